#include "support/FailingPlatform.h"
#include "support/HandClock.h"
#include "support/Test.h"
#include "support/malloc/FailingMalloc.h"
#include <tessel/diagnostics/DebugStream.h>
#include <tessel/utilities/OVGuid.h>
#include <tessel/utilities/RandomGen.h>

#include <errno.h>
#include <set>

using namespace tessel::test;

namespace {

// The process-wide generator, seeded by a clock whose low 14 bits are 0: 1234, x 8191 & 0x3FFF, and that again.
struct SeededGenerator {
    tessel::test::HandClock clock{3 * 0x4000};
    int32 seeds[3] = {1234, 15150, 1234};
    SeededGenerator() { EXPECT_EQ(InitRandomGen(), kNoErr); }
    ~SeededGenerator() { UninitRandomGen(); }
};

std::vector<double> Stream(const int32 seeds[3], size_t count) {
    int32 state[3] = {seeds[0], seeds[1], seeds[2]};
    std::vector<double> numbers(count);
    for (double& number : numbers) RandomGenWithState(&number, state);
    return numbers;
}

// The expected numbers were computed with exact fractions, each operation rounded to the nearest double.
TEST(RandomGen, GivesItsExactStream) {
    int32 seeds[3] = {1, 1, 1};
    std::vector<double> numbers = Stream(seeds, 1000);
    EXPECT_EACH(numbers[0] == 0x1.15655e1ad3ad5p-6, numbers[99] == 0x1.bcd5d3749b954p-1,
                numbers[999] == 0x1.e32e7fc1ca464p-1);
    uint64 checksum = 0;
    for (double each : numbers) {
        uint64 bits;
        std::memcpy(&bits, &each, sizeof bits);
        checksum = checksum * 31 + bits;
    }
    EXPECT_EQ(checksum, 0x42ee1b62771f2003u);
    RandomGenWithState(&numbers[0], seeds);
    EXPECT_TRUE(seeds[0] == 171 && seeds[1] == 172 && seeds[2] == 170);
}

TEST(RandomGen, ThreadsShareOneSeededStream) {
    constexpr size_t kThreads = 4, kEach = 5000;
    std::vector<double> drawn(kThreads * kEach, 1);
    RandomGen(&drawn[0]);
    EXPECT_EQ(drawn[0], 0);  // not seeded
    SeededGenerator generator;
    InThreads(kThreads, [&](int thread) {
        for (size_t i = 0; i < kEach; ++i) RandomGen(&drawn[static_cast<size_t>(thread) * kEach + i]);
    });
    std::vector<double> expected = Stream(generator.seeds, drawn.size() + 1);
    int32 state[3];
    RandomGenInitState(state);
    const int32 first = static_cast<int32>(expected.back() * 30000);
    EXPECT_TRUE(state[0] == first && state[1] == (first * 8191 & 0x3FFF) && state[2] == (state[1] * 8191 & 0x3FFF));
    expected.pop_back();
    std::sort(drawn.begin(), drawn.end());
    std::sort(expected.begin(), expected.end());
    EXPECT_EQ(drawn, expected);
}

TEST(RandomGen, WithoutMemoryForItsLockItFails) {
    int failures = tessel::test::WithEachAllocationFailing([] {
        MgErr err = InitRandomGen();
        EXPECT_TRUE(err == kNoErr || err == kMemFullErr);
        UninitRandomGen();
    });
    // The mutex and its event; that of the platform may be one that is spare.
    EXPECT_TRUE(failures == 2 || failures == 3) << failures;
}

constexpr OVGuidType kSample = {0x00112233, 0x4455, 0x6677, {0x88, 0x99, 0xAA, 0xBB, 0xCC, 0xDD, 0xEE, 0xFF}};
constexpr char kSampleText[] = "00112233-4455-6677-8899-aabbccddeeff";

TEST(OVGuid, TurnsIntoTextAndBack) {
    char text[kOVGuidTextSize];
    OVGuidType guid{};
    EXPECT_EQ(OVGuidToCStr(&kSample, text), kNoErr);
    EXPECT_STREQ(text, kSampleText);
    EXPECT_EACH(OVGuidToCStr(NullOVGuid(), text) == kNoErr, text == "00000000-0000-0000-0000-000000000000",
                OVGuidFromCStr("00112233-4455-6677-8899-AABBCCddeeFF", &guid) == kNoErr, OVGuidsEqual(&guid, &kSample),
                !OVGuidsEqual(&guid, NullOVGuid()));
    const char* bad[] = {"",
                         "00112233-4455-6677-8899-aabbccddeef",
                         "00112233-4455-6677-8899-aabbccddeeff0",
                         "{00112233-4455-6677-8899-aabbccddeeff}",
                         "00112233445566778899aabbccddeeff",
                         "00112233-4455-6677-8899+aabbccddeeff",
                         "0011223-34455-6677-8899-aabbccddeeff",
                         "0011223g-4455-6677-8899-aabbccddeeff",
                         "00112233-4455-6677-8899-aabbccddee f"};
    for (const char* each : bad) {
        EXPECT_EQ(OVGuidFromCStr(each, &guid), kGuidErr) << each;
        EXPECT_TRUE(OVGuidsEqual(&guid, &kSample)) << each;
    }
    EXPECT_EACH(OVGuidsEqual(nullptr, nullptr), !OVGuidsEqual(&guid, nullptr), !OVGuidsEqual(nullptr, &guid),
                OVGuidFromCStr(nullptr, nullptr) == kArgErr, OVGuidFromCStr("nothing is done", nullptr) == kNoErr,
                OVGuidToCStr(&kSample, nullptr) == kNoErr, OVGuidToCStr(nullptr, text) == kGuidErr, text == "");
    tessel::test::ReportRecorder reports;
    TESSEL_REPORT(kDebugInfo, 0x11223344u) << kSample;
    EXPECT_EQ(reports.Texts(), std::vector<std::string>{kSampleText});
}

TEST(OVGuid, IsRandomOrFallsBackOnTheGenerator) {
    std::set<std::string> all;
    for (int i = 0; i < 100; ++i) {
        char text[kOVGuidTextSize];
        ASSERT_EQ(OVGuidCreateStr(text), kNoErr);
        EXPECT_TRUE(text[14] == '4' && std::strchr("89ab", text[19])) << text;
        all.insert(text);
    }
    EXPECT_EQ(all.size(), 100u);

    SeededGenerator generator;
    tessel::test::FailingPlatform platform("getrandom", 1, ENOSYS);
    OVGuidType guid{};
    OVGuidCreate(&guid);
    EXPECT_EQ(std::memcmp(&guid, Stream(generator.seeds, 2).data(), sizeof guid), 0);
}

}  // namespace
