// Names and locations: resolved and long names, well-known folders, extensions, names of the host system.
#include "diagnostics/Guarded.h"
#include "files/FileSupport.h"
#include "platform/DriveTable.h"
#include "platform/FileSystem.h"
#include <tessel/diagnostics/DebugStream.h>
#include <tessel/files/AppPath.h>
#include <tessel/files/FileManager.h>
#include <tessel/files/shortcut.h>
#include <tessel/paths/PathManager.h>
#include <tessel/paths/PathRef.h>
#include <tessel/paths/PathTextFormat.h>
#include <tessel/strings/StringPStr.h>

#include <algorithm>
#include <cstring>
#include <string>

namespace tessel {

namespace {

// How long a corrected name may be answered from the cache.
constexpr double kCorrectedCaseSeconds = 10.0;

std::string StringOf(ConstPStr text) {
    return std::string(reinterpret_cast<const char*>(text + 1), text[0]);
}

// The host's name made absolute with the current directory.
bool AbsoluteNative(CStr native, std::string* absolute) {
    *absolute = native;
    if (!absolute->empty() && absolute->front() == '/') return true;
    std::string current, folder;
    if (!platform::CurrentFolder(current) || !platform::NameToNative(current, folder)) return false;
    *absolute = folder + "/" + *absolute;
    return true;
}

}  // namespace

}  // namespace tessel

using namespace tessel;

// ---- resolved and long names ----------------------------------------------------------------------------------------

Path FResolvePath(Path out, Path path) {
    return GuardedOr<Path>(nullptr, [&]() -> Path {
        if (!path) return nullptr;
        if (FDepth(path) == 0) return FEmptyPath(out);
        PlatformName name;
        if (name.Make(path, true)) return nullptr;
        return NameToPath(name.Text(), &out) ? nullptr : out;
    });
}

MgErr FGetCanonicalPath(Path path, Path* out) {
    if (!FIsAbsPath(path)) {
        TESSEL_REPORT(kDebugWarning, 0x3B40C6E2u) << "FGetCanonicalPath: relative path passed in!";
        return kArgErr;
    }
    if (!out) {
        TESSEL_REPORT(kDebugWarning, 0x68F91D05u) << "FGetCanonicalPath: NULL resolvedPath passed in!";
        return kArgErr;
    }
    return Guarded([&] {
        PathRef resolved(*path);
        if (resolved.ItemCount() != 0) {
            PlatformName name;
            if (const MgErr err = name.Make(path, true)) return err;
            resolved = PathRef(PathRef(name.Text(), PathRef::StringDisplay()).GetCorrectedCase(kCorrectedCaseSeconds));
        }
        return resolved.ConvertToPath(out);
    });
}

MgErr Win32GetLongFileName(Path path) {
    if (!FIsAbsPath(path)) return kArgErr;
    return Guarded([&] {
        if (FDepth(path) == 0) return kNoErr;
        PlatformName name;
        if (const MgErr err = name.Make(path, false)) return err;
        std::string real;
        if (!platform::ItemRealPath(name.Text(), real)) return Win32ToOVFileErr();
        return NameToPath(real, &path);
    });
}

MgErr FDirName(Path path, Path out) {
    if (!path || !out) return kArgErr;
    return Guarded([&] {
        const PathRef parent = path->GetParentDirectory();
        if (!parent.IsValid()) return kArgErr;
        *out = parent;
        return kNoErr;
    });
}

// ---- well-known folders ---------------------------------------------------------------------------------------------

MgErr GetWorkingDir(Path* path) {
    if (!path) return kArgErr;
    return Guarded([&] {
        std::string name;
        if (!platform::CurrentFolder(name)) return kNotFoundErr;
        return NameToPath(name, path);
    });
}

MgErr FGetStdTmpDirPath(Path* path) {
    if (!path) return kArgErr;
    return Guarded([&] {
        std::string name, real;
        if (!platform::TemporaryFolder(name) || name.empty()) return kNotFoundErr;
        if (platform::ItemExists(name.c_str()) != platform::ItemKind::kFolder) return FAppPath(path);
        if (!platform::ItemRealPath(name.c_str(), real)) return Win32ToOVFileErr();
        return NameToPath(real, path);
    });
}

// ---- extensions of resource files -----------------------------------------------------------------------------------

_FMFileType HasRezExt(Path path) {
    return GuardedOr<_FMFileType>(0, [&]() -> _FMFileType {
        std::string name;
        if (!path || FDepth(path) < 1 || path->CopyItemAt(-1, &name)) return 0;
        return PathRef::NameGetExtensionType(name);
    });
}

_FMFileType PStrHasRezExt(ConstPStr name) {
    if (!name) return 0;
    return GuardedOr<_FMFileType>(0, [&] { return PathRef::NameGetExtensionType(StringOf(name)); });
}

MgErr PStrAppendRezExt(PStr name, _FMFileType type) {
    if (!name) return kArgErr;
    return Guarded([&] {
        std::string text = StringOf(name);
        PathRef::NameAppendExtension(&text, type);
        if (text.size() > 255) return kArgErr;
        name[0] = static_cast<uint8>(text.size());
        std::copy(text.begin(), text.end(), name + 1);
        return kNoErr;
    });
}

int32 PStrStripRezExt(PStr name, _FMFileType type) {
    if (!name || (type && PStrHasRezExt(name) != type)) return 0;
    for (int32 length = name[0]; length > 0; --length) {
        if (name[length] != '.') continue;
        const int32 removed = name[0] - (length - 1);
        name[0] = static_cast<uint8>(length - 1);
        return removed;
    }
    return 0;
}

// ---- names of the host system ---------------------------------------------------------------------------------------

MgErr NativeToPath(CStr native, Path* path) {
    if (!native || !*native || !path) return kArgErr;
    return Guarded([&] {
        std::string absolute, name;
        if (!AbsoluteNative(native, &absolute)) return Win32ToOVFileErr();
        if (absolute.find('\\') != std::string::npos) return kArgErr;  // would read as a separator
        if (!platform::NativeToName(absolute, name)) return Win32ToOVFileErr();
        return NameToPath(name, path);
    });
}

MgErr PathToNative(Path path, char* buffer, uint32 size) {
    if (!buffer || !size) return kArgErr;
    *buffer = 0;
    return Guarded([&] {
        PlatformName name;
        if (const MgErr err = name.Make(path, false)) return err;
        std::string native;
        if (!platform::NameToNative(name.Text(), native)) return Win32ToOVFileErr();
        if (native.size() >= size) return kArgErr;
        std::memcpy(buffer, native.c_str(), native.size() + 1);
        return kNoErr;
    });
}
