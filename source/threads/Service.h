// Start and stop of the threads, for the service object.
#ifndef TESSEL_SOURCE_THREADS_SERVICE_H
#define TESSEL_SOURCE_THREADS_SERVICE_H

#include <tessel/base/MgErr.h>

namespace tessel {

// Reads an int32 of the configuration; false, and the value as it was, when there is none.
using ThreadPriorityReader = bool (*)(CStr key, int32& value);

// `configured` (null: nothing is configured) is asked for "thpri_bgrnd", "thpri_normal", "thpri_high", "thpri_vhigh"
// and "thpri_tcrit", the platform priorities of the five levels. Stop reports the threads that are left.
MgErr ThThreadStart(ThreadPriorityReader configured = nullptr);
MgErr ThThreadStop();

}  // namespace tessel

#endif
