// Files and folders as whole objects: creating, copying, moving, removing.
#include "diagnostics/Guarded.h"
#include "files/FileSupport.h"
#include "platform/FileSystem.h"
#include "platform/LastError.h"
#include "platform/Replacement.h"
#include "platform/Shell.h"
#include <tessel/diagnostics/DebugStream.h>
#include <tessel/files/FileManager.h>
#include <tessel/paths/PathManager.h>
#include <tessel/paths/PathRef.h>
#include <tessel/paths/PathTextFormat.h>

#include <cstring>

namespace tessel {

namespace {

constexpr int32 kNewFolderPermissions = 0777;

// An open file that closes itself.
class OpenFile {
public:
    OpenFile() = default;
    ~OpenFile() {
        if (file_) FMClose(file_);
    }
    OpenFile(const OpenFile&) = delete;
    OpenFile& operator=(const OpenFile&) = delete;

    MgErr Open(Path path, int32 openMode, int32 denyMode) { return FMOpen(&file_, path, openMode, denyMode); }
    platform::FileHandle get() const { return HandleOf(file_); }

private:
    File_t* file_ = nullptr;
};

MgErr ErrOfCopy(platform::CopyResult result) {
    if (result == platform::CopyResult::kDone) return kNoErr;
    return result == platform::CopyResult::kReadFailed ? kIOErr : Win32ToOVFileErr();
}

// Deletes the copied source. That it stays is not told, unless it is because it has been written meanwhile.
MgErr DeleteSource(Path from, const OpenFile& source, const platform::FileVersion& version, platform::FileHandle copy) {
    PlatformName name, resolved;
    if (name.Make(from, false) || resolved.Make(from, true)) return kNoErr;
    if (std::strcmp(name.Text(), resolved.Text()) != 0) {
        FRemove(from);  // a shortcut: it goes itself
        return kNoErr;
    }
    if (platform::FileDeleteCopied(name.Text(), source.get(), version, copy)) return kNoErr;
    return platform::LastError() == platform::kErrorSharingViolation ? kFileInUseErr : kNoErr;
}

// For a file that cannot be replaced: its own bytes change. The room is had first, so that a full disk changes none.
MgErr OverwriteWith(Path from, const OpenFile& source, const OpenFile& destination) {
    int64 size = 0;
    if (!platform::FileSize(source.get(), size)) return kIOErr;
    if (!platform::FileReserve(destination.get(), size)) return Win32ToOVFileErr();
    platform::FileVersion version;
    if (const MgErr err = ErrOfCopy(platform::FileCopyBytes(source.get(), destination.get(), false, version)))
        return err;
    if (!platform::FileFlush(destination.get())) return Win32ToOVFileErr();
    return DeleteSource(from, source, version, destination.get());
}

MgErr MoveInto(Path from, Path to) {
    OpenFile source, destination;
    if (const MgErr err = source.Open(from, kFOpenRead, kFDenyWrite)) return err;
    if (const MgErr err = destination.Open(to, kFOpenWrite, kFDenyReadWrite)) {
        TESSEL_REPORT(kDebugWarning, 0x71B0E3A4u) << "FCopyIntoWin32 got error " << err;
        return err;
    }
    PlatformName name;
    if (const MgErr err = name.Make(to, true)) return err;
    platform::ReplaceRequest request;
    request.name = name.Text();
    request.opened = destination.get();
    request.deny = platform::kRead | platform::kWrite;
    platform::Replacement copy;
    if (!copy.Begin(request)) {
        const bool inPlace = copy.Failure() == platform::ReplaceFailure::kCannotMake;
        return inPlace ? OverwriteWith(from, source, destination) : Win32ToOVFileErr();
    }
    platform::FileVersion version;
    if (const MgErr err = ErrOfCopy(platform::FileCopyBytes(source.get(), copy.File(), true, version))) return err;
    if (!copy.Finish()) return Win32ToOVFileErr();
    return DeleteSource(from, source, version, copy.File());
}

// When the current directory lies inside `path`, goes to the parent of `path`. A failure is only reported.
void LeaveFolder(Path path) {
    MgErr err = kNoErr;
    try {
        std::string current;
        if (!platform::CurrentFolder(current)) return;
        const PathRef here(current, PathRef::StringDisplay());
        const PathRef common = path->GetInCommonWith(here, PathRef::kIgnoreCase);
        if (common.ItemCount() != path->ItemCount() || path->ItemCount() == 0) return;
        PathRef parent = path->GetParentDirectory();
        PlatformName name;
        err = name.Make(&parent, false);
        if (!err) err = ErrUnless(platform::SetCurrentFolder(name.Text()));
    } catch (...) {
        err = CaughtErr();
    }
    if (err)
        TESSEL_REPORT(kDebugWarning, 0x2F9D6C18u) << "failed to preprocess move file " << path << ", error " << err;
}

// Removes the item that `name` names, which is also `path`.
MgErr RemoveItem(Path path, const char* name) {
    platform::ItemInfo info;
    if (!platform::ItemGetInfo(name, info)) return Win32ToOVFileErr();
    if (!info.folder) return ErrUnless(platform::FileDelete(name));
    LeaveFolder(path);
    return ErrUnless(platform::FolderRemove(name));
}

}  // namespace

}  // namespace tessel

