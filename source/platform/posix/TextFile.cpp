#include "platform/posix/TextFile.h"

#include "platform/posix/Interrupted.h"

#include <algorithm>
#include <atomic>
#include <cstdio>
#include <errno.h>
#include <unistd.h>

namespace tessel::platform {

namespace {

// Unlike any other's, in this process or another: who made it, and which it is. Hidden, beside the file it will be.
// Short, as that file's name may be as long as a name can be.
std::string TemporaryName(const std::string& native) {
    static std::atomic<unsigned> number{0};
    char name[48];
    std::snprintf(name, sizeof name, ".%d.%u.tmp", systemCalls.getpid(), number.fetch_add(1));
    std::size_t last = native.rfind('/') + 1;  // 0 when there is no folder
    return native.substr(0, last) + name;
}

}  // namespace

bool ReadTextFile(const char* native, std::string& text, std::size_t most, int folder) {
    text.clear();
    int file = OpenAtRetrying(folder, native, O_RDONLY | O_NONBLOCK);  // a pipe of that name must not make us wait
    if (file < 0) return false;
    char buffer[4096];
    ssize_t moved = 1;
    while (moved != 0 && text.size() < most) {
        moved = Retry([&] { return systemCalls.read(file, buffer, std::min(sizeof buffer, most - text.size())); });
        if (moved < 0) break;
        text.append(buffer, static_cast<std::size_t>(moved));
    }
    int error = errno;
    systemCalls.close(file);
    errno = error;
    return moved >= 0;
}

bool CreateTextFile(const std::string& native, const std::string& data, int folder) {
    int file = OpenAtRetrying(folder, native.c_str(), O_WRONLY | O_CREAT | O_EXCL);
    if (file < 0) return false;
    std::size_t done = 0;
    bool written = WriteAll(file, data.data(), data.size(), done);
    int error = errno;
    if (systemCalls.close(file) != 0 && written) {
        written = false;
        error = errno;
    }
    if (!written) systemCalls.unlinkat(folder, native.c_str(), 0);
    errno = error;
    return written;
}

bool ReplaceFile(const std::string& native, const std::string& data, int folder) {
    constexpr int kTries = 100;  // a process of our number may have ended and left its files behind
    std::string temporary;
    bool made = false;
    for (int i = 0; i < kTries && !made; ++i) {
        temporary = TemporaryName(native);
        made = CreateTextFile(temporary, data, folder);
        if (!made && errno != EEXIST) return false;
    }
    if (!made) return false;
    if (systemCalls.renameat2(folder, temporary.c_str(), folder, native.c_str(), 0) == 0) return true;
    int error = errno;
    systemCalls.unlinkat(folder, temporary.c_str(), 0);
    errno = error;
    return false;
}

}  // namespace tessel::platform
