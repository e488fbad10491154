#include "../fuzz/IniModel.h"
#include "platform/posix/SystemCalls.h"
#include "support/FailingPlatform.h"
#include "support/HandClock.h"
#include "support/StartedFiles.h"
#include "support/Test.h"
#include "support/malloc/FailingMalloc.h"
#include <tessel/base/OVExcept.h>
#include <tessel/config/ConfigOperations.h>

#include <array>
#include <chrono>
#include <csignal>
#include <filesystem>
#include <fstream>
#include <set>
#include <sys/stat.h>
#include <sys/wait.h>
#include <unistd.h>

namespace tessel::test {
namespace {

using namespace std::string_literals;

constexpr char kOld[] = "[a]\r\nk=old\r\n", kNew[] = "[a]\r\nk=new\r\n";

class PreferenceFile : public testing::Test {
protected:
    std::unique_ptr<BMINIConfigOperations> Store(std::string_view inside = "f.ini") {
        return std::make_unique<BMINIConfigOperations>(started.On(inside), "a");
    }
    std::string File() const { return started.drive.Get("f.ini"); }
    void Put(std::string_view bytes) const { started.drive.Put("f.ini", bytes); }
    std::set<std::string> Folder() const {
        std::set<std::string> names;
        for (const auto& entry : std::filesystem::directory_iterator(started.drive.Native()))
            names.insert(entry.path().filename());
        return names;
    }
    static std::string Value(ConfigOperationsInterface& store, const std::string& key) {
        std::string value;
        const MgErr err = store.GetValue(key, &value);
        return err ? "error " + std::to_string(err) : value;
    }

