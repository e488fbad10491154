#include "diagnostics/AllocTracking.h"

#include <atomic>
#include <cstring>

#include "platform/Process.h"

namespace tessel {
namespace {

enum class Tracking { kNotAsked, kOff, kOn };
std::atomic<Tracking> theTracking{Tracking::kNotAsked};

}  // namespace

bool IsAllocTrackingOn() {
    if (theTracking == Tracking::kNotAsked) {
        const char* const value = platform::EnvironmentGet("OV_ALLOC_TRACKER");
        theTracking = value && std::strcmp(value, "off") == 0 ? Tracking::kOff : Tracking::kOn;
    }
    return theTracking == Tracking::kOn;
}

void SetAllocTracking(bool on) {
    theTracking = on ? Tracking::kOn : Tracking::kOff;
}

}  // namespace tessel
