#include "diagnostics/Guarded.h"
#include "events/MGEventQueueImpl.h"
#include <tessel/diagnostics/DebugStream.h>
#include <tessel/events/MGEventQueue.h>
#include <tessel/time/Millisecs.h>

#include <algorithm>
#include <iterator>
#include <new>
#include <utility>

namespace tessel {

using Policy = MGEventQueue::DuplicatePostedEventPolicy;

MGEventQueue::KeepExistingEventPolicy& MGEventQueue::KeepExistingEventPolicy::Instance() {
    static KeepExistingEventPolicy instance;
    return instance;
}

// ---- from creation to end -------------------------------------------------------------------------------------------

MGEventQueueImpl::MGEventQueueImpl(CStr name, uint32 maxSize)
    : mutexErr_(ThMutexCreate(&mutex_, "MGEventQueueRights")), maxSize_(maxSize), name_(name) {
}

MGEventQueueImpl::~MGEventQueueImpl() {
    ReleaseAll(elements_);
    ThMutexDestroy(mutex_);
}

MgErr MGEventQueueImpl::Init() {
    if (mutexErr_ != kNoErr) return mutexErr_;
    ThMutexHolder holder(mutex_);
    running_ = true;
    accepting_ = true;
    counters_ = {0, 0, 0};
    return kNoErr;
}

MgErr MGEventQueueImpl::Uninit() {
    SetAcceptingEvents(false);
    PurgeEvents([](MGEventTarget*, MGEvent*, void*) { return true; }, nullptr);
    ThMutexHolder holder(mutex_);
    running_ = false;
    spare_.clear();
    return kNoErr;
}

void MGEventQueueImpl::Destroy() {
    if (running_)
        TESSEL_REPORT(kDebugError, 0x3B70E9D6u)
            << "Assertion failed: Attempting to destroy a queue that has not been uninitialized!";
    delete this;
}

bool MGEventQueueImpl::IsAcceptingEvents() {
    ThMutexHolder holder(mutex_);
    return accepting_;
}

bool MGEventQueueImpl::SetAcceptingEvents(bool accepting) {
    ThMutexHolder holder(mutex_);
    return running_ ? std::exchange(accepting_, accepting) : accepting_;
}

uint32 MGEventQueueImpl::GetNumEvents() {
    ThMutexHolder holder(mutex_);
    return static_cast<uint32>(elements_.size());
}

uint32 MGEventQueueImpl::GetMaxSize() {
    return maxSize_;
}

MGEventQueueImpl::Counters MGEventQueueImpl::GetCounters() {
    ThMutexHolder holder(mutex_);
    return counters_;
}

// ---- places in line -------------------------------------------------------------------------------------------------

// A place that is used again costs no memory. False when there is none to be had.
bool MGEventQueueImpl::Append(MGEventTarget* target, MGEvent* event) {
    if (spare_.empty() && Guarded([this] { return spare_.emplace_back(), kNoErr; }) != kNoErr) return false;
    spare_.front() = {target, event, nextSerial_++};
    elements_.splice(elements_.end(), spare_, spare_.begin());
    return true;
}

// The one after it. The event is for the caller to release.
MGEventQueueImpl::Pairs::iterator MGEventQueueImpl::Remove(Pairs::iterator pair) {
    const auto next = std::next(pair);
    spare_.splice(spare_.begin(), elements_, pair);
    return next;
}

void MGEventQueueImpl::ReleaseAll(const Pairs& pairs) {
    for (const Pair& pair : pairs) pair.event->Release();
}

// ---- posting --------------------------------------------------------------------------------------------------------

struct MGEventQueueImpl::Posting {
    MGEventTarget* target;
    MGEvent* event;
    bool alwaysAppend;
    Policy& policy;
    MgErr result = kNoErr;
    MGEvent* released[2] = {nullptr, nullptr};  // once the lock is given back
};

MGEventQueueImpl::Pairs::iterator MGEventQueueImpl::FindDuplicate(MGEventTarget* target, MGEvent* event) {
    return std::find_if(elements_.begin(), elements_.end(), [=](const Pair& queued) {
        return queued.target == target && queued.event->IsEquivalent(event);
    });
}

void MGEventQueueImpl::Settle(Pairs::iterator duplicate, Posting& posting) {
    constexpr MgErr kDuplicate = 1;
    posting.result = kDuplicate;
    posting.released[0] = posting.event;
    switch (posting.policy.Decide(duplicate->target, duplicate->event)) {
        case Policy::kReplaceQueued:
            posting.released[0] = std::exchange(duplicate->event, posting.event);
            break;
        case Policy::kDropBoth:
            posting.released[1] = posting.event;
            posting.released[0] = duplicate->event;
            Remove(duplicate);
            ++counters_.dropped;
            break;
        default:
            break;
    }
}

void MGEventQueueImpl::Post(Posting& posting) {
    if (IsOpen() && !posting.alwaysAppend) {
        const auto duplicate = FindDuplicate(posting.target, posting.event);
        if (duplicate != elements_.end()) return Settle(duplicate, posting);
    }
    if (!IsFull() && !IsOpen()) {
        posting.result = kEventQueueErr;
    } else if (IsFull() || !Append(posting.target, posting.event)) {
        posting.result = kMemFullErr;
        posting.released[0] = posting.event;
    }
}

MgErr MGEventQueueImpl::PostEvent(MGEventTarget* target, MGEvent* event, bool alwaysAppend, Policy* policy) {
    if (!target || !event) return kArgErr;
    Posting posting{target, event, alwaysAppend, policy ? *policy : KeepExistingEventPolicy::Instance()};
    ThMutexAcquire(mutex_);
    Post(posting);
    ThMutexRelease(mutex_);
    for (MGEvent* released : posting.released)
        if (released) released->Release();
    return posting.result;
}

// ---- purging --------------------------------------------------------------------------------------------------------

uint32 MGEventQueueImpl::PurgeEvents(PurgePredicate predicate, void* argument) {
    Pairs purged;
    {
        ThMutexHolder holder(mutex_);
        if (!running_ || !predicate) return 0;
        for (auto pair = elements_.begin(); pair != elements_.end();) {
            const auto next = std::next(pair);
            if (predicate(pair->target, pair->event, argument)) purged.splice(purged.end(), elements_, pair);
            pair = next;
        }
        counters_.purged += static_cast<uint32>(purged.size());
    }
    ReleaseAll(purged);
    return static_cast<uint32>(purged.size());
}

// ---- delivering -----------------------------------------------------------------------------------------------------

// The event to deliver next, none when the event is null, and those that were discarded on the way to it.
struct MGEventQueueImpl::Taken {
    MGEventTarget* target = nullptr;
    MGEvent* event = nullptr;
    Pairs discarded;
};

MGEventQueueImpl::Taken MGEventQueueImpl::Take(EventFilter* filter, uint64 serialEnd) {
    Taken taken;
    ThMutexHolder holder(mutex_);
    if (!IsOpen()) return taken;
    for (auto pair = elements_.begin(); pair != elements_.end() && pair->serial < serialEnd;) {
        const auto next = std::next(pair);
        int32 decision = pair->target->CheckEvent(pair->event);
        if (decision == MGEventTarget::kDeliver && filter) decision = filter->Check(pair->target, pair->event);
        if (decision == MGEventTarget::kDeliver) {
            taken.target = pair->target;
            taken.event = pair->event;
            Remove(pair);
            ++counters_.delivered;
            break;
        }
        if (decision == MGEventTarget::kDiscard) taken.discarded.splice(taken.discarded.end(), elements_, pair);
        pair = next;
    }
    counters_.dropped += static_cast<uint32>(taken.discarded.size());
    return taken;
}

uint32 MGEventQueueImpl::ProcessEvents(int32 maxCount, EventFilter* filter, int32 milliseconds) {
    ThMutexAcquire(mutex_);
    uint32 limit = static_cast<uint32>(elements_.size());
    const uint64 serialEnd = nextSerial_;
    ThMutexRelease(mutex_);
    if (maxCount > 0) limit = std::min(limit, static_cast<uint32>(maxCount));
    const uint32 start = milliseconds > 0 ? MilliSecs() : 0;
    uint32 handled = 0;
    while (handled < limit) {
        const Taken taken = Take(filter, serialEnd);
        ReleaseAll(taken.discarded);
        handled += static_cast<uint32>(taken.discarded.size());
        if (!taken.event) break;
        taken.target->HandleEvent(taken.event);
        taken.event->Release();
        ++handled;
        if (milliseconds > 0 && MillisecCmp(MilliSecs(), start) >= milliseconds) break;
    }
    return handled;
}

bool MGEventQueueImpl::HasDispatchableEvent() {
    ThMutexHolder holder(mutex_);
    return running_ && std::any_of(elements_.begin(), elements_.end(), [](const Pair& pair) {
               return pair.target->CheckEvent(pair.event) == MGEventTarget::kDeliver;
           });
}

// ---- looking --------------------------------------------------------------------------------------------------------

void MGEventQueueImpl::Dump(DebugStream& stream) {
    ThMutexHolder holder(mutex_);
    stream.Append("-->> BEGIN EVENT QUEUE DUMP FOR QUEUE '");
    if (name_)
        stream.Append(name_);
    else
        ToDebugStream(stream, DbgFmtPtr(this));
    stream.Append("' <<--\nElements in queue: ");
    ToDebugStream(stream, static_cast<uint32>(elements_.size()));
    stream.Append("\nMax size:");
    ToDebugStream(stream, maxSize_);
    stream.Append("\n");
    unsigned long index = 0;
    for (const Pair& pair : elements_) {
        stream.Append("[");
        ToDebugStream(stream, DbgFmtType<unsigned long>(index++, "%3lu"));
        stream.Append("] k:");
        ToDebugStream(stream, pair.event->GetKind());
        stream.Append(" t:");
        ToDebugStream(stream, DbgFmtPtr(pair.target));
        stream.Append("\n");
    }
    stream.Append("<<-- END EVENT QUEUE DUMP -->>");
}

void ToDebugStream(DebugStream& stream, MGEventQueue* queue) {
    if (queue) queue->Dump(stream);
}

MGEventQueue* CreateMGEventQueue(CStr name, uint32 maxSize) {
    return new (std::nothrow) MGEventQueueImpl(name, maxSize);
}

}  // namespace tessel
