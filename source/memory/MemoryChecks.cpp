// Checks and statistics.
#include "memory/Handles.h"
#include "memory/Heap.h"
#include "platform/Mutex.h"
#include <tessel/diagnostics/DebugStream.h>

#include <algorithm>
#include <atomic>

namespace tessel {
namespace {

uint32 Saturated(uint64 value) {
    return static_cast<uint32>(std::min<uint64>(value, UINT32_MAX));
}

MgErr CheckConsistency(bool report) {
    const bool chainsAreSound = !MemoryDebugging() || masterPointers.CheckChains(ThreadMemory::Mine());
    heap::Check();
    MgErr err = masterPointers.CheckBlocks();
    if (!chainsAreSound) err = kCorruptErr;
    if (report) {
        TESSEL_REPORT(kDebugInfo, 0x73A9D1E5u) << "Free: totFreeSize " << 0 << ", maxFreeSize " << 0;
        TESSEL_REPORT(kDebugInfo, 0x28E4C06Bu) << "Allocated to OV: totAllocSize " << heap::TotalAllocated();
        TESSEL_REPORT(kDebugInfo, 0x5A17F3C8u) << "Total: totPhysSize " << 0;
    }
    return err;
}

std::atomic<bool> isChecking{false};

// The counters as DSSetCounters set them lie this far from what the threads have counted.
struct CounterOffsets {
    platform::Mutex mutex;
    uint32 offsets[4] TESSEL_GUARDED_BY(mutex) = {};
};
CounterOffsets counterOffsets;

void ReadRawCounters(uint32 (&counters)[4]) {
    MemoryTotals totals = ThreadMemory::Totals();
    counters[0] = totals.handles;
    counters[1] = totals.pointers;
    counters[2] = totals.resizes;
    counters[3] = totals.moves;
}

}  // namespace
}  // namespace tessel

using namespace tessel;

int32 IsDSHandle(UHandle h) {
    return IsLiveHandle(h, kAlwaysProve) ? 1 : 0;
}

MgErr DSCheckHandle(UHandle h) {
    return IsGoodHandle(h, kAlwaysProve) ? kNoErr : kHandleErr;
}

MgErr DSCheckPtr(const void* p) {
    if (!p) return kHandleErr;
    const bool checked = ChecksGuards(GuardKind::kPointer) && WritesGuards(GuardKind::kPointer);
    return !checked || CheckGuards(p, GuardKind::kPointer) ? kNoErr : kHandleErr;
}

int32 DSCheckHandleGuardBytes(UHandle h) {
    if (!h) {
        TESSEL_REPORT(kDebugError, 0x1D58B0E4u) << "NULL handle passed to DSCheckHandleGuardBytes";
        return 0;
    }
    if (!WritesGuards(GuardKind::kHandle)) return 1;
    return IsLiveHandle(h, kAlwaysProve) && CheckGuards(*h, GuardKind::kHandle) ? 1 : 0;
}

int32 DSCheckPtrGuardBytes(const void* p) {
    return !WritesGuards(GuardKind::kPointer) || CheckGuards(p, GuardKind::kPointer) ? 1 : 0;
}

// Ends with a small block, which the heap must be able to give.
MgErr DSHeapCheck(int32 report) {
    constexpr uint32 kProbe = 2;
    if (isChecking.exchange(true)) return kNoErr;
    const MgErr err = CheckConsistency(report != 0);
    DSDisposePtr(DSNewPtr(kProbe));
    isChecking.store(false);
    return err;
}

MgErr DSMemStats(MemStatRec* stats) {
    const MgErr err = CheckConsistency(false);
    if (stats) {
        *stats = MemStatRec();
        stats->totalAllocated = Saturated(heap::TotalAllocated());
    }
    return err;
}

MgErr DSMemStats2(uint32* out0, uint32* out1, uint32* out2, uint32* out3, uint32* out4, uint32* out5, uint32* out6,
                  uint32* out7, uint32* out8, uint32* out9, uint32* out10, uint32* out11) {
    MemStatRec stats;
    const MgErr err = DSMemStats(&stats);
    uint32* zeros[] = {out0, out1, out2, out4, out5, out6, out7, out8, out9, out10, out11};
    for (uint32* out : zeros)
        if (out) *out = 0;
    if (out3) *out3 = stats.totalAllocated;
    return err;
}

MgErr DSMemStatsSlow(uint32 words[3]) {
    uint64 used = 0;
    bool sound = heap::Walk(&used, [](void* sum, const void*, size_t size) {
        *static_cast<uint64*>(sum) += size;
        return true;
    });
    if (!sound) TESSEL_REPORT(kDebugError, 0x4C03E9A8u) << "The heap is corrupt";
    if (!words) return kNoErr;
    words[0] = 0;
    words[1] = Saturated(used);
    words[2] = Saturated(heap::TotalAllocated());
    return kNoErr;
}

int32 DSMaxMem(void) {
    return 0;
}

MgErr DSCompact(void) {
    if (MemoryDebugging()) DSHeapCheck(1);
    return kNoErr;
}

bool MemCheckHeaps(void) {
    const bool was = MemoryDebugging();
    SetMemoryDebugger(true);
    DSHeapCheck(1);
    heap::Check();
    SetMemoryDebugger(was);
    return MemoryDebugging();
}

void DSSetCounters(const uint32 counters[4]) {
    if (!counters) return;
    uint32 raw[4];
    ReadRawCounters(raw);
    platform::MutexHolder hold(counterOffsets.mutex);
    for (int i = 0; i < 4; ++i) counterOffsets.offsets[i] = counters[i] - raw[i];
}

void DSReadCounters(uint32 counters[4]) {
    if (!counters) return;
    uint32 raw[4];
    ReadRawCounters(raw);
    platform::MutexHolder hold(counterOffsets.mutex);
    for (int i = 0; i < 4; ++i) counters[i] = raw[i] + counterOffsets.offsets[i];
}
