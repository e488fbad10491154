#include <tessel/memory/MemoryManager.h>
#include <tessel/sync/ThEvent.h>
#include <tessel/threads/ThThread.h>

#include <errno.h>
#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <atomic>
#include <cstdlib>
#include <filesystem>
#include <string>
#include <thread>
#include <vector>

#include "platform/posix/SystemCalls.h"
#include "support/ReportRecorder.h"
#include "support/ScratchDrive.h"
#include "support/StartedLibrary.h"
#include "threads/Service.h"

namespace {

using tessel::platform::systemCalls;
using testing::ElementsAre;
using testing::IsEmpty;

class ThThreadTest : public testing::Test {
protected:
    ThThreadTest() {
        EXPECT_EQ(AssimilateStartUpThread(), 1);
        reports_.Clear();
    }
    /* The service with other priorities. Threads have to be assimilated again. */
    void Restart(tessel::ThreadPriorityReader configured) {
        EXPECT_EQ(tessel::ThThreadStop(), kNoErr);
        reports_.Clear();
        EXPECT_EQ(tessel::ThThreadStart(configured), kNoErr);
    }

    tessel::test::ReportRecorder reports_;
    tessel::test::StartedLibrary library_;
};

/* A thread that runs until it is let go. */
struct Worker {
    ThEvent started = nullptr, go = nullptr;
    ThThread thread = nullptr;
    ThThread own = nullptr;
    int32 index = -1;
    bool startUp = true;

