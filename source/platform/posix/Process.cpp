#include "platform/Process.h"

#include "platform/posix/SystemCalls.h"
#include "platform/posix/TextFile.h"

#include <cstdlib>
#include <stdlib.h>
#include <unistd.h>

namespace tessel::platform {

void ProcessExit(int status) noexcept {
    ::_exit(status);
}

std::uint32_t ProcessId() noexcept {
    return static_cast<std::uint32_t>(systemCalls.getpid());
}

std::vector<std::string> ProcessArguments() {
    std::vector<std::string> arguments;
    std::string all;
    ReadTextFile("/proc/self/cmdline", all);  // each ends with a zero byte
    for (std::size_t start = 0; start < all.size();) {
        arguments.emplace_back(all.c_str() + start);
        start += arguments.back().size() + 1;
    }
    return arguments;
}

const char* EnvironmentGet(const char* name) noexcept {
    return std::getenv(name);
}

bool EnvironmentGet(const char* name, std::string& value) {
    const char* found = std::getenv(name);
    if (found) value = found;
    return found != nullptr;
}

std::string EnvironmentExpand(std::string_view text) {
    std::string expanded;
    while (!text.empty()) {
        std::size_t open = text.find('%');
        std::size_t close = open == std::string_view::npos ? open : text.find('%', open + 1);
        if (close == std::string_view::npos) break;
        expanded += text.substr(0, open);
        std::string name(text.substr(open + 1, close - open - 1));
        const char* value = name.empty() ? nullptr : std::getenv(name.c_str());
        // Of a name that is none, the second sign may begin another.
        expanded += value ? value : "%" + name;
        text.remove_prefix(value ? close + 1 : close);
    }
    expanded += text;
    return expanded;
}

}  // namespace tessel::platform
