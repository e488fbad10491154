// The start-up map: every service of the library, what it depends on, and what starts and stops it.
#include "frame/CoreServices.h"

#include "config/Service.h"
#include "diagnostics/Guarded.h"
#include "diagnostics/Service.h"
#include "events/Service.h"
#include "files/Service.h"
#include "memory/Service.h"
#include "numerics/Service.h"
#include "paths/Service.h"
#include "resources/Service.h"
#include "sync/Service.h"
#include "threads/Service.h"
#include <tessel/config/ConfigCoreTypes.h>
#include <tessel/config/ConfigManager.h>
#include <tessel/config/HardWaitBehavior.h>
#include <tessel/strings/StringPStr.h>

namespace tessel {
namespace {

using Accessor = IServiceObject* (*)();

// A service T names itself, its dependencies (in the order they are added) and its two functions.
template <class T>
class CoreService : public RefcountedServiceObject_T<T> {
public:
    const char* GetName() override { return T::kName; }
    void GetDependencies(IServiceDependencyList& list) override {
        for (Accessor dependency : T::kDependencies)
            if (dependency) list.AddDependency(dependency());
    }

protected:
    MgErr DoInit() override { return Guarded(T::Start); }
    MgErr DoUninit() override { return Guarded(T::Stop); }
};

struct DebugStream_Service final : CoreService<DebugStream_Service> {
    static constexpr char kName[] = "DebugStream_Service";
    static constexpr Accessor kDependencies[] = {nullptr};
    static MgErr Start() { return DebugStreamStart(); }
    static MgErr Stop() { return DebugStreamStop(); }
};

struct FloatingPointConstants final : CoreService<FloatingPointConstants> {
    static constexpr char kName[] = "FloatingPointConstants";
    static constexpr Accessor kDependencies[] = {nullptr};
    static MgErr Start() { return FloatingPointConstantsStart(); }
    static MgErr Stop() { return FloatingPointConstantsStop(); }
};

struct ThEvent_Service final : CoreService<ThEvent_Service> {
    static constexpr char kName[] = "ThEvent";
    static constexpr Accessor kDependencies[] = {nullptr};
    static MgErr Start() { return ThEventStart(); }
    static MgErr Stop() { return ThEventStop(); }
};

struct ThMutex_Service final : CoreService<ThMutex_Service> {
    static constexpr char kName[] = "ThMutex";
    static constexpr Accessor kDependencies[] = {ThEventService};
    static MgErr Start() { return ThMutexStart(); }
    static MgErr Stop() { return ThMutexStop(); }
};

struct ProtectedAtomicOperations_Service final : CoreService<ProtectedAtomicOperations_Service> {
    static constexpr char kName[] = "ProtectedAtomicOperations";
    static constexpr Accessor kDependencies[] = {ThMutexService};
    static MgErr Start() { return ProtectedAtomicOperationsStart(); }
    static MgErr Stop() { return ProtectedAtomicOperationsStop(); }
};

struct MemoryManager_Service final : CoreService<MemoryManager_Service> {
    static constexpr char kName[] = "MemoryManager";
    static constexpr Accessor kDependencies[] = {ThMutexService, ProtectedAtomicOperationsService};
    static MgErr Start() { return MemoryManagerStart(); }
    static MgErr Stop() { return MemoryManagerStop(); }
};

struct TrackedMallocFree_Service final : CoreService<TrackedMallocFree_Service> {
    static constexpr char kName[] = "TrackedMallocFree";
    static constexpr Accessor kDependencies[] = {MemoryManagerService};
    static MgErr Start() { return TrackedMallocFreeStart(); }
    static MgErr Stop() { return TrackedMallocFreeStop(); }
};

struct PathManager_Service final : CoreService<PathManager_Service> {
    static constexpr char kName[] = "PathManager";
    static constexpr Accessor kDependencies[] = {TrackedMallocFreeService, MemoryManagerService};
    static MgErr Start() { return PathManagerStart(); }
    static MgErr Stop() { return PathManagerStop(); }
};

struct FileManager_Service final : CoreService<FileManager_Service> {
    static constexpr char kName[] = "FileManager";
    static constexpr Accessor kDependencies[] = {PathManagerService, MemoryManagerService};
    static MgErr Start() { return FileManagerStart(); }
    static MgErr Stop() { return FileManagerStop(); }
};

struct ResourceManager_Service final : CoreService<ResourceManager_Service> {
    static constexpr char kName[] = "ResourceManager";
    static constexpr Accessor kDependencies[] = {MemoryManagerService, PathManagerService, FileManagerService};
    static MgErr Start() { return ResourceManagerStart(); }
    static MgErr Stop() { return ResourceManagerStop(); }
};

struct ConfigCoreTypes_Service final : CoreService<ConfigCoreTypes_Service> {
    static constexpr char kName[] = "ConfigCoreTypes";
    static constexpr Accessor kDependencies[] = {PathManagerService, ConfigManagerService};
    static MgErr Start() { return ConfigCoreTypesStart(); }
    static MgErr Stop() { return ConfigCoreTypesStop(); }
};

struct ConfigManager_Service final : CoreService<ConfigManager_Service> {
    static constexpr char kName[] = "ConfigManager";
    static constexpr Accessor kDependencies[] = {ThMutexService, PathManagerService, FileManagerService,
                                                 MemoryManagerService};
    static MgErr Start() { return ConfigManagerStart(); }
    static MgErr Stop() { return ConfigManagerStop(); }
};

bool ReadThreadPriority(CStr key, int32& value) {
    Str255 token;
    CToPStr(key, token);
    return CfgGetDefault(kConfigI32, token, &value) == kNoErr;
}

struct ThThread_Service final : CoreService<ThThread_Service> {
    static constexpr char kName[] = "ThThread";
    static constexpr Accessor kDependencies[] = {ThMutexService, ThEventService, ConfigManagerService,
                                                 ConfigCoreTypesService};
    static MgErr Start() { return ThThreadStart(ReadThreadPriority); }
    static MgErr Stop() { return ThThreadStop(); }
};

struct HardWaitBehavior_Service final : CoreService<HardWaitBehavior_Service> {
    static constexpr char kName[] = "HardWaitBehavior";
    static constexpr Accessor kDependencies[] = {ConfigManagerService, ConfigCoreTypesService};
    static MgErr Start() { return HardWaitBehaviorStart(); }
    static MgErr Stop() { return HardWaitBehaviorStop(); }
};

struct OccurrenceManager_Service final : CoreService<OccurrenceManager_Service> {
    static constexpr char kName[] = "OccurrenceManager";
    static constexpr Accessor kDependencies[] = {HardWaitBehaviorService, ThMutexService, ThThreadService};
    static MgErr Start() { return OccurrenceManagerStart(GetHardWaitTimeCritical() != 0); }
    static MgErr Stop() { return OccurrenceManagerStop(); }
};

}  // namespace

IServiceObject* DebugStreamService() {
    return DebugStream_Service::Object();
}
IServiceObject* FloatingPointConstantsService() {
    return FloatingPointConstants::Object();
}
IServiceObject* ThEventService() {
    return ThEvent_Service::Object();
}
IServiceObject* ThMutexService() {
    return ThMutex_Service::Object();
}
IServiceObject* ProtectedAtomicOperationsService() {
    return ProtectedAtomicOperations_Service::Object();
}
IServiceObject* MemoryManagerService() {
    return MemoryManager_Service::Object();
}
IServiceObject* TrackedMallocFreeService() {
    return TrackedMallocFree_Service::Object();
}
IServiceObject* PathManagerService() {
    return PathManager_Service::Object();
}
IServiceObject* FileManagerService() {
    return FileManager_Service::Object();
}
IServiceObject* ResourceManagerService() {
    return ResourceManager_Service::Object();
}
IServiceObject* ConfigCoreTypesService() {
    return ConfigCoreTypes_Service::Object();
}
IServiceObject* ConfigManagerService() {
    return ConfigManager_Service::Object();
}
IServiceObject* ThThreadService() {
    return ThThread_Service::Object();
}
IServiceObject* HardWaitBehaviorService() {
    return HardWaitBehavior_Service::Object();
}
IServiceObject* OccurrenceManagerService() {
    return OccurrenceManager_Service::Object();
}

}  // namespace tessel
