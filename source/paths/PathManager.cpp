// Paths through the flat interface. The flattened form and texts have files of their own.
#include "diagnostics/Guarded.h"
#include <tessel/base/OVExcept.h>
#include <tessel/diagnostics/DebugStream.h>
#include <tessel/memory/MemoryManager.h>
#include <tessel/paths/PathManager.h>
#include <tessel/paths/PathRef.h>
#include <tessel/strings/StringCStr.h>
#include <tessel/strings/StringPStr.h>
#include <tessel/strings/StringUtils.h>

#include <algorithm>
#include <cstdarg>
#include <cstdlib>
#include <cstring>
#include <new>
#include <optional>

namespace tessel {
namespace {

constexpr size_t kLongestPStr = 255;

// For start-up.
Str255 notAPathText = {};
Str255 pathTooLongText = {};

std::optional<PathRef::PathBase> BaseOfType(int32 type) {
    switch (type) {
        case kPathAbsolute:
            return PathRef::kAbsolute;
        case kPathRelative:
            return PathRef::kRelative;
        case kPathNotAPath:
            return PathRef::kNotAPath;
        case kPathUNC:
            return PathRef::kUNC;
    }
    return std::nullopt;
}

int16 TypeOf(const PathRef& path) {
    if (path.StartsWith(PathRef::kAbsolute)) return kPathAbsolute;
    if (path.StartsWith(PathRef::kRelative)) return kPathRelative;
    return path.StartsWith(PathRef::kUNC) ? kPathUNC : kPathNotAPath;
}

// Stores the value in `path`, or in a new path when it is null. Null on failure.
Path Store(Path path, const PathRef& value) {
    if (!path) return new (std::nothrow) PathRef(value);
    *path = value;
    return path;
}

MgErr CopyToPStr(const std::string& name, PStr out) {
    if (name.size() > kLongestPStr) return kArgErr;
    out[0] = static_cast<uint8>(name.size());
    std::memcpy(out + 1, name.data(), name.size());
    return kNoErr;
}

// The path's names under another base. A path without names becomes the bare base.
PathRef Rerooted(const PathRef& path, PathRef::PathBase base) {
    PathRef result(base);
    if (base == PathRef::kNotAPath || path.ItemCount() == 0) return result;
    if (path.StartsWith(PathRef::kRelative)) return result.Append(path);
    const PathRef own(path.StartsWith(PathRef::kUNC) ? PathRef::kUNC : PathRef::kAbsolute);
    return result.Append(own.GetRelativePathFromThisToThat(path, PathRef::kExact));
}

MgErr Reroot(Path path, int32 type) {
    const std::optional<PathRef::PathBase> base = BaseOfType(type);
    if (!base) return kArgErr;
    if (path->StartsWith(*base)) return kNoErr;
    const MgErr err = Guarded([&] {
        *path = Rerooted(*path, *base);
        return kNoErr;
    });
    if (err) TESSEL_REPORT(kDebugWarning, 0xF13B6E04u) << "Problem converting path " << path << " to type " << type;
    return err;
}

PathRef Combined(const PathRef& base, const PathRef& rel) {
    const bool relative = rel.StartsWith(PathRef::kRelative);
    if (base.ItemCount() == 0 && !relative) return rel;
    if (!relative) TESSEL_THROW(kArgErr, "FAddPath: the path to add must be relative");
    if (rel.ItemCount() == 0) return base;
    const int32 upDirs = rel.CountUpDir();
    const int32 baseNames = base.ItemCount();
    if (upDirs <= baseNames || base.CountUpDir() > 0) return PathRef(base).Append(rel);
    PathRef result(PathRef::kRelative);
    for (int32 i = baseNames; i < upDirs; ++i) result.AppendUpDir();
    for (int32 i = upDirs; i < rel.ItemCount(); ++i) result.Append(rel.ItemAt(i));
    return result;
}

}  // namespace
}  // namespace tessel

using namespace tessel;

// ---- construction and destruction -----------------------------------------------------------------------------------

Path FEmptyPath(Path path) {
    return GuardedOr<Path>(nullptr, [&] { return Store(path, PathRef(PathRef::kAbsolute)); });
}

Path FNotAPath(Path path) {
    return GuardedOr<Path>(nullptr, [&] { return Store(path, PathRef()); });
}

static PathRef MakePath(PathRef::PathBase base, ConstPStr name, va_list names) {
    PathRef path(base);
    for (; name; name = va_arg(names, ConstPStr)) path.Append(StringUtils::ToNarrowString(name));
    return path;
}

