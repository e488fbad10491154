#include "diagnostics/AllocTracking.h"
#include "diagnostics/TrackerHeap.h"
#include "support/Test.h"
#include "support/TextDumper.h"
#include <tessel/diagnostics/AllocTracker.h>
#include <tessel/diagnostics/DebugStream.h>

#include <map>

namespace tessel::test {
namespace {

const void* At(uintptr_t address) {
    return reinterpret_cast<const void*>(address);
}

std::string AddressDigits(uintptr_t address) {
    char text[32];
    std::snprintf(text, sizeof text, "%0*llX", int(2 * sizeof(void*)), static_cast<unsigned long long>(address));
    return text;
}

class AllocTrackerTest : public testing::Test {
protected:
    struct Destroyer {
        void operator()(AllocTracker* ended) const { DestroyAllocTracker(ended); }
    };
    std::unique_ptr<AllocTracker, Destroyer> tracker_{CreateAllocTracker()};
    AllocTracker& tracker = *tracker_;
};

TEST_F(AllocTrackerTest, CountsWhatLivesAndWhatIsNotReported) {
    for (uintptr_t i = 1; i <= 5; ++i) tracker.AddRecord(At(i * 16), 100, "f.cpp", 1);
    tracker.RemoveRecord(At(3 * 16));
    tracker.RemoveRecord(At(99));
    tracker.RemoveRecord(nullptr);
    tracker.AddRecord(nullptr, 1, "f.cpp", 1);
    EXPECT_EACH(tracker.CountLive() == 4, tracker.CountUnreported() == 4);
    tracker.MarkAllReported();
    EXPECT_EACH(tracker.CountLive() == 4, tracker.CountUnreported() == 0);
    tracker.Register(At(7));
    EXPECT_EQ(1, tracker.CountUnreported());
    tracker.RemoveRecord(At(16));
    EXPECT_EQ(1, tracker.CountUnreported()) << "one that was reported is gone";
    tracker.Unregister(At(7));
    EXPECT_EACH(tracker.CountUnreported() == 0, tracker.Count() == 3, tracker.IsTracked(At(32)),
                !tracker.IsTracked(At(48)));
    const auto totals = tracker.GetTotals();
    EXPECT_EACH(totals.made == 6u, totals.bytesMade == 500u, totals.live == 3u, totals.bytesLive == 300u);
}

TEST_F(AllocTrackerTest, ReportHasOneBlockARecordInTheOrderOfAddresses) {
    tracker.AddRecord(At(0x2000), 7, "second.cpp", 20);
    tracker.AddRecord(At(0x3000), 1, "dead.cpp", 1);
    tracker.AddRecord(At(0x1000), 123456, "a_name_longer_than_fifteen.cpp", 123456);
    tracker.RemoveRecord(At(0x3000));
    const std::string head =
        "****************************************\n"
        "** List of currently allocated things                **\n"
        "****************************************\n"
        "                                     Size  Size Expression     Content String      Alloc Number\n";
    const std::string records =
        "----------------------\n"
        "File a_name_longer_than_fifteen.cpp; Line 123456 # 123456" +
        std::string(39, ' ') + "3            0x" + AddressDigits(0x1000) +
        "\n<123456 bytes>\n"
        "----------------------\n"
        "File second.cpp     ; Line 20    #      7" +
        std::string(39, ' ') + "1            0x" + AddressDigits(0x2000) + "\n<7 bytes>\n";
    TextDumper dumper;
    tracker.DumpAll(&dumper);
    EXPECT_EQ(head + records + "\nNumber of unfreed items: 2\n\n2 things\n", dumper.text);

    TextDumper one;
    tracker.DumpOne(At(0x2000), &one);
    tracker.DumpOne(At(0x3000), &one);
    EXPECT_EQ(records.substr(records.rfind("-----\nFile") - 17), one.text);

    TextDumper again;
    tracker.MarkAllReported();
    tracker.DumpAll(&again);
    tracker.DumpOne(At(0x2000), &again);
    EXPECT_EQ(head + "\nNumber of unfreed items: 3\n\n2 things\n", again.text) << "counts all that were ever written";
}

__attribute__((noinline)) void Make(AllocTracker& tracker, uintptr_t address) {
    tracker.AddRecord(At(address), 1, "f.cpp", 1);
    asm volatile("");
}
__attribute__((noinline)) void MakeDeep(AllocTracker& tracker, uintptr_t address, int depth) {
    if (depth == 0)
        Make(tracker, address);
    else
        MakeDeep(tracker, address, depth - 1);
    asm volatile("");
}

// The return addresses written for a record.
std::vector<uintptr_t> StackOf(AllocTracker& tracker, uintptr_t address) {
    TextDumper dumper("things", true);
    tracker.DumpOne(At(address), &dumper);
    std::vector<uintptr_t> stack;
    for (size_t at = dumper.text.find("\n0x"); at != std::string::npos; at = dumper.text.find("\n0x", at + 1))
        stack.push_back(static_cast<uintptr_t>(std::stoull(dumper.text.substr(at + 3), nullptr, 16)));
    return stack;
}

bool IsIn(uintptr_t address, void (*function)(AllocTracker&, uintptr_t)) {
    const auto begin = reinterpret_cast<uintptr_t>(function);
    return address > begin && address < begin + 512;
}

TEST_F(AllocTrackerTest, RecordsTheCallsThatMadeTheObject) {
    MakeDeep(tracker, 0x10, 3);
    MakeDeep(tracker, 0x20, 20);
    MakeDeep(tracker, 0x30, 3);
    const auto stack = StackOf(tracker, 0x10);
    ASSERT_GE(stack.size(), 5u);
    EXPECT_TRUE(IsIn(stack[0], &Make)) << "begins where AddRecord is called";
    EXPECT_EACH(stack[2] == stack[3], stack[3] == stack[4], StackOf(tracker, 0x20).size() == 16u);
    EXPECT_NE(stack, StackOf(tracker, 0x30)) << "made by another call of the test";

    tracker.SetSkip(4);
    MakeDeep(tracker, 0x40, 3);
    EXPECT_EQ(stack[1], StackOf(tracker, 0x40).at(0));
    tracker.SetSkip(40);
    MakeDeep(tracker, 0x50, 60);
    MakeDeep(tracker, 0x60, 1);
    EXPECT_EACH(StackOf(tracker, 0x50).size() == 16u, StackOf(tracker, 0x60).size() <= 16u);
}

// The same frames at the same places, reached by other calls, must not be taken for the walk remembered.
__attribute__((noinline)) void Left(AllocTracker& tracker, uintptr_t address, int depth) {
    MakeDeep(tracker, address, depth);
    asm volatile("");
}
__attribute__((noinline)) void Right(AllocTracker& tracker, uintptr_t address, int depth) {
    MakeDeep(tracker, address, depth);
    asm volatile("");
}

TEST_F(AllocTrackerTest, TellsStacksApartThatDifferOnlyFarOut) {
    std::vector<uintptr_t> first[2];
    for (uintptr_t i = 0; i < 6; ++i) {
        (i % 2 ? Left : Right)(tracker, 0x10 + i * 0x10, 10);
        const auto stack = StackOf(tracker, 0x10 + i * 0x10);
        if (i < 2) first[i] = stack;
        EXPECT_EQ(first[i % 2], stack) << i;
    }
    ASSERT_EQ(first[0].size(), first[1].size());
    // The innermost twelve calls are the same.
    for (size_t i = 0; i < first[0].size(); ++i) EXPECT_EQ(i < 11, first[0][i] == first[1][i] && i < 11) << i;
}

TEST_F(AllocTrackerTest, DuplicateIsReportedAndTheEarlierRecordStays) {
    tracker.AddRecord(At(0x10), 5, "first.cpp", 1);
    ReportRecorder recorder;
    tracker.AddRecord(At(0x10), 6, "again.cpp", 2);
    EXPECT_EQ(1, tracker.CountLive());
    const auto texts = recorder.Texts(kDebugInfo);
    ASSERT_GE(texts.size(), 4u);
    EXPECT_EACH(texts[0] == "Duplicate pointer first returned in this context:\n",
                texts[1] == "----------------------\nFile first.cpp      ; Line 1     # ");
    tracker.RemoveRecord(At(0x10));
    EXPECT_EQ(0, tracker.CountLive());
}

// A dumper that makes objects of the tracker that it writes for.
class BusyDumper : public TextDumper {
public:
    explicit BusyDumper(AllocTracker& tracker) : tracker_(tracker) {}
    void DumpItemContents(const void* address, uint32) override {
        tracker_.AddRecord(static_cast<const char*>(address) + 1, 1, "busy.cpp", 1);
        tracker_.DumpAll(this);
        tracker_.RemoveRecord(address);
    }

private:
    AllocTracker& tracker_;
};

TEST_F(AllocTrackerTest, WhatADumperMakesIsNotTracked) {
    tracker.AddRecord(At(0x10), 1, "f.cpp", 1);
    tracker.AddRecord(At(0x20), 1, "f.cpp", 1);
    BusyDumper dumper(tracker);
    tracker.DumpAll(&dumper);
    EXPECT_EACH(tracker.CountLive() == 0, std::string::npos != dumper.text.find("Number of unfreed items: 2\n"));
    tracker.AddRecord(At(0x30), 1, "f.cpp", 1);
    EXPECT_EQ(1, tracker.CountLive());
}

TEST_F(AllocTrackerTest, AfterShutdownNothingIsDone) {
    tracker.AddRecord(At(0x10), 1, "f.cpp", 1);
    tracker.Shutdown();
    tracker.AddRecord(At(0x20), 1, "f.cpp", 1);
    TextDumper dumper;
    tracker.DumpAll(&dumper);
    EXPECT_EACH(dumper.text == "", tracker.CountLive() == 0, !tracker.IsTracked(At(0x10)));
}

TEST(AllocTracking, CanBeTurnedOff) {
    SetAllocTracking(false);
    AllocTracker* const tracker = CreateAllocTracker();
    SetAllocTracking(true);
    ASSERT_NE(nullptr, tracker);
    tracker->AddRecord(At(0x10), 1, "f.cpp", 1);
    EXPECT_EQ(0, tracker->CountLive());
    DestroyAllocTracker(tracker);
    DestroyAllocTracker(nullptr);
}

// Against a std::map, with addresses as an allocator gives them.
TEST_F(AllocTrackerTest, AgreesWithAModel) {
    std::mt19937 random(7);
    std::map<uintptr_t, uint32> model;
    uint64 live = 0, mostLive = 0, mostBytes = 0;
    for (int step = 0; step < 60000; ++step) {
        const uintptr_t address = 0x7f0000000000u % (uintptr_t(-1) / 2) + 16 * (random() % 4000);
        if (step % 20000 < 12000 ? random() % 3 != 0 : random() % 3 == 0) {
            if (!model.count(address)) {
                live += model[address] = random() % 1000;
                tracker.AddRecord(At(address), model[address], "f.cpp", step);
            }
        } else {
            if (model.count(address)) live -= model[address];
            model.erase(address);
            tracker.RemoveRecord(At(address));
        }
        mostLive = std::max<uint64>(mostLive, model.size());
        mostBytes = std::max(mostBytes, live);
        ASSERT_EQ(model.count(address) != 0, tracker.IsTracked(At(address)));
    }
    uint64 bytes = 0;
    for (const auto& [address, size] : model) {
        bytes += size;
        ASSERT_TRUE(tracker.IsTracked(At(address)));
    }
    EXPECT_EACH(static_cast<int32>(model.size()) == tracker.CountLive(), bytes == tracker.GetTotals().bytesLive,
                mostLive == tracker.GetTotals().mostLive, mostBytes == tracker.GetTotals().mostBytesLive);
}

TEST_F(AllocTrackerTest, TellsHowMuchEachLineHolds) {
    const struct {
        uintptr_t address;
        const char* file;
        int32 line;
    } made[] = {{0x10, "b.cpp", 7}, {0x20, "a.cpp", 9}, {0x30, "b.cpp", 7}, {0x40, "b.cpp", 2}, {0x50, "a.cpp", 1}};
    for (const auto& each : made) tracker.AddRecord(At(each.address), 100, each.file, each.line);
    tracker.RemoveRecord(At(0x50));
    tracker.MarkAllReported();
    AllocTracker::Site sites[3] = {};
    EXPECT_EACH(tracker.GetSites(sites, 2) == 3, sites[2].file == nullptr, tracker.GetSites(sites, 3) == 3);
    std::string text;
    for (const auto& site : sites)
        text += std::string(site.file) + ':' + std::to_string(site.line) + ' ' + std::to_string(site.live) + ' ' +
                std::to_string(site.bytes) + '\n';
    EXPECT_EQ("a.cpp:9 1 100\nb.cpp:2 1 100\nb.cpp:7 2 200\n", text);
}

TEST_F(AllocTrackerTest, ThreadsMakeAndReleaseTogether) {
    constexpr uintptr_t kThreads = 4, kEach = 3000;
    std::vector<std::thread> threads;
    for (uintptr_t t = 0; t < kThreads; ++t)
        threads.emplace_back([&, t] {
            for (uintptr_t i = 0; i < kEach; ++i)
                MakeDeep(tracker, 16 * (1 + i * kThreads + t), static_cast<int>(i % 9));
            for (uintptr_t i = 1; i < kEach; ++i) tracker.RemoveRecord(At(16 * (1 + i * kThreads + t)));
        });
    while (tracker.CountLive() < static_cast<int32>(kThreads)) std::this_thread::yield();
    TextDumper during;
    tracker.DumpAll(&during);
    for (auto& thread : threads) thread.join();
    EXPECT_EQ(static_cast<int32>(kThreads), tracker.CountLive());
    const auto totals = tracker.GetTotals();
    EXPECT_EACH(kThreads * kEach == totals.made, kThreads * kEach == totals.bytesMade);
    TextDumper after;
    tracker.AddRecord(At(8), 1, "f.cpp", 1);
    tracker.DumpOne(At(8), &after);
    EXPECT_NE(std::string::npos, after.text.find(' ' + std::to_string(kThreads * kEach + 1) + " "))
        << "no number was lost";
    EXPECT_EACH(totals.mostLive >= kEach, totals.mostLive <= totals.made);
    EXPECT_EQ(totals.mostLive, totals.mostBytesLive) << "each is one byte";
}

// ---- running out of memory ------------------------------------------------------------------------------------------

int theAllocationsLeft = 0;
bool theReleaseFails = false;
void* theSameBlock = nullptr;

void* FailingAllocate(size_t size) {
    return theAllocationsLeft-- > 0 ? std::calloc(1, size) : theSameBlock;
}
bool FailingRelease(void* block) {
    std::free(block);
    return !theReleaseFails;
}

class AllocTrackerFailures : public testing::Test {
protected:
    void SetUp() override {
        theReleaseFails = false;
        theSameBlock = nullptr;
        SetTrackerHeapSource({FailingAllocate, FailingRelease});
    }
    void TearDown() override { ResetTrackerHeapSource(); }

