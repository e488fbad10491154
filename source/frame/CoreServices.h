// The accessors of the library's services. Each builds its object on the first call, and again after it was stopped;
// null when memory runs out. For the start-up thread.
#ifndef TESSEL_SOURCE_FRAME_CORESERVICES_H
#define TESSEL_SOURCE_FRAME_CORESERVICES_H

#include <tessel/frame/CoreServices.h>

namespace tessel {

IServiceObject* DebugStreamService();
IServiceObject* FloatingPointConstantsService();
IServiceObject* ThEventService();
IServiceObject* ThMutexService();
IServiceObject* TrackedMallocFreeService();
IServiceObject* FileManagerService();
IServiceObject* ResourceManagerService();
IServiceObject* ConfigCoreTypesService();
IServiceObject* ConfigManagerService();
IServiceObject* ThThreadService();

}  // namespace tessel

#endif
