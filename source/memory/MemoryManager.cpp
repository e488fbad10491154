// Handles and pointer blocks through the flat interface.
#include "base/Compiler.h"
#include "memory/HandleBlock.h"
#include "memory/Handles.h"
#include "memory/Heap.h"
#include "memory/Trackers.h"
#include <tessel/diagnostics/DebugStream.h>
#include <tessel/memory/MemoryManager.h>

#include <algorithm>
#include <cstring>

namespace tessel {
namespace {

enum TraceKind { kCreated = 0, kResized = 1, kDisposed = 2 };

void Trace(TraceKind kind, MgErr err, UHandle h, uint32 newSize, uint32 oldSize) {
    if (MemEventTraceProc proc = memorySettings.trace.load()) proc(kind, err, h, newSize, oldSize);
}

// ---- creation -------------------------------------------------------------------------------------------------------

void BeforeCreation(ThreadMemory* mine) {
    NeedMemorySettings();
    if (MemoryDebugging()) masterPointers.CheckChains(mine);
}

void AfterCreation(UHandle h, uint32 size, const void* frame) {
    Trace(kCreated, kNoErr, h, size, 0);
    TrackHandle(h, size, frame);
    if (Detours() & kScopeTracked) ScopeAdd(h, size, frame);
}

UHandle CreationFailed(uint32 size) {
    CallSetMemFullProc(size);
    Trace(kCreated, kMemFullErr, nullptr, size, 0);
    return nullptr;
}

// A heap block with the data of a handle in it; null when there is no memory.
UPtr NewData(ThreadMemory* mine, uint32 size, Alignment alignment) {
    HandleLayout layout;
    const uint32 bytes = layout.BlockSize(size, alignment);
    if (TESSEL_UNLIKELY(bytes == 0)) return nullptr;
    void* block = heap::AllocateHandleBlock(mine, bytes);
    if (TESSEL_UNLIKELY(!block)) return nullptr;
    UPtr data = layout.PlaceData(block, alignment);
    layout.WriteHeader(block, data, size, alignment);
    return data;
}

TESSEL_NOT_INLINE UHandle NewHandle(uint32 size, Alignment alignment, bool clear, const void* frame) {
    ThreadMemory* mine = ThreadMemory::Mine();
    const uint32 detours = Detours();
    if (detours) BeforeCreation(mine);
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
    if (detours) AfterCreation(h, size, frame);
    return h;
}

// The short way: a small handle without anything special, on a thread that has a free slot at hand. Null when that is
// not so, or there is no memory: then NewHandle sees to it.
TESSEL_ALWAYS_INLINE UHandle NewPlainHandle(uint32 size) {
    ThreadMemory* mine = ThreadMemory::MineIfAny();
    if (TESSEL_UNLIKELY(Detours() != 0 || !mine || !mine->slots.head)) return nullptr;
    const uint32 bytes = HandleLayout::PlainBlockSize(size);
    const auto header = static_cast<HandleHeader*>(std::malloc(bytes));
    if (TESSEL_UNLIKELY(!header)) return nullptr;
    *header = {size, 0};
    UHandle h = masterPointers.TakePlain(mine);
    SetSlotContent(h, reinterpret_cast<uintptr_t>(header + 1));
    mine->counters.handles.Add(1);
    mine->counters.bytes.Add(bytes);
    return h;
}

TESSEL_ALWAYS_INLINE UHandle NewHandleBySize(uint32 size, bool clear, const void* frame) {
    Alignment alignment = AlignmentForSize(size);
    UHandle h = !clear && alignment.IsDefault() ? NewPlainHandle(size) : nullptr;
    return h ? h : NewHandle(size, alignment, clear, frame);
}

void AfterPtrCreation(UPtr p, uint32 size, const void* frame) {
    if (MemoryDebugging()) {
        if (reinterpret_cast<uintptr_t>(p) % 4 != 0)
            TESSEL_REPORT(kDebugFatal, 0x7B19C4D2u) << "Ptr block not ptr-aligned";
        DSHeapCheck(0);
    }
    TrackPointer(p, size, frame);
    if (Detours() & kScopeTracked) ScopeAdd(p, size, frame);
}

// ---- disposal -------------------------------------------------------------------------------------------------------

void Free(ThreadMemory* mine, UHandle h, UPtr data) {
    HandleLayout layout;
    HandleGate gate(mine);
    const uint32 bytes = layout.BlockSize(layout.SizeOf(data), layout.AlignmentOf(data));
    void* block = layout.BlockOf(data);
    masterPointers.Put(mine, h);
    heap::FreeHandleBlock(mine, block, bytes);
}

TESSEL_NOT_INLINE MgErr DisposeHandle(UHandle h) {
    const uint32 detours = Detours();
    if (detours) UntrackHandle(h);
    if (!IsGoodHandle(h, kQueryProves)) return ReportMemoryError(kHandleErr, "DSDisposeHandle");
    UPtr data = *h;
    const uint32 size = HandleLayout().SizeOf(data);
    if (detours & kScopeTracked) ScopeRemove(h);
    Free(ThreadMemory::Mine(), h, data);
    if (detours & kHandlesTraced) Trace(kDisposed, kNoErr, h, size, 0);
    return kNoErr;
}

// The short way, for a handle that NewPlainHandle could have made. False when there is more to do: then DisposeHandle
// sees to it.
TESSEL_ALWAYS_INLINE bool DisposePlainHandle(UHandle h) {
    ThreadMemory* mine = ThreadMemory::MineIfAny();
    if (TESSEL_UNLIKELY(Detours() != 0 || !mine || !masterPointers.HasRoom(mine))) return false;
    if (TESSEL_UNLIKELY(!IsLiveHandle(h, kQueryProves))) return false;
    HandleHeader* header = reinterpret_cast<HandleHeader*>(*h) - 1;
    if (TESSEL_UNLIKELY(header->distance != 0 || !HandleGate::TryEnter(mine))) return false;
    mine->counters.bytes.Add(-static_cast<int64>(HandleLayout::PlainBlockSize(header->size)));
    masterPointers.PutPlain(mine, h);
    std::free(header);
    HandleGate::Leave(mine);
    return true;
}

// ---- resizing -------------------------------------------------------------------------------------------------------

struct Resizing {
    HandleLayout layout;
    ThreadMemory* mine;
    UHandle h;
    uint32 newSize, oldSize;
    Alignment newAlignment, oldAlignment;
    uint32 newBytes, oldBytes;
};

// Keeps the block, or lets the allocator move it. Null when it cannot.
TESSEL_ALWAYS_INLINE UPtr ResizeInPlace(const Resizing& r) {
    UPtr data = *r.h;
    void* block = r.layout.BlockOf(data);
    if (r.newBytes != r.oldBytes) {
        const uint32 distance = r.layout.HeaderOf(data)->distance + r.layout.HeaderRoom();
        block = heap::ResizeHandleBlock(r.mine, block, r.oldBytes, r.newBytes);
        if (TESSEL_UNLIKELY(!block)) return nullptr;
        data = static_cast<UPtr>(block) + distance;
        if (TESSEL_UNLIKELY(!r.newAlignment.Suits(data))) {  // the allocator has moved it elsewhere in a page
            data = r.layout.PlaceData(block, r.newAlignment);
            std::memmove(data, static_cast<UPtr>(block) + distance, std::min(r.oldSize, r.newSize));
        }
    }
    r.layout.WriteHeader(block, data, r.newSize, r.newAlignment);
    return data;
}

TESSEL_NOT_INLINE UPtr ResizeByCopy(const Resizing& r) {
    UPtr old = *r.h;
    UPtr data = NewData(r.mine, r.newSize, r.newAlignment);
    if (!data) return nullptr;
    std::memcpy(data, old, std::min(r.oldSize, r.newSize));
    heap::FreeHandleBlock(r.mine, r.layout.BlockOf(old), r.oldBytes);
    return data;
}

// The data's place afterwards, or null when there is no memory.
TESSEL_ALWAYS_INLINE UPtr ResizeData(const Resizing& r) {
    const bool stress = memorySettings.stress.load(std::memory_order_relaxed);
    HandleGate gate(r.mine);
    UPtr data = nullptr;
    if (!stress && r.newAlignment == r.oldAlignment) data = ResizeInPlace(r);
    if (TESSEL_UNLIKELY(!data)) data = ResizeByCopy(r);
    if (TESSEL_UNLIKELY(!data)) return nullptr;
    if (data != *r.h) {
        SetSlotContent(r.h, reinterpret_cast<uintptr_t>(data));
        if (!stress) ThreadMemory::Count(r.mine, &MemoryCounters::moves, 1u);
    }
    return data;
}

TESSEL_NOT_INLINE MgErr ResizeFailed(uint32 bytes) {
    CallSetMemFullProc(bytes);
    return kMemFullErr;
}

// Who says how the data are to be aligned.
enum class AlignedBy { kCaller, kSize };

// The alignment chosen by size changes its offset from one size to the next. Large data that change by little keep the
// one that they have: growing them a byte at a time would move all of them at every other step.
TESSEL_ALWAYS_INLINE bool KeepsOffset(const Resizing& r) {
    constexpr uint32 kLeastSize = 4096, kLeastChange = 256;  // the change as a part of the size
    const uint32 change = r.newSize > r.oldSize ? r.newSize - r.oldSize : r.oldSize - r.newSize;
    return r.oldSize >= kLeastSize && change < r.oldSize / kLeastChange &&
           r.newAlignment.alignment == r.oldAlignment.alignment;
}

TESSEL_ALWAYS_INLINE MgErr ResizeChecked(ThreadMemory* mine, UHandle h, uint32 size, Alignment alignment, AlignedBy by,
                                         bool clear, HandleLayout layout, uint32 oldSize) {
    Resizing r{layout, mine, h, size, oldSize, alignment, layout.AlignmentOf(*h), 0, 0};
    if (r.newSize == r.oldSize && r.newAlignment == r.oldAlignment) return kNoErr;
    if (by == AlignedBy::kSize && KeepsOffset(r)) r.newAlignment = r.oldAlignment;
    r.newBytes = layout.BlockSize(size, r.newAlignment);
    if (TESSEL_UNLIKELY(r.newBytes == 0)) return ResizeFailed(size);
    r.oldBytes = layout.BlockSize(r.oldSize, r.oldAlignment);
    UPtr data = ResizeData(r);
    if (TESSEL_UNLIKELY(!data)) return ResizeFailed(r.newBytes);
    if (clear && size > oldSize) std::memset(data + oldSize, 0, size - oldSize);
    return kNoErr;
}

TESSEL_NOT_INLINE MgErr ReportBadHandle(const char* operation) {
    TESSEL_REPORT(kDebugFatal, 0x53C8E70Bu);
    return ReportMemoryError(kHandleErr, operation);
}

TESSEL_NOT_INLINE MgErr AfterResize(MgErr err, UHandle h, uint32 size, uint32 oldSize, const char* operation) {
    if (Detours() & kHandlesTraced) Trace(kResized, err, h, size, oldSize);
    return ReportMemoryError(err, operation);
}

MgErr Resize(UHandle h, uint32 size, Alignment alignment, AlignedBy by, bool clear, const char* operation) {
    ThreadMemory* mine = ThreadMemory::Mine();
    ThreadMemory::Count(mine, &MemoryCounters::resizes, 1u);
    if (TESSEL_UNLIKELY(!IsGoodHandle(h, kChangeProves))) return ReportBadHandle(operation);
    HandleLayout layout;
    const uint32 oldSize = layout.SizeOf(*h);
    const MgErr err = ResizeChecked(mine, h, size, alignment, by, clear, layout, oldSize);
    if (TESSEL_UNLIKELY(err != kNoErr || (Detours() & kHandlesTraced)))
        return AfterResize(err, h, size, oldSize, operation);
    return kNoErr;
}

// An empty datum is a null handle.
MgErr ResizeOrNull(UHandle* h, uint32 size, bool clear, const char* operation, const void* frame) {
    return size == 0 ? DSDisposeHandleAndNull(h) : ResizeOrCreate(h, size, clear, operation, frame);
}

}  // namespace

UHandle CreateHandle(uint32 size, bool clear, const void* frame) {
    return NewHandleBySize(size, clear, frame);
}

UPtr CreatePtr(uint32 size, bool clear, const void* frame) {
    NeedMemorySettings();
    UPtr p = NewPtrBlock(size);
    if (!p) {
        CallSetMemFullProc(size);
        return nullptr;
    }
    if (clear) std::memset(p, 0, size);
    ThreadMemory::Count(ThreadMemory::Mine(), &MemoryCounters::pointers, 1u);
    if (Detours()) AfterPtrCreation(p, size, frame);
    return p;
}

MgErr ResizeOrCreate(UHandle* h, uint32 size, bool clear, const char* operation, const void* frame) {
    if (!h) return kArgErr;
    if (*h) return Resize(*h, size, AlignmentForSize(size), AlignedBy::kSize, clear, operation);
    *h = CreateHandle(size, clear, frame);
    return *h ? kNoErr : kMemFullErr;
}

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
    return NewHandleBySize(size, false, TESSEL_THIS_FRAME);
}

