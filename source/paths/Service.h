// Start and stop of the path manager.
#ifndef TESSEL_SOURCE_PATHS_SERVICE_H
#define TESSEL_SOURCE_PATHS_SERVICE_H

#include <tessel/base/MgErr.h>

namespace tessel {

// Needs the memory manager and tracked allocation. Stopping writes the report of path objects that are left.
MgErr PathManagerStart();
MgErr PathManagerStop();

}  // namespace tessel

#endif