    Worker() {
        ThEventCreate(&started, 0, false);
        ThEventCreate(&go, 0, false);
    }
    ~Worker() {
        ThEventSignal(go);
        ThThreadDestroy(thread);
        ThEventDestroy(started);
        ThEventDestroy(go);
    }
    MgErr Start() {
        MgErr err = ThThreadCreate(&thread, Run, this, "worker");
        if (err == kNoErr) ThEventWait(started);
        return err;
    }
    static int32 Run(void* argument) {
        Worker& worker = *static_cast<Worker*>(argument);
        worker.own = ThThreadGetId();
        worker.index = ThThreadGetIndex(nullptr);
        worker.startUp = IsStartUpThread();
        ThEventSignal(worker.started);
        ThEventWait(worker.go);
        return 7;
    }
};

// ---- identity -------------------------------------------------------------------------------------------------------

TEST_F(ThThreadTest, KnowsItsThreads) {
    EXPECT_EQ(ThThreadGetIndex(nullptr), 0);
    EXPECT_EQ(ThThreadGetIndex(ThThreadGetId()), 0);
    EXPECT_TRUE(IsStartUpThread());
    {
        Worker first, second;
        ASSERT_EQ(first.Start(), kNoErr);
        ASSERT_EQ(second.Start(), kNoErr);
        EXPECT_EQ(first.own, first.thread);
        EXPECT_EQ(first.index, 1);
        EXPECT_EQ(second.index, 2);
        EXPECT_FALSE(first.startUp);
        EXPECT_TRUE(ThThreadActive(first.thread));
        EXPECT_EQ(first.thread->verifier, kThThreadVerifier);
        EXPECT_EQ(first.thread->adopted, 0);
    }
    ThThread idle = nullptr;
    ASSERT_EQ(ThThreadCreate(&idle, nullptr, nullptr, nullptr), kNoErr);
    EXPECT_EQ(ThThreadGetIndex(idle), 1);  // entries are taken again
    while (ThThreadActive(idle)) std::this_thread::yield();
    ThThreadDestroy(idle);
    EXPECT_THAT(reports_.Texts(), IsEmpty());
}

TEST_F(ThThreadTest, HasNoIdentityBeforeTheStartUpThread) {
    Restart(nullptr);
    reports_.Clear();
    ThThread adopted = nullptr;
    EXPECT_EQ(ThThreadGetId(), nullptr);
    EXPECT_EQ(ThThreadGetIndex(nullptr), kMaxThThreads);
    EXPECT_THAT(reports_.Texts(kDebugError), ElementsAre("bad ThThread in ThThreadGetIndex()"));
    EXPECT_EQ(AssimilateStartUpThread(), 1);
    EXPECT_NE(ThThreadGetId(), nullptr);
    std::thread([&] {
        EXPECT_EQ(ThThreadGetId(), nullptr);
        EXPECT_EQ(ThPseudoThreadCreate(&adopted), kNoErr);
        EXPECT_EQ(ThThreadGetId(), adopted);
        EXPECT_EQ(adopted->adopted, 1);
        EXPECT_TRUE(ThThreadActive(adopted));
        ThThreadDestroy(adopted);
        EXPECT_EQ(ThThreadGetId(), nullptr);
    }).join();
}

TEST_F(ThThreadTest, KeepsTheHostsValues) {
    int a = 0, b = 0;
    void* valueA = &b;
    ThThread self = ThThreadGetId();
    ThSetThInfo(self, &a, &b);
    EXPECT_EQ(ThGetThInfo(self, &valueA), &b);
    EXPECT_EQ(valueA, &a);
    ThSetThInfo(nullptr, &a, &b);
    EXPECT_EQ(ThGetThInfo(nullptr, &valueA), nullptr);
    EXPECT_EQ(valueA, nullptr);

    ThPlatformThread* handle = nullptr;
    uint32* id = nullptr;
    ThGetPlatformThread(self, &handle, &id);
    EXPECT_EQ(handle, &self->platformThread);
    EXPECT_EQ(id, &self->platformId);
    ThGetPlatformThread(nullptr, &handle, &id);
    EXPECT_EQ(handle, nullptr);
    EXPECT_EQ(id, nullptr);
}

// ---- the table ------------------------------------------------------------------------------------------------------

TEST_F(ThThreadTest, RefusesOneMoreThanTheTableHolds) {
    std::thread([&] {
        std::vector<ThThread> records(kMaxThThreads - 1);  // and the start-up thread
        for (ThThread& record : records) ASSERT_EQ(ThPseudoThreadCreate(&record), kNoErr);
        std::atomic<bool> ran{false};
        auto run = [](void* flag) -> int32 { return *static_cast<std::atomic<bool>*>(flag) = true; };
        ThThread refused = ThThreadGetId();
        EXPECT_EQ(ThThreadCreate(&refused, run, &ran, nullptr), kMemFullErr);
        EXPECT_EQ(refused, nullptr);
        refused = ThThreadGetId();
        EXPECT_EQ(ThPseudoThreadCreate(&refused), kMemFullErr);
        EXPECT_EQ(refused, nullptr);
        EXPECT_EQ(ThThreadGetId(), records.back());
        EXPECT_THAT(reports_.Texts(), ElementsAre("Thread Array full!!", "Thread Array full!!"));
        EXPECT_FALSE(ran);

        const int32 freed = ThThreadGetIndex(records[100]);
        reports_.Clear();
        ThThreadDestroy(records[100]);  // it is not the calling thread's current record
        EXPECT_THAT(reports_.Texts(), ElementsAre("WARNING: Destroying PseudoThread from another thread"));
        ASSERT_EQ(ThThreadCreate(&records[100], run, &ran, nullptr), kNoErr);
        EXPECT_EQ(ThThreadGetIndex(records[100]), freed);
        for (ThThread record : records) ThThreadDestroy(record);
        EXPECT_TRUE(ran);
    }).join();
    reports_.Clear();
    tessel::ThThreadStop();
    EXPECT_TRUE(reports_.Has(kDebugInfo, "Total Thread Leaks = 0.\n"));
}

TEST_F(ThThreadTest, GivesEachOfManyThreadsAPlaceOfItsOwn) {
    static std::atomic<int> users[kMaxThThreads], collisions, ended;
    collisions = ended = 0;
    auto occupy = [](void*) -> int32 {
        std::atomic<int>& mine = users[ThThreadGetIndex(nullptr)];
        if (mine++ != 0) ++collisions;
        std::this_thread::yield();
        --mine;
        return ++ended;
    };
    std::vector<std::thread> creators;
    for (int i = 0; i < 4; ++i) {
        creators.emplace_back([&] {
            for (int round = 0; round < 20; ++round) {
                ThThread threads[3];
                for (ThThread& thread : threads) ASSERT_EQ(ThThreadCreate(&thread, occupy, nullptr, ""), kNoErr);
                /* Joined while its place is taken: a place is free only when its thread has ended. */
                for (ThThread thread : threads) {
                    while (ThThreadActive(thread)) std::this_thread::yield();
                    ThThreadDestroy(thread);
                }
            }
        });
    }
    for (std::thread& creator : creators) creator.join();
    EXPECT_EQ(ended, 4 * 20 * 3);
    EXPECT_EQ(collisions, 0);
    EXPECT_THAT(reports_.Texts(), IsEmpty());
}

// ---- ending ---------------------------------------------------------------------------------------------------------

TEST_F(ThThreadTest, ReportsBadRecords) {
    THTHREADREC bad{};
    ThThreadDestroy(nullptr);
    ThThreadDestroy(&bad);
    EXPECT_EQ(ThThreadGetIndex(&bad), 2048);
    EXPECT_EQ(ThThreadGetPriority(&bad), kThPriorityNormal);
    EXPECT_EQ(ThThreadSetPriority(&bad, 1), kNoErr);
    EXPECT_FALSE(ThThreadActive(&bad));
    EXPECT_THAT(
        reports_.Texts(kDebugError),
        ElementsAre("threadp does not have correct verifier in ThThreadDestroy", "bad ThThread in ThThreadGetIndex()",
                    "invalid ThThread passed to ThThreadGetPriority", "bad argument to ThThreadSetPriority()", ""));
}

TEST_F(ThThreadTest, ReportsThreadsThatAreLeft) {
    tessel::test::ScratchDrive drive;
    const char* before = std::getenv("TMPDIR");
    const std::string temporary = before ? before : "";
    ::setenv("TMPDIR", drive.Native().c_str(), 1);
    ThThread left = nullptr;
    ASSERT_EQ(ThThreadCreate(&left, nullptr, nullptr, nullptr), kNoErr);
    Restart(nullptr);
    before ? ::setenv("TMPDIR", temporary.c_str(), 1) : ::unsetenv("TMPDIR");
    EXPECT_THAT(drive.Get("ovThreadLeaks.txt"), testing::HasSubstr("Number of unfreed items: 1\n"));
    reports_.Clear();
    ThThreadDestroy(left);
    EXPECT_THAT(reports_.Texts(), ElementsAre("disposing thread out of range"));
}

/* A clock that leaps over every long wait. */
struct LeapOverLongWaits {
    static inline std::atomic<int64_t> leapt{0};  // seconds
    static inline tessel::platform::SystemCalls original;

