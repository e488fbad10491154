#include "base/Compiler.h"
#include "diagnostics/ObjectTracker.h"
#include "platform/LastError.h"
#include "platform/MessageEvent.h"
#include "sync/HostEvent.h"
#include "sync/PlainAllocation.h"
#include "sync/Service.h"
#include <tessel/diagnostics/DebugStream.h>
#include <tessel/sync/ThEvent.h>

#include <memory>

namespace tessel {
namespace {

constexpr int32 kExpectedEvents = 1;  // left over without a report; a start and stop leaves none
ObjectTracker eventTracker;

struct EventRecord : THEVENTREC, PlainAllocation {};

bool HasVerifier(ThEvent event) {
    return TESSEL_LIKELY(event->verifier == kThEventVerifier);
}

// The events of the interface are HostEvents: known without a virtual call.
HostEvent& Host(ThEvent event) {
    return static_cast<HostEvent&>(*event->platformEvent);
}

// False, with a report unless it is null, for what is no event.
bool IsEvent(ThEvent event) {
    if (!event) return false;
    if (HasVerifier(event)) return true;
    TESSEL_REPORT(kDebugFatal, 0x3E51A0C7u);
    return false;
}

double Milliseconds(const _HRTime& t) {
    return HRTimeToSeconds(&t) * 1000.0;
}

void ReportLatency(PlatformEvent& event) {
    uint32 count = 0;
    _HRTime total{}, third{}, minimum{}, maximum{};
    event.GetLatencyStats(&count, &total, &third, &minimum, &maximum);
    if (count == 0) return;
    TESSEL_REPORT(kDebugInfo, 0x5B07D2E1u)
        << "ThEventDestroy:"
        << ": (ms) avg latency=" << DbgFmtType<double>(Milliseconds(total) / count, "%.5f") << ";"
        << " nEvents=" << count << ";"
        << " min=" << DbgFmtType<double>(Milliseconds(minimum), "%.5f") << ";"
        << " max=" << DbgFmtType<double>(Milliseconds(maximum), "%.5f");
}

MgErr CreateEvent(ThEvent* event, bool signaled, ThEventSignalProc customSignal, const void* frame) {
    if (!event) return kArgErr;
    *event = nullptr;
    std::unique_ptr<EventRecord> record(new (std::nothrow) EventRecord);
    if (!record) return kMemFullErr;
    record->verifier = kThEventVerifier;
    record->platformEvent = CreatePlatformEvent(signaled);
    record->customSignal = customSignal;
    if (!record->platformEvent) return kMemFullErr;
    *event = record.release();
    eventTracker.Add(frame, *event, sizeof(THEVENTREC), __FILE__, __LINE__);
    return kNoErr;
}

}  // namespace

MgErr ThEventStart() {
    eventTracker.Start();
    return kNoErr;
}

MgErr ThEventStop() {
    eventTracker.StopAndReport(kExpectedEvents, "Event Leaks", "ovEventLeaks.txt");
    return kNoErr;
}

}  // namespace tessel

using namespace tessel;

MgErr ThEventCreate(ThEvent* event, uint32, bool signaled) {
    return CreateEvent(event, signaled, nullptr, __builtin_frame_address(0));
}

MgErr ThEventCreateWithCustomSignal(ThEvent* event, uint32, bool signaled, ThEventSignalProc customSignal) {
    return CreateEvent(event, signaled, customSignal, __builtin_frame_address(0));
}

void ThEventDestroy(ThEvent event) {
    if (!event) {
        TESSEL_REPORT(kDebugError, 0x70C4EE19u) << "Bad ThEvent in ThEventDestroy()";
        return;
    }
    if (!IsEvent(event)) return;
    ReportLatency(*event->platformEvent);
    eventTracker.Remove(event);
    if (const MgErr err = DestroyPlatformEvent(event->platformEvent))
        TESSEL_REPORT(kDebugError, 0x1F98B35Au) << "DestroyPlatformEvent failed with MgErr " << err << ".";
    event->verifier = 0;
    delete static_cast<EventRecord*>(event);
}

int32 ThEventSignal(ThEvent event) {
    if (!event) return 0;
    if (!HasVerifier(event)) {
        TESSEL_REPORT(kDebugFatal, 0x62A91B8Du) << "Bad verifier in event.";
        return 0;
    }
    if (event->customSignal) event->customSignal();
    return Host(event).Signal();
}

int32 ThEventReset(ThEvent event) {
    return IsEvent(event) ? Host(event).Reset() : 0;
}

MgErr ThEventWaitWithTimeout(ThEvent event, int32 milliseconds) {
    if (!IsEvent(event)) return kArgErr;
    switch (event->platformEvent->Wait(milliseconds)) {
        case PlatformEvent::kSignaled:
            return kNoErr;
        case PlatformEvent::kTimedOut:
            return kTimeOutErr;
        case PlatformEvent::kRetry:
            TESSEL_REPORT(kDebugWarning, 0x2C8F6A13u) << "We were not supposed to retry here";
            return kArgErr;
        default:
            TESSEL_REPORT(kDebugFatal, 0x0D6E47F2u) << "Wait on event failed";
            return kArgErr;
    }
}

MgErr ThEventWait(ThEvent event) {
    return ThEventWaitWithTimeout(event, -1);
}

int32 ThEventMsgWaitMultiple(ThEvent event, ThEvent second, int32 milliseconds, bool pumpMessages) {
    if (!IsEvent(event)) return 1;
    bool messageArrived = false, secondSignaled = false;
    PlatformEvent* other = second && second != event && IsEvent(second) ? second->platformEvent : nullptr;
    int32 result = Host(event).MsgWaitMultiple(other, pumpMessages, milliseconds, &messageArrived, &secondSignaled);
    return result == PlatformEvent::kSignaled && !messageArrived && !secondSignaled ? 1 : 0;
}

MgErr ThEventMessageArrived(uint32 threadId) {
    if (platform::SignalMessageEvent(threadId)) return kNoErr;
    return platform::LastError() == platform::kErrorNotEnoughMemory ? kMemFullErr : kArgErr;
}

MgErr ThEventWaitAndPump(ThEvent event, ThEventPumpProc pump, int32 milliseconds, void* argument) {
    const bool isEvent = IsEvent(event);
    const MgErr pumped = pump ? pump(argument) : kNoErr;
    return isEvent ? event->platformEvent->WaitAndPump(pump, argument, milliseconds) : pumped;
}
