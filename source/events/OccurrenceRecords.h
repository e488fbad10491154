// What stands behind the refnums of occurrences and handlers. All of it is guarded by gOccMutex, but for the entries of
// the two lists of times, which are guarded as these are.
#ifndef TESSEL_SOURCE_EVENTS_OCCURRENCERECORDS_H
#define TESSEL_SOURCE_EVENTS_OCCURRENCERECORDS_H

#include "events/TimeList.h"
#include <tessel/events/OccurrenceManager.h>

namespace tessel {

struct occh;

// A handler's link in a list.
struct HandlerNode {
    OccurHdlr refnum;  // of the handler
    HandlerNode* next;
    HandlerNode** link;  // what points to this node; null while it is on no list
    occh* handler;

    bool IsListed() const { return link != nullptr; }
};

// A list of handlers, newest first. Whether it is empty may be asked without the lock.
class HandlerList {
public:
    bool IsEmpty() const { return !__atomic_load_n(&first_, __ATOMIC_ACQUIRE); }
    HandlerNode* First() const { return first_; }

    void PushFront(HandlerNode& node) {
        node.next = first_;
        node.link = &first_;
        if (first_) first_->link = &node.next;
        Store(&first_, &node);
    }
    // Nothing for a node that is on no list.
    static void Remove(HandlerNode& node) {
        if (!node.link) return;
        if (node.next) node.next->link = node.link;
        Store(node.link, node.next);
        node.link = nullptr;
        node.next = nullptr;
    }
    void Forget() { Store(&first_, nullptr); }

private:
    static void Store(HandlerNode** where, HandlerNode* node) { __atomic_store_n(where, node, __ATOMIC_RELEASE); }

    HandlerNode* first_ = nullptr;
};

// The count of a new occurrence, and of it alone.
constexpr uint32 kNewOccurrenceCount = 2;

// An occurrence.
struct Occ {
    uint32 count = kNewOccurrenceCount;  // raised by each setting
    HandlerList handlers;                // those bound to it
    TimeList::Entry schedule;            // guarded by gTimerOccMutex
};

// The bits of a handler's flags.
enum : uint32 { kOnTimedList = 1, kHasTimedOut = 2, kStrict = 4 };

// A handler.
struct occh {
    OccurHdlr refnum = 0;
    int32 armed = 0;
    int32 fired = 0;  // on a fired list
    Occurrence occurrence = 0;
    uint32 seen = kNewOccurrenceCount;  // the count of the occurrence that it has accounted for
    OccurHdlrProc callback = nullptr;
    void* argument = nullptr;
    uint32 flags = 0;
    int32 group = 0;  // whose fired list it joins
    HandlerNode occurrenceNode{0, nullptr, nullptr, this};
    HandlerNode firedNode{0, nullptr, nullptr, this};
    TimeList::Entry timeout;  // guarded by gTimedHdlrMutex
};

}  // namespace tessel

#endif
