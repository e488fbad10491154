#include "platform/Thread.h"
#include "support/HandClock.h"
#include "support/Test.h"
#include "support/malloc/FailingMalloc.h"
#include "sync/ProtectedAtomicOperations.h"
#include "sync/Service.h"
#include <tessel/sync/PlatformEvent.h>
#include <tessel/sync/PlatformEventTimer.h>
#include <tessel/sync/PlatformMutex.h>
#include <tessel/sync/ThAtomic.h>
#include <tessel/sync/ThEvent.h>
#include <tessel/sync/ThLocalStorage.h>
#include <tessel/sync/ThMutex.h>
#include <tessel/sync/ThSleep.h>
#include <tessel/time/Millisecs.h>

namespace tessel::test {
namespace {

struct Sync : ::testing::Test {
    test::ReportRecorder reports;

    ThEvent NewEvent(bool signaled = false) {
        ThEvent event = nullptr;
        EXPECT_EQ(kNoErr, ThEventCreate(&event, 0, signaled));
        return event;
    }
    ThMutex NewMutex() {
        ThMutex mutex = nullptr;
        EXPECT_EQ(kNoErr, ThMutexCreate(&mutex, "test"));
        return mutex;
    }
};

TEST_F(Sync, SignalsCountAsOneUntilTheyAreTaken) {
    ThEvent event = NewEvent(true);
    EXPECT_EACH(event->verifier == kThEventVerifier, ThEventReset(event) == 1, ThEventReset(event) == 0,
                ThEventSignal(event) == 0, ThEventSignal(event) == 0, ThEventWaitWithTimeout(event, 0) == kNoErr,
                ThEventWaitWithTimeout(event, 0) == kTimeOutErr, ThEventWaitWithTimeout(event, 20) == kTimeOutErr);
    ThEventDestroy(event);
}

// One slot between makers and takers. The two events are all that guards it: a signal that is lost stops them, one that
// two threads take breaks the slot. The takers wait in all ways there are. TESSEL_TEST_HANDOVERS makes it more than
// the few that a test run has time for.
TEST_F(Sync, EverySignalReleasesOneOfManyThreads) {
    constexpr int kMakers = 4, kTakers = 4;
    const char* wanted = std::getenv("TESSEL_TEST_HANDOVERS");
    const int64 handovers = wanted ? std::atoll(wanted) : 20000, each = handovers / kTakers;
    ThEvent empty = NewEvent(true), full = NewEvent(), never = NewEvent();
    int64 slot = 0, made = 0;  // what is in the slot, 0 for nothing; all that was ever in it
    std::atomic<int64> sum{0};
    auto make = [&] {
        for (int64 i = 0; i < each; ++i) {
            ASSERT_EQ(kNoErr, ThEventWaitWithTimeout(empty, 100000));
            ASSERT_EQ(0, slot);
            slot = ++made;
            ThEventSignal(full);
        }
    };
    auto take = [&](int kind) {
        for (int64 taken = 0; taken < each;) {
            bool got = kind == 0   ? ThEventWaitWithTimeout(full, 1) == kNoErr
                       : kind == 1 ? ThEventMsgWaitMultiple(full, never, 100000, true) == 1
                                   : ThEventWait(full) == kNoErr;
            if (!got) continue;
            ASSERT_NE(0, slot);
            sum += std::exchange(slot, 0);
            ++taken;
            ThEventSignal(empty);
        }
    };
    InThreads(kMakers + kTakers, [&](int thread) { thread < kMakers ? make() : take(thread - kMakers); });
    EXPECT_EACH(each * kTakers == made, made * (made + 1) / 2 == sum, ThEventWaitWithTimeout(empty, 0) == kNoErr,
                ThEventWaitWithTimeout(full, 0) == kTimeOutErr);
    for (ThEvent event : {empty, full, never}) ThEventDestroy(event);
}

// The signaling thread may still be on its way out of the event when the waiter ends it.
TEST_F(Sync, AnEventMayEndWithTheWaitForIt) {
    constexpr int kEvents = 20000;
    std::atomic<ThEvent> done{nullptr};
    std::thread signaler([&] {
        for (int i = 0; i < kEvents; ++i) {
            ThEvent event;
            while (!(event = done.exchange(nullptr))) std::this_thread::yield();
            ThEventSignal(event);
        }
    });
    for (int i = 0; i < kEvents; ++i) {
        ThEvent event = NewEvent();
        done = event;
        if (i % 2 == 0)
            EXPECT_EQ(kNoErr, ThEventWaitWithTimeout(event, 100000));
        else
            EXPECT_EQ(1, ThEventMsgWaitMultiple(event, nullptr, 100000, true));
        ThEventDestroy(event);
    }
    signaler.join();
}

int customSignals;

TEST_F(Sync, SignalsCallTheirProcedureFirst) {
    ThEvent event = nullptr;
    customSignals = 0;
    EXPECT_EQ(kNoErr, ThEventCreateWithCustomSignal(&event, 7, false, [] { ++customSignals; }));
    ThEventSignal(event);
    ThEventSignal(event);
    EXPECT_EQ(2, customSignals);
    ThEventDestroy(event);
}

TEST_F(Sync, WaitsForSeveralThings) {
    ThEvent first = NewEvent(), second = NewEvent();
    EXPECT_EQ(0, ThEventMsgWaitMultiple(first, second, 0, false));
    ThEventSignal(second);
    EXPECT_EQ(0, ThEventMsgWaitMultiple(first, second, 1000, true));
    EXPECT_EQ(kTimeOutErr, ThEventWaitWithTimeout(second, 0));  // its signal was taken
    ThEventSignal(first);
    EXPECT_EQ(1, ThEventMsgWaitMultiple(first, second, 1000, true));
    ThEventSignal(first);
    EXPECT_EQ(1, ThEventMsgWaitMultiple(first, first, 1000, false));
    const uint32 self = platform::CurrentThreadId();
    uint32 ended = 0;
    std::thread([&] {
        ended = platform::CurrentThreadId();
        EXPECT_EQ(kNoErr, ThEventMessageArrived(ended));  // a message to another thread
        EXPECT_EQ(kNoErr, ThEventMessageArrived(self));
        EXPECT_EQ(0, ThEventMsgWaitMultiple(first, nullptr, -1, true));
    }).join();
    while (ThEventMessageArrived(ended) == kNoErr) std::this_thread::yield();  // until the host has let go of it
    EXPECT_EACH(ThEventMessageArrived(ended) == kArgErr, ThEventMsgWaitMultiple(first, nullptr, 0, false) == 0);
    EXPECT_EQ(0, ThEventMsgWaitMultiple(first, nullptr, -1, true));  // the message, or it would wait for ever
    std::thread signaler([&] { ThEventSignal(first); });
    EXPECT_EQ(1, ThEventMsgWaitMultiple(first, second, -1, true));
    signaler.join();

    int calls = 0;
    auto pump = [](void* argument) -> MgErr { return ++*static_cast<int*>(argument) + 40; };
    EXPECT_EACH(ThEventWaitAndPump(first, pump, 10, &calls) == kMemFullErr,
                ThEventWaitAndPump(nullptr, pump, 10, &calls) == 42);
    ThEventDestroy(first);
    ThEventDestroy(second);
}

TEST_F(Sync, BadEventsAreReported) {
    THEVENTREC bad{0, nullptr, nullptr};
    EXPECT_EACH(ThEventSignal(&bad) == 0, ThEventReset(&bad) == 0, ThEventWait(&bad) == kArgErr,
                ThEventMsgWaitMultiple(&bad, nullptr, 0, false) == 1);
    ThEventDestroy(&bad);
    EXPECT_THAT(reports.Texts(kDebugFatal), ElementsAre("Bad verifier in event.", "", "", "", ""));
    EXPECT_EACH(ThEventSignal(nullptr) == 0, ThEventReset(nullptr) == 0, ThEventWait(nullptr) == kArgErr,
                ThEventMsgWaitMultiple(nullptr, nullptr, 0, false) == 1);
    ThEventDestroy(nullptr);
    EXPECT_THAT(reports.Texts(kDebugError), ElementsAre("Bad ThEvent in ThEventDestroy()"));
    THMUTEXREC badMutex{-1, nullptr, 0};
    ThMutexDestroy(&badMutex);
    EXPECT_TRUE(reports.Has(kDebugError, "bad mutex verifier in ThMutexDestroy"));
    ThMutexDestroy(nullptr);
    ThMutexAcquire(nullptr);
    ThMutexRelease(nullptr);
}

// An event of another platform: it has measured, its waits end as told, and it refuses to end.
class ForeignEvent final : public PlatformEvent {
public:
    int32 result = kFailed;

