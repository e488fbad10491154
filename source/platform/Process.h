// The process: its end, its arguments, its environment.
#ifndef TESSEL_PLATFORM_PROCESS_H
#define TESSEL_PLATFORM_PROCESS_H

#include <cstdint>
#include <string>
#include <string_view>
#include <vector>

namespace tessel::platform {

// Ends the process at once: no destructors, no exit handlers, so it works from any thread in any state.
[[noreturn]] void ProcessExit(int status) noexcept;

std::uint32_t ProcessId() noexcept;

// The arguments that the process was started with, the program's name first. Empty when the host does not tell.
std::vector<std::string> ProcessArguments();

// False when there is no such variable. Not while another thread changes the environment.
bool EnvironmentGet(const char* name, std::string& value);

// The value as the host keeps it, or null; valid until the environment changes.
const char* EnvironmentGet(const char* name) noexcept;

// The text with each `%NAME%` of a variable that exists replaced by its value.
std::string EnvironmentExpand(std::string_view text);

}  // namespace tessel::platform

#endif