Path FMakePath(Path path, int32 type, ConstPStr name, ...) {
    const std::optional<PathRef::PathBase> base = BaseOfType(static_cast<int16>(type));
    if (!base || (path && !FIsAPathOrNotAPath(path))) return nullptr;
    va_list names;
    va_start(names, name);
    Path made = GuardedOr<Path>(nullptr, [&] { return Store(path, MakePath(*base, name, names)); });
    va_end(names);
    return made;
}

MgErr FAppendName(Path path, ConstPStr name) {
    if (!FIsAPath(path)) return kArgErr;
    if ((!name || name[0] == 0) && FIsAbsPath(path)) return kArgErr;
    return Guarded([&] {
        path->Append(StringUtils::ToNarrowString(name));
        return kNoErr;
    });
}

MgErr FPathCpy(Path dst, Path src) {
    if (!dst || !src) return kArgErr;
    return Guarded([&] {
        *dst = *src;
        return kNoErr;
    });
}

MgErr FPathToPath(Path* path) {
    if (!path || !*path) return kArgErr;
    Path copy = new (std::nothrow) PathRef(**path);
    if (!copy) return kMemFullErr;
    *path = copy;
    return kNoErr;
}

void FDestroyPath(Path* path) {
    if (path)
        PathRef::DisposePath(*path);
    else
        TESSEL_REPORT(kDebugWarning, 0x7B2E5D19u) << "This is a noop.";
}

MgErr FDisposePath(Path path) {
    TESSEL_REPORT(kDebugWarning, 0x7B2E5D1Au) << "FDisposePath is deprecated within OV code; use FDestroyPath instead.";
    PathRef::DisposePath(path);
    return kNoErr;
}

MgErr FSetPathType(Path path, int32 type) {
    if (!FIsAPath(path) || type == kPathNotAPath) return kArgErr;
    return Reroot(path, type);
}

MgErr FNormalizePath(Path path) {
    if (!path) return kArgErr;
    return Guarded([&] {
        if (path->ItemCount() == 0 || !StringUtils::StartsWith(path->ItemAt(0), '\\')) return kNoErr;
        const MgErr err = Reroot(path, kPathUNC);
        if (err) return err;
        return FIsAPath(path) ? kNoErr : kArgErr;
    });
}

// ---- inspection -----------------------------------------------------------------------------------------------------

MgErr FGetPathType(Path path, int32* type) {
    if (!type) return kArgErr;
    const bool good = FIsAPathOrNotAPath(path);
    *type = good ? TypeOf(*path) : int16{kPathNotAPath};
    return good ? kNoErr : kArgErr;
}

int16 PathType(Path path) {
    return path ? TypeOf(*path) : int16{kPathNotAPath};
}

bool FIsAPath(Path path) {
    return path && !path->StartsWith(PathRef::kNotAPath);
}

bool FIsAPathOrNotAPath(Path path) {
    return path && path->IsSane(true) && (path->StartsWith(PathRef::kNotAPath) || path->IsValid());
}

bool FIsAPathOfType(Path path, int32 type) {
    const std::optional<PathRef::PathBase> base = BaseOfType(type);
    return path && base && path->StartsWith(*base);
}

bool FIsAbsPath(Path path) {
    return path && path->IsSane(true) && path->IsValid() && !path->StartsWith(PathRef::kRelative);
}

bool FIsEmptyPath(Path path) {
    return FIsAPath(path) && path->ItemCount() == 0;
}

bool FIsSanePath(Path path) {
    return path && GuardedOr(false, [&] { return path->IsSane(false); });
}

bool FIsCDUp(Path path) {
    return path && GuardedOr(false, [&] { return path->CountUpDir() > 0; });
}

int32 FDepth(Path path) {
    return path && path->IsValid() ? path->ItemCount() : -1;
}

int32 PathCnt(Path path) {
    return path ? path->ItemCount() : 0;
}

uint32 PathSize(Path path) {
    return path ? PathRef::MemorySize() : 0;
}

uint32 FGetPathStorageSize(Path path) {
    return PathSize(path);
}

uint32 FShrinkPath(Path path) {
    return path ? path->FlushCache() : 0;
}

MgErr FName(Path path, UHandle name) {
    if (!path || !name) return kArgErr;
    Str255 text;
    MgErr err = FNamePtr(path, text);
    if (!err) err = DSSetHandleSize(name, text[0] + 1u);
    if (!err) std::memcpy(*name, text, text[0] + 1u);
    return err;
}

MgErr FNamePtr(Path path, PStr name) {
    return FPathComponent(path, -1, name);
}

PStr PathCopyName(Path path, PStr name) {
    return PathCopyElt(path, -1, name);
}

MgErr FPathComponent(Path path, int32 index, PStr name) {
    if (!name) return kArgErr;
    name[0] = 0;
    if (!path) return kArgErr;
    return Guarded([&] { return CopyToPStr(path->ItemAt(index), name); });
}

