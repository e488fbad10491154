// The host's plain mutex: not recursive, no allocation. For use below the library's own mutexes.
#ifndef TESSEL_PLATFORM_MUTEX_H
#define TESSEL_PLATFORM_MUTEX_H

#include "platform/LockMarks.h"

#include <mutex>

namespace tessel::platform {

class TESSEL_LOCKS(capability("mutex")) Mutex {
public:
    void Lock() TESSEL_LOCKS(acquire_capability()) { mutex_.lock(); }
    bool TryLock() TESSEL_LOCKS(try_acquire_capability(true)) { return mutex_.try_lock(); }
    void Unlock() TESSEL_LOCKS(release_capability()) { mutex_.unlock(); }

private:
    std::mutex mutex_;
};

// Holds a mutex for a scope.
class TESSEL_LOCKS(scoped_lockable) MutexHolder {
public:
    explicit MutexHolder(Mutex& mutex) TESSEL_LOCKS(acquire_capability(mutex)) : mutex_(mutex) { mutex_.Lock(); }
    ~MutexHolder() TESSEL_LOCKS(release_capability()) { mutex_.Unlock(); }
    MutexHolder(const MutexHolder&) = delete;
    MutexHolder& operator=(const MutexHolder&) = delete;

private:
    Mutex& mutex_;
};

}  // namespace tessel::platform

#endif
