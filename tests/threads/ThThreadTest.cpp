#include "platform/posix/SystemCalls.h"
#include "support/ScratchDrive.h"
#include "support/StartedLibrary.h"
#include "support/Test.h"
#include "threads/Service.h"
#include <tessel/sync/ThEvent.h>
#include <tessel/threads/ThThread.h>

#include <errno.h>
#include <filesystem>
#include <linux/futex.h>
#include <pthread.h>
#include <sys/resource.h>
#include <sys/syscall.h>
#include <unistd.h>

namespace {

using namespace tessel::test;
using tessel::platform::systemCalls;

class ThThreadTest : public testing::Test {
protected:
    ThThreadTest() {
        EXPECT_EQ(AssimilateStartUpThread(), 1);
        reports_.Clear();
    }
    // The service with other priorities. Threads have to be assimilated again.
    void Restart(tessel::ThreadPriorityReader configured) {
        EXPECT_EQ(tessel::ThThreadStop(), kNoErr);
        reports_.Clear();
        EXPECT_EQ(tessel::ThThreadStart(configured), kNoErr);
    }
    ThThread StartThread(ThThreadProc procedure, void* argument = nullptr) {
        ThThread thread = nullptr;
        EXPECT_EQ(ThThreadCreate(&thread, procedure, argument, "name"), kNoErr);
        return thread;
    }

