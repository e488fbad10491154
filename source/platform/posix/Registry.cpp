#include "platform/Registry.h"

#include "platform/CodePage.h"
#include "platform/posix/Folders.h"
#include "platform/posix/NativeNames.h"
#include "platform/posix/RegistryStore.h"
#include "platform/posix/TextFile.h"

#include <algorithm>
#include <atomic>
#include <charconv>
#include <climits>
#include <cstdio>
#include <cstdlib>
#include <errno.h>
#include <linux/fs.h>
#include <string_view>
#include <unistd.h>
#include <vector>

// On the disk:
//
//   <store>/HKEY_LOCAL_MACHINE/SOFTWARE/Maker/=Path
//
// A key is a folder of its name; a value is a file of its name behind `=`, so that the two never meet. `%` and two
// hexadecimal digits stand for a byte that a file's name cannot have, or that would read as something else. Names that
// begin with a dot belong to the store: its lock, and beside the keys of a root the folder `.aside`, in which values
// and keys are on their way in or out. The 64-bit view is a store of its own in the folder `.view64`.
//
// A name too long for the host is `%~` and a hash of the name without regard to case; the name itself is in the file
// `.name` of the key's folder, or in the value's file before the data. Keys may lie deeper than the host's longest path
// reaches: what is in a key's folder is named from there.
//
// A value's file holds `REG `, the type in decimal digits, a line feed, and the raw data; behind the type of one with a
// long name stand a blank and the length of the name. What a folder holds otherwise, links to other folders too, is
// none of the registry's and goes with its key.

