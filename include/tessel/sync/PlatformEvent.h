// What an event of the host does. ThEvent is built on it.
#ifndef TESSEL_SYNC_PLATFORMEVENT_H
#define TESSEL_SYNC_PLATFORMEVENT_H

#include <tessel/base/MgErr.h>
#include <tessel/base/Types.h>
#include <tessel/sync/ThEvent.h>
#include <tessel/time/HRTime.h>

#ifdef __cplusplus

namespace tessel {

// Milliseconds below 0 wait for ever. Any thread; Init and Uninit while no other uses the event.
class TESSEL_API PlatformEvent {
public:
    // Results of the waits. No event of this host asks for another try.
    enum WaitResult : int32 { kSignaled = 0, kTimedOut = 1, kFailed = 2, kRetry = 3 };

    virtual ~PlatformEvent();
    // 1 when a thread was waiting, else 0.
    virtual int32 Signal() = 0;
    // 1 when the event was signaled, else 0.
    virtual int32 Reset() = 0;
    // Waits until signaled, for so long at most; a WaitResult.
    virtual int32 Wait(int32 milliseconds) = 0;
    // Not available here: kMemFullErr.
    virtual MgErr WaitAndPump(ThEventPumpProc pump, void* argument, int32 milliseconds) = 0;
    // Waits for this event, for `other` (null or this: none) or, with pump, for a message; tells which it was.
    virtual int32 MsgWaitMultiple(PlatformEvent* other, bool pump, int32 milliseconds, bool* messageArrived,
                                  bool* otherSignaled) = 0;
    // Latencies between signal and wake-up; each output may be null. Not collected here: a count of 0.
    virtual void GetLatencyStats(uint32* count, _HRTime* total, _HRTime* third, _HRTime* minimum, _HRTime* maximum) = 0;
    // Before first use, and after the last.
    virtual MgErr Init(bool signaled) = 0;
    // After the last use.
    virtual MgErr Uninit() = 0;
};

// A new event of this host, or null. Destroy: kNoErr for null, else what Uninit returns.
TESSEL_API PlatformEvent* CreatePlatformEvent(bool signaled);
// Ends an event. kNoErr for null, else what Uninit returns.
TESSEL_API MgErr DestroyPlatformEvent(PlatformEvent* event);

}  // namespace tessel

#endif
#endif
