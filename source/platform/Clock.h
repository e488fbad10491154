// Clocks and sleeping. None of it fails. Any thread.
#ifndef TESSEL_PLATFORM_CLOCK_H
#define TESSEL_PLATFORM_CLOCK_H

#include <cstdint>

namespace tessel::platform {

// Milliseconds from an arbitrary origin, monotonic, wrapping at 2^32. One read of the host's clock.
std::uint32_t TickMilliseconds() noexcept;

// A monotonic count, and how many of them make a second.
std::uint64_t HighResolutionCount() noexcept;
std::uint64_t HighResolutionFrequency() noexcept;

// The time of day: 100 ns since 1601-01-01 00:00:00 UTC.
std::int64_t SystemFileTime() noexcept;

// Processor time used, in 100 ns.
struct ProcessorTime {
    std::uint64_t kernel, user;
};
ProcessorTime ProcessTimes() noexcept;
ProcessorTime ThreadTimes() noexcept;

// At least so long, whatever signals arrive. 0 gives up the rest of the time slice.
void SleepMilliseconds(std::uint32_t milliseconds) noexcept;

}  // namespace tessel::platform

#endif
