// Start and stop of the resource manager.
#ifndef TESSEL_SOURCE_RESOURCES_SERVICE_H
#define TESSEL_SOURCE_RESOURCES_SERVICE_H

#include <tessel/base/MgErr.h>

namespace tessel {

// Makes the table of refnums, then the resource file lock. Throws OVExcept kMemFullErr when the table cannot be made.
MgErr ResourceManagerStart();

// Open files are not closed; that some are left is reported.
MgErr ResourceManagerStop();

}  // namespace tessel

#endif
