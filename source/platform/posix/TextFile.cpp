#include "platform/posix/TextFile.h"

#include "platform/posix/Interrupted.h"

#include <algorithm>
#include <errno.h>

namespace tessel::platform {

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

bool CreateTextFile(const std::string& native, const std::string& data) {
    int file = OpenRetrying(native.c_str(), O_WRONLY | O_CREAT | O_EXCL, 0600);
    if (file < 0) return false;
    std::size_t done = 0;
    bool written = WriteAll(file, data.data(), data.size(), done);
    written = written && Retry([&] { return systemCalls.fsync(file); }) == 0;
    int error = errno;
    if (systemCalls.close(file) != 0 && written && errno != EINTR) {
        written = false;
        error = errno;
    }
    if (!written) systemCalls.unlink(native.c_str());
    errno = error;
    return written;
}

}  // namespace tessel::platform
