#include <tessel/memory/MemoryManager.h>

#include <algorithm>
#include <cstring>

#include <tessel/diagnostics/DebugStream.h>

#include "memory/HandleBlock.h"
#include "memory/Handles.h"
#include "memory/Heap.h"
#include "memory/Trackers.h"

#define TESSEL_ALWAYS_INLINE inline __attribute__((always_inline))
#define TESSEL_NOT_INLINE __attribute__((noinline))
#define TESSEL_UNLIKELY(condition) __builtin_expect(!!(condition), false)

namespace tessel {
namespace {

enum TraceKind { kCreated = 0, kResized = 1, kDisposed = 2 };

void Trace(TraceKind kind, MgErr err, UHandle h, uint32 newSize, uint32 oldSize) {
    if (MemEventTraceProc proc = memorySettings.trace.load()) proc(kind, err, h, newSize, oldSize);
}

// ---- creation -------------------------------------------------------------------------------------------------------

TESSEL_NOT_INLINE void BeforeCreation(ThreadMemory* mine) {
    NeedMemorySettings();
    if (MemoryDebugging()) masterPointers.CheckChains(mine);
}

TESSEL_NOT_INLINE void AfterCreation(UHandle h, uint32 size) {
    Trace(kCreated, kNoErr, h, size, 0);
    TrackHandle(h, size);
    if (Detours() & kScopeTracked) ScopeAdd(h, size);
}

TESSEL_NOT_INLINE UHandle CreationFailed(uint32 size) {
    CallSetMemFullProc(size);
    Trace(kCreated, kMemFullErr, nullptr, size, 0);
    return nullptr;
}

// A heap block with the data of a handle in it; null when there is no memory.
TESSEL_ALWAYS_INLINE UPtr NewData(ThreadMemory* mine, uint32 size, Alignment alignment) {
    uint32 bytes = BlockSize(size, alignment);
    if (TESSEL_UNLIKELY(bytes == 0)) return nullptr;
    void* block = heap::AllocateHandleBlock(mine, bytes);
    if (TESSEL_UNLIKELY(!block)) return nullptr;
    UPtr data = PlaceData(block, alignment);
    WriteHeader(block, data, size, alignment);
    return data;
}

TESSEL_ALWAYS_INLINE UHandle NewHandle(uint32 size, Alignment alignment, bool clear) {
    ThreadMemory* mine = ThreadMemory::Mine();
    if (TESSEL_UNLIKELY(Detours())) BeforeCreation(mine);
    UHandle h = masterPointers.Take(mine);
    if (TESSEL_UNLIKELY(!h)) return CreationFailed(size);
    UPtr data = NewData(mine, size, alignment);
    if (TESSEL_UNLIKELY(!data)) {
        masterPointers.Put(mine, h);
        return CreationFailed(size);
    }
    if (clear) std::memset(data, 0, size);
    SetSlotContent(h, reinterpret_cast<uintptr_t>(data));
    ThreadMemory::Count(mine, &MemoryCounters::handles, 1u);
    if (TESSEL_UNLIKELY(Detours())) AfterCreation(h, size);
    return h;
}

TESSEL_NOT_INLINE void AfterPtrCreation(UPtr p, uint32 size) {
    if (MemoryDebugging()) {
        if (reinterpret_cast<uintptr_t>(p) % 4 != 0)
            TESSEL_REPORT(kDebugFatal, 0x7B19C4D2u) << "Ptr block not ptr-aligned";
        DSHeapCheck(0);
    }
    TrackPointer(p, size);
    if (Detours() & kScopeTracked) ScopeAdd(p, size);
}

TESSEL_ALWAYS_INLINE UPtr NewPointer(uint32 size, bool clear) {
    NeedMemorySettings();
    UPtr p = NewPtrBlock(size);
    if (!p) {
        CallSetMemFullProc(size);
        return nullptr;
    }
    if (clear) std::memset(p, 0, size);
    ThreadMemory::Count(ThreadMemory::Mine(), &MemoryCounters::pointers, 1u);
    if (Detours()) AfterPtrCreation(p, size);
    return p;
}

// ---- disposal -------------------------------------------------------------------------------------------------------

TESSEL_NOT_INLINE void AfterDisposal(UHandle h, uint32 size) {
    Trace(kDisposed, kNoErr, h, size, 0);
}

TESSEL_ALWAYS_INLINE void Free(ThreadMemory* mine, UHandle h, UPtr data) {
    HandleGate gate(mine);
    uint32 bytes = BlockSize(SizeOfData(data), AlignmentOf(data));
    void* block = BlockOf(data);
    masterPointers.Put(mine, h);
    heap::FreeHandleBlock(mine, block, bytes);
}

// ---- resizing -------------------------------------------------------------------------------------------------------

struct Resizing {
    ThreadMemory* mine;
    UHandle h;
    uint32 newSize, oldSize;
    Alignment newAlignment, oldAlignment;
    uint32 newBytes, oldBytes;
};

// Brings the data of a block that realloc has moved to where its alignment wants it, if it is not there by chance.
UPtr Realign(void* block, UPtr data, const Resizing& r) {
    uintptr_t misplaced = (reinterpret_cast<uintptr_t>(data) + r.newAlignment.offset) % r.newAlignment.alignment;
    if (misplaced == 0) return data;
    UPtr placed = PlaceData(block, r.newAlignment);
    std::memmove(placed, data, std::min(r.oldSize, r.newSize));
    return placed;
}

// Keeps the block, or lets the allocator move it. Null when it cannot.
UPtr ResizeInPlace(const Resizing& r) {
    UPtr data = *r.h;
    void* block = BlockOf(data);
    if (r.newBytes != r.oldBytes) {
        size_t distance = HeaderOf(data)->distance + sizeof(HandleHeader) + GuardRoom(GuardKind::kHandle);
        block = heap::ResizeHandleBlock(r.mine, block, r.oldBytes, r.newBytes);
        if (!block) return nullptr;
        data = Realign(block, static_cast<UPtr>(block) + distance, r);
    }
    WriteHeader(block, data, r.newSize, r.newAlignment);
    return data;
}

UPtr ResizeByCopy(const Resizing& r) {
    UPtr old = *r.h;
    UPtr data = NewData(r.mine, r.newSize, r.newAlignment);
    if (!data) return nullptr;
    std::memcpy(data, old, std::min(r.oldSize, r.newSize));
    heap::FreeHandleBlock(r.mine, BlockOf(old), r.oldBytes);
    return data;
}

// The data's place afterwards, or null when there is no memory.
UPtr ResizeData(const Resizing& r) {
    bool stress = memorySettings.stress.load(std::memory_order_relaxed);
    HandleGate gate(r.mine);
    UPtr data = nullptr;
    if (!stress && r.newAlignment == r.oldAlignment) data = ResizeInPlace(r);
    if (!data) data = ResizeByCopy(r);
    if (!data) return nullptr;
    if (data != *r.h) {
        SetSlotContent(r.h, reinterpret_cast<uintptr_t>(data));
        if (!stress) ThreadMemory::Count(r.mine, &MemoryCounters::moves, 1u);
    }
    return data;
}

MgErr ResizeChecked(ThreadMemory* mine, UHandle h, uint32 size, Alignment alignment, bool clear, uint32 oldSize) {
    Resizing r{mine, h, size, oldSize, alignment, AlignmentOf(*h), BlockSize(size, alignment), 0};
    if (r.newSize == r.oldSize && r.newAlignment == r.oldAlignment) return kNoErr;
    r.oldBytes = BlockSize(r.oldSize, r.oldAlignment);
    UPtr data = r.newBytes != 0 ? ResizeData(r) : nullptr;
    if (!data) {
        CallSetMemFullProc(r.newBytes != 0 ? r.newBytes : size);
        return kMemFullErr;
    }
    if (clear && size > oldSize) std::memset(data + oldSize, 0, size - oldSize);
    return kNoErr;
}

MgErr Resize(UHandle h, uint32 size, Alignment alignment, bool clear, const char* operation) {
    ThreadMemory* mine = ThreadMemory::Mine();
    ThreadMemory::Count(mine, &MemoryCounters::resizes, 1u);
    if (TESSEL_UNLIKELY(!IsGoodHandle(h, kChangeProves))) {
        TESSEL_REPORT(kDebugFatal, 0x53C8E70Bu);
        return ReportMemoryError(kHandleErr, operation);
    }
    uint32 oldSize = SizeOfData(*h);
    MgErr err = ResizeChecked(mine, h, size, alignment, clear, oldSize);
    if (TESSEL_UNLIKELY(Detours() & kHandlesTraced)) Trace(kResized, err, h, size, oldSize);
    return ReportMemoryError(err, operation);
}

MgErr ResizeOrNew(UHandle* h, uint32 size, bool clear, const char* operation) {
    if (!h) return kArgErr;
    if (*h) return Resize(*h, size, AlignmentForSize(size), clear, operation);
    *h = clear ? DSNewHClr(size) : DSNewHandle(size);
    return *h ? kNoErr : kMemFullErr;
}

// An empty datum is a null handle.
MgErr ResizeOrNull(UHandle* h, uint32 size, bool clear, const char* operation) {
    return size == 0 ? DSDisposeHandleAndNull(h) : ResizeOrNew(h, size, clear, operation);
}

}  // namespace

MgErr ReportMemoryError(MgErr err, const char* operation) {
    if (TESSEL_UNLIKELY(err != kNoErr))
        TESSEL_REPORT(kDebugWarning, 0x1C7F40D9u) << "Memory error " << err << " in " << operation;
    return err;
}

void FreeHandle(UHandle h) {
    Free(ThreadMemory::Mine(), h, *h);
}

}  // namespace tessel

