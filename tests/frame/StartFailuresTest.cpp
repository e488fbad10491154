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

void* Allocate(size_t size) {
    if (!tessel::test::FailingAllocator::May(size)) return nullptr;
    ++theLiveBlocks;
    return std::malloc(size != 0 ? size : 1);
}

void Release(void* block) {
    theLiveBlocks -= block != nullptr;
    std::free(block);
}

void* AllocateOrThrow(size_t size) {
    if (void* block = Allocate(size)) return block;
    throw std::bad_alloc();
}

}  // namespace

void* operator new(size_t size) {
    return AllocateOrThrow(size);
}
void* operator new[](size_t size) {
    return AllocateOrThrow(size);
}
void* operator new(size_t size, const std::nothrow_t&) noexcept {
    return Allocate(size);
}
void* operator new[](size_t size, const std::nothrow_t&) noexcept {
    return Allocate(size);
}
void operator delete(void* block) noexcept {
    Release(block);
}
void operator delete[](void* block) noexcept {
    Release(block);
}
void operator delete(void* block, size_t) noexcept {
    Release(block);
}
void operator delete[](void* block, size_t) noexcept {
    Release(block);
}
void operator delete(void* block, const std::nothrow_t&) noexcept {
    Release(block);
}
void operator delete[](void* block, const std::nothrow_t&) noexcept {
    Release(block);
}

namespace tessel {
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
    for (bool failed = true; failed && !HasFailure();) {
        MgErr err;
        {
            test::FailingAllocator failing(++n);
            err = StartAndStop();
            failed = failing.HasFailed();
        }
        EXPECT_TRUE(err == kNoErr || (err == kMemFullErr && failed)) << n << ": " << err;
        EXPECT_EQ(before, heap::TotalAllocated()) << n;
        EXPECT_EQ(kNoErr, StartAndStop()) << "with memory it starts again";
        EXPECT_EQ(blocksBefore, theLiveBlocks) << n;
        refused += err != kNoErr;
    }
    DebugOutputSetHandler(nullptr);
    EXPECT_GT(refused, 20);
    EXPECT_GT(n, refused) << "what runs out after the start is not the start's failure";
}

}  // namespace
}  // namespace tessel
