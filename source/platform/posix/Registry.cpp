#include "platform/Registry.h"

#include "platform/CodePage.h"
#include "platform/posix/Folders.h"
#include "platform/posix/NativeNames.h"
#include "platform/posix/SystemCalls.h"
#include "platform/posix/TextFile.h"

#include <algorithm>
#include <charconv>
#include <cstdio>
#include <cstdlib>
#include <dirent.h>
#include <errno.h>
#include <memory>
#include <string_view>
#include <unistd.h>
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
// `.name` of the key's folder, or in the value's file before the data.
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
constexpr const char* kNameFile = "/.name";

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

bool Exists(const std::string& native) {
    struct statx status;
    return systemCalls.statx(AT_FDCWD, native.c_str(), AT_SYMLINK_NOFOLLOW, STATX_TYPE, &status) == 0;
}

// Whether it is a folder itself: a link might lead out of the store, and what is deleted must lie within.
bool IsFolder(const std::string& native) {
    struct statx status;
    return systemCalls.statx(AT_FDCWD, native.c_str(), AT_SYMLINK_NOFOLLOW, STATX_TYPE, &status) == 0 &&
           S_ISDIR(status.stx_mode);
}

// 1018 when somebody has deleted the key meanwhile. A root is always there, if only by name.
ErrorNumber CheckThere(const RegistryKey* key) {
    return key->root || IsFolder(key->folder) ? kErrorSuccess : kErrorKeyDeleted;
}

// The item of `folder` with that name, in whatever case; the name as given where there is none.
std::string ItemIn(const std::string& folder, const std::string& diskName) {
    std::string native = folder + "/" + diskName, found;
    if (!Exists(native) && FindInFolder(folder, diskName, found)) native = folder + "/" + found;
    return native;
}

std::string KeyFolder(const RegistryKey* parent, const char* path) {
    std::string folder = parent->folder;
    for (const KeyName& part : PathParts(path)) folder = ItemIn(folder, part.disk);
    return folder;
}

// Writes the long names of a key that was just made, and of those above it.
bool KeepNames(const RegistryKey* parent, const char* path) {
    std::string folder = parent->folder;
    for (const KeyName& part : PathParts(path)) {
        folder = ItemIn(folder, part.disk);
        if (IsHashed(part.disk) && !Exists(folder + kNameFile) && !ReplaceFile(folder + kNameFile, part.name))
            return false;
    }
    return true;
}

enum class Kind { kKey, kValue, kOther };

Kind KindOf(const std::string& folder, const dirent& entry) {
    if (entry.d_name[0] == kValueMark) return Kind::kValue;
    if (entry.d_name[0] == '.') return Kind::kOther;
    bool isFolder = entry.d_type == DT_DIR || (entry.d_type == DT_UNKNOWN && IsFolder(folder + "/" + entry.d_name));
    return isFolder ? Kind::kKey : Kind::kOther;
}

// Calls visit(name on the disk, kind) for all that a key's folder holds.
template <typename Visitor>
ErrorNumber VisitFolder(const std::string& folder, Visitor visit) {
    std::unique_ptr<DIR, int (*)(DIR*)> listing(opendir(folder.c_str()), closedir);
    if (!listing) return ErrnoNumber();
    for (errno = 0; const dirent* entry = readdir(listing.get()); errno = 0) {
        std::string_view name = entry->d_name;
        if (name != "." && name != "..") visit(name, KindOf(folder, *entry));
    }
    return errno == 0 ? kErrorSuccess : ErrnoNumber();
}

template <typename Visitor>
ErrorNumber VisitKey(const RegistryKey* key, Visitor visit) {
    ErrorNumber number = VisitFolder(key->folder, visit);
    if (number != kErrorFileNotFound) return number;
    return key->root ? kErrorSuccess : kErrorKeyDeleted;
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
    std::string folder = KeyFolder(parent, path);
    const bool root = parent->root && folder == parent->folder;
    if (!root) {
        if (!IsFolder(folder)) return kErrorFileNotFound;
        if (write && ::access(folder.c_str(), W_OK) != 0) return ErrnoNumber();
    }
    key = new RegistryKey{parent->store, std::move(folder), root, write, {}};
    return kErrorSuccess;
}

ErrorNumber RegistryCreate(const RegistryKey* parent, const char* path, RegistryKey*& key) {
    key = nullptr;
    if (!parent) return kErrorInvalidHandle;
    StoreLock lock(parent->store);
    if (ErrorNumber gone = CheckThere(parent)) return gone;
    std::string folder = KeyFolder(parent, path);
    if (!MakeFolders(folder)) return ErrnoNumber();
    if (!IsFolder(folder)) return kErrorAccessDenied;
    if (!KeepNames(parent, path)) return ErrnoNumber();
    const bool root = parent->root && folder == parent->folder;
    key = new RegistryKey{parent->store, std::move(folder), root, true, {}};
    return kErrorSuccess;
}