    // Fills a tracker; the texts that it reports.
    static std::vector<std::string> Fill() {
        ReportRecorder recorder;
        AllocTracker* const tracker = CreateAllocTracker();
        for (uintptr_t i = 1; i <= 2000; ++i) tracker->AddRecord(At(i * 16), 1, "f.cpp", 1);
        const bool complete = tracker->CountLive() == 2000;
        EXPECT_EQ(complete, recorder.Count() == 0);
        if (!complete) {
            tracker->AddRecord(At(1), 1, "f.cpp", 1);
            TextDumper dumper;
            tracker->DumpAll(&dumper);
            EXPECT_EACH(dumper.text == "", tracker->CountLive() == 0);
        }
        DestroyAllocTracker(tracker);
        return recorder.Texts();
    }
};

TEST_F(AllocTrackerFailures, OutOfMemoryTurnsItOff) {
    int failures = 0;
    for (int allowed = 0;; ++allowed) {
        theAllocationsLeft = allowed;
        const auto texts = Fill();
        if (texts.empty()) break;
        EXPECT_EQ(std::vector<std::string>{"memdebug deactivated. Internal out of memory.\n"}, texts);
        ++failures;
    }
    EXPECT_GT(failures, 100);
}

TEST_F(AllocTrackerFailures, OutOfMemoryWhileDumping) {
    theAllocationsLeft = 1000;
    ReportRecorder recorder;
    AllocTracker* const tracker = CreateAllocTracker();
    tracker->AddRecord(At(16), 1, "f.cpp", 1);
    theAllocationsLeft = 0;
    TextDumper dumper;
    tracker->DumpAll(&dumper);
    EXPECT_EACH(dumper.text == "",
                std::vector<std::string>{"memdebug deactivated. Internal out of memory.\n"} == recorder.Texts());
    DestroyAllocTracker(tracker);
}

TEST_F(AllocTrackerFailures, AnAllocatorThatGivesOrTakesWronglyTurnsItOff) {
    theAllocationsLeft = 100000;
    theReleaseFails = true;
    EXPECT_EQ(std::vector<std::string>{"memdebug deactivated. Internal free error.\n"}, Fill());

    // Gives its first block again.
    theReleaseFails = false;
    SetTrackerHeapSource({[](size_t size) {
                              if (theSameBlock) return theSameBlock;
                              return theSameBlock = std::calloc(1, std::max<size_t>(size, 65536));
                          },
                          FailingRelease});
    EXPECT_EQ(std::vector<std::string>{"memdebug deactivated. Malloc returned same pointer twice.\n"}, Fill());
}

}  // namespace
}  // namespace tessel::test
