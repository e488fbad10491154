#include "events/ThTmoEvent.h"

#include <tessel/diagnostics/DebugStream.h>
#include <tessel/sync/ThSleep.h>
#include <tessel/time/Millisecs.h>

#include <new>

namespace tessel {
namespace {

uint32 DeadlineOf(ThTmoEvent& event) {
    event.section->Lock();
    const uint32 deadline = event.deadline;
    event.section->Unlock();
    return deadline;
}

}  // namespace

ThTmoEvent* ThTmoEventCreate() {
    auto* event = new (std::nothrow) ThTmoEvent{};
    if (!event) return nullptr;
    event->verifier = kThTmoEventVerifier;
    event->section = CreatePlatformMutex();
    event->event = CreatePlatformEvent(false);
    if (event->section && event->event) return event;
    ThTmoEventDestroy(event);
    return nullptr;
}

void ThTmoEventDestroy(ThTmoEvent* event) {
    if (!event) return;
    if (event->verifier != kThTmoEventVerifier) {
        TESSEL_REPORT(kDebugError, 0x2E91C7B4u) << "Bad ThTmoEvent in ThTmoEventDestroy()";
        return;
    }
    if (DestroyPlatformEvent(event->event) != kNoErr)
        TESSEL_REPORT(kDebugError, 0x74A0D3E9u) << "CloseHandle() failed in ThTmoEventDestroy()";
    DestroyPlatformMutex(event->section);
    event->verifier = 0;
    delete event;
}

void ThTmoEventSetDeadline(ThTmoEvent& event, uint32 deadline) {
    event.section->Lock();
    const bool differs = event.deadline != deadline;
    event.deadline = deadline;
    event.section->Unlock();
    if (differs) event.event->Signal();
}

void ThTmoEventWait(ThTmoEvent& event) {
    constexpr int32 kForEver = -1;
    constexpr uint32 kRest = 10;  // milliseconds
    for (;;) {
        int32 remaining = kForEver;
        if (const uint32 deadline = DeadlineOf(event)) {
            remaining = MillisecCmp(deadline, MilliSecs());
            if (remaining <= 0) return;
            if (remaining > 1) --remaining;
        }
        const int32 result = event.event->Wait(remaining);
        if (result == PlatformEvent::kTimedOut) return;
        if (result != PlatformEvent::kFailed) continue;
        TESSEL_REPORT(kDebugFatal, 0x5B38E60Cu) << "Wait for single object failed";
        ThSleep(kRest);
        return;
    }
}

}  // namespace tessel
