// Start and stop of the library, on the host's start-up thread:
//
// InitTesselBase();  InitTesselAppSupport();  ...  UninitTesselAppSupport();  UninitTesselBase();
#ifndef TESSEL_FRAME_TESSELINIT_H
#define TESSEL_FRAME_TESSELINIT_H

#include <tessel/base/MgErr.h>

TESSEL_BEGIN_C

// Starts the core services: reports, events, mutexes, memory, paths, files. 2 when memory runs out, else the result of
// the service that failed. Once until undone.
TESSEL_API MgErr InitTesselBase(void);

// Stops them in the reverse order, with the leak reports; application support first when it is still started. Always 0.
TESSEL_API MgErr UninitTesselBase(void);

// Starts configuration, threads and resources. Does nothing before InitTesselBase, and when they are started. Always 0.
// When the setting "LoadHeapDebugger" (Bool) is true, the library "HeapDebugger.dll" is loaded before the threads
// start, searched for as the host system does; nothing is said when it is not found.
TESSEL_API MgErr InitTesselAppSupport(void);

// Stops them. Does nothing when they are not started. Always 0.
TESSEL_API MgErr UninitTesselAppSupport(void);

TESSEL_END_C

#endif