namespace tessel::platform {

struct RegistryKey {
    std::string store;       // the host's name of the folder that holds all
    std::string rootFolder;  // of its root
    std::string folder;      // the host's name; that of a root need not exist
    bool root, write;
    mutable std::atomic<bool> wasThere;        // of a root's folder: when it is missing now, it has vanished
    mutable std::vector<std::string> listing;  // of the enumeration under way
};

namespace {

ErrorNumber ErrnoNumber() {
    return ErrorOfErrno(errno);
}

// ---- names ----------------------------------------------------------------------------------------------------------

constexpr char kValueMark = '=';

std::string Escaped(std::string_view name) {
    std::string escaped;
    for (std::size_t i = 0; i < name.size(); ++i) {
        unsigned char byte = static_cast<unsigned char>(name[i]);
        bool special = byte < 0x20 || byte == '/' || byte == '%' || (i == 0 && (byte == '.' || byte == kValueMark));
        char text[4] = {name[i]};
        if (special) std::snprintf(text, sizeof text, "%%%02X", byte);
        escaped += text;
    }
    return escaped;
}

std::string Unescaped(std::string_view escaped) {
    std::string name;
    for (std::size_t i = 0; i < escaped.size(); ++i) {
        unsigned byte = 0;
        bool special = escaped[i] == '%' && i + 2 < escaped.size() &&
                       std::from_chars(&escaped[i + 1], &escaped[i + 1] + 2, byte, 16).ptr == &escaped[i + 1] + 2;
        name += special ? static_cast<char>(byte) : escaped[i];
        if (special) i += 2;
    }
    return name;
}

// Between the code page of the library and the UTF-8 of the disk.
std::string ForDisk(const char* name) {
    std::string text = name ? name : "";
    if (ActiveCodePage().utf8) return text;
    std::string utf8;
    ToUtf8(text, utf8);
    return utf8;
}

std::string FromDisk(const std::string& text) {
    if (ActiveCodePage().utf8) return text;
    std::string name;
    FromUtf8(text, name);
    return name;
}

constexpr std::string_view kHashed = "%~";  // no escaped byte begins so
constexpr const char* kNameFile = ".name";

bool IsHashed(std::string_view diskName) {
    return diskName.substr(0, kHashed.size()) == kHashed;
}

// 128 bits of a name without regard to case: two never meet by chance.
std::string HashText(std::string_view name) {
    constexpr std::uint64_t kPrime = 0x100000001B3u;
    std::uint64_t first = 0xCBF29CE484222325u, second = 0x9E3779B97F4A7C15u;
    while (!name.empty()) {
        const char32_t character = TakeUpper(name);
        first = (first ^ character) * kPrime;
        second = (second + character) * kPrime;
        second ^= second >> 29;
    }
    char text[33];
    std::snprintf(text, sizeof text, "%016llx%016llx", static_cast<unsigned long long>(first),
                  static_cast<unsigned long long>(second));
    return text;
}

// The name on the disk of a key or, behind the mark, of a value; without the mark.
std::string DiskNameOf(std::string_view name) {
    constexpr std::size_t kLongest = 255 - sizeof kValueMark;
    std::string escaped = Escaped(name);
    return escaped.size() <= kLongest ? escaped : std::string(kHashed) + HashText(name);
}

// The name of a key that was written by earlier versions fills the last byte too.
std::string KeyDiskNameOf(std::string_view name) {
    std::string escaped = Escaped(name);
    return escaped.size() <= 255 ? escaped : DiskNameOf(name);
}

std::string ValueFileName(const char* name) {
    return kValueMark + DiskNameOf(ForDisk(name));
}

struct KeyName {
    std::string name, disk;  // both in UTF-8
};

std::vector<KeyName> PathParts(const char* path) {
    std::vector<KeyName> parts;
    std::string text = ForDisk(path);
    for (std::size_t start = 0; start <= text.size();) {
        std::size_t end = std::min(text.find('\\', start), text.size());
        if (end > start) {
            std::string name = text.substr(start, end - start);
            std::string disk = KeyDiskNameOf(name);
            parts.push_back({std::move(name), std::move(disk)});
        }
        start = end + 1;
    }
    return parts;
}

// ---- the store ------------------------------------------------------------------------------------------------------

// Empty when the setting names none: a relative one would lie elsewhere for every process.
std::string StoreFolder() {
    const char* setting = std::getenv("TESSEL_REGISTRY");
    if (setting && *setting) return *setting == '/' ? setting : "";
    return XdgFolder("XDG_CONFIG_HOME", ".config") + "/tessel/registry";
}

// ---- folders --------------------------------------------------------------------------------------------------------

// Of a key, in steps of what the host takes at once. The user may have put a root elsewhere by a link.
Folder FolderOf(const RegistryKey* key) {
    std::string_view path = key->folder;
    Folder folder;
    int from = AT_FDCWD;
    while (path.size() >= PATH_MAX) {
        const std::size_t length = path.rfind('/', PATH_MAX - 1);
        folder = Folder(from, std::string(path.substr(0, length)).c_str(), O_PATH | O_NOFOLLOW);
        if (!folder) return folder;
        from = folder.Number();
        path.remove_prefix(length + 1);
    }
    Folder last(from, std::string(path).c_str(), key->root ? O_PATH : O_PATH | O_NOFOLLOW);
    if (last && key->root) key->wasThere = true;
    return last;
}

bool IsMissing(int error) {
    return error == ENOENT || error == ENOTDIR || error == ELOOP;
}

// Of a key whose folder could not be opened: 1018 when it has been there, and is gone.
ErrorNumber LostNumber() {
    return IsMissing(errno) ? kErrorKeyDeleted : ErrnoNumber();
}

// A root is always there, if only by name, as long as nothing has been put into it.
bool IsUnmadeRoot(const RegistryKey* key) {
    return key->root && !key->wasThere && IsMissing(errno);
}

enum class Kind { kKey, kValue, kOther };

// False with errno.
bool KindOf(const Folder& folder, const dirent& entry, Kind& kind) {
    kind = entry.d_name[0] == kValueMark ? Kind::kValue : Kind::kOther;
    if (entry.d_name[0] == kValueMark || entry.d_name[0] == '.') return true;
    bool isFolder = entry.d_type == DT_DIR;
    if (entry.d_type == DT_UNKNOWN) {
        isFolder = static_cast<bool>(folder.Key(entry.d_name));
        if (!isFolder && !IsMissing(errno)) return false;
    }
    if (isFolder) kind = Kind::kKey;
    return true;
}

// Calls visit(name on the disk, kind) for all that a key's folder holds; visit returns an error number.
template <typename Visitor>
ErrorNumber VisitItems(const Folder& folder, Visitor visit) {
    ErrorNumber number = kErrorSuccess;
    const bool all = folder.Visit([&](const dirent& entry) {
        Kind kind;
        if (number != kErrorSuccess) return;
        number = KindOf(folder, entry, kind) ? visit(std::string_view(entry.d_name), kind) : ErrnoNumber();
    });
    return all || number != kErrorSuccess ? number : ErrnoNumber();
}

// Calls visit(folder, name on the disk, kind) for all that a key holds.
template <typename Visitor>
ErrorNumber VisitKey(const RegistryKey* key, Visitor visit) {
    const Folder folder = FolderOf(key);
    if (!folder) return IsUnmadeRoot(key) ? kErrorSuccess : LostNumber();
    return VisitItems(folder, [&](std::string_view name, Kind kind) { return visit(folder, name, kind); });
}

// The item of `folder` with that name, in whatever case; the name as given where there is none. The first in byte order
// where several are, so that the answer does not hang on the order of the listing. False with errno when the folder
// does not tell.
bool ItemIn(const Folder& folder, const std::string& diskName, std::string& item) {
    struct statx status;
    item = diskName;
    if (systemCalls.statx(folder.Number(), item.c_str(), AT_SYMLINK_NOFOLLOW, STATX_TYPE, &status) == 0) return true;
    if (!IsAbsence(errno)) return false;
    std::string found;
    const bool listed = folder.Visit([&](const dirent& entry) {
        if (EqualNames(entry.d_name, diskName) && (found.empty() || found > entry.d_name)) found = entry.d_name;
    });
    if (!found.empty()) item = found;
    return listed;
}

// ---- on the way in --------------------------------------------------------------------------------------------------

// Writes a new file in `folder` and puts it onto the device, with the permissions and the owner of `like` where it is
// given. False with errno; then there is none.
bool WriteFile(const Folder& folder, const std::string& name, const std::string& text, const struct statx* like) {
    const int flags = O_WRONLY | O_CREAT | O_EXCL | O_NOFOLLOW;
    const int file = OpenAtRetrying(folder.Number(), name.c_str(), flags, like ? 0600 : 0666);
    if (file < 0) return false;
    std::size_t done = 0;
    bool written = WriteAll(file, text.data(), text.size(), done);
    if (written && like) {
        // Not everybody may give a file away: then it is the writer's, as the old one would be for one who may.
        written = systemCalls.fchown(file, like->stx_uid, like->stx_gid) == 0 || errno == EPERM;
        written = written && systemCalls.fchmod(file, like->stx_mode & 07777u) == 0;
    }
    written = written && Retry([&] { return systemCalls.fsync(file); }) == 0;
    int error = errno;
    if (systemCalls.close(file) != 0 && written && errno != EINTR) {
        written = false;
        error = errno;
    }
    if (!written) systemCalls.unlinkat(folder.Number(), name.c_str(), 0);
    errno = error;
    return written;
}

// Gives what lies aside under `name` its place, for good. What had the place lies aside then. It stays where it was,
// and what is aside is deleted, when that cannot be put onto the device. False with errno.
bool TakePlace(Aside& aside, const std::string& name, const Folder& folder, const std::string& item, bool replaces) {
    const int from = aside.Place().Number(), to = folder.Number();
    unsigned flags = replaces ? RENAME_EXCHANGE : 0;
    bool placed = systemCalls.renameat2(from, name.c_str(), to, item.c_str(), flags) == 0;
    if (!placed && replaces && (errno == EINVAL || errno == ENOSYS)) {  // a file system that cannot exchange names
        flags = 0;
        placed = systemCalls.renameat2(from, name.c_str(), to, item.c_str(), flags) == 0;
    }
    const bool flushed = placed && folder.Flush() && aside.Place().Flush();
    const int error = errno;
    const bool mayGoBack = !replaces || flags != 0;
    if (placed && !flushed && mayGoBack) systemCalls.renameat2(to, item.c_str(), from, name.c_str(), flags);
    aside.Empty();
    errno = error;
    return flushed;
}

// Makes a key's folder. One with a long name is made aside, and takes its place when that stands in it: nobody ever
// sees a key without its name.
bool MakeKeyFolder(Aside& aside, const Folder& parent, const KeyName& part) {
    if (!IsHashed(part.disk)) {
        if (systemCalls.mkdirat(parent.Number(), part.disk.c_str(), 0777) != 0) return false;
        if (parent.Flush()) return true;
        const int error = errno;
        systemCalls.unlinkat(parent.Number(), part.disk.c_str(), AT_REMOVEDIR);
        errno = error;
        return false;
    }
    if (!aside) return false;
    const std::string unfinished = aside.NewName();
    if (systemCalls.mkdirat(aside.Place().Number(), unfinished.c_str(), 0777) != 0) return false;
    const Folder folder = aside.Place().Key(unfinished);
    if (folder && WriteFile(folder, kNameFile, part.name, nullptr) && folder.Flush())
        return TakePlace(aside, unfinished, parent, part.disk, false);
    const int error = errno;
    aside.Empty();
    errno = error;
    return false;
}

// Goes from a key down, and makes what is missing where there is an `aside`. `path` becomes that of what was found, in
// the spelling of the disk.
Folder Descend(const RegistryKey* key, const std::vector<KeyName>& parts, Aside* aside, std::string& path) {
    Folder folder = FolderOf(key);
    path = key->folder;
    for (const KeyName& part : parts) {
        std::string item;
        if (!folder || !ItemIn(folder, part.disk, item)) return Folder();
        Folder next = folder.Key(item);
        if (!next && errno == ENOENT && aside && (MakeKeyFolder(*aside, folder, part) || errno == EEXIST))
            next = folder.Key(item);
        (path += '/') += item;
        folder = std::move(next);
    }
    return folder;
}

}  // namespace

// ---- keys -----------------------------------------------------------------------------------------------------------

ErrorNumber RegistryOpenRoot(RegistryRoot root, std::uint32_t view, RegistryKey*& key) {
    constexpr const char* kNames[] = {"HKEY_CLASSES_ROOT", "HKEY_CURRENT_CONFIG", "HKEY_CURRENT_USER",
                                      "HKEY_DYN_DATA",     "HKEY_LOCAL_MACHINE",  "HKEY_PERFORMANCE_DATA",
                                      "HKEY_USERS"};
    key = nullptr;
    if (view != kRegistryDefaultView && view != kRegistryView64) return kErrorInvalidParameter;
    std::string store = StoreFolder();
    if (store.empty()) return kErrorInvalidName;
    std::string folder = store + (view == kRegistryView64 ? "/.view64/" : "/") + kNames[static_cast<int>(root)];
    const bool isThere = IsFolder(folder, Links::kFollowed);
    key = new RegistryKey{std::move(store), folder, folder, true, true, isThere, {}};
    return kErrorSuccess;
}

namespace {

RegistryKey* NewKey(const RegistryKey* parent, std::string&& folder, bool root, bool write) {
    return new RegistryKey{
        parent->store, parent->rootFolder, std::move(folder), root, write, parent->wasThere.load(), {}};
}

}  // namespace

ErrorNumber RegistryOpen(const RegistryKey* parent, const char* path, bool write, RegistryKey*& key) {
    key = nullptr;
    if (!parent) return kErrorInvalidHandle;
    const std::vector<KeyName> parts = PathParts(path);
    std::string name = parent->folder;
    const bool root = parent->root && parts.empty();
    if (!root) {
        if (!FolderOf(parent)) return IsUnmadeRoot(parent) ? kErrorFileNotFound : LostNumber();
        const Folder folder = Descend(parent, parts, nullptr, name);
        if (!folder) return IsMissing(errno) ? kErrorFileNotFound : ErrnoNumber();
        if (write && ::faccessat(folder.Number(), ".", W_OK, 0) != 0) return ErrnoNumber();
    }
    key = NewKey(parent, std::move(name), root, write);
    return kErrorSuccess;
}

ErrorNumber RegistryCreate(const RegistryKey* parent, const char* path, RegistryKey*& key) {
    key = nullptr;
    if (!parent) return kErrorInvalidHandle;
    StoreLock lock(parent->store, parent->rootFolder);
    if (lock.Error() != kErrorSuccess) return lock.Error();
    if (parent->root && !MakeFolders(parent->folder)) return ErrnoNumber();
    if (!FolderOf(parent)) return LostNumber();
    const std::vector<KeyName> parts = PathParts(path);
    Aside aside(parent->rootFolder);
    std::string name;
    if (!Descend(parent, parts, &aside, name)) return IsMissing(errno) ? kErrorAccessDenied : ErrnoNumber();
    key = NewKey(parent, std::move(name), parent->root && parts.empty(), true);
    return kErrorSuccess;
}

ErrorNumber RegistryClose(RegistryKey* key) {
    if (!key) return kErrorInvalidHandle;
    delete key;
    return kErrorSuccess;
}

ErrorNumber RegistryDelete(const RegistryKey* parent, const char* path) {
    if (!parent) return kErrorInvalidHandle;
    std::vector<KeyName> parts = PathParts(path);
    if (parts.empty()) return kErrorInvalidParameter;
    StoreLock lock(parent->store, parent->rootFolder);
    if (lock.Error() != kErrorSuccess) return lock.Error();
    const std::string last = parts.back().disk;
    parts.pop_back();
    std::string above, item;
    const Folder folder = Descend(parent, parts, nullptr, above);
    const bool found = folder && ItemIn(folder, last, item) && folder.Key(item);
    if (!found) return IsMissing(errno) ? kErrorFileNotFound : ErrnoNumber();
    Aside aside(parent->rootFolder);
    return aside && aside.Delete(folder, item) ? kErrorSuccess : ErrnoNumber();
}

ErrorNumber RegistryCounts(const RegistryKey* key, std::uint32_t& subKeys, std::uint32_t& values) {
    subKeys = values = 0;
    if (!key) return kErrorInvalidHandle;
    return VisitKey(key, [&](const Folder&, std::string_view, Kind kind) {
        if (kind == Kind::kKey) ++subKeys;
        if (kind == Kind::kValue) ++values;
        return kErrorSuccess;
    });
}

namespace {

constexpr std::string_view kValueHeader = "REG ";
constexpr std::size_t kLongestHeader = kValueHeader.size() + 22;  // two numbers, the blank and the line feed

// Of a value's file: what stands where. `length` is that of the name before the data.
struct ValueHeader {
    std::uint32_t type = 0;
    std::size_t size = 0, length = 0;
};

bool ParseHeader(const std::string& text, bool hashed, ValueHeader& header) {
    if (text.compare(0, kValueHeader.size(), kValueHeader) != 0) return false;
    const char* const end = text.data() + text.size();
    std::from_chars_result number = std::from_chars(text.data() + kValueHeader.size(), end, header.type);
    if (number.ec == std::errc() && hashed && number.ptr != end && *number.ptr == ' ')
        number = std::from_chars(number.ptr + 1, end, header.length);
    if (number.ec != std::errc() || number.ptr == end || *number.ptr != '\n') return false;
    header.size = static_cast<std::size_t>(number.ptr + 1 - text.data());
    return header.length <= text.size() - header.size;
}

// The name of what stands in a key's folder, in UTF-8. 2 when it is none of ours.
ErrorNumber NameOfItem(const Folder& folder, std::string_view item, Kind kind, std::string& name) {
    constexpr std::size_t kMost = 1024 * 1024;
    const std::string_view disk = item.substr(kind == Kind::kValue ? 1 : 0);
    name = Unescaped(disk);
    if (!IsHashed(disk)) return kErrorSuccess;
    std::string file(item);
    if (kind == Kind::kKey) (file += '/') += kNameFile;
    if (!ReadTextFile(file.c_str(), name, kMost, folder.Number()))
        return IsMissing(errno) || errno == EISDIR ? kErrorFileNotFound : ErrnoNumber();
    if (kind == Kind::kKey) return kErrorSuccess;
    ValueHeader header;
    if (!ParseHeader(name, true, header)) return kErrorFileNotFound;
    name = name.substr(header.size, header.length);
    return kErrorSuccess;
}

// The first index lists the folder, the others read on in that listing.
ErrorNumber Enumerate(const RegistryKey* key, Kind kind, std::uint32_t index, std::string& name) {
    if (!key) return kErrorInvalidHandle;
    if (index == 0) {
        key->listing.clear();
        ErrorNumber number = VisitKey(key, [&](const Folder& folder, std::string_view item, Kind itemKind) {
            std::string found;
            if (itemKind != kind) return kErrorSuccess;
            const ErrorNumber named = NameOfItem(folder, item, kind, found);
            if (named == kErrorSuccess) key->listing.push_back(FromDisk(found));
            return named == kErrorFileNotFound ? kErrorSuccess : named;
        });
        if (number != kErrorSuccess) return number;
        std::sort(key->listing.begin(), key->listing.end());
    }
    if (index >= key->listing.size()) return kErrorNoMoreItems;
    name = key->listing[index];
    return kErrorSuccess;
}

}  // namespace

ErrorNumber RegistryEnumerateKey(const RegistryKey* key, std::uint32_t index, std::string& name) {
    return Enumerate(key, Kind::kKey, index, name);
}

ErrorNumber RegistryEnumerateValue(const RegistryKey* key, std::uint32_t index, std::string& name) {
    return Enumerate(key, Kind::kValue, index, name);
}

// ---- values ---------------------------------------------------------------------------------------------------------

namespace {

constexpr std::size_t kLongestName = 1024 * 1024;  // bytes of a value's name before its data

// As the name is spelled first: a name that fits costs no look at the folder. No more is read than a value may have,
// and a byte: a damaged store must not take all memory.
ErrorNumber ReadValueFile(const RegistryKey* key, const std::string& diskName, std::string& text) {
    constexpr std::size_t kMost = kLongestHeader + kLongestName + kLargestRegistryValue + 1;
    if (ReadTextFile((key->folder + "/" + diskName).c_str(), text, kMost)) return kErrorSuccess;
    if (!IsAbsence(errno) && errno != ENAMETOOLONG) return ErrnoNumber();
    const Folder folder = FolderOf(key);
    if (!folder) return IsUnmadeRoot(key) ? kErrorFileNotFound : LostNumber();
    std::string item;
    const bool read = ItemIn(folder, diskName, item) && ReadTextFile(item.c_str(), text, kMost, folder.Number());
    return read ? kErrorSuccess : ErrnoNumber();
}

bool ParseValue(std::string& text, bool hashed, std::uint32_t& type) {
    ValueHeader header;
    if (!ParseHeader(text, hashed, header)) return false;
    type = header.type;
    text.erase(0, header.size + header.length);
    return text.size() <= kLargestRegistryValue;
}

// Under the lock. False with errno; then the old value is there.
bool WriteValue(const RegistryKey* key, const Folder& folder, const std::string& file, const std::string& text) {
    std::string item;
    if (!ItemIn(folder, file, item)) return false;
    constexpr unsigned kMask = STATX_TYPE | STATX_MODE | STATX_UID | STATX_GID;
    struct statx old;
    const bool isThere = systemCalls.statx(folder.Number(), item.c_str(), AT_SYMLINK_NOFOLLOW, kMask, &old) == 0;
    if (!isThere && !IsAbsence(errno)) return false;
    Aside aside(key->rootFolder);
    if (!aside) return false;
    const std::string name = aside.NewName();
    const struct statx* const like = isThere && S_ISREG(old.stx_mode) ? &old : nullptr;
    return WriteFile(aside.Place(), name, text, like) && TakePlace(aside, name, folder, item, isThere);
}

}  // namespace

ErrorNumber RegistryQueryValue(const RegistryKey* key, const char* name, std::uint32_t& type, std::string& data) {
    if (!key) return kErrorInvalidHandle;
    const std::string file = ValueFileName(name);
    const ErrorNumber number = ReadValueFile(key, file, data);
    if (number != kErrorSuccess) return number;
    return ParseValue(data, IsHashed(std::string_view(file).substr(1)), type) ? kErrorSuccess : kErrorRegistryCorrupt;
}

ErrorNumber RegistrySetValue(const RegistryKey* key, const char* name, std::uint32_t type, const void* data,
                             std::size_t size) {
    if (!key) return kErrorInvalidHandle;
    if (!key->write) return kErrorAccessDenied;
    if ((!data && size != 0) || size > kLargestRegistryValue) return kErrorInvalidParameter;
    const std::string file = ValueFileName(name), utf8 = ForDisk(name);
    const bool hashed = IsHashed(std::string_view(file).substr(1));
    if (hashed && utf8.size() > kLongestName) return kErrorInvalidParameter;
    std::string text(kValueHeader);
    text += std::to_string(type) + (hashed ? " " + std::to_string(utf8.size()) + "\n" + utf8 : "\n");
    if (size != 0) text.append(static_cast<const char*>(data), size);
    StoreLock lock(key->store, key->rootFolder);
    if (lock.Error() != kErrorSuccess) return lock.Error();
    if (key->root && !MakeFolders(key->folder)) return ErrnoNumber();
    const Folder folder = FolderOf(key);
    if (!folder) return LostNumber();
    return WriteValue(key, folder, file, text) ? kErrorSuccess : ErrnoNumber();
}

ErrorNumber RegistryDeleteValue(const RegistryKey* key, const char* name) {
    if (!key) return kErrorInvalidHandle;
    if (!key->write) return kErrorAccessDenied;
    StoreLock lock(key->store, key->rootFolder);
    if (lock.Error() != kErrorSuccess) return lock.Error();
    const Folder folder = FolderOf(key);
    if (!folder) return IsUnmadeRoot(key) ? kErrorFileNotFound : LostNumber();
    std::string item;
    struct statx status;
    const bool found = ItemIn(folder, ValueFileName(name), item) &&
                       systemCalls.statx(folder.Number(), item.c_str(), AT_SYMLINK_NOFOLLOW, STATX_TYPE, &status) == 0;
    if (!found) return ErrnoNumber();
    Aside aside(key->rootFolder);
    return aside && aside.Delete(folder, item) ? kErrorSuccess : ErrnoNumber();
}

namespace {

ErrorNumber Synchronize(const Folder& folder, const std::string& name) {
    int file = OpenAtRetrying(folder.Number(), name.c_str(), O_RDONLY | O_NONBLOCK);
    if (file < 0) return errno == ENOENT ? kErrorSuccess : ErrnoNumber();
    ErrorNumber number = kErrorSuccess;
    if (Retry([&] { return systemCalls.fsync(file); }) != 0 && errno != EINVAL) number = ErrnoNumber();
    systemCalls.close(file);
    return number;
}

}  // namespace

ErrorNumber RegistryFlush(const RegistryKey* key) {
    if (!key) return kErrorInvalidHandle;
    ErrorNumber first = kErrorSuccess;
    auto keep = [&first](ErrorNumber number) {
        if (first == kErrorSuccess) first = number;
    };
    const Folder folder = FolderOf(key);
    if (!folder) return IsUnmadeRoot(key) ? kErrorSuccess : LostNumber();
    keep(VisitItems(folder, [&](std::string_view name, Kind kind) {
        if (kind == Kind::kValue) keep(Synchronize(folder, std::string(name)));
        return kErrorSuccess;
    }));
    keep(folder.Flush() ? kErrorSuccess : ErrnoNumber());
    return first;
}

}  // namespace tessel::platform
