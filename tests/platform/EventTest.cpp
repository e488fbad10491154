#include "platform/Event.h"

#include <gtest/gtest.h>
#include <signal.h>
#include <sys/time.h>

#include <atomic>
#include <cerrno>
#include <chrono>
#include <thread>
#include <vector>

#include "platform/Clock.h"
#include "support/FailingPlatform.h"
#include "support/HandClock.h"

namespace tessel::platform {
namespace {

using test::FailingPlatform;
using test::HandClock;

double MillisecondsOf(void (*work)()) {
    auto start = std::chrono::steady_clock::now();
    work();
    return std::chrono::duration<double, std::milli>(std::chrono::steady_clock::now() - start).count();
}

TEST(Event, SeveralSignalsCountAsOne) {
    Event event;
    EXPECT_FALSE(event.Wait(0));
    EXPECT_FALSE(event.Set());
    EXPECT_FALSE(event.Set());
    EXPECT_TRUE(event.Wait(0));
    EXPECT_FALSE(event.Wait(0));
    event.Set();
    EXPECT_TRUE(event.Reset());
    EXPECT_FALSE(event.Reset());
    EXPECT_TRUE(Event(true).Wait(-1));
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

TEST(Event, TimeOutsAreNeverEarly) {
    EXPECT_GE(MillisecondsOf([] { EXPECT_FALSE(Event().Wait(20)); }), 20.0);
    EXPECT_GE(MillisecondsOf([] {
                  Event first, second;
                  Event* both[] = {&first, &second};
                  EXPECT_EQ(-1, Event::WaitAny(both, 2, 20));
              }),
              20.0);
    EXPECT_GE(MillisecondsOf([] {
                  FailingPlatform failing("futex", 1, EINTR, 3);
                  EXPECT_FALSE(Event().Wait(20));
                  EXPECT_GE(failing.Calls(), 4);
              }),
              20.0);
}

/* Two threads hand each other a turn; a lost signal would leave both asleep. */
TEST(Event, NoWakeUpIsLost) {
    constexpr int kTurns = 50'000;
    Event ping, pong;
    std::thread other([&] {
        for (int i = 0; i < kTurns; ++i) {
            ping.Wait(-1);
            pong.Set();
        }
    });
    for (int i = 0; i < kTurns; ++i) {
        ping.Set();
        ASSERT_TRUE(pong.Wait(30'000));
    }
    other.join();
}

/* As many takers as tickets: each Set that found the event reset lets exactly one through. Some takers wait with
   time-outs, some for two events, so every way out of a wait is met. */
TEST(Event, EverySignalReleasesOneWaiter) {
    constexpr int kSignals = 20'000;
    Event ticket, other, taken;
    std::atomic<int> count{0};
    std::atomic<bool> stop{false};
    auto take = [&](int kind) {
        Event* both[] = {&other, &ticket};
        while (!stop) {
            bool got = kind == 0 ? ticket.Wait(-1) : kind == 1 ? ticket.Wait(1) : Event::WaitAny(both, 2, -1) == 1;
            if (!got || stop) continue;
            ++count;
            taken.Set();
        }
        ticket.Set(); /* for the next one to stop */
    };
    std::vector<std::thread> takers;
    for (int kind : {0, 1, 2, 0}) takers.emplace_back(take, kind);
    for (int i = 0; i < kSignals; ++i) {
        ticket.Set();
        ASSERT_TRUE(taken.Wait(30'000)) << i;
        ASSERT_EQ(i + 1, count);
    }
    stop = true;
    ticket.Set();
    for (std::thread& taker : takers) taker.join();
}

TEST(Event, WaitAnyTakesTheFirstSignaled) {
    Event first, second, third;
    Event* all[] = {&first, &second, &third};
    third.Set();
    second.Set();
    EXPECT_EQ(1, Event::WaitAny(all, 3, -1));
    EXPECT_EQ(2, Event::WaitAny(all, 3, 0));
    EXPECT_EQ(-1, Event::WaitAny(all, 3, 0));
    std::thread setter([&] { MessageEvent().Set(); });
    Event* withMessages[] = {&first, &MessageEvent()};
    EXPECT_EQ(1, Event::WaitAny(withMessages, 2, -1));
    setter.join();
    EXPECT_FALSE(first.Wait(0));
}

TEST(Clock, IsReadFromTheHost) {
    HandClock clock(5'000'000'123'456); /* far beyond 2^32 milliseconds */
    std::uint32_t start = TickMilliseconds();
    EXPECT_EQ(static_cast<std::uint32_t>(5'000'000'123'456), start);
    EXPECT_EQ(std::uint64_t{5'000'000'123'456}, HighResolutionCount() / (HighResolutionFrequency() / 1000));
    clock.Advance(7);
    EXPECT_EQ(start + 7, TickMilliseconds());
    SleepMilliseconds(1500);
    EXPECT_EQ(start + 1507, TickMilliseconds());
    EXPECT_EQ(116'444'736'000'000'000 + 5'000'000'124'963 * 10'000, SystemFileTime());
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
    EXPECT_GE(MillisecondsOf([] { SleepMilliseconds(30); }), 30.0);
    EXPECT_GE(MillisecondsOf([] { Event().Wait(30); }), 30.0);
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
