#include <tessel/sync/PlatformEvent.h>
#include <tessel/sync/PlatformEventTimer.h>

#include <memory>

#include "platform/MessageEvent.h"
#include "sync/HostEvent.h"

namespace tessel {

PlatformEvent::~PlatformEvent() = default;

MgErr HostEvent::Init(bool signaled) {
    if (signaled)
        event_.Set();
    else
        event_.Reset();
    return kNoErr;
}

int32 HostEvent::MsgWaitMultiple(PlatformEvent* other, bool pump, int32 milliseconds, bool* messageArrived,
                                 bool* otherSignaled) {
    platform::Event* events[platform::Event::kMostEvents] = {&event_};
    int count = 1, otherIndex = -1, messageIndex = -1;
    if (other && other != this) {
        otherIndex = count;
        events[count++] = &static_cast<HostEvent*>(other)->event_;
    }
    if (pump) {
        messageIndex = count;
        events[count++] = platform::OwnMessageEvent();
        if (!events[messageIndex]) return kFailed;
    }
    int first = -1;
    platform::EventWait wait = platform::Event::WaitAny(events, static_cast<std::size_t>(count), milliseconds, first);
    if (messageArrived) *messageArrived = first >= 0 && first == messageIndex;
    if (otherSignaled) *otherSignaled = first >= 0 && first == otherIndex;
    return ResultOf(wait);
}

void HostEvent::GetLatencyStats(uint32* count, _HRTime* total, _HRTime* third, _HRTime* minimum, _HRTime* maximum) {
    PlatformEventTimer().GetLatencyStats(count, total, third, minimum, maximum);
}

PlatformEvent* CreatePlatformEvent(bool signaled) {
    std::unique_ptr<HostEvent> event(new (std::nothrow) HostEvent);
    if (!event || event->Init(signaled) != kNoErr) return nullptr;
    return event.release();
}

MgErr DestroyPlatformEvent(PlatformEvent* event) {
    if (!event) return kNoErr;
    MgErr err = event->Uninit();
    delete event;
    return err;
}

}  // namespace tessel
