// Queues of events, each with the target that it is for: posted by any thread, delivered in the order of posting on the
// thread that drains the queue.
//
//     CreateMGEventQueue  -->  Init: running, accepting  -->  SetAcceptingEvents(false)  -->  Uninit  -->  Destroy
//
// A queue owns a reference to each event that it holds, and releases it with its lock given back. Any thread may post,
// purge and ask; one thread at a time drains.
#ifndef TESSEL_EVENTS_MGEVENTQUEUE_H
#define TESSEL_EVENTS_MGEVENTQUEUE_H

#include <tessel/base/MgErr.h>
#include <tessel/events/MGEvent.h>
#include <tessel/events/MGEventTarget.h>

#ifdef __cplusplus

namespace tessel {

// The slots and their order are fixed. Policies, predicates and filters run with the lock of the queue held: they must
// not call it.
class TESSEL_API MGEventQueue {
public:
    // Decides what becomes of an event that is equivalent to one that waits for the same target.
    class TESSEL_API DuplicatePostedEventPolicy {
    public:
        enum Decision : int32 {
            kKeepQueued = 0,     // release the new one
            kReplaceQueued = 1,  // release the one that waits; the new one takes its place in line
            kDropBoth = 2        // release both
        };
        // Given the pair that waits. Any other answer is as kKeepQueued.
        virtual int32 Decide(MGEventTarget* target, MGEvent* queued) = 0;
        virtual ~DuplicatePostedEventPolicy() = default;
    };

    // The policy of who gives none.
    class TESSEL_API KeepExistingEventPolicy final : public DuplicatePostedEventPolicy {
    public:
        int32 Decide(MGEventTarget*, MGEvent*) override { return kKeepQueued; }
        // The one object of this policy; the library's.
        static KeepExistingEventPolicy& Instance();
    };

    // Has a word on the events that their target would have delivered: any MGEventTarget::Decision.
    class TESSEL_API EventFilter {
    public:
        // What to do with the event now.
        virtual int32 Check(MGEventTarget* target, MGEvent* event) = 0;
        virtual ~EventFilter() = default;
    };

    // Picks events to be dropped; `argument` is the caller's.
    using PurgePredicate = bool (*)(MGEventTarget* target, MGEvent* event, void* argument);

    // Starts the queue, its counters at 0. The error of its creation, if there was one.
    virtual MgErr Init() = 0;
    // Releases all events and stops the queue. Always kNoErr.
    virtual MgErr Uninit() = 0;
    // Ends the queue, which must not be running: that is reported, and what it still holds is released.
    virtual void Destroy() = 0;

    // A queue that does not accept events delivers none either. Changes only while it runs; the value as it was.
    virtual bool IsAcceptingEvents() = 0;
    // Opens or closes the queue to events; nothing while it does not run. The value as it was.
    virtual bool SetAcceptingEvents(bool accepting) = 0;

    // Posts an event, whose reference the queue takes over, unless the result says otherwise.
    //   0              appended
    //   1              without `alwaysAppend`, an equivalent event waits for the target; `policy` (null: keep the one
    //                  that waits) has decided. Looked for before the queue counts as full.
    //   2              the queue is full, or there is no memory; the event was released
    //   kEventQueueErr the queue does not run or accept; the event is still the caller's
    // kArgErr (1) for a null target or event; nothing is released.
    virtual MgErr PostEvent(MGEventTarget* target, MGEvent* event, bool alwaysAppend,
                            DuplicatePostedEventPolicy* policy) = 0;

    // Drops the events that the predicate is true for; how many. 0 while the queue does not run.
    virtual uint32 PurgeEvents(PurgePredicate predicate, void* argument) = 0;

    // How many events wait; 0 while the queue does not run.
    virtual uint32 GetNumEvents() = 0;
    // How many events may wait; 0: any number.
    virtual uint32 GetMaxSize() = 0;
    // Whether some target would have its event delivered.
    virtual bool HasDispatchableEvent() = 0;

    // Delivers what was queued when it began, or `maxCount` of it when that is positive, for about `milliseconds` at
    // most when that is positive. Events that their target discards, or the filter (null: none), count too. How many
    // were delivered or discarded. A target may post to the queue: that waits for the next call.
    virtual uint32 ProcessEvents(int32 maxCount, EventFilter* filter, int32 milliseconds) = 0;

    // Appends a list of what waits.
    virtual void Dump(DebugStream& stream) = 0;

    virtual ~MGEventQueue() = default;
};

// A new queue, not running yet, for at most `maxSize` events (0: any number); null when there is no memory. The name
// (null: none) is kept by address. The caller ends it with Destroy.
TESSEL_API MGEventQueue* CreateMGEventQueue(CStr name, uint32 maxSize);

// The queue's Dump; nothing for null.
TESSEL_API void ToDebugStream(DebugStream& stream, MGEventQueue* queue);

}  // namespace tessel

#endif
#endif
