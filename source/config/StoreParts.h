// What the stores of settings have in common.
#ifndef TESSEL_SOURCE_CONFIG_STOREPARTS_H
#define TESSEL_SOURCE_CONFIG_STOREPARTS_H

#include <tessel/base/OVExcept.h>
#include <tessel/memory/TrackedMallocFree.h>
#include <tessel/sync/ThMutex.h>

#include <atomic>
#include <functional>
#include <new>
#include <set>
#include <string>

namespace tessel {

// A mutex for as long as its store lives.
class StoreMutex {
public:
    StoreMutex() {
        if (const MgErr err = ThMutexCreate(&mutex_, nullptr)) TESSEL_THROW(err, "store of settings");
    }
    ~StoreMutex() { ThMutexDestroy(mutex_); }
    StoreMutex(const StoreMutex&) = delete;
    StoreMutex& operator=(const StoreMutex&) = delete;

    ThMutex Get() const { return mutex_; }

private:
    ThMutex mutex_ = nullptr;
};

// The name of the current section. It is handed out by reference and may be set by another thread meanwhile, so every
// name that was ever current is kept.
class CurrentSection {
public:
    explicit CurrentSection(const std::string& name) { Set(name); }

    const std::string& Get() const { return *current_.load(std::memory_order_acquire); }
    // One thread at a time.
    void Set(const std::string& name) { current_.store(&*names_.insert(name).first, std::memory_order_release); }

private:
    std::set<std::string, std::less<>, TrackedAllocator<std::string>> names_;
    std::atomic<const std::string*> current_{nullptr};
};

// The result of `body`; what there is no memory for is raised as an OVExcept.
template <class Body>
auto RaisingMemFull(Body&& body) {
    try {
        return body();
    } catch (const std::bad_alloc&) {
        TESSEL_THROW(kMemFullErr, "store of settings");
    }
}

}  // namespace tessel

#endif
