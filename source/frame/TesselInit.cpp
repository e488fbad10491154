#include <tessel/frame/TesselInit.h>

#include <algorithm>
#include <iterator>

#include "frame/CoreServices.h"

namespace tessel {
namespace {

IServiceRegistry* theBaseRegistry = nullptr;
bool theAppSupportIsOn = false;

// In the order they are started.
constexpr IServiceObject* (*kAppSupport[])() = {ConfigManagerService, ConfigCoreTypesService, ThThreadService,
                                                ResourceManagerService};

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

// Their results are not looked at: the library goes on without what did not start.
MgErr InitTesselAppSupport(void) {
    if (theAppSupportIsOn || !theBaseRegistry) return kNoErr;
    for (auto accessor : kAppSupport)
        if (IServiceObject* service = accessor()) service->Init();
    theAppSupportIsOn = true;
    return kNoErr;
}

MgErr UninitTesselAppSupport(void) {
    if (!theAppSupportIsOn) return kNoErr;
    for (auto accessor = std::rbegin(kAppSupport); accessor != std::rend(kAppSupport); ++accessor)
        if (IServiceObject* service = (*accessor)()) service->Uninit();
    theAppSupportIsOn = false;
    return kNoErr;
}
