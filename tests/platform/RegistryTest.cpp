#include "platform/Clock.h"
#include "platform/CodePage.h"
#include "platform/Registry.h"
#include "support/FailingPlatform.h"
#include "support/HandClock.h"
#include "support/ScratchDrive.h"
#include "support/Test.h"

#include <cerrno>
#include <fcntl.h>
#include <filesystem>
#include <sys/stat.h>
#include <unistd.h>

namespace tessel::platform {
namespace {

using test::FailingPlatform;
using test::ScratchDrive;

class Registry : public ::testing::Test {
protected:
    Registry() {
        setenv("TESSEL_REGISTRY", drive_.Native("store").c_str(), 1);
        RegistryOpenRoot(RegistryRoot::kLocalMachine, kRegistryDefaultView, root_);
    }
    ~Registry() override {
        RegistryClose(root_);
        unsetenv("TESSEL_REGISTRY");
    }

    RegistryKey* Create(const char* path) {
        RegistryKey* key = nullptr;
        EXPECT_EQ(kErrorSuccess, RegistryCreate(root_, path, key));
        return key;
    }
    ErrorNumber TryOpen(const char* path) {
        RegistryKey* key = nullptr;
        ErrorNumber number = RegistryOpen(root_, path, false, key);
        if (key) RegistryClose(key);
        return number;
    }

