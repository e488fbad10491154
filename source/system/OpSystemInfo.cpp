#include "platform/System.h"
#include <tessel/system/OpSystemInfo.h>

#include <iterator>

CStr GetOSNameFromID(int32 targetID) {
    static const CStr kNames[] = {"invalid OS target", "Mac OS", "Windows 3.1", "Windows 95/NT", "Solaris 1",
                                  "Solaris 2",         "HP-UX",  "PowerMAX",    "Linux",         "Irix",
                                  "Rhapsody",          "BeOS",   "AIX",         "OSF1",          "VxWorks",
                                  "PharLap",           "Carbon", "RTX",         "Windows x64",   "Linux x64"};
    return targetID >= 0 && targetID < static_cast<int32>(std::size(kNames)) ? kNames[targetID] : "<unknown value>";
}

namespace tessel {

const OpSystemFeatureFlags& OpSystemFeatureFlags::kNone() {
    static const OpSystemFeatureFlags flags(0);
    return flags;
}

const OpSystemFeatureFlags& OpSystemFeatureFlags::kFirstBit() {
    static const OpSystemFeatureFlags flags(1);
    return flags;
}

const OpSystemFeatureFlags& OpSystemFeatureFlags::k64Bit() {
    static const OpSystemFeatureFlags flags(kFirstBit().flags_ << 0);
    return flags;
}

const OpSystemFeatureFlags& OpSystemFeatureFlags::kIsNTOS() {
    static const OpSystemFeatureFlags flags(kFirstBit().flags_ << 16);
    return flags;
}

OpSystemFeatureFlags OpSystemFeatureFlags::operator&(const OpSystemFeatureFlags& other) const {
    return OpSystemFeatureFlags(flags_ & other.flags_);
}

OpSystemInfo::~OpSystemInfo() = default;

// What the seam tells of the host. It knows no service packs: they are part of the name and the build.
class HostSystemInfo final : public OpSystemInfo {
public:
    HostSystemInfo()
        : host_(platform::GetSystemVersion()),
          version_(std::to_string(host_.major) + "." + std::to_string(host_.minor)),
          features_(kIs64Bit ? OpSystemFeatureFlags::k64Bit() : OpSystemFeatureFlags::kNone()) {}

    int32 GetTargetID() const override { return kIs64Bit ? kOSTargetLinuxX64 : kOSTargetLinux; }
    const std::string& GetFamilyName() const override { return host_.family; }
    const std::string& GetName() const override { return host_.name; }
    const std::string& GetVersionText() const override { return version_; }
    const std::string& GetBuildText() const override { return host_.build; }
    uint32 GetMajorVersion() const override { return host_.major; }
    uint32 GetMinorVersion() const override { return host_.minor; }
    uint32 GetBuildNumber() const override { return host_.patch; }
    uint16 GetServicePackMajor() const override { return 0; }
    uint16 GetServicePackMinor() const override { return 0; }
    const OpSystemFeatureFlags& GetFeatureFlags() const override { return features_; }

private:
    static constexpr bool kIs64Bit = sizeof(void*) == 8;

    platform::SystemVersion host_;
    std::string version_;
    OpSystemFeatureFlags features_;
};

OpSystemInfo* OSInfo() {
    static HostSystemInfo info;
    return &info;
}

void ToDebugStream(DebugStream& stream, const OpSystemInfo* info) {
    if (info) ToDebugStream(stream, std::string_view(info->GetName()));
}

}  // namespace tessel