    tessel::test::ReportRecorder reports_;
    tessel::test::StartedLibrary library_;
};

// Waits until it is let go.
int32 AwaitEvent(void* event) {
    return ThEventWait(static_cast<ThEvent>(event));
}

size_t ThreadsOfProcess() {
    std::filesystem::directory_iterator tasks("/proc/self/task");
    return static_cast<size_t>(std::distance(begin(tasks), end(tasks)));
}

// The host lists a thread for a moment after its end. One that is left for good makes the test run out of time.
void AwaitThreads(size_t most) {
    while (ThreadsOfProcess() > most) std::this_thread::yield();
}

TEST(ThThreadPriorities, AreTheUsualOnesUntilTheStart) {
    int32 p[5];
    uint8 distinct[5];
    ThThreadGetNativePriorityInfo(&p[0], &p[1], &p[2], &p[3], &p[4]);
    ThThreadGetPrioInfo(distinct);
    EXPECT_THAT(p, ElementsAre(-15, 0, 1, 2, 15));
    EXPECT_THAT(distinct, ElementsAre(1, 1, 1, 1, 1));
}

// ---- identity and the table -----------------------------------------------------------------------------------------

TEST_F(ThThreadTest, KnowsItsThreads) {
    struct Seen {
        ThEvent go;
        ThThread own;
        int32 index;
        bool startUp;
    } seen{nullptr, nullptr, -1, true};
    ThEventCreate(&seen.go, 0, false);
    ThThread thread = StartThread(
        [](void* argument) {
            Seen& mine = *static_cast<Seen*>(argument);
            mine.own = ThThreadGetId();
            mine.index = ThThreadGetIndex(nullptr);
            mine.startUp = IsStartUpThread();
            return AwaitEvent(mine.go);
        },
        &seen);
    EXPECT_EACH(ThThreadGetIndex(nullptr) == 0, IsStartUpThread(), ThThreadActive(thread));
    int a = 0, b = 0;
    void* valueA = nullptr;
    ThSetThInfo(thread, &a, &b);
    EXPECT_EACH(ThGetThInfo(thread, &valueA) == &b, valueA == &a, ThGetThInfo(nullptr, &valueA) == nullptr,
                valueA == nullptr);
    ThPlatformThread* handle = nullptr;
    uint32* id = nullptr;
    ThGetPlatformThread(thread, &handle, &id);
    EXPECT_TRUE(handle == &thread->platformThread && id == &thread->platformId);
    ThGetPlatformThread(nullptr, &handle, &id);
    EXPECT_TRUE(handle == nullptr && id == nullptr);
    ThEventSignal(seen.go);
    while (ThThreadActive(thread)) std::this_thread::yield();
    EXPECT_TRUE(seen.own == thread && seen.index == 1 && !seen.startUp);
    ThThreadDestroy(thread);
    ThEventDestroy(seen.go);
    EXPECT_THAT(reports_.Texts(), IsEmpty());
}

TEST_F(ThThreadTest, HasNoIdentityBeforeTheStartUpThread) {
    Restart(nullptr);
    EXPECT_EACH(ThThreadGetId() == nullptr, ThThreadGetIndex(nullptr) == 2048,
                (Texts{"bad ThThread in ThThreadGetIndex()"}) == reports_.Texts(kDebugError),
                AssimilateStartUpThread() == 1);
    std::thread([] {
        ThThread adopted = nullptr;
        EXPECT_EACH(ThThreadGetId() == nullptr, ThPseudoThreadCreate(&adopted) == kNoErr, ThThreadGetId() == adopted,
                    adopted->adopted == 1, ThThreadActive(adopted));
        ThThreadDestroy(adopted);
        EXPECT_EQ(ThThreadGetId(), nullptr);
    }).join();
}

TEST_F(ThThreadTest, RefusesOneMoreThanTheTableHolds) {
    std::thread([&] {
        std::vector<ThThread> records(2047);  // and the start-up thread
        for (ThThread& record : records) ASSERT_EQ(ThPseudoThreadCreate(&record), kNoErr);
        ThThread started = ThThreadGetId(), adopted = started;
        EXPECT_EQ(ThThreadCreate(
                      &started,
                      [](void*) {
                          std::abort();
                          return 0;
                      },
                      nullptr, nullptr),
                  kMemFullErr);
        EXPECT_EACH(ThPseudoThreadCreate(&adopted) == kMemFullErr, started == nullptr, adopted == nullptr,
                    ThThreadGetId() == records.back());
        const int32 freed = ThThreadGetIndex(records[100]);
        ThThreadDestroy(records[100]);  // not the calling thread's current record
        EXPECT_THAT(reports_.Texts(), ElementsAre("Thread Array full!!", "Thread Array full!!",
                                                  "WARNING: Destroying PseudoThread from another thread"));
        records[100] = StartThread(nullptr);
        EXPECT_EQ(ThThreadGetIndex(records[100]), freed);
        for (ThThread record : records) ThThreadDestroy(record);
    }).join();
    tessel::ThThreadStop();
    EXPECT_TRUE(reports_.Has(kDebugInfo, "Total Thread Leaks = 0.\n"));
}

TEST_F(ThThreadTest, GivesEachOfManyThreadsAPlaceOfItsOwn) {
    static std::atomic<int> users[kMaxThThreads], collisions, ended;
    collisions = ended = 0;
    tessel::test::InThreads(4, [this](int) {
        for (int round = 0; round < 100; ++round) {
            ThThread thread = StartThread([](void*) -> int32 {
                std::atomic<int>& mine = users[ThThreadGetIndex(nullptr)];
                if (mine++ != 0) ++collisions;
                --mine;
                return ++ended;
            });
            ThThread hasty = StartThread([](void*) -> int32 { return ThThreadGetIndex(nullptr) != 0 ? ++ended : 0; });
            for (int spin = 0; spin < round % 5 * 100; ++spin) ThThreadActive(hasty);
            ThThreadDestroy(hasty);                                    // while it begins, runs or ends
            while (ThThreadActive(thread)) std::this_thread::yield();  // its place is taken as long as it uses it
            ThThreadDestroy(thread);
        }
    });
    EXPECT_EACH(ended == 4 * 100 * 2, collisions == 0, reports_.Texts().empty());
}

// ---- ending ---------------------------------------------------------------------------------------------------------

TEST_F(ThThreadTest, ReportsBadRecordsAndThreadsThatAreLeft) {
    THTHREADREC bad{};
    ThThreadDestroy(nullptr);
    ThThreadDestroy(&bad);
    EXPECT_EACH(ThThreadGetIndex(&bad) == 2048, ThThreadGetPriority(&bad) == kThPriorityNormal,
                ThThreadSetPriority(&bad, 1) == kNoErr, !ThThreadActive(&bad),
                (Texts{"threadp does not have correct verifier in ThThreadDestroy",
                       "bad ThThread in ThThreadGetIndex()", "invalid ThThread passed to ThThreadGetPriority",
                       "bad argument to ThThreadSetPriority()", ""}) == reports_.Texts(kDebugError));

    tessel::test::ScratchDrive drive;
    ::setenv("TMPDIR", drive.Native().c_str(), 1);
    ThThread left = StartThread(nullptr);
    while (ThThreadActive(left)) std::this_thread::yield();
    Restart(nullptr);
    ::unsetenv("TMPDIR");
    EXPECT_THAT(drive.Get("ovThreadLeaks.txt"), testing::HasSubstr("Number of unfreed items: 1\n"));
    reports_.Clear();
    ThThreadDestroy(left);
    EXPECT_THAT(reports_.Texts(), ElementsAre("disposing thread out of range"));
}

// A clock that leaps over every long wait.
struct LeapOverLongWaits {
    static inline std::atomic<int64_t> leapt{0};  // seconds
    static inline thread_local bool isWatched = false;
    static inline std::atomic<bool> waits{false};  // the thread that is watched
    static inline tessel::platform::SystemCalls original;

