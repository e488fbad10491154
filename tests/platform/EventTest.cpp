#include "platform/Clock.h"
#include "platform/Event.h"
#include "platform/posix/SystemCalls.h"
#include "support/FailingPlatform.h"
#include "support/HandClock.h"
#include "support/Test.h"

#include <bit>
#include <cerrno>
#include <chrono>
#include <signal.h>
#include <sys/time.h>

namespace tessel::platform {
namespace {

using test::FailingPlatform;
using test::HandClock;

double MillisecondsOf(void (*work)()) {
    auto start = std::chrono::steady_clock::now();
    work();
    return std::chrono::duration<double, std::milli>(std::chrono::steady_clock::now() - start).count();
}

TEST(Event, NobodyAsleepNoSystemCall) {
    FailingPlatform watching("futex", 1, EINVAL, 0);
    Event event;
    event.Set();
    event.Wait(-1);
    event.Set();
    event.Reset();
    EXPECT_EQ(0, watching.Calls());
}

// Each reading of the time of day lies an hour before the one before.
int ReadFallingTimeOfDay(clockid_t clock, timespec* time) {
    static std::atomic<time_t> hours{0};
    int result = clock_gettime(clock, time);
    if (clock != CLOCK_MONOTONIC) time->tv_sec -= 3600 * ++hours;
    return result;
}

TEST(Event, TimeOutsAreNeverEarlyNorLost) {
    static constexpr EventWait kTimedOut = EventWait::kTimedOut;
    EXPECT_GE(MillisecondsOf([] {
                  Event first, second;
                  Event* both[] = {&first, &second};
                  int index = 0;
                  EXPECT_EACH(Event::WaitAny(both, 2, 20, index) == kTimedOut, index == -1);
              }),
              20.0);
    EXPECT_GE(MillisecondsOf([] {
                  FailingPlatform failing("futex", 1, EINTR, 3);
                  EXPECT_EACH(Event().Wait(20) == kTimedOut, failing.Calls() >= 4);
              }),
              20.0);
    const SystemCalls original = systemCalls;
    systemCalls.clock_gettime = ReadFallingTimeOfDay;
    EXPECT_GE(MillisecondsOf([] { EXPECT_EQ(kTimedOut, Event().Wait(20)); }), 20.0);
    systemCalls = original;
}

TEST(Event, AHostThatCannotWaitIsToldOf) {
    Event first, second;
    Event* both[] = {&first, &second};
    int index = 0;
    FailingPlatform failing("futex", 1, ENOSYS, 2);
    EXPECT_EACH(EventWait::kFailed == first.Wait(-1), EventWait::kFailed == Event::WaitAny(both, 2, -1, index));
}

TEST(Event, WaitAnyTakesTheFirstSignaled) {
    Event first, second, third;
    Event* all[] = {&first, &second, &third};
    third.Set();
    second.Set();
    int index = 0;
    for (int expected : {1, 2, -1}) {
        Event::WaitAny(all, 3, 0, index);
        EXPECT_EQ(expected, index);
    }
    EXPECT_EQ(EventWait::kTimedOut, first.Wait(0));
}

// Each waits for an event that all share and for its own; whoever leaves must take nobody else off the list.
TEST(Event, AnyOfTheWaitersMayLeave) {
    constexpr int kWaiters = 6;
    std::mt19937 random(1);
    for (int round = 0; round < 50; ++round) {
        Event shared, own[kWaiters];
        std::atomic<int> waiting{0}, left{0}, wrong{0}, byShared{0};
        const unsigned leaving = random() % (1u << kWaiters);
        test::InThreads(kWaiters + 1, [&](int thread) {
            if (thread < kWaiters) {
                Event* both[] = {&shared, &own[thread]};
                int index = -1;
                ++waiting;
                wrong += Event::WaitAny(both, 2, 60000, index) != EventWait::kTaken;
                byShared += index == 0;
                ++left;
                return;
            }
            while (waiting < kWaiters) std::this_thread::yield();
            for (int i = 0; i < kWaiters; ++i)
                if (leaving >> i & 1) own[i].Set();
            while (left < std::popcount(leaving)) std::this_thread::yield();
            for (int gone = left; gone < kWaiters; ++gone) {
                shared.Set();
                while (left == gone) std::this_thread::yield();
            }
        });
        EXPECT_EACH(wrong == 0, byShared == kWaiters - std::popcount(leaving));
    }
}

TEST(Clock, IsReadFromTheHost) {
    HandClock clock(5'000'000'123'456);  // far beyond 2^32 milliseconds
    std::uint32_t start = TickMilliseconds();
    EXPECT_EACH(static_cast<std::uint32_t>(5'000'000'123'456) == start,
                std::uint64_t{5'000'000'123'456} == HighResolutionCount() / (HighResolutionFrequency() / 1000));
    clock.Advance(7);
    EXPECT_EQ(start + 7, TickMilliseconds());
    SleepMilliseconds(1500);
    EXPECT_EACH(start + 1507 == TickMilliseconds(),
                116'444'736'000'000'000 + 5'000'000'124'963 * 10'000 == SystemFileTime());
}

TEST(Clock, SleepsGoOnAfterSignals) {
    static std::atomic<int> signals;
    signals = 0;
    struct sigaction action {
    }, before;
    action.sa_handler = [](int) { ++signals; };
    sigaction(SIGALRM, &action, &before);
    const itimerval everyMillisecond = {{0, 1000}, {0, 1000}};
    setitimer(ITIMER_REAL, &everyMillisecond, nullptr);
    EXPECT_EACH(MillisecondsOf([] { SleepMilliseconds(30); }) >= 30.0,
                MillisecondsOf([] { Event().Wait(30); }) >= 30.0);
    const itimerval never = {};
    setitimer(ITIMER_REAL, &never, nullptr);
    EXPECT_GT(signals, 0);
    sigaction(SIGALRM, &before, nullptr);
}

TEST(Clock, ProcessorTimesGrow) {
    ProcessorTime before = ThreadTimes();
    volatile unsigned work = 0;
    while (ThreadTimes().user + ThreadTimes().kernel < before.user + before.kernel + 50'000) work = work + 1;
    ProcessorTime process = ProcessTimes();
    EXPECT_GE(process.user + process.kernel, 50'000u);
}

}  // namespace
}  // namespace tessel::platform
