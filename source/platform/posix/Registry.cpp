#include "platform/Registry.h"

#include "platform/CodePage.h"
#include "platform/posix/Folders.h"
#include "platform/posix/NativeNames.h"
#include "platform/posix/SystemCalls.h"
#include "platform/posix/TextFile.h"

#include <algorithm>
#include <charconv>
#include <climits>
#include <cstdio>
#include <cstdlib>
#include <dirent.h>
#include <errno.h>
#include <memory>
#include <string_view>
#include <unistd.h>
#include <utility>
#include <vector>

// On the disk:
//
//   <store>/HKEY_LOCAL_MACHINE/SOFTWARE/Maker/=Path
//
// A key is a folder of its name; a value is a file of its name behind `=`, so that the two never meet. `%` and two
// hexadecimal digits stand for a byte that a file's name cannot have, or that would read as something else. Names that
// begin with a dot belong to the store: its lock, and values being written. The 64-bit view is a store of its own in
// the folder `.view64`.
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
    std::string store;   // the host's name of the folder that holds all
    std::string folder;  // the host's name; that of a root need not exist
    bool root, write;
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

// Held by whoever changes the store, in whatever process: so no two make one name in two spellings, and no key goes
// while a value is put into it. Where it cannot be had (a file system without locks) things go on without.
class StoreLock {
public:
    explicit StoreLock(const std::string& store) {
        if (!MakeFolders(store)) return;
        file_ = systemCalls.open((store + "/.lock").c_str(), O_RDWR | O_CREAT | O_CLOEXEC, 0666);
        struct flock range {};
        range.l_type = F_WRLCK;
        while (file_ >= 0 && systemCalls.lock(file_, F_OFD_SETLKW, &range) != 0 && errno == EINTR) {
        }
    }
    ~StoreLock() {
        if (file_ >= 0) systemCalls.close(file_);
    }
    StoreLock(const StoreLock&) = delete;
    StoreLock& operator=(const StoreLock&) = delete;

private:
    int file_ = -1;
};

// ---- folders --------------------------------------------------------------------------------------------------------

// A folder that is held open, to name what is in it from there. Without one, `Number` is -1 and errno said why.
class Folder {
public:
    Folder() = default;
    Folder(int from, const char* name, int flags)
        : number_(systemCalls.openat(from, name, flags | O_DIRECTORY | O_CLOEXEC, 0)) {}
    Folder(Folder&& other) noexcept : number_(std::exchange(other.number_, -1)) {}
    Folder& operator=(Folder&& other) noexcept {
        std::swap(number_, other.number_);
        return *this;
    }
    ~Folder() {
        const int error = errno;
        if (number_ >= 0) systemCalls.close(number_);
        errno = error;
    }

    explicit operator bool() const { return number_ >= 0; }
    int Number() const { return number_; }

    // A key's folder in this one. It is a folder itself: a link might lead out of the store, and what is deleted must
    // lie within.
    Folder Key(const std::string& name) const { return Folder(number_, name.c_str(), O_PATH | O_NOFOLLOW); }

private:
    int number_ = -1;
};

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
    return Folder(from, std::string(path).c_str(), key->root ? O_PATH : O_PATH | O_NOFOLLOW);
}

bool IsMissing(int error) {
    return error == ENOENT || error == ENOTDIR || error == ELOOP;
}

// Of a key whose folder could not be opened: 1018 when somebody has deleted it meanwhile.
ErrorNumber LostNumber() {
    return IsMissing(errno) ? kErrorKeyDeleted : ErrnoNumber();
}

bool Exists(const Folder& folder, const std::string& name) {
    struct statx status;
    return systemCalls.statx(folder.Number(), name.c_str(), AT_SYMLINK_NOFOLLOW, STATX_TYPE, &status) == 0;
}

enum class Kind { kKey, kValue, kOther };

Kind KindOf(const Folder& folder, const dirent& entry) {
    if (entry.d_name[0] == kValueMark) return Kind::kValue;
    if (entry.d_name[0] == '.') return Kind::kOther;
    const bool isFolder = entry.d_type == DT_DIR || (entry.d_type == DT_UNKNOWN && folder.Key(entry.d_name));
    return isFolder ? Kind::kKey : Kind::kOther;
}

// Calls visit(name on the disk, kind) for all that a key's folder holds.
template <typename Visitor>
ErrorNumber VisitFolder(const Folder& folder, Visitor visit) {
    const int number = systemCalls.openat(folder.Number(), ".", O_RDONLY | O_DIRECTORY | O_CLOEXEC, 0);
    if (number < 0) return ErrnoNumber();
    std::unique_ptr<DIR, int (*)(DIR*)> listing(fdopendir(number), closedir);
    if (!listing) {
        const ErrorNumber error = ErrnoNumber();
        systemCalls.close(number);
        return error;
    }
    for (errno = 0; const dirent* entry = readdir(listing.get()); errno = 0) {
        const std::string_view name = entry->d_name;
        if (name != "." && name != "..") visit(name, KindOf(folder, *entry));
    }
    return errno == 0 ? kErrorSuccess : ErrnoNumber();
}

