// Start and stop of the subsystems of this folder, for the service objects.
#ifndef TESSEL_SOURCE_SYNC_SERVICE_H
#define TESSEL_SOURCE_SYNC_SERVICE_H

#include <tessel/base/MgErr.h>

namespace tessel {

// Between start and stop the events and mutexes made are tracked; stop reports those that are left.
MgErr ThEventStart();
MgErr ThEventStop();
MgErr ThMutexStart();
MgErr ThMutexStop();

// Decides whether 8-byte atomics run in hardware.
MgErr ProtectedAtomicOperationsStart();
MgErr ProtectedAtomicOperationsStop();

}  // namespace tessel

#endif