UHandle DSNewHClr(uint32 size) {
    return CreateHandle(size, true, TESSEL_THIS_FRAME);
}

UHandle DSNewAlignedHandle(uint32 size, uint32 alignment, uint32 offset) {
    return NewHandle(size, AlignmentFor(alignment, offset), false, TESSEL_THIS_FRAME);
}

UHandle DSNewAlignedHClr(uint32 size, uint32 alignment, uint32 offset) {
    return NewHandle(size, AlignmentFor(alignment, offset), true, TESSEL_THIS_FRAME);
}

UPtr DSNewPtr(uint32 size) {
    return CreatePtr(size, false, TESSEL_THIS_FRAME);
}

UPtr DSNewPClr(uint32 size) {
    return CreatePtr(size, true, TESSEL_THIS_FRAME);
}

MgErr DSDisposeHandle(UHandle h) {
    if (!h || DisposePlainHandle(h)) return kNoErr;
    return DisposeHandle(h);
}

MgErr DSDisposeHandleAndNull(UHandle* h) {
    if (!h || !*h) return kNoErr;
    const MgErr err = DSDisposeHandle(*h);
    *h = nullptr;
    return err;
}

MgErr DSDisposePtr(void* p) {
    NeedMemorySettings();
    if (!p) return ReportMemoryError(kArgErr, "DSDisposePtr");
    const uint32 detours = Detours();
    if (detours) UntrackPointer(p);
    if (ChecksGuards(GuardKind::kPointer) && !CheckGuards(p, GuardKind::kPointer))
        return ReportMemoryError(kHandleErr, "DSDisposePtr");
    if (detours & kScopeTracked) ScopeRemove(p);
    return ReportMemoryError(DisposePtrBlock(p) ? kNoErr : kHandleErr, "DSDisposePtr");
}

