/* The auto-reset event.

   An event is signaled or not. A wait that finds it signaled, or is woken by a signal, resets it: one signal releases
   one waiter, and several signals before a wait count as one.

     state          Set                       Wait
     signaled       stays so                  resets it and goes on
     not, nobody    signaled                  spins briefly, then sleeps
     not, waiters   wakes one if it sleeps    joins them

   Nothing allocates or throws; nobody asleep, no system call. Any thread. The memory may be released as soon as no
   thread is inside a call on it. */
#ifndef TESSEL_PLATFORM_EVENT_H
#define TESSEL_PLATFORM_EVENT_H

#include <atomic>
#include <cstddef>
#include <cstdint>

namespace tessel::platform {

class Event {
public:
    explicit constexpr Event(bool signaled = false) noexcept : word_(signaled ? kSignaled : 0) {}
    Event(const Event&) = delete;
    Event& operator=(const Event&) = delete;

    /* True when a thread was waiting. */
    bool Set() noexcept {
        std::uint32_t before = word_.fetch_or(kSignaled, std::memory_order_seq_cst);
        if (before > kSignaled) {
            Wake(before);
            return true;
        }
        return awake_.load(std::memory_order_relaxed) != 0;
    }

    /* Not signaled from here on. True when it was. */
    bool Reset() noexcept { return (word_.fetch_and(~kSignaled, std::memory_order_seq_cst) & kSignaled) != 0; }

    /* True when the signal was taken, false when so many milliseconds passed without one. Negative: waits for ever.
       Never early; changes of the time of day do not matter. */
    bool Wait(std::int32_t milliseconds) noexcept;

    /* Waits until one of `count` (at most kMostEvents) different events is signaled, and takes the signal of the first
       such. Its index, or -1 after so many milliseconds. */
    static constexpr std::size_t kMostEvents = 4;
    static int WaitAny(Event* const* events, std::size_t count, std::int32_t milliseconds) noexcept;

private:
    struct Watch;
    static constexpr std::uint32_t kSignaled = 1; /* bit 0 of word_ */
    static constexpr std::uint32_t kWatched = 2;  /* bit 1: a WaitAny watches this event among others */
    static constexpr std::uint32_t kSleeper = 4;  /* the rest counts the threads asleep in Wait */

    bool Take() noexcept;
    bool Spin() noexcept;
    bool SleepFor(std::int32_t milliseconds) noexcept;
    void Wake(std::uint32_t before) noexcept;
    void PassOn(std::uint32_t now) noexcept;
    void AddWatch(Watch& watch) noexcept;
    void RemoveWatch(Watch& watch) noexcept;
    void WakeWatches() noexcept;
    static int TakeFirst(Event* const* events, std::size_t count) noexcept;

    std::atomic<std::uint32_t> word_;
    std::atomic<std::uint16_t> awake_{0}; /* threads in Wait that do not sleep */
    std::atomic<std::uint16_t> spins_{0}; /* how long the last waits were worth spinning */
    Watch* watches_ = nullptr;            /* guarded by the one lock of all watches */
};

/* Signaled by the host when input for the thread that handles its messages has arrived. One for the process. */
Event& MessageEvent() noexcept;

}  // namespace tessel::platform

#endif
