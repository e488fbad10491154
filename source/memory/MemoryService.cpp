// Start and stop of the memory manager.
#include "memory/HandleBlock.h"
#include "memory/Handles.h"
#include "memory/Heap.h"
#include "memory/Service.h"
#include "memory/Trackers.h"
#include <tessel/base/MGPlacementNew.h>
#include <tessel/diagnostics/DebugStream.h>

#include <atomic>

namespace tessel {
namespace {

std::atomic<bool> initialized{false};
heap::ErrorCallback previousCallback = nullptr;

// Lack of memory is told to the memory-full procedure instead.
void PassOnHeapError(heap::Error error, const void* block) {
    if (error != heap::Error::kOutOfMemory && previousCallback) previousCallback(error, block);
}

// Names the blocks of all handles to a walk over the heap.
bool NameHandleBlocks(void* context, heap::Visitor visitor) {
    HandleLayout layout;
    platform::ReadablePages pages;
    return masterPointers.ForEachLive([&](UHandle h) {
        const UPtr data = *h;
        if (!layout.IsSound(data, pages)) return false;
        const uint32 bytes = layout.BlockSize(layout.SizeOf(data), layout.AlignmentOf(data));
        return visitor(context, layout.BlockOf(data), bytes);
    });
}

// Reports and frees every handle that is left. One that was overwritten, or whose header was, has a size that nobody
// knows, and keeps its block: to free it would be to follow the header. Blocks that were freed may be given back to the
// system, so what can be read is asked anew for each.
void RecoverHandles() {
    uint32 count = 0;
    uint64 bytes = 0;
    masterPointers.ForEachLeft([&](UHandle h) {
        platform::ReadablePages pages;
        const bool sound = HandleLayout().IsSound(*h, pages);
        const uint32 size = sound ? HandleLayout().SizeOf(*h) : 0;
        TESSEL_REPORT(kDebugInfo, 0x66B5D82Cu) << "handle " << DbgFmtPtr(h) << ", size " << size << " still allocated.";
        UntrackHandle(h);
        if (!sound) return heap::CallErrorCallback(heap::Error::kDamagedBlock, *h);
        FreeHandle(h);
        ++count;
        bytes += size;
    });
    // Before the end of the master pointers: a handler may use handles while it shows a report.
    TESSEL_REPORT(kDebugInfo, 0x0D94A7F3u) << "Recovered " << count << " Handles for " << bytes << " bytes.";
    masterPointers.Stop();
}

}  // namespace

MgErr MemoryManagerStart() {
    NeedMemorySettings();
    PrepareHandleGate();
    previousCallback = heap::SetErrorCallback(PassOnHeapError);
    SetMemoryDebugger(false);
    MgErr err = masterPointers.Start();
    if (err == kNoErr) err = masterPointers.mutex.Create("MemoryManager");
    if (err != kNoErr) {
        masterPointers.Stop();
        heap::SetErrorCallback(previousCallback);
        return err;
    }
    heap::SetHandleBlocks(NameHandleBlocks);
    initialized.store(true);
    StartTrackers();
    StartScopedTracker();
    return kNoErr;
}

MgErr MemoryManagerStop() {
    MGPlacementNewRunCleanup();
    initialized.store(false);
    StopScopedTracker();
    WriteLeakReports();
    heap::SetHandleBlocks(nullptr);
    RecoverHandles();
    masterPointers.mutex.Destroy();
    StopTrackers();
    SetMemFullProc(nullptr);
    heap::SetErrorCallback(previousCallback);
    return kNoErr;
}

}  // namespace tessel

bool GetMemoryManagerInitialized(void) {
    return tessel::initialized.load();
}
