// The members of PathRef that ask the disk.
#include "files/FileSupport.h"
#include "paths/PathRefAccess.h"
#include "platform/FileSystem.h"
#include "platform/System.h"
#include <tessel/base/OVExcept.h>
#include <tessel/diagnostics/DebugStream.h>
#include <tessel/files/CachedPathFlavor.h>
#include <tessel/files/FileManager.h>
#include <tessel/paths/PathCachedItem.h>
#include <tessel/paths/PathManager.h>
#include <tessel/paths/PathRef.h>
#include <tessel/paths/PathTextFormat.h>

#include <memory>
#include <vector>

namespace tessel {

namespace {

constexpr char kCorrectedCaseKey[] = "_pathref_corrected_case_";
constexpr char kCaseIsCorrectKey[] = "_pathref_case_is_correct_";
constexpr int32 kAnyWrite = 0222;

// The flat functions take what they do not change as they take everything.
Path Flat(const PathRef& path) {
    return const_cast<PathRef*>(&path);
}

// Whether the host has cached that this item, or a folder that it would be in, does not exist.
bool IsKnownToBeMissing(const PathRef& path) {
    for (const auto direction : {PathRef::kSearchHere, PathRef::kSearchUp}) {
        const SharedCachedItem item =
            PathRefAccess::CachedItem(path, kPathFlavorKey, CachedPathFlavor::ClassName(), direction);
        const auto* flavor = static_cast<const CachedPathFlavor*>(item.get());
        if (flavor) return !flavor->IsFile() && !flavor->IsFolder();
    }
    return false;
}

FInfo64Rec InfoOf(const PathRef& path) {
    if (IsKnownToBeMissing(path)) TESSEL_THROW(kNotFoundErr, "PathRef::Size: Does not exist");
    FInfo64Rec info;
    if (const MgErr err = FGetInfo64(Flat(path), &info, kFInfoAll))
        TESSEL_THROW(err, "PathRef::Size: Unable to get information about path");
    return info;
}

PathRef Resolved(const PathRef& path) {
    PathRef resolved;
    if (!FResolvePath(&resolved, Flat(path)))
        TESSEL_THROW(kArgErr, "PathRef::ResolveShortcuts: Unable to resolve path");
    return resolved;
}

// The corrected path that was cached, if any.
bool FindCorrectedCase(const PathRef& path, PathRef* corrected) {
    const auto direction = PathRef::kSearchHere;
    if (PathRefAccess::CachedItem(path, kCaseIsCorrectKey, PathRef::CachedBool::ClassName(), direction)) {
        *corrected = path;
        return true;
    }
    const SharedCachedItem cached =
        PathRefAccess::CachedItem(path, kCorrectedCaseKey, PathRef::CachedPath::ClassName(), direction);
    if (cached) *corrected = static_cast<const PathRef::CachedPath*>(cached.get())->Get();
    return cached != nullptr;
}

// Negative and NaN count as 0, and what is too long as the longest lifetime.
uint32 Milliseconds(double seconds) {
    const double milliseconds = seconds * 1000.0;
    if (!(milliseconds > 0)) return 0;
    return milliseconds < INT32_MAX ? static_cast<uint32>(milliseconds) : uint32{INT32_MAX};
}

void CacheCorrectedCase(const PathRef& path, const PathRef& corrected, double seconds) {
    const auto lifetime = Milliseconds(seconds);
    const auto relation = PathRef::CachedItem::kDependsOnFile;
    if (corrected.Equals(path, PathRef::kExact))
        path.Cache(kCaseIsCorrectKey, new PathRef::CachedBool(lifetime, relation, true));
    else
        path.Cache(kCorrectedCaseKey, new PathRef::CachedPath(lifetime, relation, corrected));
}

// Whether the system has room for a name of the path: each name takes at least one byte of it.
bool CanBeAsked(const PathRef& path) {
    char name[kMaxDOSPathName];
    if (!path.StartsWith(PathRef::kRelative)) return MakeDOSPathName(Flat(path), name, 0) == kNoErr;
    std::string text;
    return path.ItemCount() < kMaxDOSPathName && !path.ConvertToString(&text, PathRef::StringCommandLine()) &&
           text.size() < kMaxDOSPathName;
}

// The last name as the folder lists it; an item that is not there keeps the name it was given.
std::string ListedName(const PathRef& path) {
    std::string name, text, listed;
    if (const MgErr err = path.CopyItemAt(-1, &name)) TESSEL_THROW(err, "Unable to copy the name of the PathRef");
    if (const MgErr err = path.ConvertToString(&text, PathRef::StringCommandLine()))
        TESSEL_THROW(err, "Unable to get DOS Path");
    if (platform::ItemRealName(text.c_str(), listed) && listed.size() == name.size()) return listed;
    return name;
}

}  // namespace

// ---- queries --------------------------------------------------------------------------------------------------------

bool PathRef::Exists() const {
    return FExists(Flat(*this)) != 0;
}

bool PathRef::IsADirectory() const {
    return FExists(Flat(*this)) == 2;
}

bool PathRef::IsAFile() const {
    return FExists(Flat(*this)) == 1;
}

uint64 PathRef::Size(SizeType type) const {
    if (type != kLogicalSize)
        TESSEL_THROW(kUnsupportedErr, "PathRef::Size: Only logical size is supported at the moment");
    const FInfo64Rec info = InfoOf(*this);
    if (info.folder) TESSEL_THROW(kArgErr, "PathRef::Size: Can't get the size of a folder, get DirectoryItemCount");
    return static_cast<uint64>(info.size);
}

uint64 PathRef::DirectoryItemCount() const {
    const FInfo64Rec info = InfoOf(*this);
    if (!info.folder) TESSEL_THROW(kArgErr, "PathRef::Size: Can't get the item count of a file, get Size");
    return static_cast<uint64>(info.size);
}

double PathRef::VolumeSize() const {
    double total = 0, free = 0;
    if (const MgErr err = FMGetVolInfo(Flat(*this), &total, &free))
        TESSEL_THROW(err, "PathRef::Volume: Unable to get volume size");
    return total;
}

double PathRef::VolumeFree() const {
    double total = 0, free = 0;
    if (const MgErr err = FMGetVolInfo(Flat(*this), &total, &free))
        TESSEL_THROW(err, "PathRef::Volume: Unable to get volume free");
    return free;
}

int32 PathRef::DisconnectVolume() const {
    return 0;
}

uint32 PathRef::ModificationDate() const {
    uint32 seconds = 0;
    if (const MgErr err = FMGetModDate(Flat(*this), nullptr, &seconds, nullptr))
        TESSEL_THROW(err, "Unable to get modification date");
    return seconds;
}

bool PathRef::IsAShortcut() const {
    if (IsKnownToBeMissing(*this)) return false;
    int32 isShortcut = 0;
    if (const MgErr err = FIsShortcut(Flat(*this), &isShortcut))
        TESSEL_THROW(err, "PathRef::IsAShortcut: Unable to query Path for shortcut");
    return isShortcut != 0;
}

bool PathRef::IsSpecial() const {
    return false;
}

// ---- other forms of the path ----------------------------------------------------------------------------------------

void PathRef::ResolveShortcuts(ResolveMethod method) {
    if (method != kResolveAllButLast) {
        *this = Resolved(*this);
        return;
    }
    std::string last;
    if (const MgErr err = CopyItemAt(-1, &last)) TESSEL_THROW(err, "PathRef::ResolveShortcuts: Unable to resolve path");
    PathRef resolved = Resolved(GetParentDirectory());
    resolved.Append(last);
    *this = resolved;
}

PathRef PathRef::GetLongNames() const {
    PathRef longNames(*this);
    if (const MgErr err = Win32GetLongFileName(&longNames)) TESSEL_THROW(err, "PathRef::GetLongNames");
    return longNames;
}

PathRef PathRef::GetCorrectedCase(double seconds) const {
    if (!IsValid() || ItemCount() == 0) return *this;
    if (!CanBeAsked(*this)) TESSEL_THROW(kArgErr, "Unable to get DOS Path");
    // Up to what is known already, and down again.
    PathRef corrected;
    std::vector<PathRef> unknown;
    for (PathRef path(*this); !FindCorrectedCase(path, &corrected); path = path.GetParentDirectory()) {
        if (path.ItemCount() == 0) {
            corrected = path;
            break;
        }
        unknown.push_back(path);
    }
    for (; !unknown.empty(); unknown.pop_back()) {
        corrected.Append(ListedName(unknown.back()));
        CacheCorrectedCase(unknown.back(), corrected, seconds);
    }
    return corrected;
}

void PathRef::AppendTemporaryName(const StringType& extension, const StringType& prefix, const StringType& suffix) {
    for (;;) {
        uint32 number = 0;
        if (!platform::RandomBytes(&number, sizeof number)) TESSEL_THROW(kIOErr, "PathRef AppendTemporaryName");
        StringType name = prefix;
        name.append(std::to_string(number)).append(suffix);
        if (!extension.empty()) name.append(".").append(extension);
        PathRef candidate(*this);
        candidate.Append(name);
        if (candidate.Exists()) continue;
        *this = candidate;
        return;
    }
}

// ---- changes --------------------------------------------------------------------------------------------------------

MgErr PathRef::MakeWriteable(WriteableDepth depth) const {
    if (depth == kItemAndContents) return kUnsupportedErr;
    if (depth != kItemOnly) {
        TESSEL_REPORT(kDebugWarning, 0x1E96B0D7u)
            << "PathRef::MakeWriteable: New depth type, need to handle it (" << static_cast<int32>(depth) << ")";
        return kNoErr;
    }
    if (IsKnownToBeMissing(*this)) return kNotFoundErr;
    FInfo64Rec info;
    if (const MgErr err = FGetInfo64(Flat(*this), &info, kFInfoAll)) return err;
    if ((info.permissions & kAnyWrite) == kAnyWrite) return kNoErr;
    info.permissions |= kAnyWrite;
    return FSetInfo64(Flat(*this), &info);
}

MgErr PathRef::RemoveFile(ResolveAction action) {
    MgErr err = kNoErr;
    if (action == kDontResolve) {
        err = FRemove(this);
    } else {
        PathRef target = Resolved(*this);
        err = FRemove(&target);
        // Without a shortcut along the path both are the same item, which is gone now.
        if (!err && !target.Equals(*this, kIgnoreCase)) err = FRemove(this);
    }
    FlushCache();
    return err;
}

MgErr PathRef::CopyFileTo(const PathRef& to, ResolveAction action) const {
    const MgErr err = FCopyResolve(Flat(*this), Flat(to), action);
    to.FlushCache();
    return err;
}

MgErr PathRef::MoveFileTo(const PathRef& to, ResolveAction action) const {
    const MgErr err = FMoveResolve(Flat(*this), Flat(to), action);
    FlushCache();
    to.FlushCache();
    return err;
}

}  // namespace tessel
