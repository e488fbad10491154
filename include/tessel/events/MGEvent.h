// What a queue delivers. The queue does not know what an event means.
#ifndef TESSEL_EVENTS_MGEVENT_H
#define TESSEL_EVENTS_MGEVENT_H

#include <tessel/events/MGUnknown.h>

#ifdef __cplusplus

namespace tessel {

// The host implements it. Both run with the lock of the queue held: they must not call the queue.
class TESSEL_API MGEvent : public MGUnknown {
public:
    // What the event is about, in the host's numbering.
    virtual int32 GetKind() = 0;
    // Whether one of the two is enough.
    virtual bool IsEquivalent(MGEvent* other) = 0;

    // The identifier that QueryClass knows this interface by.
    static const OVGuidType& ClassID();

protected:
    ~MGEvent() = default;
};

}  // namespace tessel

#endif
#endif
