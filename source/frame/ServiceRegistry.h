// The registry behind IServiceRegistry.
#ifndef TESSEL_SOURCE_FRAME_SERVICEREGISTRY_H
#define TESSEL_SOURCE_FRAME_SERVICEREGISTRY_H

#include <tessel/frame/ServiceRegistry.h>
#include <tessel/memory/TrackedMallocFree.h>

#include <memory>
#include <vector>

namespace tessel {

// A registered service, and the record of its last start and stop (times of the millisecond clock).
struct ServiceRegistryItem {
    explicit ServiceRegistryItem(IServiceObject* service_) : service(service_) {}

    IServiceObject* service;
    int32 pending = 0;  // while ordering: dependencies that are not placed yet
    ServiceDependencyList dependents;
    MgErr startResult = 0;
    uint32 startBegin = 0;
    uint32 startEnd = 0;
    MgErr stopResult = 0;
    uint32 stopBegin = 0;
    uint32 stopEnd = 0;
};

// Throws std::bad_alloc only where a container grows; the operations turn it into 2.
class ServiceRegistry final : public IServiceRegistry, public TrackedObject {
public:
    MgErr InitServices() override;
    MgErr UninitServices() override;
    void Release() override { delete this; }
    MgErr AddService(IServiceObject* service) override;
    MgErr RemoveService(IServiceObject* service) override;
    bool HasService(IServiceObject* service) override { return Find(service) != nullptr; }

    // The service whose start failed last, or null. It is not stopped with the others.
    IServiceObject* Failed() const;

    // Registers a service of a list: one that is registered already is reported.
    void Register(IServiceObject* service);

private:
    // The start order keeps items alive that are no longer registered.
    using Items = std::vector<std::shared_ptr<ServiceRegistryItem>>;

    ServiceRegistryItem* Find(IServiceObject* service) const;
    void Order();
    bool CountDependencies(ServiceRegistryItem& item);
    void Place(Items work);
    MgErr Start(ServiceRegistryItem& item);
    MgErr Stop(ServiceRegistryItem& item);

    // What a service may not do from its own start, stop or GetDependencies: these get 42 meanwhile.
    bool IsInUse() const { return startedCount_ > 0 || busy_; }

    bool busy_ = false;  // ordering, starting or stopping
    Items items_;        // in the order of registration
    Items startOrder_;
    int32 startedCount_ = 0;  // so many from the front of the start order are started
};

}  // namespace tessel

#endif