// Calls visit(folder, name on the disk, kind) for all that a key holds. A root is always there, if only by name.
template <typename Visitor>
ErrorNumber VisitKey(const RegistryKey* key, Visitor visit) {
    const Folder folder = FolderOf(key);
    if (!folder) return key->root && IsMissing(errno) ? kErrorSuccess : LostNumber();
    return VisitFolder(folder, [&](std::string_view name, Kind kind) { visit(folder, name, kind); });
}

// The item of `folder` with that name, in whatever case; the name as given where there is none. The first in byte order
// where several are, so that the answer does not hang on the order of the listing.
std::string ItemIn(const Folder& folder, const std::string& diskName) {
    if (Exists(folder, diskName)) return diskName;
    std::string found;
    VisitFolder(folder, [&](std::string_view name, Kind) {
        if (EqualNames(name, diskName) && (found.empty() || found > name)) found = name;
    });
    return found.empty() ? diskName : found;
}

// Deletes a folder with all that is in it. False with errno.
bool DeleteFolder(const Folder& parent, const std::string& name) {
    const Folder folder = parent.Key(name);
    if (!folder) return false;
    std::vector<std::string> items;
    VisitFolder(folder, [&](std::string_view item, Kind) { items.emplace_back(item); });
    for (const std::string& item : items) {
        const bool deleted = systemCalls.unlinkat(folder.Number(), item.c_str(), 0) == 0 || errno == ENOENT ||
                             (errno == EISDIR && DeleteFolder(folder, item));
        if (!deleted) return false;
    }
    return systemCalls.unlinkat(parent.Number(), name.c_str(), AT_REMOVEDIR) == 0;
}

// Makes a key's folder. One with a long name is made under another, and takes its own when that stands in it: nobody
// ever sees a key without its name.
bool MakeKeyFolder(const Folder& parent, const KeyName& part) {
    if (!IsHashed(part.disk)) return systemCalls.mkdirat(parent.Number(), part.disk.c_str(), 0777) == 0;
    const std::string unfinished = ".making" + part.disk;
    DeleteFolder(parent, unfinished);  // of a process that ended on the way
    if (systemCalls.mkdirat(parent.Number(), unfinished.c_str(), 0777) != 0) return false;
    const Folder folder = parent.Key(unfinished);
    if (folder && ReplaceFile(kNameFile, part.name, folder.Number()) &&
        systemCalls.renameat2(parent.Number(), unfinished.c_str(), parent.Number(), part.disk.c_str(), 0) == 0)
        return true;
    const int error = errno;
    DeleteFolder(parent, unfinished);
    errno = error;
    return false;
}

