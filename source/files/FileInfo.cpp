// What is known about a file or folder, and changing it.
#include "diagnostics/Guarded.h"
#include "files/FileSupport.h"
#include "platform/CodePage.h"
#include "platform/DriveTable.h"
#include "platform/FileSystem.h"
#include "platform/LastError.h"
#include <tessel/diagnostics/DebugStream.h>
#include <tessel/files/FileManager.h>
#include <tessel/memory/MemoryManager.h>
#include <tessel/paths/PathManager.h>
#include <tessel/paths/PathRef.h>

#include <algorithm>
#include <limits>
#include <string>

namespace tessel {

namespace {

constexpr FourCC kUnknownCode = TESSEL_FOURCC('?', '?', '?', '?');
constexpr FourCC kKnownCreator = TESSEL_FOURCC('O', 'R', 'V', 'N');
constexpr int32 kAnyWrite = 0222;

// The epoch of dates, 1904, in 100 ns since 1601; and how many of those make a second.
constexpr int64 kEpochOffset = 95616288000000000;
constexpr int64 kTicksPerSecond = 10000000;

// The list of volumes: what a path without names stands for.
void DescribeVolumeList(FInfo64Rec* info) {
    info->type = info->creator = kUnknownCode;
    info->size = static_cast<int64>(platform::DrivesPresent().size());
    info->folder = 1;
}

void DescribeFile(Path path, const platform::ItemInfo& item, uint8 mask, FInfo64Rec* info) {
    if (mask & kFInfoType) {
        info->type = HasRezExt(path);
        info->creator = info->type ? kKnownCreator : kUnknownCode;
        if (!info->type) info->type = kUnknownCode;
    }
    if (mask & kFInfoSize) info->size = item.size;
}

MgErr DescribeFolder(const char* name, uint8 mask, FInfo64Rec* info) {
    info->type = info->creator = kUnknownCode;
    info->folder = 1;
    if (mask & kFInfoSize) return ErrUnless(platform::FolderCount(name, info->size));
    return kNoErr;
}

// Seconds since 1904 of 100 ns ticks since 1601, to the nearest; 0 for dates before, the last second for dates beyond.
uint32 FileTimeToSeconds(int64 fileTime) {
    if (fileTime < kEpochOffset) return 0;
    const int64 seconds = (fileTime - kEpochOffset + kTicksPerSecond / 2) / kTicksPerSecond;
    return static_cast<uint32>(std::min<int64>(seconds, std::numeric_limits<uint32>::max()));
}

void DescribeDates(const platform::ItemInfo& item, uint8 mask, FInfo64Rec* info) {
    if (mask & kFInfoCreationDate) info->creationDate = FileTimeToSeconds(item.created ? item.created : item.modified);
    if (mask & kFInfoModDate) info->modificationDate = FileTimeToSeconds(item.modified);
}

// An item with at least one name. `path` is what shortcuts led to, `name` its platform name.
MgErr DescribeItem(Path path, const char* name, uint8 mask, FInfo64Rec* info) {
    platform::ItemInfo item = {};
    if (IsVolume(path)) {
        if (FExists(path) == 0) return kNotFoundErr;
        item.folder = true;
    } else if (!platform::ItemGetInfo(name, item)) {
        return Win32ToOVFileErr();
    }
    if (item.folder) {
        if (const MgErr err = DescribeFolder(name, mask, info)) return err;
    } else {
        DescribeFile(path, item, mask, info);
    }
    if (mask & kFInfoPermissions) {
        if (const MgErr err = FGetAccessRights(path, info->owner, info->group, &info->permissions)) return err;
    }
    DescribeDates(item, mask, info);
    return kNoErr;
}

MgErr SetDates(Path path, const FInfo64Rec& info) {
    File_t* file = nullptr;
    if (const MgErr err = FMOpen(&file, path, kFOpenWrite, kFDenyReadWrite)) return err;
    const MgErr err = ErrUnless(platform::FileSetTimes(HandleOf(file), SecsToWin32FileTime(info.creationDate, nullptr),
                                                       0, SecsToWin32FileTime(info.modificationDate, nullptr)));
    const MgErr closeErr = FMClose(file);
    return err ? err : closeErr;
}

// One size of a record, with a report when 32 bits do not hold it.
int32 NarrowSize(int64 size, CStr field) {
    if (size > std::numeric_limits<int32>::max())
        TESSEL_REPORT(kDebugWarning, 0x6C20F1B5u)
            << "Converting 64-bit to 32-bit, but " << field << " is too big! " << field << "=" << size;
    if (size < 0)
        TESSEL_REPORT(kDebugWarning, 0x0D83A94Eu)
            << "Converting 64-bit to 32-bit, but " << field << " is negative! " << field << "=" << size;
    return static_cast<int32>(size);
}

// The fields that both forms of the record have alike.
template <class To, class From>
void CopyCommonFields(const From& from, To* to) {
    to->type = from.type;
    to->creator = from.creator;
    to->permissions = from.permissions;
    to->creationDate = from.creationDate;
    to->modificationDate = from.modificationDate;
    to->folder = from.folder;
    to->reserved1 = from.reserved1;
    to->reserved2 = from.reserved2;
    to->reserved3 = from.reserved3;
    std::copy(std::begin(from.owner), std::end(from.owner), to->owner);
    std::copy(std::begin(from.group), std::end(from.group), to->group);
}

void Narrow(const FInfo64Rec& from, FInfoRec* to) {
    CopyCommonFields(from, to);
    to->size = NarrowSize(from.size, "size");
    to->rfSize = NarrowSize(from.rfSize, "rfSize");
}

void Widen(const FInfoRec& from, FInfo64Rec* to) {
    CopyCommonFields(from, to);
    to->size = from.size;
    to->rfSize = from.rfSize;
}

bool HasShortcutName(const std::string& name) {
    constexpr std::string_view kExtension = ".lnk";
    return name.size() > kExtension.size() &&
           std::equal(kExtension.begin(), kExtension.end(), name.end() - kExtension.size(), [](char a, char b) {
               return a == static_cast<char>(platform::LowerByte(static_cast<uint8>(b)));
           });
}

// The permissions that are reported for an item.
int32 ReportedPermissions(bool folder, bool readOnly) {
    if (folder) return readOnly ? 0555 : 0777;
    return readOnly ? 0444 : 0666;
}

}  // namespace

}  // namespace tessel

