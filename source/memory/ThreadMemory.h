// What the memory manager keeps for each thread, so that creating and disposing of handles shares nothing between
// threads: a few free master pointers, counters, and a gate.
#ifndef TESSEL_SOURCE_MEMORY_THREADMEMORY_H
#define TESSEL_SOURCE_MEMORY_THREADMEMORY_H

#include "base/Compiler.h"
#include <tessel/base/Types.h>

#include <atomic>

namespace tessel {

// Free master pointers, each linked to the next by its content (next | 1), the last by 1.
struct SlotChain {
    UPtr* head = nullptr;
    UPtr* tail = nullptr;
    uint32 count = 0;
};

// Written by one thread, read by any.
template <class T>
class OwnCounter {
public:
    void Add(T n) { value_.store(static_cast<T>(Get() + n), std::memory_order_relaxed); }
    void AddShared(T n) { value_.fetch_add(n, std::memory_order_relaxed); }  // for a counter of several threads
    T Get() const { return value_.load(std::memory_order_relaxed); }

private:
    std::atomic<T> value_{0};
};

struct MemoryCounters {
    OwnCounter<uint32> handles;   // created
    OwnCounter<uint32> pointers;  // pointer blocks created
    OwnCounter<uint32> resizes;   // calls
    OwnCounter<uint32> moves;     // resizes that moved the data
    OwnCounter<int64> bytes;      // in handle blocks, given out less taken back
};

struct MemoryTotals {
    uint32 handles = 0, pointers = 0, resizes = 0, moves = 0;
    int64 bytes = 0;
};

class alignas(64) ThreadMemory {
public:
    // The calling thread's. Null when it has none, because memory ran out or the thread is ending: then the shared
    // state serves, under its locks.
    static ThreadMemory* Mine() {
        ThreadMemory* mine = current;
        return TESSEL_LIKELY(mine != nullptr) ? mine : Adopt();
    }

    // The same for the short ways, which leave the making to others.
    static ThreadMemory* MineIfAny() { return current; }

    // Counts for the calling thread, whose `mine` may be null.
    template <class T>
    static void Count(ThreadMemory* mine, OwnCounter<T> MemoryCounters::*counter, T n) {
        if (TESSEL_LIKELY(mine != nullptr))
            (mine->counters.*counter).Add(n);
        else
            (shared.*counter).AddShared(n);
    }
    static MemoryTotals Totals();

    // Forgets the free master pointers of every thread, and the bytes of handle blocks: none is the manager's any more.
    // No other thread may be using handles.
    static void ForgetHandles();

    MemoryCounters counters;
    // Two chains of a few slots each: full ones are exchanged with the shared chain in one piece.
    SlotChain slots;
    SlotChain reserve;

private:
    friend class HandleGate;
    friend class GateClosed;

    static ThreadMemory* Adopt();
    static void Retire(ThreadMemory* mine);
    struct AtThreadExit;

    static MemoryCounters shared;  // of threads that have none of their own, or are gone

    // Reached directly: this runs on every handle operation.
    TESSEL_FAST_THREAD_LOCAL static constinit ThreadMemory* current;

    std::atomic<uint32> inside_{0};  // 1 while the thread is in a HandleGate
    ThreadMemory* next_ = nullptr;
};

// Held while a handle's block changes or goes away, so that a walk over all handles meets no half-done one. Costs no
// atomic operation on the thread that holds it: the walk makes all threads agree (GateClosed). Not while calling the
// host, and not twice.
class HandleGate {
public:
    explicit HandleGate(ThreadMemory* mine) : mine_(mine) {
        if (!mine)
            LockShared();
        else if (!TryEnter(mine))
            EnterSlowly();
    }
    ~HandleGate() {
        if (mine_)
            Leave(mine_);
        else
            UnlockShared();
    }
    HandleGate(const HandleGate&) = delete;
    HandleGate& operator=(const HandleGate&) = delete;

    // For the short ways. False when it takes more than a look: then the gate is not entered.
    static bool TryEnter(ThreadMemory* mine) {
        mine->inside_.store(1, std::memory_order_relaxed);
        std::atomic_signal_fence(std::memory_order_seq_cst);
        if (TESSEL_LIKELY(state.load(std::memory_order_acquire) == 0)) return true;
        Leave(mine);
        return false;
    }
    static void Leave(ThreadMemory* mine) { mine->inside_.store(0, std::memory_order_release); }

private:
    friend class GateClosed;
    friend void PrepareHandleGate();
    void EnterSlowly();
    static void LockShared();
    static void UnlockShared();

    static constexpr uint32 kClosed = 1;
    static constexpr uint32 kOwnFences = 2;  // the host cannot fence every thread for the one that walks
    static std::atomic<uint32> state;

    ThreadMemory* mine_;
};

// Before the first use. Without it the gate works too, at the cost of an atomic operation.
void PrepareHandleGate();

// While it lives no thread is in a HandleGate. The calling thread must not be in one.
class GateClosed {
public:
    GateClosed();
    ~GateClosed();
    GateClosed(const GateClosed&) = delete;
    GateClosed& operator=(const GateClosed&) = delete;
};

}  // namespace tessel

#endif
