// What happens when memory runs out at any point, when threads meet, and when something is left.
#include "memory/Heap.h"
#include "memory/Service.h"
#include "support/FailingAllocator.h"
#include "support/ScratchDrive.h"
#include "support/StartedMemory.h"
#include "support/Test.h"
#include <tessel/memory/CookieManager.h>
#include <tessel/memory/MemoryManager.h>
#include <tessel/memory/MemoryUtil.h>
#include <tessel/memory/ScopedAllocationTracking.h>
#include <tessel/memory/TrackedMallocFree.h>
#include <tessel/sync/ThEvent.h>
#include <tessel/sync/ThMutex.h>

#include <malloc.h>

namespace tessel {

namespace test {
void MakeAndDisposeWithoutFrames(unsigned rounds);
}

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
            EXPECT_EACH((err == kNoErr ? size : old) == DSGetHandleSize(h),
                        std::memcmp(*h, "xxxxxxxxxxxxxxxxxxxx", 20) == 0);
        }
        MgErr err = DSCopyHandle(&copy, h);
        EXPECT_EACH((copy ? kNoErr : kMemFullErr) == err, IsDSHandle(h) == 1);
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
            EXPECT_EACH(MCGetCookieInfo(jar, cookie, &info) == kNoErr, i == info);
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

MagicCookieJar fullJar;
std::vector<MagicCookie> inFullJar;