using namespace tessel;

// ---- queries --------------------------------------------------------------------------------------------------------

int32 FExists(Path path) {
    return GuardedOr<int32>(0, [&]() -> int32 {
        if (!FIsAbsPath(path)) return 0;
        if (FDepth(path) == 0) return 2;
        PlatformName name;
        if (name.Make(path, true)) return 0;
        platform::SetLastError(platform::kErrorSuccess);
        switch (platform::ItemExists(name.Text())) {
            case platform::ItemKind::kFile:
                return 1;
            case platform::ItemKind::kFolder:
                return 2;
            default:
                return platform::LastError() == platform::kErrorSharingViolation ? 1 : 0;
        }
    });
}

MgErr FGetInfoResolve(Path path, FInfo64Rec* info, int32 resolve, uint8 mask) {
    if (!info || !FIsAbsPath(path)) return kArgErr;
    *info = {};
    return Guarded([&] {
        if (FDepth(path) == 0) {
            DescribeVolumeList(info);
            return kNoErr;
        }
        PlatformName name;
        if (const MgErr err = name.Make(path, resolve != 0)) return err;
        PathRef target(name.Text(), PathRef::StringDisplay());
        return DescribeItem(&target, name.Text(), mask, info);
    });
}

MgErr FGetInfo64(Path path, FInfo64Rec* info, int32 mask) {
    return FGetInfoResolve(path, info, 1, static_cast<uint8>(mask));
}

MgErr FGetInfo(Path path, FInfoRec* info) {
    if (!info) return kArgErr;
    FInfo64Rec info64;
    const MgErr err = FGetInfo64(path, &info64, kFInfoAll);
    if (!err) Narrow(info64, info);
    return err;
}

MgErr FGetAccessRights(Path path, PStr owner, PStr group, int32* permissions) {
    if (!FIsAbsPath(path)) return kArgErr;
    return Guarded([&] {
        if (owner) owner[0] = 0;
        if (group) group[0] = 0;
        if (permissions) *permissions = 0;
        if (FDepth(path) == 0) return kNoErr;
        PlatformName name;
        if (const MgErr err = name.Make(path, true)) return err;
        platform::ItemInfo item;
        if (!platform::ItemGetInfo(name.Text(), item)) return Win32ToOVFileErr();
        if (permissions) *permissions = ReportedPermissions(item.folder, item.readOnly);
        return kNoErr;
    });
}

int32 FGetDefPerm(int32 permissions) {
    FileManagerLock lock;
    return permissions & ~static_cast<int32>(platform::PermissionMask());
}

LStrHandle FGetDefGroup(LStrHandle group) {
    UHandle data = reinterpret_cast<UHandle>(group);
    if (DSSetHandleSizeOrNewHandle(&data, LStrSize(0))) return nullptr;
    group = reinterpret_cast<LStrHandle>(data);
    (*group)->count = 0;
    return group;
}

MgErr FIsHiddenFile(Path path, int32* isHidden) {
    if (!FIsAbsPath(path)) {
        TESSEL_REPORT(kDebugWarning, 0x48D1720Eu) << "FIsHiddenFile: relative path passed in!";
        return kArgErr;
    }
    if (!isHidden) {
        TESSEL_REPORT(kDebugWarning, 0x1A6B5F93u) << "FIsHiddenFile: NULL isHidden passed in!";
        return kArgErr;
    }
    return Guarded([&] {
        *isHidden = 0;
        PlatformName name;
        if (const MgErr err = name.Make(path, false)) return err;
        platform::ItemInfo item;
        if (!platform::ItemGetInfo(name.Text(), item)) return Win32ToOVFileErr();
        *isHidden = item.hidden ? 1 : 0;
        return kNoErr;
    });
}