    StartedFiles started;
    HandClock clock{100'000};
    const std::set<std::string> onlyFile{"f.ini"};
};

TEST_F(PreferenceFile, HoldsAndGivesTheWorkedFiles) {
    const struct {
        std::string file;
        std::vector<std::array<std::string, 3>> holds, then;
    } rows[] = {{"prefs.ini",
                 {{"Editor", "font.size", "13"},
                  {"Editor", "name", "Main window"},
                  {"Editor", "path", "C:\\data\\a.txt"},
                  {"Editor", "recent", "C:\\one;C:\\two;C:\\three"},
                  {"Window", "pos", "5,6,7,8"},
                  {"Window", "zoom", "100"}},
                 {{"Window", "pos", "9"}, {"editor", "NAME", "x y"}, {"New", "k", "v"}}},
                {"null-section.ini",
                 {{"(null)", "top", "1"},
                  {"(null)", "other", "quoted"},
                  {"One", "k", "v"},
                  {"One", "k2", "v2"},
                  {"two", "a", "b"}},
                 {{"three", "x", "y"}}}};
    for (const auto& row : rows) {
        const auto folder = std::filesystem::exists("data") ? "data/"s : "tests/data/"s;
        std::filesystem::copy(folder + row.file, started.drive.Native(row.file));
        const auto before = started.drive.Get(row.file);
        auto store = Store(row.file);
        std::vector<std::array<std::string, 3>> holds;
        Texts sections, keys;
        EXPECT_EQ(kNoErr, store->GetSectionNames(&sections));
        for (const std::string& section : sections) {
            store->SetSectionName(section);
            EXPECT_EQ(kNoErr, store->GetKeyNames(&keys));
            for (const std::string& key : keys) holds.push_back({section, key, Value(*store, key)});
        }
        EXPECT_EACH(row.holds == holds, before == started.drive.Get(row.file));
        for (const auto& [section, key, value] : row.then) EXPECT_EQ(kNoErr, store->SetValue(section, key, value));
        std::ifstream after(folder + row.file + ".after", std::ios::binary);
        const std::string expected{std::istreambuf_iterator<char>(after), {}};
        EXPECT_EQ(expected, started.drive.Get(row.file));
        // The same again, from memory and from the file.
        EXPECT_EACH(store->SetValue(row.then[0][0], row.then[0][1], row.then[0][2]) == kNoErr,
                    Store(row.file)->SetValue(row.then[0][0], row.then[0][1], row.then[0][2]) == kNoErr,
                    expected == started.drive.Get(row.file));
    }
}

TEST_F(PreferenceFile, AnswersWhenThereIsNothing) {
    auto store = Store();
    std::string value = "kept";
    Texts names{"gone"};
    EXPECT_EACH(store->GetValue("k", &value) == kConfigKeyErr, !store->HasKey("k"), store->RemoveKey("k") == kNoErr,
                store->GetSectionNames(&names) == kNoErr, names.empty(), store->GetKeyNames(&names) == kNoErr,
                Folder().empty());
    Put(kOld);
    const struct {
        std::string section, key;
        MgErr get, set, remove;
    } rows[] = {{"", "k", kArgErr, kArgErr, kConfigTypeErr},
                {"a", "", kArgErr, kArgErr, kConfigTypeErr},
                {"a", " ", kConfigKeyErr, kConfigTypeErr, kConfigTypeErr},
                {"b", "k", kConfigKeyErr, kNoErr, kNoErr},
                {"a", "l", kConfigKeyErr, kNoErr, kNoErr}};
    for (const auto& row : rows) {
        EXPECT_EQ(row.get, store->GetValue(row.section, row.key, &value)) << row.section << row.key;
        EXPECT_EACH(!store->HasKey(row.section, row.key), row.set == store->SetValue(row.section, row.key, "v"),
                    (row.set == kNoErr) == store->HasKey(row.section, row.key),
                    row.remove == store->RemoveKey(row.section, row.key), !store->HasKey(row.section, row.key));
    }
    EXPECT_EACH(value == "kept", File() == "[a]\r\nk=old\r\n\r\n[b]\r\n\r\n",
                store->GetValue("a", "k", nullptr) == kArgErr, store->GetSectionNames(nullptr) == kArgErr,
                store->GetKeyNames("a", nullptr) == kArgErr);
    EXPECT_THROW(BMINIConfigOperations(PathRef(), "a"), OVExcept);
}

TEST_F(PreferenceFile, MakesTheFoldersOnTheWay) {
    EXPECT_EACH(Store("x/y/z.ini")->SetValue("k", "new") == kNoErr, kNew + "\r\n"s == started.drive.Get("x/y/z.ini"));
    auto store = Store("f.ini/g.ini");
    Put("a file");
    EXPECT_THROW(store->SetValue("k", "new"), OVExcept);
    std::filesystem::remove(started.drive.Native("f.ini"));
    EXPECT_EACH(store->SetValue("l", "too") == kNoErr,
                started.drive.Get("f.ini/g.ini") == "[a]\r\nk=new\r\nl=too\r\n\r\n");
}

TEST_F(PreferenceFile, IsReadAgainWhenItDiffers) {
    Put(kOld);
    auto store = Store();
    EXPECT_EQ("old", Value(*store, "k"));
    const auto native = started.drive.Native("f.ini");
    const auto aSecondLater = [&](const std::string& expected) {
        clock.Advance(999);
        const std::string before = Value(*store, "k");
        clock.Advance(1);
        EXPECT_EACH(before != expected, expected == Value(*store, "k"));
    };
    Put("[a]\nk=longer\n");
    aSecondLater("longer");
    Put("[a]\nk=LONGER\n");
    std::filesystem::last_write_time(native, std::filesystem::file_time_type() - std::chrono::hours(24 * 365 * 200));
    aSecondLater("LONGER");
    started.drive.Put("other", "[a]\nk=Longer\n");
    std::filesystem::last_write_time(started.drive.Native("other"), std::filesystem::last_write_time(native));
    std::filesystem::rename(started.drive.Native("other"), native);
    aSecondLater("Longer");
    std::filesystem::rename(native, started.drive.Native("other"));
    aSecondLater("error 20");
    Put(kNew);
    EXPECT_EQ("new", Value(*store, "k"));  // a look that failed puts nothing off
    // What the store has written itself is no change.
    EXPECT_EQ(kNoErr, store->SetValue("k", "own"));
    clock.Advance(1000);
    const FailingPlatform unread("read", 1, EIO, 1000);
    EXPECT_EACH(Value(*store, "k") == "own", unread.Calls() == 0);
}

TEST_F(PreferenceFile, IsLeftAloneWhenItCannotBeRead) {
    const struct {
        const char* call;
        int error;
        std::string bytes;
        MgErr err;
    } rows[] = {{"read", 0, "\xFF\xFE[\0"s, kUnsupportedErr},
                {"read", EIO, kOld, kIOErr},
                {"open", EACCES, kOld, kNotFoundErr},
                {"open", EMFILE, kOld, kNotFoundErr},
                {"statx", ENOSYS, kOld, kGenericErr}};
    for (const auto& row : rows) {
        const ReportRecorder reports;
        auto store = Store();
        Put(row.bytes);
        const auto refused = std::make_unique<FailingPlatform>(row.call, 1, row.error, 1000);
        Texts names;
        std::string value;
        EXPECT_EQ(row.err, store->GetValue("k", &value)) << row.call << row.err;
        EXPECT_EACH(row.err == store->SetValue("k", "new"), row.err == store->RemoveKey("k"),
                    row.err == store->GetSectionNames(&names), row.err == store->GetKeyNames(&names),
                    !store->HasKey("k"), row.bytes == File());
        const Texts told(row.err == kGenericErr ? 6 : 0, "Warning, function is not implemented on this platform.");
        EXPECT_EQ(told, reports.Texts());
    }
    Put(kOld);
    auto store = Store();
    EXPECT_EQ("old", Value(*store, "k"));
    clock.Advance(1000);
    const ReportRecorder reports;
    const FailingPlatform unknown("statx", 1, EIO, 2);
    EXPECT_EACH(Value(*store, "k") == "old", (Texts{"Warning, unexpected result."}) == reports.Texts(kDebugWarning));
}

TEST_F(PreferenceFile, KeysWithoutASectionGetTheNameOfTheCurrentOne) {
    Put(";c\nk=old\n");
    auto store = Store();
    EXPECT_EACH(Value(*store, "k") == "old", File() == "[a]\r\n;c\r\nk=old\r\n");
    Put("k=old\nl=too\n");
    clock.Advance(1000);
    {
        const ReportRecorder reports;
        const FailingPlatform full("write", 1, ENOSPC);
        EXPECT_EACH(Value(*store, "l") == "too",
                    (Texts{"Cannot rewrite preference file T:\\f.ini, error 9"}) == reports.Texts(kDebugWarning));
    }
    EXPECT_EACH(File() == "k=old\nl=too\n", store->RemoveKey("l") == kNoErr, File() == kOld);
}

// ---- saving ---------------------------------------------------------------------------------------------------------

TEST_F(PreferenceFile, AFailedSaveSaysWhyAndGoesOutWithTheNext) {
    const struct {
        const char* call;
        int n, error;
        MgErr err;
    } rows[] = {{"open", 1, EACCES, kPermissionErr},   {"openat", 10, ENOSPC, kIOErr},
                {"openat", 10, EACCES, kIOErr},        {"write", 1, ENOSPC, kDiskFullErr},
                {"write", 1, EIO, kDiskFullErr},       {"fsync", 1, EIO, kDiskFullErr},
                {"renameat2", 1, EIO, kPermissionErr}, {"openat", 10, ENOMEM, kConfigMemErr}};
    for (const auto& row : rows) {
        Put(kOld);
        auto store = Store();
        ASSERT_EQ("old", Value(*store, "k"));
        {
            const FailingPlatform failing(row.call, row.n, row.error);
            EXPECT_EQ(row.err, store->SetValue("k", "new")) << row.call;
        }
        EXPECT_EACH(File() == kOld, onlyFile == Folder(), Value(*store, "k") == "new");
        clock.Advance(1000);
        EXPECT_EQ(kNoErr, store->RemoveKey("x"));  // nothing to save
        EXPECT_EACH(File() == kOld, store->SetValue("l", "2") == kNoErr, kNew + "l=2\r\n"s == File());
    }
    const auto links = started.drive.Native("link.ini");
    std::filesystem::create_symlink("f.ini", links);
    ASSERT_EQ(0, chmod(started.drive.Native("f.ini").c_str(), 0604));
    EXPECT_EACH(Store("link.ini")->SetValue("k", "3") == kNoErr, std::filesystem::is_symlink(links),
                File() == "[a]\r\nk=3\r\nl=2\r\n",
                static_cast<std::filesystem::perms>(0604) == std::filesystem::status(links).permissions());
    for (int i = 0; i < 1000; ++i) started.drive.Put("ini$$" + std::to_string(i) + ".TMP", "not ours");
    EXPECT_EACH(Store()->SetValue("k", "4") == kIOErr, Folder().size() == 1002u);
}

// Whatever fails, and wherever the process ends, the file is one of the two, whole, and a later save goes through.
TEST_F(PreferenceFile, IsTheOldOrTheNewOneAfterEveryFault) {
    const auto whole = [&](auto where) {
        const std::string bytes = File();
        EXPECT_TRUE(bytes == kOld || bytes == kNew) << where << bytes;
    };
    for (const int error : {ENOSPC, EIO, EACCES, FailingPlatform::kKill}) {
        bool reached = true;
        for (int n = 1; reached; ++n) {
            Put(kOld);
            auto store = Store();
            EXPECT_EQ("old", Value(*store, "k"));
            const pid_t child = fork();
            if (child == 0) {
                const ReportRecorder quiet;
                const FailingPlatform failing("*", n, error);
                MgErr err = kNoErr;
                try {
                    clock.Advance(1000);
                    err = store->SetValue("k", "new");
                } catch (const OVExcept& exception) {
                    err = exception.Code();
                }
                const bool saved = File() == kNew;
                _exit(failing.Calls() < n ? 2 : err == kNoErr && !saved);
            }
            int status = 0;
            ASSERT_EQ(child, waitpid(child, &status, 0));
            reached = !WIFEXITED(status) || WEXITSTATUS(status) != 2;
            EXPECT_TRUE(WIFSIGNALED(status) ? WTERMSIG(status) == SIGKILL : WEXITSTATUS(status) != 1)
                << n << " " << error;
            whole(n);
            EXPECT_EACH(store->SetValue("k", "new") == kNoErr, File() == kNew);
            EXPECT_EQ(onlyFile, Folder()) << n << " " << error;
            EXPECT_TRUE(n > 10 || reached);
        }
    }
    std::mt19937 random(1);
    for (int kills = Amount("TESSEL_TEST_CONFIG_KILLS", 30); kills > 0; --kills) {
        const pid_t child = fork();
        if (child == 0) {
            auto store = Store();
            for (int i = 0;; ++i) store->SetValue("k", i % 2 ? "new" : "old");
        }
        std::this_thread::sleep_for(std::chrono::microseconds(random() % 20000));
        kill(child, SIGKILL);
        waitpid(child, nullptr, 0);
        whole("kill");
    }
    EXPECT_EACH(Store()->SetValue("k", "new") == kNoErr, onlyFile == Folder());
}

// What is in the order of the calls: all of the bytes are on the device before the name changes, and the name before
// the save is over.
TEST_F(PreferenceFile, FlushesTheFileBeforeItHasTheNameAndTheFolderAfter) {
    static std::string order;
    static platform::SystemCalls calls;
    calls = platform::systemCalls;
    platform::systemCalls.write = [](auto... arguments) { return order += 'w', calls.write(arguments...); };
    platform::systemCalls.linkat = [](auto... arguments) { return order += 'l', calls.linkat(arguments...); };
    platform::systemCalls.renameat2 = [](auto... arguments) { return order += 'r', calls.renameat2(arguments...); };
    platform::systemCalls.fsync = [](int file) {
        struct stat status {};
        fstat(file, &status);
        return order += S_ISDIR(status.st_mode) ? 'd' : 'f', calls.fsync(file);
    };
    auto store = Store();
    for (const std::string& value : {"old"s, "new"s, std::string(200'000, 'x')}) {
        order.clear();
        EXPECT_EQ(kNoErr, store->SetValue("k", value));
        EXPECT_THAT(order, testing::MatchesRegex(value == "old" ? "wfld" : "w+flrd"));
    }
    platform::systemCalls = calls;
}

TEST_F(PreferenceFile, AnAllocationThatFailsLosesNothing) {
    Put(kOld);
    const auto attempt = [&](int n, bool& failed) {
        std::unique_ptr<BMINIConfigOperations> store;
        const PathRef path = started.On("f.ini");
        MgErr err = kNoErr;
        {
            const FailingMalloc failing(n);
            try {
                store = std::make_unique<BMINIConfigOperations>(path, "a");
                err = store->SetValue("k", "new");
            } catch (const OVExcept& exception) {
                err = exception.Code();
            } catch (const std::bad_alloc&) {
                err = kMemFullErr;  // of the store itself
            }
            failed = failing.HasFailed();
        }
        EXPECT_EQ(err ? kOld : kNew, File()) << n;
        EXPECT_TRUE(!store || store->SetValue("k", "old") == kNoErr) << n;
        Put(kOld);
        return err;
    };
    int refused = 0;
    bool failed = true;
    for (int n = 1; failed; ++n) {
        const MgErr err = attempt(n, failed);
        EXPECT_TRUE(err == kNoErr || err == kMemFullErr || err == kConfigMemErr) << n << " " << err;
        refused += err != kNoErr;
    }
    EXPECT_GT(refused, 10);
    EXPECT_EQ(onlyFile, Folder());
}

// ---- many at once ---------------------------------------------------------------------------------------------------

// Four processes write values that say how long they are, to the same keys of one file.
TEST_F(PreferenceFile, ProcessesReadWhatOneOfThemWrote) {
    constexpr int kProcesses = 4, kKeys = 5;
    const auto seconds = std::chrono::seconds(Amount("TESSEL_TEST_CONFIG_SECONDS", 0));
    const auto intact = [](const std::string& value) { return !value.empty() && std::stoul(value) == value.size(); };
    Put("[a]\r\n;last\r\n");
    std::vector<pid_t> children;
    for (int process = 0; process < kProcesses; ++process) {
        children.push_back(fork());
        if (children.back() != 0) continue;
        const auto end = std::chrono::steady_clock::now() + seconds;
        std::mt19937 random(static_cast<unsigned>(process));
        auto store = Store();
        bool good = true;
        for (int round = 0; good && (round < 100 || std::chrono::steady_clock::now() < end); ++round) {
            std::string value(10 + random() % 300, 'x');
            value.replace(0, 4, std::to_string(value.size()) + " ");
            value.resize(std::stoul(value), 'x');
            const std::string key = "k" + std::to_string(random() % kKeys);
            const bool sets = random() % 2;
            const MgErr err = sets ? store->SetValue(key, value) : store->GetValue(key, &value);
            clock.Advance(500);
            IniModel model;
            good = sets ? err == kNoErr : err == kConfigKeyErr || (err == kNoErr && intact(value));
            good = good && model.Read(File()) && model.sections.size() == 1 && model.trailing == Texts{";last"};
            if (!good) std::fprintf(stderr, "%d: error %d, %s\n%s\n", process, err, value.c_str(), File().c_str());
            if (!good) break;
            for (const auto& entry : model.sections.front().keys) good = good && intact(entry.value);
        }
        _exit(good ? 0 : 1);
    }
    for (const pid_t child : children) {
        int status = 1;
        waitpid(child, &status, 0);
        EXPECT_EQ(0, status);
    }
    EXPECT_EQ(onlyFile, Folder());
}

TEST_F(PreferenceFile, ThreadsShareAStore) {
    auto file = Store();
    MemoryMapConfigOperations memory("a");
    for (ConfigOperationsInterface* store :
         {static_cast<ConfigOperationsInterface*>(file.get()), static_cast<ConfigOperationsInterface*>(&memory)}) {
        InThreads(4, [store](int thread) {
            const std::string name = std::to_string(thread);
            Texts names;
            for (int round = 0; round < 20; ++round) {
                EXPECT_EQ(kNoErr, store->SetValue(name, "k", name));
                store->SetSectionName(name);
                EXPECT_EACH(store->GetSectionName() != "", Value(*store, "k").size() == 1u,
                            store->GetSectionNames(&names) == kNoErr, store->HasKey(name, "k"));
            }
        });
    }
    Texts names;
    EXPECT_EQ(kNoErr, Store()->GetSectionNames(&names));
    EXPECT_THAT(names, testing::UnorderedElementsAre("0", "1", "2", "3"));
}

// ---- in memory ------------------------------------------------------------------------------------------------------

TEST(MemoryMapConfigOperationsTest, KeepsUnderComposedKeys) {
    const StartedPaths started;
    MemoryMapConfigOperations store("");
    const struct {
        const char *section, *key, *value;
    } sets[] = {{"s", "b", " \"2\" "}, {"s", "a", "1"}, {"", "t.x.y", "3"},     {"", "plain", "4"}, {"s", "a", "5"},
                {"S", "", "no"},       {"t", "z", ""},  {"\xC3\xA4", "k", "6"}, {"a.b", "c", "7"}};
    for (const auto& set : sets)
        EXPECT_EQ(*set.key ? kNoErr : kArgErr, store.SetValue(set.section, set.key, set.value));
    Texts names;
    EXPECT_EACH(store.GetSectionNames(&names) == kNoErr, (Texts{"a", "s", "s", "t", "t", "\xC3\xA4"}) == names,
                store.GetKeyNames(&names) == kNoErr, (Texts{"plain"}) == names,
                store.GetKeyNames("t", &names) == kNoErr, (Texts{"x.y", "z"}) == names);
    std::string value = "kept";
    EXPECT_EACH(store.GetValue("s", "A", &value) == kConfigKeyErr, store.GetValue("s", "", &value) == kArgErr,
                value == "kept", store.GetValue("s", "a", nullptr) == kArgErr,
                store.GetKeyNames("s", nullptr) == kArgErr, store.GetSectionNames(nullptr) == kArgErr,
                store.GetValue("s.b", &value) == kNoErr, value == " \"2\" ", store.RemoveKey("s", "a") == kNoErr,
                store.RemoveKey("s", "a") == kConfigKeyErr, !store.HasKey("s", "a"), !store.HasKey("s", ""),
                store.HasKey("t.x", "y"));
}

}  // namespace
}  // namespace tessel::test