    static int Clock(clockid_t clock, timespec* time) {
        int result = original.clock_gettime(clock, time);
        time->tv_sec += static_cast<time_t>(leapt);
        return result;
    }
    static long Futex(uint32_t* word, int operation, uint32_t value, const timespec* timeout) {
        const int kind = operation & FUTEX_CMD_MASK;
        if (isWatched && (kind == FUTEX_WAIT || kind == FUTEX_WAIT_BITSET)) waits = true;
        if (!timeout || timeout->tv_sec < 5) return original.futex(word, operation, value, timeout);
        leapt += timeout->tv_sec + 1;
        errno = ETIMEDOUT;
        return -1;
    }
    LeapOverLongWaits() {
        original = systemCalls;
        systemCalls.clock_gettime = Clock;
        systemCalls.futex = Futex;
    }
    ~LeapOverLongWaits() { systemCalls = original; }
};

TEST_F(ThThreadTest, EndsAThreadThatIgnoresItsStopByForce) {
#if defined(__SANITIZE_THREAD__) || defined(__SANITIZE_ADDRESS__)
    GTEST_SKIP() << "the sanitizers keep books on threads, which one that ends by force leaves open";
#endif
    const size_t before = ThreadsOfProcess();
    LeapOverLongWaits leap;
    static thread_local int leftBehind = 0;
    ThEvent event = nullptr;
    ThEventCreate(&event, 0, false);
    ThThread thread = StartThread(
        [](void* waited) -> int32 {
            leftBehind = 1;
            LeapOverLongWaits::isWatched = true;
            ThEventMsgWaitMultiple(static_cast<ThEvent>(waited), nullptr, -1, true);
            return 0;
        },
        event);
    while (!LeapOverLongWaits::waits) std::this_thread::yield();
    const std::string text = "Terminating thread " + std::to_string(thread->platformId);
    ThThreadDestroy(thread);
    EXPECT_GE(LeapOverLongWaits::leapt, 10);
    EXPECT_THAT(reports_.Texts(), ElementsAre(text));
    AwaitThreads(before);
    EXPECT_EQ(ThEventSignal(event), 1);  // it writes to a watch that lies on the dead thread's stack
    for (int i = 0; i < 8; ++i) {
        bool fresh = false;
        thread = StartThread(
            [](void* own) -> int32 {
                *static_cast<bool*>(own) = !leftBehind && ThThreadGetIndex(nullptr) == 1;
                return 0;
            },
            &fresh);
        while (ThThreadActive(thread)) std::this_thread::yield();
        ThThreadDestroy(thread);
        EXPECT_TRUE(fresh);
    }
    ThEventDestroy(event);
    tessel::ThThreadStop();
    EXPECT_TRUE(reports_.Has(kDebugInfo, "Total Thread Leaks = 0.\n"));
}

TEST_F(ThThreadTest, MayLeaveThroughTheHost) {
    static std::atomic<int> seen;
    seen = 0;
    ThThread thread = StartThread([](void*) -> int32 {
        seen = ThThreadGetIndex(nullptr);
        pthread_exit(nullptr);
    });
    while (seen == 0) std::this_thread::yield();
    ThThreadDestroy(thread);
    EXPECT_THAT(reports_.Texts(), IsEmpty());
}

TEST_F(ThThreadTest, MayDestroyItself) {
    std::thread([] {}).join();  // the first thread of a process may bring one of its run-time library
    const size_t before = ThreadsOfProcess();
    StartThread([](void*) -> int32 {
        ThThreadDestroy(ThThreadGetId());
        return ThThreadGetId() != nullptr;
    });
    while (reports_.CountAt(kDebugError) == 0) std::this_thread::yield();
    AwaitThreads(before);
    EXPECT_THAT(reports_.Texts(kDebugError),
                ElementsAre(testing::StartsWith("TerminateThread returns FALSE: why???, LastError = 5threadid = ")));
}

// ---- priorities -----------------------------------------------------------------------------------------------------

bool Lowered(CStr key, int32& value) {
    const std::string name = key;
    if (name == "thpri_normal") value = -2;
    if (name == "thpri_high") value = -1;
    if (name == "thpri_vhigh") value = 0;
    return true;
}

bool Disordered(CStr key, int32& value) {
    const std::string name = key;
    if (name == "thpri_bgrnd") value = 0;
    if (name == "thpri_high") value = -1;
    if (name == "thpri_tcrit") value = 1;
    return true;
}

TEST_F(ThThreadTest, ReportsItsPriorityTable) {
    int32 p[5];
    uint8 distinct[5];
    Restart(nullptr);
    EXPECT_THAT(reports_.Texts(),
                ElementsAre("using thread priorities:", "\tbackground: -15", "\tnormal: 0", "\thigh (above normal): 1",
                            "\tvery high (high): 2", "\ttime critical: 15"));
    ThThreadGetPrioInfo(distinct);
    EXPECT_THAT(distinct, ElementsAre(1, 1, 1, 1, 1));

    Restart(Disordered);
    EXPECT_THAT(reports_.Texts(kDebugError),
                ElementsAre("inconsistent thread priority token configuration: normal is higher priority than "
                            "high (above normal)",
                            "inconsistent thread priority token configuration: very high (high) is higher priority "
                            "than time critical"));
    ThThreadGetNativePriorityInfo(&p[0], &p[1], &p[2], &p[3], &p[4]);
    EXPECT_THAT(p, ElementsAre(0, 0, -1, 2, 1));
    ThThreadGetPrioInfo(distinct);
    EXPECT_THAT(distinct, ElementsAre(0, 1, 0, 1, 0));
}

std::vector<int32> levelsSet;

TEST_F(ThThreadTest, SetsPrioritiesAndTellsTheHost) {
    if (::getpriority(PRIO_PROCESS, 0) != 0) GTEST_SKIP() << "the process itself does not have the priority 0";
    static ThThread thread;
    ThThreadPrioritySetProc note = [](ThThread set, ThPlatformThread, uint32 id, int32 level) {
        EXPECT_TRUE(set == thread && id == thread->platformId);
        levelsSet.push_back(level);
    };
    ThThreadPrioritySetProc other = [](ThThread, ThPlatformThread, uint32, int32) {};
    Restart(Lowered);  // everybody may lower a priority
    EXPECT_EACH(ThSetThreadPrioritySetProc(nullptr) == kArgErr, ThSetThreadPrioritySetProc(note) == kNoErr,
                ThSetThreadPrioritySetProc(other) == kArgErr);
    ThEvent go = nullptr;
    ThEventCreate(&go, 0, false);
    thread = StartThread(AwaitEvent, go);
    reports_.Clear();

    EXPECT_EQ(ThThreadGetPriority(thread), kThPriorityVeryHigh);  // 0, as it was started
    for (int32 level : {3, 2, 5, -1, 0}) EXPECT_EQ(ThThreadSetPriority(thread, level), kNoErr);
    EXPECT_EACH(ThThreadSetPriority(nullptr, 1) == kNoErr, ThThreadGetPriority(thread) == kThPriorityBackground);
    EXPECT_THAT(levelsSet, ElementsAre(3, 2, 1, 0));
    EXPECT_EACH(
        ThClearThreadPrioritySetProc(other) == kArgErr, ThClearThreadPrioritySetProc(note) == kNoErr,
        (Texts{"bad argument to ThThreadSetPriority()", "", "bad argument to ThThreadSetPriority()",
               "Someone is attempting to clear the ThreadPrioritySetProc but didn't set it!"}) == reports_.Texts());
    ThEventSignal(go);
    ThThreadDestroy(thread);
    ThEventDestroy(go);
}

TEST_F(ThThreadTest, ReportsWhatTheHostRefuses) {
    Restart([](CStr, int32& value) { return value = 7, true; });  // no priority of the host's
    ThThread thread = StartThread(nullptr);
    reports_.Clear();
    EXPECT_EACH(ThThreadSetPriority(thread, kThPriorityHigh) == kNoErr,
                (Texts{"SetThreadPriority failed"}) == reports_.Texts());
    ThThreadDestroy(thread);

    Restart(nullptr);
    thread = StartThread(nullptr);
    reports_.Clear();
    while (reports_.Count() == 0) EXPECT_EQ(ThThreadGetPriority(thread), kThPriorityNormal);  // until it has ended
    EXPECT_THAT(reports_.Texts(kDebugError),
                ElementsAre(testing::MatchesRegex("unable to get priority for thread [0-9]+, syserr = [0-9]+, "
                                                  "assuming normal")));
    ThThreadDestroy(thread);
}

TEST_F(ThThreadTest, RaisesItsOwnAsFarAsTheHostLets) {
    if (::getpriority(PRIO_PROCESS, 0) != 0) GTEST_SKIP() << "the process itself does not have the priority 0";
    rlimit before{};
    ::getrlimit(RLIMIT_NICE, &before);
    const rlimit none{0, before.rlim_max};
    ::setrlimit(RLIMIT_NICE, &none);
    static std::atomic<int32> reached;
    const ThThreadProc raise = [](void*) -> int32 {
        ::syscall(SYS_setresuid, -1, 65534, -1);  // of this thread alone: it gives away what it may do
        tessel::RaiseThreadPriority(ThThreadGetId(), kThPriorityTimeCritical);
        return reached = ThThreadGetPriority(ThThreadGetId());
    };
    const struct {
        tessel::ThreadPriorityReader configured;
        int32 level;
        const char* name;
    } rows[] = {{nullptr, kThPriorityNormal, " is normal"}, {Lowered, kThPriorityVeryHigh, " is very high (high)"}};
    for (const auto& row : rows) {
        Restart(row.configured);
        EXPECT_EQ(AssimilateStartUpThread(), 1);
        reports_.Clear();
        ThThreadDestroy(StartThread(raise));
        EXPECT_EQ(reached, row.level);
        EXPECT_THAT(reports_.Texts(),
                    ElementsAre(testing::AllOf(testing::StartsWith("the process may not make a thread time critical, "),
                                               testing::EndsWith(row.name))));
        EXPECT_EQ(reports_.CountAt(kDebugWarning), 0u);
    }
    ::setrlimit(RLIMIT_NICE, &before);
}

TEST_F(ThThreadTest, TellsOfTheThreadAndTheMachine) {
    _HRTime before, after;
    ThGetThreadTime(&before);
    do ThGetThreadTime(&after);
    while (HRTimeCompare(&after, &before) == 0);
    EXPECT_EACH(HRTimeCompare(&after, &before) == 1,
                ThNumberOfProcessors() == static_cast<int32>(std::thread::hardware_concurrency()),
                ThThreadStackLeft() == 2147483647, stack_overflow_exception_filter(0xC00000FDu) == 1,
                stack_overflow_exception_filter(0xC0000005u) == 0);
}

}  // namespace
