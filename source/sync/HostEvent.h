// The event of this host as a PlatformEvent.
#ifndef TESSEL_SOURCE_SYNC_HOSTEVENT_H
#define TESSEL_SOURCE_SYNC_HOSTEVENT_H

#include "platform/Event.h"
#include "sync/PlainAllocation.h"
#include <tessel/sync/PlatformEvent.h>

namespace tessel {

// Final and inline: a ThEvent that nobody waits for is signaled without a virtual call.
class HostEvent final : public PlatformEvent, public PlainAllocation {
public:
    int32 Signal() override { return event_.Set() ? 1 : 0; }
    int32 Reset() override { return event_.Reset() ? 1 : 0; }
    int32 Wait(int32 milliseconds) override { return ResultOf(event_.Wait(milliseconds)); }
    MgErr WaitAndPump(ThEventPumpProc, void*, int32) override { return kMemFullErr; }
    int32 MsgWaitMultiple(PlatformEvent* other, bool pump, int32 milliseconds, bool* messageArrived,
                          bool* otherSignaled) override;
    void GetLatencyStats(uint32* count, _HRTime* total, _HRTime* third, _HRTime* minimum, _HRTime* maximum) override;
    MgErr Init(bool signaled) override;
    MgErr Uninit() override { return kNoErr; }

private:
    friend class SpareEvents;

    static int32 ResultOf(platform::EventWait wait) {
        if (wait == platform::EventWait::kTaken) return kSignaled;
        return wait == platform::EventWait::kTimedOut ? kTimedOut : kFailed;
    }

    platform::Event event_;
    HostEvent* nextSpare_ = nullptr;
};

}  // namespace tessel

#endif
