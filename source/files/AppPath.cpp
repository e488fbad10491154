// The folders of the running program and of the library.
#include "diagnostics/Guarded.h"
#include "files/FileSupport.h"
#include <tessel/base/MGAppInterface.h>
#include <tessel/base/MGModule.h>
#include <tessel/diagnostics/DebugStream.h>
#include <tessel/files/AppPath.h>
#include <tessel/files/FileManager.h>
#include <tessel/paths/PathRef.h>

#include <mutex>
#include <string>

namespace tessel {

namespace {

constexpr int32 kExtensionDot = 4;  // from the end, in a name like "APP.EXE"

// The name of a module's file. One that does not look like a program's is reported.
std::string ModuleName(MGModuleHandle module) {
    char name[kModuleTextSize] = {};
    const int32 length = MSWinGetModulePath(module, name, sizeof name);
    if (length < kExtensionDot || name[length - kExtensionDot] != '.')
        TESSEL_REPORT(kDebugInfo, 0x54D1B9E6u) << "app name should end in .EXE: \"" << name << "\"";
    return name;
}

const std::string& ApplicationName() {
    static std::once_flag once;
    static char name[kModuleTextSize];
    static std::string text;
    std::call_once(once, [] {
        FAppCStr(name, sizeof name);
        text = name;
    });
    return text;
}

bool IsRunTimeEngine() {
    return MGGetIsRunTime(nullptr) || MGGetIsFullFeatureRunTime(nullptr);
}

// The folder that holds the file of that name.
MgErr FolderOf(const std::string& name, Path* path) {
    const PathRef file(name, PathRef::StringDisplay());
    return file.GetParentDirectory().ConvertToPath(path);
}

}  // namespace

}  // namespace tessel

using namespace tessel;

MgErr FAppCStr(char* buffer, int32 size) {
    if (!buffer || size <= 0) return kNoErr;
    return GuardedOr<MgErr>(kNoErr, [&] {
        const std::string name = ModuleName(MGModuleGetInstance());
        buffer[name.copy(buffer, static_cast<size_t>(size) - 1)] = 0;
        return kNoErr;
    });
}

MgErr FAppName(Path* path) {
    if (!path) return kArgErr;
    return Guarded([&] { return NameToPath(ApplicationName(), path); });
}

MgErr FAppPath(Path* path) {
    if (!path) return kArgErr;
    return Guarded([&] { return FolderOf(ApplicationName(), path); });
}

MgErr FMGPath(Path* path) {
    if (!path) return kArgErr;
    if (!IsRunTimeEngine()) return FAppPath(path);
    return Guarded([&] { return FolderOf(ModuleName(MGModuleGetModule()), path); });
}

MgErr FResDir(Path* path) {
    if (const MgErr err = FMGPath(path)) return err;
    if (IsRunTimeEngine()) return kNoErr;
    return Guarded([&] {
        (*path)->Append("resource");
        return kNoErr;
    });
}
