// The heap beneath handles and pointer blocks: a thin layer over the C allocator that knows the blocks it gave out.
//
// Plain blocks are kept in lists in shards by address, each with a lock of its own, so that threads seldom meet. Handle
// blocks carry nothing for that: their owner knows them all by the master pointers, and names them when asked.
// With OV_USE_MALLOC=1 in the environment plain blocks come straight from the C allocator, and no walk meets them.
#ifndef TESSEL_SOURCE_MEMORY_HEAP_H
#define TESSEL_SOURCE_MEMORY_HEAP_H

#include "base/Compiler.h"
#include "memory/ThreadMemory.h"
#include "platform/Allocator.h"
#include <tessel/base/Types.h>

#include <atomic>
#include <cstdlib>

namespace tessel::heap {

enum class Error { kDamagedBlock = 1, kOutOfMemory = 5 };
using ErrorCallback = void (*)(Error error, const void* block);  // block may be null

// Installs a callback and returns the one before. The first one reports damage.
ErrorCallback SetErrorCallback(ErrorCallback callback);
void CallErrorCallback(Error error, const void* block);

// ---- plain blocks: aligned for any plain type; null when there is no memory -----------------------------------------

void* Allocate(size_t size);
// False when the block is damaged or none: the error callback has been called, and nothing is freed.
bool Free(void* block);

// ---- handle blocks: the caller keeps their size ---------------------------------------------------------------------

// Asked before every allocation; the answer false makes it fail. Null, as it starts: all may succeed. For tests.
using AllocationFilter = bool (*)(size_t size);
void SetAllocationFilter(AllocationFilter filter);
extern std::atomic<AllocationFilter> allocationFilter;

void* OutOfMemory();  // calls the error callback; null

inline bool MayAllocate(size_t size) {
    AllocationFilter filter = allocationFilter.load(std::memory_order_relaxed);
    return TESSEL_LIKELY(filter == nullptr) || filter(size);
}

inline void* AllocateHandleBlock(ThreadMemory* mine, size_t size) {
    void* block = MayAllocate(size) ? std::malloc(size) : nullptr;
    if (TESSEL_UNLIKELY(block == nullptr)) return OutOfMemory();
    ThreadMemory::Count(mine, &MemoryCounters::bytes, static_cast<int64>(size));
    return block;
}

// These two in a HandleGate.
inline void FreeHandleBlock(ThreadMemory* mine, void* block, size_t size) {
    std::free(block);
    ThreadMemory::Count(mine, &MemoryCounters::bytes, -static_cast<int64>(size));
}

// Moves the block only when it must: a block that grows by little will often grow again, and is given an eighth more
// than asked for; one that shrinks by less than that keeps its place. Null leaves the block as it is.
void* Reallocate(void* block, size_t oldSize, size_t newSize);
inline void* ResizeHandleBlock(ThreadMemory* mine, void* block, size_t oldSize, size_t newSize) {
    size_t room = platform::AllocatedSize(block);
    bool fits = newSize <= room && newSize >= room - room / 8;
    void* resized = fits ? block : Reallocate(block, oldSize, newSize);
    if (resized)
        ThreadMemory::Count(mine, &MemoryCounters::bytes, static_cast<int64>(newSize) - static_cast<int64>(oldSize));
    return resized;
}

// ---- all blocks -----------------------------------------------------------------------------------------------------

// Sees a block; false ends the walk.
using Visitor = bool (*)(void* context, const void* block, size_t size);

// Names every handle block; false when one is damaged. Called with the gate closed. Null: there are none.
using HandleBlocks = bool (*)(void* context, Visitor visitor);
void SetHandleBlocks(HandleBlocks blocks);

// Meets every block that is given out once. False when a block was found damaged, or the visitor ended it.
// The visitor must not use the heap.
bool Walk(void* context, Visitor visitor);

// True when every block is sound; else the error callback is called for the first one that is not.
bool Check();

// Bytes in the blocks given out.
uint64 TotalAllocated();

void ReturnFreeMemory();

}  // namespace tessel::heap

#endif
