// The event that the occurrence thread waits on until a deadline.
#ifndef TESSEL_SOURCE_EVENTS_THTMOEVENT_H
#define TESSEL_SOURCE_EVENTS_THTMOEVENT_H

#include <tessel/base/MgErr.h>
#include <tessel/base/Types.h>
#include <tessel/memory/TrackedMallocFree.h>
#include <tessel/sync/PlatformEvent.h>
#include <tessel/sync/PlatformMutex.h>

namespace tessel {

struct ThTmoEvent : TrackedObject {
    uint32 verifier;         // kThTmoEventVerifier
    uint32 deadline;         // on the millisecond clock; 0: none
    PlatformMutex* section;  // guards the deadline; nothing is taken inside
    PlatformEvent* event;    // auto-reset
};

constexpr uint32 kThTmoEventVerifier = 0x76456D54;  // the bytes "TmEv"

// A new event without deadline, not signaled; null when there is no memory.
ThTmoEvent* ThTmoEventCreate();

// Nothing for null. A bad verifier is reported, and nothing is freed.
void ThTmoEventDestroy(ThTmoEvent* event);

// Another deadline wakes who waits, to look at it.
void ThTmoEventSetDeadline(ThTmoEvent& event, uint32 deadline);

// Waits until a millisecond before the deadline, or the deadline itself when that is less: who waits again then wakes
// close to it. Without a deadline it waits until there is one. A wait that fails is reported, and ends after a rest.
void ThTmoEventWait(ThTmoEvent& event);

}  // namespace tessel

#endif
