// Shortcuts, the recycle bin, and well-known folders.
#include "support/StartedFiles.h"
#include <tessel/base/OVExcept.h>
#include <tessel/files/AppPath.h>
#include <tessel/files/FileManager.h>
#include <tessel/files/SystemDirs.h>
#include <tessel/files/shortcut.h>
#include <tessel/paths/PathTextFormat.h>

#include <cstdlib>
#include <cstring>
#include <filesystem>
#include <map>
#include <string>

namespace tessel::test {
namespace {

using namespace std::string_literals;

std::string Little32(uint32 value) {
    return {static_cast<char>(value), static_cast<char>(value >> 8), static_cast<char>(value >> 16),
            static_cast<char>(value >> 24)};
}

// A shortcut file with nothing in it but its target.
std::string ShortcutTo(const std::string& target) {
    const std::string header = Little32(76) + "\x01\x14\x02\0\0\0\0\0\xC0\0\0\0\0\0\0\x46"s + Little32(2);
    const std::string volume = Little32(17) + Little32(3) + Little32(0) + Little32(16) + "\0"s;
    const auto end = static_cast<uint32>(28 + volume.size() + target.size() + 1);
    const auto suffix = static_cast<uint32>(28 + volume.size() + target.size());
    return header + std::string(76 - header.size(), '\0') + Little32(end) + Little32(28) + Little32(1) + Little32(28) +
           Little32(28 + 17) + Little32(0) + Little32(suffix) + volume + target + "\0"s;
}

class FoldersTest : public testing::Test {
protected:
    FoldersTest() { Set("HOME", started.drive.Native("home")); }
    ~FoldersTest() override {
        for (const auto& [variable, value] : before_) setenv(variable.c_str(), value.c_str(), 1);
    }
    void Set(const char* variable, const std::string& value) {
        const char* old = std::getenv(variable);
        before_.try_emplace(variable, old ? old : "");
        setenv(variable, value.c_str(), 1);
    }
    std::string Text(const PathRef& path) {
        std::string text;
        EXPECT_EQ(kNoErr, path.ConvertToString(&text, PathRef::StringDisplay()));
        return text;
    }
    std::string ResolvedName(const std::string& name, int32 (*resolve)(char*), int32 result) {
        char buffer[300];
        std::strcpy(buffer, name.c_str());
        EXPECT_EQ(result, resolve(buffer)) << name;
        return buffer;
    }

