#include "diagnostics/AllocTracking.h"
#include "memory/Heap.h"
#include "support/StartedMemory.h"
#include "support/Test.h"
#include <tessel/base/MGPlacementNew.h>
#include <tessel/memory/MemoryManager.h>

namespace tessel::test {
namespace {

struct Tracking {
    explicit Tracking(bool on) { SetAllocTracking(on); }
    ~Tracking() { SetAllocTracking(true); }
};

// Handles that are tracked, and those that go the short ways.
struct Handles : ::testing::TestWithParam<bool> {
    Tracking tracking{GetParam()};
    test::StartedMemory memory;
};
INSTANTIATE_TEST_SUITE_P(Tracked, Handles, ::testing::Bool());

std::string Content(UHandle h) {
    return std::string(reinterpret_cast<const char*>(*h), DSGetHandleSize(h));
}

UHandle Make(const std::string& text) {
    UHandle h = nullptr;
    EXPECT_EQ(kNoErr, DSPtrToHand(text.data(), &h, static_cast<uint32>(text.size())));
    return h;
}

bool IsAligned(UHandle h, uint32 alignment, uint32 offset) {
    return (reinterpret_cast<uintptr_t>(*h) + offset) % alignment == 0;
}

TEST_P(Handles, AreAlignedByTheirSize) {
    struct Case {
        uint32 size, alignment, offset;
    };
    const Case cases[] = {{0, 8, 0},        {1, 8, 0},          {4, 8, 4},          {8, 8, 8},         {1020, 8, 4},
                          {1023, 8, 0},     {1024, 16, 8},      {1025, 16, 0},      {1028, 16, 4},     {1048572, 16, 4},
                          {1048575, 16, 0}, {1048576, 4096, 8}, {1048577, 4096, 0}, {1048580, 4096, 4}};
    for (const Case& c : cases) {
        const uint64 before = heap::TotalAllocated();
        UHandle h = DSNewHClr(c.size);
        ASSERT_TRUE(h && *h) << c.size;
        EXPECT_EQ(c.size, DSGetHandleSize(h));
        EXPECT_TRUE(IsAligned(h, c.alignment, c.offset)) << c.size;
        EXPECT_EACH(std::string(c.size, '\0') == Content(h), DSDisposeHandle(h) == kNoErr,
                    heap::TotalAllocated() == before, DSDisposeHandle(h) == kHandleErr);
    }
}

// A step that is large for the size places the data by the size; small steps rarely move them.
TEST_P(Handles, GrowInSmallStepsWithoutMovingEachTime) {
    UHandle h = DSNewHandle(4096);
    uint32 moves = 0;
    for (uint32 size = 4097; size <= 300000; ++size) {
        const UPtr before = *h;
        ASSERT_EQ(kNoErr, DSSetHandleSize(h, size));
        (*h)[size - 1] = static_cast<uint8>(size * 7);
        moves += *h != before;
    }
    EXPECT_LT(moves, 10000u);
    for (uint32 i = 4096; i < 300000; ++i) ASSERT_EQ(static_cast<uint8>((i + 1) * 7), (*h)[i]) << i;
    for (uint32 size : {400004u, 300001u, 310008u}) {
        ASSERT_EQ(kNoErr, DSSetHandleSize(h, size));
        EXPECT_TRUE(IsAligned(h, 16, size & 4 ? 4 : size & 1 ? 0 : 8)) << size;
    }
    EXPECT_EQ(kNoErr, DSDisposeHandle(h));
}

TEST_P(Handles, KeepTheirBytesAndAlignmentThroughResizes) {
    std::mt19937 random(1);
    const uint32 sizes[] = {0, 3, 17, 100, 1000, 5000, 70000, 300000};
    for (uint32 alignment : {0u, 8u, 9u, 64u, 100u, 4096u}) {
        uint32 effective = alignment <= 8 ? 8 : alignment == 9 ? 16 : alignment == 100 ? 128 : alignment;
        uint32 offset = random() % 40;
        std::string model = "some text to begin with";
        UHandle h = Make(model);
        for (int i = 0; i < 60; ++i) {
            uint32 size = sizes[random() % 8] + random() % 20;
            bool clear = random() % 2;
            auto resize = clear ? DSSetAlignedHSzClr : DSSetAlignedHandleSize;
            ASSERT_EQ(kNoErr, resize(h, size, alignment, offset));
            ASSERT_TRUE(IsAligned(h, effective, (offset + 3) / 4 * 4));
            size_t kept = std::min<size_t>(model.size(), size);
            std::string now = Content(h);
            ASSERT_EQ(model.substr(0, kept), now.substr(0, kept));
            ASSERT_TRUE(!clear || now.substr(kept) == std::string(size - kept, '\0'));
            for (size_t at = kept; at < size; ++at) (*h)[at] = static_cast<uint8>(random());
            model = Content(h);
        }
        DSDisposeHandle(h);
    }
}

TEST_P(Handles, MoveOnlyWhenTheyMust) {
    uint32 counters[4] = {0, 0, 0, 0};
    UHandle h = DSNewHandle(17);
    UPtr data = *h;
    DSSetCounters(counters);
    EXPECT_EQ(kNoErr, DSSetHandleSize(h, 17));  // nothing changes
    EXPECT_EQ(kNoErr, DSSetHandleSize(h, 18));  // the same heap size
    EXPECT_EQ(data, *h);
    EXPECT_EACH(DSSetHandleSize(h, 0xFFFFFFFF) == kMemFullErr, DSGetHandleSize(h) == 18u);
    DSReadCounters(counters);
    EXPECT_THAT(counters, ElementsAre(0, 0, 3, 0));

    ASSERT_EQ(kNoErr, DSSetHandleSize(h, 100));
    data = *h;
    ASSERT_EQ(kNoErr, DSSetHandleSize(h, 104));  // another alignment offset
    EXPECT_NE(data, *h);
    UHandle eights = DSNewHandle(64);
    data = *eights;
    ASSERT_EQ(kNoErr, DSSetHandleSize(eights, 64));
    EXPECT_EQ(data, *eights);

    DSReadCounters(counters);
    SetStressHandles(true);
    uint32 moves = counters[3];
    for (uint32 size : {105u, 104u, 3000u}) {
        data = *h;
        EXPECT_EACH(DSSetHandleSize(h, size) == kNoErr, data != *h);
    }
    data = *h;
    EXPECT_EACH(DSSetHandleSize(h, 3000) == kNoErr, data == *h);
    SetStressHandles(false);
    DSReadCounters(counters);
    EXPECT_EQ(moves, counters[3]);
    DSDisposeHandle(h);
    DSDisposeHandle(eights);
}

TEST_P(Handles, AreRecognised) {
    const uint64 before = heap::TotalAllocated();
    UHandle first = DSNewHandle(1), second = DSNewHandle(2);
    EXPECT_EACH(IsDSHandle(first) == 1, DSDisposeHandle(first) == kNoErr, DSDisposeHandle(second) == kNoErr,
                before == heap::TotalAllocated());
    EXPECT_EQ(0, IsDSHandle(first));  // a free slot
    EXPECT_EQ(kHandleErr, DSCheckHandle(first));
    EXPECT_EQ(second, DSNewHandle(5));  // last freed, first reused
    EXPECT_EQ(first, DSNewHandle(5));

    UPtr looksAlive = *first;
    UHandle odd = reinterpret_cast<UHandle>(reinterpret_cast<uintptr_t>(first) + 1);
    for (UHandle none : {static_cast<UHandle>(nullptr), &looksAlive, odd, reinterpret_cast<UHandle>(16)}) {
        EXPECT_EACH(IsDSHandle(none) == 0, DSCheckHandle(none) == kHandleErr, DSGetHandleSize(none) == 0u,
                    DSSetHandleSize(none, 3) == kHandleErr, AZHLock(none) == kHandleErr);
        AZHPurge(none);
        EXPECT_EQ(none ? kHandleErr : kNoErr, DSDisposeHandle(none));
    }
    EXPECT_EQ(8u, memory.reports.CountAt(kDebugFatal));  // size query and resize of each
    EXPECT_TRUE(memory.reports.Has(kDebugWarning, "Memory error 3 in DSSetHandleSize"));
    EXPECT_EACH(memory.reports.Has(kDebugWarning, "Memory error 3 in DSDisposeHandle"),
                memory.reports.Has(kDebugWarning, "Memory error 3 in AZHLock"),
                memory.reports.Has(kDebugWarning, "Memory error 3 in AZHPurge"), AZHUnlock(first) == kNoErr,
                AZHGetState(first) == 0);

    DSSetHandleChecking(1);  // a size query now believes what looks alive, a resize does not
    EXPECT_EACH(DSGetHandleSize(&looksAlive) == 5u, DSSetHandleSize(&looksAlive, 6) == kHandleErr);
    DSSetHandleChecking(0);
    EXPECT_EQ(kNoErr, DSSetHandleSize(&looksAlive, 5));
    DSSetHandleChecking(7);
    EXPECT_EQ(0u, DSGetHandleSize(&looksAlive));
    DSDisposeHandle(first);
    DSDisposeHandle(second);
}

TEST_P(Handles, AreMadeResizedAndDroppedThroughTheirAddress) {
    UHandle h = nullptr;
    EXPECT_EACH(
        DataSetHandleSizeOrNewHandle(&h, 0) == kNoErr, h == nullptr, DataSetHSzOrNewHClr(&h, 3) == kNoErr,
        std::string(3, '\0') == Content(h), DSSetHSzOrNewHClr(&h, 5) == kNoErr, std::string(5, '\0') == Content(h),
        DataSetHandleSizeOrNewHandle(&h, 0) == kNoErr, h == nullptr, DSSetHandleSizeOrNewHandle(&h, 0) == kNoErr,
        Content(h) == "", DSSetHandleFromPtrNULLMeansEmpty(&h, "abc", 3) == kNoErr, Content(h) == "abc",
        DSSetHandleFromPtrNULLMeansEmpty(&h, "abc", 0) == kNoErr, h == nullptr, DSSetHandleFromPtr(&h, "", 0) == kNoErr,
        DSDisposeHandleAndNull(&h) == kNoErr, h == nullptr, DSDisposeHandleAndNull(&h) == kNoErr,
        DSDisposeHandleAndNull(nullptr) == kNoErr, DSDisposePtr(nullptr) == kArgErr);
    EXPECT_THAT(memory.reports.Texts(), ElementsAre("Memory error 1 in DSDisposePtr"));
}

TEST_P(Handles, AreCopiedAndAppended) {
    UHandle source = Make("source"), copy = nullptr;
    EXPECT_EACH(DSCopyHandle(&copy, source) == kNoErr, Content(copy) == "source", DSPtrToXHand("xy", copy, 2) == kNoErr,
                Content(copy) == "xy", DSCopyHandle(&copy, source) == kNoErr, DSPtrAndHand(" and", copy, 4) == kNoErr,
                DSHandAndHand(source, copy) == kNoErr, Content(copy) == "source andsource",
                DSHandAndHand(source, source) == kNoErr, Content(source) == "sourcesource",
                DSPtrAndHand(nullptr, source, 1) == kArgErr, DSPtrToXHand(nullptr, source, 1) == kArgErr,
                DSSetHandleFromPtr(&source, nullptr, 1) == kArgErr, Content(source) == "sourcesource");
    UHandle other = source;
    EXPECT_EACH(DSHandToHand(&other) == kNoErr, source != other, Content(other) == "sourcesource",
                DSSwapHandles(copy, other) == kNoErr, Content(other) == "source andsource",
                other == DSRecoverHandle(*other));
    EXPECT_THAT(memory.reports.Texts(), IsEmpty());

    EXPECT_EACH(DSCopyHandle(&copy, copy) == kNoErr,
                memory.reports.Has(kDebugWarning, "Should call DSHandToHand. This is a no-op"),
                DSRecoverHandle(*other + 1) == nullptr,
                memory.reports.Has(kDebugFatal, "Pointer passed to BRecoverHandle not linked to master pointer!"),
                DSSwapHandles(copy, copy) == kNoErr, memory.reports.CountAt(kDebugFatal) == 2u,
                DSCopyHandle(&copy, nullptr) == kNoErr, copy == nullptr);
    DSDisposeHandle(source);
    DSDisposeHandle(other);
}

// ---- procedures -----------------------------------------------------------------------------------------------------

std::vector<std::string> calls;

void TraceCall(int32 kind, MgErr err, UHandle h, uint32 newSize, uint32 oldSize) {
    calls.push_back(std::to_string(kind) + ' ' + std::to_string(err) + (h ? " h " : " null ") +
                    std::to_string(newSize) + ' ' + std::to_string(oldSize));
}

TEST_P(Handles, AreTracedAndTellWhenMemoryIsFull) {
    calls.clear();
    SetMemEventTraceProc(TraceCall);
    EXPECT_EQ(nullptr, SetMemFullProc([](uint32 size) { calls.push_back("full " + std::to_string(size)); }));
    UHandle h = DSNewHandle(10);
    DSSetHandleSize(h, 12);
    DSSetHandleSize(h, 12);
    DSSetHandleSize(h, 0xFFFFFFFE);
    EXPECT_EACH(DSPtrAndHand("", h, 0xFFFFFFFD) == kMemFullErr, DSNewHandle(0xFFFFFFFF) == nullptr);
    DSDisposeHandle(h);
    SetMemEventTraceProc(nullptr);
    CallSetMemFullProc(5);
    EXPECT_THAT(calls, ElementsAre("0 0 h 10 0", "1 0 h 12 10", "1 0 h 12 12", "full 4294967294", "1 2 h 4294967294 12",
                                   "full 4294967295", "1 2 h 4294967295 12", "full 4294967295", "0 2 null 4294967295 0",
                                   "2 0 h 12 0", "full 5"));
    memory.Stop();
    EXPECT_EQ(nullptr, SetMemFullProc(nullptr));  // the stop removed it
}

TEST_P(Handles, AreRecoveredAtTheStop) {
    Make("twelve bytes");
    DSDisposeHandle(Make("gone"));
    Make("abc");
    int ended = 0;
    struct Singleton {
        int& count;
        ~Singleton() { ++count; }
    };
    alignas(Singleton) char place[sizeof(Singleton)];
    MGPlacementNewRegisterDeletor(new MGPlacementDelete<Singleton>(new (place) Singleton{ended}));
    EXPECT_TRUE(GetMemoryManagerInitialized());
    memory.Stop();
    EXPECT_EACH(!GetMemoryManagerInitialized(), ended == 1);
    EXPECT_THAT(memory.reports.Texts(),
                ::testing::Contains(::testing::EndsWith("2 Handle Leaks (0 expected)")).Times(GetParam()));
    EXPECT_TRUE(memory.reports.Has(kDebugInfo, "Recovered 2 Handles for 15 bytes."));
    EXPECT_THAT(memory.reports.Texts(), ::testing::Contains(::testing::EndsWith(", size 3 still allocated.")));
}

}  // namespace
}  // namespace tessel::test
