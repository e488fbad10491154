#include "diagnostics/ObjectTracker.h"
#include "platform/Thread.h"
#include "sync/PlainAllocation.h"
#include "sync/Service.h"
#include <tessel/diagnostics/DebugStream.h>
#include <tessel/sync/ThMutex.h>

#include <memory>

namespace tessel {
namespace {

constexpr int32 kFree = -1;
constexpr int32 kExpectedMutexes = 1;  // left over without a report; a start and stop leaves none
ObjectTracker mutexTracker;

struct MutexRecord : THMUTEXREC, PlainAllocation {};

MgErr CreateMutex(ThMutex* mutex, const void* frame) {
    if (!mutex) return kArgErr;
    *mutex = nullptr;
    std::unique_ptr<MutexRecord> record(new (std::nothrow) MutexRecord);
    if (!record) return kMemFullErr;
    record->count = kFree;
    record->verifier = kThMutexVerifier;
    if (ThEventCreate(&record->event, 0, false) != kNoErr) return kMemFullErr;
    *mutex = record.release();
    mutexTracker.Add(frame, *mutex, sizeof(THMUTEXREC), __FILE__, __LINE__);
    return kNoErr;
}

bool TakeFree(ThMutex mutex) {
    int32 free = kFree;
    return __atomic_load_n(&mutex->count, __ATOMIC_RELAXED) == kFree &&
           __atomic_compare_exchange_n(&mutex->count, &free, 0, false, __ATOMIC_ACQUIRE, __ATOMIC_RELAXED);
}

// A sleep and a wake-up cost many times a short hold, and a mutex that was handed to a sleeper stays held until that
// wakes: so spin for about that long. Each look is twice as long after the one before, to leave the line to the holder.
bool SpinForFree(ThMutex mutex) {
    constexpr int kFirstPauses = 4, kLastPauses = 1024;  // some 40 us in all
    for (int pauses = kFirstPauses; pauses <= kLastPauses; pauses *= 2) {
        if (TakeFree(mutex)) return true;
        for (int i = 0; i < pauses; ++i) platform::SpinPause();
    }
    return TakeFree(mutex);
}

}  // namespace

MgErr ThMutexStart() {
    mutexTracker.Start();
    return kNoErr;
}

MgErr ThMutexStop() {
    mutexTracker.StopAndReport(kExpectedMutexes, "Mutex Leaks", "ovMutexLeaks.txt");
    return kNoErr;
}

}  // namespace tessel

using namespace tessel;

MgErr ThMutexCreate(ThMutex* mutex, CStr) {
    return CreateMutex(mutex, __builtin_frame_address(0));
}

void ThMutexDestroy(ThMutex mutex) {
    if (!mutex) return;
    if (mutex->verifier != kThMutexVerifier) {
        TESSEL_REPORT(kDebugError, 0x48D10A63u) << "bad mutex verifier in ThMutexDestroy";
        return;
    }
    mutexTracker.Remove(mutex);
    ThEventDestroy(mutex->event);
    mutex->verifier = 0;
    delete static_cast<MutexRecord*>(mutex);
}

void ThMutexAcquireHeld(ThMutex mutex) {
    if (SpinForFree(mutex)) return;
    if (__atomic_add_fetch(&mutex->count, 1, __ATOMIC_ACQ_REL) != 0) ThEventWait(mutex->event);
}

void ThMutexWakeNext(ThMutex mutex) {
    ThEventSignal(mutex->event);
}
