// Volumes: which there are, and how much they hold.
#include "diagnostics/Guarded.h"
#include "files/FileSupport.h"
#include "platform/DriveTable.h"
#include "platform/FileSystem.h"
#include <tessel/files/FileManager.h>
#include <tessel/memory/MemoryManager.h>
#include <tessel/memory/TrackedMallocFree.h>
#include <tessel/paths/PathManager.h>
#include <tessel/paths/PathRef.h>
#include <tessel/strings/StringCPStr.h>
#include <tessel/strings/StringPStr.h>

#include <algorithm>
#include <cstddef>
#include <cstring>
#include <limits>
#include <string>
#include <vector>

namespace tessel {

namespace {

constexpr uint32 kKindFlag = 2;

FourCC KindCode(platform::DriveKind kind) {
    switch (kind) {
        case platform::DriveKind::kRemovable:
        case platform::DriveKind::kCompactDisc:
            return TESSEL_FOURCC('f', 'l', 'p', 'y');
        case platform::DriveKind::kNetwork:
            return TESSEL_FOURCC('s', 'r', 'v', 'r');
        default:
            return TESSEL_FOURCC('h', 'd', 's', 'k');
    }
}

bool IsLetter(char c) {
    return (c >= 'a' && c <= 'z') || (c >= 'A' && c <= 'Z');
}

// The name of the root of the path's volume: "C:\" or "\\server\share\".
MgErr VolumeRoot(Path path, std::string* root) {
    if (!FIsAbsPath(path) || FDepth(path) < 1) return kArgErr;
    std::string first;
    if (const MgErr err = path->CopyItemAt(0, &first)) return err;
    if (path->StartsWith(PathRef::kAbsolute)) {
        if (first.size() != 1 || !IsLetter(first[0])) return kArgErr;
        const char letter = static_cast<char>(first[0] & ~0x20);
        *root = std::string{letter, ':', '\\'};
    } else {
        *root = first + "\\";
    }
    return kNoErr;
}

uint32 Fit32(uint64 value) {
    return static_cast<uint32>(std::min<uint64>(value, std::numeric_limits<uint32>::max()));
}

// An element of a list of names, with what belongs to it.
struct NamedEntry {
    Str255 name;
    VolKindRec entry;
};
using NamedEntries = std::vector<NamedEntry, TrackedAllocator<NamedEntry>>;

// Whether the handle holds as many names as the list says.
bool NamesLieInside(CPStrHandle names) {
    const UHandle bytes = reinterpret_cast<UHandle>(names);
    const uint64 size = DSGetHandleSize(bytes);
    uint64 at = offsetof(CPStr, bytes);
    if (size < at || (*names)->count < 0) return false;
    for (int32 left = (*names)->count; left > 0; --left) {
        if (at >= size) return false;
        at += (*bytes)[at] + 1u;
    }
    return at <= size;
}

NamedEntries TakeApart(CPStrPtr names, const VolKindRec* entries) {
    NamedEntries all(static_cast<size_t>(names->count));
    const uint8* next = names->bytes;
    for (size_t i = 0; i < all.size(); ++i) {
        std::memcpy(all[i].name, next, next[0] + 1u);
        next += next[0] + 1u;
        if (entries) all[i].entry = entries[i];
    }
    return all;
}

void PutTogether(const NamedEntries& all, CPStrPtr names, VolKindRec* entries) {
    uint8* next = names->bytes;
    for (size_t i = 0; i < all.size(); ++i) {
        std::memcpy(next, all[i].name, all[i].name[0] + 1u);
        next += all[i].name[0] + 1u;
        if (entries) entries[i] = all[i].entry;
    }
}

}  // namespace

}  // namespace tessel

using namespace tessel;

MgErr FListDesktop(CPStrHandle names, UHandle kinds) {
    if (!names) return kArgErr;
    return Guarded([&] {
        const auto drives = platform::DrivesPresent();
        if (kinds) {
            if (const MgErr err = DSSetHandleSize(kinds, static_cast<uint32>(drives.size() * sizeof(VolKindRec))))
                return err;
        }
        if (const MgErr err = CPStrClear(names)) return err;
        for (size_t i = 0; i < drives.size(); ++i) {
            const uint8 name[] = {1, static_cast<uint8>(drives[i].letter)};
            if (const MgErr err = CPStrInsert(names, name, static_cast<int32>(i))) return err;
            if (kinds) reinterpret_cast<VolKindRec*>(*kinds)[i] = {kKindFlag, KindCode(drives[i].kind)};
        }
        return kNoErr;
    });
}

MgErr FMGetVolInfo64(Path path, uint64* freeBytes, uint64* totalBytes, uint32* sectorSize) {
    platform::VolumeSpace space = {};
    const MgErr err = Guarded([&] {
        std::string root;
        if (const MgErr rootErr = VolumeRoot(path, &root)) return rootErr;
        return platform::VolumeGetSpace(root.c_str(), space) ? kNoErr : Win32ToOVFileErr();
    });
    if (err) space = {};
    if (freeBytes) *freeBytes = space.freeBytes;
    if (totalBytes) *totalBytes = space.totalBytes;
    if (sectorSize) *sectorSize = space.sectorBytes;
    return err;
}

MgErr FMGetVolInfo(Path path, double* totalBytes, double* freeBytes) {
    if (!totalBytes || !freeBytes) return kArgErr;
    uint64 total = 0, free = 0;
    const MgErr err = FMGetVolInfo64(path, &free, &total, nullptr);
    *totalBytes = static_cast<double>(total);
    *freeBytes = static_cast<double>(free);
    return err;
}

MgErr FGetVolInfo(Path path, VolInfoRec* info) {
    if (!info) return kArgErr;
    uint64 total = 0, free = 0;
    const MgErr err = FMGetVolInfo64(path, &free, &total, nullptr);
    *info = {Fit32(total), Fit32(total - free), Fit32(free)};
    return err;
}

MgErr FMGetVolPath(Path path, Path* volume) {
    if (!volume || !FIsAbsPath(path) || FDepth(path) < 1) return kArgErr;
    return Guarded([&] {
        PathRef root(path->StartsWith(PathRef::kUNC) ? PathRef::kUNC : PathRef::kAbsolute);
        root.Append(path->ItemAt(0));
        return root.ConvertToPath(volume);
    });
}

MgErr LSort(CPStrHandle names, UHandle entries) {
    if (!names) return kArgErr;
    return Guarded([&] {
        if (!NamesLieInside(names)) return kArgErr;
        const auto count = static_cast<uint64>((*names)->count);
        if (entries && DSGetHandleSize(entries) < count * sizeof(VolKindRec)) return kArgErr;
        auto* records = entries ? reinterpret_cast<VolKindRec*>(*entries) : nullptr;
        NamedEntries all = TakeApart(*names, records);
        std::stable_sort(all.begin(), all.end(),
                         [](const NamedEntry& a, const NamedEntry& b) { return PStrCaseCmp(a.name, b.name) < 0; });
        PutTogether(all, *names, records);
        return kNoErr;
    });
}
