#include "platform/Registry.h"

#include <gtest/gtest.h>
#include <sys/wait.h>
#include <unistd.h>

#include <algorithm>
#include <cerrno>
#include <cstdlib>
#include <filesystem>

#include "platform/CodePage.h"
#include "support/FailingPlatform.h"
#include "support/ScratchDrive.h"

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

TEST_F(Registry, KeysIgnoreCaseAndKeepIt) {
    EXPECT_EQ(kErrorFileNotFound, TryOpen("Software"));
    RegistryClose(Create("Software\\Maker\\Größe"));
    RegistryClose(Create("SOFTWARE\\maker\\..\\a/b"));
    EXPECT_EQ(kErrorSuccess, TryOpen("sofTWARE\\MAKER\\gRÖßE"));
    RegistryKey* maker = Create("software\\Maker");
    std::string name;
    EXPECT_EQ(kErrorSuccess, RegistryEnumerateKey(maker, 0, name));
    EXPECT_EQ("..", name); /* a name like any other */
    EXPECT_EQ(kErrorSuccess, RegistryEnumerateKey(maker, 1, name));
    EXPECT_EQ("Größe", name);
    EXPECT_EQ(kErrorNoMoreItems, RegistryEnumerateKey(maker, 2, name));
    RegistryClose(maker);
    EXPECT_EQ(kErrorSuccess, TryOpen("software\\maker\\..\\A/B"));

    EXPECT_EQ(kErrorAccessDenied, RegistryDelete(root_, "Software\\Maker\\..")); /* it holds a key */
    EXPECT_EQ(kErrorSuccess, RegistryDelete(root_, "Software\\Maker\\..\\a/b"));
    EXPECT_EQ(kErrorSuccess, RegistryDelete(root_, "Software\\Maker\\.."));
    EXPECT_EQ(kErrorFileNotFound, RegistryDelete(root_, "Software\\Maker\\.."));
    EXPECT_EQ(kErrorInvalidParameter, RegistryDelete(root_, ""));
}

TEST_F(Registry, ViewsAndRootsAreApart) {
    RegistryKey *other = nullptr, *view64 = nullptr;
    RegistryOpenRoot(RegistryRoot::kCurrentUser, kRegistryDefaultView, other);
    RegistryOpenRoot(RegistryRoot::kLocalMachine, kRegistryView64, view64);
    RegistryClose(Create("Key"));
    RegistryKey* key = nullptr;
    EXPECT_EQ(kErrorFileNotFound, RegistryOpen(other, "Key", false, key));
    EXPECT_EQ(kErrorFileNotFound, RegistryOpen(view64, "Key", false, key));
    EXPECT_EQ(kErrorInvalidParameter, RegistryOpenRoot(RegistryRoot::kUsers, 1, key));
    std::uint32_t keys = 9, values = 9;
    EXPECT_EQ(kErrorSuccess, RegistryCounts(view64, keys, values)); /* nothing of it is on the disk yet */
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
    for (const auto& [name, value] : rows) {
        EXPECT_EQ(kErrorFileNotFound, RegistryQueryValue(key, name, type, data));
        EXPECT_EQ(kErrorSuccess, RegistrySetValue(key, name, 4000000000u, "longer before", 13));
        EXPECT_EQ(kErrorSuccess, RegistrySetValue(key, name, 3, value.data(), value.size()));
    }
    for (const auto& [name, value] : rows) {
        EXPECT_EQ(kErrorSuccess, RegistryQueryValue(key, name, type, data));
        EXPECT_EQ(3u, type);
        EXPECT_EQ(value, data);
    }
    EXPECT_EQ(kErrorSuccess, RegistryQueryValue(key, "PATH", type, data));
    EXPECT_EQ(bytes, data);
    std::uint32_t keys = 0, values = 0;
    EXPECT_EQ(kErrorSuccess, RegistryCounts(key, keys, values));
    EXPECT_EQ(3u, values);
    std::string names, name;
    for (std::uint32_t i = 0; RegistryEnumerateValue(key, i, name) == 0; ++i) names += "<" + name + ">";
    EXPECT_EQ("<><=.%2F/\\><Path>", names);
    EXPECT_EQ(kErrorSuccess, RegistryFlush(key));
    EXPECT_EQ("REG 3\n" + bytes, drive_.Get("store/HKEY_LOCAL_MACHINE/Key/=Path")); /* the documented form */

    drive_.Put("store/HKEY_LOCAL_MACHINE/Key/=Path", "REG x\n");
    EXPECT_EQ(kErrorRegistryCorrupt, RegistryQueryValue(key, "Path", type, data));
    EXPECT_EQ(kErrorSuccess, RegistryDeleteValue(key, "path"));
    EXPECT_EQ(kErrorFileNotFound, RegistryDeleteValue(key, "path"));
    RegistryClose(key);
    EXPECT_EQ(kErrorSuccess, RegistryOpen(root_, "Key", false, key));
    EXPECT_EQ(kErrorAccessDenied, RegistrySetValue(key, "Path", 1, "x", 1));
    RegistryClose(key);
    EXPECT_EQ(kErrorSuccess, RegistryDelete(root_, "KEY"));
}

