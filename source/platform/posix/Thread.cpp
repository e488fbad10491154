#include "platform/Thread.h"

#include "platform/Clock.h"
#include "platform/Event.h"
#include "platform/Mutex.h"
#include "platform/posix/Errors.h"
#include "platform/posix/SystemCalls.h"
#include "platform/posix/Threads.h"

#include <algorithm>
#include <atomic>
#include <errno.h>
#include <new>
#include <pthread.h>
#include <sys/prctl.h>
#include <sys/syscall.h>
#include <unistd.h>

namespace tessel::platform {

// Shared by the handles to a thread and, while it runs, by the thread: the last of them frees it.
struct ThreadRecord {
    std::atomic<int> references{1};
    std::atomic<ThreadId> id{0};
    std::atomic<bool> ended{false};
    std::atomic<bool> forced{false};     // ended by ThreadEnd
    std::atomic<bool> abandoned{false};  // forced, and its own reference given back
    std::atomic<std::int32_t> exitCode{0};
    bool started = false;  // by this seam
    pthread_t thread{};
    ThreadProcedure procedure = nullptr;
    void* argument = nullptr;
    Event idKnown;
    Event over;  // signaled for good once the thread has ended: who takes the signal gives it back
    Mutex joinMutex;
    bool joined TESSEL_GUARDED_BY(joinMutex) = false;  // nothing of it runs any more
};

// ---- who is who -----------------------------------------------------------------------------------------------------

namespace {

constexpr std::int32_t kStillActive = 259;

// The calling thread's record if this seam started it, and its id once asked for.
constinit thread_local ThreadRecord* currentRecord = nullptr;
constinit thread_local ThreadId currentId = 0;

// Who gives up the last reference is alone with the record.
void Release(ThreadRecord* record) TESSEL_LOCKS_UNPROVEN {
    if (record->references.fetch_sub(1, std::memory_order_acq_rel) != 1) return;
    if (record->started && !record->joined && !record->forced) pthread_detach(record->thread);
    delete record;
}

}  // namespace

bool IsThreadOfProcess(ThreadId thread) noexcept {
    return systemCalls.tgkill(systemCalls.getpid(), static_cast<pid_t>(thread), 0) == 0;
}

// The host lets wake-ups slip by 50 us else, to gather them.
void WakeOnTime() noexcept {
    constexpr unsigned long kLeastSlack = 1;  // nanosecond
    systemCalls.prctl(PR_SET_TIMERSLACK, kLeastSlack);
}

ThreadId CurrentThreadId() noexcept {
    if (currentId == 0) {
        // A forked child's one thread has another id than the thread it was.
        static const int registered = pthread_atfork(nullptr, nullptr, [] { currentId = 0; });
        (void)registered;
        currentId = static_cast<ThreadId>(systemCalls.gettid());
    }
    return currentId;
}

// ---- ending by force ------------------------------------------------------------------------------------------------

namespace {

// The host's own cancellation unwinds the thread's stack, and a frame on the way that lets no exception out would end
// the process. So the thread is sent a signal, on which it leaves without looking back.
//
// Nothing of such a thread was cleaned up: its thread-local values still stand in its memory, and others may hold
// pointers to its stack. So the host is never asked to join or detach it: the memory stays the dead thread's for good,
// and no other thread begins with what it left.
int EndSignal() {
    return SIGRTMAX - 3;
}

void MarkEnded(ThreadRecord& record, std::int32_t code) {
    record.exitCode.store(code, std::memory_order_relaxed);
    record.ended.store(true, std::memory_order_release);
    record.over.Set();
}

void OnEndSignal(int, siginfo_t* info, void*) {
    ThreadRecord* record = static_cast<ThreadRecord*>(info->si_value.sival_ptr);
    if (info->si_code != SI_QUEUE || info->si_pid != systemCalls.getpid() || !record || record != currentRecord) return;
    record->forced.store(true, std::memory_order_relaxed);
    MarkEnded(*record, record->exitCode.load(std::memory_order_relaxed));
    ::syscall(SYS_exit, 0);  // of this thread alone
}

// False when the host uses the signal for something else.
bool InstallEndSignal() {
    static const bool installed = [] {
        struct sigaction before {};
        if (systemCalls.sigaction(EndSignal(), nullptr, &before) != 0) return false;
        if ((before.sa_flags & SA_SIGINFO) != 0 || before.sa_handler != SIG_DFL) return false;
        struct sigaction action {};
        action.sa_sigaction = OnEndSignal;
        action.sa_flags = SA_SIGINFO | SA_ONSTACK;
        sigfillset(&action.sa_mask);
        return systemCalls.sigaction(EndSignal(), &action, nullptr) == 0;
    }();
    return installed;
}

void AdmitEndSignal() {
    sigset_t set;
    sigemptyset(&set);
    sigaddset(&set, EndSignal());
    systemCalls.sigprocmask(SIG_UNBLOCK, &set, nullptr);
}

}  // namespace

bool ThreadEnd(ThreadHandle thread, std::int32_t code) noexcept {
    constexpr std::int32_t kPatience = 1000;  // milliseconds
    if (!thread) return FailWith(kErrorInvalidHandle);
    if (!thread->started || thread == currentRecord) return FailWith(kErrorAccessDenied);
    if (!InstallEndSignal()) return FailWith(kErrorNotSupported);
    {
        MutexHolder holder(thread->joinMutex);  // while it is held, the host does not reuse the thread's name
        if (thread->joined || thread->ended.load(std::memory_order_acquire)) return true;
        thread->exitCode.store(code, std::memory_order_relaxed);
        union sigval value {};
        value.sival_ptr = thread;
        int error = pthread_sigqueue(thread->thread, EndSignal(), value);
        if (error != 0 && error != ESRCH) return FailWith(ErrorOfErrno(error));
    }
    if (!ThreadJoin(thread, kPatience)) return false;
    // What the thread itself can no longer do.
    if (thread->forced && !thread->abandoned.exchange(true)) {
        ForgetMessageEvent(thread->id);
        Release(thread);
    }
    return true;
}

// ---- starting -------------------------------------------------------------------------------------------------------

namespace {

// As the process was started with it.
const int processNice = systemCalls.getpriority(PRIO_PROCESS, 0);

// The host hands a maker's priority on to the threads it makes. Where it may not be raised again it stays.
void TakeProcessPriority() {
    if (systemCalls.getpriority(PRIO_PROCESS, 0) != processNice) systemCalls.setpriority(PRIO_PROCESS, 0, processNice);
}

void* RunThread(void* context) {
    ThreadRecord* record = static_cast<ThreadRecord*>(context);
    currentRecord = record;
    AdmitEndSignal();
    TakeProcessPriority();
    record->id.store(CurrentThreadId(), std::memory_order_release);
    record->idKnown.Set();
    // Also when the host's own way out of a thread unwinds it.
    struct AtEnd {
        ThreadRecord* record;
        std::int32_t code;
        ~AtEnd() {
            currentRecord = nullptr;
            MarkEnded(*record, code);
            Release(record);
        }
    } end{record, 0};
    end.code = record->procedure(record->argument);
    return nullptr;
}

}  // namespace

ThreadHandle ThreadStart(ThreadProcedure procedure, void* argument, ThreadId& id) noexcept {
    ThreadRecord* record = procedure ? new (std::nothrow) ThreadRecord : nullptr;
    if (!record) {
        FailWith(procedure ? kErrorNotEnoughMemory : kErrorInvalidParameter);
        return nullptr;
    }
    record->started = true;
    record->procedure = procedure;
    record->argument = argument;
    record->references = 2;
    int error = pthread_create(&record->thread, nullptr, RunThread, record);
    if (error != 0) {
        delete record;
        FailWith(error == EAGAIN ? kErrorNotEnoughMemory : ErrorOfErrno(error));
        return nullptr;
    }
    record->idKnown.Wait(-1);
    id = record->id.load(std::memory_order_acquire);
    return record;
}

ThreadHandle ThreadOpenCurrent() noexcept {
    if (currentRecord) {
        currentRecord->references.fetch_add(1, std::memory_order_relaxed);
        return currentRecord;
    }
    ThreadRecord* record = new (std::nothrow) ThreadRecord;
    if (record) record->id = CurrentThreadId();
    if (!record) FailWith(kErrorNotEnoughMemory);
    return record;
}

// ---- looking and waiting --------------------------------------------------------------------------------------------

bool ThreadRunning(ThreadHandle thread, bool& running) noexcept {
    if (!thread) return FailWith(kErrorInvalidHandle);
    running = thread->started ? !thread->ended.load(std::memory_order_acquire) : IsThreadOfProcess(thread->id);
    return true;
}

bool ThreadExitCode(ThreadHandle thread, std::int32_t& code) noexcept {
    bool running = false;
    if (!ThreadRunning(thread, running)) return false;
    code = running ? kStillActive : thread->exitCode.load(std::memory_order_relaxed);
    return true;
}

namespace {

// Of a foreign thread the host tells no more than whether it is there.
bool AwaitForeign(const ThreadRecord& record, std::int32_t milliseconds) {
    std::uint32_t start = TickMilliseconds();
    while (IsThreadOfProcess(record.id)) {
        std::uint32_t passed = TickMilliseconds() - start;
        if (milliseconds >= 0 && passed >= static_cast<std::uint32_t>(milliseconds)) return FailWith(kErrorTimedOut);
        SleepMilliseconds(1);
    }
    return true;
}

}  // namespace

bool ThreadJoin(ThreadHandle thread, std::int32_t milliseconds) noexcept {
    if (!thread) return FailWith(kErrorInvalidHandle);
    if (!thread->started) return AwaitForeign(*thread, milliseconds);
    if (!thread->ended.load(std::memory_order_acquire)) {
        EventWait waited = thread->over.Wait(milliseconds);
        if (waited != EventWait::kTaken)
            return FailWith(waited == EventWait::kTimedOut ? kErrorTimedOut : kErrorGeneralFailure);
        thread->over.Set();
    }
    MutexHolder holder(thread->joinMutex);
    if (thread->joined || thread == currentRecord) return true;
    if (thread->forced)
        AwaitForeign(*thread, -1);  // it is on its last steps
    else
        pthread_join(thread->thread, nullptr);
    thread->joined = true;
    return true;
}

bool ThreadClose(ThreadHandle thread) noexcept {
    if (!thread) return FailWith(kErrorInvalidHandle);
    Release(thread);
    return true;
}

// ---- priorities -----------------------------------------------------------------------------------------------------

namespace {

struct PriorityRow {
    std::int32_t priority;
    int nice;
};

// The documented priorities, and the host's: a lower one is more urgent there.
constexpr PriorityRow kPriorities[] = {{-15, 19}, {-2, 10}, {-1, 5}, {0, 0}, {1, -5}, {2, -10}, {15, -20}};

// The host names threads by number in these calls, and gives the number of one that has ended to the next, in whatever
// process.
bool IsThere(ThreadHandle thread) {
    bool running = false;
    return ThreadRunning(thread, running) && running;
}

}  // namespace

bool ThreadSetPriority(ThreadHandle thread, std::int32_t priority) noexcept {
    if (!IsThere(thread)) return FailWith(kErrorInvalidHandle);
    for (const PriorityRow& row : kPriorities) {
        if (row.priority == priority)
            return systemCalls.setpriority(PRIO_PROCESS, thread->id, row.nice) == 0 || FailErrno();
    }
    return FailWith(kErrorInvalidParameter);
}

bool ThreadGetPriority(ThreadHandle thread, std::int32_t& priority) noexcept {
    if (!IsThere(thread)) return FailWith(kErrorInvalidHandle);
    errno = 0;
    int nice = systemCalls.getpriority(PRIO_PROCESS, thread->id);
    if (errno != 0) return FailErrno();
    // The most urgent row that the thread's number reaches.
    for (const PriorityRow& row : kPriorities) {
        if (nice >= row.nice) {
            priority = row.priority;
            return true;
        }
    }
    return FailWith(kErrorGeneralFailure);
}

// ---- the calling thread ---------------------------------------------------------------------------------------------

StackBounds CurrentStackBounds() noexcept {
    constinit thread_local StackBounds bounds{0, 0};
    constinit thread_local bool known = false;
    if (known) return bounds;
    known = true;
    pthread_attr_t attributes;
    if (pthread_getattr_np(pthread_self(), &attributes) != 0) return bounds;
    void* low = nullptr;
    std::size_t size = 0;
    if (pthread_attr_getstack(&attributes, &low, &size) == 0) {
        bounds.low = reinterpret_cast<std::uintptr_t>(low);
        bounds.high = bounds.low + size;
    }
    pthread_attr_destroy(&attributes);
    return bounds;
}

std::uint32_t NumberOfProcessors() noexcept {
    cpu_set_t set;
    if (systemCalls.sched_getaffinity(0, sizeof set, &set) == 0)
        return static_cast<std::uint32_t>(std::max(1, CPU_COUNT(&set)));
    long online = systemCalls.sysconf(_SC_NPROCESSORS_ONLN);
    return online > 0 ? static_cast<std::uint32_t>(online) : 1;
}

void YieldThread() noexcept {
    systemCalls.sched_yield();
}

// ---- thread-local slots ---------------------------------------------------------------------------------------------

LocalKey LocalKeyAllocate() noexcept {
    pthread_key_t key;
    int error = pthread_key_create(&key, nullptr);
    if (error == 0) return static_cast<LocalKey>(key);
    FailWith(ErrorOfErrno(error));
    return kNoLocalKey;
}

bool LocalKeyFree(LocalKey key) noexcept {
    int error = pthread_key_delete(static_cast<pthread_key_t>(key));
    return error == 0 || FailWith(ErrorOfErrno(error));
}

bool LocalSet(LocalKey key, void* value) noexcept {
    int error = pthread_setspecific(static_cast<pthread_key_t>(key), value);
    return error == 0 || FailWith(ErrorOfErrno(error));
}

void* LocalGet(LocalKey key) noexcept {
    return pthread_getspecific(static_cast<pthread_key_t>(key));
}

}  // namespace tessel::platform
