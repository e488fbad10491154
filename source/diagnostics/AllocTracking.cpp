#include "diagnostics/AllocTracking.h"

#include "diagnostics/Guarded.h"
#include "platform/Process.h"

#include <algorithm>
#include <atomic>
#include <cstring>
#include <string>

namespace tessel {
namespace {

enum class Tracking { kNotAsked, kOff, kOn };
std::atomic<Tracking> tracking{Tracking::kNotAsked};

constexpr char kVariable[] = "OV_ALLOC_TRACKER";
constexpr char kOff[] = "off";

bool IsOffInEnvironment() {
    const char* const value = platform::EnvironmentGet(kVariable);
    return value && std::strcmp(value, kOff) == 0;
}

bool IsOffInArguments() {
    return GuardedOr(false, [] {
        const auto arguments = platform::ProcessArguments();
        const std::string off = std::string(kVariable) + '=' + kOff;
        return std::find(arguments.begin(), arguments.end(), off) != arguments.end();
    });
}

}  // namespace

bool IsAllocTrackingOn() {
    if (tracking == Tracking::kNotAsked) SetAllocTracking(!IsOffInEnvironment() && !IsOffInArguments());
    return tracking == Tracking::kOn;
}

void SetAllocTracking(bool on) {
    tracking = on ? Tracking::kOn : Tracking::kOff;
}

}  // namespace tessel
