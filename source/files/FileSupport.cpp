#include "files/FileSupport.h"

#include "files/Service.h"
#include <tessel/paths/PathManager.h>
#include <tessel/paths/PathRef.h>
#include <tessel/paths/PathTextFormat.h>
#include <tessel/sync/ThMutex.h>

namespace tessel {

namespace {

ThMutex fileManagerMutex = nullptr;

}  // namespace

// ---- names ----------------------------------------------------------------------------------------------------------

MgErr PlatformName::Make(Path path, bool resolveShortcuts) {
    return MakeDOSPathName(path, text_, resolveShortcuts ? 1 : 0);
}

void FlushPathCache(Path path) {
    if (path) path->FlushCache();
}

bool IsVolume(Path path) {
    return FIsAbsPath(path) && FDepth(path) == 1;
}

MgErr NameToPath(const std::string& name, Path* path) {
    return PathRef(name, PathRef::StringDisplay()).ConvertToPath(path);
}

// ---- opening --------------------------------------------------------------------------------------------------------

MgErr OpenRequest::Check(Path path, int32 openMode, int32 denyMode) {
    static constexpr uint32 kAccess[] = {platform::kRead | platform::kWrite, platform::kRead, platform::kWrite,
                                         platform::kWrite};
    static constexpr uint32 kDenied[] = {platform::kRead | platform::kWrite, platform::kWrite, 0};
    FlushPathCache(path);
    if (!FIsAbsPath(path)) return kArgErr;
    if (openMode < kFOpenReadWrite || openMode > kFOpenWriteTruncDirect) return kArgErr;
    if (denyMode < kFDenyReadWrite || denyMode > kFDenyNone) return kArgErr;
    access_ = kAccess[openMode % 4];
    denied_ = kDenied[denyMode];
    if (const MgErr err = name_.Make(path, true)) return err;
    return IsVolume(path) ? kArgErr : kNoErr;
}

MgErr OpenedFile(platform::FileHandle handle, File_t** file) {
    if (handle == platform::kNoFile) return Win32ToOVFileErr();
    *file = FileOf(handle);
    return kNoErr;
}

// ---- start and stop -------------------------------------------------------------------------------------------------

FileManagerLock::FileManagerLock() {
    ThMutexAcquire(fileManagerMutex);
}
FileManagerLock::~FileManagerLock() {
    ThMutexRelease(fileManagerMutex);
}

MgErr FileManagerStart() {
    return ThMutexCreate(&fileManagerMutex, "FileManager");
}

MgErr FileManagerStop() {
    ThMutexDestroy(fileManagerMutex);
    fileManagerMutex = nullptr;
    return kNoErr;
}

}  // namespace tessel