uint32 DSGetHandleSize(UHandle h) {
    if (TESSEL_UNLIKELY(!IsGoodHandle(h, kQueryProves))) {
        TESSEL_REPORT(kDebugFatal, 0x2F9D86C1u);
        return 0;
    }
    return HandleLayout().SizeOf(*h);
}

MgErr DSSetHandleSize(UHandle h, uint32 size) {
    return Resize(h, size, AlignmentForSize(size), AlignedBy::kSize, false, "DSSetHandleSize");
}

MgErr DSSetHSzClr(UHandle h, uint32 size) {
    return Resize(h, size, AlignmentForSize(size), AlignedBy::kSize, true, "DSSetHSzClr");
}

MgErr DSSetAlignedHandleSize(UHandle h, uint32 size, uint32 alignment, uint32 offset) {
    return Resize(h, size, AlignmentFor(alignment, offset), AlignedBy::kCaller, false, "DSSetAlignedHandleSize");
}

MgErr DSSetAlignedHSzClr(UHandle h, uint32 size, uint32 alignment, uint32 offset) {
    return Resize(h, size, AlignmentFor(alignment, offset), AlignedBy::kCaller, true, "DSSetAlignedHSzClr");
}

MgErr DSSetHandleSizeOrNewHandle(UHandle* h, uint32 size) {
    return ResizeOrCreate(h, size, false, "DSSetHandleSizeOrNewHandle", TESSEL_THIS_FRAME);
}

MgErr DSSetHSzOrNewHClr(UHandle* h, uint32 size) {
    return ResizeOrCreate(h, size, true, "DSSetHSzOrNewHClr", TESSEL_THIS_FRAME);
}

MgErr DataSetHandleSizeOrNewHandle(UHandle* h, uint32 size) {
    return ResizeOrNull(h, size, false, "DataSetHandleSizeOrNewHandle", TESSEL_THIS_FRAME);
}

MgErr DataSetHSzOrNewHClr(UHandle* h, uint32 size) {
    return ResizeOrNull(h, size, true, "DataSetHSzOrNewHClr", TESSEL_THIS_FRAME);
}
