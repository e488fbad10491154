// The library's services that a host can take hold of, or make its own services depend on.
#ifndef TESSEL_FRAME_CORESERVICES_H
#define TESSEL_FRAME_CORESERVICES_H

#include <tessel/frame/ServiceRegistry.h>

#ifdef __cplusplus

namespace tessel {

// The service object, built on the first call and again after it was stopped. Null when memory runs out. The host
// starts HardWaitBehavior and OccurrenceManager itself; the others are started by InitTesselBase.
TESSEL_API IServiceObject* MemoryManagerService();
// The PathManager service.
TESSEL_API IServiceObject* PathManagerService();
// The ProtectedAtomicOperations service.
TESSEL_API IServiceObject* ProtectedAtomicOperationsService();
// The HardWaitBehavior service, which the host starts.
TESSEL_API IServiceObject* HardWaitBehaviorService();
// The OccurrenceManager service, which the host starts.
TESSEL_API IServiceObject* OccurrenceManagerService();

}  // namespace tessel

#endif
#endif
