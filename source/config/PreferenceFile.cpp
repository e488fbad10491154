// Which file and which section the host's settings are in.
#include "config/PreferenceFile.h"

#include "diagnostics/Guarded.h"
#include <tessel/base/MGAppInterface.h>
#include <tessel/base/OVExcept.h>
#include <tessel/config/ConfigManager.h>
#include <tessel/diagnostics/DebugStream.h>
#include <tessel/files/AppPath.h>
#include <tessel/files/FileManager.h>
#include <tessel/paths/PathManager.h>
#include <tessel/paths/PathTextFormat.h>
#include <tessel/registry/WinRegistry.h>
#include <tessel/utilities/UserCommandLine.h>

#include <cstring>

namespace tessel {
namespace {

constexpr char kExtension[] = ".ini";

std::string NonNull(CStr text) {
    return text ? text : "";
}

std::string BaseName() {
    MGAppInterface* app = MGApp();
    return app ? NonNull(app->PreferenceBaseName()) : "";
}

// What the functions for text give when they succeed, else not-a-path.
template <class Make>
PathRef PathFrom(Make make) {
    Path path = nullptr;
    MgErr err = make(&path);
    PathRef made(path);
    FDestroyPath(&path);
    if (err == kMemFullErr) TESSEL_THROW(err, "No memory for a path");
    return made;
}

// GetConfigPath, on a text of any length.
std::string ConfigName(std::string text) {
    size_t dot = text.rfind('.');
    if (dot != text.npos && dot > 0) text.erase(dot);
    return text + kExtension;
}

}  // namespace

bool CanBeFile(const PathRef& path) {
    // Behind the drive, or the server and the share.
    int32 names = path.StartsWith(PathRef::kUNC) ? 3 : 2;
    return path.IsValid() && !path.StartsWith(PathRef::kRelative) && path.ItemCount() >= names;
}

PathRef PreferencePath(CStr text) {
    PathRef path = PathFrom([&](Path* made) { return FFileSystemCStrToPath(text, made); });
    if (CanBeFile(path)) return path;
    // "/dir/name" and "name" are relative here.
    path = PathFrom([&](Path* made) { return NativeToPath(text, made); });
    return CanBeFile(path) ? path : PathRef();
}

PathRef DefaultPreferenceFile() {
    Path folder = nullptr;
    MgErr err = FAppPath(&folder);
    PathRef path(folder);
    FDestroyPath(&folder);
    if (err) TESSEL_THROW(err, "The application has no folder");
    return path.Append(BaseName() + kExtension);
}

PathRef MainPreferenceFile() {
    CStr chosen = GetPrefsPath();
    if (!chosen) return DefaultPreferenceFile();
    PathRef path = PreferencePath(chosen);
    if (CanBeFile(path)) return path;
    TESSEL_REPORT(kDebugWarning, 0x5E93C07Au)
        << "The preference file \"" << chosen << "\" is not understood; the default holds.";
    return DefaultPreferenceFile();
}

std::string HostSection() {
    MGAppInterface* app = MGApp();
    if (!app) return "";
    if (app->IsBoundApp()) return NonNull(app->PreferenceBaseName());
    if (app->IsRunTime()) return NonNull(app->ApplicationAltName()) + "RT";
    if (app->IsFullFeatureRunTime()) return NonNull(app->ApplicationAltName()) + "FFRT";
    return NonNull(app->ApplicationName());
}

}  // namespace tessel

using namespace tessel;

MgErr GetConfigPath(CStr text, char* buffer, int32) {
    if (!text || !buffer) return kArgErr;
    const char* dot = std::strrchr(text, '.');
    size_t length = dot && dot != text ? static_cast<size_t>(dot - text) : std::strlen(text);
    std::memmove(buffer, text, length);
    std::memcpy(buffer + length, kExtension, sizeof kExtension);
    return kNoErr;
}

MgErr CfgGetPathToPreviousVersion(CStr product, CStr version, CStr fileName, char* buffer) {
    if (!buffer) return kArgErr;
    *buffer = 0;
    if (!product || !version || !fileName) return kArgErr;
    return Guarded([&] {
        IWinRegistryKey* root = GetLocalMachineRegistryKey(kRegistryViewDefault);
        if (!root) return kRegistryErr;
        AutoRelease<IWinRegistryKey> key;
        std::string name = std::string("SOFTWARE\\BRENMOOR\\") + product + '\\' + version;
        if (root->OpenSubKey(name.c_str(), key.Out())) return kRegistryErr;
        CStr folder = key->GetStringValue("Path");
        if (!folder) return static_cast<MgErr>(key->GetLastError());
        std::string file = ConfigName(std::string(folder) + fileName);
        if (file.size() >= kMaxDOSPathName) return kArgErr;
        std::memcpy(buffer, file.c_str(), file.size() + 1);
        return kNoErr;
    });
}
