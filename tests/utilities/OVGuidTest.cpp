#include <tessel/diagnostics/DebugStream.h>
#include <tessel/utilities/OVGuid.h>
#include <tessel/utilities/RandomGen.h>

#include <gtest/gtest.h>

#include <cerrno>
#include <cstring>
#include <set>
#include <string>

#include "support/FailingPlatform.h"
#include "support/HandClock.h"
#include "support/ReportRecorder.h"

namespace {

constexpr OVGuidType kSample = {0x00112233, 0x4455, 0x6677, {0x88, 0x99, 0xAA, 0xBB, 0xCC, 0xDD, 0xEE, 0xFF}};
constexpr char kSampleText[] = "00112233-4455-6677-8899-aabbccddeeff";

TEST(OVGuid, TurnsIntoTextAndBack) {
    char text[kOVGuidTextSize];
    EXPECT_EQ(OVGuidToCStr(&kSample, text), kNoErr);
    EXPECT_STREQ(text, kSampleText);
    EXPECT_EQ(OVGuidToCStr(NullOVGuid(), text), kNoErr);
    EXPECT_STREQ(text, "00000000-0000-0000-0000-000000000000");

    OVGuidType guid{};
    EXPECT_EQ(OVGuidFromCStr("00112233-4455-6677-8899-AABBCCddeeFF", &guid), kNoErr);
    EXPECT_TRUE(OVGuidsEqual(&guid, &kSample));
    EXPECT_FALSE(OVGuidsEqual(&guid, NullOVGuid()));
    EXPECT_FALSE(OVGuidsEqual(&guid, nullptr));
}

TEST(OVGuid, RefusesWhatIsNotExactlyTheForm) {
    const char* bad[] = {"",
                         "0",
                         "00112233-4455-6677-8899-aabbccddeef",
                         "00112233-4455-6677-8899-aabbccddeeff0",
                         "{00112233-4455-6677-8899-aabbccddeeff}",
                         "00112233445566778899aabbccddeeff",
                         "00112233-4455-6677-8899+aabbccddeeff",
                         "0011223-34455-6677-8899-aabbccddeeff",
                         "0011223g-4455-6677-8899-aabbccddeeff",
                         "00112233-4455-6677-8899-aabbccddee f"};
    for (const char* text : bad) {
        OVGuidType guid = kSample;
        EXPECT_EQ(OVGuidFromCStr(text, &guid), kGuidErr) << text;
        EXPECT_TRUE(OVGuidsEqual(&guid, &kSample)) << text;
    }
    EXPECT_EQ(OVGuidFromCStr(nullptr, nullptr), kArgErr);
    EXPECT_EQ(OVGuidFromCStr("nothing is done", nullptr), kNoErr);
    EXPECT_EQ(OVGuidToCStr(&kSample, nullptr), kNoErr);
    char text[kOVGuidTextSize] = "x";
    EXPECT_EQ(OVGuidToCStr(nullptr, text), kGuidErr);
    EXPECT_STREQ(text, "");
}

TEST(OVGuid, CreatesDistinctRandomIdentifiers) {
    std::set<std::string> all;
    for (int i = 0; i < 200; ++i) {
        char text[kOVGuidTextSize];
        ASSERT_EQ(OVGuidCreateStr(text), kNoErr);
        EXPECT_EQ(text[14], '4');
        EXPECT_NE(std::strchr("89ab", text[19]), nullptr) << text;
        all.insert(text);
    }
    EXPECT_EQ(all.size(), 200u);
}

TEST(OVGuid, FallsBackOnTheGenerator) {
    tessel::test::HandClock clock(0x4000);  // seeds the generator with these
    int32 state[3] = {1234, 15150, 1234};
    ASSERT_EQ(InitRandomGen(), kNoErr);
    tessel::test::FailingPlatform platform("getrandom", 1, ENOSYS);
    OVGuidType guid{};
    OVGuidCreate(&guid);
    EXPECT_EQ(platform.Calls(), 1);
    double expected[2];
    for (double& number : expected) RandomGenWithState(&number, state);
    EXPECT_EQ(std::memcmp(&guid, expected, sizeof guid), 0);
    UninitRandomGen();
}

TEST(OVGuid, IsReportedAsText) {
    tessel::test::ReportRecorder reports;
    TESSEL_REPORT(kDebugInfo, 0x11223344u) << kSample;
    EXPECT_EQ(reports.Texts(), std::vector<std::string>{kSampleText});
}

}  // namespace
