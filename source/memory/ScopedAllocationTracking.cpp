// What was allocated while a scope was tracked, and is left at its end.
#include "diagnostics/CallStackWalk.h"
#include "diagnostics/Guarded.h"
#include "memory/MemorySettings.h"
#include "memory/Trackers.h"
#include "sync/LibraryMutex.h"
#include <tessel/diagnostics/DebugStream.h>
#include <tessel/diagnostics/StackChain.h>
#include <tessel/memory/ScopedAllocationTracking.h>

#include <map>
#include <new>
#include <utility>

namespace tessel {
namespace {

struct ScopedAllocation {
    uint32 size;
    StackChainFS<16> stack;
};

// The standard allocator: what tracks allocations must not be among them.
using ScopedMap = std::map<uintptr_t, ScopedAllocation>;

struct ScopedRecord {
    LibraryMutex mutex;
    bool active TESSEL_GUARDED_BY(mutex) = false;
    ScopedMap map TESSEL_GUARDED_BY(mutex);
};
ScopedRecord* record = nullptr;  // from start to stop of the memory manager

void ReportMisuse() {
    TESSEL_REPORT(kDebugError, 0x31B7D9C5u) << "Recursive or multithreaded tracking not supported!";
}

void ReportAllocation(const ScopedAllocation& allocation) {
    try {
        TESSEL_REPORT(kDebugInfo, 0x6F20A4E3u) << allocation.size << " bytes";
        for (int32 i = 0; i < allocation.stack.Count(); ++i) {
            FrameDecoder frame(allocation.stack.At(i));
            TESSEL_REPORT(kDebugInfo, 0x094CB7D1u)
                << DbgFmtPtr(frame.Address()) << " - " << frame.Name() << " + " << static_cast<uint64>(frame.Offset());
        }
    } catch (...) {
        CaughtErr();
        TESSEL_REPORT(kDebugError, 0x44E8F15Au) << "*** AllocRecord::Dump -- exception thrown ***";
    }
}

// Takes what is left out of the record and ends tracking. False when it was not on.
bool EndTracking(ScopedMap& left) {
    LibraryMutexHolder hold(record->mutex);
    const bool was = record->active;
    record->active = false;
    SetDetour(kScopeTracked, false);
    left.swap(record->map);
    return was;
}

}  // namespace

void StartScopedTracker() {
    record = new (std::nothrow) ScopedRecord;
    if (record && record->mutex.Create("ScopedAllocationTracking") != kNoErr) delete std::exchange(record, nullptr);
}

void StopScopedTracker() {
    if (!record) return;
    SetDetour(kScopeTracked, false);
    record->mutex.Destroy();
    delete record;
    record = nullptr;
}

void ScopeAdd(const void* address, uint32 size, const void* frame) {
    ScopedAllocation allocation{size, {}};
    allocation.stack.RecordFrom(frame, static_cast<const StackFrame*>(frame)->returnAddress, 0);
    LibraryMutexHolder hold(record->mutex);
    if (!record->active) return;
    Guarded([&]() TESSEL_LOCKS_UNPROVEN {  // called at once
        record->map.insert_or_assign(reinterpret_cast<uintptr_t>(address), allocation);
        return kNoErr;
    });
}

void ScopeRemove(const void* address) {
    LibraryMutexHolder hold(record->mutex);
    record->map.erase(reinterpret_cast<uintptr_t>(address));
}

}  // namespace tessel

using namespace tessel;

void StartScopedAllocationTracking(void) {
    if (!record) return;
    bool wasActive;
    {
        LibraryMutexHolder hold(record->mutex);
        wasActive = record->active;
        record->active = true;
        SetDetour(kScopeTracked, true);
    }
    if (wasActive) ReportMisuse();
}

void StopScopedAllocationTracking(void) {
    if (!record) return;
    ScopedMap left;
    if (!EndTracking(left)) return ReportMisuse();
    if (left.empty()) return;
    TESSEL_REPORT(kDebugInfo, 0x2E6A51F8u) << "Leftover allocations: " << static_cast<uint64>(left.size());
    for (const auto& [address, allocation] : left) ReportAllocation(allocation);
}
