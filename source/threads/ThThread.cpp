#include "platform/Clock.h"
#include "platform/LastError.h"
#include "threads/ThreadTable.h"
#include <tessel/diagnostics/AllocTracker.h>
#include <tessel/diagnostics/DebugStream.h>
#include <tessel/diagnostics/DumpLeakInfo.h>
#include <tessel/memory/MemoryManager.h>
#include <tessel/numerics/FloatingPointRegisters.h>
#include <tessel/sync/ThLocalStorage.h>
#include <tessel/threads/ThThread.h>

#include <atomic>

namespace tessel {

LibraryMutex gCreateThread;

namespace {

// Written under gCreateThread. Entry 0 is looked at without it.
std::atomic<ThThread> table[kMaxThThreads];
std::atomic<uint32> endings[kMaxThThreads];

AllocTrackerPtr threadTracker = nullptr;                 // of the threads started here
std::atomic<uint32> ownRecordKey{kThNoLocalStorageKey};  // the slot of the calling thread's record
THTHREADREC startUpRecord;                               // not from the allocator
std::atomic<uint32> startUpThreadId{0};

ThThread OwnRecord() {
    return static_cast<ThThread>(ThLocalStorageGetValue(ownRecordKey));
}

void SetOwnRecord(ThThread thread) {
    ThLocalStorageSetValue(ownRecordKey, thread);
}

// ---- the table ------------------------------------------------------------------------------------------------------

// Puts a record into the first empty entry. False when there is none.
bool EnterIntoTable(ThThread thread) TESSEL_REQUIRES(gCreateThread) {
    for (int32 i = 0; i < kMaxThThreads; ++i) {
        if (table[i].load(std::memory_order_relaxed)) continue;
        thread->index = i;
        table[i].store(thread, std::memory_order_release);
        return true;
    }
    return false;
}

// False when it does not stand where it says.
bool RemoveFromTable(ThThread thread) {
    LibraryMutexHolder holder(gCreateThread);
    if (thread->index < 0 || thread->index >= kMaxThThreads || table[thread->index] != thread) return false;
    endings[thread->index].fetch_add(1, std::memory_order_relaxed);
    table[thread->index] = nullptr;
    return true;
}

void ClearTable() {
    for (std::atomic<ThThread>& entry : table) entry = nullptr;
}

void CloseStartUpRecord() {
    if (startUpRecord.platformThread) platform::ThreadClose(HandleOf(&startUpRecord));
    startUpRecord = {};
}

ThThread NewRecord() {
    return reinterpret_cast<ThThread>(DSNewPClr(sizeof(THTHREADREC)));
}

// ---- starting -------------------------------------------------------------------------------------------------------

// The handle is the last that the creator fills in. It has it as soon as this thread runs, so there is little to wait
// for, and no lock that might be gone when the library stops meanwhile.
void AwaitCompleteRecord(ThThread thread) {
    while (!__atomic_load_n(&thread->platformThread, __ATOMIC_ACQUIRE)) platform::YieldThread();
}

int32 RunThread(void* argument) {
    ThThread thread = static_cast<ThThread>(argument);
    AwaitCompleteRecord(thread);
    struct Identity {
        explicit Identity(ThThread own) { SetOwnRecord(own); }
        ~Identity() { SetOwnRecord(nullptr); }
    } identity(thread);
    FPInit();
    return thread->procedure ? thread->procedure(thread->argument) : 0;
}

enum class Outcome { kMade, kTableFull, kRefused };

// The place in the table is taken first, so that no thread starts that has none.
Outcome StartThread(ThThread thread) {
    LibraryMutexHolder holder(gCreateThread);
    if (!EnterIntoTable(thread)) return Outcome::kTableFull;
    thread->verifier = kThThreadVerifier;
    ThPlatformThread handle = platform::ThreadStart(RunThread, thread, thread->platformId);
    __atomic_store_n(&thread->platformThread, handle, __ATOMIC_RELEASE);
    if (handle) return Outcome::kMade;
    table[thread->index] = nullptr;
    return Outcome::kRefused;
}

Outcome AdoptCallingThread(ThThread thread) {
    thread->platformThread = platform::ThreadOpenCurrent();
    if (!thread->platformThread) return Outcome::kRefused;
    thread->adopted = 1;
    thread->platformId = platform::CurrentThreadId();
    thread->verifier = kThThreadVerifier;
    LibraryMutexHolder holder(gCreateThread);
    return EnterIntoTable(thread) ? Outcome::kMade : Outcome::kTableFull;
}

void Untrack(ThThread thread) {
    if (threadTracker) threadTracker->RemoveRecord(thread);
}

// Takes the record back when nothing came of it.
MgErr Conclude(Outcome outcome, ThThread* thread) {
    if (outcome == Outcome::kMade) return kNoErr;
    if (outcome == Outcome::kTableFull) TESSEL_REPORT(kDebugInfo, 0x14E9C26Du) << "Thread Array full!!";
    Untrack(*thread);
    if ((*thread)->platformThread) platform::ThreadClose(HandleOf(*thread));
    DSDisposePtr(*thread);
    *thread = nullptr;
    return kMemFullErr;
}

// ---- ending ---------------------------------------------------------------------------------------------------------

constexpr int32 kPatience = 10000;  // milliseconds that a thread has to end by itself

bool EndByForce(ThThread thread) {
    TESSEL_REPORT(kDebugInfo, 0x5F8310BAu) << "Terminating thread " << thread->platformId;
    if (platform::ThreadEnd(HandleOf(thread), 0)) return true;
    TESSEL_REPORT(kDebugError, 0x22B7F6E3u)
        << "TerminateThread returns FALSE: why???, LastError = " << platform::LastError()
        << "threadid = " << thread->platformId;
    return false;
}

// Waits for a thread started here, and ends it if it does not. The calling thread would wait for itself in vain. True
// when no other thread uses the record any more.
bool EndStarted(ThThread thread) {
    platform::ThreadHandle handle = HandleOf(thread);
    bool running = false;
    if (!platform::ThreadRunning(handle, running)) {
        TESSEL_REPORT(kDebugInfo, 0x4D91A7C8u)
            << "GetExitCodeThread returns FALSE, LastError = " << DbgFmtHex(platform::LastError());
        TESSEL_REPORT(kDebugError, 0x0B6E5D32u) << "Terminate thread failed";
        return true;
    }
    const bool isCaller = thread->platformId == platform::CurrentThreadId();
    if (!running || (!isCaller && platform::ThreadJoin(handle, kPatience))) return true;
    return EndByForce(thread) || isCaller;
}

void CloseHandle(ThThread thread) {
    if (!platform::ThreadClose(HandleOf(thread)))
        TESSEL_REPORT(kDebugError, 0x71C4F28Au)
            << "CloseHandle in SysThreadDestroy returns FALSE, LastError = " << DbgFmtHex(platform::LastError());
}

}  // namespace

uint32 ThreadEndings(int32 index) {
    return endings[index].load(std::memory_order_relaxed);
}

// ---- the service ----------------------------------------------------------------------------------------------------

MgErr ThThreadStart(ThreadPriorityReader configured) {
    threadTracker = CreateAllocTracker();
    ClearTable();
    ownRecordKey = ThLocalStorageAllocateKey();
    BuildPriorityTable(configured);
    MgErr err = gCreateThread.Create("gCreateThread");
    if (err == kNoErr && ownRecordKey == kThNoLocalStorageKey) err = kMemFullErr;
    if (err != kNoErr) ThThreadStop();
    return err;
}

MgErr ThThreadStop() {
    gCreateThread.Destroy();
    if (ownRecordKey != kThNoLocalStorageKey) ThLocalStorageFreeKey(ownRecordKey);
    ownRecordKey = kThNoLocalStorageKey;
    ClearTable();
    CloseStartUpRecord();
    DumpLeakInfo(threadTracker, 0, "Thread Leaks", "ovThreadLeaks.txt");
    DestroyAllocTracker(threadTracker);
    threadTracker = nullptr;
    return kNoErr;
}

}  // namespace tessel

