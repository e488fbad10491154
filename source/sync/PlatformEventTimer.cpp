#include <tessel/sync/PlatformEventTimer.h>

namespace tessel {

void PlatformEventTimer::Start() {
    HRWallClockTime(&start_);
}

void PlatformEventTimer::RecordLatency() {
    _HRTime now;
    HRWallClockTime(&now);
    if (HRTimeCompare(&now, &start_) < 0) return;
    _HRTime latency;
    HRTimeSubtract(&now, &start_, &latency);
    HRTimeAdd(&total_, &latency, &total_);
    if (count_ == 0 || HRTimeCompare(&latency, &minimum_) < 0) minimum_ = latency;
    if (count_ == 0 || HRTimeCompare(&latency, &maximum_) > 0) maximum_ = latency;
    ++count_;
}

void PlatformEventTimer::GetLatencyStats(uint32* count, _HRTime* total, _HRTime* third, _HRTime* minimum,
                                         _HRTime* maximum) const {
    if (count) *count = count_;
    if (total) *total = total_;
    if (third) *third = third_;
    if (minimum) *minimum = minimum_;
    if (maximum) *maximum = maximum_;
}

}  // namespace tessel
