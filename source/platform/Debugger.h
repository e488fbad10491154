// The debugger and the console. None of it fails. Any thread.
#ifndef TESSEL_PLATFORM_DEBUGGER_H
#define TESSEL_PLATFORM_DEBUGGER_H

#include <cstddef>

namespace tessel::platform {

bool DebuggerAttached() noexcept;

// Breaks into the debugger. Without one the process ends.
void DebuggerBreak() noexcept;

// Text for whoever debugs: one write of the whole, standard error here. Null writes nothing.
void DebuggerOutput(const char* text) noexcept;

// Text for the user at the console: standard output here.
void ConsoleOutput(const char* text, std::size_t count) noexcept;

// Makes sure that there is a console. True when one had to be made, which ConsoleFree then takes away (never here).
bool ConsoleAllocate() noexcept;
void ConsoleFree() noexcept;

}  // namespace tessel::platform

#endif
