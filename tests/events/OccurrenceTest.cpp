#include "EventsTestSupport.h"
#include "events/Occurrences.h"
#include "events/Service.h"
#include "events/ThTmoEvent.h"
#include "memory/Heap.h"
#include "platform/posix/SystemCalls.h"
#include "support/FailingAllocator.h"
#include "support/HandClock.h"

#include <array>
#include <chrono>
#include <mutex>
#include <optional>
#include <signal.h>
#include <sys/time.h>

namespace tessel::test {
namespace {

class OccurrenceTest : public EventsTest {
protected:
    // Until another thread has noted so much. What never comes makes the test run out of time.
    template <class Condition>
    static void Await(Condition condition) {
        while (!condition()) std::this_thread::yield();
    }
    // The record behind a refnum, to damage it.
    static occh& RecordOf(OccurHdlr handler) {
        occh* record = nullptr;
        EXPECT_EQ(kNoErr, gHandlers.GetCookieInfo(handler, &record));
        return *record;
    }
};

TEST_F(OccurrenceTest, RefusesWhatIsNoRefnum) {
    const Occurrence gone = AllocOccur();
    const OccurHdlr handler = AllocOccurHdlr(0, Log::Note, Name("h")), freed = AllocOccurHdlr(gone, Log::Note, nullptr);
    EXPECT_EACH(ValidOccurrence(gone), DeallocOccur(gone) == kNoErr, DeallocOccurHdlr(freed) == kNoErr);
    for (uint32 bad : {Occurrence{0}, gone, handler ^ 0x00100000u}) {
        EXPECT_FALSE(ValidOccurrence(bad));
        for (auto* operation : {DeallocOccur, Occur, CancelOccurAtTime}) EXPECT_EQ(1, operation(bad));
        EXPECT_EQ(1, OccurAtTime(bad, 5));
        OccurIfValid(bad);
    }
    for (OccurHdlr bad : {OccurHdlr{0}, freed}) {
        for (auto* operation : {DeallocOccurHdlr, CancelOnOccur, FireOccurHdlr}) EXPECT_EQ(1, operation(bad));
        EXPECT_EACH(OnOccurrence(bad, false) == 1, OnOccurrenceWithTimeout(bad, false, 5) == 1,
                    BindOccurHdlr(bad, gone, Log::Note, nullptr) == 1, !HandlerTimedOut(bad));
    }
    EXPECT_EACH(OnOccurrence(handler, false) == 69, HandlerTimedOut(handler), CancelOnOccur(handler) == 1,
                DeallocOccurHdlr(handler) == kNoErr);
    EXPECT_THAT(Log::Take(), ElementsAre("h"));
}

TEST_F(OccurrenceTest, ReportsNullCallbacksAndDamagedLists) {
    const Occurrence o = AllocOccur();
    const OccurHdlr h = AllocOccurHdlr(o, nullptr, nullptr);
    const std::string skipped = "NULL callback for occurrence handler " + std::to_string(h) + "; skipped call";
    OnOccurrence(h, false);
    Occur(o);
    ChkOccurrences();
    Occur(o);
    OnOccurrence(h, false);
    BindOccurHdlr(h, o, Log::Note, Name("h"));
    OnOccurrenceWithTimeout(h, false, 1000000);
    BindOccurHdlr(h, o, nullptr, nullptr);
    EXPECT_THAT(reports.Texts(kDebugError),
                ElementsAre("Setting NULL callback proc", skipped, skipped,
                            "ARMED AND DANGEROUS! This occurrence is about to fire with a NULL callback proc!"));
    reports.Clear();

    BindOccurHdlr(h, o, Log::Note, Name("h"));
    occh& record = RecordOf(h);
    record.firedNode.refnum = record.occurrenceNode.refnum = 1;
    timedHandlers.Remove(record.timeout);
    record.timeout.SetRefnum(1);
    OnOccurrenceWithTimeout(h, false, 1000000);
    Occur(o);
    BindOccurHdlr(h, 0, Log::Note, Name("h"));
    BindOccurHdlr(h, o, Log::Note, Name("h"));
    ChkOccurrences();
    EXPECT_THAT(reports.Texts(kDebugError),
                ElementsAre("bogus handler list in OnOccurrenceWithTimeout()", "bogus handler list in _FireOccurHdlr()",
                            "bogus handler list in BindOccurHdlr()"));
    EXPECT_THAT(Log::Take(), ElementsAre("h"));  // each insertion went ahead
    record.fired = 1;
    EXPECT_EACH(CancelOnOccur(h) == kNoErr, reports.Has(kDebugInfo, "Handler marked as FIRED not on fired list!!"));

    TimeList::Entry nobodys(12345);
    {
        OccurrenceLockHolder timed(gTimedHdlrMutex);
        EXPECT_EQ(TESSEL_CHECK_LOCK_ORDER, OccurrenceLock::HeldRanks() != 0);
        timedHandlers.Insert(nobodys, MilliSecs(), MilliSecs(), TimeList::Among::kBeforeEquals);
    }
    OccurAtTime(o, MilliSecs() + 1000000);  // wakes the thread
    Await([&] { return reports.Has(kDebugInfo, "Bad occhandler in timeout list"); });
    DeallocOccurHdlr(h);
    DeallocOccur(o);
}

// ---- groups ---------------------------------------------------------------------------------------------------------

TEST_F(OccurrenceTest, ThreadsCheckTheirGroup) {
    static std::atomic<int> told;
    told = 0;
    auto tell = [](void* number) {
        EXPECT_EQ(0u, OccurrenceLock::HeldRanks() & ~3u);
        told += *static_cast<int*>(number);
    };
    int one = 1, hundred = 100;
    const Occurrence o = AllocOccur();
    const OccurHdlr h = AllocOccurHdlr(o, Log::Note, Name("joined"));
    for (int32 bad : {-1, 2048})
        EXPECT_EACH(SetOccThreadGroup(bad, 0) == 1, SetOccThreadGroup(0, bad) == 1,
                    SetOccThreadGroupProc(bad, tell, &one) == 1, ChkThGroupOccurrences(bad) == kNoErr,
                    !QuickCheckGroupHandlersFired(bad));
    EXPECT_EQ(kNoErr, SetOccThreadGroupProc(0, tell, &one));
    int32 index = 0;
    for (bool joins : {true, false}) {  // the second thread has the place of the first, and a group of its own
        std::thread([&] {
            ThThread self = nullptr;
            ThPseudoThreadCreate(&self);
            if (joins) {
                index = self->index;
                EXPECT_EQ(kNoErr, SetOccThreadGroup(index, 0));
            }
            EXPECT_EACH(index == self->index, SetOccThreadGroupProc(index, tell, joins ? &one : &hundred) == kNoErr);
            OnOccurrence(h, true);
            ThThreadDestroy(self);
        }).join();
        Occur(o);
        EXPECT_EACH(joins == QuickCheckGroupHandlersFired(0), !joins == QuickCheckGroupHandlersFired(index));
        ChkOccurrences();
        EXPECT_EQ(joins ? Texts{"joined"} : Texts{}, Log::Take());
    }
    EXPECT_EQ(101, told);
    ChkThGroupOccurrences(index);
    EXPECT_THAT(Log::Take(), ElementsAre("joined"));
    std::thread([&] { OnOccurrence(h, true); }).join();  // without a record
    Occur(o);
    EXPECT_TRUE(QuickCheckGroupHandlersFired(0));
    SetOccurrenceManagerMainThreadGroupIndex(7);
    EXPECT_EQ(7, GetOccurrenceManagerMainThreadGroupIndex());
    DeallocOccurHdlr(h);
    DeallocOccur(o);
    EXPECT_FALSE(QuickCheckGroupHandlersFired(0));
}

// ---- times ----------------------------------------------------------------------------------------------------------

TEST_F(OccurrenceTest, SetsWhatIsScheduledInOrder) {
    static std::mutex mutex;
    static Texts ran;
    static std::atomic<int> count;
    count = 0;
    auto note = [](void* name) {
        EXPECT_EQ(0u, OccurrenceLock::HeldRanks());
        std::lock_guard<std::mutex> hold(mutex);
        ran.push_back(static_cast<const char*>(name));
        ++count;
    };
    OccurrenceManagerService()->Uninit();            // nobody reads the clock while it is exchanged
    std::optional<HandClock> clock(4294967296 - 5);  // the millisecond clock is about to wrap
    OccurrenceManagerService()->Init();
    const uint32 now = MilliSecs();
    const char* names[] = {"a", "b", "c", "d", "e"};
    std::vector<Occurrence> occurrences;
    std::vector<OccurHdlr> handlers;
    for (const char* name : names) {
        occurrences.push_back(AllocOccur());
        handlers.push_back(AllocThreadSafeOccurHdlr(occurrences.back(), note, Name(name)));
        OnOccurrence(handlers.back(), false);
    }
    const OccurHdlr timed = AllocThreadSafeOccurHdlr(occurrences[4], note, Name("timed out"));
    OnOccurrenceWithTimeout(timed, true, 100000);
    OnOccurrenceWithTimeout(timed, true, 12);  // replaces the first
    const OccurHdlr dropped = AllocThreadSafeOccurHdlr(occurrences[0], note, Name("dropped"));
    OnOccurrenceWithTimeout(dropped, true, 3);
    BindOccurHdlr(dropped, occurrences[1], note, Name("bound"));
    OccurAtTime(occurrences[0], now + 5);  // 0 counts as 1
    OccurAtTime(occurrences[1], now + 9);
    OccurAtTime(occurrences[2], now + 9);  // before its equal
    OccurAtTime(occurrences[3], now + 90);
    OccurAtTime(occurrences[3], now + 2);
    OccurAtTime(occurrences[4], now + 1);
    CancelOccurAtTime(occurrences[4]);
    clock->Advance(11);
    Await([&] { return count == 5; });
    clock->Advance(1);
    Await([&] { return count == 6; });
    EXPECT_TRUE(HandlerTimedOut(timed));
    // Of one occurrence, the handler bound first runs first.
    EXPECT_EQ((Texts{"d", "a", "c", "b", "bound", "timed out"}), ran);
    // From a callback of the occurrence thread, everything may be called.
    static Occurrence last;
    static std::atomic<bool> done;
    done = false;
    last = occurrences[4];
    BindOccurHdlr(
        timed, occurrences[3],
        [](void* handler) {
            OccurAtTime(last, MilliSecs());
            CancelOccurAtTime(last);
            OnOccurrenceWithTimeout(*static_cast<OccurHdlr*>(handler), true, 100000);
            DeallocOccur(last);
            done = true;
        },
        const_cast<OccurHdlr*>(&timed));
    OnOccurrence(timed, true);
    OccurAtTime(occurrences[3], MilliSecs());
    Await([&] { return done.load(); });
    EXPECT_EQ("e", ran.back());
    for (OccurHdlr handler : handlers) DeallocOccurHdlr(handler);
    DeallocOccurHdlr(dropped);
    DeallocOccurHdlr(timed);
    for (int i = 0; i < 4; ++i) DeallocOccur(occurrences[static_cast<size_t>(i)]);
    OccurrenceManagerService()->Uninit();
    clock.reset();
    OccurrenceManagerService()->Init();
}

TEST_F(OccurrenceTest, ReportsATimedEventThatItCannotUse) {
    ThTmoEvent bad{};
    ThTmoEventDestroy(&bad);
    EXPECT_THAT(reports.Texts(kDebugError), ElementsAre("Bad ThTmoEvent in ThTmoEventDestroy()"));
    struct Refusing : PlatformEvent {
        int32 Signal() override { return 0; }
        int32 Reset() override { return 0; }
        int32 Wait(int32) override { return kFailed; }
        MgErr WaitAndPump(ThEventPumpProc, void*, int32) override { return kMemFullErr; }
        int32 MsgWaitMultiple(PlatformEvent*, bool, int32, bool*, bool*) override { return kFailed; }
        void GetLatencyStats(uint32*, _HRTime*, _HRTime*, _HRTime*, _HRTime*) override {}
        MgErr Init(bool) override { return kNoErr; }
        MgErr Uninit() override { return kMemFullErr; }
    };
    ThTmoEvent* event = ThTmoEventCreate();
    DestroyPlatformEvent(event->event);
    event->event = new Refusing;
    ThTmoEventWait(*event);
    EXPECT_THAT(reports.Texts(kDebugFatal), ElementsAre("Wait for single object failed"));
    ThTmoEventDestroy(event);
    EXPECT_TRUE(reports.Has(kDebugError, "CloseHandle() failed in ThTmoEventDestroy()"));
}

// ---- start and stop -------------------------------------------------------------------------------------------------

TEST_F(OccurrenceTest, StartsAsNewAfterEveryStop) {
    auto never = [](void*) { ADD_FAILURE(); };
    const Occurrence o = AllocOccur();
    const OccurHdlr left = AllocOccurHdlr(o, never, nullptr), fired = AllocOccurHdlr(o, never, nullptr);
    SetOccThreadGroup(0, 9);
    SetOccThreadGroupProc(
        9, [](void*) {}, nullptr);
    OnOccurrence(fired, false);
    Occur(o);
    OnOccurrenceWithTimeout(left, true, 30000);
    OccurAtTime(o, MilliSecs() + 30000);
    InterruptSafeOccur(o);
    Restart();
    EXPECT_THAT(reports.Texts(kDebugWarning), ElementsAre("UninitOccurrences: 1 leftover occurrences",
                                                          "UninitOccurrences: 2 leftover occurrence handlers"));
    reports.Clear();
    EXPECT_FALSE(ValidOccurrence(o) || QuickCheckGroupHandlersFired(9) || QuickCheckGroupHandlersFired(0));
    const Occurrence again = AllocOccur();
    const OccurHdlr handler = AllocOccurHdlr(again, Log::Note, Name("own group"));
    OnOccurrence(handler, false);
    Occur(again);
    ChkThGroupOccurrences(0);
    EXPECT_THAT(Log::Take(), ElementsAre("own group"));
    DeallocOccurHdlr(handler);
    DeallocOccur(again);

    OccurrenceManagerService()->Uninit();
    EXPECT_EACH((AllocOccur() | AllocOccurHdlr(0, never, nullptr)) == 0u, InterruptSafeOccur(again) == kNoErr,
                ChkOccurrences() == kNoErr, GetOccurrenceManagerAsyncArea() == nullptr);
    OccurrenceManagerService()->Init();
}

TEST_F(OccurrenceTest, SurvivesEveryAllocationThatFails) {
    OccurrenceManagerService()->Uninit();
    int refused = 0;
    for (bool failed = true; failed && !HasFailure();) {
        static int n = 0;
        const uint64 before = heap::TotalAllocated();
        FailingAllocator failing(++n);
        if (OccurrenceManagerStart() == kNoErr) {
            const Occurrence o = AllocOccur();
            const OccurHdlr h = AllocOccurHdlr(
                o, [](void*) {}, nullptr);
            const bool made = o && h;
            EXPECT_EQ(!made, (OnOccurrenceWithTimeout(h, false, 1000) | OccurAtTime(o, 1)) != kNoErr);
            refused += !made;
            DeallocOccurHdlr(h);
            DeallocOccur(o);
            OccurrenceManagerStop();
        } else {
            ++refused;
        }
        failed = failing.HasFailed();
        EXPECT_EQ(before, heap::TotalAllocated()) << n;
    }
    EXPECT_EACH(refused > 8, reports.CountAt(kDebugWarning) == 0u);
    OccurrenceManagerService()->Init();
}

// ---- the interrupt-safe area ----------------------------------------------------------------------------------------

struct Noted {
    std::atomic<uint32> posted{0}, seen{0};
    Occurrence occurrence = 0;
    OccurHdlr handler = 0;

