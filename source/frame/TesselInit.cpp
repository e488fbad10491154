#include "diagnostics/Guarded.h"
#include "frame/CoreServices.h"
#include "frame/Environment.h"
#include "frame/ServiceRegistry.h"
#include "platform/Module.h"
#include <tessel/config/ConfigCoreTypes.h>
#include <tessel/config/ConfigManager.h>
#include <tessel/frame/TesselInit.h>

#include <algorithm>
#include <iterator>
#include <utility>

namespace tessel {
namespace {

IServiceRegistry* baseRegistry = nullptr;
bool appSupportIsOn = false;

// In the order they are started.
constexpr IServiceObject* (*kAppSupport[])() = {ConfigManagerService, ConfigCoreTypesService, ThThreadService,
                                                ResourceManagerService};
constexpr size_t kConfigIsReady = 2;  // when so many are started
// Those of them that were taken hold of.
IServiceObject* appServices[std::size(kAppSupport)];

// A library that watches the heap, when the settings ask for it. The library goes on without it.
void LoadHeapDebugger() {
    static constexpr uint8 kKey[] = "\20LoadHeapDebugger";
    int32 isWanted = 0;
    if (CfgGetDefault(kConfigBool, kKey, &isWanted) == kNoErr && isWanted)
        GuardedOr<platform::LibraryHandle>(nullptr, [] { return platform::LibraryLoad("HeapDebugger.dll"); });
}

}  // namespace
}  // namespace tessel

using namespace tessel;

MgErr InitTesselBase(void) {
    if (baseRegistry) return kGenericErr;
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
    baseRegistry = CreateServiceRegistry(services);
    if (!baseRegistry) return kMemFullErr;
    const MgErr err = baseRegistry->InitServices();
    ReportUnknownSettings();
    return err;
}

// A service that failed to start keeps its error until it is let go: then the next start finds a new one.
MgErr UninitTesselBase(void) {
    if (!baseRegistry) return kNoErr;
    UninitTesselAppSupport();  // which stands on the base
    if (IServiceObject* failed = static_cast<ServiceRegistry*>(baseRegistry)->Failed()) failed->Uninit();
    baseRegistry->UninitServices();
    baseRegistry->Release();
    baseRegistry = nullptr;
    return kNoErr;
}

// Their results are not looked at: the library goes on without what did not start.
MgErr InitTesselAppSupport(void) {
    if (appSupportIsOn || !baseRegistry) return kNoErr;
    for (size_t i = 0; i < std::size(kAppSupport); ++i) {
        if (i == kConfigIsReady) LoadHeapDebugger();
        appServices[i] = kAppSupport[i]();
        if (appServices[i]) appServices[i]->Init();
    }
    appSupportIsOn = true;
    return kNoErr;
}

MgErr UninitTesselAppSupport(void) {
    if (!appSupportIsOn) return kNoErr;
    for (size_t i = std::size(kAppSupport); i-- > 0;)
        if (IServiceObject* service = std::exchange(appServices[i], nullptr)) service->Uninit();
    appSupportIsOn = false;
    return kNoErr;
}