    ScratchDrive drive_;
    RegistryKey* root_ = nullptr;
};

TEST_F(Registry, NeedsAnAbsoluteFolder) {
    setenv("TESSEL_REGISTRY", "relative/store", 1);
    RegistryKey* key = nullptr;
    EXPECT_EACH(RegistryOpenRoot(RegistryRoot::kUsers, kRegistryDefaultView, key) == kErrorInvalidName, key == nullptr);
}

TEST_F(Registry, KeysIgnoreCaseAndKeepIt) {
    EXPECT_EQ(kErrorFileNotFound, TryOpen("Software"));
    RegistryClose(Create("Software\\Maker\\Größe"));
    RegistryClose(Create("SOFTWARE\\maker\\..\\a/b"));
    EXPECT_EQ(kErrorSuccess, TryOpen("sofTWARE\\MAKER\\gRÖßE"));
    RegistryKey* maker = Create("software\\Maker");
    std::string name;
    EXPECT_EQ(kErrorSuccess, RegistryEnumerateKey(maker, 0, name));
    EXPECT_EQ("..", name);  // a name like any other
    EXPECT_EQ(kErrorSuccess, RegistryEnumerateKey(maker, 1, name));
    EXPECT_EACH(name == "Größe", RegistryEnumerateKey(maker, 2, name) == kErrorNoMoreItems);
    RegistryClose(maker);
    EXPECT_EQ(kErrorSuccess, TryOpen("software\\maker\\..\\A/B"));

    EXPECT_EACH(RegistryDelete(root_, "Software\\Maker\\..") == kErrorSuccess,
                RegistryDelete(root_, "Software\\Maker\\..") == kErrorFileNotFound,
                RegistryDelete(root_, "") == kErrorInvalidParameter);
}

TEST_F(Registry, ViewsAndRootsAreApart) {
    RegistryKey *other = nullptr, *view64 = nullptr;
    RegistryOpenRoot(RegistryRoot::kCurrentUser, kRegistryDefaultView, other);
    RegistryOpenRoot(RegistryRoot::kLocalMachine, kRegistryView64, view64);
    RegistryClose(Create("Key"));
    RegistryKey* key = nullptr;
    EXPECT_EACH(RegistryOpen(other, "Key", false, key) == kErrorFileNotFound,
                RegistryOpen(view64, "Key", false, key) == kErrorFileNotFound,
                RegistryOpenRoot(RegistryRoot::kUsers, 1, key) == kErrorInvalidParameter);
    std::uint32_t keys = 9, values = 9;
    EXPECT_EQ(kErrorSuccess, RegistryCounts(view64, keys, values));  // nothing of it is on the disk yet
    EXPECT_EQ(0u, keys + values);
    RegistryClose(other);
    RegistryClose(view64);
}

TEST_F(Registry, ValuesKeepTypeAndBytes) {
    RegistryKey* key = Create("Key");
    const std::string bytes("a\0\xFF\n", 4);
    const std::pair<const char*, std::string> rows[] = {{"", "unnamed"}, {"Path", bytes}, {"=.%2F/\\", ""}};
    std::uint32_t type = 0;
    std::string data;
    for (const auto& [name, value] : rows)
        EXPECT_EACH(RegistryQueryValue(key, name, type, data) == kErrorFileNotFound,
                    RegistrySetValue(key, name, 4000000000u, "longer before", 13) == kErrorSuccess,
                    RegistrySetValue(key, name, 3, value.data(), value.size()) == kErrorSuccess);
    for (const auto& [name, value] : rows)
        EXPECT_EACH(RegistryQueryValue(key, name, type, data) == kErrorSuccess, type == 3u, value == data);
    EXPECT_EACH(RegistryQueryValue(key, "PATH", type, data) == kErrorSuccess, bytes == data);
    std::uint32_t keys = 0, values = 0;
    EXPECT_EACH(RegistryCounts(key, keys, values) == kErrorSuccess, values == 3u);
    std::string names, name;
    for (std::uint32_t i = 0; RegistryEnumerateValue(key, i, name) == 0; ++i) names += "<" + name + ">";
    EXPECT_EACH(names == "<><=.%2F/\\><Path>", RegistryFlush(key) == kErrorSuccess);
    EXPECT_EQ("REG 3\n" + bytes, drive_.Get("store/HKEY_LOCAL_MACHINE/Key/=Path"));  // the documented form

    drive_.Put("store/HKEY_LOCAL_MACHINE/Key/=Path", "REG x\n");
    EXPECT_EACH(RegistryQueryValue(key, "Path", type, data) == kErrorRegistryCorrupt,
                RegistryDeleteValue(key, "path") == kErrorSuccess,
                RegistryDeleteValue(key, "path") == kErrorFileNotFound);
    RegistryClose(key);
    EXPECT_EACH(RegistryOpen(root_, "Key", false, key) == kErrorSuccess,
                RegistrySetValue(key, "Path", 1, "x", 1) == kErrorAccessDenied);
    RegistryClose(key);
    EXPECT_EQ(kErrorSuccess, RegistryDelete(root_, "KEY"));
}

TEST_F(Registry, NamesAreInTheCodePage) {
    ASSERT_TRUE(SetCodePage(932));
    RegistryKey* key = Create("\x83\x5C\\Sub");  // one character whose second byte is a backslash, then a separator
    RegistryClose(key);
    std::string name;
    EXPECT_EACH(RegistryEnumerateKey(root_, 0, name) == kErrorSuccess, name == "\x83\x5C");
    SetCodePage(kCodePageUtf8);
    EXPECT_EQ(kErrorSuccess, TryOpen("ソ\\sub"));
}

TEST_F(Registry, AFailedWriteLeavesTheOldValue) {
    RegistryKey* key = Create("Key");
    ASSERT_EQ(kErrorSuccess, RegistrySetValue(key, "Path", 1, "old", 3));
    for (const char* call : {"write", "fchmod", "fsync", "renameat2"}) {
        FailingPlatform failing(call, 1, ENOSPC);
        EXPECT_EQ(kErrorDiskFull, RegistrySetValue(key, "Path", 1, "new", 3)) << call;
    }
    FailingPlatform failing("fsync", 2, EROFS);  // of the folder
    EXPECT_EQ(kErrorAccessDenied, RegistrySetValue(key, "Path", 1, "new", 3));
    std::uint32_t type = 0;
    std::string data;
    EXPECT_EACH(RegistryQueryValue(key, "Path", type, data) == kErrorSuccess, data == "old");
    RegistryClose(key);
    EXPECT_EQ(1, std::distance(std::filesystem::directory_iterator(drive_.Native("store/HKEY_LOCAL_MACHINE/Key")), {}));
}

TEST_F(Registry, WhatIsNoneOfItsOwnIsLeftAlone) {
    std::filesystem::create_directory(drive_.Native("outside"));
    drive_.Put("outside/.precious", "file");
    RegistryKey* key = Create("Key");
    const std::string folder = drive_.Native("store/HKEY_LOCAL_MACHINE/Key/");
    ASSERT_EQ(0, symlink(drive_.Native("outside").c_str(), (folder + "Link").c_str()));
    ASSERT_EQ(0, mkfifo((folder + "=pipe").c_str(), 0600));
    drive_.Put("store/HKEY_LOCAL_MACHINE/Key/=endless", "REG 1\n");
    ASSERT_EQ(0, truncate((folder + "=endless").c_str(), off_t{1} << 40));
    drive_.Put("store/HKEY_LOCAL_MACHINE/Key/stray", "");

    std::uint32_t keys = 9, values = 0, type = 0;
    std::string data;
    EXPECT_EACH(RegistryCounts(key, keys, values) == kErrorSuccess, keys == 0u,
                TryOpen("Key\\Link") == kErrorFileNotFound, TryOpen("Key\\stray") == kErrorFileNotFound,
                RegistryDelete(key, "Link") == kErrorFileNotFound);
    RegistryKey* made = nullptr;
    EXPECT_EQ(kErrorAccessDenied, RegistryCreate(key, "Link", made));
    for (const char* damaged : {"pipe", "endless"})
        EXPECT_EQ(kErrorRegistryCorrupt, RegistryQueryValue(key, damaged, type, data)) << damaged;
    EXPECT_EACH(RegistrySetValue(key, "large", 3, "", kLargestRegistryValue + 1) == kErrorInvalidParameter,
                RegistryDelete(root_, "Key") == kErrorSuccess, drive_.Get("outside/.precious") == "file");

    // It does not come back by what is done to it from now on.
    EXPECT_EACH(RegistrySetValue(key, "x", 1, "x", 1) == kErrorKeyDeleted,
                RegistryCreate(key, "Sub", made) == kErrorKeyDeleted,
                RegistryEnumerateKey(key, 0, data) == kErrorKeyDeleted,
                RegistryCounts(key, keys, values) == kErrorKeyDeleted, TryOpen("Key") == kErrorFileNotFound);
    RegistryClose(key);
}

TEST_F(Registry, NamesMayBeLong) {
    RegistryKey* key = Create("Key");
    const std::string name(250, 'n');
    EXPECT_EACH(RegistrySetValue(key, name.c_str(), 1, "x", 1) == kErrorSuccess,
                RegistryDeleteValue(key, name.c_str()) == kErrorSuccess);
    std::uint32_t type = 0;
    std::string data, found;
    for (const std::string& each : {std::string(255, '/'), std::string(300, '%'), name + "\xC3\xA4" + name}) {
        EXPECT_EACH(RegistryQueryValue(key, each.c_str(), type, data) == kErrorFileNotFound,
                    RegistrySetValue(key, each.c_str(), 7, "data\n", 5) == kErrorSuccess,
                    RegistryQueryValue(key, each.c_str(), type, data) == kErrorSuccess, type == 7, data == "data\n",
                    RegistryEnumerateValue(key, 0, found) == kErrorSuccess, each == found,
                    RegistryDeleteValue(key, each.c_str()) == kErrorSuccess);
        RegistryClose(Create(("Key\\" + each + "\\Sub").c_str()));
        EXPECT_EACH(RegistryEnumerateKey(key, 0, found) == kErrorSuccess, each == found,
                    RegistryDelete(key, (each + "\\sub").c_str()) == kErrorSuccess,
                    RegistryDelete(key, each.c_str()) == kErrorSuccess);
    }
    EXPECT_EACH(
        RegistrySetValue(key, (name + "\xC3\xA4" + name).c_str(), 1, "x", 1) == kErrorSuccess,
        RegistryQueryValue(key, (std::string(250, 'N') + "\xC3\x84" + name).c_str(), type, data) == kErrorSuccess);
    RegistryClose(key);
}

// Each name in another spelling when it is made and when it is looked for.
TEST_F(Registry, KeysMayLieDeep) {
    constexpr int kDepth = 200;
    const std::string plain(255, 'k'), hashed(255, '/'), PLAIN(255, 'K');
    std::string made, asked;
    for (int i = 0; i < kDepth; ++i) {
        made += "\\" + (i % 2 ? plain : hashed);
        asked += "\\" + (i % 2 ? PLAIN : hashed);
    }
    RegistryKey *key = Create(made.c_str()), *opened = nullptr;
    EXPECT_EACH(RegistrySetValue(key, "Value", 1, "data", 4) == kErrorSuccess,
                RegistrySetValue(key, hashed.c_str(), 1, "x", 1) == kErrorSuccess,
                RegistryDeleteValue(key, hashed.c_str()) == kErrorSuccess, RegistryFlush(key) == kErrorSuccess);
    RegistryClose(key);
    ASSERT_EQ(kErrorSuccess, RegistryOpen(root_, asked.c_str(), false, opened));
    std::uint32_t type = 0, keys = 9, values = 9;
    std::string data, name;
    EXPECT_EACH(RegistryQueryValue(opened, "VALUE", type, data) == kErrorSuccess, data == "data",
                RegistryCounts(opened, keys, values) == kErrorSuccess, keys == 0, values == 1);
    RegistryClose(opened);
    for (int i = kDepth; i-- > 0;) {
        asked.resize(static_cast<std::size_t>(i) * 256);
        ASSERT_EQ(kErrorSuccess, RegistryOpen(root_, asked.c_str(), false, opened));
        EXPECT_EACH(RegistryEnumerateKey(opened, 0, name) == kErrorSuccess, (i % 2 ? plain : hashed) == name,
                    RegistryDelete(opened, name.c_str()) == kErrorSuccess);
        RegistryClose(opened);
    }
}

// The folder of a key with a long name has its name as soon as it is there.
TEST_F(Registry, NoKeyIsThereWithoutItsName) {
    const std::string name(255, '/');
    RegistryKey *key = Create("Key"), *made = nullptr;
    for (const char* call : {"write", "renameat2", "fsync"}) {
        FailingPlatform failing(call, 1, ENOSPC);
        EXPECT_EQ(kErrorDiskFull, RegistryCreate(key, name.c_str(), made)) << call;
        EXPECT_EQ(kErrorFileNotFound, TryOpen(("Key\\" + name).c_str()));
    }
    RegistryClose(Create(("Key\\" + name).c_str()));
    RegistryClose(key);
}

TEST_F(Registry, WhatWasLeftOnItsWayIsClearedByTheNext) {
    RegistryKey* key = Create("Key");
    const std::string root = drive_.Native("store/HKEY_LOCAL_MACHINE"), aside = root + "/.aside";
    std::string deep = aside;
    for (int i = 0; i < 1000; ++i) deep += "/k";  // deeper than a process has descriptors
    ASSERT_EQ(0, std::system(("mkdir -p " + deep).c_str()));
    drive_.Put("store/HKEY_LOCAL_MACHINE/.aside/0", "half");
    EXPECT_EACH(RegistrySetValue(key, "x", 1, "x", 1) == kErrorSuccess, !std::filesystem::exists(aside));
    {
        FailingPlatform failing("unlinkat", 1, EIO, 100);
        EXPECT_EQ(kErrorSuccess, RegistryDelete(root_, "Key"));
    }
    EXPECT_EACH(std::filesystem::exists(aside), RegistrySetValue(key, "x", 1, "x", 1) == kErrorKeyDeleted,
                std::filesystem::is_empty(root));
    RegistryClose(key);
}

TEST_F(Registry, ValuesKeepTheirPermissions) {
    RegistryKey* key = Create("Key");
    const std::string file = drive_.Native("store/HKEY_LOCAL_MACHINE/Key/=Secret");
    EXPECT_EQ(kErrorSuccess, RegistrySetValue(key, "Secret", 1, "old", 3));
    for (mode_t mode : {0600u, 0640u}) {
        chmod(file.c_str(), mode);
        EXPECT_EQ(kErrorSuccess, RegistrySetValue(key, "SECRET", 1, "new", 3));
        struct stat status;
        ASSERT_EQ(0, stat(file.c_str(), &status));
        EXPECT_EQ(mode, status.st_mode & 07777);
    }
    RegistryClose(key);
}

TEST_F(Registry, WithoutItsTurnNobodyChangesAnything) {
    RegistryKey* key = Create("Key");
    const std::string lock = drive_.Native("store/.lock");
    const int holder = open(lock.c_str(), O_RDWR | O_CLOEXEC);
    struct flock range {};
    range.l_type = F_WRLCK;
    ASSERT_EQ(0, fcntl(holder, F_OFD_SETLK, &range));
    {
        test::HandClock clock(1000);
        const std::uint32_t before = TickMilliseconds();
        EXPECT_EACH(RegistrySetValue(key, "x", 1, "x", 1) == kErrorTimedOut, TickMilliseconds() - before == 10'000u);
    }
    close(holder);
    {
        FailingPlatform failing("lock", 1, EIO);
        EXPECT_EQ(kErrorIODevice, RegistryDelete(root_, "Key"));
    }
    {
        FailingPlatform failing("lock", 1, ENOLCK);  // a file system without locks
        EXPECT_EQ(kErrorSuccess, RegistrySetValue(key, "x", 1, "x", 1));
    }
    std::filesystem::remove(lock);
    std::filesystem::create_symlink("elsewhere", lock);
    EXPECT_EQ(kErrorCannotResolveName, RegistryDeleteValue(key, "x"));
    std::filesystem::remove(lock);
    ASSERT_EQ(0, mkfifo(lock.c_str(), 0600));
    RegistrySetValue(key, "x", 1, "y", 1);  // it does not hang
    RegistryClose(key);
}

TEST_F(Registry, AStoreThatVanishedIsNoEmptyStore) {
    RegistryKey *key = Create("Key"), *opened = nullptr;
    std::filesystem::rename(drive_.Native("store"), drive_.Native("elsewhere"));
    std::uint32_t type = 0, keys = 0, values = 0;
    std::string data;
    for (RegistryKey* each : {key, root_}) {
        EXPECT_EACH(RegistryQueryValue(each, "x", type, data) == kErrorKeyDeleted,
                    RegistryCounts(each, keys, values) == kErrorKeyDeleted,
                    RegistryEnumerateValue(each, 0, data) == kErrorKeyDeleted,
                    RegistryOpen(each, "Sub", false, opened) == kErrorKeyDeleted);
    }
    std::filesystem::rename(drive_.Native("elsewhere"), drive_.Native("store"));
    for (const char* call : {"fdopendir", "readdir"}) {
        FailingPlatform failing(call, 1, EMFILE);
        EXPECT_EQ(kErrorTooManyOpenFiles, RegistryQueryValue(key, "x", type, data)) << call;
    }
    EXPECT_EQ(kErrorFileNotFound, RegistryQueryValue(key, "x", type, data));
    RegistryClose(key);
}

}  // namespace
}  // namespace tessel::platform
