#include "platform/System.h"
#include "platform/Thread.h"
#include "support/FailingPlatform.h"
#include "support/ReportRecorder.h"
#include <tessel/system/CPUInformation.h>
#include <tessel/system/OpSystemInfo.h>
#include <tessel/system/PlatformInformation.h>

#include <errno.h>
#include <gmock/gmock.h>

namespace tessel {
namespace {

constexpr bool k64Bit = sizeof(void*) == 8;

template <class T>
std::string TextOf(const T& value) {
    DebugStream stream("", 0, "", kDebugInfo);
    ToDebugStream(stream, value);
    return stream.Text();
}

TEST(OpSystemInfo, TellsOfThisHost) {
    OpSystemInfo* info = OSInfo();
    ASSERT_EQ(info, OSInfo());
    EXPECT_EQ(k64Bit ? 19 : 8, info->GetTargetID());
    EXPECT_EQ("Linux", info->GetFamilyName());
    platform::SystemVersion host = platform::GetSystemVersion();
    EXPECT_GE(info->GetMajorVersion(), 2u);
    EXPECT_EQ(std::to_string(host.major) + '.' + std::to_string(host.minor), info->GetVersionText());
    EXPECT_EQ(host.patch, info->GetBuildNumber());
    EXPECT_FALSE(info->GetName().empty());
    EXPECT_EQ(info->GetName(), TextOf(static_cast<const OpSystemInfo*>(info)));
    EXPECT_EQ("", TextOf(static_cast<const OpSystemInfo*>(nullptr)));
}

TEST(OpSystemInfo, HasFeatureFlags) {
    const OpSystemFeatureFlags& flags = OSInfo()->GetFeatureFlags();
    EXPECT_EQ(k64Bit, (flags & OpSystemFeatureFlags::k64Bit()).IsNonZero());
    EXPECT_FALSE((flags & OpSystemFeatureFlags::kIsNTOS()).IsNonZero());
    EXPECT_TRUE(OpSystemFeatureFlags::kIsNTOS().IsNonZero());
    EXPECT_FALSE((OpSystemFeatureFlags::kIsNTOS() & OpSystemFeatureFlags::kFirstBit()).IsNonZero());
    EXPECT_FALSE(OpSystemFeatureFlags::kNone().IsNonZero());
}

TEST(Names, FollowTheIdentifiers) {
    EXPECT_STREQ("invalid OS target", GetOSNameFromID(0));
    EXPECT_STREQ("Linux", GetOSNameFromID(8));
    EXPECT_STREQ("VxWorks", GetOSNameFromID(14));
    EXPECT_STREQ("Linux x64", GetOSNameFromID(19));
    EXPECT_STREQ("InvalidCPU", GetCPUArchName(0));
    EXPECT_STREQ("ARM", GetCPUArchName(8));
    EXPECT_STREQ("PIC", GetCPUArchName(10));
    for (int32 none : {-1, 20}) EXPECT_STREQ("<unknown value>", GetOSNameFromID(none));
    for (int32 none : {-1, 11}) EXPECT_STREQ("<unknown value>", GetCPUArchName(none));
}

TEST(CPUInformation, TellsOfThisHost) {
    InitCPUInformation();
    CPUInformation* info = CPUInfo();
    ASSERT_NE(nullptr, info);
    EXPECT_EQ(info, CPUInfo());
    EXPECT_EQ(info, PlatformInfo()->GetCPUInfo());
    EXPECT_EQ(OSInfo(), PlatformInfo()->GetOSInfo());
    EXPECT_EQ(k64Bit ? 9 : 3, info->GetArch());
    EXPECT_EQ(k64Bit ? "x64" : "X86", info->GetArchName());
    EXPECT_EQ(platform::NumberOfProcessors(), info->GetNumLogicalCPUs());
    EXPECT_GE(info->GetNumHardwareThreads(), info->GetNumCores());
    EXPECT_GE(info->GetNumPackages(), 1u);
    ASSERT_NE(nullptr, info->GetMachineDescription());
    ASSERT_NE(nullptr, info->GetFeatures(kCPUFeatureSelector));
    EXPECT_NE(0u, info->GetFeatures(kCPUFeatureSelector)->GetFlags() & CPUFeatures::kCompareExchange8);
    EXPECT_EQ(nullptr, info->GetFeatures(0));
    EXPECT_EQ("CPUArch: " + info->GetArchName() + ", NumLogicalCPUs: " + std::to_string(info->GetNumLogicalCPUs()),
              TextOf(static_cast<const CPUInformation*>(info)));
    EXPECT_EQ("Invalid CPUInformation", TextOf(static_cast<const CPUInformation*>(nullptr)));
    UninitCPUInformation();
    test::ReportRecorder reports;
    test::FailingPlatform failing("openat", 1, EACCES);
    info = PlatformInfo()->GetCPUInfo();  // built anew
    EXPECT_EQ(platform::NumberOfProcessors(), info->GetNumLogicalCPUs());
    EXPECT_EQ(2u, info->GetNumCores() + info->GetNumPackages());
    EXPECT_THAT(reports.Texts(kDebugWarning), ::testing::ElementsAre("cannot read /proc/cpuinfo, error 5"));
    UninitCPUInformation();
}

}  // namespace
}  // namespace tessel
