#include "diagnostics/TrackerHeap.h"

#include <cstdlib>

namespace tessel {
namespace {

constexpr TrackerHeapSource kCAllocator = {
    [](size_t size) { return std::calloc(1, size); },
    [](void* block) {
        std::free(block);
        return true;
    },
};

TrackerHeapSource heapSource = kCAllocator;

}  // namespace

void SetTrackerHeapSource(const TrackerHeapSource& source) {
    heapSource = source;
}
void ResetTrackerHeapSource() {
    heapSource = kCAllocator;
}

TrackerHeap::~TrackerHeap() {
    for (Block* block = list_.next; block != &list_;) {
        Block* const next = block->next;
        heapSource.release(block);
        block = next;
    }
}

bool TrackerHeap::Holds(const Block* block) const {
    for (const Block* each = list_.next; each != &list_; each = each->next)
        if (each == block) return true;
    return false;
}

void* TrackerHeap::Allocate(size_t size, TrackerFailure& failure) {
    auto* block = static_cast<Block*>(heapSource.allocate(sizeof(Block) + size));
    if (!block) {
        failure = TrackerFailure::kOutOfMemory;
        return nullptr;
    }
    platform::MutexHolder hold(mutex_);
    if (Holds(block)) {
        failure = TrackerFailure::kSamePointerTwice;
        return nullptr;
    }
    *block = {list_.next, &list_};
    block->next->previous = list_.next = block;
    return block + 1;
}

void TrackerHeap::Release(void* memory, TrackerFailure& failure) {
    if (!memory) return;
    Block* const block = static_cast<Block*>(memory) - 1;
    {
        platform::MutexHolder hold(mutex_);
        block->previous->next = block->next;
        block->next->previous = block->previous;
    }
    if (!heapSource.release(block)) failure = TrackerFailure::kFreeError;
}

}  // namespace tessel
