#include "support/FailingAllocator.h"

#include "diagnostics/TrackerHeap.h"
#include "memory/Heap.h"

#include <atomic>
#include <cstdlib>

namespace tessel::test {
namespace {

std::atomic<int> left;
std::atomic<bool> failed;

}  // namespace

bool FailingAllocator::May(size_t) {
    if (left.fetch_sub(1) != 1) return true;
    failed = true;
    return false;
}

FailingAllocator::FailingAllocator(int n) {
    left = n;
    failed = false;
    heap::SetAllocationFilter(May);
    SetTrackerHeapSource({[](size_t size) { return May(size) ? std::calloc(1, size) : nullptr; },
                          [](void* block) {
                              std::free(block);
                              return true;
                          }});
}

FailingAllocator::~FailingAllocator() {
    left = 0;
    heap::SetAllocationFilter(nullptr);
    ResetTrackerHeapSource();
}

bool FailingAllocator::HasFailed() const {
    return failed;
}

}  // namespace tessel::test
