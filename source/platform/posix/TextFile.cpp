#include "platform/posix/TextFile.h"

#include <errno.h>
#include <fcntl.h>
#include <unistd.h>

#include <atomic>
#include <cstdio>

#include "platform/posix/SystemCalls.h"

namespace tessel::platform {

namespace {

int OpenRetrying(const char* native, int flags, mode_t mode) {
    int file;
    do {
        file = systemCalls.open(native, flags | O_CLOEXEC, mode);
    } while (file < 0 && errno == EINTR);
    return file;
}

bool WriteAll(int file, const std::string& data) {
    for (std::size_t done = 0; done < data.size();) {
        ssize_t moved = systemCalls.write(file, data.data() + done, data.size() - done);
        if (moved < 0 && errno == EINTR) continue;
        if (moved <= 0) return false;
        done += static_cast<std::size_t>(moved);
    }
    return true;
}

/* Unlike any other's, in this process or another: who made it, and which it is. */
std::string TemporaryName(const std::string& native) {
    static std::atomic<unsigned> number{0};
    char ending[48];
    std::snprintf(ending, sizeof ending, ".%d.%u.tmp", ::getpid(), number.fetch_add(1));
    return native + ending;
}

}  // namespace

bool ReadTextFile(const char* native, std::string& text) {
    text.clear();
    int file = OpenRetrying(native, O_RDONLY, 0);
    if (file < 0) return false;
    char buffer[4096];
    ssize_t moved;
    while ((moved = systemCalls.read(file, buffer, sizeof buffer)) != 0) {
        if (moved < 0 && errno != EINTR) break;
        if (moved > 0) text.append(buffer, static_cast<std::size_t>(moved));
    }
    int error = errno;
    systemCalls.close(file);
    errno = error;
    return moved == 0;
}

bool ReplaceFile(const std::string& native, const std::string& data) {
    std::string temporary = TemporaryName(native);
    int file = OpenRetrying(temporary.c_str(), O_WRONLY | O_CREAT | O_EXCL, 0666);
    if (file < 0) return false;
    bool written = WriteAll(file, data);
    int error = errno;
    if (systemCalls.close(file) != 0 && written) {
        written = false;
        error = errno;
    }
    if (written && systemCalls.renameat2(AT_FDCWD, temporary.c_str(), AT_FDCWD, native.c_str(), 0) == 0) return true;
    if (written) error = errno;
    systemCalls.unlink(temporary.c_str());
    errno = error;
    return false;
}

}  // namespace tessel::platform
