#include "events/AsyncArea.h"
#include "events/OccurrenceThread.h"
#include "events/Occurrences.h"
#include "events/Service.h"
#include "events/ThreadGroups.h"
#include <tessel/diagnostics/DebugStream.h>
#include <tessel/events/OccurrenceManager.h>
#include <tessel/memory/MemoryManager.h>

namespace tessel {

CookieJar<Occ*> gOccurrences;
CookieJar<occh*> gHandlers;

// ---- reports and callbacks ------------------------------------------------------------------------------------------

namespace {

void TellOf(OccurrenceReports::Kind kind) {
    switch (kind) {
        case OccurrenceReports::kBogusFired:
            TESSEL_REPORT(kDebugError, 0x35D8B16Fu) << "bogus handler list in _FireOccurHdlr()";
            break;
        case OccurrenceReports::kBogusBound:
            TESSEL_REPORT(kDebugError, 0x0A7F23D9u) << "bogus handler list in BindOccurHdlr()";
            break;
        case OccurrenceReports::kBogusTimed:
            TESSEL_REPORT(kDebugError, 0x67E1940Bu) << "bogus handler list in OnOccurrenceWithTimeout()";
            break;
        case OccurrenceReports::kNotOnFiredList:
            TESSEL_REPORT(kDebugInfo, 0x52B60DC3u) << "Handler marked as FIRED not on fired list!!";
            break;
        case OccurrenceReports::kDangerous:
            TESSEL_REPORT(kDebugError, 0x1C94E7A2u)
                << "ARMED AND DANGEROUS! This occurrence is about to fire with a NULL callback proc!";
            break;
        default:
            TESSEL_REPORT(kDebugError, 0x7D02F85Eu) << "Setting NULL callback proc";
    }
}

}  // namespace

void OccurrenceReports::Tell() const {
    for (int kind = 0; kind < kNumKinds; ++kind)
        for (uint32 left = counts_[kind]; left > 0; --left) TellOf(static_cast<Kind>(kind));
}

void HandlerCall::Run() const {
    if (callback) return callback(argument);
    TESSEL_REPORT(kDebugError, 0x48C9F05Au) << "NULL callback for occurrence handler " << handler << "; skipped call";
}

// ---- start and stop -------------------------------------------------------------------------------------------------

namespace {

// What the host left behind is freed as well, so that only the report tells of it.
template <class Record>
void FreeLeftOver(CookieJar<Record*>& refnums) {
    CookieList list;
    if (!refnums.IsAValidJar() || refnums.GetCookieList(&list) != kNoErr) return;
    for (int32 i = 0; i < list.GetCount(); ++i) {
        Record* record = nullptr;
        if (refnums.DisposeCookie(list.GetCookie(i), &record) == kNoErr) FreeOccurrenceRecord(record);
    }
}

void ReportLeftOver() {
    int32 occurrences = 0, handlers = 0;
    gOccurrences.GetNumCookies(&occurrences);
    gHandlers.GetNumCookies(&handlers);
    if (occurrences != 0)
        TESSEL_REPORT(kDebugWarning, 0x2F6B91E4u) << "UninitOccurrences: " << occurrences << " leftover occurrences";
    if (handlers != 0)
        TESSEL_REPORT(kDebugWarning, 0x60A8C35Du)
            << "UninitOccurrences: " << handlers << " leftover occurrence handlers";
}

MgErr StartAll(bool hardWaitTimeCritical) {
    MgErr err = gOccMutex.Create("OccMutex");
    if (err == kNoErr) err = gTimerOccMutex.Create("TimerOccMutex");
    if (err == kNoErr) err = gTimedHdlrMutex.Create("gTimedHdlrMutex");
    if (err == kNoErr) err = gOccurrences.Init();
    if (err == kNoErr) err = gHandlers.Init();
    if (err == kNoErr) err = AsyncAreaStart();
    if (err != kNoErr) return err;
    ResetThreadGroups();
    return OccurrenceThreadStart(hardWaitTimeCritical);
}

}  // namespace

MgErr OccurrenceManagerStart(bool hardWaitTimeCritical) {
    const MgErr err = StartAll(hardWaitTimeCritical);
    if (err != kNoErr) OccurrenceManagerStop();
    return err;
}

MgErr OccurrenceManagerStop() {
    ReportLeftOver();
    OccurrenceThreadStop();
    FreeLeftOver(gHandlers);
    FreeLeftOver(gOccurrences);
    ForgetTimes();
    ResetThreadGroups();
    gTimedHdlrMutex.Destroy();
    gTimerOccMutex.Destroy();
    gOccMutex.Destroy();
    gHandlers.Uninit();
    gOccurrences.Uninit();
    AsyncAreaStop();
    return kNoErr;
}

// ---- setting --------------------------------------------------------------------------------------------------------

void SetOccurrence(Occ& occurrence, OccurrenceReports& reports) {
    occurrence.count = NextCount(occurrence.count);
    for (HandlerNode* node = occurrence.handlers.First(); node; node = node->next) Fire(*node->handler, false, reports);
}

MgErr SetOccurrence(Occurrence occurrence) {
    OccurrenceReports reports;
    OccurrenceLockHolder holder(gOccMutex);
    Occ* record = FindOccurrence(occurrence);
    if (!record) return kArgErr;
    SetOccurrence(*record, reports);
    return kNoErr;
}

namespace {

// The handlers that are armed run as timed out, and none is left bound.
void UnbindAll(Occ& occurrence, OccurrenceReports& reports) TESSEL_REQUIRES(gOccMutex) {
    while (HandlerNode* node = occurrence.handlers.First()) {
        Fire(*node->handler, true, reports);
        Unbind(*node->handler);
    }
}

// Under the timer mutex from the first look to the end, so that no schedule is made meanwhile.
MgErr EndOccurrence(Occurrence occurrence) {
    OccurrenceReports reports;
    OccurrenceLockHolder timer(gTimerOccMutex);
    OccurrenceLockHolder holder(gOccMutex);
    Occ* record = FindOccurrence(occurrence);
    if (!record) return kArgErr;
    Unschedule(*record);
    UnbindAll(*record, reports);
    const MgErr err = gOccurrences.DisposeCookie(occurrence);
    FreeOccurrenceRecord(record);
    return err;
}

}  // namespace
}  // namespace tessel

using namespace tessel;

Occurrence AllocOccur() {
    Occ* record = NewOccurrenceRecord<Occ>();
    if (!record) return 0;
    // Under the mutex until the record is whole: nobody but a guesser knows the refnum.
    OccurrenceLockHolder holder(gOccMutex);
    const Occurrence occurrence = gOccurrences.NewCookie(record);
    if (occurrence)
        record->schedule.SetRefnum(occurrence);
    else
        FreeOccurrenceRecord(record);
    return occurrence;
}

MgErr DeallocOccur(Occurrence occurrence) {
    const MgErr err = EndOccurrence(occurrence);
    if (err == kNoErr) RunThreadSafeHandlers();
    return err;
}

bool ValidOccurrence(Occurrence occurrence) {
    Occ* record = nullptr;
    return occurrence && gOccurrences.GetCookieInfo(occurrence, &record) == kNoErr;
}

MgErr Occur(Occurrence occurrence) {
    const MgErr err = SetOccurrence(occurrence);
    RunThreadSafeHandlers();
    return err;
}

void OccurIfValid(Occurrence occurrence) {
    if (ValidOccurrence(occurrence)) Occur(occurrence);
}
