#include "platform/DriveTable.h"

#include "platform/CodePage.h"
#include "platform/Mutex.h"
#include "platform/posix/NativeNames.h"
#include "platform/posix/SystemCalls.h"

#include <algorithm>
#include <atomic>
#include <cstdlib>
#include <memory>

namespace tessel::platform {

// ---- the table ------------------------------------------------------------------------------------------------------

namespace {

// Folders are absolute and without a separator at the end, so "/" is the empty text; `present` tells the two apart.
struct Table {
    bool present[26] = {};
    std::string folder[26];
    std::string network;
    std::unique_ptr<Table> older;  // readers may still hold it
};

std::atomic<Table*> activeTable{nullptr};
Mutex tableMutex;  // guards the making of a table

// Owns the newest table, and through it the older ones.
std::unique_ptr<Table>& OwnedTable() TESSEL_REQUIRES(tableMutex) {
    static std::unique_ptr<Table>* const owned = new std::unique_ptr<Table>;  // outlives every thread
    return *owned;
}

std::string WithoutEndSeparators(std::string_view folder) {
    while (!folder.empty() && folder.back() == '/') folder.remove_suffix(1);
    return std::string(folder);
}

int DriveIndex(char letter) {
    if (letter >= 'a' && letter <= 'z') letter = static_cast<char>(letter - 'a' + 'A');
    return letter >= 'A' && letter <= 'Z' ? letter - 'A' : -1;
}

// One entry of TESSEL_DRIVES; what does not read `X=/folder` is left out.
void AddDrive(Table& table, std::string_view entry) {
    if (entry.size() < 3 || entry[1] != '=' || entry[2] != '/') return;
    int index = DriveIndex(entry[0]);
    if (index < 0) return;
    table.present[index] = true;
    table.folder[index] = WithoutEndSeparators(entry.substr(2));
}

std::unique_ptr<Table> MakeTable() {
    auto table = std::make_unique<Table>();
    const char* setting = std::getenv("TESSEL_DRIVES");
    std::string_view drives = setting && *setting ? setting : "C=/";
    while (!drives.empty()) {
        std::size_t end = std::min(drives.find(';'), drives.size());
        AddDrive(*table, drives.substr(0, end));
        drives.remove_prefix(std::min(end + 1, drives.size()));
    }
    const char* network = std::getenv("TESSEL_UNC");
    if (network && *network == '/') table->network = WithoutEndSeparators(network);
    return table;
}

void PublishTable() TESSEL_REQUIRES(tableMutex) {
    std::unique_ptr<Table>& owned = OwnedTable();
    std::unique_ptr<Table> table = MakeTable();
    table->older = std::move(owned);
    owned = std::move(table);
    activeTable.store(owned.get(), std::memory_order_release);
}

const Table& Drives() {
    const Table* table = activeTable.load(std::memory_order_acquire);
    if (table) return *table;
    MutexHolder holder(tableMutex);
    if (!activeTable.load(std::memory_order_relaxed)) PublishTable();
    return *activeTable.load(std::memory_order_relaxed);
}

bool IsAtOrUnder(std::string_view native, std::string_view folder) {
    if (native.substr(0, folder.size()) != folder) return false;
    return native.size() == folder.size() || native[folder.size()] == '/';
}

// The drive that lies nearest above a native name, or -1.
int NearestDrive(const Table& table, std::string_view native) {
    int nearest = -1;
    for (int i = 0; i < 26; ++i) {
        if (!table.present[i] || !IsAtOrUnder(native, table.folder[i])) continue;
        if (nearest < 0 || table.folder[i].size() > table.folder[nearest].size()) nearest = i;
    }
    return nearest;
}

}  // namespace

void ReloadDrives() {
    MutexHolder holder(tableMutex);
    PublishTable();
}

// ---- names to the host's --------------------------------------------------------------------------------------------

namespace {

// The name in UTF-8 with `/` between its parts.
bool Normalize(std::string_view name, std::string& text) {
    if (ActiveCodePage().utf8) {
        text.assign(name);
    } else if (!ToUtf8(name, text)) {
        return FailWith(kErrorInvalidName);
    }
    if (text.empty() || text.find('\0') != std::string::npos) return FailWith(kErrorInvalidName);
    std::replace(text.begin(), text.end(), '\\', '/');
    return true;
}

// A name from a root on, without its `.` and `..`. They are taken out of the text, as they are meant in such names: a
// `..` at the root stays there, so that no name leads out of its drive, and one behind a link leads back to before it.
std::string WithoutDots(std::string_view name) {
    if (name.find("/.") == std::string_view::npos) return std::string(name);
    std::string plain;
    while (!name.empty()) {
        name.remove_prefix(1);  // the separator
        std::string_view part = name.substr(0, name.find('/'));
        name.remove_prefix(part.size());
        if (part == "..")
            plain.resize(plain.empty() ? 0 : plain.rfind('/'));
        else if (part != "." && !part.empty())
            (plain += '/') += part;
    }
    return plain;
}

// `//server/share/dir`: the root is the share.
bool NetworkName(const Table& table, std::string_view text, std::string& native) {
    std::size_t shareAt = std::min(text.find('/', 2), text.size());
    std::size_t restAt = shareAt < text.size() ? std::min(text.find('/', shareAt + 1), text.size()) : text.size();
    std::string_view server = text.substr(1, shareAt - 1), share = text.substr(shareAt, restAt - shareAt);
    bool named = server.size() > 1 && server != "/." && server != "/.." && share != "/." && share != "/..";
    if (table.network.empty() || !named) return FailWith(kErrorNetworkPathNotFound);
    native = table.network;
    (native += server) += share;
    native += WithoutDots(text.substr(restAt));
    return true;
}

// `rest` is what stands behind the drive: absolute on it, or relative to the current folder if that lies there.
bool DriveName(const Table& table, int index, std::string_view rest, std::string& native) {
    if (index < 0 || !table.present[index]) return FailWith(kErrorPathNotFound);
    const std::string& root = table.folder[index];
    std::string below(rest);
    if (rest.empty() || rest[0] != '/') {
        std::string current = NativeCurrentFolder();
        below = IsAtOrUnder(current, root) && current != "/" ? current.substr(root.size()) : "";
        if (!rest.empty()) (below += '/') += rest;
    }
    native = root + WithoutDots(below);
    return true;
}

// The host's name as the text says, maybe with separators at its end.
bool Translate(std::string&& text, std::string& native) {
    const Table& table = Drives();
    if (text.size() > 1 && text[0] == '/' && text[1] == '/') return NetworkName(table, text, native);
    if (text.size() > 1 && text[1] == ':') {
        return DriveName(table, DriveIndex(text[0]), std::string_view(text).substr(2), native);
    }
    if (text[0] == '/') return DriveName(table, NearestDrive(table, NativeCurrentFolder()), text, native);
    native = std::move(text);
    return true;
}

}  // namespace

bool NameToNativeText(std::string_view name, std::string& native) {
    std::string text;
    if (!Normalize(name, text) || !Translate(std::move(text), native)) return false;
    while (native.size() > 1 && native.back() == '/') native.pop_back();
    if (native.empty()) native = "/";
    return true;
}

bool NameToNative(std::string_view name, std::string& native) {
    if (!NameToNativeText(name, native)) return false;
    return MatchOnDisk(native) != Match::kFailed || FailErrno();
}

// ---- names from the host's ------------------------------------------------------------------------------------------

bool NativeToName(std::string_view native, std::string& name) {
    if (native.empty() || native[0] != '/') return FailWith(kErrorInvalidName);
    std::string plain = WithoutEndSeparators(native);
    const Table& table = Drives();
    int drive = NearestDrive(table, plain);
    const std::string& network = table.network;
    bool onNetwork = !network.empty() && plain.size() > network.size() && IsAtOrUnder(plain, network) &&
                     (drive < 0 || network.size() >= table.folder[drive].size());
    if (!onNetwork && drive < 0) return FailWith(kErrorPathNotFound);

    std::string rest = NameFromDisk(plain.substr(onNetwork ? network.size() : table.folder[drive].size()));
    // What NameFromDisk leaves of `/` are the separators; no trail byte of a code page is one.
    std::replace(rest.begin(), rest.end(), '/', '\\');
    if (onNetwork) {
        name = "\\" + rest;
    } else {
        name = {static_cast<char>('A' + drive), ':'};
        name += rest.empty() ? "\\" : rest;
    }
    return true;
}

// ---- drives ---------------------------------------------------------------------------------------------------------

namespace {

// File systems by the number that the kernel knows them by (statfs).
DriveKind KindOfFileSystem(long type) {
    switch (static_cast<std::uint32_t>(type)) {
        case 0x6969u:      // NFS
        case 0x517Bu:      // SMB
        case 0xFE534D42u:  // SMB2
        case 0xFF534D42u:  // CIFS
        case 0x01021997u:  // 9P
        case 0x00C36400u:  // Ceph
        case 0x5346414Fu:  // AFS
            return DriveKind::kNetwork;
        case 0x9660u:      // ISO 9660
        case 0x15013346u:  // UDF
            return DriveKind::kCompactDisc;
        case 0x01021994u:  // tmpfs
        case 0x858458F6u:  // ramfs
            return DriveKind::kMemory;
        case 0x4D44u:      // FAT
        case 0x2011BAB0u:  // exFAT
            return DriveKind::kRemovable;
        default:
            return DriveKind::kFixed;
    }
}

}  // namespace

std::vector<Drive> DrivesPresent() {
    std::vector<Drive> drives;
    const Table& table = Drives();
    for (int i = 0; i < 26; ++i) {
        if (!table.present[i]) continue;
        struct statfs status;
        const char* folder = table.folder[i].empty() ? "/" : table.folder[i].c_str();
        if (systemCalls.statfs(folder, &status) != 0) continue;
        drives.push_back({static_cast<char>('A' + i), KindOfFileSystem(static_cast<long>(status.f_type))});
    }
    return drives;
}

}  // namespace tessel::platform
