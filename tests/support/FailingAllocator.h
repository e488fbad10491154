// Makes the n-th allocation (from 1) of the library's heap fail while the object lives; with n = 0 none. The memory of
// the trackers counts too. One object at a time.
#pragma once

#include <cstddef>

namespace tessel::test {

class FailingAllocator {
public:
    explicit FailingAllocator(int n);
    ~FailingAllocator();
    FailingAllocator(const FailingAllocator&) = delete;
    FailingAllocator& operator=(const FailingAllocator&) = delete;

    // Whether an allocation has failed.
    bool HasFailed() const;

    // Counts an allocation, and tells whether it may succeed: for operators new that a test program replaces.
    static bool May(std::size_t size);
};

}  // namespace tessel::test

