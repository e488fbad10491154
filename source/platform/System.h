// The machine, the operating system, and its randomness.
#ifndef TESSEL_PLATFORM_SYSTEM_H
#define TESSEL_PLATFORM_SYSTEM_H

#include <cstddef>
#include <cstdint>
#include <string>

namespace tessel::platform {

struct SystemVersion {
    std::string family;                 // "Linux"
    std::string name;                   // of the distribution, in full
    std::string version;                // of the kernel, "6.1.0-18-amd64"
    std::string build;                  // `patch` in digits
    std::uint32_t major, minor, patch;  // the numbers in `version`
};
SystemVersion GetSystemVersion();

// What the processors can do.
constexpr std::uint64_t kCompareExchange8 = 1;   // 8 bytes at once
constexpr std::uint64_t kCompareExchange16 = 2;  // 16 bytes at once

struct ProcessorFacts {
    std::uint32_t logical;         // processors that this process may use
    std::uint32_t cores;           // cores of the machine, 1 when not known
    std::uint32_t packages;        // sockets of the machine, 1 when not known
    std::uint32_t threadsPerCore;  // of the machine, whatever this process may use
    std::uint64_t features;        // of the flags above
    std::string model;             // empty when not known
    std::string trouble;           // why something is not known, for a report; mostly empty
};
ProcessorFacts GetProcessorFacts();

// Bytes from the kernel's generator. False when it has none to give.
bool RandomBytes(void* buffer, std::size_t count) noexcept;

}  // namespace tessel::platform

#endif
