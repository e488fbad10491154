#include <tessel/sync/PlatformEventTimer.h>

namespace tessel {

void PlatformEventTimer::Start() {
    HRWallClockTime(&fStart);
}

void PlatformEventTimer::RecordLatency() {
    _HRTime now;
    HRWallClockTime(&now);
    if (HRTimeCompare(&now, &fStart) < 0) return;
    _HRTime latency;
    HRTimeSubtract(&now, &fStart, &latency);
    HRTimeAdd(&fTotal, &latency, &fTotal);
    if (fCount == 0 || HRTimeCompare(&latency, &fMinimum) < 0) fMinimum = latency;
    if (fCount == 0 || HRTimeCompare(&latency, &fMaximum) > 0) fMaximum = latency;
    ++fCount;
}

void PlatformEventTimer::GetLatencyStats(uint32* count, _HRTime* total, _HRTime* third, _HRTime* minimum,
                                         _HRTime* maximum) const {
    if (count) *count = fCount;
    if (total) *total = fTotal;
    if (third) *third = fThird;
    if (minimum) *minimum = fMinimum;
    if (maximum) *maximum = fMaximum;
}

}  // namespace tessel
