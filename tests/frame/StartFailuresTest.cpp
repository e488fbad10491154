// The start of the library when memory runs out. The operators new of this program fail along with the library's own
// allocations.
#include "memory/Heap.h"
#include "support/FailingAllocator.h"
#include "support/Test.h"
#include <tessel/diagnostics/DebugOutput.h>
#include <tessel/frame/TesselInit.h>
#include <tessel/memory/MemoryManager.h>

#include <new>

namespace {

std::atomic<int> theLiveBlocks{0};

}  // namespace

// The forms for arrays call these, or are the sanitizer's in pairs.
void* operator new(size_t size, const std::nothrow_t&) noexcept {
    void* block = tessel::test::FailingAllocator::May(size) ? std::malloc(size != 0 ? size : 1) : nullptr;
    theLiveBlocks += block != nullptr;
    return block;
}

void* operator new(size_t size) {
    if (void* block = operator new(size, std::nothrow)) return block;
    throw std::bad_alloc();
}

void operator delete(void* block) noexcept {
    theLiveBlocks -= block != nullptr;
    std::free(block);
}

void operator delete(void* block, size_t) noexcept {
    operator delete(block);
}

void operator delete(void* block, const std::nothrow_t&) noexcept {
    operator delete(block);
}

namespace tessel::test {
namespace {

MgErr StartAndStop() {
    MgErr err = InitTesselBase();
    if (err == kNoErr) {
        err = InitTesselAppSupport();
        UHandle h = DSNewHandle(100);
        if (h && err == kNoErr) err = DSSetHandleSize(h, 50);
        DSDisposeHandle(h);
        UninitTesselAppSupport();
    }
    UninitTesselBase();
    return err;
}

TEST(TesselStart, SurvivesEveryAllocationThatFails) {
    DebugOutputSetHandler([](CStr, int32, CStr, int32, uint32, CStr) {});
    EXPECT_EQ(kNoErr, StartAndStop());
    const uint64 before = heap::TotalAllocated();
    const int blocksBefore = theLiveBlocks;
    int refused = 0, n = 0;
    for (bool failed = true; failed && !HasFailure(); ++n) {
        MgErr err;
        {
            test::FailingAllocator failing(n + 1);
            err = StartAndStop();
            failed = failing.HasFailed();
        }
        EXPECT_EACH((err == kNoErr || (err == kMemFullErr && failed)), heap::TotalAllocated() == before,
                    StartAndStop() == kNoErr, blocksBefore == theLiveBlocks);  // with memory it starts again
        refused += err != kNoErr;
    }
    DebugOutputSetHandler(nullptr);
    EXPECT_EACH(refused > 20, n > refused);  // what runs out after the start is not the start's failure
}

}  // namespace
}  // namespace tessel::test
