// The kernel's calls as this backend means them: a signal that interrupts one is no failure, a short write goes on, and
// it is said whether a link is meant or what it leads to. All set errno on failure.
#ifndef TESSEL_PLATFORM_POSIX_INTERRUPTED_H
#define TESSEL_PLATFORM_POSIX_INTERRUPTED_H

#include "platform/posix/SystemCalls.h"

#include <dirent.h>
#include <errno.h>
#include <memory>
#include <string>

namespace tessel::platform {

// Makes a call until no signal interrupts it.
template <typename Call>
auto Retry(Call call) {
    for (;;) {
        const auto result = call();
        if (result != -1 || errno != EINTR) return result;
    }
}

// The descriptor does not live on in other programs.
inline int OpenRetrying(const char* native, int flags, mode_t mode = 0666) {
    return Retry([&] { return systemCalls.open(native, flags | O_CLOEXEC, mode); });
}

// The same for a name within an open folder.
inline int OpenAtRetrying(int folder, const char* name, int flags, mode_t mode = 0666) {
    return Retry([&] { return systemCalls.openat(folder, name, flags | O_CLOEXEC, mode); });
}

// `done` counts the bytes that were written, also after a failure. ENOSPC when the host takes none without an error.
inline bool WriteAll(int file, const void* data, std::size_t count, std::size_t& done) {
    done = 0;
    while (done < count) {
        const char* from = static_cast<const char*>(data) + done;
        const ssize_t moved = Retry([&] { return systemCalls.write(file, from, count - done); });
        if (moved == 0) errno = ENOSPC;
        if (moved <= 0) return false;
        done += static_cast<std::size_t>(moved);
    }
    return true;
}

// Reads until `count` bytes or the end of the file; `done` counts them, also after a failure.
inline bool ReadAll(int file, void* to, std::size_t count, std::size_t& done) {
    done = 0;
    while (done < count) {
        char* at = static_cast<char*>(to) + done;
        const ssize_t moved = Retry([&] { return systemCalls.read(file, at, count - done); });
        if (moved < 0) return false;
        if (moved == 0) break;
        done += static_cast<std::size_t>(moved);
    }
    return true;
}

// Whether a failure says that there is no such item, rather than that the host could not look.
inline bool IsAbsence(int error) {
    return error == ENOENT || error == ENOTDIR;
}

// Of a name that is a link: what it leads to, or the link itself.
enum class Links { kFollowed, kThemselves };

inline bool StatusOf(const std::string& native, Links links, unsigned mask, struct statx& status) {
    const int flags = links == Links::kFollowed ? 0 : AT_SYMLINK_NOFOLLOW;
    return systemCalls.statx(AT_FDCWD, native.c_str(), flags, mask, &status) == 0;
}

// Of a link: the link itself.
// False with errno: only IsAbsence says that it is not there.
inline bool Exists(const std::string& native) {
    struct statx status;
    return StatusOf(native, Links::kThemselves, STATX_TYPE, status);
}

inline bool IsFolder(const std::string& native, Links links) {
    struct statx status;
    return StatusOf(native, links, STATX_TYPE, status) && S_ISDIR(status.stx_mode);
}

// Calls visit(listing, entry) for each entry, `.` and `..` too, until it returns false. False with errno when not all
// could be had.
template <typename Visitor>
bool VisitListing(DIR* listing, Visitor visit) {
    for (;;) {
        errno = 0;
        const dirent* entry = systemCalls.readdir(listing);
        if (!entry && errno == EINTR) continue;
        if (!entry) return errno == 0;
        if (!visit(listing, *entry)) return true;
    }
}

// Calls visit(listing, entry) for each entry of a folder, `.` and `..` too, until it returns false. False with errno
// when the folder cannot be listed, or not to its end.
template <typename Visitor>
bool VisitFolder(const std::string& native, Visitor visit) {
    DIR* opened = nullptr;
    do opened = systemCalls.opendir(native.c_str());
    while (!opened && errno == EINTR);
    const std::unique_ptr<DIR, int (*)(DIR*)> listing(opened, systemCalls.closedir);
    return listing && VisitListing(listing.get(), visit);
}

}  // namespace tessel::platform

#endif
