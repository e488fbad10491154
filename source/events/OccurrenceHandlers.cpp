// What becomes of a handler: the lists it is on, bound, armed, fired and run.
#include "events/OccurrenceThread.h"
#include "events/Occurrences.h"
#include "events/ThreadGroups.h"
#include <tessel/events/OccurrenceManager.h>
#include <tessel/time/Millisecs.h>

namespace tessel {

// ---- lists ----------------------------------------------------------------------------------------------------------

void LeaveTimedList(occh& handler) {
    if (!(handler.flags & kOnTimedList)) return;
    handler.flags &= ~kOnTimedList;
    OccurrenceLockHolder timed(gTimedHdlrMutex);
    timedHandlers.Remove(handler.timeout);
}

void Unbind(occh& handler) {
    HandlerList::Remove(handler.occurrenceNode);
    handler.occurrence = 0;
}

void Fire(occh& handler, bool timedOut, OccurrenceReports& reports) {
    if (!handler.occurrence || !handler.armed || handler.fired) return;
    handler.armed = 0;
    handler.fired = 1;
    LeaveTimedList(handler);
    handler.flags = timedOut ? handler.flags | kHasTimedOut : handler.flags & ~kHasTimedOut;
    if (IsDamaged(handler.firedNode, handler)) reports.Add(OccurrenceReports::kBogusFired);
    ThreadGroup& group = threadGroups[handler.group];
    group.fired.PushFront(handler.firedNode);
    if (group.notify) group.notify(group.argument);
}

namespace {

// ---- making and ending ----------------------------------------------------------------------------------------------

struct Binding {
    Occurrence occurrence;
    OccurHdlrProc callback;
    void* argument;
};

void SetCallback(occh& handler, const Binding& binding) {
    handler.callback = binding.callback;
    handler.argument = binding.argument;
}

// The handler is bound to that occurrence already.
void BindAgain(occh& handler, const Binding& binding, OccurrenceReports& reports) {
    if (!binding.callback && handler.callback && (handler.armed || handler.fired))
        reports.Add(OccurrenceReports::kDangerous);
    SetCallback(handler, binding);
}

void Bind(occh& handler, const Binding& binding, OccurrenceReports& reports) TESSEL_REQUIRES(gOccMutex) {
    LeaveTimedList(handler);
    if (handler.occurrence && handler.occurrence != binding.occurrence) Unbind(handler);
    if (handler.occurrence) return BindAgain(handler, binding, reports);
    SetCallback(handler, binding);
    if (!binding.callback) reports.Add(OccurrenceReports::kNullCallback);
    Occ* occurrence = FindOccurrence(binding.occurrence);
    if (!occurrence) return;
    if (IsDamaged(handler.occurrenceNode, handler)) reports.Add(OccurrenceReports::kBogusBound);
    occurrence->handlers.PushFront(handler.occurrenceNode);
    handler.occurrence = binding.occurrence;
    handler.seen = kNewOccurrenceCount;
}

void SetRefnum(occh& handler, OccurHdlr refnum) {
    handler.refnum = refnum;
    handler.occurrenceNode.refnum = refnum;
    handler.firedNode.refnum = refnum;
    handler.timeout.SetRefnum(refnum);
}

OccurHdlr AllocHandler(const Binding& binding, uint32 flags, int32 group) {
    occh* record = NewOccurrenceRecord<occh>();
    if (!record) return 0;
    record->flags = flags;
    record->group = group;
    SetCallback(*record, binding);
    OccurrenceReports reports;
    OccurrenceLockHolder holder(gOccMutex);
    const OccurHdlr handler = gHandlers.NewCookie(record);
    if (handler) {
        SetRefnum(*record, handler);
        if (binding.occurrence) Bind(*record, binding, reports);
    } else {
        FreeOccurrenceRecord(record);
    }
    return handler;
}

// ---- arming ---------------------------------------------------------------------------------------------------------

struct Arming {
    bool reset;
    bool withTimeout;    // OnOccurrenceWithTimeout
    int32 milliseconds;  // negative: no time-out
};

// What is to be done once the lock is given back.
struct Outcome {
    MgErr err = kNoErr;
    HandlerCall call;
    bool wakesEarlier = false;
};

// True when the deadline is the earliest now.
bool JoinTimedList(occh& handler, int32 milliseconds, OccurrenceReports& reports) TESSEL_REQUIRES(gOccMutex) {
    const uint32 now = MilliSecs(), deadline = now + static_cast<uint32>(milliseconds);
    OccurrenceLockHolder timed(gTimedHdlrMutex);
    if (handler.timeout.IsListed() || handler.timeout.GetRefnum() != handler.refnum) {
        reports.Add(OccurrenceReports::kBogusTimed);
        timedHandlers.Remove(handler.timeout);
        handler.timeout.SetRefnum(handler.refnum);
    }
    timedHandlers.Insert(handler.timeout, deadline ? deadline : 1, now, TimeList::Among::kAfterEquals);
    handler.flags |= kOnTimedList;
    return timedHandlers.IsFirst(handler.timeout);
}

Outcome RunNow(occh& handler, MgErr err) {
    handler.armed = 0;
    return {err, HandlerCall::Of(handler), false};
}

Outcome ArmRecord(occh& handler, const Arming& arming, OccurrenceReports& reports) TESSEL_REQUIRES(gOccMutex) {
    if (handler.fired) return {};
    LeaveTimedList(handler);
    const Occ* occurrence = FindOccurrence(handler.occurrence);
    if (!occurrence) {
        handler.flags |= kHasTimedOut;
        return RunNow(handler, kOccurrenceGoneErr);
    }
    if (arming.withTimeout) handler.flags &= ~kHasTimedOut;
    if (handler.group != kThreadSafeGroup) handler.group = OwnThreadGroup();
    if (arming.reset) handler.seen = occurrence->count;
    if (handler.seen != occurrence->count) {
        handler.flags &= ~kHasTimedOut;
        handler.seen = handler.flags & kStrict ? NextCount(handler.seen) : occurrence->count;
        return RunNow(handler, kNoErr);
    }
    handler.armed = 1;
    Outcome outcome;
    if (arming.withTimeout && arming.milliseconds >= 0)
        outcome.wakesEarlier = JoinTimedList(handler, arming.milliseconds, reports);
    return outcome;
}

Outcome ArmRefnum(OccurHdlr handler, const Arming& arming) {
    OccurrenceReports reports;
    OccurrenceLockHolder holder(gOccMutex);
    occh* record = FindHandler(handler);
    return record ? ArmRecord(*record, arming, reports) : Outcome{kArgErr, {}, false};
}

MgErr Arm(OccurHdlr handler, const Arming& arming) {
    const Outcome outcome = ArmRefnum(handler, arming);
    if (outcome.call.handler) outcome.call.Run();
    if (outcome.wakesEarlier) {
        OccurrenceLockHolder timer(gTimerOccMutex);
        UpdateWakeUp();
    }
    return outcome.err;
}

MgErr FireByForce(OccurHdlr handler) {
    OccurrenceReports reports;
    OccurrenceLockHolder holder(gOccMutex);
    occh* record = FindHandler(handler);
    if (!record) return kArgErr;
    Fire(*record, true, reports);
    return kNoErr;
}

}  // namespace
}  // namespace tessel

