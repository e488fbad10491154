// Mutexes. Not recursive: a thread must not acquire a mutex that it holds.
//
// ThMutexAcquire and ThMutexRelease are inline and cost one atomic operation each while nobody else wants the mutex.
// A thread that finds it held spins briefly, then joins the count and sleeps; a release hands the mutex to one that
// sleeps before anybody else can take it, so that no sleeper waits for ever.
#ifndef TESSEL_SYNC_THMUTEX_H
#define TESSEL_SYNC_THMUTEX_H

#include <tessel/base/MgErr.h>
#include <tessel/base/Types.h>
#include <tessel/sync/ThEvent.h>

// A mutex. Its fields are the library's to change.
typedef struct THMUTEXREC {
    int32 count;      // -1 when free; else the number of threads that hold it or sleep for it, minus one
    ThEvent event;    // wakes one that sleeps
    uint32 verifier;  // kThMutexVerifier
} THMUTEXREC;
typedef THMUTEXREC* ThMutex;

#define kThMutexVerifier ((uint32)0x7874754D)  // the bytes "Mutx"

TESSEL_BEGIN_C

// A new, free mutex in *mutex, owned by the caller; null there and kMemFullErr when it cannot be made. The name is not
// used.
TESSEL_API MgErr ThMutexCreate(ThMutex* mutex, CStr name);

// Nothing for null; an error report for a wrong verifier. No thread may hold it.
TESSEL_API void ThMutexDestroy(ThMutex mutex);

// What the inline operations do when another thread holds the mutex, or sleeps for it. Not for null.
TESSEL_API void ThMutexAcquireHeld(ThMutex mutex);
// Hands the mutex to one that sleeps for it. Not for null.
TESSEL_API void ThMutexWakeNext(ThMutex mutex);

// Both do nothing for null.
static inline void ThMutexAcquire(ThMutex mutex) {
    int32 free = -1;
    if (!mutex) return;
    if (!__atomic_compare_exchange_n(&mutex->count, &free, 0, false, __ATOMIC_ACQUIRE, __ATOMIC_RELAXED))
        ThMutexAcquireHeld(mutex);
}

// Lets a mutex go that the calling thread holds. Nothing for null.
static inline void ThMutexRelease(ThMutex mutex) {
    if (!mutex) return;
    if (__atomic_sub_fetch(&mutex->count, 1, __ATOMIC_RELEASE) != -1) ThMutexWakeNext(mutex);
}

TESSEL_END_C

#ifdef __cplusplus

namespace tessel {

// Holds a mutex for a scope.
class ThMutexHolder {
public:
    // Acquires the mutex; null holds nothing.
    explicit ThMutexHolder(ThMutex mutex) : mutex_(mutex) { ThMutexAcquire(mutex_); }
    ~ThMutexHolder() { ThMutexRelease(mutex_); }
    ThMutexHolder(const ThMutexHolder&) = delete;
    ThMutexHolder& operator=(const ThMutexHolder&) = delete;

private:
    ThMutex mutex_;
};

}  // namespace tessel
#endif

#endif
