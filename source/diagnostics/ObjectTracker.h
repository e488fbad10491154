// A tracker of one kind of object, from the start of its service to its stop.
#ifndef TESSEL_SOURCE_DIAGNOSTICS_OBJECTTRACKER_H
#define TESSEL_SOURCE_DIAGNOSTICS_OBJECTTRACKER_H

#include <tessel/base/MgErr.h>
#include <tessel/diagnostics/AllocTracker.h>
#include <tessel/diagnostics/DumpLeakInfo.h>

#include <atomic>

namespace tessel {

class ObjectTracker {
public:
    // A tracker that cannot be made tracks nothing.
    void Start(AllocTracker* tracker = CreateAllocTracker()) { tracker_.store(tracker, std::memory_order_release); }
    void Stop() { DestroyAllocTracker(tracker_.exchange(nullptr, std::memory_order_acq_rel)); }

    // Stops before the report is written.
    void StopAndReport(int32 expected, CStr name, CStr fileName) {
        AllocTracker* tracker = tracker_.exchange(nullptr, std::memory_order_acq_rel);
        DumpLeakInfo(tracker, expected, name, fileName);
        DestroyAllocTracker(tracker);
    }

    // The call stack begins with the caller of the function whose frame is given.
    void Add(const void* frame, const void* object, uint32 size, const char* file, int32 line) {
        if (AllocTracker* tracker = Get()) tracker->AddRecordFrom(frame, object, size, file, line);
    }
    void Remove(const void* object) {
        if (AllocTracker* tracker = Get()) tracker->RemoveRecord(object);
    }
    void Report(int32 expected, CStr name, CStr fileName) { DumpLeakInfo(Get(), expected, name, fileName); }
    void MarkAllReported() {
        if (AllocTracker* tracker = Get()) tracker->MarkAllReported();
    }

    // Null: nothing is tracked.
    AllocTracker* Get() const { return tracker_.load(std::memory_order_acquire); }

private:
    std::atomic<AllocTracker*> tracker_{nullptr};
};

}  // namespace tessel

#endif
