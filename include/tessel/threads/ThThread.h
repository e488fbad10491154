// Threads: started, adopted, ended, their priorities, and the record that stands for each.
//
// A thread record comes from ThThreadCreate (starts a thread), ThPseudoThreadCreate (adopts the calling one) or
// AssimilateStartUpThread, and is the caller's until ThThreadDestroy. At most 2048 exist at a time. A record whose
// verifier is wrong is reported and has the result that each operation says. Any thread, between start and stop of the
// library, unless said otherwise.
#ifndef TESSEL_THREADS_THTHREAD_H
#define TESSEL_THREADS_THTHREAD_H

#include <tessel/base/MgErr.h>
#include <tessel/base/Types.h>
#include <tessel/time/HRTime.h>

#define kThThreadVerifier ((uint32)0x64726854)  // the bytes "Thrd"
#define kMaxThThreads 2048                      // the size of the thread table

// Levels of priority.
enum {
    kThPriorityBackground = 0,
    kThPriorityNormal = 1,
    kThPriorityHigh = 2,
    kThPriorityVeryHigh = 3,
    kThPriorityTimeCritical = 4,
    kNumThPriorities = 5
};

// What a thread runs. Its result is the thread's exit code.
typedef int32 (*ThThreadProc)(void* argument);

// The host's own handle of a thread.
typedef void* ThPlatformThread;

// The record of a thread. Its fields are the library's to change.
typedef struct THTHREADREC {
    uint32 verifier;  // kThThreadVerifier
    ThPlatformThread platformThread;
    int32 index;       // in the thread table
    void* userValueA;  // ThSetThInfo
    void* userValueB;
    int32 adopted;  // 1 for the start-up thread and for adopted threads, 0 for threads that were started here
    uint32 platformId;
    ThThreadProc procedure;
    void* argument;
} THTHREADREC;
typedef THTHREADREC* ThThread;

TESSEL_BEGIN_C

// ---- making and ending ----------------------------------------------------------------------------------------------

// Starts a thread on `procedure` (null: it ends at once). *thread is set before it runs. The name is not used. It has
// the priority that the process was started with; where its maker's is lower and the host does not let it be raised,
// its maker's.
// kMemFullErr, and null in *thread, when there is no memory, the host refuses or the table is full.
TESSEL_API MgErr ThThreadCreate(ThThread* thread, ThThreadProc procedure, void* argument, CStr name);

// Makes a record for the calling thread. Errors as above.
TESSEL_API MgErr ThPseudoThreadCreate(ThThread* thread);

// Makes the calling thread the start-up thread, with entry 0 of the table: before that no thread has an identity. 1,
// or 0 when the host gives no handle. Once, on the main thread, after the start of the library and before other
// threads.
TESSEL_API int32 AssimilateStartUpThread(void);
// Whether the calling thread is the start-up thread.
TESSEL_API bool IsStartUpThread(void);

// Ends a record. A thread started here that still runs is waited for, 10 seconds at most, and then ended by force:
// what it holds stays held, and its stack and its record's memory are lost for good when it refuses to end. A thread
// that destroys its own record goes on without identity, with an error report (it cannot be ended by itself), and ends
// when its procedure returns. A thread may leave through the host (pthread_exit); its exit code is 0 then. Nothing for
// null; an error report, and nothing else, for a bad record.
TESSEL_API void ThThreadDestroy(ThThread thread);

// ---- identity -------------------------------------------------------------------------------------------------------

// The calling thread's record; null when it has none, and before AssimilateStartUpThread.
TESSEL_API ThThread ThThreadGetId(void);

// The place of a thread (null: the calling one) in the table. 2048 for a bad record.
TESSEL_API int32 ThThreadGetIndex(ThThread thread);

// Whether the thread still runs. False for null and for a bad record.
TESSEL_API bool ThThreadActive(ThThread thread);

// Two values of the caller's in the record. Get returns B and stores A; null and null for a null thread.
TESSEL_API void ThSetThInfo(ThThread thread, void* valueA, void* valueB);
// Stores value A in *valueA and returns value B; null and null for a null thread.
TESSEL_API void* ThGetThInfo(ThThread thread, void** valueA);

// Where the host's handle and number of the thread stand; null and null for a null thread or one without a handle.
TESSEL_API void ThGetPlatformThread(ThThread thread, ThPlatformThread** handle, uint32** id);

// ---- priority -------------------------------------------------------------------------------------------------------

// The levels stand for priorities of the host, whatever that of the process: where one was started at a low priority
// and may not raise it, normal is refused and reported, and a new thread's level may be lower than normal.
//
// Sets a level; a negative one is reported and counts as normal, one of 5 or more is reported and changes nothing.
// Always kNoErr; a host that refuses is reported.
TESSEL_API MgErr ThThreadSetPriority(ThThread thread, int32 level);

// The lowest level that is at least as urgent as the thread is. kThPriorityNormal for a bad record, and when the host
// does not tell.
TESSEL_API int32 ThThreadGetPriority(ThThread thread);

// The host's priorities of the five levels: -15, 0, 1, 2 and 15, or what the settings "thpri_bgrnd", "thpri_normal",
// "thpri_high", "thpri_vhigh" and "thpri_tcrit" (I32) say when the threads start. Each output may be null.
TESSEL_API void ThThreadGetNativePriorityInfo(int32* background, int32* normal, int32* high, int32* veryHigh,
                                              int32* timeCritical);

// Whether each level differs from the one below (the first: from the one above); normal always does.
// Nothing for null.
TESSEL_API void ThThreadGetPrioInfo(uint8 distinct[kNumThPriorities]);

// Called, outside all locks, on the thread that set a priority, after it did.
typedef void (*ThThreadPrioritySetProc)(ThThread thread, ThPlatformThread handle, uint32 id, int32 level);

// Installs the one procedure: kArgErr for null and while another is installed.
TESSEL_API MgErr ThSetThreadPrioritySetProc(ThThreadPrioritySetProc procedure);

// Removes it: kArgErr and a warning unless it is the one installed.
TESSEL_API MgErr ThClearThreadPrioritySetProc(ThThreadPrioritySetProc procedure);

// ---- the calling thread and the machine -----------------------------------------------------------------------------

// Processor time that the calling thread has used, in 100 ns. Nothing for null.
TESSEL_API void ThGetThreadTime(_HRTime* time);

// Bytes of stack left: not limited here, always 0x7FFFFFFF.
TESSEL_API int32 ThThreadStackLeft(void);

// Logical processors that this process may use.
TESSEL_API int32 ThNumberOfProcessors(void);

// 1 for the code of a stack overflow, 0xC00000FD, else 0.
TESSEL_API int32 stack_overflow_exception_filter(uint32 exceptionCode);

TESSEL_END_C

#endif
