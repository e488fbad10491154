#include "platform/Event.h"

#include <errno.h>
#include <linux/futex.h>

#include <algorithm>

#include "platform/Mutex.h"
#include "platform/Thread.h"
#include "platform/posix/SystemCalls.h"

namespace tessel::platform {

// ---- sleeping on a word ---------------------------------------------------------------------------------------------

namespace {

constexpr std::int64_t kNanosecondsPerSecond = 1'000'000'000;

std::int64_t MonotonicNanoseconds() {
    timespec time{};
    systemCalls.clock_gettime(CLOCK_MONOTONIC, &time);
    return static_cast<std::int64_t>(time.tv_sec) * kNanosecondsPerSecond + time.tv_nsec;
}

/* A moment to wait for, or none. */
class Deadline {
public:
    explicit Deadline(std::int32_t milliseconds) {
        if (milliseconds >= 0) at_ = MonotonicNanoseconds() + std::int64_t{milliseconds} * 1'000'000;
    }

    /* Sleeps while the word holds `value`, or until somebody wakes it. False when the time is over. The kernel counts
       its time from after our look at the clock, so it is never over early. */
    bool SleepWhile(std::atomic<std::uint32_t>& word, std::uint32_t value) const {
        timespec left{};
        if (at_ != kNever) {
            std::int64_t remaining = at_ - MonotonicNanoseconds();
            if (remaining <= 0) return false;
            left.tv_sec = static_cast<time_t>(remaining / kNanosecondsPerSecond);
            left.tv_nsec = static_cast<long>(remaining % kNanosecondsPerSecond);
        }
        long result = systemCalls.futex(reinterpret_cast<std::uint32_t*>(&word), FUTEX_WAIT_PRIVATE, value,
                                        at_ != kNever ? &left : nullptr);
        return result == 0 || errno != ETIMEDOUT;
    }

private:
    static constexpr std::int64_t kNever = -1;
    std::int64_t at_ = kNever; /* nanoseconds of the monotonic clock */
};

void WakeOne(std::atomic<std::uint32_t>& word) {
    systemCalls.futex(reinterpret_cast<std::uint32_t*>(&word), FUTEX_WAKE_PRIVATE, 1, nullptr);
}

/* Spinning pays when the signal comes sooner than a sleep and a wake-up cost. Each event remembers whether it lately
   did: a short sleep says that spinning would have paid, a long one that it did not. */
constexpr std::uint16_t kMostSpins = 128;
constexpr std::uint16_t kLeastSpins = 4;
constexpr std::int64_t kShortSleep = 50'000; /* nanoseconds */

bool SpinningHelps() {
    static const bool several = NumberOfProcessors() > 1;
    return several;
}

}  // namespace

// ---- one event ------------------------------------------------------------------------------------------------------

bool Event::Take() noexcept {
    if (!(word_.load(std::memory_order_relaxed) & kSignaled)) return false;
    return (word_.fetch_and(~kSignaled, std::memory_order_acq_rel) & kSignaled) != 0;
}

bool Event::Spin() noexcept {
    if (!SpinningHelps()) return false;
    std::uint16_t limit = std::max(spins_.load(std::memory_order_relaxed), kLeastSpins);
    for (std::uint16_t i = 0; i < limit; ++i) {
        if (Take()) return true;
        SpinPause();
    }
    return false;
}

bool Event::Wait(std::int32_t milliseconds) noexcept {
    if (Take()) return true;
    if (milliseconds == 0) return false;
    awake_.fetch_add(1, std::memory_order_relaxed);
    bool taken = Spin();
    if (!taken) word_.fetch_add(kSleeper, std::memory_order_seq_cst);
    awake_.fetch_sub(1, std::memory_order_relaxed);
    return taken || SleepFor(milliseconds);
}

/* The calling thread is counted among the sleepers already. */
bool Event::SleepFor(std::int32_t milliseconds) noexcept {
    Deadline deadline(milliseconds);
    std::int64_t start = MonotonicNanoseconds();
    bool taken = Take();
    bool inTime = true;
    while (!taken && inTime) {
        std::uint32_t now = word_.load(std::memory_order_relaxed);
        if (!(now & kSignaled)) inTime = deadline.SleepWhile(word_, now);
        taken = Take();
    }
    bool isShort = taken && MonotonicNanoseconds() - start < kShortSleep;
    spins_.store(isShort ? kMostSpins : std::uint16_t{0}, std::memory_order_relaxed);
    PassOn(word_.fetch_sub(kSleeper, std::memory_order_seq_cst) - kSleeper);
    return taken;
}

// ---- several events -------------------------------------------------------------------------------------------------

/* One event's entry in a WaitAny: what to set and wake when it is signaled. */
struct Event::Watch {
    std::atomic<std::uint32_t>* woken;
    Watch* next;
};

namespace {

/* Guards the lists of watches of all events. Nothing is taken inside it. */
constinit Mutex watchMutex;

}  // namespace

void Event::WakeWatches() noexcept {
    MutexHolder holder(watchMutex);
    for (Watch* watch = watches_; watch; watch = watch->next) {
        watch->woken->store(1, std::memory_order_seq_cst);
        WakeOne(*watch->woken);
    }
}

/* Only the signal that was not there before wakes: the earlier one woke somebody, and who leaves a signal behind passes
   it on. */
void Event::Wake(std::uint32_t before) noexcept {
    if (before & kSignaled) return;
    if (before & kWatched) WakeWatches();
    if (before >= kSleeper) WakeOne(word_);
}

void Event::PassOn(std::uint32_t now) noexcept {
    if (now & kSignaled) Wake(now & ~kSignaled);
}

void Event::AddWatch(Watch& watch) noexcept {
    watch.next = watches_;
    watches_ = &watch;
    word_.fetch_or(kWatched, std::memory_order_seq_cst);
}

void Event::RemoveWatch(Watch& watch) noexcept {
    Watch** link = &watches_;
    while (*link != &watch) link = &(*link)->next;
    *link = watch.next;
    if (!watches_) word_.fetch_and(~kWatched, std::memory_order_seq_cst);
}

int Event::TakeFirst(Event* const* events, std::size_t count) noexcept {
    for (std::size_t i = 0; i < count; ++i) {
        if (events[i]->Take()) return static_cast<int>(i);
    }
    return -1;
}

int Event::WaitAny(Event* const* events, std::size_t count, std::int32_t milliseconds) noexcept {
    count = std::min(count, kMostEvents);
    int taken = TakeFirst(events, count);
    if (taken >= 0 || milliseconds == 0) return taken;

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
    bool inTime = true;
    while ((taken = TakeFirst(events, count)) < 0 && inTime) {
        inTime = deadline.SleepWhile(woken, 0);
        woken.store(0, std::memory_order_seq_cst);
    }
    {
        MutexHolder holder(watchMutex);
        for (std::size_t i = 0; i < count; ++i) events[i]->RemoveWatch(watches[i]);
    }
    for (std::size_t i = 0; i < count; ++i) events[i]->PassOn(events[i]->word_.load(std::memory_order_seq_cst));
    return taken;
}

Event& MessageEvent() noexcept {
    static constinit Event event;
    return event;
}

}  // namespace tessel::platform
