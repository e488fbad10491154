#include "events/ThreadGroups.h"

#include "events/AsyncArea.h"
#include "events/Occurrences.h"
#include "threads/ThreadTable.h"

#include <atomic>

namespace tessel {

// The lists and procedures are guarded by gOccMutex.
ThreadGroup threadGroups[kNumOccThreadGroups + 1];

namespace {

// The group that a thread index was put in, and how many threads had ended at that index by then: when one more has,
// the thread of that index is another, in a group of its own. Written under gOccMutex.
struct Membership {
    uint32 group, endings;
};
std::atomic<Membership> memberships[kNumOccThreadGroups];

std::atomic<int32> mainThreadGroup{0};

bool IsGroup(int32 index) {
    return index >= 0 && index < kNumOccThreadGroups;
}

int32 RootOf(int32 index) {
    const Membership membership = memberships[index].load(std::memory_order_relaxed);
    return membership.endings == ThreadEndings(index) ? static_cast<int32>(membership.group) : index;
}

// Accounts for what a handler that runs has seen. One that timed out has seen nothing.
void AccountForOccurrence(occh& handler) TESSEL_REQUIRES(gOccMutex) {
    if (handler.flags & kHasTimedOut) return;
    const Occ* occurrence = FindOccurrence(handler.occurrence);
    if (!occurrence) return;
    handler.seen = handler.flags & kStrict ? NextCount(handler.seen) : occurrence->count;
}

HandlerCall TakeFired(ThreadGroup& group) {
    OccurrenceLockHolder holder(gOccMutex);
    HandlerNode* node = group.fired.First();
    if (!node) return {};
    HandlerList::Remove(*node);
    occh& handler = *node->handler;
    LeaveTimedList(handler);
    handler.fired = 0;
    handler.armed = 0;
    AccountForOccurrence(handler);
    return HandlerCall::Of(handler);
}

void RunFired(ThreadGroup& group) {
    while (!group.fired.IsEmpty()) {
        const HandlerCall call = TakeFired(group);
        if (!call.handler) return;
        call.Run();
    }
}

}  // namespace

void ResetThreadGroups() {
    for (int32 i = 0; i < kNumOccThreadGroups; ++i)
        memberships[i].store({static_cast<uint32>(i), ThreadEndings(i)}, std::memory_order_relaxed);
    for (ThreadGroup& group : threadGroups) {
        group.fired.Forget();
        group.notify = nullptr;
        group.argument = nullptr;
    }
}

int32 OwnThreadGroup() {
    const ThThread self = ThThreadGetId();
    return RootOf(self && IsGroup(self->index) ? self->index : 0);
}

void RunThreadGroup(int32 group) {
    if (!gOccurrences.IsAValidJar()) return;
    AsyncAreaWalk area;
    while (const Occurrence noted = area.Next()) {
        SetOccurrence(noted);
        RunFired(threadGroups[kThreadSafeGroup]);
    }
    RunFired(threadGroups[group]);
}

}  // namespace tessel

using namespace tessel;

MgErr SetOccThreadGroup(int32 threadIndex, int32 groupThreadIndex) {
    if (!IsGroup(threadIndex) || !IsGroup(groupThreadIndex)) return kArgErr;
    OccurrenceLockHolder holder(gOccMutex);
    memberships[threadIndex].store({static_cast<uint32>(RootOf(groupThreadIndex)), ThreadEndings(threadIndex)},
                                   std::memory_order_relaxed);
    return kNoErr;
}

MgErr SetOccThreadGroupProc(int32 groupIndex, OccThreadGroupProc procedure, void* argument) {
    if (!IsGroup(groupIndex)) return kArgErr;
    OccurrenceLockHolder holder(gOccMutex);
    ThreadGroup& group = threadGroups[RootOf(groupIndex)];
    group.notify = procedure;
    group.argument = argument;
    return kNoErr;
}

MgErr ChkOccurrences() {
    RunThreadGroup(OwnThreadGroup());
    return kNoErr;
}

MgErr ChkThGroupOccurrences(int32 group) {
    if (IsGroup(group)) RunThreadGroup(group);
    return kNoErr;
}

bool QuickCheckGroupHandlersFired(int32 group) {
    return IsGroup(group) && (!threadGroups[group].fired.IsEmpty() || AsyncAreaHasOccurrence());
}

void SetOccurrenceManagerMainThreadGroupIndex(int32 group) {
    mainThreadGroup = group;
}

int32 GetOccurrenceManagerMainThreadGroupIndex() {
    return mainThreadGroup;
}
