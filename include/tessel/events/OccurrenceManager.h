// Occurrences: named events that any thread may set, and handlers that run a callback for them.
//
// An occurrence is set with Occur, by its schedule, or from code that may take no lock. It counts how often. A handler
// is bound to one occurrence and armed with OnOccurrence. An armed handler whose occurrence is set is fired: it joins
// the list of its thread group, whose notify procedure is told, and its callback runs on the thread of the group that
// calls ChkOccurrences. A thread-safe handler runs in the call that fires it. An occurrence remembers: a handler armed
// after the fact runs at once.
//
//     idle    -- OnOccurrence, nothing new -->  armed  -- Occur, time-out, force -->  fired  -- ChkOccurrences --> idle
//     idle    -- OnOccurrence, set since the handler last ran -->  the callback, then idle
//     armed, fired  -- CancelOnOccur -->  idle
//
// Both are refnums, of records that leak reports call Occ and occh. 0 and what is no live refnum give kArgErr, or the
// result named. The OccurrenceManager_Service has to run (OccurrenceManagerService() in frame/CoreServices.h; the host
// starts it itself): before its start and after its stop nothing can be made and no refnum is live.
//
// Any thread may call any operation. Callbacks and reports run with no lock held, on the thread that the operation
// names, and may call everything here. A callback that another thread has taken from its list may still run while its
// handler is cancelled, bound anew or freed: keep alive what its argument points to. Among the handlers of a group that
// wait to run, the one fired last runs first; of one occurrence, the handler bound first.
#ifndef TESSEL_EVENTS_OCCURRENCEMANAGER_H
#define TESSEL_EVENTS_OCCURRENCEMANAGER_H

#include <tessel/base/MgErr.h>
#include <tessel/base/Types.h>

typedef uint32 Occurrence;  // the refnum of an occurrence
typedef uint32 OccurHdlr;   // the refnum of a handler

// Thread groups: as many as threads have places in the thread table. Each thread starts in the group of its index; a
// thread without a record counts as index 0.
#define kNumOccThreadGroups 2048

// What a handler runs.
typedef void (*OccurHdlrProc)(void* argument);

// Told whenever a handler of its group is fired, on the thread that fires it. The lock of the occurrences is held: it
// must not call anything of this header but InterruptSafeOccur, nor wait for a thread that does. Signal an event or
// post a message, and call ChkOccurrences on the thread that gets it.
typedef void (*OccThreadGroupProc)(void* argument);

// The area behind InterruptSafeOccur. Code that cannot call into the library claims a slot itself, from the first one
// on: one exchange of 8 bytes turns a slot that is not claimed into {1, 0, occurrence}. The 16 bytes at the start are
// not used.
#define kNumOccurAsyncSlots 1023
// One slot, 8 bytes, which are exchanged as one.
typedef struct OccurAsyncSlot {
    uint16 claimed;  // bit 0
    uint16 counted;  // the library's own mark
    Occurrence occurrence;
} OccurAsyncSlot;
// The whole area.
typedef struct OccurAsyncArea {
    uint8 header[16];
    OccurAsyncSlot slots[kNumOccurAsyncSlots];
} OccurAsyncArea;

TESSEL_BEGIN_C

// ---- occurrences ----------------------------------------------------------------------------------------------------

// A new occurrence, with nothing bound; the caller's until DeallocOccur. 0 when memory or refnums run out.
TESSEL_API Occurrence AllocOccur(void);

// Frees an occurrence. Its schedule is cancelled; the handlers that are armed for it are fired by force, and all are
// unbound. Thread-safe handlers run in this call.
TESSEL_API MgErr DeallocOccur(Occurrence occurrence);

// Whether it is a live occurrence. Takes no lock.
TESSEL_API bool ValidOccurrence(Occurrence occurrence);

// Sets it: counts, fires every armed handler, sets what InterruptSafeOccur has left, and runs the thread-safe handlers.
TESSEL_API MgErr Occur(Occurrence occurrence);

// The same for a live occurrence; nothing for any other value.
TESSEL_API void OccurIfValid(Occurrence occurrence);

// Notes an occurrence to be set by the next Occur, or the next check of any group. Takes no lock and allocates nothing:
// for signal handlers and the like. An occurrence that is noted already is not noted twice. kOccurrenceFullErr, and
// nothing noted, when all 1,023 slots are taken; kNoErr, and nothing noted, when the service does not run. No signal
// handler may be inside while the service stops.
TESSEL_API MgErr InterruptSafeOccur(Occurrence occurrence);

// Where it is noted; null when the service does not run.
TESSEL_API OccurAsyncArea* GetOccurrenceManagerAsyncArea(void);

