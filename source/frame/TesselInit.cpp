#include <tessel/frame/TesselInit.h>

#include <algorithm>

#include "frame/CoreServices.h"

namespace tessel {
namespace {

IServiceRegistry* theBaseRegistry = nullptr;
bool theAppSupportIsOn = false;

}  // namespace
}  // namespace tessel

using namespace tessel;

MgErr InitTesselBase(void) {
    if (theBaseRegistry) return kGenericErr;
    static IServiceObject* services[10];
    IServiceObject* const core[] = {
        DebugStreamService(),
        FloatingPointConstantsService(),
        ThEventService(),
        ThMutexService(),
        ProtectedAtomicOperationsService(),
        MemoryManagerService(),
        TrackedMallocFreeService(),
        PathManagerService(),
        FileManagerService(),
    };
    std::copy(std::begin(core), std::end(core), services);
    if (std::find(std::begin(core), std::end(core), nullptr) != std::end(core)) return kMemFullErr;
    theBaseRegistry = CreateServiceRegistry(services);
    return theBaseRegistry ? theBaseRegistry->InitServices() : kMemFullErr;
}

MgErr UninitTesselBase(void) {
    if (!theBaseRegistry) return kNoErr;
    theBaseRegistry->UninitServices();
    theBaseRegistry->Release();
    theBaseRegistry = nullptr;
    return kNoErr;
}

MgErr InitTesselAppSupport(void) {
    if (theAppSupportIsOn) return kNoErr;
    ConfigManagerService()->Init();
    ConfigCoreTypesService()->Init();
    ThThreadService()->Init();
    ResourceManagerService()->Init();
    theAppSupportIsOn = true;
    return kNoErr;
}

MgErr UninitTesselAppSupport(void) {
    if (!theAppSupportIsOn) return kNoErr;
    ResourceManagerService()->Uninit();
    ThThreadService()->Uninit();
    ConfigCoreTypesService()->Uninit();
    ConfigManagerService()->Uninit();
    theAppSupportIsOn = false;
    return kNoErr;
}