using namespace tessel;

UHandle DSNewHandle(uint32 size) {
    return NewHandle(size, AlignmentForSize(size), false);
}

UHandle DSNewHClr(uint32 size) {
    return NewHandle(size, AlignmentForSize(size), true);
}

UHandle DSNewAlignedHandle(uint32 size, uint32 alignment, uint32 offset) {
    return NewHandle(size, AlignmentFor(alignment, offset), false);
}

UHandle DSNewAlignedHClr(uint32 size, uint32 alignment, uint32 offset) {
    return NewHandle(size, AlignmentFor(alignment, offset), true);
}

UPtr DSNewPtr(uint32 size) {
    return NewPointer(size, false);
}

UPtr DSNewPClr(uint32 size) {
    return NewPointer(size, true);
}

MgErr DSDisposeHandle(UHandle h) {
    if (!h) return kNoErr;
    uint32 detours = Detours();
    if (TESSEL_UNLIKELY(detours)) UntrackHandle(h);
    if (TESSEL_UNLIKELY(!IsGoodHandle(h, kQueryProves))) return ReportMemoryError(kHandleErr, "DSDisposeHandle");
    UPtr data = *h;
    uint32 size = SizeOfData(data);
    if (TESSEL_UNLIKELY(detours & kScopeTracked)) ScopeRemove(h);
    Free(ThreadMemory::Mine(), h, data);
    if (TESSEL_UNLIKELY(detours & kHandlesTraced)) AfterDisposal(h, size);
    return kNoErr;
}