// Called, without arguments, by an InterruptSafeOccur that has claimed one of the last ten slots: it is time to check.
// It must do no more than a signal handler may. Null: none, as it starts.
typedef void (*ResetCountDownRegCallbackProc)(void);
// Installs that procedure, for the whole process.
TESSEL_API void SetResetCountDownRegCallbackProc(ResetCountDownRegCallbackProc procedure);

// Sets the occurrence when MilliSecs() reaches `milliseconds` (0 counts as 1), from a thread of the library's own; a
// time less than 2^31 ms ago is due at once. Replaces an earlier schedule.
TESSEL_API MgErr OccurAtTime(Occurrence occurrence, uint32 milliseconds);

// Takes the schedule away, if there is one: from then on it sets nothing.
TESSEL_API MgErr CancelOccurAtTime(Occurrence occurrence);

// ---- handlers -------------------------------------------------------------------------------------------------------

// A new handler, bound to the occurrence unless that is 0; the caller's until DeallocOccurHdlr. 0 when memory or
// refnums run out. A plain handler runs once for all that happened since it last ran; a strict one once for each. A
// thread-safe one belongs to no group: it runs on the thread that sets the occurrence, or on the library's own.
TESSEL_API OccurHdlr AllocOccurHdlr(Occurrence occurrence, OccurHdlrProc callback, void* argument);
// The same for a strict handler.
TESSEL_API OccurHdlr AllocOccurHdlrStrict(Occurrence occurrence, OccurHdlrProc callback, void* argument);
// The same for a thread-safe handler.
TESSEL_API OccurHdlr AllocThreadSafeOccurHdlr(Occurrence occurrence, OccurHdlrProc callback, void* argument);

// Binds the handler to another occurrence, of which it has then seen nothing (0, or one that is gone: to none), or
// gives it another callback when it is bound to this one. A pending time-out is dropped; whether it is armed or fired
// stays. A null callback is reported, and its calls are skipped.
TESSEL_API MgErr BindOccurHdlr(OccurHdlr handler, Occurrence occurrence, OccurHdlrProc callback, void* argument);

// Frees a handler, whatever state it is in.
TESSEL_API MgErr DeallocOccurHdlr(OccurHdlr handler);

// Arms the handler for the group of the calling thread. When its occurrence was set since it last ran, and `reset` does
// not ask to forget that, the callback runs now, on this thread, and the handler is idle. A fired handler stays so.
// kOccurrenceGoneErr when it is bound to no occurrence, or that was freed: the callback runs now, as if timed out.
TESSEL_API MgErr OnOccurrence(OccurHdlr handler, bool reset);

// The same, and fires the handler, as timed out, when nothing happened for so many milliseconds. Negative: no time-out.
TESSEL_API MgErr OnOccurrenceWithTimeout(OccurHdlr handler, bool reset, int32 milliseconds);

// Makes the handler idle, and forgets what happened so far. kArgErr also when it is bound to no occurrence.
TESSEL_API MgErr CancelOnOccur(OccurHdlr handler);

// Fires the handler if it is armed, as if timed out.
TESSEL_API MgErr FireOccurHdlr(OccurHdlr handler);

// Whether it was fired last by its time-out, by force, or because its occurrence was gone. False for no handler.
TESSEL_API bool HandlerTimedOut(OccurHdlr handler);

// ---- groups ---------------------------------------------------------------------------------------------------------

// Makes the thread at one index of the thread table a member of the group that the thread at another belongs to, until
// its record is destroyed. Handlers stay in the group that they were armed in. kArgErr for an index out of range.
TESSEL_API MgErr SetOccThreadGroup(int32 threadIndex, int32 groupThreadIndex);

// Sets who is told of fired handlers (null: nobody) in the group that the thread at the index belongs to. kArgErr for
// an index out of range.
TESSEL_API MgErr SetOccThreadGroupProc(int32 groupIndex, OccThreadGroupProc procedure, void* argument);

// Runs the fired handlers of the calling thread's group, or of a given one (nothing when it is out of range), those too
// that are fired meanwhile; sets what InterruptSafeOccur has noted first. Always kNoErr.
TESSEL_API MgErr ChkOccurrences(void);
// Runs the fired handlers of a given group, nothing when it is out of range; else as ChkOccurrences.
TESSEL_API MgErr ChkThGroupOccurrences(int32 group);

// Whether there is anything to run or to set for the group; takes no lock. False when it is out of range.
TESSEL_API bool QuickCheckGroupHandlersFired(int32 group);

// The group of the main thread: kept for the host, 0 as it starts.
TESSEL_API void SetOccurrenceManagerMainThreadGroupIndex(int32 group);
// The group of the main thread, as it was set; 0 at first.
TESSEL_API int32 GetOccurrenceManagerMainThreadGroupIndex(void);

TESSEL_END_C

#endif