    int32 Signal() override { return 0; }
    int32 Reset() override { return 0; }
    int32 Wait(int32) override { return result; }
    MgErr WaitAndPump(ThEventPumpProc, void*, int32) override { return 0; }
    int32 MsgWaitMultiple(PlatformEvent*, bool, int32, bool*, bool*) override { return 0; }
    void GetLatencyStats(uint32* count, _HRTime* total, _HRTime*, _HRTime* minimum, _HRTime* maximum) override {
        test::HandClock clock(1000);
        PlatformEventTimer timer;
        for (int latency : {3, 1, 4}) {
            timer.Start();
            clock.Advance(latency);
            timer.RecordLatency();
        }
        clock.Advance(-2);
        timer.Start();
        clock.Advance(-1);
        timer.RecordLatency();  // the clock went backwards: not counted
        timer.GetLatencyStats(count, total, nullptr, minimum, maximum);
    }
    MgErr Init(bool) override { return kNoErr; }
    MgErr Uninit() override { return kGenericErr; }
};

TEST_F(Sync, WhatThePlatformSaysIsReported) {
    ThEvent event = NewEvent();
    DestroyPlatformEvent(event->platformEvent);
    ForeignEvent* foreign = new ForeignEvent;
    event->platformEvent = foreign;
    EXPECT_EACH(ThEventWait(event) == kArgErr, reports.CountAt(kDebugFatal) == 1u);
    foreign->result = PlatformEvent::kRetry;
    EXPECT_EACH(ThEventWait(event) == kArgErr, reports.CountAt(kDebugWarning) == 1u);
    ThEventDestroy(event);
    EXPECT_THAT(reports.Texts(),
                ElementsAre("Wait on event failed", "We were not supposed to retry here",
                            "ThEventDestroy:: (ms) avg latency=2.66667; nEvents=3; min=1.00000; max=4.00000",
                            "DestroyPlatformEvent failed with MgErr 42."));
}

TEST_F(Sync, WithoutMemoryNothingIsMade) {
    int failures = test::WithEachAllocationFailing([] {
        ThEvent event = nullptr;
        ThMutex mutex = nullptr;
        const MgErr eventErr = ThEventCreate(&event, 0, true), mutexErr = ThMutexCreate(&mutex, nullptr);
        EXPECT_EACH((event ? kNoErr : kMemFullErr) == eventErr, (mutex ? kNoErr : kMemFullErr) == mutexErr);
        if (event) ThEventDestroy(event);
        ThMutexDestroy(mutex);
    });
    EXPECT_LE(3, failures);  // the event, the mutex and its event; what the host has for events may be spare
}

TEST_F(Sync, MutexesExclude) {
    constexpr int kThreads = 8, kRounds = 20000;
    ThMutex mutex = NewMutex();
    int count = 0;
    InThreads(kThreads, [&](int thread) {
        for (int i = 0; i < kRounds; ++i) {
            ThMutexHolder hold(mutex);
            ++count;
            if (i % 5000 == thread) std::this_thread::yield();
        }
    });
    EXPECT_EACH(kThreads * kRounds == count, mutex->count == -1, mutex->verifier == kThMutexVerifier);
    ThMutexDestroy(mutex);
}

TEST_F(Sync, ASleeperIsHandedTheMutex) {
    ThMutex mutex = NewMutex();
    ThMutexAcquire(mutex);
    bool reached = false;
    std::thread waiter([&] {
        ThMutexAcquire(mutex);
        reached = true;
        ThMutexRelease(mutex);
    });
    while (__atomic_load_n(&mutex->count, __ATOMIC_ACQUIRE) != 1) std::this_thread::yield();
    EXPECT_FALSE(reached);
    ThMutexRelease(mutex);
    waiter.join();
    EXPECT_EACH(reached, mutex->count == -1);
    ThMutexDestroy(mutex);
}

TEST_F(Sync, TrackersReportWhatIsLeft) {
    EXPECT_EACH(ThEventStart() == kNoErr, ThMutexStart() == kNoErr);
    ThMutex one = NewMutex(), two = NewMutex();
    ThEventDestroy(NewEvent());
    EXPECT_EQ(kNoErr, ThMutexStop());
    ThMutexDestroy(two);
    EXPECT_EQ(kNoErr, ThEventStop());
    EXPECT_THAT(reports.Texts(kDebugInfo), Contains(EndsWith("(1) : 2 Mutex Leaks (1 expected)")));
    EXPECT_TRUE(reports.Has(kDebugInfo, "Total Event Leaks = 1.\n"));  // as many as expected
    ThMutexDestroy(one);
}

TEST(Atomics, ReturnWhatTheyShould) {
    int32 word = 0x7FFFFFFF;
    EXPECT_EACH(_ThAtomicInc(&word) == INT32_MIN, _ThAtomicDec(&word) == 0x7FFFFFFF,
                ThAtomicSwap(&word, 5) == 0x7FFFFFFF, ThSwapIfSame(&word, 6, 4) == 0, word == 5,
                ThSwapIfSame(&word, 6, 5) == 1, word == 6);
    void* pointer = &word;
    EXPECT_EACH(&word == ThAtomicSwapPtr(&pointer, nullptr), ThSwapIfSamePtr(&pointer, &word, &word) == 0,
                ThSwapIfSamePtr(&pointer, &word, nullptr) == 1, &word == pointer);
}

// Writers store words whose halves agree; no reader may see two halves of different writes.
TEST_F(Sync, EightBytesGoAtOnce) {
    EXPECT_EACH(ProtectedAtomicOperationsStart() == kNoErr, AtomicsInHardware());
    for (bool hardware : {true, false}) {
        SetAtomicsInHardware(hardware);
        ThMutex mutex = NewMutex();
        std::atomic<int> torn{0};
        uint64 shared = 0;
        InThreads(4, [&](int thread) {
            for (uint64 i = 0; i < 5000; ++i) {
                uint64 half = i * 4 + static_cast<uint64>(thread), own = half << 32 | half, seen;
                Th8ByteAtomicWrtRd(&own, &shared, 1, mutex);
                Th8ByteAtomicWrtRd(&seen, &shared, 0, mutex);
                if (seen >> 32 != (seen & 0xFFFFFFFF)) ++torn;
            }
        });
        EXPECT_EQ(0, torn);
        uint64 own = 1, last = shared;
        Th8ByteAtomicWrtRd(&own, &shared, 0, nullptr);
        EXPECT_EACH(last == own, last == shared);
        ThMutexDestroy(mutex);
    }
    ProtectedAtomicOperationsStart();
}

TEST(Sleeping, EndsJustBeforeTheDeadline) {
    test::HandClock clock(5000);
    uint32 now = MilliSecs();
    EXPECT_EACH(now == ThWaitTill(now, now), now == ThWaitTill(now - 5, now), now + 1 == ThWaitTill(now + 1, now));
    now = MilliSecs();
    EXPECT_EQ(now + 99, ThWaitTill(now + 100, now));
    ThSleep(7);
    EXPECT_EQ(now + 106, MilliSecs());
    ThPause(3);
}

TEST(LocalStorage, KeepsAValueForEachThread) {
    uint32 key = ThLocalStorageAllocateKey(), other = ThLocalStorageAllocateKey();
    ASSERT_NE(kThNoLocalStorageKey, key);
    ASSERT_NE(key, other);
    ThLocalStorageSetValue(key, &key);
    InThreads(2, [&](int thread) {
        EXPECT_EQ(nullptr, ThLocalStorageGetValue(key));
        ThLocalStorageSetValue(key, &thread);
        EXPECT_EQ(&thread, ThLocalStorageGetValue(key));
    });
    EXPECT_EACH(&key == ThLocalStorageGetValue(key), ThLocalStorageGetValue(other) == nullptr);
    ThLocalStorageFreeKey(key);
    ThLocalStorageFreeKey(other);
}

TEST(PlatformObjects, WorkByThemselves) {
    PlatformEvent* event = CreatePlatformEvent(true);
    ASSERT_NE(nullptr, event);
    EXPECT_EACH(event->Wait(0) == 0, event->Wait(0) == 1);
    uint32 count = 5;
    _HRTime total{1, 1};
    event->GetLatencyStats(&count, &total, nullptr, nullptr, nullptr);
    EXPECT_EACH(count + total.high + total.low == 0u, DestroyPlatformEvent(event) == kNoErr,
                DestroyPlatformEvent(nullptr) == kNoErr);
    PlatformMutex* mutex = CreatePlatformMutex();
    ASSERT_NE(nullptr, mutex);
    int sum = 0;
    InThreads(4, [&](int) {
        for (int i = 0; i < 5000; ++i) {
            mutex->Lock();
            ++sum;
            mutex->Unlock();
        }
    });
    EXPECT_EACH(sum == 20000, DestroyPlatformMutex(mutex) == kNoErr, DestroyPlatformMutex(nullptr) == kNoErr);
}

}  // namespace
}  // namespace tessel::test