    static void See(void* noted) {
        auto* own = static_cast<Noted*>(noted);
        own->seen = own->posted.load();
        OnOccurrence(own->handler, false);
    }
    void Alloc() {
        occurrence = AllocOccur();
        handler = AllocThreadSafeOccurHdlr(occurrence, See, this);
        OnOccurrence(handler, false);
    }
    void Post() {
        ++posted;
        InterruptSafeOccur(occurrence);
    }
    void ExpectNothingLost() {
        EXPECT_EQ(posted, seen);
        DeallocOccurHdlr(handler);
        DeallocOccur(occurrence);
    }
};

TEST_F(OccurrenceTest, TheAreaTakesAsManyAsItHasSlots) {
    static int warnings;
    warnings = 0;
    std::vector<Noted> noted(1024);
    for (Noted& each : noted) each.Alloc();
    SetResetCountDownRegCallbackProc([] { ++warnings; });
    for (int i = 0; i < 1023; ++i) EXPECT_EQ(kNoErr, (++noted[i].posted, InterruptSafeOccur(noted[i].occurrence)));
    EXPECT_EACH(warnings == 10, InterruptSafeOccur(noted[1023].occurrence) == 70);
    for (int i : {0, 500, 1022}) EXPECT_EQ(kNoErr, InterruptSafeOccur(noted[i].occurrence));
    EXPECT_EQ(11, warnings);
    SetResetCountDownRegCallbackProc(nullptr);
    ChkOccurrences();
    EXPECT_FALSE(QuickCheckGroupHandlersFired(0));
    OccurAsyncArea* area = GetOccurrenceManagerAsyncArea();
    for (int i : {0, 1}) {  // as a host does it
        ++noted[i].posted;
        area->slots[i] = {1, 0, noted[i].occurrence};
    }
    EXPECT_TRUE(QuickCheckGroupHandlersFired(0));
    Occur(noted[5].occurrence);
    EXPECT_FALSE(QuickCheckGroupHandlersFired(0));
    for (Noted& each : noted) each.ExpectNothingLost();
}

std::array<Noted, 64> signalled;

TEST_F(OccurrenceTest, NothingIsLostThatSignalHandlersPost) {
    for (Noted& each : signalled) each.Alloc();
    static std::atomic<uint32> signals;
    signals = 0;
    struct sigaction action {
    }, old{};
    action.sa_handler = [](int) { signalled[++signals % signalled.size()].Post(); };
    sigaction(SIGALRM, &action, &old);
    itimerval each100us{{0, 100}, {0, 100}}, never{};
    const auto end = std::chrono::steady_clock::now() +
                     std::chrono::milliseconds(1000 * Amount("TESSEL_TEST_EVENT_SECONDS", 0) + 200);
    setitimer(ITIMER_REAL, &each100us, nullptr);
    while (std::chrono::steady_clock::now() < end || signals < 100) ChkOccurrences();
    setitimer(ITIMER_REAL, &never, nullptr);
    sigaction(SIGALRM, &old, nullptr);
    ChkOccurrences();
    RecordProperty("signals", static_cast<int>(signals));
    for (Noted& each : signalled) each.ExpectNothingLost();
}

TEST_F(OccurrenceTest, NothingIsLostThatManyThreadsPost) {
    std::vector<Noted> noted(64);
    for (Noted& each : noted) each.Alloc();
    std::atomic<int> posting{8};
    InThreads(9, [&](int thread) {
        while (thread == 8 && posting > 0) ChkOccurrences();
        for (size_t n = 0; thread < 8 && n < 5000; ++n) noted[n % 8 * 8 + static_cast<size_t>(thread)].Post();
        if (thread < 8) --posting;
    });
    ChkOccurrences();
    for (Noted& each : noted) each.ExpectNothingLost();
}

// ---- many threads ---------------------------------------------------------------------------------------------------

// Things that many threads make, use and free at random. A callback counts for the slot of its handler.
constexpr size_t kSlots = 16;
std::array<std::atomic<Occurrence>, kSlots> occurrences;
struct Slot {
    std::atomic<OccurHdlr> handler{0};
    std::atomic<uint64> calls{0}, arms{0};
};
std::array<Slot, kSlots> slots;

void CountCall(void* slot) {
    EXPECT_EQ(0u, OccurrenceLock::HeldRanks());
    ++static_cast<Slot*>(slot)->calls;
}

void DoAnything(std::mt19937& random) {
    Slot& slot = slots[random() % kSlots];
    std::atomic<Occurrence>& occurrence = occurrences[random() % kSlots];
    auto* alloc = std::array{AllocOccurHdlr, AllocOccurHdlrStrict, AllocThreadSafeOccurHdlr}[random() % 3];
    const auto arm = [&](MgErr (*how)(OccurHdlr, bool)) {
        ++slot.arms;
        how(slot.handler, random() % 4 == 0);
    };
    const std::function<void()> operations[] = {
        [&] { DeallocOccur(occurrence.exchange(AllocOccur())); },
        [&] { DeallocOccurHdlr(slot.handler.exchange(alloc(occurrence, CountCall, &slot))); },
        [&] { BindOccurHdlr(slot.handler, occurrence, CountCall, &slot); },
        [&] { CancelOnOccur(slot.handler); },
        [&] { FireOccurHdlr(slot.handler); },
        [&] { OccurAtTime(occurrence, MilliSecs() + random() % 3); },
        [&] { CancelOccurAtTime(occurrence); },
        [&] { InterruptSafeOccur(occurrence); },
        [&] { arm([](OccurHdlr h, bool reset) { return OnOccurrenceWithTimeout(h, reset, reset ? 1 : 5); }); },
        [&] { arm(OnOccurrence); },
        [&] { ChkThGroupOccurrences(static_cast<int32>(random() % 10)); },
        [&] { Occur(occurrence); }};
    operations[std::array{0, 1, 2, 3, 4, 5, 6, 7, 8, 9, 9, 10, 10, 11, 11, 11}[random() % 16]]();
}

TEST_F(OccurrenceTest, ManyThreadsDoAnythingAtOnce) {
    const auto end = std::chrono::steady_clock::now() +
                     std::chrono::milliseconds(1000 * Amount("TESSEL_TEST_EVENT_SECONDS", 0) + 300);
    for (auto& occurrence : occurrences) occurrence = AllocOccur();
    for (Slot& slot : slots) slot.handler = AllocOccurHdlr(0, CountCall, &slot);
    std::atomic<uint64> operations{0};
    InThreads(8, [&](int seed) {
        std::mt19937 random(static_cast<unsigned>(seed));
        ThThread self = nullptr;
        ThPseudoThreadCreate(&self);
        do {
            for (int i = 0; i < 1000; ++i) DoAnything(random);
            operations += 1000;
        } while (std::chrono::steady_clock::now() < end);
        ThThreadDestroy(self);
    });
    for (int32 group = 0; group < 16; ++group) ChkThGroupOccurrences(group);
    RecordProperty("operations", std::to_string(operations));
    for (Slot& slot : slots) {
        EXPECT_LE(slot.calls, slot.arms);  // each arming has one callback at most
        const uint64 before = slot.calls;
        const Occurrence fresh = AllocOccur();
        CancelOnOccur(slot.handler);
        BindOccurHdlr(slot.handler, fresh, CountCall, &slot);
        OnOccurrence(slot.handler, true);
        Occur(fresh);
        Occur(fresh);
        ChkOccurrences();
        EXPECT_EQ(before + 1, slot.calls);
        DeallocOccurHdlr(slot.handler);
        DeallocOccur(fresh);
    }
    for (auto& occurrence : occurrences) DeallocOccur(occurrence);
    EXPECT_EQ(0u, reports.CountAt(kDebugError));
}

}  // namespace
}  // namespace tessel::test
