// A ThMutex of the library's own, made when a part of the library starts, in the form that clang's analysis of locks
// follows.
#ifndef TESSEL_SOURCE_SYNC_LIBRARYMUTEX_H
#define TESSEL_SOURCE_SYNC_LIBRARYMUTEX_H

#include "platform/LockMarks.h"
#include <tessel/sync/ThMutex.h>

namespace tessel {

// Before it is made, and after its end, nothing is locked.
class TESSEL_LOCKS(capability("mutex")) LibraryMutex {
public:
    // Once: does nothing while there is one.
    MgErr Create(CStr name) { return mutex_ ? kNoErr : ThMutexCreate(&mutex_, name); }
    void Destroy() {
        ThMutexDestroy(mutex_);
        mutex_ = nullptr;
    }
    void Acquire() TESSEL_LOCKS(acquire_capability()) { ThMutexAcquire(mutex_); }
    void Release() TESSEL_LOCKS(release_capability()) { ThMutexRelease(mutex_); }

private:
    ThMutex mutex_ = nullptr;
};

// Holds a mutex for a scope.
class TESSEL_LOCKS(scoped_lockable) LibraryMutexHolder {
public:
    explicit LibraryMutexHolder(LibraryMutex& mutex) TESSEL_LOCKS(acquire_capability(mutex)) : mutex_(mutex) {
        mutex_.Acquire();
    }
    ~LibraryMutexHolder() TESSEL_LOCKS(release_capability()) { mutex_.Release(); }
    LibraryMutexHolder(const LibraryMutexHolder&) = delete;
    LibraryMutexHolder& operator=(const LibraryMutexHolder&) = delete;

private:
    LibraryMutex& mutex_;
};

}  // namespace tessel

#endif
