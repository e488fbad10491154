#include "frame/ServiceRegistry.h"

#include "diagnostics/Guarded.h"
#include <tessel/diagnostics/DebugStream.h>
#include <tessel/time/Millisecs.h>

#include <algorithm>
#include <cstdio>
#include <set>

namespace tessel {
namespace {

constexpr int32 kFirstDependencies = 4;
constexpr int32 kMostDependencies = 1024;
constexpr size_t kNameSize = 128;

// Every service that some registry started and has not stopped, once for each such registry. Never destroyed: a host
// may stop at its very end.
using ServiceSet = std::multiset<IServiceObject*>;
ServiceSet& RunningServices() {
    static auto& services = *new ServiceSet;
    return services;
}

class Busy {
public:
    explicit Busy(bool& busy) : busy_(busy) { busy_ = true; }
    ~Busy() { busy_ = false; }
    Busy(const Busy&) = delete;
    Busy& operator=(const Busy&) = delete;

private:
    bool& busy_;
};

}  // namespace

IServiceDependencyList::~IServiceDependencyList() = default;
IServiceObject::~IServiceObject() = default;
IServiceRegistry::~IServiceRegistry() = default;

// ---- ServiceDependencyList ------------------------------------------------------------------------------------------

ServiceDependencyList::ServiceDependencyList() {
    services_.reserve(kFirstDependencies);
}

void ServiceDependencyList::AddDependency(IServiceObject* service) {
    if (!service)
        TESSEL_REPORT(kDebugWarning, 0x7D02B6E4u) << "Cannot add null service dependency to dependency list.";
    else if (GetCount() >= kMostDependencies)
        TESSEL_REPORT(kDebugFatal, 0x19C8A35Fu) << "Too many service dependencies (" << kMostDependencies << ").";
    else
        services_.push_back(service);
}

IServiceObject* ServiceDependencyList::GetAt(int32 index) const {
    if (index >= 0 && index < GetCount()) return services_[static_cast<size_t>(index)];
    TESSEL_REPORT(kDebugFatal, 0x5B4E0D97u)
        << "Service dependency index " << index << " not in range 0.." << GetCount();
    return nullptr;
}

// ---- ServiceRegistry: what is registered ----------------------------------------------------------------------------

ServiceRegistryItem* ServiceRegistry::Find(IServiceObject* service) const {
    for (const auto& item : items_)
        if (item->service == service) return item.get();
    return nullptr;
}

void ServiceRegistry::Register(IServiceObject* service) {
    if (Find(service))
        TESSEL_REPORT(kDebugFatal, 0x3A71CE08u)
            << "ServiceRegistry: A service has already been registered that has the name \"" << service->GetName()
            << "\".";
    else
        items_.push_back(std::make_shared<ServiceRegistryItem>(service));
}

MgErr ServiceRegistry::AddService(IServiceObject* service) {
    if (IsInUse()) return kGenericErr;
    if (!service || Find(service)) return kArgErr;
    return Guarded([&] {
        Register(service);
        return kNoErr;
    });
}

MgErr ServiceRegistry::RemoveService(IServiceObject* service) {
    if (IsInUse()) return kGenericErr;
    const auto item =
        std::find_if(items_.begin(), items_.end(), [&](const auto& each) { return each->service == service; });
    if (item == items_.end()) return kArgErr;
    items_.erase(item);
    return kNoErr;
}

// ---- ServiceRegistry: the start order -------------------------------------------------------------------------------

void ServiceRegistry::Order() {
    startOrder_.clear();
    for (const auto& item : items_) {
        item->pending = 0;
        item->dependents = ServiceDependencyList();
    }
    for (const auto& item : items_)
        if (!CountDependencies(*item)) return;
    Place(items_);
}

// False when one of the item's dependencies exists nowhere.
bool ServiceRegistry::CountDependencies(ServiceRegistryItem& item) {
    ServiceDependencyList dependencies;
    item.service->GetDependencies(dependencies);
    for (int32 i = 0; i < dependencies.GetCount(); ++i) {
        IServiceObject* const dependency = dependencies.GetAt(i);
        if (ServiceRegistryItem* registered = Find(dependency)) {
            ++item.pending;
            registered->dependents.AddDependency(item.service);
        } else if (!RunningServices().count(dependency)) {
            TESSEL_REPORT(kDebugFatal, 0x60F7194Bu)
                << "ServiceRegistry: Service \"" << item.service->GetName() << "\" has a dependency \""
                << dependency->GetName() << "\" that does not exist!";
            return false;
        }
    }
    return true;
}

void ServiceRegistry::Place(Items work) {
    while (!work.empty()) {
        const auto ready = std::find_if(work.begin(), work.end(), [](const auto& item) { return item->pending == 0; });
        if (ready == work.end()) {
            TESSEL_REPORT(kDebugFatal, 0x0C95F2DAu) << "ServiceRegistry: Service dependencies form a cycle.";
            items_.clear();
            return;
        }
        startOrder_.push_back(*ready);
        const ServiceDependencyList& dependents = (*ready)->dependents;
        for (int32 i = 0; i < dependents.GetCount(); ++i) --Find(dependents.GetAt(i))->pending;
        work.erase(ready);
    }
}

// ---- ServiceRegistry: start and stop --------------------------------------------------------------------------------

MgErr ServiceRegistry::InitServices() {
    if (IsInUse()) return kGenericErr;
    Busy busy(busy_);
    return Guarded([&] {
        Order();
        for (const auto& item : startOrder_)
            if (const MgErr err = Start(*item)) return err;
        return kNoErr;
    });
}

MgErr ServiceRegistry::Start(ServiceRegistryItem& item) {
    ServiceSet entry{item.service};  // before it runs, since memory may run out
    item.startBegin = MilliSecs();
    item.startResult = Guarded([&] { return item.service->Init(); });
    item.startEnd = MilliSecs();
    if (item.startResult == kNoErr) {
        RunningServices().merge(entry);
        ++startedCount_;
        return kNoErr;
    }
    TESSEL_REPORT(kDebugInfo, 0x4F36D8B1u)
        << "ServiceRegistry: Service " << item.service->GetName() << " init failed with error " << item.startResult;
    return item.startResult;
}

IServiceObject* ServiceRegistry::Failed() const {
    const auto next = static_cast<size_t>(startedCount_);
    return next < startOrder_.size() && startOrder_[next]->startResult != kNoErr ? startOrder_[next]->service : nullptr;
}

MgErr ServiceRegistry::UninitServices() {
    if (busy_) return kGenericErr;
    Busy busy(busy_);
    while (startedCount_ > 0) {
        if (const MgErr err = Stop(*startOrder_[static_cast<size_t>(startedCount_) - 1])) return err;
        --startedCount_;
    }
    return kNoErr;
}

MgErr ServiceRegistry::Stop(ServiceRegistryItem& item) {
    char name[kNameSize];  // the stop may destroy the service
    std::snprintf(name, sizeof name, "%s", item.service->GetName());
    item.stopBegin = MilliSecs();
    item.stopResult = Guarded([&] { return item.service->Uninit(); });
    item.stopEnd = MilliSecs();
    if (item.stopResult == kNoErr)
        RunningServices().erase(RunningServices().find(item.service));
    else
        TESSEL_REPORT(kDebugInfo, 0x2E8B5C76u)
            << "ServiceRegistry: Service " << name << " uninit failed with error " << item.stopResult;
    return item.stopResult;
}

IServiceRegistry* CreateServiceRegistry(IServiceObject* const* services) {
    if (!services) return nullptr;
    return GuardedOr(static_cast<IServiceRegistry*>(nullptr), [&]() -> IServiceRegistry* {
        auto registry = std::make_unique<ServiceRegistry>();
        for (; *services; ++services) registry->Register(*services);
        return registry.release();
    });
}

}  // namespace tessel
