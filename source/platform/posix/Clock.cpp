#include "platform/Clock.h"

#include "platform/posix/FileHandles.h"
#include "platform/posix/SystemCalls.h"

#include <errno.h>

namespace tessel::platform {

namespace {

constexpr std::uint64_t kNanosecondsPerSecond = 1'000'000'000;

timespec Read(clockid_t clock) {
    timespec time{};
    systemCalls.clock_gettime(clock, &time);
    return time;
}

std::uint64_t In100Nanoseconds(const timeval& time) {
    return static_cast<std::uint64_t>(time.tv_sec) * 10'000'000u + static_cast<std::uint64_t>(time.tv_usec) * 10u;
}

ProcessorTime UsageOf(int who) {
    rusage usage{};
    systemCalls.getrusage(who, &usage);
    return {In100Nanoseconds(usage.ru_stime), In100Nanoseconds(usage.ru_utime)};
}

}  // namespace

std::uint32_t TickMilliseconds() noexcept {
    timespec time = Read(CLOCK_MONOTONIC);
    return static_cast<std::uint32_t>(time.tv_sec) * 1000u + static_cast<std::uint32_t>(time.tv_nsec) / 1'000'000u;
}

std::uint64_t HighResolutionCount() noexcept {
    timespec time = Read(CLOCK_MONOTONIC);
    return static_cast<std::uint64_t>(time.tv_sec) * kNanosecondsPerSecond + static_cast<std::uint64_t>(time.tv_nsec);
}

std::uint64_t HighResolutionFrequency() noexcept {
    return kNanosecondsPerSecond;
}

std::int64_t SystemFileTime() noexcept {
    timespec time = Read(CLOCK_REALTIME);
    return FileTimeOf(time.tv_sec, time.tv_nsec);
}

ProcessorTime ProcessTimes() noexcept {
    return UsageOf(RUSAGE_SELF);
}

ProcessorTime ThreadTimes() noexcept {
    return UsageOf(RUSAGE_THREAD);
}

void SleepMilliseconds(std::uint32_t milliseconds) noexcept {
    if (milliseconds == 0) {
        systemCalls.sched_yield();
        return;
    }
    timespec until = Read(CLOCK_MONOTONIC);
    until.tv_sec += static_cast<time_t>(milliseconds / 1000);
    until.tv_nsec += static_cast<long>(milliseconds % 1000) * 1'000'000;
    if (until.tv_nsec >= static_cast<long>(kNanosecondsPerSecond)) {
        until.tv_nsec -= static_cast<long>(kNanosecondsPerSecond);
        ++until.tv_sec;
    }
    // To a moment rather than for a time: so interruptions, however many, do not make it longer.
    while (systemCalls.clock_nanosleep(CLOCK_MONOTONIC, TIMER_ABSTIME, &until, nullptr) != 0 && errno == EINTR) {
    }
}

}  // namespace tessel::platform
