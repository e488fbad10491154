#include "platform/Debugger.h"

#include "platform/posix/Interrupted.h"

#include <cstdlib>
#include <cstring>
#include <errno.h>
#include <signal.h>
#include <unistd.h>

namespace tessel::platform {

namespace {

void Put(int file, const char* text, std::size_t count) {
    const int savedError = errno;
    std::size_t done = 0;
    WriteAll(file, text, count, done);
    errno = savedError;
}

}  // namespace

bool DebuggerAttached() noexcept {
    char status[2048];  // the line stands near the top
    int file = OpenRetrying("/proc/self/status", O_RDONLY);
    if (file < 0) return false;
    const ssize_t count = Retry([&] { return systemCalls.read(file, status, sizeof status - 1); });
    systemCalls.close(file);
    if (count <= 0) return false;
    status[count] = 0;
    constexpr char kLabel[] = "\nTracerPid:";  // not within another line: a program may be named so
    const char* line = std::strstr(status, kLabel);
    return line && std::strtol(line + sizeof kLabel - 1, nullptr, 10) != 0;
}

void DebuggerBreak() noexcept {
    systemCalls.raise(SIGTRAP);
}

void DebuggerOutput(const char* text) noexcept {
    if (text) Put(STDERR_FILENO, text, std::strlen(text));
}

void ConsoleOutput(const char* text, std::size_t count) noexcept {
    Put(STDOUT_FILENO, text, count);
}

bool ConsoleAllocate() noexcept {
    return false;
}

void ConsoleFree() noexcept {
}

}  // namespace tessel::platform
