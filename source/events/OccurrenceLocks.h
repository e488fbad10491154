// The three mutexes of the occurrences, and the order they are taken in: timer, occurrence, timed handler.
//
// Clang proves who holds what, and the order, when it compiles. In builds with a sanitizer every acquisition also looks
// at what its thread holds, and ends the program when the order is broken.
#ifndef TESSEL_SOURCE_EVENTS_OCCURRENCELOCKS_H
#define TESSEL_SOURCE_EVENTS_OCCURRENCELOCKS_H

#include "platform/LockMarks.h"
#include <tessel/sync/ThMutex.h>

#if defined(__SANITIZE_THREAD__) || defined(__SANITIZE_ADDRESS__)
#    define TESSEL_CHECK_LOCK_ORDER 1
#else
#    define TESSEL_CHECK_LOCK_ORDER 0
#endif

namespace tessel {

// A ThMutex with its rank: a thread takes ranks in rising order. Without its ThMutex, nothing is locked.
class TESSEL_LOCKS(capability("mutex")) OccurrenceLock {
public:
    explicit constexpr OccurrenceLock(int rank) : rank_(rank) {}

    MgErr Create(CStr name) { return ThMutexCreate(&mutex_, name); }
    void Destroy() {
        ThMutexDestroy(mutex_);
        mutex_ = nullptr;
    }
    void Acquire() TESSEL_LOCKS(acquire_capability()) {
        if (TESSEL_CHECK_LOCK_ORDER) NoteAcquired(rank_);
        ThMutexAcquire(mutex_);
    }
    void Release() TESSEL_LOCKS(release_capability()) {
        ThMutexRelease(mutex_);
        if (TESSEL_CHECK_LOCK_ORDER) NoteReleased(rank_);
    }

    // What the calling thread holds, a bit a rank; always 0 where the order is not looked at.
    static unsigned HeldRanks();

private:
    static void NoteAcquired(int rank);
    static void NoteReleased(int rank);

    ThMutex mutex_ = nullptr;
    const int rank_;
};

// Holds a lock for a scope.
class TESSEL_LOCKS(scoped_lockable) OccurrenceLockHolder {
public:
    explicit OccurrenceLockHolder(OccurrenceLock& lock) TESSEL_LOCKS(acquire_capability(lock)) : lock_(lock) {
        lock_.Acquire();
    }
    ~OccurrenceLockHolder() TESSEL_LOCKS(release_capability()) { lock_.Release(); }
    OccurrenceLockHolder(const OccurrenceLockHolder&) = delete;
    OccurrenceLockHolder& operator=(const OccurrenceLockHolder&) = delete;

private:
    OccurrenceLock& lock_;
};

// Guards the schedule and the wake-up of the occurrence thread; an occurrence is freed under it. Not held while
// callbacks run.
extern OccurrenceLock gTimerOccMutex;

// Guards occurrences, handlers, fired lists and the data of groups. Notify procedures run inside.
extern OccurrenceLock gOccMutex TESSEL_ACQUIRED_AFTER(gTimerOccMutex);

// Guards the list of handlers with a deadline. Nothing is taken inside.
extern OccurrenceLock gTimedHdlrMutex TESSEL_ACQUIRED_AFTER(gOccMutex);

}  // namespace tessel

#endif