using namespace tessel;

// ---- making and ending ----------------------------------------------------------------------------------------------

MgErr ThThreadCreate(ThThread* thread, ThThreadProc procedure, void* argument, CStr) {
    if (!thread) return kArgErr;
    *thread = NewRecord();
    if (!*thread) return kMemFullErr;
    ThThread record = *thread;
    record->procedure = procedure;
    record->argument = argument;
    if (threadTracker)
        threadTracker->AddRecordFrom(__builtin_frame_address(0), record, sizeof *record, __FILE__, __LINE__);
    return Conclude(StartThread(record), thread);
}

MgErr ThPseudoThreadCreate(ThThread* thread) {
    if (!thread) return kArgErr;
    *thread = NewRecord();
    if (!*thread) return kMemFullErr;
    const MgErr err = Conclude(AdoptCallingThread(*thread), thread);
    if (err == kNoErr) SetOwnRecord(*thread);
    return err;
}

int32 AssimilateStartUpThread() {
    CloseStartUpRecord();
    startUpRecord.verifier = kThThreadVerifier;
    startUpRecord.adopted = 1;
    startUpRecord.platformId = platform::CurrentThreadId();
    startUpRecord.platformThread = platform::ThreadOpenCurrent();
    startUpThreadId = startUpRecord.platformId;
    SetOwnRecord(&startUpRecord);
    table[0] = &startUpRecord;
    return startUpRecord.platformThread ? 1 : 0;
}

