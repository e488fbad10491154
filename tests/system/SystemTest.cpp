#include "platform/System.h"
#include "platform/Thread.h"
#include "support/FailingPlatform.h"
#include "support/Test.h"
#include <tessel/system/CPUInformation.h>
#include <tessel/system/OpSystemInfo.h>
#include <tessel/system/PlatformInformation.h>

#include <errno.h>

namespace tessel::test {
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
    EXPECT_EACH((k64Bit ? 19 : 8) == info->GetTargetID(), info->GetFamilyName() == "Linux");
    platform::SystemVersion host = platform::GetSystemVersion();
    EXPECT_EACH(info->GetMajorVersion() >= 2u,
                std::to_string(host.major) + '.' + std::to_string(host.minor) == info->GetVersionText(),
                host.patch == info->GetBuildNumber(), !info->GetName().empty(),
                info->GetName() == TextOf(static_cast<const OpSystemInfo*>(info)),
                TextOf(static_cast<const OpSystemInfo*>(nullptr)) == "");
}

TEST(OpSystemInfo, HasFeatureFlags) {
    const OpSystemFeatureFlags& flags = OSInfo()->GetFeatureFlags();
    EXPECT_EACH(k64Bit == (flags & OpSystemFeatureFlags::k64Bit()).IsNonZero(),
                !(flags & OpSystemFeatureFlags::kIsNTOS()).IsNonZero(), OpSystemFeatureFlags::kIsNTOS().IsNonZero(),
                !(OpSystemFeatureFlags::kIsNTOS() & OpSystemFeatureFlags::kFirstBit()).IsNonZero(),
                !OpSystemFeatureFlags::kNone().IsNonZero());
}

TEST(Names, FollowTheIdentifiers) {
    EXPECT_EACH(GetOSNameFromID(0) == "invalid OS target", GetOSNameFromID(8) == "Linux",
                GetOSNameFromID(14) == "VxWorks", GetOSNameFromID(19) == "Linux x64", GetCPUArchName(0) == "InvalidCPU",
                GetCPUArchName(8) == "ARM", GetCPUArchName(10) == "PIC");
    for (int32 none : {-1, 20}) EXPECT_STREQ("<unknown value>", GetOSNameFromID(none));
    for (int32 none : {-1, 11}) EXPECT_STREQ("<unknown value>", GetCPUArchName(none));
}

TEST(CPUInformation, TellsOfThisHost) {
    InitCPUInformation();
    CPUInformation* info = CPUInfo();
    ASSERT_NE(nullptr, info);
    EXPECT_EACH(info == CPUInfo(), info == PlatformInfo()->GetCPUInfo(), OSInfo() == PlatformInfo()->GetOSInfo(),
                (k64Bit ? 9 : 3) == info->GetArch(), (k64Bit ? "x64" : "X86") == info->GetArchName(),
                platform::NumberOfProcessors() == info->GetNumLogicalCPUs(),
                info->GetNumHardwareThreads() >= info->GetNumCores(), info->GetNumPackages() >= 1u);
    ASSERT_NE(nullptr, info->GetMachineDescription());
    ASSERT_NE(nullptr, info->GetFeatures(kCPUFeatureSelector));
    EXPECT_EACH((info->GetFeatures(kCPUFeatureSelector)->GetFlags() & CPUFeatures::kCompareExchange8) != 0u,
                info->GetFeatures(0) == nullptr,
                "CPUArch: " + info->GetArchName() + ", NumLogicalCPUs: " + std::to_string(info->GetNumLogicalCPUs()) ==
                    TextOf(static_cast<const CPUInformation*>(info)),
                TextOf(static_cast<const CPUInformation*>(nullptr)) == "Invalid CPUInformation");
    UninitCPUInformation();
    test::ReportRecorder reports;
    test::FailingPlatform failing("openat", 1, EACCES);
    info = PlatformInfo()->GetCPUInfo();  // built anew
    EXPECT_EACH(platform::NumberOfProcessors() == info->GetNumLogicalCPUs(),
                info->GetNumCores() + info->GetNumPackages() == 2u);
    EXPECT_THAT(reports.Texts(kDebugWarning), ::testing::ElementsAre("cannot read /proc/cpuinfo, error 5"));
    UninitCPUInformation();
}

}  // namespace
}  // namespace tessel::test
