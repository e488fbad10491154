// The recycle bin: the trash of the desktop, as freedesktop.org describes it.
#include "platform/Shell.h"
#include "platform/posix/Copying.h"
#include "platform/posix/Folders.h"
#include "platform/posix/Interrupted.h"
#include "platform/posix/NativeNames.h"
#include "platform/posix/TextFile.h"

#include <cstdio>
#include <errno.h>
#include <linux/fs.h>
#include <set>
#include <string_view>
#include <time.h>
#include <unistd.h>
#include <vector>

namespace tessel::platform {

namespace {

// ---- where it is ----------------------------------------------------------------------------------------------------

// A trash folder, and the folder that the paths in it are relative to (empty: they are absolute).
struct Trash {
    std::string folder, top;
};

bool GetStatus(const std::string& native, struct statx& status) {
    return StatusOf(native, Links::kThemselves, STATX_BASIC_STATS, status);
}

bool SameDevice(const struct statx& a, const struct statx& b) {
    return a.stx_dev_major == b.stx_dev_major && a.stx_dev_minor == b.stx_dev_minor;
}

// The top folder of the file system that holds the item.
std::string TopFolder(const std::string& native, const struct statx& item) {
    std::string top = NativeParent(native);
    struct statx status;
    while (top != "/" && GetStatus(NativeParent(top), status) && SameDevice(status, item)) top = NativeParent(top);
    return top;
}

// Makes a folder where there is none. What is another user's, or a link, is not used: what is thrown away would go
// wherever somebody else wants it.
bool MakeOwnFolder(const std::string& native) {
    struct statx status;
    if (!MakeFolders(native, 0700) || !GetStatus(native, status)) return false;
    if (S_ISDIR(status.stx_mode) && status.stx_uid == systemCalls.geteuid()) return true;
    errno = EACCES;
    return false;
}

bool MakeTrash(const std::string& folder) {
    return MakeOwnFolder(folder) && MakeOwnFolder(folder + "/files") && MakeOwnFolder(folder + "/info");
}

// Whether another place may do where this one does not: it is not the user's to make or to use.
bool MayBeElsewhere(int error) {
    return error == EACCES || error == EPERM || error == EROFS || error == ENOTDIR || error == ENOENT || error == ELOOP;
}

// The home trash for what lies on its file system; else that at the top of the item's own: the shared one if it is set
// up as it must be (a real folder with the sticky bit), else one of the user's.
bool FindTrash(const std::string& native, const struct statx& item, Trash& trash) {
    struct statx status;
    trash = {XdgFolder("XDG_DATA_HOME", ".local/share") + "/Trash", ""};
    const bool home = MakeTrash(trash.folder) && GetStatus(trash.folder, status);
    if (home && SameDevice(status, item)) return true;
    if (!home && !MayBeElsewhere(errno)) return false;
    trash.top = TopFolder(native, item);
    const std::string prefix = trash.top == "/" ? "/" : trash.top + "/";
    const std::string user = std::to_string(systemCalls.getuid());
    const bool shared = GetStatus(prefix + ".Trash", status) && S_ISDIR(status.stx_mode) && (status.stx_mode & S_ISVTX);
    trash.folder = prefix + ".Trash/" + user;
    if (shared && MakeTrash(trash.folder)) return true;
    trash.folder = prefix + ".Trash-" + user;
    return MakeTrash(trash.folder);
}

// ---- what it says of an item ----------------------------------------------------------------------------------------

constexpr std::string_view kInfoEnd = ".trashinfo";
constexpr std::string_view kMark = "\nX-Tessel=1\n";  // in those that were made here

std::string PercentEncoded(std::string_view path) {
    constexpr std::string_view kPlain = "ABCDEFGHIJKLMNOPQRSTUVWXYZabcdefghijklmnopqrstuvwxyz0123456789/-_.~";
    std::string encoded;
    for (char c : path) {
        char text[4] = {c};
        if (kPlain.find(c) == std::string_view::npos) {
            std::snprintf(text, sizeof text, "%%%02X", static_cast<unsigned char>(c));
        }
        encoded += text;
    }
    return encoded;
}

std::string TrashInfo(const std::string& native, const Trash& trash) {
    timespec now{};
    systemCalls.clock_gettime(CLOCK_REALTIME, &now);
    tm local{};
    localtime_r(&now.tv_sec, &local);
    char date[32];
    ::strftime(date, sizeof date, "%Y-%m-%dT%H:%M:%S", &local);
    std::string_view path = native;
    if (!trash.top.empty()) path.remove_prefix(trash.top == "/" ? 1 : trash.top.size() + 1);
    return "[Trash Info]\nPath=" + PercentEncoded(path) + "\nDeletionDate=" + date + std::string(kMark);
}

// ---- what was left on the way ---------------------------------------------------------------------------------------

constexpr char kUnfinished[] = ".tessel.trashinfo.new";

bool IsOurs(const std::string& info) {
    constexpr std::size_t kMost = 64 * 1024;
    std::string text;
    return ReadTextFile(info.c_str(), text, kMost) && text.find(kMark) != std::string::npos;
}

// Removes the information about items that never came: whoever wrote it here has ended, as it is our turn. That of
// other programs stays, as they may be about to move theirs.
void ClearStrays(const Trash& trash) {
    const std::string files = trash.folder + "/files", infos = trash.folder + "/info/";
    std::set<std::string> items;
    std::vector<std::string> strays;
    const bool known = VisitFolder(files, [&](DIR*, const dirent& entry) {
        items.emplace(entry.d_name);
        return true;
    });
    if (!known) return;
    VisitFolder(infos, [&](DIR*, const dirent& entry) {
        const std::string_view name = entry.d_name;
        const bool isInfo = name.size() > kInfoEnd.size() && name.substr(name.size() - kInfoEnd.size()) == kInfoEnd;
        if (isInfo && !items.count(std::string(name.substr(0, name.size() - kInfoEnd.size()))))
            strays.emplace_back(name);
        return true;
    });
    for (const std::string& stray : strays) {
        if (IsOurs(infos + stray)) systemCalls.unlink((infos + stray).c_str());
    }
}

// ---- in it ----------------------------------------------------------------------------------------------------------

// The information, written whole before it has its name. False with errno.
bool WriteUnfinished(const std::string& unfinished, const std::string& text) {
    if (systemCalls.unlink(unfinished.c_str()) != 0 && errno != ENOENT) return false;
    return CreateTextFile(unfinished, text);
}

// The item, to its place and on the device there; else back to where it was. False with errno.
bool MoveItem(const std::string& native, const std::string& target) {
    if (!RenameWithoutReplacing(native, target)) return false;
    if (FlushFolder(NativeParent(target)) && FlushFolder(NativeParent(native))) return true;
    const int error = errno;
    RenameWithoutReplacing(target, native);
    errno = error;
    return false;
}

// The information first, which takes the name; then the item itself. False with errno; EEXIST when the name is taken.
bool PutIntoTrash(const std::string& native, const Trash& trash, const std::string& name) {
    const std::string info = trash.folder + "/info/" + name + std::string(kInfoEnd);
    const std::string unfinished = trash.folder + "/info/" + kUnfinished;
    if (!RenameWithoutReplacing(unfinished, info)) return false;
    if (FlushFolder(trash.folder + "/info") && MoveItem(native, trash.folder + "/files/" + name)) return true;
    const int error = errno;
    if (!RenameWithoutReplacing(info, unfinished)) systemCalls.unlink(info.c_str());
    errno = error;
    return false;
}

bool PutUnderFreeName(const std::string& native, const Trash& trash) {
    constexpr int kMostNames = 10'000;
    constexpr std::size_t kMost = 255 - kInfoEnd.size() - sizeof ".10000";
    const std::string last(NativeLast(native).substr(0, kMost));
    for (int number = 1; number <= kMostNames; ++number) {
        if (PutIntoTrash(native, trash, number == 1 ? last : last + "." + std::to_string(number))) return true;
        if (errno != EEXIST) return false;
    }
    return false;
}

}  // namespace

bool ShellTrash(const char* name) {
    std::string native;
    struct statx status;
    if (!NameToAbsoluteNative(name, native)) return false;
    if (!GetStatus(native, status)) return FailErrno();
    Trash trash;
    if (native == "/") return FailWith(kErrorAccessDenied);
    if (!FindTrash(native, status, trash)) return FailErrno();
    const FolderTurn turn(trash.folder + "/info");
    if (turn.IsRefused()) return FailWith(kErrorSharingViolation);
    if (turn.IsHeld()) ClearStrays(trash);
    const std::string unfinished = trash.folder + "/info/" + kUnfinished;
    const bool put = WriteUnfinished(unfinished, TrashInfo(native, trash)) && PutUnderFreeName(native, trash);
    if (put) return true;
    const ErrorNumber reason = ErrorOfErrno(errno);
    systemCalls.unlink(unfinished.c_str());
    return FailWith(reason);
}

}  // namespace tessel::platform