ErrorNumber RegistryClose(RegistryKey* key) {
    if (!key) return kErrorInvalidHandle;
    delete key;
    return kErrorSuccess;
}

ErrorNumber RegistryDelete(const RegistryKey* parent, const char* path) {
    if (!parent) return kErrorInvalidHandle;
    StoreLock lock(parent->store);
    std::string folder = KeyFolder(parent, path);
    if (folder == parent->folder) return kErrorInvalidParameter;
    if (!IsFolder(folder)) return kErrorFileNotFound;
    bool hasSubKeys = false;
    std::vector<std::string> files;
    ErrorNumber number = VisitFolder(folder, [&](std::string_view name, Kind kind) {
        if (kind == Kind::kKey) hasSubKeys = true;
        files.push_back(folder + "/" + std::string(name));
    });
    if (number != kErrorSuccess) return number;
    if (hasSubKeys) return kErrorAccessDenied;
    for (const std::string& file : files) systemCalls.unlink(file.c_str());
    return systemCalls.rmdir(folder.c_str()) == 0 ? kErrorSuccess : ErrnoNumber();
}

ErrorNumber RegistryCounts(const RegistryKey* key, std::uint32_t& subKeys, std::uint32_t& values) {
    subKeys = values = 0;
    if (!key) return kErrorInvalidHandle;
    return VisitKey(key, [&](std::string_view, Kind kind) {
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
bool NameOfItem(const std::string& folder, std::string_view item, Kind kind, std::string& name) {
    constexpr std::size_t kMost = 1024 * 1024;
    const std::string_view disk = item.substr(kind == Kind::kValue ? 1 : 0);
    name = Unescaped(disk);
    if (!IsHashed(disk)) return true;
    const std::string native = folder + "/" + std::string(item);
    if (kind == Kind::kKey) return ReadTextFile((native + kNameFile).c_str(), name, kMost);
    ValueHeader header;
    if (!ReadTextFile(native.c_str(), name, kMost) || !ParseHeader(name, true, header)) return false;
    name = name.substr(header.size, header.length);
    return true;
}

// The first index lists the folder, the others read on in that listing.
ErrorNumber Enumerate(const RegistryKey* key, Kind kind, std::uint32_t index, std::string& name) {
    if (!key) return kErrorInvalidHandle;
    if (index == 0) {
        key->listing.clear();
        ErrorNumber number = VisitKey(key, [&](std::string_view item, Kind itemKind) {
            std::string found;
            if (itemKind == kind && NameOfItem(key->folder, item, kind, found)) key->listing.push_back(FromDisk(found));
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
bool ReadValueFile(const std::string& folder, const std::string& diskName, std::string& text) {
    constexpr std::size_t kMost = kLongestHeader + kLongestName + kLargestRegistryValue + 1;
    std::string found;
    if (ReadTextFile((folder + "/" + diskName).c_str(), text, kMost)) return true;
    if (errno != ENOENT) return false;
    if (FindInFolder(folder, diskName, found)) return ReadTextFile((folder + "/" + found).c_str(), text, kMost);
    errno = ENOENT;
    return false;
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
    if (!ReadValueFile(key->folder, file, data)) return ErrnoNumber();
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
    if (ErrorNumber gone = CheckThere(key)) return gone;
    if (key->root && !MakeFolders(key->folder)) return ErrnoNumber();
    return ReplaceFile(ItemIn(key->folder, file), text) ? kErrorSuccess : ErrnoNumber();
}

ErrorNumber RegistryDeleteValue(const RegistryKey* key, const char* name) {
    if (!key) return kErrorInvalidHandle;
    if (!key->write) return kErrorAccessDenied;
    StoreLock lock(key->store);
    std::string file = ItemIn(key->folder, ValueFileName(name));
    return systemCalls.unlink(file.c_str()) == 0 ? kErrorSuccess : ErrnoNumber();
}

namespace {

ErrorNumber Synchronize(const std::string& native) {
    int file = systemCalls.open(native.c_str(), O_RDONLY | O_CLOEXEC | O_NONBLOCK, 0);
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
    keep(VisitKey(key, [&](std::string_view name, Kind kind) {
        if (kind == Kind::kValue) keep(Synchronize(key->folder + "/" + std::string(name)));
    }));
    keep(Synchronize(key->folder));
    return first;
}

}  // namespace tessel::platform
