#include "platform/CodePage.h"
#include "registry/WinRegistryObjects.h"
#include "support/FailingPlatform.h"
#include "support/ReportRecorder.h"
#include "support/ScratchDrive.h"
#include "support/malloc/FailingMalloc.h"
#include <tessel/base/OVExcept.h>
#include <tessel/registry/WinRegistry.h>

#include <cstdlib>
#include <errno.h>
#include <gmock/gmock.h>
#include <gtest/gtest.h>
#include <memory>
#include <string>
#include <sys/wait.h>
#include <thread>
#include <unistd.h>
#include <vector>

namespace tessel {
namespace {

using testing::ElementsAre;
using Key = AutoRelease<IWinRegistryKey>;

// The roots are made once a process: so is their store.
class Store : public testing::Environment {
public:
    void SetUp() override {
        drive_ = std::make_unique<test::ScratchDrive>();
        ::setenv("TESSEL_REGISTRY", drive_->Native("store").c_str(), 1);
    }
    void TearDown() override { drive_.reset(); }
    static void Put(const std::string& file, const std::string& bytes) { drive_->Put("store/" + file, bytes); }

private:
    static inline std::unique_ptr<test::ScratchDrive> drive_;
};
const testing::Environment* const store = testing::AddGlobalTestEnvironment(new Store);

IWinRegistryKey& Root() {
    return *GetCurrentUserRegistryKey(0);
}

class Registry : public testing::Test {
protected:
    Registry() { EXPECT_EQ(Root().CreateSubKey("Test", key_.Out()), kNoErr); }
    ~Registry() override {
        key_.Reset(nullptr);
        EXPECT_EQ(Root().DeleteSubKey("Test"), kNoErr);
    }
    void SetRaw(CStr name, uint32 type, const std::string& data) {
        EXPECT_EQ(key_->SetValue(name, type, data.data(), static_cast<uint32>(data.size())), kNoErr);
    }

