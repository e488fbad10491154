#include "support/HandClock.h"

#include "platform/posix/SystemCalls.h"

#include <atomic>

namespace tessel::test {

using platform::systemCalls;

namespace {

std::atomic<std::int64_t> now;  // nanoseconds
platform::SystemCalls original;

int Read(clockid_t, timespec* time) {
    time->tv_sec = static_cast<time_t>(now / 1'000'000'000);
    time->tv_nsec = static_cast<long>(now % 1'000'000'000);
    return 0;
}

int SleepUntil(clockid_t, int, const timespec* time, timespec*) {
    now = static_cast<std::int64_t>(time->tv_sec) * 1'000'000'000 + time->tv_nsec;
    return 0;
}

}  // namespace

HandClock::HandClock(std::int64_t milliseconds) {
    original = systemCalls;
    now = milliseconds * 1'000'000;
    systemCalls.clock_gettime = Read;
    systemCalls.clock_nanosleep = SleepUntil;
}

HandClock::~HandClock() {
    systemCalls = original;
}

void HandClock::Advance(std::int64_t milliseconds) {
    now += milliseconds * 1'000'000;
}

}  // namespace tessel::test
