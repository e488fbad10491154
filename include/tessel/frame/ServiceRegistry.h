// Services: reference-counted parts of a program that are started in the order of their dependencies.
//
// IServiceObject            what a registry starts and stops
// RefcountedServiceObject_T a base for services: counts uses, starts on the first and ends on the last
// IServiceRegistry          starts a set of services in order, and stops them in the reverse
//
// Services are started and stopped on one thread. Only the use count of a service is safe from any thread.
#ifndef TESSEL_FRAME_SERVICEREGISTRY_H
#define TESSEL_FRAME_SERVICEREGISTRY_H

#include <tessel/base/MgErr.h>

#ifdef __cplusplus
#    include <atomic>
#    include <new>
#    include <vector>

namespace tessel {

class IServiceObject;

// Collects the services that one depends on.
class TESSEL_API IServiceDependencyList {
public:
    // Adds a service that must run first. It stays its owner's.
    virtual void AddDependency(IServiceObject* service) = 0;
    virtual ~IServiceDependencyList();
};

// A part of a program that is started and stopped, and counts who uses it.
class TESSEL_API IServiceObject {
public:
    // Takes hold of the service; the first to do so starts it.
    virtual MgErr Init() = 0;
    // Lets go of it; the last to do so stops and destroys it.
    virtual MgErr Uninit() = 0;
    // A constant text of at most 127 bytes.
    virtual const char* GetName() = 0;
    // Adds every service that must run before this one.
    virtual void GetDependencies(IServiceDependencyList& list) = 0;
    virtual ~IServiceObject();
};

// A base for a service class T, of which there is one object at a time.
template <class T>
class RefcountedServiceObject_T : public IServiceObject {
public:
    // The object, built when there is none; null when memory runs out. Takes no lock.
    static T* Object() {
        if (!object_) object_ = new (std::nothrow) T;
        return object_;
    }

    // Returns what the start returned; 42 while the first start is still running.
    MgErr Init() override {
        if (useCount_.fetch_add(1) == 0) status_ = DoInit();
        return status_;
    }

    MgErr Uninit() override {
        if (useCount_.fetch_sub(1) != 1) return kNoErr;
        const MgErr err = DoUninit();
        if (object_ == this) object_ = nullptr;
        delete this;
        return err;
    }

    // How many hold the service.
    int32 UseCount() const { return useCount_; }
    // What the start returned; kGenericErr before.
    MgErr Status() const { return status_; }

protected:
    virtual MgErr DoInit() = 0;
    virtual MgErr DoUninit() = 0;

private:
    static inline T* object_ = nullptr;

    std::atomic<int32> useCount_{0};
    std::atomic<MgErr> status_{kGenericErr};
};

// A list of at most 1024 services.
class TESSEL_API ServiceDependencyList final : public IServiceDependencyList {
public:
    // An empty list. Raises std::bad_alloc when memory runs out.
    ServiceDependencyList();

    // Refuses null (level-2 report) and a 1025th service (level 4). Throws std::bad_alloc when memory runs out.
    void AddDependency(IServiceObject* service) override;
    // How many services it holds.
    int32 GetCount() const { return static_cast<int32>(services_.size()); }
    // Null, with a level-4 report, beyond the count.
    IServiceObject* GetAt(int32 index) const;

private:
    std::vector<IServiceObject*> services_;
};

// Starts and stops a set of services, which it does not own. A service that calls its registry from its own start,
// stop or GetDependencies gets 42.
class TESSEL_API IServiceRegistry {
public:
    // Starts every service after those that it depends on, and else in the order of registration. A dependency must be
    // registered here or run already, started by another registry; when one is missing (level-4 report) nothing is
    // started. Services whose dependencies form a cycle are not started (level-4 report), and all registrations are
    // forgotten. Returns the result of the first service that failed, and stops there; 42 while services are started.
    virtual MgErr InitServices() = 0;
    // Stops what is started in the reverse order. Returns the result of the first service that failed, and stops
    // there.
    virtual MgErr UninitServices() = 0;
    // Destroys the registry without stopping anything.
    virtual void Release() = 0;
    // 1 for null and for a service that is registered already; 42 while services are started.
    virtual MgErr AddService(IServiceObject* service) = 0;
    // 1 for null and for a service that is not registered; 42 while services are started.
    virtual MgErr RemoveService(IServiceObject* service) = 0;
    // Whether the service is registered here.
    virtual bool HasService(IServiceObject* service) = 0;
    virtual ~IServiceRegistry();
};

// A registry of the services in a null-terminated array; one that stands there twice is reported (level 4) and held
// once. The caller owns it and ends it with Release. Null for a null array, and when memory runs out.
TESSEL_API IServiceRegistry* CreateServiceRegistry(IServiceObject* const* services);

}  // namespace tessel

#endif
#endif
