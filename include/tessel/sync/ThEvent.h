// Events: one thread signals, one that waits goes on.
//
//   state          signal                    reset        wait
//   signaled       stays so                  not          not signaled, and goes on
//   not, nobody    signaled                  stays so     waits
//   not, waiters   one of them goes on       stays so     waits
//
// A null event is what each operation says; one whose verifier is wrong is a fatal report and then as null. Any thread.
// Destroy an event only when no thread is inside a call on it.
#ifndef TESSEL_SYNC_THEVENT_H
#define TESSEL_SYNC_THEVENT_H

#include <tessel/base/MgErr.h>
#include <tessel/base/Types.h>

#ifdef __cplusplus
namespace tessel {
class PlatformEvent;
}
typedef tessel::PlatformEvent* PlatformEventPtr;
#else
typedef struct tessel_PlatformEvent* PlatformEventPtr;
#endif

// Called at the start of a signal, on the signaling thread.
typedef void (*ThEventSignalProc)(void);

// An event. Its fields are the library's to change.
typedef struct THEVENTREC {
    uint32 verifier;  // kThEventVerifier
    PlatformEventPtr platformEvent;
    ThEventSignalProc customSignal;  // called at the start of every ThEventSignal, or null
} THEVENTREC;
typedef THEVENTREC* ThEvent;

#define kThEventVerifier ((uint32)0x746E7645)  // the bytes "Evnt"

TESSEL_BEGIN_C

// A new event in *event, owned by the caller; null there and kMemFullErr when it cannot be made. `ignored` is not used.
// WithCustomSignal: `customSignal` (or null) is called at the start of every signal, on the signaling thread.
TESSEL_API MgErr ThEventCreate(ThEvent* event, uint32 ignored, bool signaled);
// A new event whose every signal begins with a call of `customSignal` (null: none); else as ThEventCreate.
TESSEL_API MgErr ThEventCreateWithCustomSignal(ThEvent* event, uint32 ignored, bool signaled,
                                               ThEventSignalProc customSignal);

// An error report for null or a failing platform. No thread may be waiting, or begin to use the event; one whose signal
// has released the last waiter may still be on its way out.
TESSEL_API void ThEventDestroy(ThEvent event);

// 1 when a thread was waiting, else 0. Several signals before a wait count as one. Null: 0.
TESSEL_API int32 ThEventSignal(ThEvent event);

// 1 when the event was signaled, else 0. Null: 0.
TESSEL_API int32 ThEventReset(ThEvent event);

// Waits until signaled: kNoErr, or kTimeOutErr after so many milliseconds; negative waits for ever. Null: kArgErr.
TESSEL_API MgErr ThEventWaitWithTimeout(ThEvent event, int32 milliseconds);
// Waits until signaled, for ever. Null: kArgErr.
TESSEL_API MgErr ThEventWait(ThEvent event);

// Waits for one of two events (the second may be null, or the first again) or, with pumpMessages, for a message to the
// calling thread. 1 only when the first event was signaled; 0 for the second, a message or a time-out. Null first
// event: 1.
TESSEL_API int32 ThEventMsgWaitMultiple(ThEvent event, ThEvent second, int32 milliseconds, bool pumpMessages);

// Tells a thread, by the host's number of it (platformId in its ThThread), that a message for it has arrived: its wait
// with pumpMessages, the present or the next one, ends. Several before a wait count as one. kArgErr when there is no
// such thread in the process.
TESSEL_API MgErr ThEventMessageArrived(uint32 threadId);

// Calls pump(argument) once. For a null event its result; else kMemFullErr: waiting while pumping is not available.
typedef MgErr (*ThEventPumpProc)(void* argument);
// Calls pump(argument) once, as above; does not wait.
TESSEL_API MgErr ThEventWaitAndPump(ThEvent event, ThEventPumpProc pump, int32 milliseconds, void* argument);

TESSEL_END_C

#endif
