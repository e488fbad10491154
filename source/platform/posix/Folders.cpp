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

bool MakeFolders(const std::string& native, unsigned mode) {
    if (systemCalls.mkdir(native.c_str(), static_cast<mode_t>(mode)) == 0) return true;
    if (errno == EEXIST) {
        if (IsFolder(native, Links::kFollowed)) return true;
        errno = ENOTDIR;
        return false;
    }
    std::string parent = NativeParent(native);
    if (errno != ENOENT || parent == native || !MakeFolders(parent, mode)) return false;
    return systemCalls.mkdir(native.c_str(), static_cast<mode_t>(mode)) == 0 || errno == EEXIST;
}

}  // namespace tessel::platform
