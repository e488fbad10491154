// The memory of one allocation tracker: blocks of the C allocator, kept in a list so that they can all be released.
//
// Never goes through anything that is tracked. Any thread.
#ifndef TESSEL_SOURCE_DIAGNOSTICS_TRACKERHEAP_H
#define TESSEL_SOURCE_DIAGNOSTICS_TRACKERHEAP_H

#include "platform/Mutex.h"

#include <cstddef>

namespace tessel {

// Why a tracker gives up.
enum class TrackerFailure { kNone, kOutOfMemory, kSamePointerTwice, kFreeError };

// Where the blocks come from; replaced by tests. `allocate` gives zeroed memory or null. `release` tells whether it
// could.
struct TrackerHeapSource {
    void* (*allocate)(size_t size);
    bool (*release)(void* block);
};
void SetTrackerHeapSource(const TrackerHeapSource& source);
void ResetTrackerHeapSource();

class TrackerHeap {
public:
    TrackerHeap() = default;
    ~TrackerHeap();
    TrackerHeap(const TrackerHeap&) = delete;
    TrackerHeap& operator=(const TrackerHeap&) = delete;

    void* Allocate(size_t size, TrackerFailure& failure);  // zeroed; null sets `failure`, which is left alone otherwise
    void Release(void* memory, TrackerFailure& failure);   // null is ignored

private:
    struct Block {
        Block* next;
        Block* previous;
    };
    bool Holds(const Block* block) const TESSEL_REQUIRES(mutex_);

    platform::Mutex mutex_;
    Block list_ TESSEL_GUARDED_BY(mutex_){&list_, &list_};
};

}  // namespace tessel

#endif