    static int Clock(clockid_t clock, timespec* time) {
        int result = original.clock_gettime(clock, time);
        time->tv_sec += static_cast<time_t>(leapt);
        return result;
    }
    static long Futex(uint32_t* word, int operation, uint32_t value, const timespec* timeout) {
        constexpr time_t kLong = 5;
        if (!timeout || timeout->tv_sec < kLong) return original.futex(word, operation, value, timeout);
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

size_t ThreadsOfProcess() {
    std::filesystem::directory_iterator tasks("/proc/self/task");
    return static_cast<size_t>(std::distance(begin(tasks), end(tasks)));
}

TEST_F(ThThreadTest, EndsAThreadThatIgnoresItsStopByForce) {
#if defined(__SANITIZE_THREAD__)
    GTEST_SKIP() << "the thread sanitizer waits for the bookkeeping of a thread that ends without any";
#endif
    const size_t before = ThreadsOfProcess();
    LeapOverLongWaits leap;
    std::atomic<bool> running{false};
    ThThread thread = nullptr;
    auto ignore = [](void* flag) -> int32 {
        *static_cast<std::atomic<bool>*>(flag) = true;
        for (;;) std::this_thread::sleep_for(std::chrono::hours(1));
    };
    ASSERT_EQ(ThThreadCreate(&thread, ignore, &running, nullptr), kNoErr);
    while (!running) std::this_thread::yield();
    const std::string text = "Terminating thread " + std::to_string(thread->platformId);
    ThThreadDestroy(thread);
    EXPECT_GE(LeapOverLongWaits::leapt, 10);
    EXPECT_THAT(reports_.Texts(), ElementsAre(text));
    EXPECT_EQ(ThreadsOfProcess(), before);
    reports_.Clear();
    ASSERT_EQ(ThThreadCreate(&thread, nullptr, nullptr, nullptr), kNoErr);
    EXPECT_EQ(ThThreadGetIndex(thread), 1);
    ThThreadDestroy(thread);
    tessel::ThThreadStop();
    EXPECT_TRUE(reports_.Has(kDebugInfo, "Total Thread Leaks = 0.\n"));
}

TEST_F(ThThreadTest, MayDestroyItself) {
    static std::atomic<bool> gone;
    gone = false;
    const size_t before = ThreadsOfProcess();
    ThThread thread = nullptr;
    ASSERT_EQ(ThThreadCreate(
                  &thread,
                  [](void*) -> int32 {
                      ThThreadDestroy(ThThreadGetId());
                      EXPECT_EQ(ThThreadGetId(), nullptr);
                      return gone = true;
                  },
                  nullptr, nullptr),
              kNoErr);
    while (!gone || ThreadsOfProcess() != before) std::this_thread::yield();
    EXPECT_THAT(reports_.Texts(kDebugError),
                ElementsAre(testing::StartsWith("TerminateThread returns FALSE: why???, LastError = 5threadid = ")));
}

// ---- priorities -----------------------------------------------------------------------------------------------------

bool FallingPriorities(CStr key, int32& value) {
    const std::string name = key;
    if (name == "thpri_normal") value = -2;
    if (name == "thpri_high") value = -1;
    if (name == "thpri_vhigh") value = 0;
    return name != "thpri_bgrnd" && name != "thpri_tcrit";
}

bool DisorderedPriorities(CStr key, int32& value) {
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
    ThThreadGetNativePriorityInfo(&p[0], &p[1], &p[2], &p[3], &p[4]);
    EXPECT_THAT(p, ElementsAre(-15, 0, 1, 2, 15));
    ThThreadGetPrioInfo(distinct);
    EXPECT_THAT(distinct, ElementsAre(1, 1, 1, 1, 1));

    Restart(DisorderedPriorities);
    EXPECT_THAT(reports_.Texts(kDebugError),
                ElementsAre("inconsistent thread priority token configuration: normal is higher priority than "
                            "high (above normal)",
                            "inconsistent thread priority token configuration: very high (high) is higher priority "
                            "than time critical"));
    ThThreadGetNativePriorityInfo(&p[0], &p[1], nullptr, &p[3], &p[4]);
    EXPECT_THAT(p, ElementsAre(0, 0, 1, 2, 1));
    ThThreadGetPrioInfo(distinct);
    EXPECT_THAT(distinct, ElementsAre(0, 1, 0, 1, 0));
}

struct PriorityCall {
    ThThread thread;
    uint32 id;
    int32 level;
};
std::vector<PriorityCall> priorityCalls;

TEST_F(ThThreadTest, SetsPrioritiesAndTellsTheHost) {
    priorityCalls.clear();
    ThThreadPrioritySetProc note = [](ThThread thread, ThPlatformThread, uint32 id, int32 level) {
        priorityCalls.push_back({thread, id, level});
    };
    ThThreadPrioritySetProc other = [](ThThread, ThPlatformThread, uint32, int32) {};
    Restart(FallingPriorities);  // lower ones only, which everybody may set
    AssimilateStartUpThread();
    EXPECT_EQ(ThSetThreadPrioritySetProc(nullptr), kArgErr);
    EXPECT_EQ(ThSetThreadPrioritySetProc(note), kNoErr);
    EXPECT_EQ(ThSetThreadPrioritySetProc(other), kArgErr);
    Worker worker;
    ASSERT_EQ(worker.Start(), kNoErr);
    reports_.Clear();

    EXPECT_EQ(ThThreadGetPriority(worker.thread), kThPriorityVeryHigh);  // 0, as it was started
    for (int32 level : {3, 2, 5, -1, 0}) EXPECT_EQ(ThThreadSetPriority(worker.thread, level), kNoErr);
    EXPECT_EQ(ThThreadSetPriority(nullptr, 1), kNoErr);
    EXPECT_EQ(ThThreadGetPriority(worker.thread), kThPriorityBackground);
    std::vector<int32> levels;
    for (const PriorityCall& call : priorityCalls) {
        EXPECT_EQ(call.thread, worker.thread);
        EXPECT_EQ(call.id, worker.thread->platformId);
        levels.push_back(call.level);
    }
    EXPECT_THAT(levels, ElementsAre(3, 2, 1, 0));
    EXPECT_THAT(reports_.Texts(),
                ElementsAre("bad argument to ThThreadSetPriority()", "", "bad argument to ThThreadSetPriority()"));
    reports_.Clear();
    EXPECT_EQ(ThClearThreadPrioritySetProc(other), kArgErr);
    EXPECT_THAT(reports_.Texts(kDebugWarning),
                ElementsAre("Someone is attempting to clear the ThreadPrioritySetProc but didn't set it!"));
    EXPECT_EQ(ThClearThreadPrioritySetProc(note), kNoErr);
    EXPECT_EQ(ThClearThreadPrioritySetProc(nullptr), kArgErr);
}

TEST_F(ThThreadTest, ReportsWhatTheHostRefuses) {
    Restart([](CStr, int32& value) { return value = 7, true; });  // no priority of the host's
    ThThread ended = nullptr;
    ASSERT_EQ(ThThreadCreate(&ended, nullptr, nullptr, nullptr), kNoErr);
    reports_.Clear();
    EXPECT_EQ(ThThreadSetPriority(ended, kThPriorityHigh), kNoErr);
    EXPECT_THAT(reports_.Texts(), ElementsAre("SetThreadPriority failed"));
    ThThreadDestroy(ended);

    Restart(nullptr);
    ASSERT_EQ(ThThreadCreate(&ended, nullptr, nullptr, nullptr), kNoErr);
    reports_.Clear();
    while (reports_.Count() == 0) EXPECT_EQ(ThThreadGetPriority(ended), kThPriorityNormal);
    EXPECT_THAT(reports_.Texts(kDebugError),
                ElementsAre(testing::MatchesRegex("unable to get priority for thread [0-9]+, syserr = [0-9]+, "
                                                  "assuming normal")));
    ThThreadDestroy(ended);
}

// ---- the calling thread and the machine -----------------------------------------------------------------------------

TEST_F(ThThreadTest, TellsOfTheThreadAndTheMachine) {
    _HRTime before, after;
    ThGetThreadTime(&before);
    do ThGetThreadTime(&after);
    while (HRTimeCompare(&after, &before) == 0);
    EXPECT_EQ(HRTimeCompare(&after, &before), 1);
    EXPECT_EQ(ThNumberOfProcessors(), static_cast<int32>(std::thread::hardware_concurrency()));
    EXPECT_EQ(ThThreadStackLeft(), 2147483647);
    EXPECT_EQ(stack_overflow_exception_filter(0xC00000FDu), 1);
    EXPECT_EQ(stack_overflow_exception_filter(0xC0000005u), 0);
}

}  // namespace