    StartedFiles started;
    std::map<std::string, std::string> before_;
};

TEST_F(FoldersTest, ShortcutsAreFollowedAlongAName) {
    std::filesystem::create_directories(started.drive.Native("real/deep"));
    started.drive.Put("real/deep/f.txt", "12345");
    started.drive.Put("link.lnk", ShortcutTo("T:\\real"));
    started.drive.Put("real/down.LNK", ShortcutTo("T:\\real\\deep\\"));
    started.drive.Put("loop.lnk", ShortcutTo("T:\\loop.lnk"));

    EXPECT_EQ("T:\\real", ResolvedName("T:\\link.lnk", Win32ResolveShortCut, 1));
    EXPECT_EQ("T:\\real", ResolvedName("T:\\link", Win32ResolveShortCut, 1));
    EXPECT_EQ("T:\\real", ResolvedName("T:\\real", Win32ResolveShortCut, 0));
    EXPECT_EQ("T:\\missing", ResolvedName("T:\\missing", Win32ResolveShortCut, 0));
    EXPECT_EQ("T:\\real\\deep\\f.txt", ResolvedName("T:\\link\\down\\f.txt", Win32ResolveAllShortCuts, 1));
    EXPECT_EQ("T:\\real\\deep\\f.txt", ResolvedName("T:\\link.lnk\\deep\\f.txt", Win32ResolveAllShortCuts, 1));
    EXPECT_EQ("T:\\real\\deep", ResolvedName("T:\\real\\deep", Win32ResolveAllShortCuts, 0));
    ResolvedName("T:\\loop.lnk\\x", Win32ResolveAllShortCuts, 1);
    started.drive.Put("l.lnk", ShortcutTo("T:\\real\\deep"));
    const std::string tooLongThen = "T:\\l\\" + std::string(251, 'x');
    EXPECT_EQ(tooLongThen, ResolvedName(tooLongThen, Win32ResolveAllShortCuts, 0));

    PathRef path = started.On("link.lnk/down.lnk/f.txt");
    FInfo64Rec info;
    EXPECT_EQ(kNoErr, FGetInfo64(&path, &info, kFInfoAll));
    EXPECT_EQ(5, info.size);
    PathRef resolved;
    EXPECT_EQ(&resolved, FResolvePath(&resolved, &path));
    EXPECT_EQ("T:\\real\\deep\\f.txt", Text(resolved));
    // Without its extension a shortcut is not meant.
    PathRef bare = started.On("link/deep");
    EXPECT_EQ(0, FExists(&bare));
    EXPECT_EQ(&resolved, FResolvePath(&resolved, &bare));
    EXPECT_EQ("T:\\link\\deep", Text(resolved));
    PathRef link = started.On("LINK.lnk");
    EXPECT_TRUE(link.IsAShortcut());
    EXPECT_EQ(kNoErr, FRemove(&link));
    EXPECT_EQ("12345", started.drive.Get("real/deep/f.txt"));
}

TEST_F(FoldersTest, TheRecycleBinTakesFiles) {
    Set("XDG_DATA_HOME", started.drive.Native("data"));
    started.drive.Put("f", "kept");
    EXPECT_EQ(kNoErr, FRemoveToRecycle(started.At("f"), 0));
    EXPECT_EQ(0, FExists(started.At("f")));
    EXPECT_EQ("kept", started.drive.Get("data/Trash/files/f"));
    EXPECT_EQ(kNotFoundErr, FRemoveToRecycle(started.At("f"), 1));
}

TEST_F(FoldersTest, StandardFoldersByKind) {
    for (const char* variable : {"XDG_DATA_HOME", "XDG_CONFIG_HOME", "XDG_DATA_DIRS"}) Set(variable, "");
    EXPECT_EQ("T:\\home", Text(SystemDirs::GetUserHomeDir(true)));
    EXPECT_EQ("T:\\home\\Documents", Text(SystemDirs::GetUserDocumentsDir(true)));
    PathRef documents = SystemDirs::Get(kSystemDirUserDocuments, false);
    EXPECT_EQ(2, FExists(&documents));
    EXPECT_EQ("T:\\home\\.local\\share", Text(SystemDirs::GetUserApplicationDataDir(true)));
    const int32 kSame[][2] = {{3, 4}, {7, 8}, {7, 13}, {9, 10}};
    for (const auto& pair : kSame)
        EXPECT_EQ(Text(SystemDirs::Get(pair[0], true)), Text(SystemDirs::Get(pair[1], true))) << pair[0];
    EXPECT_EQ(1, SystemDirs::Get(kSystemDirSystemVolume, false).ItemCount());
    Path path = nullptr;
    EXPECT_EQ(kArgErr, GetSystemDir(14, 0, &path));
    EXPECT_EQ(kArgErr, GetSystemDir(0, 0, nullptr));
    EXPECT_EQ(nullptr, path);
    EXPECT_EQ(kNotFoundErr, FGetOSFolderPath(nullptr, 1));

    std::filesystem::create_directories(started.drive.Native("tmp"));
    Set("TMPDIR", started.drive.Native("tmp"));
    EXPECT_EQ("T:\\tmp", Text(SystemDirs::Get(kSystemDirTemporary, false)));
    EXPECT_EQ(kNoErr, FGetStdTmpDirPath(&path));
    EXPECT_EQ("T:\\tmp", Text(*path));
    std::filesystem::remove(started.drive.Native("tmp"));
    Path application = nullptr, resources = nullptr;
    const ReportRecorder programsHaveNoExtensionHere;
    EXPECT_EQ(kNoErr, FAppPath(&application));
    EXPECT_EQ(kNoErr, FGetStdTmpDirPath(&path));
    EXPECT_EQ(Text(*application), Text(*path));
    EXPECT_EQ(kNoErr, FResDir(&resources));
    EXPECT_EQ(Text(*application) + "\\resource", Text(*resources));
    EXPECT_EQ(kNoErr, FAppName(&path));
    EXPECT_EQ(std::filesystem::canonical("/proc/self/exe").filename().string(), path->Name());
    for (Path* made : {&path, &application, &resources}) PathRef::DisposePath(*made);
}

}  // namespace
}  // namespace tessel::test
