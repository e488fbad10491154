// A mutex that a thread which holds it may take again.
#ifndef TESSEL_SOURCE_SYNC_RECURSIVEMUTEX_H
#define TESSEL_SOURCE_SYNC_RECURSIVEMUTEX_H

#include "platform/LockMarks.h"
#include <tessel/sync/ThMutex.h>

namespace tessel {

// One for the whole process: how often the calling thread holds it is counted in a thread_local variable beside it,
// which its operations are given. To clang's analysis its holders are what takes it.
class TESSEL_LOCKS(capability("mutex")) RecursiveMutex {
public:
    MgErr Create(CStr name) { return mutex_ ? kNoErr : ThMutexCreate(&mutex_, name); }
    void Destroy() {
        ThMutexDestroy(mutex_);
        mutex_ = nullptr;
    }

    void Acquire(uint32& held) {
        if (held++ == 0) ThMutexAcquire(mutex_);
    }
    // Whether the thread has let go of it.
    bool Release(uint32& held) {
        if (--held != 0) return false;
        ThMutexRelease(mutex_);
        return true;
    }
    ThMutex Get() const { return mutex_; }

private:
    ThMutex mutex_ = nullptr;
};

}  // namespace tessel

#endif
