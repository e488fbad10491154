// Whom a queue delivers events to.
#ifndef TESSEL_EVENTS_MGEVENTTARGET_H
#define TESSEL_EVENTS_MGEVENTTARGET_H

#include <tessel/events/MGEvent.h>

#ifdef __cplusplus

namespace tessel {

// What all targets share. The slots and their order are fixed; those without a name are not called.
class TESSEL_API MGEventTargetBase : public MGUnknown {
public:
    virtual uintptr_t Slot4() { return 0; }
    virtual uintptr_t Slot5() { return 0; }

    // The identifier that QueryClass knows this interface by.
    static const OVGuidType& ClassID();

protected:
    ~MGEventTargetBase() = default;
};

// The host implements it. A queue holds no reference to its targets: purge the queue before a target ends.
class TESSEL_API MGEventTarget : public MGEventTargetBase {
public:
    // The answers of CheckEvent. Any other is as kDefer.
    enum Decision : int32 { kDiscard = 0, kDefer = 1, kDeliver = 2 };

    // What to do with the event now: drop it, leave it in its place, deliver it. Runs with the lock of the queue held,
    // possibly often for one event: it must not call the queue.
    virtual int32 CheckEvent(MGEvent* event) = 0;
    virtual uintptr_t Slot7() { return 0; }
    // Runs on the thread that drains the queue, without its lock. The event is the queue's, which releases it
    // afterwards.
    virtual void HandleEvent(MGEvent* event) = 0;

    // The identifier that QueryClass knows this interface by.
    static const OVGuidType& ClassID();

protected:
    ~MGEventTarget() = default;
};

}  // namespace tessel

#endif
#endif