TEST_F(Registry, NamesAreInTheCodePage) {
    ASSERT_TRUE(SetCodePage(932));
    RegistryKey* key = Create("\x83\x5C\\Sub"); /* one character whose second byte is a backslash, then a separator */
    RegistryClose(key);
    std::string name;
    EXPECT_EQ(kErrorSuccess, RegistryEnumerateKey(root_, 0, name));
    EXPECT_EQ("\x83\x5C", name);
    SetCodePage(kCodePageUtf8);
    EXPECT_EQ(kErrorSuccess, TryOpen("ソ\\sub"));
}

TEST_F(Registry, AFailedWriteLeavesTheOldValue) {
    RegistryKey* key = Create("Key");
    ASSERT_EQ(kErrorSuccess, RegistrySetValue(key, "Path", 1, "old", 3));
    for (const char* call : {"write", "close", "renameat2"}) {
        FailingPlatform failing(call, 1, ENOSPC);
        EXPECT_EQ(kErrorDiskFull, RegistrySetValue(key, "Path", 1, "new", 3)) << call;
    }
    std::uint32_t type = 0;
    std::string data;
    EXPECT_EQ(kErrorSuccess, RegistryQueryValue(key, "Path", type, data));
    EXPECT_EQ("old", data);
    RegistryClose(key);
    EXPECT_EQ(1, std::distance(std::filesystem::directory_iterator(drive_.Native("store/HKEY_LOCAL_MACHINE/Key")), {}));
}

/* Two processes write one value, and make one key in two spellings, as fast as they can, while this one reads. */
TEST_F(Registry, ProcessesNeverSeeHalfAValue) {
    RegistryKey* key = Create("Key");
    const auto valueOf = [](int i) {
        return std::string(static_cast<std::size_t>(i % 7 + 1) * 3000, static_cast<char>('a' + i % 7));
    };
    ASSERT_EQ(kErrorSuccess, RegistrySetValue(key, "Value", 1, "a", 1));
    pid_t writers[2];
    for (int w = 0; w < 2; ++w) {
        writers[w] = fork();
        if (writers[w] != 0) continue;
        for (int i = 0; i < 300; ++i) {
            std::string value = valueOf(i + w);
            if (RegistrySetValue(key, w ? "VALUE" : "value", 1, value.data(), value.size()) != 0) _exit(1);
            RegistryKey* made = nullptr;
            if (RegistryCreate(key, ((w ? "Sub" : "sUB") + std::to_string(i)).c_str(), made) != 0) _exit(2);
        }
        _exit(0);
    }
    std::uint32_t type = 0;
    std::string data;
    int ended = 0, status = 0, seen = 0;
    while (ended < 2) {
        if (waitpid(-1, &status, WNOHANG) > 0) {
            EXPECT_EQ(0, status);
            ++ended;
        }
        ASSERT_EQ(kErrorSuccess, RegistryQueryValue(key, "Value", type, data));
        EXPECT_TRUE(data == "a" || data == valueOf(data[0] - 'a')) << data.size();
        ++seen;
    }
    EXPECT_GT(seen, 1);
    std::uint32_t keys = 0, values = 0;
    EXPECT_EQ(kErrorSuccess, RegistryCounts(key, keys, values));
    EXPECT_EQ(300u, keys);
    EXPECT_EQ(1u, values);
    RegistryClose(key);
}

}  // namespace
}  // namespace tessel::platform
