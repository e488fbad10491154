#include "frame/Environment.h"

#include "diagnostics/Guarded.h"
#include "platform/CodePage.h"
#include "platform/Process.h"
#include <tessel/diagnostics/DebugStream.h>

#include <algorithm>
#include <string_view>
#include <vector>

namespace tessel {
namespace {

using Values = std::vector<std::string_view>;

bool IsFolder(std::string_view value) {
    return value.starts_with('/');
}

// "C=/;T=/mnt/x"; an entry may be empty.
bool AreDrives(std::string_view value) {
    while (!value.empty()) {
        const std::string_view entry = value.substr(0, value.find(';'));
        const bool isLetter = !entry.empty() && ((entry[0] | 32) >= 'a' && (entry[0] | 32) <= 'z');
        if (!entry.empty() && !(isLetter && entry.substr(1).starts_with("=/"))) return false;
        value.remove_prefix(std::min(entry.size() + 1, value.size()));
    }
    return true;
}

bool IsCodePage(std::string_view value) {
    return platform::IsCodePageSetting(value.data());  // the end of the variable is there
}

struct Setting {
    const char* variable;
    Values values;                           // or
    bool (*isUnderstood)(std::string_view);  // when there is no list
};

void Check(const Setting& setting) {
    const char* const value = platform::EnvironmentGet(setting.variable);
    if (!value || !*value) return;
    const bool isUnderstood =
        setting.isUnderstood ? setting.isUnderstood(value)
                             : std::find(setting.values.begin(), setting.values.end(), value) != setting.values.end();
    if (!isUnderstood)
        TESSEL_REPORT(kDebugWarning, 0xC46F10B3u)
            << setting.variable << '=' << value << " is not understood; the default holds.";
}

}  // namespace

void ReportUnknownSettings() {
    GuardedOr(false, [] {
        const Values guards = {"off", "alloc", "check"};
        const Setting settings[] = {
            {"OVGuardBytes", guards, nullptr},
            {"OVGuardBytes_Handle", guards, nullptr},
            {"OVGuardBytes_Ptr", guards, nullptr},
            {"OVGuardBytes_NewDelete", guards, nullptr},
            {"OVHandleCheck", {"all", "2", "resize", "1", "off", "none", "0"}, nullptr},
            {"OV_ALLOC_TRACKER", {"off", "on"}, nullptr},
            {"OV_USE_MALLOC", {"1", "0"}, nullptr},
            {"TESSEL_DRIVES", {}, AreDrives},
            {"TESSEL_UNC", {}, IsFolder},
            {"TESSEL_CODEPAGE", {}, IsCodePage},
        };
        for (const Setting& setting : settings) Check(setting);
        return true;
    });
}

}  // namespace tessel
