// Who remembers handles and pointer blocks while they live: the two trackers, and the record of scoped tracking.
#ifndef TESSEL_SOURCE_MEMORY_TRACKERS_H
#define TESSEL_SOURCE_MEMORY_TRACKERS_H

#include <tessel/diagnostics/DumpLeakInfo.h>
#include <tessel/memory/MemoryManager.h>

namespace tessel {

void StartTrackers();
void WriteLeakReports();
void StopTrackers();

// `frame` is that of the function that the host called: the call stacks recorded begin with its caller.
void TrackHandle(UHandle h, uint32 size, const void* frame);
void TrackPointer(const void* p, uint32 size, const void* frame);
void UntrackHandle(UHandle h);
void UntrackPointer(const void* p);

// Leak reports that show where the handle's data lies and what it holds.
class HandleLeakDumper final : public LeakDumper {
public:
    using LeakDumper::LeakDumper;
    void DumpItemContents(const void* handle, uint32 size) override;
};

// ---- scoped tracking (ScopedAllocationTracking.cpp) -----------------------------------------------------------------

void StartScopedTracker();  // makes the record; tracking is not on
void StopScopedTracker();
void ScopeAdd(const void* address, uint32 size, const void* frame);
void ScopeRemove(const void* address);

}  // namespace tessel

#endif
