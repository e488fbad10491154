// What the files of the occurrences share.
#ifndef TESSEL_SOURCE_EVENTS_OCCURRENCES_H
#define TESSEL_SOURCE_EVENTS_OCCURRENCES_H

#include "diagnostics/Guarded.h"
#include "events/OccurrenceLocks.h"
#include "events/OccurrenceRecords.h"
#include <tessel/events/OccurrenceManager.h>
#include <tessel/memory/CookieManager.h>
#include <tessel/memory/MemoryManager.h>

#include <new>

namespace tessel {

// The refnums. Looked up without a lock; a record is used and freed under gOccMutex.
extern CookieJar<Occ*> gOccurrences;
extern CookieJar<occh*> gHandlers;

// The armed handlers with a deadline.
extern TimeList timedHandlers TESSEL_GUARDED_BY(gTimedHdlrMutex);

// ---- reports and callbacks, once the locks are given back -----------------------------------------------------------

// Gathers what is to be reported: stands before the locks in its scope, so that it tells after they are released.
class OccurrenceReports {
public:
    enum Kind { kBogusFired, kBogusBound, kBogusTimed, kNotOnFiredList, kDangerous, kNullCallback, kNumKinds };

    OccurrenceReports() = default;
    ~OccurrenceReports() {
        if (any_) Tell();
    }
    OccurrenceReports(const OccurrenceReports&) = delete;
    OccurrenceReports& operator=(const OccurrenceReports&) = delete;

    void Add(Kind kind) {
        any_ = true;
        ++counts_[kind];
    }

private:
    void Tell() const;

    bool any_ = false;
    uint32 counts_[kNumKinds] = {};
};

// A callback that is due.
struct HandlerCall {
    OccurHdlr handler = 0;  // 0: nothing is due
    OccurHdlrProc callback = nullptr;
    void* argument = nullptr;

    static HandlerCall Of(const occh& handler) { return {handler.refnum, handler.callback, handler.argument}; }

    // Calls it, or reports that there is nothing to call.
    void Run() const;
};

// ---- records --------------------------------------------------------------------------------------------------------

// Null when it is no live refnum.
inline Occ* FindOccurrence(Occurrence occurrence) TESSEL_REQUIRES(gOccMutex) {
    Occ* record = nullptr;
    return occurrence && gOccurrences.GetCookieInfo(occurrence, &record) == kNoErr ? record : nullptr;
}
inline occh* FindHandler(OccurHdlr handler) TESSEL_REQUIRES(gOccMutex) {
    occh* record = nullptr;
    return handler && gHandlers.GetCookieInfo(handler, &record) == kNoErr ? record : nullptr;
}

// A record (Occ or occh) in a pointer block; null when there is no memory.
template <class Record>
Record* NewOccurrenceRecord() {
    void* block = DSNewPClr(sizeof(Record));
    auto make = [block] { return block ? new (block) Record : nullptr; };
    Record* record = GuardedOr(static_cast<Record*>(nullptr), make);
    if (block && !record) DSDisposePtr(block);
    return record;
}

// Its refnum is gone, and it is on no list.
template <class Record>
void FreeOccurrenceRecord(Record* record) {
    record->~Record();
    DSDisposePtr(record);
}

// The count after the next setting, and what a strict handler has seen after the next callback.
inline uint32 NextCount(uint32 count) {
    return count + 1 == kNewOccurrenceCount ? kNewOccurrenceCount + 1 : count + 1;
}

inline bool IsDamaged(const HandlerNode& node, const occh& handler) {
    return node.refnum != handler.refnum || node.IsListed();
}

void LeaveTimedList(occh& handler) TESSEL_REQUIRES(gOccMutex);

// The handler leaves its occurrence.
void Unbind(occh& handler) TESSEL_REQUIRES(gOccMutex);

// ---- setting and firing ---------------------------------------------------------------------------------------------

// Puts an armed handler on the fired list of its group, and tells the group. Nothing for any other handler.
void Fire(occh& handler, bool timedOut, OccurrenceReports& reports) TESSEL_REQUIRES(gOccMutex);

// Counts, and fires the handlers. Thread-safe ones are still to be run.
void SetOccurrence(Occ& occurrence, OccurrenceReports& reports) TESSEL_REQUIRES(gOccMutex);
MgErr SetOccurrence(Occurrence occurrence);

}  // namespace tessel

#endif
