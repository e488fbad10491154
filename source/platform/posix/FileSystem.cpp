#include "platform/FileSystem.h"

#include "platform/posix/Copying.h"
#include "platform/posix/FileHandles.h"
#include "platform/posix/Folders.h"
#include "platform/posix/Interrupted.h"
#include "platform/posix/NativeNames.h"
#include "platform/posix/TextFile.h"

#include <algorithm>
#include <cstdio>
#include <cstdlib>
#include <cstring>
#include <errno.h>
#include <linux/fs.h>
#include <memory>
#include <sys/stat.h>
#include <unistd.h>

namespace tessel::platform {

// ---- looking --------------------------------------------------------------------------------------------------------

void FillInfo(const struct statx& status, ItemInfo& info) {
    info = {};
    info.folder = S_ISDIR(status.stx_mode);
    info.mode = status.stx_mode & 0777u;
    info.readOnly = (info.mode & 0222u) == 0;
    info.size = info.folder ? 0 : static_cast<std::int64_t>(status.stx_size);
    info.accessed = FileTimeOf(status.stx_atime.tv_sec, status.stx_atime.tv_nsec);
    info.modified = FileTimeOf(status.stx_mtime.tv_sec, status.stx_mtime.tv_nsec);
    if (status.stx_mask & STATX_BTIME) {
        info.created = FileTimeOf(status.stx_btime.tv_sec, status.stx_btime.tv_nsec);
    }
}

namespace {

// A link whose end cannot be reached (it leads nowhere, in a circle, into a closed folder) is described itself, so that
// it can be seen and deleted.
bool GetStatus(const std::string& native, unsigned mask, struct statx& status) {
    return StatusOf(native, Links::kFollowed, mask, status) || StatusOf(native, Links::kThemselves, mask, status);
}

void TakeCreated(const unsigned char (&bytes)[8], ssize_t count, ItemInfo& info) {
    if (count != sizeof bytes) return;
    std::uint64_t time = 0;
    for (int i = 7; i >= 0; --i) time = time << 8 | bytes[i];
    info.created = static_cast<std::int64_t>(time);
}

}  // namespace

bool ItemGetInfo(const char* name, ItemInfo& info) {
    return OnExistingItem(name, [&](const std::string& native) {
        struct statx status;
        if (!GetStatus(native, kInfoMask, status)) return false;
        FillInfo(status, info);
        info.hidden = native != "." && native != ".." && NativeLast(native).substr(0, 1) == ".";
        unsigned char bytes[8];
        TakeCreated(bytes, systemCalls.getxattr(native.c_str(), kCreatedAttribute, bytes, sizeof bytes), info);
        return true;
    });
}

bool FileGetInfo(FileHandle file, ItemInfo& info) {
    int descriptor = DescriptorOf(file);
    struct statx status;
    if (systemCalls.statx(descriptor, "", AT_EMPTY_PATH, kInfoMask, &status) != 0) return FailErrno();
    FillInfo(status, info);
    unsigned char bytes[8];
    TakeCreated(bytes, systemCalls.fgetxattr(descriptor, kCreatedAttribute, bytes, sizeof bytes), info);
    return true;
}

FileVersion VersionOfStatus(const struct statx& status) {
    const std::uint64_t device = std::uint64_t{status.stx_dev_major} << 32 | status.stx_dev_minor;
    return {device, status.stx_ino, static_cast<std::int64_t>(status.stx_size), status.stx_mtime.tv_sec,
            status.stx_mtime.tv_nsec};
}

bool ItemGetVersion(const char* name, FileVersion& version) {
    return OnExistingItem(name, [&](const std::string& native) {
        struct statx status;
        if (!StatusOf(native, Links::kFollowed, kVersionMask, status)) return false;
        version = VersionOfStatus(status);
        return true;
    });
}

bool FileGetVersion(FileHandle file, FileVersion& version) {
    struct statx status;
    if (systemCalls.statx(DescriptorOf(file), "", AT_EMPTY_PATH, kVersionMask, &status) != 0) return FailErrno();
    version = VersionOfStatus(status);
    return true;
}

ItemKind ItemExists(const char* name) {
    ItemKind kind = ItemKind::kNone;
    OnExistingItem(name, [&](const std::string& native) {
        struct statx status;
        if (!GetStatus(native, STATX_TYPE, status)) return false;
        kind = S_ISDIR(status.stx_mode) ? ItemKind::kFolder : ItemKind::kFile;
        return true;
    });
    return kind;
}

bool ItemRealName(const char* name, std::string& real) {
    std::string native, path;
    if (!NameToAbsoluteNative(name, native)) return false;
    bool drive = NativeToName(native, path) && path.size() == 3;  // `T:` and the separator
    real = drive ? "" : NameFromDisk(NativeLast(native));
    return true;
}

bool ItemRealPath(const char* name, std::string& real) {
    std::string native;
    return NameToAbsoluteNative(name, native) && NativeToName(native, real);
}

// ---- folders --------------------------------------------------------------------------------------------------------

namespace {

bool EntryIsFolder(DIR* listing, const dirent& entry) {
    if (entry.d_type != DT_UNKNOWN && entry.d_type != DT_LNK) return entry.d_type == DT_DIR;
    struct statx status;
    return systemCalls.statx(dirfd(listing), entry.d_name, 0, STATX_TYPE, &status) == 0 && S_ISDIR(status.stx_mode);
}

// Calls visit(listing, entry) for all that a folder holds.
template <typename Visitor>
bool VisitItems(const char* name, Visitor visit) {
    return OnExistingItem(name, [&](const std::string& native) {
        return VisitFolder(native, [&](DIR* listing, const dirent& entry) {
            const bool dots = std::strcmp(entry.d_name, ".") == 0 || std::strcmp(entry.d_name, "..") == 0;
            if (!dots) visit(listing, entry);
            return true;
        });
    });
}

}  // namespace

bool FolderList(const char* name, std::vector<FolderEntry>& entries) {
    entries.clear();
    return VisitItems(name, [&](DIR* listing, const dirent& entry) {
        entries.push_back({NameFromDisk(entry.d_name), EntryIsFolder(listing, entry)});
    });
}

bool FolderCount(const char* name, std::int64_t& count) {
    count = 0;
    return VisitItems(name, [&](DIR*, const dirent&) { ++count; });
}

bool FolderCreate(const char* name) {
    std::string native;
    if (!NameToNativeText(name, native)) return false;
    Match match = MatchOnDisk(native);
    if (match == Match::kAll) return FailWith(kErrorAlreadyExists);
    if (match != Match::kLastMissing) return FailMatch(match);
    return systemCalls.mkdir(native.c_str(), 0777) == 0 || FailErrno();
}

namespace {

bool IsLink(const std::string& native) {
    struct statx status;
    return StatusOf(native, Links::kThemselves, STATX_TYPE, status) && S_ISLNK(status.stx_mode);
}

}  // namespace

bool FolderRemove(const char* name) {
    return OnExistingItem(name, [](const std::string& native) {
        if (systemCalls.rmdir(native.c_str()) == 0) return true;
        if (errno != ENOTDIR) return false;
        // A link to a folder goes like a folder; what it leads to stays.
        if (IsLink(native) && IsFolder(native, Links::kFollowed)) return systemCalls.unlink(native.c_str()) == 0;
        errno = ENOTDIR;
        return false;
    });
}

bool FileDelete(const char* name) {
    return OnExistingItem(name, [](const std::string& native) { return systemCalls.unlink(native.c_str()) == 0; });
}

// ---- moving and copying ---------------------------------------------------------------------------------------------

// A file is linked under its new name, which fails when that is taken; a folder cannot be linked.
bool RenameWithoutReplacing(const std::string& from, const std::string& to) {
    if (systemCalls.renameat2(AT_FDCWD, from.c_str(), AT_FDCWD, to.c_str(), RENAME_NOREPLACE) == 0) return true;
    if (errno != EINVAL && errno != ENOSYS) return false;
    if (systemCalls.link(from.c_str(), to.c_str()) == 0) return systemCalls.unlink(from.c_str()) == 0;
    if (errno == EEXIST || errno == EXDEV) return false;
    if (Exists(to)) errno = EEXIST;
    if (errno != ENOENT) return false;
    return systemCalls.renameat2(AT_FDCWD, from.c_str(), AT_FDCWD, to.c_str(), 0) == 0;
}

namespace {

bool SameItem(const std::string& a, const std::string& b) {
    struct statx first, second;
    return StatusOf(a, Links::kThemselves, STATX_INO, first) && StatusOf(b, Links::kThemselves, STATX_INO, second) &&
           SameFile(first, second);
}

// Puts a rename onto the device, or takes it back. False with errno.
bool FlushRename(const std::string& from, const std::string& to) {
    const std::string source = NativeParent(from), target = NativeParent(to);
    if (FlushFolder(target) && (source == target || FlushFolder(source))) return true;
    const int error = errno;
    RenameWithoutReplacing(to, from);
    errno = error;
    return false;
}

bool Rename(const std::string& source, const std::string& wanted, bool otherSpelling) {
    if (RenameWithoutReplacing(source, wanted)) return FlushRename(source, wanted);
    // A file system that ignores case itself takes the new spelling for a name that is taken.
    const bool itself = errno == EEXIST && otherSpelling && SameItem(source, wanted);
    if (!itself || systemCalls.renameat2(AT_FDCWD, source.c_str(), AT_FDCWD, wanted.c_str(), 0) != 0) return false;
    return FlushRename(source, wanted);
}

}  // namespace

bool ItemRename(const char* from, const char* to) {
    std::string source, target;
    if (!NameToAbsoluteNative(from, source) || !NameToAbsoluteText(to, target)) return false;
    std::string respelled = target;
    Match match = MatchOnDisk(respelled);
    // The parent as on the disk, the last part as the caller wants it.
    std::string wanted = NativeParent(respelled);
    {
        const FolderTurn turn(wanted);
        if (match == Match::kLastMissing) match = MatchOnDisk(respelled);
        if (match == Match::kParentMissing || match == Match::kFailed) return FailMatch(match);
        const bool otherSpelling = match == Match::kAll && respelled == source;
        if (match == Match::kAll && !otherSpelling) return FailWith(kErrorAlreadyExists);
        if (wanted != "/") wanted += '/';
        wanted += NativeLast(target);
        if (wanted == source || Rename(source, wanted, otherSpelling)) return true;
    }
    return errno == EXDEV ? MoveAcross(source, from, to) : FailErrno();
}

// ---- permissions ----------------------------------------------------------------------------------------------------

bool ItemSetMode(const char* name, std::uint32_t mode) {
    return OnExistingItem(name, [mode](const std::string& native) {
        return systemCalls.chmod(native.c_str(), static_cast<mode_t>(mode & 0777u)) == 0;
    });
}

bool ItemSetReadOnly(const char* name, bool readOnly) {
    ItemInfo info{};
    if (!ItemGetInfo(name, info)) return false;
    if (info.readOnly == readOnly) return true;
    // Writing comes back to those who may read, as far as new files would get it.
    std::uint32_t writers = (info.mode & 0444u) >> 1 & ~PermissionMask();
    return ItemSetMode(name, readOnly ? info.mode & ~0222u : info.mode | writers | 0200u);
}

std::uint32_t PermissionMask() {
    std::string status;
    ReadTextFile("/proc/self/status", status);
    const std::size_t line = std::min(status.find("Umask:"), status.size());
    unsigned mask = 0;
    if (std::sscanf(status.c_str() + line, "Umask: %o", &mask) == 1) return mask;
    // Without /proc it can only be read by setting it.
    mask = systemCalls.umask(0);
    systemCalls.umask(static_cast<mode_t>(mask));
    return mask;
}

// ---- places ---------------------------------------------------------------------------------------------------------

bool CurrentFolder(std::string& name) {
    std::unique_ptr<char, decltype(&std::free)> folder(systemCalls.getcwd(nullptr, 0), std::free);
    return folder ? NativeToName(folder.get(), name) : FailErrno();
}

bool SetCurrentFolder(const char* name) {
    return OnExistingItem(name, [](const std::string& native) { return systemCalls.chdir(native.c_str()) == 0; });
}

bool TemporaryFolder(std::string& name) {
    const char* folder = std::getenv("TMPDIR");
    if (!NativeToName(folder && *folder == '/' ? folder : "/tmp", name)) return false;
    if (name.size() > 3) name += '\\';  // all but a drive, which has it
    return true;
}

bool VolumeGetSpace(const char* name, VolumeSpace& space) {
    return OnExistingItem(name, [&](const std::string& native) {
        struct statfs status;
        if (systemCalls.statfs(native.c_str(), &status) != 0) return false;
        std::uint64_t unit = static_cast<std::uint64_t>(status.f_frsize ? status.f_frsize : status.f_bsize);
        space.totalBytes = unit * status.f_blocks;
        space.freeBytes = unit * status.f_bavail;
        space.sectorBytes = static_cast<std::uint32_t>(unit);
        return true;
    });
}

}  // namespace tessel::platform