MgErr FIsShortcut(Path path, int32* isShortcut) {
    if (!FIsAbsPath(path)) {
        TESSEL_REPORT(kDebugWarning, 0x739E04C1u) << "FIsShortcut: relative path passed in!";
        return kArgErr;
    }
    if (!isShortcut) {
        TESSEL_REPORT(kDebugWarning, 0x20C5D86Fu) << "FIsShortcut: NULL isShortcut passed in!";
        return kArgErr;
    }
    return Guarded([&] {
        *isShortcut = 0;
        std::string last;
        if (FDepth(path) < 1 || path->CopyItemAt(-1, &last)) return kNoErr;
        if (!HasShortcutName(last)) return kNoErr;
        PlatformName name;
        if (name.Make(path, false)) return kNoErr;
        platform::ItemInfo item;
        *isShortcut = platform::ItemGetInfo(name.Text(), item) && !item.folder ? 1 : 0;
        return kNoErr;
    });
}

int32 FIsSpecialFile(Path) {
    return 0;
}

int32 FEject(Path) {
    return 0;
}

MgErr FMGetModDate(Path path, File_t* file, uint32* seconds, int32* readOnly) {
    if (!seconds) return kArgErr;
    return Guarded([&] {
        *seconds = 0;
        if (readOnly) *readOnly = 0;
        platform::ItemInfo item;
        if (!file || !platform::FileGetInfo(HandleOf(file), item)) {
            if (!FIsAbsPath(path)) return kArgErr;
            if (FDepth(path) == 0 || IsVolume(path)) return kNoErr;
            PlatformName name;
            if (const MgErr err = name.Make(path, true)) return err;
            if (!platform::ItemGetInfo(name.Text(), item)) return Win32ToOVFileErr();
        }
        *seconds = FileTimeToSeconds(item.modified);
        if (readOnly) *readOnly = item.readOnly ? 1 : 0;
        return kNoErr;
    });
}

int64 SecsToWin32FileTime(uint32 seconds, int64* fileTime) {
    const int64 ticks = kEpochOffset + seconds * kTicksPerSecond;
    if (fileTime) *fileTime = ticks;
    return ticks;
}

// ---- changes --------------------------------------------------------------------------------------------------------

MgErr FSetInfo64(Path path, FInfo64Rec* info) {
    if (!info || !FIsAbsPath(path)) return kArgErr;
    return Guarded([&] {
        FlushPathCache(path);
        if (info->folder) return kNoErr;
        // The dates need a file that may be written: a file that becomes read-only gets them first.
        const bool datesFirst = (info->permissions & kAnyWrite) == 0;
        if (datesFirst) {
            if (const MgErr err = SetDates(path, *info)) return err;
        }
        if (const MgErr err = FSetAccessRights(path, info->owner, info->group, &info->permissions)) return err;
        return datesFirst ? kNoErr : SetDates(path, *info);
    });
}

MgErr FSetInfo(Path path, FInfoRec* info) {
    if (!info) return kArgErr;
    FInfo64Rec info64;
    Widen(*info, &info64);
    const MgErr err = FSetInfo64(path, &info64);
    Narrow(info64, info);
    return err;
}

MgErr FSetAccessRights(Path path, PStr owner, PStr group, int32* permissions) {
    if (!FIsAbsPath(path)) return kArgErr;
    if (!owner && !group && !permissions) return kNoErr;
    return Guarded([&] {
        FlushPathCache(path);
        if (FDepth(path) == 0) return kIOErr;
        PlatformName name;
        if (const MgErr err = name.Make(path, true)) return err;
        platform::ItemInfo item;
        if (!permissions) return platform::ItemGetInfo(name.Text(), item) ? kNoErr : AccessRightsErr();
        const auto mode = static_cast<uint32>(*permissions) & 0777;
        return platform::ItemSetMode(name.Text(), mode) ? kNoErr : AccessRightsErr();
    });
}

MgErr FMakeFileNotReadOnly(Path path) {
    TESSEL_REPORT(kDebugWarning, 0x5B17E2D9u)
        << "FMakeFileNotReadOnly is DEPRECATED and may be removed as early as Orvane 2011";
    if (!FIsAbsPath(path)) return kArgErr;
    return Guarded([&] {
        FlushPathCache(path);
        PlatformName name;
        if (const MgErr err = name.Make(path, true)) return err;
        platform::ItemInfo item;
        if (!platform::ItemGetInfo(name.Text(), item)) return Win32ToOVFileErr();
        if (item.folder) return kNoErr;
        return ErrUnless(platform::ItemSetReadOnly(name.Text(), false));
    });
}
