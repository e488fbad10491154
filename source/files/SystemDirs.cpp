// The well-known folders of the system and of its users.
#include "files/FileSupport.h"
#include "platform/FileSystem.h"
#include "platform/LastError.h"
#include "platform/Shell.h"
#include <tessel/base/OVExcept.h>
#include <tessel/files/FileManager.h>
#include <tessel/files/SystemDirs.h>

#include <cstdio>
#include <string>

namespace tessel {

namespace {

using platform::ShellFolder;

constexpr ShellFolder kShellFolders[] = {
    ShellFolder::kProfile,         ShellFolder::kDesktop,
    ShellFolder::kDocuments,       ShellFolder::kLocalAppData,
    ShellFolder::kLocalAppData,    ShellFolder::kProfile,  // the last is not asked: temporary
    ShellFolder::kCommonDocuments, ShellFolder::kCommonAppData,
    ShellFolder::kCommonAppData,   ShellFolder::kSystem,
    ShellFolder::kSystem,          ShellFolder::kProgramFiles,
    ShellFolder::kWindows,         ShellFolder::kCommonAppData};

[[noreturn]] void ThrowSystemCall(const char* call) {
    char detail[96];
    std::snprintf(detail, sizeof detail, "%s() system call failed with error '%d'.", call,
                  static_cast<int>(platform::LastError()));
    TESSEL_THROW(kGenericErr, detail);
}

MgErr TemporaryFolderPath(Path* path) {
    std::string name, real;
    if (!platform::TemporaryFolder(name) || name.empty() || name.size() > kPlatformNameSize)
        ThrowSystemCall("GetTempPath");
    if (!platform::ItemRealPath(name.c_str(), real) || real.empty() || real.size() > kPlatformNameSize)
        ThrowSystemCall("GetLongPathName");
    return NameToPath(real, path);
}

}  // namespace

PathRef SystemDirs::Get(SystemDirType kind, bool create) {
    PathRef folder(PathRef::kAbsolute);
    Path path = &folder;
    if (const MgErr err = GetSystemDir(kind, create ? 1 : 0, &path)) TESSEL_THROW(err, "SystemDirs::Get");
    return folder;
}

PathRef SystemDirs::GetUserHomeDir(bool create) {
    return Get(kSystemDirUserHome, create);
}
PathRef SystemDirs::GetUserDesktopDir(bool create) {
    return Get(kSystemDirUserDesktop, create);
}
PathRef SystemDirs::GetUserDocumentsDir(bool create) {
    return Get(kSystemDirUserDocuments, create);
}
PathRef SystemDirs::GetUserApplicationDataDir(bool create) {
    return Get(kSystemDirUserApplicationData, create);
}

}  // namespace tessel

using namespace tessel;

MgErr GetSystemDir(SystemDirType kind, int32 create, Path* path) {
    if (!path || kind < kSystemDirUserHome || kind > kSystemDirPublicApplicationData3) return kArgErr;
    if (kind == kSystemDirTemporary) return TemporaryFolderPath(path);
    const bool volume = kind == kSystemDirSystemVolume;
    std::string name;
    if (!platform::ShellFolderName(kShellFolders[kind], create && !volume, name)) return kNoErr;
    if (!volume) return NameToPath(name, path);
    PathRef folder(name, PathRef::StringDisplay());
    return FMGetVolPath(&folder, path);
}

MgErr FGetOSFolderPath(Path, int32 kind) {
    return kind ? kNotFoundErr : kArgErr;
}