bool IsStartUpThread() {
    return startUpThreadId.load(std::memory_order_relaxed) == platform::CurrentThreadId();
}

void ThThreadDestroy(ThThread thread) {
    if (!thread) return;
    if (!IsThread(thread)) {
        TESSEL_REPORT(kDebugError, 0x60DF3E15u) << "threadp does not have correct verifier in ThThreadDestroy";
        return;
    }
    if (OwnRecord() == thread)
        SetOwnRecord(nullptr);
    else if (thread->adopted)
        TESSEL_REPORT(kDebugInfo, 0x37A4C90Fu) << "WARNING: Destroying PseudoThread from another thread";
    Untrack(thread);
    if (!RemoveFromTable(thread)) TESSEL_REPORT(kDebugError, 0x7E52B841u) << "disposing thread out of range";
    const bool ended = thread->adopted || EndStarted(thread);
    CloseHandle(thread);
    if (!ended) return;  // the thread goes on with its record
    *thread = {};
    if (thread != &startUpRecord) DSDisposePtr(thread);
}

// ---- identity -------------------------------------------------------------------------------------------------------

ThThread ThThreadGetId() {
    return table[0].load(std::memory_order_acquire) ? OwnRecord() : nullptr;
}

int32 ThThreadGetIndex(ThThread thread) {
    if (!thread) thread = ThThreadGetId();
    if (IsThread(thread)) return thread->index;
    TESSEL_REPORT(kDebugError, 0x09B8E7D6u) << "bad ThThread in ThThreadGetIndex()";
    return kMaxThThreads;
}

bool ThThreadActive(ThThread thread) {
    if (!thread) return false;
    if (!IsThread(thread)) {
        TESSEL_REPORT(kDebugError, 0x56F1C3A4u);
        return false;
    }
    bool running = false;
    return platform::ThreadRunning(HandleOf(thread), running) && running;
}

void ThSetThInfo(ThThread thread, void* valueA, void* valueB) {
    if (!thread) return;
    thread->userValueA = valueA;
    thread->userValueB = valueB;
}

void* ThGetThInfo(ThThread thread, void** valueA) {
    if (valueA) *valueA = thread ? thread->userValueA : nullptr;
    return thread ? thread->userValueB : nullptr;
}

void ThGetPlatformThread(ThThread thread, ThPlatformThread** handle, uint32** id) {
    const bool known = thread && thread->platformThread;
    if (handle) *handle = known ? &thread->platformThread : nullptr;
    if (id) *id = known ? &thread->platformId : nullptr;
}

// ---- the calling thread and the machine -----------------------------------------------------------------------------

void ThGetThreadTime(_HRTime* time) {
    if (!time) return;
    const platform::ProcessorTime used = platform::ThreadTimes();
    const uint64 total = used.kernel + used.user;
    time->high = static_cast<uint32>(total >> 32);
    time->low = static_cast<uint32>(total);
}

int32 ThThreadStackLeft() {
    return 0x7FFFFFFF;
}

int32 ThNumberOfProcessors() {
    return static_cast<int32>(platform::NumberOfProcessors());
}

int32 stack_overflow_exception_filter(uint32 exceptionCode) {
    constexpr uint32 kStackOverflow = 0xC00000FDu;
    return exceptionCode == kStackOverflow ? 1 : 0;
}