    Key key_;
};

template <class Body>
void ExpectRaises(MgErr code, const char* detail, Body&& body) {
    try {
        body();
        ADD_FAILURE() << "did not raise: " << detail;
    } catch (const OVExcept& exception) {
        EXPECT_EQ(exception.Code(), code);
        EXPECT_STREQ(exception.Detail(), detail);
    }
}

const uint8* Bytes(CStr text) {
    return reinterpret_cast<const uint8*>(text);
}

// ---- keys -----------------------------------------------------------------------------------------------------------

TEST(RegistryRoots, AreMadeOncePerView) {
    const struct {
        IWinRegistryKey* (*get)(uint32);
        const char* name;
    } roots[] = {{GetClassesRootRegistryKey, "HKEY_CLASSES_ROOT"},
                 {GetCurrentConfigRegistryKey, "HKEY_CURRENT_CONFIG"},
                 {GetCurrentUserRegistryKey, "HKEY_CURRENT_USER"},
                 {GetDynDataRegistryKey, "HKEY_DYN_DATA"},
                 {GetLocalMachineRegistryKey, "HKEY_LOCAL_MACHINE"},
                 {GetPerformanceDataRegistryKey, "HKEY_PERFORMANCE_DATA"},
                 {GetUsersRegistryKey, "HKEY_USERS"}};
    test::ReportRecorder reports;
    for (const auto& root : roots) {
        IWinRegistryKey* key = root.get(0);
        ASSERT_NE(key, nullptr);
        EXPECT_STREQ(key->GetName(), root.name);
        EXPECT_STREQ(key->GetFullName(), root.name);
        EXPECT_EQ(root.get(0), key);
        EXPECT_NE(root.get(0x100), key);
        EXPECT_EQ(root.get(0x100), root.get(0x100));
        EXPECT_EQ(key->Close(), kNoErr);
        key->Release();
        EXPECT_TRUE(key->IsOpen());
        reports.Clear();
        EXPECT_EQ(root.get(1), nullptr);
        EXPECT_THAT(reports.Texts(),
                    ElementsAre("Requested unknown registry view 1 for key " + std::string(root.name)));
    }
}

TEST(RegistryRoots, ServeManyThreads) {
    std::vector<std::thread> threads;
    for (int t = 0; t < 4; ++t) {
        threads.emplace_back([t] {
            const std::string name = "Thread " + std::to_string(t);
            for (int i = 0; i < 20; ++i) {
                Key key, missing;
                EXPECT_EQ(GetUsersRegistryKey(0)->CreateSubKey(name.c_str(), key.Out()), kNoErr);
                EXPECT_EQ(GetUsersRegistryKey(0)->OpenSubKey("Missing", missing.Out()), kRegistryErr);
            }
        });
    }
    for (std::thread& thread : threads) thread.join();
    EXPECT_EQ(GetUsersRegistryKey(0)->GetSubKeyCount(), 4);
}

TEST_F(Registry, KeysAreMadeOpenedAndClosed) {
    Key made, opened, again;
    EXPECT_FALSE(key_->SubKeyExists("A"));
    EXPECT_EQ(key_->GetLastError(), 2u);
    EXPECT_EQ(key_->CreateSubKey("A\\b\\C\\", made.Out()), kNoErr);
    EXPECT_STREQ(made->GetName(), "C");
    EXPECT_STREQ(made->GetFullName(), "HKEY_CURRENT_USER\\Test\\A\\b\\C");
    EXPECT_TRUE(key_->SubKeyExists("a\\B\\c"));
    EXPECT_TRUE(key_->SubKeyExists(Bytes("A")));
    EXPECT_EQ(key_->GetLastError(), 0u);
    EXPECT_EQ(key_->OpenSubKey("A", opened.Out()), kNoErr);
    EXPECT_EQ(opened->OpenSubKey("b", 1, again.Out()), kNoErr);
    EXPECT_STREQ(again->GetFullName(), "HKEY_CURRENT_USER\\Test\\A\\b");
    EXPECT_EQ(opened->OpenSubKey("", again.Out()), kNoErr);
    EXPECT_STREQ(again->GetName(), "A");

    EXPECT_EQ(opened->SetStringValue("x", "read only"), kRegistryErr);
    EXPECT_EQ(opened->GetLastError(), 5u);
    EXPECT_EQ(opened->Flush(), kNoErr);
    EXPECT_EQ(opened->Close(), kNoErr);
    EXPECT_FALSE(opened->IsOpen());
    EXPECT_EQ(opened->GetSubKeyCount(), -1);
    EXPECT_EQ(opened->GetLastError(), 6u);
    EXPECT_EQ(opened->GetStringValue("x"), nullptr);
    EXPECT_EQ(opened->OpenSubKey("b", again.Out()), kRegistryErr);
    EXPECT_FALSE(again);
    EXPECT_EQ(opened->Close(), kNoErr);
}

TEST_F(Registry, NamesAreSplitBetweenCharacters) {
    ASSERT_TRUE(platform::SetCodePage(932));
    {
        Key key;
        EXPECT_EQ(key_->CreateSubKey("\x83\x5C\\\x83\x5C", key.Out()), kNoErr);  // the second bytes are no separators
        EXPECT_STREQ(key->GetName(), "\x83\x5C");
        EXPECT_STREQ(key->GetFullName(), "HKEY_CURRENT_USER\\Test\\\x83\x5C\\\x83\x5C");
    }
    platform::SetCodePage(platform::kCodePageUtf8);
}

TEST_F(Registry, MissingArgumentsAreRefused) {
    const CStr none = nullptr;
    IWinRegistryKey* key = nullptr;
    const MgErr results[] = {key_->OpenSubKey(none, &key),
                             key_->OpenSubKey("A", 1, nullptr),
                             key_->CreateSubKey(none, &key),
                             key_->CreateSubKey("A", nullptr),
                             key_->EnumerateSubKeys(nullptr),
                             key_->EnumerateValues(nullptr),
                             key_->SetStringValue("A", none),
                             key_->SetDefaultStringValue(none),
                             key_->SetSubKeyDefaultValue("A", none),
                             key_->SetSubKeyDefaultValue(none, "A"),
                             key_->SetValue("A", 3, nullptr, 1),
                             key_->DeleteSubKey(none),
                             key_->DeleteSubKey("")};
    for (MgErr result : results) EXPECT_EQ(result, kArgErr);
    EXPECT_EQ(key_->GetLastError(), 87u);
    EXPECT_FALSE(key_->SubKeyExists("A"));
}

TEST_F(Registry, DeletingTakesAllThatIsBelow) {
    Key below;
    for (CStr name : {"A\\1\\x", "A\\1\\y", "A\\2", "AB"}) ASSERT_EQ(key_->CreateSubKey(name, below.Out()), kNoErr);
    below.Reset(nullptr);
    ASSERT_EQ(key_->SetSubKeyDefaultValue("A\\1\\x", "value"), kNoErr);
    {
        test::FailingPlatform failing("renameat2", 1, EACCES);
        EXPECT_EQ(key_->DeleteSubKey("A"), kRegistryErr);
        EXPECT_EQ(key_->GetLastError(), 5u);
    }
    for (CStr name : {"A\\1\\x", "A\\1\\y", "A\\2"}) EXPECT_TRUE(key_->SubKeyExists(name));
    EXPECT_EQ(key_->DeleteSubKey(Bytes("a")), kNoErr);
    EXPECT_FALSE(key_->SubKeyExists("A"));
    EXPECT_EQ(key_->GetSubKeyCount(), 1);
    EXPECT_EQ(key_->DeleteSubKey("A"), kRegistryErr);
    EXPECT_EQ(key_->GetLastError(), 2u);
}

// ---- values ---------------------------------------------------------------------------------------------------------

TEST_F(Registry, ValuesOfAnyTypeKeepTheirBytes) {
    const struct {
        CStr name;
        uint32 type;
        std::string data;
    } values[] = {{"none", 0, ""},
                  {"binary", 3, std::string("\0\1\xFF\n", 4)},
                  {"number", 4, std::string("\x78\x56\x34\x12", 4)},
                  {"list", 7, std::string("a\0b\0\0", 5)},
                  {"", 0xFFFFFFFFu, "unnamed"}};
    for (const auto& value : values) {
        SetRaw(value.name, value.type, value.data);
        uint32 type = 99, size = 99;
        const void* data = key_->QueryValue(value.name, &type, &size);
        ASSERT_NE(data, nullptr);
        EXPECT_EQ(type, value.type);
        EXPECT_EQ(std::string(static_cast<const char*>(data), size), value.data);
    }
    EXPECT_EQ(key_->GetValueCount(), 5);
    uint32 type = 99, size = 99;
    EXPECT_EQ(key_->QueryValue(Bytes("missing"), &type, &size), nullptr);
    EXPECT_EQ(type + size, 0u);
    EXPECT_EQ(key_->GetLastError(), 2u);
    EXPECT_NE(key_->QueryValue(Bytes(nullptr), nullptr, nullptr), nullptr);
}

TEST_F(Registry, StringsAreStoredWithTheirTerminator) {
    EXPECT_EQ(key_->SetStringValue("a", "first"), kNoErr);
    EXPECT_EQ(key_->SetStringValue(Bytes("b"), Bytes("second")), kNoErr);
    EXPECT_EQ(key_->SetStringValue(Bytes("c"), "third"), kNoErr);
    EXPECT_EQ(key_->SetStringValue("d", Bytes("fourth")), kNoErr);
    EXPECT_EQ(key_->SetDefaultStringValue("fifth"), kNoErr);
    uint32 type = 0, size = 0;
    EXPECT_STREQ(static_cast<const char*>(key_->QueryValue("a", &type, &size)), "first");
    EXPECT_EQ(type, 1u);
    EXPECT_EQ(size, 6u);
    EXPECT_STREQ(key_->GetStringValue("B"), "second");
    EXPECT_STREQ(key_->GetStringValue(Bytes("c")), "third");
    EXPECT_STREQ(key_->GetStringValue("d"), "fourth");
    EXPECT_STREQ(key_->GetDefaultStringValue(), "fifth");
    EXPECT_EQ(key_->GetStringValue("missing"), nullptr);
    EXPECT_EQ(key_->GetLastError(), 2u);

    EXPECT_EQ(key_->SetSubKeyDefaultValue("Sub\\Key", "made"), kNoErr);
    EXPECT_EQ(key_->SetSubKeyDefaultValue(Bytes(""), Bytes("own")), kNoErr);
    Key sub;
    ASSERT_EQ(key_->OpenSubKey("Sub\\Key", sub.Out()), kNoErr);
    EXPECT_STREQ(sub->GetDefaultStringValue(), "made");
    EXPECT_STREQ(key_->GetDefaultStringValue(), "own");
}

TEST_F(Registry, ReferencesToTheEnvironmentAreExpanded) {
    ::setenv("TESSEL_TEST_HOME", "/home/u", 1);
    ::setenv("TESSEL_TEST_LONG", std::string(100000, 'x').c_str(), 1);
    SetRaw("path", 2, std::string("%TESSEL_TEST_HOME%\\%none%\\100%\0", 32));
    EXPECT_STREQ(key_->GetStringValue("path"), "/home/u\\%none%\\100%");
    SetRaw("plain", 1, "%TESSEL_TEST_HOME%");
    EXPECT_STREQ(key_->GetStringValue("plain"), "%TESSEL_TEST_HOME%");
    std::string many;
    for (int i = 0; i < 11; ++i) many += "%TESSEL_TEST_LONG%";
    SetRaw("bomb", 2, many);
    ExpectRaises(kGenericErr, "Failed to extract expanded environment variables in registry value",
                 [&] { key_->GetStringValue("bomb"); });
}

TEST_F(Registry, WhatIsNoStringOrDamagedIsRaised) {
    SetRaw("number", 4, "1234");
    ExpectRaises(kRegistryTypeErr, "Registery Value queried is not a string type",
                 [&] { key_->GetStringValue("number"); });
    Store::Put("HKEY_CURRENT_USER/Test/=damaged", "nothing of the kind");
    ExpectRaises(kRegistryErr, "Error reading registry value", [&] { key_->QueryValue("damaged", nullptr, nullptr); });
    EXPECT_NE(key_->GetLastError(), 0u);
    ExpectRaises(kArgErr, "Registry Key Parent Name cannot be NULL", [] { WinRegistryKey({}, nullptr, "x"); });
    ExpectRaises(kArgErr, "Parent for Registry Value cannot be NULL", [] { WinRegistryValue(nullptr, "x"); });
    ExpectRaises(kArgErr, "Parent for Registry Enumeration cannot be NULL",
                 [] { WinRegistryKeyEnumeration enumeration(nullptr); });
    ExpectRaises(kArgErr, "Parent for Registry Enumeration cannot be NULL",
                 [] { WinRegistryValueEnumeration enumeration(nullptr); });
}

// Two processes write one value, and make one key in two spellings, as fast as they can, while this one reads.
TEST_F(Registry, ProcessesNeverSeeHalfAValue) {
    constexpr int kRounds = 200;
    const auto valueOf = [](int i) {
        return std::string(static_cast<size_t>(i % 7 + 1) * 3000, static_cast<char>('a' + i % 7));
    };
    SetRaw("Value", 3, "a");
    pid_t writers[2];
    for (int w = 0; w < 2; ++w) {
        writers[w] = ::fork();
        if (writers[w] != 0) continue;
        for (int i = 0; i < kRounds; ++i) {
            const std::string value = valueOf(i + w);
            if (key_->SetValue(w ? "VALUE" : "value", 3, value.data(), static_cast<uint32>(value.size()))) ::_exit(1);
            Key made;
            if (key_->CreateSubKey(((w ? "Sub" : "sUB") + std::to_string(i)).c_str(), made.Out())) ::_exit(2);
        }
        ::_exit(0);
    }
    int ended = 0, status = 0, halves = 0;
    while (ended < 2) {
        if (::waitpid(-1, &status, WNOHANG) > 0) {
            EXPECT_EQ(status, 0);
            ++ended;
        }
        uint32 size = 0;
        const char* data = static_cast<const char*>(key_->QueryValue("Value", nullptr, &size));
        ASSERT_NE(data, nullptr);
        const std::string seen(data, size);
        halves += seen != "a" && seen != valueOf(seen[0] - 'a');
    }
    EXPECT_EQ(halves, 0);
    EXPECT_EQ(key_->GetSubKeyCount(), kRounds);
    EXPECT_EQ(key_->GetValueCount(), 1);
}

TEST_F(Registry, WithoutMemoryNothingIsLost) {
    int failures = test::WithEachAllocationFailing([&] {
        const auto expected = [&](IWinRegistryKey& key, MgErr err) {
            EXPECT_TRUE(err == kNoErr || (err == kMemFullErr && key.GetLastError() == 14));
            return err == kNoErr;
        };
        Key made;
        AutoRelease<IWinRegistryValueEnumeration> values;
        if (!expected(*key_, key_->CreateSubKey("A\\B", made.Out()))) return;
        if (!expected(*made, made->SetStringValue("a value whose name and text are long", "too long to be at hand")))
            return;
        try {
            EXPECT_STREQ(made->GetStringValue("a value whose name and text are long"), "too long to be at hand");
        } catch (const OVExcept& exception) {
            EXPECT_EQ(exception.Code(), kMemFullErr);
            EXPECT_STREQ(exception.Detail(), "Unable to allocate buffer for registry query");
            return;
        }
        if (!expected(*made, made->EnumerateValues(values.Out()))) return;
        EXPECT_TRUE(values->MoveNext() || values->GetLastError() == 14u);
        made.Reset(nullptr);
        expected(*key_, key_->DeleteSubKey("A"));
    });
    EXPECT_GT(failures, 10);
    EXPECT_EQ(key_->GetSubKeyCount(), 0);
}

// ---- enumerations ---------------------------------------------------------------------------------------------------

TEST_F(Registry, EnumerationsWalkSideBySide) {
    Key sub;
    for (CStr name : {"K1", "K2", "K3"}) ASSERT_EQ(key_->CreateSubKey(name, sub.Out()), kNoErr);
    for (CStr name : {"v1", "v2", "v3"}) ASSERT_EQ(key_->SetStringValue(name, name), kNoErr);
    AutoRelease<IWinRegistryKeyEnumeration> keys;
    AutoRelease<IWinRegistryValueEnumeration> values;
    ASSERT_EQ(key_->EnumerateSubKeys(keys.Out()), kNoErr);
    ASSERT_EQ(key_->EnumerateValues(values.Out()), kNoErr);
    EXPECT_EQ(keys->GetCurrent(), nullptr);
    EXPECT_EQ(values->GetCurrent(), nullptr);
    std::string seen;
    while (keys->MoveNext() && values->MoveNext()) {
        seen += std::string(keys->GetCurrent()->GetFullName()) + "=" + values->GetCurrent()->GetString() + " ";
        EXPECT_EQ(keys->GetCurrent()->SetDefaultStringValue("x"), kRegistryErr);  // it is open for reading
    }
    EXPECT_EQ(seen, "HKEY_CURRENT_USER\\Test\\K1=v1 HKEY_CURRENT_USER\\Test\\K2=v2 HKEY_CURRENT_USER\\Test\\K3=v3 ");
    EXPECT_EQ(keys->GetLastError(), 259u);
    EXPECT_EQ(keys->GetCurrent(), nullptr);
    EXPECT_FALSE(values->MoveNext());
    EXPECT_FALSE(values->MoveNext());
    EXPECT_EQ(values->GetLastError(), 259u);

    ASSERT_EQ(key_->EnumerateSubKeys(keys.Out()), kNoErr);
    EXPECT_TRUE(keys->MoveNext());
    EXPECT_EQ(key_->DeleteSubKey("K2"), kNoErr);
    EXPECT_FALSE(keys->MoveNext());
    EXPECT_EQ(keys->GetLastError(), 2u);
}

TEST_F(Registry, ValueObjectsKeepWhatWasRead) {
    ::setenv("TESSEL_TEST_HOME", "/home/u", 1);
    SetRaw("a", 2, "%TESSEL_TEST_HOME%");
    SetRaw("b", 3, "xyz");
    AutoRelease<IWinRegistryValueEnumeration> values;
    ASSERT_EQ(key_->EnumerateValues(values.Out()), kNoErr);
    ASSERT_TRUE(values->MoveNext());
    IWinRegistryValue& text = *values->GetCurrent();
    EXPECT_STREQ(text.GetName(), "a");
    EXPECT_STREQ(text.GetString(), "/home/u");
    ::setenv("TESSEL_TEST_HOME", "/home/v", 1);
    EXPECT_STREQ(text.GetString(), "/home/u");  // made once
    EXPECT_EQ(std::string(static_cast<const char*>(text.GetData()), text.GetSize()), "%TESSEL_TEST_HOME%");
    ASSERT_TRUE(values->MoveNext());
    EXPECT_EQ(values->GetCurrent()->GetType(), 3u);
    EXPECT_EQ(values->GetCurrent()->GetString(), nullptr);
    EXPECT_EQ(values->GetCurrent()->GetLastError(), 0u);

    Root().OpenSubKey("Test", key_.Out());
    WinRegistryValue missing(static_cast<WinRegistryKey&>(*key_).Handle(), "missing");
    EXPECT_EQ(missing.GetData(), nullptr);
    EXPECT_EQ(missing.GetSize(), 0u);
    EXPECT_EQ(missing.GetString(), nullptr);
    EXPECT_EQ(missing.GetLastError(), 2u);
}

}  // namespace
}  // namespace tessel
