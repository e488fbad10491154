#include "platform/Clock.h"
#include "time/ClockMode.h"
#include <tessel/system/OpSystemInfo.h>
#include <tessel/time/HRTime.h>

#include <cmath>

namespace tessel {
namespace {

constexpr double kTwoTo32 = 4294967296.0;

std::atomic<uint32> tickState{0};
std::atomic<int32> useMultimediaTimer{0};

uint64 Count(const _HRTime& t) {
    return (static_cast<uint64>(t.high) << 32) | t.low;
}

_HRTime FromCount(uint64 count) {
    return {static_cast<uint32>(count >> 32), static_cast<uint32>(count)};
}

double CountsPerSecond(ClockMode mode) {
    return mode == ClockMode::kProcessTime ? 10000000.0 : 1000.0;
}

}  // namespace

ClockMode CurrentClockMode() {
    static std::atomic<ClockMode> decided{ClockMode::kUndecided};
    ClockMode mode = decided.load(std::memory_order_relaxed);
    if (mode == ClockMode::kUndecided) {
        const bool processTime = (OSInfo()->GetFeatureFlags() & OpSystemFeatureFlags::kIsNTOS()).IsNonZero();
        mode = processTime ? ClockMode::kProcessTime : ClockMode::kTick;
        decided.store(mode, std::memory_order_relaxed);
    }
    return mode;
}

_HRTime ExtendTick(std::atomic<uint32>& state, uint32 tick) {
    constexpr uint32 kWraps = 0xFF;
    const uint32 last = state.load(std::memory_order_relaxed);
    const uint32 wraps = (last + (tick < (last & ~kWraps) ? 1 : 0)) & kWraps;
    state.store((tick & ~kWraps) | wraps, std::memory_order_relaxed);
    return {wraps, tick};
}

_HRTime ReadClock(ClockMode mode) {
    if (mode != ClockMode::kProcessTime) return ExtendTick(tickState, platform::TickMilliseconds());
    platform::ProcessorTime used = platform::ProcessTimes();
    return FromCount(used.kernel + used.user);
}

double SecondsOf(const _HRTime& t, ClockMode mode) {
    return (t.high * kTwoTo32 + t.low) / CountsPerSecond(mode);
}

_HRTime TimeOf(double seconds, ClockMode mode) {
    const double count = seconds * CountsPerSecond(mode);
    // Through 64 bits, so that a negative count wraps as the words of _HRTime do.
    auto word = [](double value) {
        constexpr double kBeyondInt64 = 9223372036854775808.0;
        return std::fabs(value) < kBeyondInt64 ? static_cast<uint32>(static_cast<int64>(value)) : 0;
    };
    return {word(count / kTwoTo32), word(std::fmod(count, kTwoTo32))};
}

}  // namespace tessel

using namespace tessel;

void HRTimeZero(_HRTime* t) {
    *t = {0, 0};
}

void HRTimeAdd(const _HRTime* a, const _HRTime* b, _HRTime* out) {
    *out = FromCount(Count(*a) + Count(*b));
}

void HRTimeSubtract(const _HRTime* a, const _HRTime* b, _HRTime* out) {
    *out = FromCount(Count(*a) - Count(*b));
}

int32 HRTimeCompare(const _HRTime* a, const _HRTime* b) {
    const uint64 left = Count(*a), right = Count(*b);
    return (left > right) - (left < right);
}

void HRWallClockTime(_HRTime* out) {
    *out = ReadClock(CurrentClockMode());
}

double HRTimeToSeconds(const _HRTime* t) {
    return SecondsOf(*t, CurrentClockMode());
}

void SecondsToHRTime(double seconds, _HRTime* out) {
    *out = TimeOf(seconds, CurrentClockMode());
}

void HRTimeSetUseMultimediaTimer(int32 on) {
    useMultimediaTimer.store(on, std::memory_order_relaxed);
}

int32 HRTimeGetUseMultimediaTimer(void) {
    return useMultimediaTimer.load(std::memory_order_relaxed);
}
