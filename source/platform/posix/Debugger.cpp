#include "platform/Debugger.h"

#include "platform/posix/SystemCalls.h"

#include <cstdlib>
#include <cstring>
#include <errno.h>
#include <fcntl.h>
#include <signal.h>
#include <unistd.h>

namespace tessel::platform {

namespace {

void WriteAll(int file, const char* text, std::size_t count) {
    int savedError = errno;
    while (count > 0) {
        ssize_t moved = systemCalls.write(file, text, count);
        if (moved < 0 && errno == EINTR) continue;
        if (moved <= 0) break;
        text += moved;
        count -= static_cast<std::size_t>(moved);
    }
    errno = savedError;
}

}  // namespace

bool DebuggerAttached() noexcept {
    char status[2048];  // the line stands near the top
    int file = systemCalls.open("/proc/self/status", O_RDONLY | O_CLOEXEC, 0);
    if (file < 0) return false;
    ssize_t count = systemCalls.read(file, status, sizeof status - 1);
    systemCalls.close(file);
    if (count <= 0) return false;
    status[count] = 0;
    constexpr char kLabel[] = "TracerPid:";
    const char* line = std::strstr(status, kLabel);
    return line && std::strtol(line + sizeof kLabel - 1, nullptr, 10) != 0;
}

void DebuggerBreak() noexcept {
    ::raise(SIGTRAP);
}

void DebuggerOutput(const char* text) noexcept {
    if (text) WriteAll(STDERR_FILENO, text, std::strlen(text));
}

void ConsoleOutput(const char* text, std::size_t count) noexcept {
    WriteAll(STDOUT_FILENO, text, count);
}

bool ConsoleAllocate() noexcept {
    return false;
}

void ConsoleFree() noexcept {
}

}  // namespace tessel::platform