using namespace tessel;

OccurHdlr AllocOccurHdlr(Occurrence occurrence, OccurHdlrProc callback, void* argument) {
    return AllocHandler({occurrence, callback, argument}, 0, 0);
}

OccurHdlr AllocOccurHdlrStrict(Occurrence occurrence, OccurHdlrProc callback, void* argument) {
    return AllocHandler({occurrence, callback, argument}, kStrict, 0);
}

OccurHdlr AllocThreadSafeOccurHdlr(Occurrence occurrence, OccurHdlrProc callback, void* argument) {
    return AllocHandler({occurrence, callback, argument}, 0, kThreadSafeGroup);
}

MgErr BindOccurHdlr(OccurHdlr handler, Occurrence occurrence, OccurHdlrProc callback, void* argument) {
    OccurrenceReports reports;
    OccurrenceLockHolder holder(gOccMutex);
    occh* record = FindHandler(handler);
    if (!record) return kArgErr;
    Bind(*record, {occurrence, callback, argument}, reports);
    return kNoErr;
}

MgErr DeallocOccurHdlr(OccurHdlr handler) {
    OccurrenceLockHolder holder(gOccMutex);
    occh* record = FindHandler(handler);
    if (!record) return kArgErr;
    LeaveTimedList(*record);
    Unbind(*record);
    HandlerList::Remove(record->firedNode);
    const MgErr err = gHandlers.DisposeCookie(handler);
    FreeOccurrenceRecord(record);
    return err;
}

MgErr OnOccurrence(OccurHdlr handler, bool reset) {
    return Arm(handler, {reset, false, -1});
}

MgErr OnOccurrenceWithTimeout(OccurHdlr handler, bool reset, int32 milliseconds) {
    return Arm(handler, {reset, true, milliseconds});
}

MgErr CancelOnOccur(OccurHdlr handler) {
    OccurrenceReports reports;
    OccurrenceLockHolder holder(gOccMutex);
    occh* record = FindHandler(handler);
    if (!record) return kArgErr;
    const Occ* occurrence = FindOccurrence(record->occurrence);
    if (occurrence) record->seen = occurrence->count;
    record->armed = 0;
    if (record->fired && !record->firedNode.IsListed()) reports.Add(OccurrenceReports::kNotOnFiredList);
    record->fired = 0;
    HandlerList::Remove(record->firedNode);
    LeaveTimedList(*record);
    return occurrence ? kNoErr : kArgErr;
}

MgErr FireOccurHdlr(OccurHdlr handler) {
    const MgErr err = FireByForce(handler);
    if (err == kNoErr) RunThreadSafeHandlers();
    return err;
}

bool HandlerTimedOut(OccurHdlr handler) {
    OccurrenceLockHolder holder(gOccMutex);
    const occh* record = FindHandler(handler);
    return record && (record->flags & kHasTimedOut);
}
