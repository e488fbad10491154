#include "platform/posix/RegistryStore.h"

#include "platform/Clock.h"
#include "platform/posix/Folders.h"

#include <errno.h>
#include <new>
#include <unistd.h>
#include <vector>

namespace tessel::platform {

namespace {

constexpr char kPlace[] = ".aside";

// Of what is in a folder.
bool Names(const Folder& folder, std::vector<std::string>& names) {
    names.clear();
    return folder.Visit([&](const dirent& entry) { names.emplace_back(entry.d_name); });
}

}  // namespace

bool Folder::Flush() const {
    // What was opened as a place only cannot be flushed.
    const int file = OpenAtRetrying(number_, ".", O_RDONLY | O_DIRECTORY, 0);
    if (file < 0) return false;
    const bool flushed = FlushFolder(file);
    const int error = errno;
    systemCalls.close(file);
    errno = error;
    return flushed;
}

// ---- turns ----------------------------------------------------------------------------------------------------------

namespace {

constexpr std::uint32_t kMostWaitMs = 10'000;  // a holder is done in milliseconds, unless it was stopped

bool LocksAreMissing(int error) {
    return error == ENOLCK || error == EOPNOTSUPP || error == ENOSYS || error == EINVAL;
}

}  // namespace

StoreLock::StoreLock(const std::string& store, const std::string& root) {
    if (!MakeFolders(store)) {
        error_ = ErrorOfErrno(errno);
        return;
    }
    // The one that was waited for may have been deleted, with its store, meanwhile.
    const std::string name = store + "/.lock", place = root + "/" + kPlace;
    while (Open(name) && Wait()) {
        if (!Leads(name)) continue;
        if (isShared_ && IsFolder(place, Links::kThemselves)) Aside(root).Empty();
        return;
    }
}

bool StoreLock::Leads(const std::string& name) {
    struct statx held, named;
    if (systemCalls.statx(file_, "", AT_EMPTY_PATH, STATX_INO, &held) != 0) return true;
    const bool found = StatusOf(name, Links::kThemselves, STATX_INO, named);
    return found ? held.stx_ino == named.stx_ino : !IsAbsence(errno);
}

StoreLock::~StoreLock() {
    if (file_ >= 0) systemCalls.close(file_);
}

bool StoreLock::Open(const std::string& name) {
    if (file_ >= 0) systemCalls.close(file_);
    file_ = OpenRetrying(name.c_str(), O_RDWR | O_CREAT | O_NOFOLLOW | O_NONBLOCK);
    if (file_ < 0) error_ = ErrorOfErrno(errno);
    return file_ >= 0;
}

bool StoreLock::Wait() {
    const std::uint32_t start = TickMilliseconds();
    for (;;) {
        struct flock range {};
        range.l_type = F_WRLCK;
        if (Retry([&] { return systemCalls.lock(file_, F_OFD_SETLK, &range); }) == 0) return true;
        if (LocksAreMissing(errno)) {
            isShared_ = false;
            return true;
        }
        const bool isHeld = errno == EAGAIN || errno == EACCES;
        if (!isHeld || TickMilliseconds() - start >= kMostWaitMs) {
            error_ = isHeld ? kErrorTimedOut : ErrorOfErrno(errno);
            return false;
        }
        SleepMilliseconds(1);
    }
}

// ---- aside ----------------------------------------------------------------------------------------------------------

Aside::Aside(const std::string& root) : root_(AT_FDCWD, root.c_str(), O_PATH) {
    if (!root_ || (systemCalls.mkdirat(root_.Number(), kPlace, 0700) != 0 && errno != EEXIST)) return;
    place_ = root_.Key(kPlace);
}

Aside::~Aside() {
    const int error = errno;
    if (place_) systemCalls.unlinkat(root_.Number(), kPlace, AT_REMOVEDIR);
    errno = error;
}

std::string Aside::NewName() {
    struct statx status;
    std::string name;
    do name = std::to_string(number_++);
    while (systemCalls.statx(place_.Number(), name.c_str(), AT_SYMLINK_NOFOLLOW, STATX_TYPE, &status) == 0);
    return name;
}

bool Aside::Delete(const Folder& folder, const std::string& item) {
    const std::string name = NewName();
    const int from = folder.Number(), to = place_.Number();
    if (systemCalls.renameat2(from, item.c_str(), to, name.c_str(), 0) != 0) return false;
    if (!folder.Flush() || !place_.Flush()) {
        const int error = errno;
        systemCalls.renameat2(to, name.c_str(), from, item.c_str(), 0);
        errno = error;
        return false;
    }
    Empty();
    return true;
}

// A folder's own content goes up beside it first, so that no depth needs more than two folders at once.
bool Aside::Clear(const std::string& item) {
    if (systemCalls.unlinkat(place_.Number(), item.c_str(), 0) == 0) return true;
    if (systemCalls.unlinkat(place_.Number(), item.c_str(), AT_REMOVEDIR) == 0) return true;
    const Folder folder = place_.Key(item);
    std::vector<std::string> names;
    if (!folder || !Names(folder, names)) return false;
    bool moved = false;
    for (const std::string& name : names) {
        const std::string here = NewName();
        if (systemCalls.renameat2(folder.Number(), name.c_str(), place_.Number(), here.c_str(), 0) == 0) moved = true;
    }
    return moved;
}

void Aside::Empty() noexcept try {
    if (!place_) return;
    std::vector<std::string> names;
    for (bool more = true; more && Names(place_, names) && !names.empty();) {
        more = false;
        for (const std::string& name : names) more = Clear(name) || more;
    }
} catch (const std::bad_alloc&) {
}

}  // namespace tessel::platform
