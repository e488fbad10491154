#include "platform/Event.h"

#include "platform/Mutex.h"
#include "platform/Thread.h"
#include "platform/posix/SystemCalls.h"

#include <algorithm>
#include <errno.h>
#include <linux/futex.h>

namespace tessel::platform {

// ---- sleeping on a word ---------------------------------------------------------------------------------------------

namespace {

constexpr std::int64_t kNanosecondsPerSecond = 1'000'000'000;

std::int64_t MonotonicNanoseconds() {
    timespec time{};
    systemCalls.clock_gettime(CLOCK_MONOTONIC, &time);
    return static_cast<std::int64_t>(time.tv_sec) * kNanosecondsPerSecond + time.tv_nsec;
}

// A moment to wait for, or none.
class Deadline {
public:
    explicit Deadline(std::int32_t milliseconds) {
        if (milliseconds >= 0) at_ = MonotonicNanoseconds() + std::int64_t{milliseconds} * 1'000'000;
    }

    // Sleeps while the word is 0: kTaken when that may have changed. The kernel counts its time from after our look at
    // the clock, so it is never over early.
    EventWait SleepWhileZero(std::atomic<std::uint32_t>& word) const {
        timespec left{};
        if (at_ != kNever) {
            std::int64_t remaining = at_ - MonotonicNanoseconds();
            if (remaining <= 0) return EventWait::kTimedOut;
            left.tv_sec = static_cast<time_t>(remaining / kNanosecondsPerSecond);
            left.tv_nsec = static_cast<long>(remaining % kNanosecondsPerSecond);
        }
        long result = systemCalls.futex(reinterpret_cast<std::uint32_t*>(&word), FUTEX_WAIT_PRIVATE, 0,
                                        at_ != kNever ? &left : nullptr);
        if (result == 0 || errno == EAGAIN || errno == EINTR) return EventWait::kTaken;
        return errno == ETIMEDOUT ? EventWait::kTimedOut : EventWait::kFailed;
    }

private:
    static constexpr std::int64_t kNever = -1;
    std::int64_t at_ = kNever;  // nanoseconds of the monotonic clock
};

void WakeOne(std::atomic<std::uint32_t>& word) {
    systemCalls.futex(reinterpret_cast<std::uint32_t*>(&word), FUTEX_WAKE_PRIVATE, 1, nullptr);
}

// Looking again pays when the signal comes sooner than a sleep and a wake-up cost. What each event lately met decides
// how: a signaler on another processor needs no more than a short spin, one on this processor cannot run before we
// yield, and one that was long in coming is not worth either. Two threads that hand a turn to each other would go on
// sleeping once they began to, as each takes longer to wake than the other looks: so one short sleep in eight is
// followed by a look that outlasts a wake-up.
enum Habit : std::uint8_t {
    kLong = 0,              // the last wait slept long
    kSoon = 1,              // spin, then yield
    kOnThisProcessor = 16,  // yield at once; counts down to kSoon, as threads move
    kPatient = 17           // yield at once, and many times
};
constexpr int kSpins = 32, kYields = 6;        // some 2 us in all
constexpr int kPatientYields = 160;            // some 40 us
constexpr std::int64_t kShortSleep = 100'000;  // nanoseconds; wake-ups among them may take half

bool SpinningHelps() {
    static const bool several = NumberOfProcessors() > 1;
    return several;
}

}  // namespace

// ---- one event ------------------------------------------------------------------------------------------------------

bool Event::LookAgain() noexcept {
    std::uint8_t habit = habit_.load(std::memory_order_relaxed);
    if (habit == kLong) return Take();
    for (int i = 0; habit == kSoon && SpinningHelps() && i < kSpins; ++i) {
        if (Take()) return true;
        SpinPause();
    }
    for (int i = 0; i < (habit == kPatient ? kPatientYields : kYields); ++i) {
        YieldThread();
        if (!Take()) continue;
        int next = habit == kSoon ? kOnThisProcessor : habit == kPatient ? kSoon : habit - 1;
        habit_.store(static_cast<std::uint8_t>(next), std::memory_order_relaxed);
        return true;
    }
    return false;
}

EventWait Event::WaitForSignal(std::int32_t milliseconds) noexcept {
    awake_.fetch_add(1, std::memory_order_relaxed);
    bool taken = LookAgain();
    if (!taken) sleepers_.fetch_add(kSleeper, std::memory_order_seq_cst);
    awake_.fetch_sub(1, std::memory_order_relaxed);
    return taken ? EventWait::kTaken : SleepFor(milliseconds);
}

// The calling thread is counted among the sleepers already.
EventWait Event::SleepFor(std::int32_t milliseconds) noexcept {
    Deadline deadline(milliseconds);
    std::int64_t start = MonotonicNanoseconds();
    EventWait slept = EventWait::kTaken;
    bool taken;
    while (!(taken = Take()) && slept == EventWait::kTaken) slept = deadline.SleepWhileZero(signaled_);
    bool isShort = taken && MonotonicNanoseconds() - start < kShortSleep;
    bool isEighth = isShort && shortSleeps_.fetch_add(1, std::memory_order_relaxed) % 8 == 0;
    habit_.store(isEighth ? kPatient : isShort ? kSoon : kLong, std::memory_order_relaxed);
    sleepers_.fetch_sub(kSleeper, std::memory_order_seq_cst);
    return taken ? EventWait::kTaken : slept;
}

// ---- several events -------------------------------------------------------------------------------------------------

// One event's entry in a WaitAny: what to set and wake when it is signaled.
struct Event::Watch {
    std::atomic<std::uint32_t>* woken;
    Watch* next;
};

constinit Mutex Event::watchMutex;

void Event::Renew(bool signaled) noexcept {
    MutexHolder holder(watchMutex);
    watches_ = nullptr;
    sleepers_.store(0, std::memory_order_seq_cst);
    awake_.store(0, std::memory_order_relaxed);
    habit_.store(kLong, std::memory_order_relaxed);
    shortSleeps_.store(0, std::memory_order_relaxed);
    signaled_.store(signaled ? 1 : 0, std::memory_order_seq_cst);
}

void Event::WakeWatches() noexcept {
    MutexHolder holder(watchMutex);
    for (Watch* watch = watches_; watch; watch = watch->next) {
        watch->woken->store(1, std::memory_order_seq_cst);
        WakeOne(*watch->woken);
    }
}

void Event::Wake(std::uint32_t sleepers) noexcept {
    if (sleepers & kWatched) WakeWatches();
    if (sleepers >= kSleeper) WakeOne(signaled_);
}

void Event::AddWatch(Watch& watch) noexcept {
    watch.next = watches_;
    watches_ = &watch;
    sleepers_.fetch_or(kWatched, std::memory_order_seq_cst);
}

void Event::RemoveWatch(Watch& watch) noexcept {
    Watch** link = &watches_;
    while (*link != &watch) link = &(*link)->next;
    *link = watch.next;
    if (!watches_) sleepers_.fetch_and(~kWatched, std::memory_order_seq_cst);
}

int Event::TakeFirst(Event* const* events, std::size_t count) noexcept {
    for (std::size_t i = 0; i < count; ++i) {
        if (events[i]->Take()) return static_cast<int>(i);
    }
    return -1;
}

EventWait Event::WaitAny(Event* const* events, std::size_t count, std::int32_t milliseconds, int& first) noexcept {
    count = std::min(count, kMostEvents);
    first = TakeFirst(events, count);
    if (first >= 0) return EventWait::kTaken;
    if (milliseconds == 0) return EventWait::kTimedOut;

    Deadline deadline(milliseconds);
    std::atomic<std::uint32_t> woken{0};
    Watch watches[kMostEvents];
    {
        MutexHolder holder(watchMutex);
        for (std::size_t i = 0; i < count; ++i) {
            watches[i].woken = &woken;
            events[i]->AddWatch(watches[i]);
        }
    }
    EventWait slept = EventWait::kTaken;
    while ((first = TakeFirst(events, count)) < 0 && slept == EventWait::kTaken) {
        slept = deadline.SleepWhileZero(woken);
        woken.store(0, std::memory_order_seq_cst);
    }
    {
        MutexHolder holder(watchMutex);
        for (std::size_t i = 0; i < count; ++i) events[i]->RemoveWatch(watches[i]);
    }
    return first >= 0 ? EventWait::kTaken : slept;
}

}  // namespace tessel::platform
