// The auto-reset event.
//
// An event is signaled or not. A wait that finds it signaled, or is woken by a signal, resets it: one signal releases
// one waiter, and several signals before a wait count as one.
//
//   state          Set                       Wait
//   signaled       stays so                  resets it and goes on
//   not, nobody    signaled                  looks again for a while, then sleeps
//   not, waiters   wakes one if it sleeps    joins them
//
// Nothing allocates or throws; nobody asleep, no system call. Any thread. The memory may be released as soon as no
// thread is inside a call on it.
#ifndef TESSEL_PLATFORM_EVENT_H
#define TESSEL_PLATFORM_EVENT_H

#include "platform/Mutex.h"

#include <atomic>
#include <cstddef>
#include <cstdint>

namespace tessel::platform {

// kFailed: the host cannot wait.
enum class EventWait { kTaken, kTimedOut, kFailed };

class Event {
public:
    explicit constexpr Event(bool signaled = false) noexcept : signaled_(signaled ? 1 : 0) {}
    Event(const Event&) = delete;
    Event& operator=(const Event&) = delete;

    // True when a thread was waiting.
    bool Set() noexcept {
        bool before = signaled_.exchange(1, std::memory_order_seq_cst) != 0;
        std::uint32_t sleepers = sleepers_.load(std::memory_order_seq_cst);
        if (sleepers == 0) return awake_.load(std::memory_order_relaxed) != 0;
        // Only the signal that was not there before wakes: the earlier one woke somebody, who is on the way.
        if (!before) Wake(sleepers);
        return true;
    }

    // As new, for another use of its memory: forgets also the waits of threads that were ended by force. No thread
    // waits; one whose signal released the last waiter may still be on its way out of Set.
    void Renew(bool signaled) noexcept;

    // Not signaled from here on. True when it was.
    bool Reset() noexcept { return signaled_.exchange(0, std::memory_order_seq_cst) != 0; }

    // kTaken when the signal was taken, kTimedOut when so many milliseconds passed without one. Negative: waits for
    // ever. Never early; changes of the time of day do not matter.
    EventWait Wait(std::int32_t milliseconds) noexcept {
        if (Take()) return EventWait::kTaken;
        return milliseconds == 0 ? EventWait::kTimedOut : WaitForSignal(milliseconds);
    }

    // Waits until one of `count` (at most kMostEvents) different events is signaled, and takes the signal of the first
    // such; its index is in `first`, which is -1 otherwise.
    static constexpr std::size_t kMostEvents = 4;
    static EventWait WaitAny(Event* const* events, std::size_t count, std::int32_t milliseconds, int& first) noexcept;

private:
    struct Watch;
    static constinit Mutex watchMutex;            // one for the watches of all events; nothing is taken inside
    static constexpr std::uint32_t kWatched = 1;  // bit 0 of sleepers_: a WaitAny watches this event among others
    static constexpr std::uint32_t kSleeper = 2;  // the rest counts the threads asleep in Wait

    bool Take() noexcept {
        return signaled_.load(std::memory_order_seq_cst) != 0 && signaled_.exchange(0, std::memory_order_seq_cst) != 0;
    }
    EventWait WaitForSignal(std::int32_t milliseconds) noexcept;
    bool LookAgain() noexcept;
    EventWait SleepFor(std::int32_t milliseconds) noexcept;
    void Wake(std::uint32_t sleepers) noexcept;
    void AddWatch(Watch& watch) noexcept TESSEL_REQUIRES(watchMutex);
    void RemoveWatch(Watch& watch) noexcept TESSEL_REQUIRES(watchMutex);
    void WakeWatches() noexcept;
    static int TakeFirst(Event* const* events, std::size_t count) noexcept;

    // Who waits first counts itself and then looks for the signal, who signals does it the other way round: so one of
    // them sees the other.
    std::atomic<std::uint32_t> signaled_;  // 0 or 1; sleepers sleep on it
    std::atomic<std::uint32_t> sleepers_{0};
    std::atomic<std::uint32_t> awake_{0};  // threads in Wait that do not sleep
    std::atomic<std::uint8_t> habit_{0};   // how soon signals came lately
    std::atomic<std::uint8_t> shortSleeps_{0};
    Watch* watches_ TESSEL_GUARDED_BY(watchMutex) = nullptr;
};

}  // namespace tessel::platform

#endif
