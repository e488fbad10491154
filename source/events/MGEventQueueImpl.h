// The event queue.
#ifndef TESSEL_SOURCE_EVENTS_MGEVENTQUEUEIMPL_H
#define TESSEL_SOURCE_EVENTS_MGEVENTQUEUEIMPL_H

#include <tessel/events/MGEventQueue.h>
#include <tessel/memory/TrackedMallocFree.h>
#include <tessel/sync/ThMutex.h>

#include <list>

namespace tessel {

class MGEventQueueImpl final : public MGEventQueue, public TrackedObject {
public:
    MGEventQueueImpl(CStr name, uint32 maxSize);
    ~MGEventQueueImpl() override;

    MgErr Init() override;
    MgErr Uninit() override;
    void Destroy() override;
    bool IsAcceptingEvents() override;
    bool SetAcceptingEvents(bool accepting) override;
    MgErr PostEvent(MGEventTarget* target, MGEvent* event, bool alwaysAppend,
                    DuplicatePostedEventPolicy* policy) override;
    uint32 PurgeEvents(PurgePredicate predicate, void* argument) override;
    uint32 GetNumEvents() override;
    uint32 GetMaxSize() override;
    bool HasDispatchableEvent() override;
    uint32 ProcessEvents(int32 maxCount, EventFilter* filter, int32 milliseconds) override;
    void Dump(DebugStream& stream) override;

    // What became of the events since Init. For tests and debuggers.
    struct Counters {
        uint32 delivered, purged, dropped;  // dropped: discarded by targets, or as duplicates
    };
    Counters GetCounters();

private:
    struct Pair {
        MGEventTarget* target;
        MGEvent* event;
        uint64 serial;  // counts the posts
    };
    using Pairs = std::list<Pair, TrackedAllocator<Pair>>;
    struct Taken;
    struct Posting;

    // Under the mutex.
    bool IsOpen() const { return running_ && accepting_; }
    bool IsFull() const { return maxSize_ != 0 && elements_.size() >= maxSize_; }
    bool Append(MGEventTarget* target, MGEvent* event);
    Pairs::iterator FindDuplicate(MGEventTarget* target, MGEvent* event);
    void Settle(Pairs::iterator duplicate, Posting& posting);
    void Post(Posting& posting);
    Pairs::iterator Remove(Pairs::iterator pair);

    Taken Take(EventFilter* filter, uint64 serialEnd);
    static void ReleaseAll(const Pairs& pairs);

    ThMutex mutex_ = nullptr;  // "MGEventQueueRights": guards what follows
    MgErr mutexErr_;
    bool running_ = false;
    bool accepting_ = false;
    Pairs elements_;  // in the order of posting
    Pairs spare_;     // places that were used before
    uint64 nextSerial_ = 0;
    Counters counters_{0, 0, 0};
    const uint32 maxSize_;
    const CStr name_;
};

}  // namespace tessel

#endif
