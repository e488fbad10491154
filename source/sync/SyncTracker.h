// The trackers of events and mutexes: one each, from the start of its service to its stop.
#ifndef TESSEL_SOURCE_SYNC_SYNCTRACKER_H
#define TESSEL_SOURCE_SYNC_SYNCTRACKER_H

#include <tessel/base/MgErr.h>
#include <tessel/diagnostics/AllocTracker.h>
#include <tessel/diagnostics/DumpLeakInfo.h>

#include <atomic>

namespace tessel {

class SyncTracker {
public:
    // A tracker that cannot be made tracks nothing.
    void Start() { tracker_.store(CreateAllocTracker(), std::memory_order_release); }

    void Stop(int32 expected, CStr name, CStr fileName) {
        AllocTracker* tracker = tracker_.exchange(nullptr, std::memory_order_acq_rel);
        DumpLeakInfo(tracker, expected, name, fileName);
        DestroyAllocTracker(tracker);
    }
    // The call stack begins with the caller of the function whose frame is given.
    void Add(const void* frame, const void* object, uint32 size, const char* file, int32 line) {
        if (AllocTracker* tracker = tracker_.load(std::memory_order_acquire))
            tracker->AddRecordFrom(frame, object, size, file, line);
    }
    void Remove(const void* object) {
        if (AllocTracker* tracker = tracker_.load(std::memory_order_acquire)) tracker->RemoveRecord(object);
    }

private:
    std::atomic<AllocTracker*> tracker_{nullptr};
};

}  // namespace tessel

#endif
