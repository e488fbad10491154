#include "platform/MessageEvent.h"
#include "platform/Mutex.h"
#include "sync/HostEvent.h"
#include <tessel/sync/PlatformEvent.h>
#include <tessel/sync/PlatformEventTimer.h>

#include <new>
#include <utility>

namespace tessel {

// Events that were destroyed, for the next to be made. Their memory stays that of an event for good: a signal releases
// a waiter, who may destroy the event while the signaling thread still looks whom else to wake. When it finds another
// event there, a thread that sleeps on that one looks up once for nothing.
class SpareEvents {
public:
    HostEvent* Take() {
        platform::MutexHolder holder(mutex_);
        HostEvent* event = first_;
        if (event) first_ = std::exchange(event->nextSpare_, nullptr);
        return event;
    }
    void Keep(HostEvent* event) {
        platform::MutexHolder holder(mutex_);
        event->nextSpare_ = std::exchange(first_, event);
    }

private:
    platform::Mutex mutex_;  // nothing is taken inside
    HostEvent* first_ TESSEL_GUARDED_BY(mutex_) = nullptr;
};

namespace {

constinit SpareEvents spareEvents;

}  // namespace

PlatformEvent::~PlatformEvent() = default;

MgErr HostEvent::Init(bool signaled) {
    event_.Renew(signaled);
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
    HostEvent* event = spareEvents.Take();
    if (!event) event = new (std::nothrow) HostEvent;
    if (event) event->Init(signaled);
    return event;
}

MgErr DestroyPlatformEvent(PlatformEvent* event) {
    if (!event) return kNoErr;
    const MgErr err = event->Uninit();
    if (auto* own = dynamic_cast<HostEvent*>(event))
        spareEvents.Keep(own);
    else
        delete event;
    return err;
}

}  // namespace tessel