// Memory is asked for by whoever wants a cookie, and the host may make room in the jar itself.
TEST(MemoryFull, IsToldWithoutTheLockOfTheJar) {
    test::StartedMemory memory;
    fullJar = MCNewJar();
    for (int i = 0; i < 64; ++i) inFullJar.push_back(MCNewCookie(fullJar, nullptr));
    SetMemFullProc([](uint32) {
        EXPECT_EQ(kNoErr, MCDisposeCookie(fullJar, inFullJar.back(), nullptr));
        inFullJar.pop_back();
    });
    test::FailingAllocator failing(1);
    EXPECT_EACH(MCNewCookie(fullJar, nullptr) == 0u, inFullJar.size() == 63u);
    MCDisposeJar(fullJar);
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

TEST(TrackedAllocation, IsReportedWhenItLeaks) {
    test::StartedMemory memory;
    EXPECT_THROW(TrackedNew(SIZE_MAX - 100), std::bad_alloc);
    EXPECT_EACH(TrackedMalloc(SIZE_MAX) == nullptr, TrackedNewNoThrow(SIZE_MAX / 2) == nullptr);
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
__attribute__((noinline)) void MakeOneOfEach(std::vector<UHandle>& handles, std::vector<void*>& blocks,
                                             ThMutex (&mutexes)[2], ThEvent (&events)[2]) {
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
    for (ThMutex& mutex : mutexes) ThMutexCreate(&mutex, "");
    ThEventCreate(&events[0], 0, false);
    ThEventCreateWithCustomSignal(&events[1], 0, false, nullptr);
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

TEST(LeakReports, BearDamagedHandlesAndThoseThatGoMeanwhile) {
    test::ScratchDrive drive;
    setenv("TMPDIR", drive.Native().c_str(), 1);
    test::StartedMemory memory;
    UHandle const h = DSNewHandle(8);
    const UPtr data = *h;
    for (uintptr_t bad : {uintptr_t{2}, uintptr_t{0x1000}, ~uintptr_t{1}}) {
        *h = reinterpret_cast<UPtr>(bad);
        MemDumpTracker();
        EXPECT_NE(std::string::npos, drive.Get("ovHandleLeaks.txt").find("\nMemory Contents: \n"));
    }
    *h = data;
    std::atomic<bool> done{false};
    std::thread maker([&] {
        for (int round = 0; round < 40; ++round) {
            UHandle handles[64];
            for (UHandle& each : handles) each = DSNewHandle(1 << 20);
            for (UHandle each : handles) DSDisposeHandle(each);
        }
        done = true;
    });
    while (!done) MemDumpTracker();
    maker.join();
    EXPECT_EQ(kNoErr, DSDisposeHandle(h));
    unsetenv("TMPDIR");
}

TEST(LeakReports, CallsWithoutFramesTakeNoMemory) {
    test::StartedMemory memory;
    test::MakeAndDisposeWithoutFrames(1000);
    const size_t before = mallinfo2().uordblks;
    test::MakeAndDisposeWithoutFrames(100000);
    EXPECT_LT(mallinfo2().uordblks, before + (64 << 10));
}

TEST(LeakReports, BeginWithTheCallerOfTheLibrary) {
    test::ScratchDrive drive;
    setenv("TMPDIR", drive.Native().c_str(), 1);
    test::StartedMemory memory;
    MemResetTracker();
    std::vector<UHandle> handles;
    std::vector<void*> blocks;
    ThMutex mutexes[2];
    ThEvent events[2];
    MakeOneOfEach(handles, blocks, mutexes, events);
    MemDumpTracker();
    for (UHandle h : handles) EXPECT_EQ(kNoErr, DSDisposeHandle(h));
    for (size_t i = 0; i < 4; ++i) DSDisposePtr(blocks[i]);
    memory.Stop();
    unsetenv("TMPDIR");
    EXPECT_EACH(std::vector<bool>(handles.size(), true) == StacksThatBeginThere(drive.Get("ovHandleLeaks.txt")),
                std::vector<bool>(4, true) == StacksThatBeginThere(drive.Get("ovPointerLeaks.txt")),
                std::vector<bool>(3, true) == StacksThatBeginThere(drive.Get("ovnewdelleaks.txt")),
                std::vector<bool>(2, true) == StacksThatBeginThere(drive.Get("ovMutexLeaks.txt")));
    const std::vector<bool> forEvents = StacksThatBeginThere(drive.Get("ovEventLeaks.txt"));
    EXPECT_EQ(2, std::count(forEvents.begin(), forEvents.end(), true)) << "the others are those of the mutexes";
    for (size_t i = 4; i < blocks.size(); ++i) TrackedFree(blocks[i]);
    for (ThMutex mutex : mutexes) ThMutexDestroy(mutex);
    for (ThEvent event : events) ThEventDestroy(event);
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

// What a thread does with its own handles, tracked blocks and cookies of a jar that all share.
class Worker {
public:
    Worker(uint32 seed, MagicCookieJar jar) : seed_(seed), jar_(jar) {}

    // The number of results that were wrong.
    int Run(uint32 rounds) {
        for (uint32 i = 0; i < rounds; ++i) {
            Slot& slot = slots_[(i * 7 + seed_) % kSlots];
            if (slot.handle)
                Empty(slot, i);
            else
                Fill(slot, i);
            if (i % 500 == 0) {
                uint32 words[3];
                Expect(DSMemStatsSlow(words) == kNoErr && DSHeapCheck(0) == kNoErr);
            }
        }
        for (Slot& slot : slots_)
            if (slot.handle) Empty(slot, 1);
        return wrong_;
    }

private:
    static constexpr uint32 kSlots = 40;
    struct Slot {
        UHandle handle = nullptr;
        uint8* block = nullptr;
        MagicCookie cookie = 0;
    };

    void Fill(Slot& slot, uint32 i) {
        slot.handle = DSNewHandle(i % 300 + 1);
        **slot.handle = static_cast<uint8>(seed_);
        DSDisposePtr(DSNewPtr(i % 100));
        slot.block = static_cast<uint8*>(TrackedMalloc(i % 70 + 1));
        *slot.block = static_cast<uint8>(i);
        void* info = slot.block;
        slot.cookie = MCNewCookie(jar_, &info);
        Expect(slot.cookie != 0);
    }
    void Empty(Slot& slot, uint32 i) {
        Expect(DSCheckHandle(slot.handle) == kNoErr && **slot.handle == static_cast<uint8>(seed_));
        Expect(DSSetHandleSize(slot.handle, i % 500 + 1) == kNoErr && **slot.handle == static_cast<uint8>(seed_));
        Expect(DSDisposeHandle(slot.handle) == kNoErr);
        void* info = nullptr;
        Expect(MCGetCookieInfo(jar_, slot.cookie, &info) == kNoErr && info == slot.block);
        Expect(MCDisposeCookie(jar_, slot.cookie, nullptr) == kNoErr);
        Expect(MCGetCookieInfo(jar_, slot.cookie, &info) == kArgErr);
        TrackedFree(slot.block);
        slot = Slot();
    }
    void Expect(bool right) { wrong_ += !right; }

    uint32 seed_;
    MagicCookieJar jar_;
    Slot slots_[kSlots];
    int wrong_ = 0;
};

// Counts and contents are exact while others create, resize, check and dispose, and walks go on.
// TESSEL_TEST_MEMORY_ROUNDS: how often each thread does so (1,500).
TEST(MemoryThreads, DoNotDisturbEachOther) {
    constexpr uint32 kThreads = 8;
    const char* wanted = std::getenv("TESSEL_TEST_MEMORY_ROUNDS");
    const uint32 rounds = wanted ? static_cast<uint32>(std::atoi(wanted)) : 1500;
    test::StartedMemory memory;
    uint64 before = heap::TotalAllocated();
    MagicCookieJar jar = MCNewJar();
    const uint32 zeros[4] = {};
    DSSetCounters(zeros);
    std::atomic<int> wrong{0};
    test::InThreads(kThreads, [&](int thread) { wrong += Worker(static_cast<uint32>(thread), jar).Run(rounds); });
    EXPECT_EQ(0, wrong);
    int32 cookies = -1;
    EXPECT_EACH(MCJarSize(jar, &cookies) == kNoErr, cookies == 0);
    uint32 counters[4];
    DSReadCounters(counters);
    // Each handle is resized once, and each round fills a slot or empties one; then the rest is emptied.
    EXPECT_EACH(counters[0] == counters[2], counters[0] >= kThreads * rounds / 2,
                counters[0] <= kThreads * rounds / 2 + kThreads * 40);
    EXPECT_GE(counters[1], counters[0]);  // and those of the checks and the jar
    MCDisposeJar(jar);
    EXPECT_EQ(before, heap::TotalAllocated());
    memory.Stop();
    for (const char* none : {"Total Handle Leaks = 0.\n", "Total Pointer Leaks = 0.\n", "Total new/delete leaks = 0.\n",
                             "Recovered 0 Handles for 0 bytes."})
        EXPECT_TRUE(memory.reports.Has(kDebugInfo, none)) << none;
    EXPECT_EQ(0u, memory.reports.CountAt(kDebugError) + memory.reports.CountAt(kDebugFatal));
}

// ---- misuse ---------------------------------------------------------------------------------------------------------

TEST(StaleHandle, IsRefusedByEveryOperationAndItsTracesAreFound) {
    test::StartedMemory memory;
    UHandle next = DSNewHandle(8), stale = DSNewHandle(8);
    void* foreign = &next;
    DSDisposeHandle(next);
    EXPECT_EQ(kNoErr, DSDisposeHandle(stale));
    for (UHandle bad : {stale, static_cast<UHandle>(foreign)}) {
        UHandle copy = nullptr;
        EXPECT_EACH(DSDisposeHandle(bad) == kHandleErr, DSSetHandleSize(bad, 20) == kHandleErr,
                    DSCopyHandle(&copy, bad) == kHandleErr, copy == nullptr, DSPtrAndHand("x", bad, 1) == kHandleErr,
                    DSHandAndHand(bad, bad) == kHandleErr, DSGetHandleSize(bad) == 0u);
    }
    memory.reports.Clear();
    // A write through the stale handle goes into a free master pointer.
    SetMemoryDebugger(true);
    uint8 saved = **stale;
    **stale = static_cast<uint8>(saved ^ 0x40);
    EXPECT_EQ(kCorruptErr, DSHeapCheck(0));
    **stale = saved;
    SetMemoryDebugger(false);
    EXPECT_THAT(memory.reports.Texts(kDebugFatal), ElementsAre("freemaster chain isn't NULL terminated!"));
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
    EXPECT_EACH(text == "2abcdefghi345345678", '3' - 'a' == BlockCmp("xx3y", "xxaz", 4),
                0x80 - 0x7F == BlockCmp("\x80", "\x7F", 1), BlockCmp("xx3y", "xxaz", 2) == 0);
}

}  // namespace
}  // namespace tessel
