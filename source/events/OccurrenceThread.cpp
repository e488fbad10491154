#include "events/OccurrenceThread.h"

#include "events/Occurrences.h"
#include "events/ThTmoEvent.h"
#include "events/ThreadGroups.h"
#include "platform/Thread.h"
#include "threads/Service.h"
#include <tessel/diagnostics/DebugStream.h>
#include <tessel/sync/ThSleep.h>
#include <tessel/threads/ThThread.h>
#include <tessel/time/Millisecs.h>

#include <atomic>

namespace tessel {

TimeList schedule;
TimeList timedHandlers;

namespace {

ThThread occurrenceThread = nullptr;
ThTmoEvent* timedEvent = nullptr;
int32 threadPriority = kThPriorityTimeCritical;
std::atomic<bool> mustStop{false}, isRunning{false};

// The earlier of two times of which 0 is none.
uint32 Earlier(uint32 a, uint32 b) {
    if (a == 0 || b == 0) return a + b;
    return MillisecCmp(a, b) <= 0 ? a : b;
}

uint32 NeverZero(uint32 time) {
    return time ? time : 1;
}

// ---- the work of the thread, one thing due at a time, so that callbacks run with no lock held -----------------------

// Sets the first occurrence that is due. False when none is.
bool SetNextDue(uint32 now) {
    OccurrenceReports reports;
    OccurrenceLockHolder timer(gTimerOccMutex);
    const Occurrence due = schedule.FirstDue(now);
    if (!due) return false;
    OccurrenceLockHolder holder(gOccMutex);
    if (Occ* occurrence = FindOccurrence(due)) {
        schedule.Remove(occurrence->schedule);
        SetOccurrence(*occurrence, reports);
    } else {
        schedule.DropFirst();
    }
    return true;
}

// Takes the first handler whose deadline has come off the list; null when it is none. False when none is due.
bool TakeTimedOut(uint32 now, occh*& handler) TESSEL_REQUIRES(gOccMutex) {
    OccurrenceLockHolder timed(gTimedHdlrMutex);
    const OccurHdlr due = timedHandlers.FirstDue(now);
    handler = FindHandler(due);
    if (handler) {
        timedHandlers.Remove(handler->timeout);
        handler->flags &= ~kOnTimedList;
    } else if (due) {
        timedHandlers.DropFirst();
    }
    return due != 0;
}

bool FireNextTimedOut(uint32 now) {
    bool isBad;
    {
        OccurrenceReports reports;
        OccurrenceLockHolder holder(gOccMutex);
        occh* handler = nullptr;
        if (!TakeTimedOut(now, handler)) return false;
        isBad = !handler;
        if (handler) Fire(*handler, true, reports);
    }
    if (isBad) TESSEL_REPORT(kDebugInfo, 0x6F15A2C8u) << "Bad occhandler in timeout list";
    return true;
}

size_t CountScheduledDue(uint32 now) {
    OccurrenceLockHolder timer(gTimerOccMutex);
    return schedule.CountDue(now);
}

size_t CountTimeOutsDue(uint32 now) {
    OccurrenceLockHolder timed(gTimedHdlrMutex);
    return timedHandlers.CountDue(now);
}

// As much as is due now: what callbacks schedule for now has its turn in the next round.
void ServeWhatIsDue() {
    const uint32 now = MilliSecs();
    for (size_t left = CountScheduledDue(now); left > 0 && SetNextDue(now); --left) RunThreadSafeHandlers();
    bool fired = false;
    for (size_t left = CountTimeOutsDue(now); left > 0 && FireNextTimedOut(now); --left) fired = true;
    if (fired) RunThreadSafeHandlers();
    OccurrenceLockHolder timer(gTimerOccMutex);
    UpdateWakeUp();
}

int32 RunOccurrenceThread(void*) {
    RaiseThreadPriority(occurrenceThread, threadPriority);
    platform::WakeOnTime();
    while (!mustStop) {
        ThTmoEventWait(*timedEvent);
        if (!mustStop) ServeWhatIsDue();
    }
    isRunning = false;
    return 0;
}

}  // namespace

void UpdateWakeUp() {
    if (!timedEvent) return;
    OccurrenceLockHolder timed(gTimedHdlrMutex);
    ThTmoEventSetDeadline(*timedEvent, Earlier(schedule.FirstTime(), timedHandlers.FirstTime()));
}

void Unschedule(Occ& occurrence) {
    const bool wasFirst = schedule.IsFirst(occurrence.schedule);
    schedule.Remove(occurrence.schedule);
    if (wasFirst) UpdateWakeUp();
}

void ForgetTimes() {
    OccurrenceLockHolder timer(gTimerOccMutex);
    OccurrenceLockHolder timed(gTimedHdlrMutex);
    schedule.Forget();
    timedHandlers.Forget();
}

MgErr OccurrenceThreadStart(bool hardWaitTimeCritical) {
    threadPriority = hardWaitTimeCritical ? kThPriorityVeryHigh : kThPriorityTimeCritical;
    timedEvent = ThTmoEventCreate();
    if (!timedEvent) return kMemFullErr;
    mustStop = false;
    isRunning = true;
    const MgErr err = ThThreadCreate(&occurrenceThread, RunOccurrenceThread, nullptr, "Orvane Occurrence Thread");
    if (err != kNoErr) isRunning = false;
    return err;
}

void OccurrenceThreadStop() {
    constexpr uint32 kBetweenLooks = 10;  // milliseconds
    mustStop = true;
    if (timedEvent) ThTmoEventSetDeadline(*timedEvent, NeverZero(MilliSecs() + 1));
    while (isRunning) ThSleep(kBetweenLooks);
    ThThreadDestroy(occurrenceThread);
    occurrenceThread = nullptr;
    ThTmoEventDestroy(timedEvent);
    timedEvent = nullptr;
}

}  // namespace tessel

using namespace tessel;

MgErr OccurAtTime(Occurrence occurrence, uint32 milliseconds) {
    OccurrenceLockHolder timer(gTimerOccMutex);
    Occ* record = nullptr;  // freed under the timer mutex only
    if (!occurrence || gOccurrences.GetCookieInfo(occurrence, &record) != kNoErr) return kArgErr;
    const uint32 before = schedule.FirstTime(), time = NeverZero(milliseconds), now = MilliSecs();
    if (record->schedule.IsListed())
        schedule.Move(record->schedule, time, now);
    else
        schedule.Insert(record->schedule, time, now, TimeList::Among::kBeforeEquals);
    if (schedule.FirstTime() != before) UpdateWakeUp();
    return kNoErr;
}

MgErr CancelOccurAtTime(Occurrence occurrence) {
    OccurrenceLockHolder timer(gTimerOccMutex);
    Occ* record = nullptr;
    if (!occurrence || gOccurrences.GetCookieInfo(occurrence, &record) != kNoErr) return kArgErr;
    Unschedule(*record);
    return kNoErr;
}
