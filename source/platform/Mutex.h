// The host's plain mutex: not recursive, no allocation. For use below the library's own mutexes.
#ifndef TESSEL_PLATFORM_MUTEX_H
#define TESSEL_PLATFORM_MUTEX_H

#include <mutex>

namespace tessel::platform {

class Mutex {
public:
    void Lock() { mutex_.lock(); }
    bool TryLock() { return mutex_.try_lock(); }
    void Unlock() { mutex_.unlock(); }

private:
    std::mutex mutex_;
};

// Holds a mutex for a scope.
class MutexHolder {
public:
    explicit MutexHolder(Mutex& mutex) : mutex_(mutex) { mutex_.Lock(); }
    ~MutexHolder() { mutex_.Unlock(); }
    MutexHolder(const MutexHolder&) = delete;
    MutexHolder& operator=(const MutexHolder&) = delete;

private:
    Mutex& mutex_;
};

}  // namespace tessel::platform

#endif
