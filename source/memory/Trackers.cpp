#include "memory/Trackers.h"

#include "diagnostics/AllocTracking.h"
#include "diagnostics/NumberText.h"
#include "memory/HandleBlock.h"
#include "memory/MasterPointers.h"
#include "memory/MemorySettings.h"
#include "platform/MemoryRead.h"

#include <atomic>

namespace tessel {
namespace {

constexpr int32 kExpected = 0;
constexpr char kHandleLeaks[] = "Handle Leaks";
constexpr char kHandleLeakFile[] = "ovHandleLeaks.txt";
constexpr char kPointerLeaks[] = "Pointer Leaks";
constexpr char kPointerLeakFile[] = "ovPointerLeaks.txt";

std::atomic<AllocTracker*> handleTracker{nullptr};
std::atomic<AllocTracker*> pointerTracker{nullptr};

AllocTracker* Get(const std::atomic<AllocTracker*>& tracker) {
    return tracker.load(std::memory_order_acquire);
}

}  // namespace

void StartTrackers() {
    handleTracker.store(CreateAllocTracker());
    pointerTracker.store(CreateAllocTracker());
    SetDetour(kHandlesTracked, IsAllocTrackingOn());
}

void WriteLeakReports() {
    if (AllocTracker* tracker = Get(handleTracker))
        HandleLeakDumper(kExpected, kHandleLeaks, kHandleLeakFile).DumpLeaks(*tracker);
    if (AllocTracker* tracker = Get(pointerTracker)) DumpLeakInfo(tracker, kExpected, kPointerLeaks, kPointerLeakFile);
}

void StopTrackers() {
    SetDetour(kHandlesTracked, false);
    DestroyAllocTracker(handleTracker.exchange(nullptr));
    DestroyAllocTracker(pointerTracker.exchange(nullptr));
}

void TrackHandle(UHandle h, uint32 size, const void* frame) {
    if (AllocTracker* tracker = Get(handleTracker)) tracker->AddRecordFrom(frame, h, size, __FILE__, __LINE__);
}

void TrackPointer(const void* p, uint32 size, const void* frame) {
    if (AllocTracker* tracker = Get(pointerTracker)) tracker->AddRecordFrom(frame, p, size, __FILE__, __LINE__);
}

void UntrackHandle(UHandle h) {
    if (AllocTracker* tracker = Get(handleTracker)) tracker->RemoveRecord(h);
}

void UntrackPointer(const void* p) {
    if (AllocTracker* tracker = Get(pointerTracker)) tracker->RemoveRecord(p);
}

// The size recorded is that at creation; the handle knows its own. The handle may be damaged, and other threads may
// dispose of it meanwhile, so that its header is believed only when it can be read and the slot still leads to it.
void HandleLeakDumper::DumpItemContents(const void* handle, uint32) {
    UHandle h = static_cast<UHandle>(const_cast<void*>(handle));
    if (!masterPointers.Contains(h)) return;
    const uintptr_t content = SlotContent(h);
    if (!IsLiveContent(content)) return;
    const auto* const data = reinterpret_cast<const void*>(content);
    HandleHeader header;
    const bool isRead = platform::ReadMemory(HandleLayout().HeaderOf(data), &header, sizeof header) == sizeof header;
    if (SlotContent(h) != content) return;
    FormatToOutput("Master Pointer: 0x%s\n", AddressText(data).Text());
    LeakDumper::DumpItemContents(data, isRead ? header.size : 0);
}

}  // namespace tessel

using namespace tessel;

void MemDumpTracker(void) {
    WriteLeakReports();
}

void MemResetTracker(void) {
    if (AllocTracker* tracker = Get(handleTracker)) tracker->MarkAllReported();
    if (AllocTracker* tracker = Get(pointerTracker)) tracker->MarkAllReported();
}