PStr PathCopyElt(Path path, int32 index, PStr name) {
    return FPathComponent(path, index, name) ? nullptr : name;
}

MgErr PathReplaceElt(Path path, ConstPStr name, int32 index) {
    if (!path || !name) return kArgErr;
    return Guarded([&] {
        path->Replace(index, StringUtils::ToNarrowString(name));
        return kNoErr;
    });
}

void FGetFileExtension(CStr name, char* extension) {
    if (!extension) return;
    const char* dot = name ? std::strrchr(name, '.') : nullptr;
    if (!dot || dot == name) dot = "";
    std::memmove(extension, dot, std::strlen(dot) + 1);
}

// ---- comparison -----------------------------------------------------------------------------------------------------

bool FPathEqual(Path a, Path b) {
    if (a == b) return true;
    return a && b && a->Equals(*b, PathRef::kIgnoreCase);
}

int32 FPathCmpExact(Path a, Path b) {
    if (a == b) return 0;
    if (!a || !b) return a ? 1 : -1;
    return a->Compare(*b, PathRef::kExact);
}

int32 FPathCmpLexical(Path a, Path b) {
    if (a == b) return 0;
    if (!a || !b) return a ? -1 : 1;
    return a->Compare(*b, PathRef::kIgnoreCase3);
}

int32 FPathCmp(Path a, Path b) {
    if (a == b) return 0;
    if (!a || !b || TypeOf(*a) != TypeOf(*b)) return -1;
    if (a->ItemCount() > 0 && b->ItemCount() > 0) return std::abs(a->Compare(*b, PathRef::kIgnoreCase));
    if (a->ItemCount() == b->ItemCount()) return 0;
    return a->ItemCount() == 0 ? -1 : 1;
}

int32 FPathMatchingTailCount(Path a, Path b) {
    if (a == b) return 0;
    if (!a || !b || TypeOf(*a) != TypeOf(*b)) return -1;
    return GuardedOr<int32>(-1, [&]() -> int32 {
        const int32 most = std::min(a->ItemCount(), b->ItemCount());
        int32 count = 0;
        while (count < most && PathRef::NameEquals(a->ItemAt(-1 - count), b->ItemAt(-1 - count), PathRef::kIgnoreCase))
            ++count;
        return count == most && a->ItemCount() == b->ItemCount() ? 0 : count + 1;
    });
}

bool FileNameEqual(ConstPStr a, ConstPStr b) {
    return a && b && PStrCaseEqual(a, b);
}

bool FileNameNEqual(ConstPStr a, ConstPStr b, int32 n) {
    if (!a || !b) return false;
    Str255 first, second;  // cut to n bytes
    for (auto [from, to] : {std::pair<ConstPStr, PStr>{a, first}, std::pair<ConstPStr, PStr>{b, second}}) {
        to[0] = static_cast<uint8>(std::clamp<int32>(n, 0, from[0]));
        std::memcpy(to + 1, from + 1, to[0]);
    }
    return PStrCaseEqual(first, second);
}

bool FileNameCStrEqual(CStr a, CStr b) {
    return a && b && StrCaseCmp(a, b) == 0;
}

// ---- combination ----------------------------------------------------------------------------------------------------

MgErr FAddPath(Path base, Path rel, Path result) {
    if (!base || !rel || !result) return kArgErr;
    return Guarded([&] {
        *result = Combined(*base, *rel);
        return FNormalizePath(result);
    });
}

MgErr FRelPath(Path from, Path to, Path result) {
    if (!from || !to || !result) return kArgErr;
    return Guarded([&] {
        *result = from->GetRelativePathFromThisToThat(*to, PathRef::kIgnoreCase);
        return kNoErr;
    });
}

MgErr FCommonPath(Path a, Path b) {
    if (!a || !b) return kArgErr;
    return Guarded([&] {
        *a = a->GetInCommonWith(*b, PathRef::kIgnoreCase);
        return a->IsValid() || FEmptyPath(a) ? kNoErr : kMemFullErr;
    });
}

MgErr FVolName(Path path, Path result) {
    if (!path || !result) return kArgErr;
    return Guarded([&] {
        *result = path->Volume();
        return kNoErr;
    });
}

// ---- texts for what has no text -------------------------------------------------------------------------------------

void FGetNotAPathString(PStr text) {
    if (text) PStrCpy(text, notAPathText);
}

void FSetNotAPathString(ConstPStr text) {
    if (text)
        PStrCpy(notAPathText, text);
    else
        notAPathText[0] = 0;
}

void FGetPathTooLongString(PStr text) {
    if (text) PStrCpy(text, pathTooLongText);
}

void FSetPathTooLongString(ConstPStr text) {
    if (text)
        PStrCpy(pathTooLongText, text);
    else
        pathTooLongText[0] = 0;
}
