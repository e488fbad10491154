// Start and stop of the subsystems of this folder, for the service objects.
#ifndef TESSEL_SOURCE_MEMORY_SERVICE_H
#define TESSEL_SOURCE_MEMORY_SERVICE_H

#include <tessel/base/MgErr.h>

namespace tessel {

// Stop writes the leak reports of handles and pointer blocks and frees every handle that is left.
MgErr MemoryManagerStart();
MgErr MemoryManagerStop();

// Between the two, TrackedMalloc records its blocks; stop writes the report of those that are left.
MgErr TrackedMallocFreeStart();
MgErr TrackedMallocFreeStop();

}  // namespace tessel

#endif
