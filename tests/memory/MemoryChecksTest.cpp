#include "memory/GuardBytes.h"
#include "memory/HandleBlock.h"
#include "memory/Heap.h"
#include "memory/MasterPointers.h"
#include "memory/MemorySettings.h"
#include "support/StartedMemory.h"
#include "support/Test.h"
#include <tessel/memory/MemoryManager.h>
#include <tessel/memory/TrackedMallocFree.h>

#include <map>

namespace tessel {

// Plants damage among the free master pointers.
struct MasterPointersTest {
    static int32& FreeCount() { return masterPointers.freeCount_; }
    static int32& BlockCount() { return masterPointers.blockCount_; }
    static UHandle FreeHead() { return masterPointers.freeHead_; }
};

namespace {

using ::testing::Contains;
using ::testing::ElementsAre;
using ::testing::HasSubstr;
using ::testing::StartsWith;

using Variables = std::map<std::string, std::string>;

// Settings from an environment of the test's, taken back at the end. Handles made meanwhile must be gone by then.
class Environment {
public:
    explicit Environment(Variables values) {
        variables = std::move(values);
        TakeMemorySettings([](const char* name) { return variables.count(name) ? variables[name].c_str() : nullptr; });
    }
    ~Environment() {
        TakeMemorySettings([](const char* name) { return std::strcmp(name, "OVHandleCheck") == 0 ? "2" : "off"; });
    }

private:
    static inline Variables variables;
};

uint32 Option(GuardKind kind) {
    return GuardOptions(kind);
}

TEST(MemorySettings, ComeFromTheEnvironment) {
    struct Case {
        Variables variables;
        std::vector<uint32> options;  // handle, pointer, new/delete
        bool allWritten;
        int32 checking;
    };
    const Case cases[] = {
        {{{"OVGuardBytes", "check"}, {"OVHandleCheck", "resize"}}, {7, 7, 7}, true, 1},
        {{{"OVGuardBytes", "alloc"}, {"OVGuardBytes_Ptr", "off"}, {"OVHandleCheck", "none"}}, {3, 0, 3}, false, 0},
        {{{"OVGuardBytes_NewDelete", "check"}, {"OVHandleCheck", ""}}, {0, 0, 7}, false, 0},
        {{{"OVGuardBytes", "CHECK"}, {"OVHandleCheck", "All"}}, {0, 0, 0}, false, 2},
        {{{"OVGuardBytes", "alloc"}, {"OVGuardBytes_Handle", "?"}, {"OVHandleCheck", "1"}}, {0, 3, 3}, false, 1}};
    for (const Case& c : cases) {
        Environment environment(c.variables);
        EXPECT_THAT(c.options, ElementsAre(Option(GuardKind::kHandle), Option(GuardKind::kPointer),
                                           Option(GuardKind::kNewDelete)));
        EXPECT_EACH(c.checking == memorySettings.checking.load(), c.allWritten == ConfigGuardBytes(1));
        for (GuardKind kind : {GuardKind::kHandle, GuardKind::kPointer, GuardKind::kNewDelete})
            EXPECT_EQ((c.options[static_cast<size_t>(kind)] & 3) == 3, ChecksGuards(kind));
        ConfigGuardBytes(0);
        EXPECT_FALSE(ChecksGuards(GuardKind::kHandle) || ChecksGuards(GuardKind::kNewDelete));
    }
}

std::vector<std::string> failures;
void RecordFailure(const void*, int32 kind, const char* version) {
    failures.push_back(std::to_string(kind) + (version ? std::string(" ") + version : ""));
}

TEST(MemoryStop, EndsWellWhateverAHandleWasOverwrittenWith) {
    alignas(16) static char writable[64] = {};
    alignas(16) static const char text[65] = "0123456789abcdef0123456789abcdef0123456789abcdef0123456789abcde";
    void* const mine = std::malloc(40);
    for (const char* guards : {"", "check"}) {
        Environment environment(Variables{{"OVGuardBytes", guards}});
        test::StartedMemory memory;
        UHandle const other = DSNewHandle(5000);
        const uintptr_t contents[] = {0x10,
                                      8,
                                      0x7ffff008,
                                      ~uintptr_t{7},
                                      ~uintptr_t{1},
                                      uintptr_t(mine),
                                      uintptr_t(writable + 24),
                                      uintptr_t(text + 16),
                                      uintptr_t(&mine),
                                      uintptr_t(*other) - 8,
                                      uintptr_t(*other) + 8};
        std::vector<void*> lost;
        for (uintptr_t content : contents) {
            UHandle const h = DSNewHandle(24);
            const UPtr data = *h;
            EXPECT_TRUE(heap::Check()) << content;
            *h = reinterpret_cast<UPtr>(content);
            EXPECT_FALSE(heap::Check()) << content;
            *h = data;
            lost.push_back(HandleLayout().BlockOf(data));
        }
        size_t next = 0;
        masterPointers.ForEachLeft([&](UHandle h) {
            if (h != other) *h = reinterpret_cast<UPtr>(contents[next++]);
        });
        ASSERT_EQ(std::size(contents), next);
        memory.Stop();
        for (void* block : lost) std::free(block);
        EXPECT_TRUE(memory.reports.Has(kDebugInfo, "Recovered 1 Handles for 5000 bytes.")) << guards;
    }
    std::free(mine);
}

TEST(GuardBytes, ShowWhatWasOverwritten) {
    Environment environment(Variables{{"OVGuardBytes", "check"}});
    test::StartedMemory memory;
    GuardByteCheckFailedProc standard = SetGuardByteCheckFailedProc(RecordFailure);
    failures.clear();
    UHandle h = DSNewHandle(16);
    UPtr p = DSNewPtr(16);
    ASSERT_EQ(0, std::memcmp(*h + 16, "ORV13MEM", 8));
    ASSERT_EQ(0, std::memcmp(*h - 8, "ORV13MEM", 8));
    struct Case {
        int at;
        char byte, intact;
        int32 at2;  // a second byte, 0 for none
        std::string failure;
    };
    const Case cases[] = {{16, '!', 'O', 0, "1"}, {23, '!', 'M', 0, "1"}, {-1, '!', 'M', 0, "0"},
                          {-8, '!', 'O', 0, "0"}, {-4, '2', '3', 0, "0"}, {-4, '2', '3', 20, "2 12"}};
    for (UPtr data : {*h, p})
        for (const Case& c : cases) {
            failures.clear();
            data[c.at] = static_cast<uint8>(c.byte);
            if (c.at2) data[c.at2] = static_cast<uint8>(c.byte);
            if (data == p) {
                EXPECT_EACH(DSCheckPtr(p) == kHandleErr, DSCheckPtrGuardBytes(p) == 0, DSDisposePtr(p) == kHandleErr);
            } else {
                EXPECT_EACH(DSSetHandleSize(h, 40) == kHandleErr, DSCheckHandleGuardBytes(h) == 0,
                            DSDisposeHandle(h) == kHandleErr);
            }
            EXPECT_THAT(failures, ElementsAre(c.failure, c.failure, c.failure)) << c.at;
            data[c.at] = static_cast<uint8>(c.intact);
            if (c.at2) data[c.at2] = static_cast<uint8>(c.intact);
        }
    EXPECT_EQ(12u, memory.reports.CountAt(kDebugWarning) - 6);  // resize and disposals: 6 and 12
    EXPECT_EQ(6u, memory.reports.CountAt(kDebugFatal));

    for (uint32 size : {40u, 3u, 2000u, 1500u, 0u, 1048576u, 24u}) {  // the pattern moves with the end
        ASSERT_EQ(kNoErr, DSSetHandleSize(h, size));
        EXPECT_EACH(DSCheckHandle(h) == kNoErr, std::memcmp(*h + size, "ORV13MEM", 8) == 0);
    }
    SetGuardByteCheckFailedProc(standard);
    memory.reports.Clear();
    EXPECT_EACH(DSCheckHandleGuardBytes(nullptr) == 0, DSCheckPtrGuardBytes(nullptr) == 0);
    (*h)[24] = 0;
    EXPECT_EQ(kHandleErr, DSCheckHandle(h));
    (*h)[24] = 'O';
    auto tracked = static_cast<uint8*>(TrackedMalloc(3));
    tracked[-3] = 0;
    TrackedFree(tracked);
    EXPECT_THAT(memory.reports.Texts(kDebugError),
                ElementsAre("NULL handle passed to DSCheckHandleGuardBytes", "NULL ptr passed to CheckGuards",
                            StartsWith("Memory corruption detected:  buffer overrun at pointer 0x"),
                            StartsWith("Memory corruption detected:  buffer underrun at pointer 0x")));
    EXPECT_EQ(nullptr, DSRecoverHandle(p));  // no handle's header lies in front of it
    EXPECT_EQ(kNoErr, DSDisposeHandle(h));
    EXPECT_EACH(DSCheckHandleGuardBytes(h) == 0, DSDisposePtr(p) == kNoErr);

    UHandle ruined = DSNewHandle(16);
    DSSetHandleSize(DSNewHandle(5), 7);
    UPtr block = *ruined - 16;
    std::memset(block, 0x44, 16);  // header and leading guard
    EXPECT_EQ(kHandleErr, DSDisposeHandle(ruined));
    SetDetour(kHandlesTracked, false);
    memory.Stop();
    std::free(block);  // the library left it alone
    EXPECT_EACH(memory.reports.Has(kDebugError, "The heap is corrupt"),
                memory.reports.Has(kDebugInfo, "Recovered 1 Handles for 7 bytes."));
}

uint32 Total() {
    MemStatRec stats;
    EXPECT_EQ(kNoErr, DSMemStats(&stats));
    return stats.totalAllocated;
}

TEST(MemoryStatistics, AreExact) {
    test::StartedMemory memory;
    uint32 before = Total();
    UHandle h = DSNewHandle(64);
    EXPECT_EQ(before + 72, Total());
    DSSetHandleSize(h, 2000);
    EXPECT_EQ(before + 2000 + 8 + (4 + 16 + 8) + 4 + 8, Total());  // rounded up to 16: 2048
    UPtr p = DSNewPtr(100);
    EXPECT_GE(Total(), before + 2148);
    uint32 words[3] = {1, 1, 1};
    EXPECT_EQ(kNoErr, DSMemStatsSlow(words));
    EXPECT_THAT(words, ElementsAre(0, Total(), Total()));
    uint32 outs[12];
    std::fill(outs, outs + 12, 7u);
    EXPECT_EQ(kNoErr, DSMemStats2(&outs[0], &outs[1], nullptr, &outs[3], &outs[4], &outs[5], &outs[6], &outs[7],
                                  &outs[8], &outs[9], &outs[10], &outs[11]));
    EXPECT_THAT(outs, ElementsAre(0, 0, 7, Total(), 0, 0, 0, 0, 0, 0, 0, 0));
    EXPECT_EQ(kNoErr, DSHeapCheck(1));
    EXPECT_THAT(memory.reports.Texts(kDebugInfo),
                ElementsAre("Free: totFreeSize 0, maxFreeSize 0",
                            "Allocated to OV: totAllocSize " + std::to_string(Total()), "Total: totPhysSize 0"));
    DSDisposePtr(p);
    DSDisposeHandle(h);
    EXPECT_EACH(before == Total(), DSMaxMem() == 0);
}

TEST(MasterPointers, GrowByOneBlockAtATime) {
    test::StartedMemory memory;
    constexpr uint32 kFirst = 50000, kBlock = 10000;
    uint32 handleBytes = 8, start = Total();
    std::vector<UHandle> handles;
    auto grow = [&](uint32 count) {
        while (handles.size() < count) handles.push_back(DSNewHandle(0));
        return Total() - start - count * handleBytes;
    };
    EXPECT_EQ(0u, grow(kFirst));
    uint32 block = grow(kFirst + 1);
    EXPECT_EACH(block >= sizeof(MasterPointerBlock), block == grow(kFirst + kBlock),
                2 * block == grow(kFirst + kBlock + 1));
    for (UHandle h : handles) EXPECT_EQ(1, IsDSHandle(h));
    while (!handles.empty()) {
        EXPECT_EQ(kNoErr, DSDisposeHandle(handles.back()));
        handles.pop_back();
    }
    EXPECT_EQ(start + 2 * block, Total());  // blocks stay
}

TEST(MemoryChecks, FindPlantedDamage) {
    test::StartedMemory memory;
    UHandle used = DSNewHandle(8);
    EXPECT_EACH(!MemCheckHeaps(), memory.reports.CountAt(kDebugFatal) == 0u);

    MasterPointersTest::BlockCount() -= 1;
    EXPECT_EQ(kCorruptErr, DSHeapCheck(0));
    MasterPointersTest::BlockCount() += 2;
    EXPECT_EQ(kCorruptErr, DSMemStats(nullptr));
    MasterPointersTest::BlockCount() -= 1;
    EXPECT_THAT(memory.reports.Texts(kDebugFatal),
                ElementsAre("MemCheck error, m.p. block chain error 1", "MemCheck error, m.p. block chain error 2"));
    memory.reports.Clear();
    EXPECT_TRUE(ToggleMemoryDebugging());
    int32 count = MasterPointersTest::FreeCount();
    UPtr link = *MasterPointersTest::FreeHead();
    for (int32 bad : {-1, count - 1, count + 1}) {
        MasterPointersTest::FreeCount() = bad;
        EXPECT_EQ(kCorruptErr, DSHeapCheck(0));
    }
    MasterPointersTest::FreeCount() = count;
    *MasterPointersTest::FreeHead() = reinterpret_cast<UPtr>(uintptr_t{0x41414141});
    DSDisposeHandle(DSNewHandle(1));  // looks before it takes
    *MasterPointersTest::FreeHead() = link;
    EXPECT_EQ(kNoErr, DSHeapCheck(0));
    constexpr char kChain[] = "freemaster chain isn't NULL terminated!";
    EXPECT_THAT(memory.reports.Texts(kDebugFatal), ElementsAre("bad freemaster count", kChain, kChain, kChain));
    EXPECT_FALSE(ToggleMemoryDebugging());
    EXPECT_THAT(memory.reports.Texts(kDebugInfo),
                ElementsAre("turning memory checking on", "turning memory checking off"));
    DSDisposeHandle(used);
}

TEST(MemoryChecks, FindDamagedBlocks) {
    test::StartedMemory memory;
    UPtr p = DSNewPtr(8);
    UHandle h = DSNewHandle(8), aligned = DSNewHandle(2000);
    uint8 saved[16];
    uint32 words[3];
    for (UPtr header : {p - 16, *h - 8, *h - 4, *aligned - 4}) {  // links, size, and the ways back to the block
        std::memcpy(saved, header, 8);
        memory.reports.Clear();
        std::memset(header, 0xEE, 4);
        EXPECT_EACH(DSMemStatsSlow(words) == kNoErr, !heap::Check());
        std::memcpy(header, saved, 8);
        EXPECT_THAT(memory.reports.Texts(kDebugError), ElementsAre("The heap is corrupt", "The heap is corrupt"));
        EXPECT_TRUE(heap::Check());
    }
    std::memset(saved, 0xEE, sizeof saved);
    std::swap_ranges(saved, saved + 16, p - 16);  // as if it were freed memory
    EXPECT_EQ(kHandleErr, DSDisposePtr(p));
    std::swap_ranges(saved, saved + 16, p - 16);
    EXPECT_EQ(kNoErr, DSDisposePtr(p));
    DSDisposeHandle(aligned);
    DSDisposeHandle(h);
}

}  // namespace
}  // namespace tessel
