// Tracked allocation: what new and delete of the library's classes, and TrackedMalloc, come to.
#include "base/Compiler.h"
#include "diagnostics/ObjectTracker.h"
#include "memory/HandleBlock.h"
#include "memory/MemorySettings.h"
#include "memory/Service.h"
#include <tessel/memory/TrackedMallocFree.h>

#include <algorithm>

namespace tessel {
namespace {

constexpr int32 kStackSkip = 4;     // the tracker's own, and the function that the host called
constexpr int32 kRecordLine = 140;  // the line that reports name for every tracked block
constexpr char kLeakFile[] = "ovnewdelleaks.txt";

ObjectTracker tracker;

// Called by every function that allocates, itself called by the host. Not inlined, so that its frame tells where from.
TESSEL_NOT_INLINE void* Allocate(size_t size) {
    NeedMemorySettings();
    void* address = NewGuardedBlock(size, GuardKind::kNewDelete);
    if (address)
        tracker.Add(__builtin_frame_address(0), address, static_cast<uint32>(std::min<size_t>(size, UINT32_MAX)),
                    __FILE__, kRecordLine);
    return address;
}

class BadAllocation final : public std::bad_alloc {
public:
    const char* what() const noexcept override { return "bad allocation"; }
};

}  // namespace

MgErr TrackedMallocFreeStart() {
    tracker.Start(CreateAllocTrackerSpecifySkip(kStackSkip));
    return kNoErr;
}

MgErr TrackedMallocFreeStop() {
    tracker.StopAndReport(0, "new/delete leaks", kLeakFile);
    return kNoErr;
}

void* TrackedNew(size_t size) {
    void* address = Allocate(size != 0 ? size : 1);
    if (!address) throw BadAllocation();
    return address;
}

void* TrackedNewNoThrow(size_t size) noexcept {
    return Allocate(size != 0 ? size : 1);
}

}  // namespace tessel

using namespace tessel;

void* TrackedMalloc(size_t size) {
    return Allocate(size);
}

void TrackedFree(void* address) {
    if (!address) return;
    if (ChecksGuards(GuardKind::kNewDelete)) CheckGuards(address, GuardKind::kNewDelete);
    tracker.Remove(address);
    DisposeGuardedBlock(address, GuardKind::kNewDelete);
}

void TrackedMallocDumpTracker(void) {
    constexpr int32 kExpected = 330;
    tracker.Report(kExpected, "new/delete leaks -- 330 is arbitrary to avoid known reported leaks.", kLeakFile);
}

void TrackedMallocResetTracker(void) {
    tracker.MarkAllReported();
}
