#include <tessel/system/PlatformInformation.h>

namespace tessel {
namespace {

// Asks for both each time, so that it stays right after UninitCPUInformation.
class HostPlatform final : public PlatformInformation {
public:
    OpSystemInfo* GetOSInfo() const override { return OSInfo(); }
    CPUInformation* GetCPUInfo() const override { return CPUInfo(); }
};

}  // namespace

PlatformInformation::~PlatformInformation() = default;

PlatformInformation* PlatformInfo() {
    static HostPlatform info;
    return &info;
}

}  // namespace tessel
