#include "memory/Trackers.h"

#include "diagnostics/AllocTracking.h"
#include "diagnostics/NumberText.h"
#include "diagnostics/ObjectTracker.h"
#include "memory/HandleBlock.h"
#include "memory/MasterPointers.h"
#include "memory/MemorySettings.h"
#include "platform/MemoryRead.h"

namespace tessel {
namespace {

constexpr int32 kExpected = 0;
constexpr char kHandleLeaks[] = "Handle Leaks";
constexpr char kHandleLeakFile[] = "ovHandleLeaks.txt";
constexpr char kPointerLeaks[] = "Pointer Leaks";
constexpr char kPointerLeakFile[] = "ovPointerLeaks.txt";

ObjectTracker handleTracker;
ObjectTracker pointerTracker;

}  // namespace

void StartTrackers() {
    handleTracker.Start();
    pointerTracker.Start();
    SetDetour(kHandlesTracked, IsAllocTrackingOn());
}

void WriteLeakReports() {
    if (AllocTracker* tracker = handleTracker.Get())
        HandleLeakDumper(kExpected, kHandleLeaks, kHandleLeakFile).DumpLeaks(*tracker);
    pointerTracker.Report(kExpected, kPointerLeaks, kPointerLeakFile);
}

void StopTrackers() {
    SetDetour(kHandlesTracked, false);
    handleTracker.Stop();
    pointerTracker.Stop();
}

void TrackHandle(UHandle h, uint32 size, const void* frame) {
    handleTracker.Add(frame, h, size, __FILE__, __LINE__);
}

void TrackPointer(const void* p, uint32 size, const void* frame) {
    pointerTracker.Add(frame, p, size, __FILE__, __LINE__);
}

void UntrackHandle(UHandle h) {
    handleTracker.Remove(h);
}

void UntrackPointer(const void* p) {
    pointerTracker.Remove(p);
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
    handleTracker.MarkAllReported();
    pointerTracker.MarkAllReported();
}
