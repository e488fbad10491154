#include "platform/System.h"

#include <errno.h>

#if defined(__x86_64__) || defined(__i386__)
#    include <cpuid.h>
#endif

#include "platform/Thread.h"
#include "platform/posix/Errors.h"
#include "platform/posix/Interrupted.h"
#include "platform/posix/TextFile.h"

#include <algorithm>
#include <cstdio>
#include <cstdlib>
#include <set>
#include <string_view>

namespace tessel::platform {

namespace {

// Calls take(line) for each line of a text.
template <typename Taker>
void ForEachLine(std::string_view text, Taker take) {
    while (!text.empty()) {
        std::size_t end = text.find('\n');
        take(text.substr(0, end));
        text.remove_prefix(end == std::string_view::npos ? text.size() : end + 1);
    }
}

// What follows `key` in a line that begins with it, without blanks, signs and quotes around it.
bool ValueOf(std::string_view line, std::string_view key, std::string& value) {
    if (line.substr(0, key.size()) != key) return false;
    line.remove_prefix(key.size());
    std::size_t first = line.find_first_not_of("\t :=\"'");
    std::size_t last = line.find_last_not_of("\t \"'");
    if (first == std::string_view::npos || last < first) return false;
    value = line.substr(first, last - first + 1);
    return true;
}

std::string DistributionName() {
    std::string text, name;
    if (!ReadTextFile("/etc/os-release", text) && !ReadTextFile("/usr/lib/os-release", text)) return {};
    ForEachLine(text, [&](std::string_view line) { ValueOf(line, "PRETTY_NAME=", name); });
    return name;
}

std::uint64_t Features() {
#if defined(__x86_64__) || defined(__i386__)
    unsigned a = 0, b = 0, c = 0, d = 0;
    if (!__get_cpuid(1, &a, &b, &c, &d)) return 0;
    return (d & bit_CMPXCHG8B ? kCompareExchange8 : 0) | (c & bit_CMPXCHG16B ? kCompareExchange16 : 0);
#else
    return (__atomic_always_lock_free(8, nullptr) ? kCompareExchange8 : 0) |
           (__atomic_always_lock_free(16, nullptr) ? kCompareExchange16 : 0);
#endif
}

}  // namespace

SystemVersion GetSystemVersion() {
    SystemVersion version{};
    version.family = "Linux";
    utsname host{};
    if (systemCalls.uname(&host) == 0) {
        version.family = host.sysname;
        version.version = host.release;
        std::sscanf(host.release, "%u.%u.%u", &version.major, &version.minor, &version.patch);
    }
    version.build = std::to_string(version.patch);
    version.name = DistributionName();
    if (version.name.empty()) version.name = version.family + " " + version.version;
    return version;
}

ProcessorFacts GetProcessorFacts() {
    ProcessorFacts facts{NumberOfProcessors(), 1, 1, 1, Features(), {}, {}};
    std::string text, value, package;
    if (!ReadTextFile("/proc/cpuinfo", text))
        facts.trouble = "cannot read /proc/cpuinfo, error " + std::to_string(ErrorOfErrno(errno));
    std::set<std::string> packages, cores;  // a core's number counts within its package
    std::uint32_t processors = 0;
    ForEachLine(text, [&](std::string_view line) {
        if (ValueOf(line, "processor", value)) ++processors;
        if (facts.model.empty()) ValueOf(line, "model name", facts.model);
        if (ValueOf(line, "physical id", package)) packages.insert(package);
        if (ValueOf(line, "core id", value)) cores.insert(package + "/" + value);
    });
    if (!packages.empty()) facts.packages = static_cast<std::uint32_t>(packages.size());
    if (!cores.empty()) facts.cores = static_cast<std::uint32_t>(cores.size());
    facts.threadsPerCore = std::max(1u, std::max(processors, facts.logical) / facts.cores);
    return facts;
}

bool RandomBytes(void* buffer, std::size_t count) noexcept {
    char* to = static_cast<char*>(buffer);
    while (count > 0) {
        const ssize_t got = Retry([&] { return systemCalls.getrandom(to, count, 0); });
        if (got <= 0) return FailErrno();
        to += got;
        count -= static_cast<std::size_t>(got);
    }
    return true;
}

}  // namespace tessel::platform