// Goes from a key down, and makes what is missing where `make` asks for it. `path` becomes that of what was found, in
// the spelling of the disk.
Folder Descend(const RegistryKey* key, const std::vector<KeyName>& parts, bool make, std::string& path) {
    Folder folder = FolderOf(key);
    path = key->folder;
    for (const KeyName& part : parts) {
        if (!folder) break;
        const std::string item = ItemIn(folder, part.disk);
        Folder next = folder.Key(item);
        if (!next && errno == ENOENT && make && (MakeKeyFolder(folder, part) || errno == EEXIST || errno == ENOTEMPTY))
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
    key = new RegistryKey{std::move(store), std::move(folder), true, true, {}};
    return kErrorSuccess;
}

ErrorNumber RegistryOpen(const RegistryKey* parent, const char* path, bool write, RegistryKey*& key) {
    key = nullptr;
    if (!parent) return kErrorInvalidHandle;
    const std::vector<KeyName> parts = PathParts(path);
    std::string name = parent->folder;
    const bool root = parent->root && parts.empty();
    if (!root) {
        const Folder folder = Descend(parent, parts, false, name);
        if (!folder) return IsMissing(errno) ? kErrorFileNotFound : ErrnoNumber();
        if (write && ::faccessat(folder.Number(), ".", W_OK, 0) != 0) return ErrnoNumber();
    }
    key = new RegistryKey{parent->store, std::move(name), root, write, {}};
    return kErrorSuccess;
}

ErrorNumber RegistryCreate(const RegistryKey* parent, const char* path, RegistryKey*& key) {
    key = nullptr;
    if (!parent) return kErrorInvalidHandle;
    StoreLock lock(parent->store);
    if (parent->root && !MakeFolders(parent->folder)) return ErrnoNumber();
    if (!FolderOf(parent)) return LostNumber();
    const std::vector<KeyName> parts = PathParts(path);
    std::string name;
    if (!Descend(parent, parts, true, name)) return IsMissing(errno) ? kErrorAccessDenied : ErrnoNumber();
    key = new RegistryKey{parent->store, std::move(name), parent->root && parts.empty(), true, {}};
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
    StoreLock lock(parent->store);
    const std::string last = parts.back().disk;
    parts.pop_back();
    std::string above;
    const Folder folder = Descend(parent, parts, false, above);
    const std::string item = folder ? ItemIn(folder, last) : last;
    const Folder key = folder ? folder.Key(item) : Folder();
    if (!key) return IsMissing(errno) ? kErrorFileNotFound : ErrnoNumber();
    bool hasSubKeys = false;
    const ErrorNumber number = VisitFolder(key, [&](std::string_view, Kind kind) { hasSubKeys |= kind == Kind::kKey; });
    if (number != kErrorSuccess) return number;
    if (hasSubKeys) return kErrorAccessDenied;
    return DeleteFolder(folder, item) ? kErrorSuccess : ErrnoNumber();
}

ErrorNumber RegistryCounts(const RegistryKey* key, std::uint32_t& subKeys, std::uint32_t& values) {
    subKeys = values = 0;
    if (!key) return kErrorInvalidHandle;
    return VisitKey(key, [&](const Folder&, std::string_view, Kind kind) {
        if (kind == Kind::kKey) ++subKeys;
        if (kind == Kind::kValue) ++values;
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

// The name of what stands in a key's folder, in UTF-8. False when it cannot be read: then it is none of ours.
bool NameOfItem(const Folder& folder, std::string_view item, Kind kind, std::string& name) {
    constexpr std::size_t kMost = 1024 * 1024;
    const std::string_view disk = item.substr(kind == Kind::kValue ? 1 : 0);
    name = Unescaped(disk);
    if (!IsHashed(disk)) return true;
    std::string file(item);
    if (kind == Kind::kKey) return ReadTextFile(((file += '/') += kNameFile).c_str(), name, kMost, folder.Number());
    ValueHeader header;
    if (!ReadTextFile(file.c_str(), name, kMost, folder.Number()) || !ParseHeader(name, true, header)) return false;
    name = name.substr(header.size, header.length);
    return true;
}

// The first index lists the folder, the others read on in that listing.
ErrorNumber Enumerate(const RegistryKey* key, Kind kind, std::uint32_t index, std::string& name) {
    if (!key) return kErrorInvalidHandle;
    if (index == 0) {
        key->listing.clear();
        ErrorNumber number = VisitKey(key, [&](const Folder& folder, std::string_view item, Kind itemKind) {
            std::string found;
            if (itemKind == kind && NameOfItem(folder, item, kind, found)) key->listing.push_back(FromDisk(found));
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

// As the name is spelled first: a name that fits costs no look at the folder. False with errno. No more is read than
// a value may have, and a byte: a damaged store must not take all memory.
bool ReadValueFile(const RegistryKey* key, const std::string& diskName, std::string& text) {
    constexpr std::size_t kMost = kLongestHeader + kLongestName + kLargestRegistryValue + 1;
    if (ReadTextFile((key->folder + "/" + diskName).c_str(), text, kMost)) return true;
    if (errno != ENOENT && errno != ENAMETOOLONG) return false;
    const Folder folder = FolderOf(key);
    return folder && ReadTextFile(ItemIn(folder, diskName).c_str(), text, kMost, folder.Number());
}

bool ParseValue(std::string& text, bool hashed, std::uint32_t& type) {
    ValueHeader header;
    if (!ParseHeader(text, hashed, header)) return false;
    type = header.type;
    text.erase(0, header.size + header.length);
    return text.size() <= kLargestRegistryValue;
}

}  // namespace

ErrorNumber RegistryQueryValue(const RegistryKey* key, const char* name, std::uint32_t& type, std::string& data) {
    if (!key) return kErrorInvalidHandle;
    const std::string file = ValueFileName(name);
    if (!ReadValueFile(key, file, data)) return ErrnoNumber();
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
    StoreLock lock(key->store);
    if (key->root && !MakeFolders(key->folder)) return ErrnoNumber();
    const Folder folder = FolderOf(key);
    if (!folder) return LostNumber();
    return ReplaceFile(ItemIn(folder, file), text, folder.Number()) ? kErrorSuccess : ErrnoNumber();
}

ErrorNumber RegistryDeleteValue(const RegistryKey* key, const char* name) {
    if (!key) return kErrorInvalidHandle;
    if (!key->write) return kErrorAccessDenied;
    StoreLock lock(key->store);
    const Folder folder = FolderOf(key);
    if (!folder) return ErrnoNumber();
    const std::string file = ItemIn(folder, ValueFileName(name));
    return systemCalls.unlinkat(folder.Number(), file.c_str(), 0) == 0 ? kErrorSuccess : ErrnoNumber();
}

namespace {

ErrorNumber Synchronize(const Folder& folder, const std::string& name) {
    int file = systemCalls.openat(folder.Number(), name.c_str(), O_RDONLY | O_CLOEXEC | O_NONBLOCK, 0);
    if (file < 0) return errno == ENOENT ? kErrorSuccess : ErrnoNumber();
    ErrorNumber number = kErrorSuccess;
    if (systemCalls.fsync(file) != 0 && errno != EINVAL) number = ErrnoNumber();
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
    if (!folder) return key->root && IsMissing(errno) ? kErrorSuccess : LostNumber();
    keep(VisitFolder(folder, [&](std::string_view name, Kind kind) {
        if (kind == Kind::kValue) keep(Synchronize(folder, std::string(name)));
    }));
    keep(Synchronize(folder, "."));
    return first;
}

}  // namespace tessel::platform
