#include "memory/ThreadMemory.h"

#include "base/Compiler.h"
#include "memory/MasterPointers.h"
#include "platform/Mutex.h"
#include "platform/Thread.h"
#include "platform/ThreadFence.h"

#include <cstdlib>
#include <new>

namespace tessel {
namespace {

// Guards the list of threads, and is held while the gate is closed. The heap's locks may be taken inside.
platform::Mutex threadsMutex;
ThreadMemory* threads TESSEL_GUARDED_BY(threadsMutex) = nullptr;

thread_local bool isEnding = false;

void Accumulate(MemoryTotals& totals, const MemoryCounters& counters) {
    totals.handles += counters.handles.Get();
    totals.pointers += counters.pointers.Get();
    totals.resizes += counters.resizes.Get();
    totals.moves += counters.moves.Get();
    totals.bytes += counters.bytes.Get();
}

}  // namespace

MemoryCounters ThreadMemory::shared;
TESSEL_FAST_THREAD_LOCAL constinit ThreadMemory* ThreadMemory::current = nullptr;

struct ThreadMemory::AtThreadExit {
    ~AtThreadExit() {
        isEnding = true;
        ThreadMemory* mine = current;
        current = nullptr;
        if (mine) Retire(mine);
    }
    void Arm() {}
};

ThreadMemory* ThreadMemory::Adopt() {
    if (isEnding) return nullptr;
    void* memory = std::aligned_alloc(alignof(ThreadMemory), sizeof(ThreadMemory));
    if (!memory) return nullptr;
    static thread_local AtThreadExit atExit;
    atExit.Arm();
    ThreadMemory* mine = new (memory) ThreadMemory;
    platform::MutexHolder hold(threadsMutex);
    mine->next_ = threads;
    threads = mine;
    return current = mine;
}

void ThreadMemory::Retire(ThreadMemory* mine) {
    masterPointers.Return(mine->slots);
    masterPointers.Return(mine->reserve);
    {
        platform::MutexHolder hold(threadsMutex);
        MemoryTotals own;
        Accumulate(own, mine->counters);
        shared.handles.AddShared(own.handles);
        shared.pointers.AddShared(own.pointers);
        shared.resizes.AddShared(own.resizes);
        shared.moves.AddShared(own.moves);
        shared.bytes.AddShared(own.bytes);
        ThreadMemory** link = &threads;
        while (*link != mine) link = &(*link)->next_;
        *link = mine->next_;
    }
    mine->~ThreadMemory();
    std::free(mine);
}

MemoryTotals ThreadMemory::Totals() {
    MemoryTotals totals;
    platform::MutexHolder hold(threadsMutex);
    Accumulate(totals, shared);
    for (ThreadMemory* thread = threads; thread; thread = thread->next_) Accumulate(totals, thread->counters);
    return totals;
}

void ThreadMemory::ForgetHandles() {
    const int64 bytes = Totals().bytes;
    platform::MutexHolder hold(threadsMutex);
    shared.bytes.AddShared(-bytes);
    for (ThreadMemory* thread = threads; thread; thread = thread->next_) thread->slots = thread->reserve = SlotChain();
}

// ---- the gate -------------------------------------------------------------------------------------------------------

std::atomic<uint32> HandleGate::state{kOwnFences};

void PrepareHandleGate() {
    if (platform::FenceEveryThreadAvailable()) HandleGate::state.fetch_and(~HandleGate::kOwnFences);
}

// The exchange is the fence that the short way leaves to the host.
void HandleGate::EnterSlowly() {
    while (mine_->inside_.exchange(1, std::memory_order_seq_cst), state.load(std::memory_order_seq_cst) & kClosed) {
        mine_->inside_.store(0, std::memory_order_release);
        threadsMutex.Lock();  // held by whoever closed the gate
        threadsMutex.Unlock();
    }
}

// Given back by UnlockShared.
void HandleGate::LockShared() TESSEL_LOCKS_UNPROVEN {
    threadsMutex.Lock();
}

void HandleGate::UnlockShared() TESSEL_LOCKS_UNPROVEN {
    threadsMutex.Unlock();
}

// Holds the mutex until its end.
GateClosed::GateClosed() TESSEL_LOCKS_UNPROVEN {
    threadsMutex.Lock();
    const uint32 before = HandleGate::state.fetch_or(HandleGate::kClosed, std::memory_order_seq_cst);
    if (!(before & HandleGate::kOwnFences)) platform::FenceEveryThread();
    for (ThreadMemory* thread = threads; thread; thread = thread->next_)
        while (thread->inside_.load(std::memory_order_seq_cst) != 0) platform::YieldThread();
}

GateClosed::~GateClosed() TESSEL_LOCKS_UNPROVEN {
    HandleGate::state.fetch_and(~HandleGate::kClosed, std::memory_order_seq_cst);
    threadsMutex.Unlock();
}

}  // namespace tessel