using namespace tessel;

// ---- creating -------------------------------------------------------------------------------------------------------

MgErr FGenericCreate(File_t** file, Path path, int32, int32 openMode, int32 denyMode, int32, int32 always) {
    if (!file) return kArgErr;
    *file = nullptr;
    return Guarded([&] {
        OpenRequest request;
        if (const MgErr err = request.Check(path, openMode, denyMode)) return err;
        const auto disposition = always ? platform::Disposition::kCreateAlways : platform::Disposition::kCreateNew;
        return OpenedFile(request.Open(disposition), file);
    });
}

MgErr FCreate(File_t** file, Path path, int32 unused1, int32 openMode, int32 denyMode, int32 unused2) {
    return FGenericCreate(file, path, unused1, openMode, denyMode, unused2, 0);
}

MgErr FCreateAlways(File_t** file, Path path, int32 unused1, int32 openMode, int32 denyMode, int32 unused2) {
    return FGenericCreate(file, path, unused1, openMode, denyMode, unused2, 1);
}

MgErr FNewDir(Path path, int32) {
    return Guarded([&] {
        if (!FIsAbsPath(path)) return kArgErr;
        FlushPathCache(path);
        PlatformName name;
        if (const MgErr err = name.Make(path, true)) return err;
        return ErrUnless(platform::FolderCreate(name.Text()));
    });
}

MgErr FNewDirHier(Path path) {
    return Guarded([&] {
        if (!FIsAbsPath(path)) return kArgErr;
        switch (FExists(path)) {
            case 1:
                return kGenericErr;
            case 2:
                return kNoErr;
            default:
                break;
        }
        PathRef parent = path->GetParentDirectory();
        if (const MgErr err = FNewDirHier(&parent)) return err;
        const MgErr err = FNewDir(path, FGetDefPerm(kNewFolderPermissions));
        // Someone else may have made it in between.
        return err == kExistsErr && FExists(path) == 2 ? kNoErr : err;
    });
}

// ---- copying and moving ---------------------------------------------------------------------------------------------

MgErr FCopyResolve(Path from, Path to, int32 resolve) {
    return Guarded([&] {
        if (!FIsAbsPath(from) || !FIsAbsPath(to) || IsVolume(from)) return kArgErr;
        FlushPathCache(to);
        PlatformName source, destination;
        if (const MgErr err = source.Make(from, resolve != 0)) return err;
        if (const MgErr err = destination.Make(to, true)) return err;
        return ErrUnless(platform::FileCopy(source.Text(), destination.Text()));
    });
}

MgErr FCopy(Path from, Path to) {
    return FCopyResolve(from, to, 1);
}

MgErr FMoveResolve(Path from, Path to, int32 resolve) {
    return Guarded([&] {
        if (!FIsAbsPath(from) || !FIsAbsPath(to)) return kArgErr;
        FlushPathCache(from);
        FlushPathCache(to);
        LeaveFolder(from);
        if (FDepth(from) < 2 || FDepth(to) < 1) return kArgErr;
        PlatformName source, destination;
        if (const MgErr err = source.Make(from, resolve != 0)) return err;
        if (const MgErr err = destination.Make(to, true)) return err;
        return ErrUnless(platform::ItemRename(source.Text(), destination.Text()));
    });
}

MgErr FMove(Path from, Path to) {
    return FMoveResolve(from, to, 1);
}

MgErr FMoveInto(Path from, Path to) {
    return Guarded([&] {
        if (!FIsAbsPath(from) || !FIsAbsPath(to)) return kArgErr;
        FlushPathCache(from);
        FlushPathCache(to);
        return MoveInto(from, to);
    });
}

// ---- removing -------------------------------------------------------------------------------------------------------

MgErr FRemove(Path path) {
    return Guarded([&] {
        if (!FIsAbsPath(path)) return kArgErr;
        FlushPathCache(path);
        PlatformName name;
        if (const MgErr err = name.Make(path, false)) return err;
        return RemoveItem(path, name.Text());
    });
}

MgErr FRemoveToRecycle(Path path, int32) {
    return Guarded([&] {
        if (!FIsAbsPath(path)) return kArgErr;
        FlushPathCache(path);
        PlatformName name;
        if (const MgErr err = name.Make(path, false)) return err;
        return ErrUnless(platform::ShellTrash(name.Text()));
    });
}
