// Latency statistics in high-resolution time (time/HRTime.h). Callers serialise.
#ifndef TESSEL_SYNC_PLATFORMEVENTTIMER_H
#define TESSEL_SYNC_PLATFORMEVENTTIMER_H

#include <tessel/base/Types.h>
#include <tessel/time/HRTime.h>

#ifdef __cplusplus

namespace tessel {

// Collects how long it took from Start to RecordLatency: how often, and the sum, the least and the most of it.
class TESSEL_API PlatformEventTimer {
public:
    PlatformEventTimer() = default;

    // From here on the time counts.
    void Start();
    // Adds the time since Start to the statistics, unless the clock went backwards.
    void RecordLatency();
    // Each output may be null. `third` is always 0.
    void GetLatencyStats(uint32* count, _HRTime* total, _HRTime* third, _HRTime* minimum, _HRTime* maximum) const;

private:
    _HRTime start_ = {0, 0};
    _HRTime total_ = {0, 0};
    _HRTime third_ = {0, 0};
    _HRTime maximum_ = {0, 0};
    _HRTime minimum_ = {0, 0};
    uint32 count_ = 0;
};

}  // namespace tessel

#endif
#endif