MgErr DSDisposeHandleAndNull(UHandle* h) {
    if (!h || !*h) return kNoErr;
    MgErr err = DSDisposeHandle(*h);
    *h = nullptr;
    return err;
}

MgErr DSDisposePtr(void* p) {
    NeedMemorySettings();
    if (!p) return ReportMemoryError(kArgErr, "DSDisposePtr");
    uint32 detours = Detours();
    if (detours) UntrackPointer(p);
    if (ChecksGuards(GuardKind::kPointer) && !CheckGuards(p, GuardKind::kPointer))
        return ReportMemoryError(kHandleErr, "DSDisposePtr");
    if (detours & kScopeTracked) ScopeRemove(p);
    DisposePtrBlock(p);
    return kNoErr;
}

uint32 DSGetHandleSize(UHandle h) {
    if (TESSEL_UNLIKELY(!IsGoodHandle(h, kQueryProves))) {
        TESSEL_REPORT(kDebugFatal, 0x2F9D86C1u);
        return 0;
    }
    return SizeOfData(*h);
}

MgErr DSSetHandleSize(UHandle h, uint32 size) {
    return Resize(h, size, AlignmentForSize(size), false, "DSSetHandleSize");
}

MgErr DSSetHSzClr(UHandle h, uint32 size) {
    return Resize(h, size, AlignmentForSize(size), true, "DSSetHSzClr");
}

MgErr DSSetAlignedHandleSize(UHandle h, uint32 size, uint32 alignment, uint32 offset) {
    return Resize(h, size, AlignmentFor(alignment, offset), false, "DSSetAlignedHandleSize");
}

MgErr DSSetAlignedHSzClr(UHandle h, uint32 size, uint32 alignment, uint32 offset) {
    return Resize(h, size, AlignmentFor(alignment, offset), true, "DSSetAlignedHSzClr");
}

MgErr DSSetHandleSizeOrNewHandle(UHandle* h, uint32 size) {
    return ResizeOrNew(h, size, false, "DSSetHandleSizeOrNewHandle");
}

MgErr DSSetHSzOrNewHClr(UHandle* h, uint32 size) {
    return ResizeOrNew(h, size, true, "DSSetHSzOrNewHClr");
}

MgErr DataSetHandleSizeOrNewHandle(UHandle* h, uint32 size) {
    return ResizeOrNull(h, size, false, "DataSetHandleSizeOrNewHandle");
}

MgErr DataSetHSzOrNewHClr(UHandle* h, uint32 size) {
    return ResizeOrNull(h, size, true, "DataSetHSzOrNewHClr");
}
