// What happens when memory runs out at any point, when threads meet, and when something is left.
#include <gmock/gmock.h>

#include <cstring>
#include <functional>
#include <memory>
#include <thread>
#include <vector>

#include <tessel/memory/CookieManager.h>
#include <tessel/memory/MemoryManager.h>
#include <tessel/memory/MemoryUtil.h>
#include <tessel/memory/ScopedAllocationTracking.h>
#include <tessel/memory/TrackedMallocFree.h>

#include "memory/Heap.h"
#include "memory/Service.h"
#include "support/FailingAllocator.h"
#include "support/ScratchDrive.h"
#include "support/StartedMemory.h"

namespace tessel {
namespace {

using ::testing::Contains;
using ::testing::ElementsAre;
using ::testing::EndsWith;
using ::testing::HasSubstr;
using ::testing::IsEmpty;

// Runs a scenario with the 1st, 2nd, 3rd ... allocation failing until it passes without. It must leave nothing behind.
int FailAtEveryAllocation(const std::function<void()>& scenario) {
    for (int n = 1;; ++n) {
        test::StartedMemory memory;
        uint64 before = heap::TotalAllocated();
        bool failed;
        {
            test::FailingAllocator failing(n);
            scenario();
            failed = failing.HasFailed();
        }
        EXPECT_EQ(before, heap::TotalAllocated()) << n;
        if (!failed || ::testing::Test::HasFailure()) return n;
    }
}

TEST(MemoryFull, LeavesHandlesAsTheyWere) {
    int runs = FailAtEveryAllocation([] {
        UHandle h = DSNewHandle(20), copy = nullptr;
        if (!h) return;
        std::memset(*h, 'x', 20);
        for (uint32 size : {200u, 5000u, 2000000u, 3000000u, 20u}) {
            uint32 old = DSGetHandleSize(h);
            MgErr err = DSSetHSzClr(h, size);
            EXPECT_TRUE(err == kNoErr || err == kMemFullErr);
            EXPECT_EQ(err == kNoErr ? size : old, DSGetHandleSize(h));
            EXPECT_EQ(0, std::memcmp(*h, "xxxxxxxxxxxxxxxxxxxx", 20));
        }
        MgErr err = DSCopyHandle(&copy, h);
        EXPECT_EQ(copy ? kNoErr : kMemFullErr, err);
        EXPECT_EQ(1, IsDSHandle(h));
        DSDisposeHandle(copy);
        DSDisposeHandle(h);
    });
    EXPECT_GT(runs, 6);
}

TEST(MemoryFull, LeavesJarsAsTheyWere) {
    int runs = FailAtEveryAllocation([] {
        MagicCookieJar jar = MCNewJar();
        if (!jar) return;
        int32 made = 0, count = -1;
        for (uintptr_t i = 0; i < 300; ++i) {
            MagicCookie cookie = MCNewCookie(jar, &i);
            uintptr_t info = 0;
            if (cookie == 0) continue;
            ++made;
            EXPECT_EQ(kNoErr, MCGetCookieInfo(jar, cookie, &info));
            EXPECT_EQ(i, info);
        }
        EXPECT_GE(made, 299);
        MCJarSize(jar, &count);
        EXPECT_EQ(made, count);
        UHandle list = nullptr;
        MgErr err = MCGetCookieList(jar, &list);
        EXPECT_EQ(list ? kNoErr : kMemFullErr, err);
        DSDisposeHandle(list);
        MCDisposeJar(jar);
    });
    EXPECT_GT(runs, 9);
}

struct TrackedThing : TrackedObject {
    int value = 5;
};

TEST(MemoryFull, IsToldByTrackedAllocation) {
    int runs = FailAtEveryAllocation([] {
        void* plain = TrackedMalloc(100);
        TrackedFree(plain);
        std::unique_ptr<TrackedThing> thing(new (std::nothrow) TrackedThing);
        try {
            std::vector<int, TrackedAllocator<int>> numbers(1000, 7);
            EXPECT_EQ(7, numbers[999]);
        } catch (const std::bad_alloc& e) {
            EXPECT_STREQ("bad allocation", e.what());
        }
    });
    EXPECT_GT(runs, 3);
}

TEST(MemoryFull, PreventsTheStart) {
    uint64 before = heap::TotalAllocated();
    for (int n = 1; n <= 5; ++n) {
        test::FailingAllocator failing(n);
        EXPECT_EQ(kMemFullErr, MemoryManagerStart());
        EXPECT_FALSE(GetMemoryManagerInitialized());
        EXPECT_EQ(before, heap::TotalAllocated());
    }
}

TEST(TrackedAllocation, IsReportedWhenItLeaks) {
    test::StartedMemory memory;
    EXPECT_THROW(TrackedNew(SIZE_MAX - 100), std::bad_alloc);
    EXPECT_EQ(nullptr, TrackedMalloc(SIZE_MAX));
    EXPECT_EQ(nullptr, TrackedNewNoThrow(SIZE_MAX / 2));
    void* none = TrackedNew(0);
    void* other = TrackedNew(0);
    EXPECT_TRUE(none && other && none != other);
    TrackedFree(nullptr);
    TrackedMallocDumpTracker();
    TrackedMallocResetTracker();
    TrackedFree(other);
    auto* left = new TrackedThing;
    memory.Stop();
    EXPECT_TRUE(memory.reports.Has(kDebugInfo,
                                   "Total new/delete leaks -- 330 is arbitrary to avoid known reported leaks. = 2.\n"));
    EXPECT_THAT(memory.reports.Texts(kDebugInfo), Contains(EndsWith("(1) : 1 new/delete leaks (0 expected)")));
    delete left;
    TrackedFree(none);
}

// Calls every operation that makes something; the frames of all lie in this function.
__attribute__((noinline)) void MakeOneOfEach(std::vector<UHandle>& handles, std::vector<void*>& blocks) {
    UHandle some = nullptr, copy = nullptr;
    for (auto make : {DSNewHandle, DSNewHClr, AZNewHandle, AZNewHClr}) handles.push_back(make(8));
    for (auto make : {DSNewAlignedHandle, DSNewAlignedHClr}) handles.push_back(make(8, 16, 0));
    for (auto make :
         {DSSetHandleSizeOrNewHandle, DSSetHSzOrNewHClr, DataSetHandleSizeOrNewHandle, DataSetHSzOrNewHClr}) {
        UHandle h = nullptr;
        make(&h, 8);
        handles.push_back(h);
    }
    for (auto make : {DSPtrToHand, AZPtrToHand}) {
        make("12345678", &some, 8);
        handles.push_back(some);
    }
    for (auto make : {DSSetHandleFromPtr, AZSetHandleFromPtr, DSSetHandleFromPtrNULLMeansEmpty}) {
        UHandle h = nullptr;
        make(&h, "12345678", 8);
        handles.push_back(h);
    }
    for (auto make : {DSHandToHand, AZHandToHand}) {
        make(&some);
        handles.push_back(some);
    }
    for (auto make : {DSCopyHandle, AZCopyHandle}) {
        copy = nullptr;
        make(&copy, some);
        handles.push_back(copy);
    }
    for (auto make : {DSNewPtr, DSNewPClr, AZNewPtr, AZNewPClr}) blocks.push_back(make(8));
    blocks.push_back(TrackedMalloc(8));
    blocks.push_back(TrackedNew(8));
    blocks.push_back(TrackedNewNoThrow(8));
    asm volatile("");
}

// Of each record in a leak report, whether its call stack begins in the function above.
std::vector<bool> StacksThatBeginThere(const std::string& report) {
    const auto begin = reinterpret_cast<uintptr_t>(&MakeOneOfEach);
    std::vector<bool> results;
    for (size_t at = report.find("\nMemory Contents: "); at != std::string::npos;
         at = report.find("\nMemory Contents: ", at)) {
        at = report.find("\n0x", at + 1);
        uintptr_t address = at == std::string::npos ? 0 : std::stoull(report.substr(at + 3), nullptr, 16);
        results.push_back(address > begin && address < begin + 16384);
    }
    return results;
}

TEST(LeakReports, BeginWithTheCallerOfTheLibrary) {
    test::ScratchDrive drive;
    setenv("TMPDIR", drive.Native().c_str(), 1);
    test::StartedMemory memory;
    MemResetTracker();
    std::vector<UHandle> handles;
    std::vector<void*> blocks;
    MakeOneOfEach(handles, blocks);
    MemDumpTracker();
    for (UHandle h : handles) EXPECT_EQ(kNoErr, DSDisposeHandle(h));
    for (size_t i = 0; i < 4; ++i) DSDisposePtr(blocks[i]);
    memory.Stop();
    unsetenv("TMPDIR");
    EXPECT_EQ(std::vector<bool>(handles.size(), true), StacksThatBeginThere(drive.Get("ovHandleLeaks.txt")));
    EXPECT_EQ(std::vector<bool>(4, true), StacksThatBeginThere(drive.Get("ovPointerLeaks.txt")));
    EXPECT_EQ(std::vector<bool>(3, true), StacksThatBeginThere(drive.Get("ovnewdelleaks.txt")));
    for (size_t i = 4; i < blocks.size(); ++i) TrackedFree(blocks[i]);
}

TEST(ScopedTracking, ReportsWhatIsLeft) {
    test::StartedMemory memory;
    StopScopedAllocationTracking();
    UHandle before = DSNewHandle(1);
    StartScopedAllocationTracking();
    StartScopedAllocationTracking();
    constexpr char kMisuse[] = "Recursive or multithreaded tracking not supported!";
    EXPECT_THAT(memory.reports.Texts(kDebugError), ElementsAre(kMisuse, kMisuse));
    memory.reports.Clear();
    DSDisposeHandle(DSNewHandle(7));
    DSDisposePtr(DSNewPtr(7));
    DSDisposeHandle(before);
    UHandle left = DSNewHandle(21);
    UPtr leftPtr = DSNewPtr(22);
    StopScopedAllocationTracking();
    auto texts = memory.reports.Texts(kDebugInfo);
    ASSERT_FALSE(texts.empty());
    EXPECT_EQ("Leftover allocations: 2", texts[0]);
    EXPECT_THAT(texts, Contains("21 bytes"));
    EXPECT_THAT(texts, Contains("22 bytes"));
    EXPECT_THAT(texts, Contains(HasSubstr(" - ")));
    memory.reports.Clear();
    DSDisposeHandle(left);
    DSDisposePtr(leftPtr);
    StartScopedAllocationTracking();
    StopScopedAllocationTracking();
    EXPECT_THAT(memory.reports.Texts(), IsEmpty());
}

// Counts and contents are exact while others create, resize, check and dispose, and walks go on.
TEST(MemoryThreads, DoNotDisturbEachOther) {
    constexpr uint32 kThreads = 8, kRounds = 1500, kHandles = 40;
    test::StartedMemory memory;
    uint64 before = heap::TotalAllocated();
    const uint32 zeros[4] = {};
    DSSetCounters(zeros);
    std::atomic<int> wrong{0};
    auto work = [&](uint32 seed) {
        UHandle handles[kHandles] = {};
        for (uint32 i = 0; i < kRounds; ++i) {
            UHandle& h = handles[(i * 7 + seed) % kHandles];
            if (h) {
                if (DSCheckHandle(h) != kNoErr || **h != static_cast<uint8>(seed)) ++wrong;
                if (DSSetHandleSize(h, i % 500 + 1) != kNoErr || **h != static_cast<uint8>(seed)) ++wrong;
                if (DSDisposeHandle(h) != kNoErr) ++wrong;
                h = nullptr;
            } else {
                h = DSNewHandle(i % 300 + 1);
                **h = static_cast<uint8>(seed);
                DSDisposePtr(DSNewPtr(i % 100));
            }
            if (i % 500 == 0) {
                uint32 words[3];
                if (DSMemStatsSlow(words) != kNoErr || DSHeapCheck(0) != kNoErr) ++wrong;
            }
        }
        for (UHandle h : handles) DSDisposeHandle(h);
    };
    std::vector<std::thread> threads;
    for (uint32 i = 0; i < kThreads; ++i) threads.emplace_back(work, i);
    for (std::thread& thread : threads) thread.join();
    EXPECT_EQ(0, wrong);
    EXPECT_EQ(before, heap::TotalAllocated());
    uint32 counters[4];
    DSReadCounters(counters);
    // Each of the slots a thread uses is filled and emptied in turn.
    uint32 resizes = counters[2], creations = counters[0];
    EXPECT_EQ(kThreads * kRounds, creations + resizes);
    EXPECT_GE(counters[1], creations);  // and those of the checks
    EXPECT_THAT(memory.reports.Texts(kDebugError), IsEmpty());
    EXPECT_THAT(memory.reports.Texts(kDebugFatal), IsEmpty());
}

// ---- block utilities ------------------------------------------------------------------------------------------------

int checks;

TEST(MemoryUtil, MovesComparesAndSwaps) {
    char text[] = "0123456789abcdefghij";
    checks = 0;
    SetMemoryCheckCallback([](int32 zero) { checks += zero == 0 ? 1 : 100; });
    MoveBlock(text, text + 1, 9);  // overlapping, source first
    EXPECT_STREQ("0012345678abcdefghij", text);
    MoveBlock(text + 3, text, 4);
    EXPECT_STREQ("2345345678abcdefghij", text);
    MoveBlock(text, text + 5, 0);
    ClearMem(text + 19, 1);
    EXPECT_STREQ("2345345678abcdefghi", text);
    SetMemoryCheckCallback(nullptr);
    ClearMem(text, 0);
    EXPECT_EQ(3, checks);
    SwapBlock(text + 1, text + 10, 9);
    EXPECT_STREQ("2abcdefghi345345678", text);
    EXPECT_EQ('3' - 'a', BlockCmp("xx3y", "xxaz", 4));
    EXPECT_EQ(0x80 - 0x7F, BlockCmp("\x80", "\x7F", 1));
    EXPECT_EQ(0, BlockCmp("xx3y", "xxaz", 2));
}

}  // namespace
}  // namespace tessel
