#include "platform/posix/Folders.h"

#include "platform/posix/Interrupted.h"
#include "platform/posix/NativeNames.h"

#include <cstdlib>
#include <errno.h>
#include <pwd.h>
#include <unistd.h>

namespace tessel::platform {

namespace {

std::string WithoutEnd(std::string folder) {
    while (folder.size() > 1 && folder.back() == '/') folder.pop_back();
    return folder;
}

std::string AccountHome() {
    passwd account{};
    passwd* found = nullptr;
    char buffer[2048];
    bool known = getpwuid_r(systemCalls.getuid(), &account, buffer, sizeof buffer, &found) == 0 && found &&
                 *found->pw_dir == '/';
    return known ? found->pw_dir : "/";
}

}  // namespace

std::string HomeFolder() {
    const char* home = std::getenv("HOME");
    return WithoutEnd(home && *home == '/' ? home : AccountHome());
}

std::string XdgFolder(const char* variable, const char* underHome) {
    const char* value = std::getenv(variable);
    if (value && *value == '/') return WithoutEnd(value);
    std::string home = HomeFolder();
    return (home == "/" ? home : home + "/") + underHome;
}

bool FlushFolder(int folder) {
    // Some file systems cannot flush a folder, and then need not.
    return Retry([&] { return systemCalls.fsync(folder); }) == 0 || errno == EINVAL;
}

bool FlushFolder(const std::string& native) {
    const int folder = OpenRetrying(native.c_str(), O_RDONLY | O_DIRECTORY);
    if (folder < 0) return false;
    const bool flushed = FlushFolder(folder);
    const int error = errno;
    systemCalls.close(folder);
    errno = error;
    return flushed;
}

namespace {

bool MakeFolder(const std::string& native, unsigned mode) {
    if (systemCalls.mkdir(native.c_str(), static_cast<mode_t>(mode)) != 0) return false;
    if (FlushFolder(NativeParent(native))) return true;
    const int error = errno;
    systemCalls.rmdir(native.c_str());
    errno = error;
    return false;
}

}  // namespace

bool MakeFolders(const std::string& native, unsigned mode) {
    if (MakeFolder(native, mode)) return true;
    if (errno == EEXIST) {
        struct statx status;
        if (!StatusOf(native, Links::kFollowed, STATX_TYPE, status)) return false;
        errno = ENOTDIR;
        return S_ISDIR(status.stx_mode);
    }
    std::string parent = NativeParent(native);
    if (errno != ENOENT || parent == native || !MakeFolders(parent, mode)) return false;
    return MakeFolder(native, mode) || errno == EEXIST;
}

}  // namespace tessel::platform
