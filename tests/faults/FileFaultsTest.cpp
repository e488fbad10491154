// Files, folders, the recycle bin and the registry: what is found after any call that fails, any kill and any power
// loss. What was there or what was to be, whole.
#include "platform/Registry.h"
#include "platform/posix/SystemCalls.h"
#include "support/FailingPlatform.h"
#include "support/FaultScenario.h"
#include "support/ReportRecorder.h"
#include "support/StartedFiles.h"
#include <tessel/base/OVExcept.h>
#include <tessel/config/ConfigOperations.h>
#include <tessel/files/FileManager.h>
#include <tessel/paths/PathRef.h>

#include <cerrno>
#include <cstdlib>
#include <filesystem>
#include <iostream>
#include <linux/fs.h>
#include <sys/wait.h>
#include <unistd.h>

namespace tessel::test {
namespace {

namespace fs = std::filesystem;
using platform::RegistryKey;
using platform::systemCalls;

platform::SystemCalls host;

// Names on two file systems, and a kernel that does not copy between them.
struct Apart {
    explicit Apart(bool apart) {
        host = systemCalls;
        if (!apart) return;
        systemCalls.renameat2 = [](int a, const char* from, int b, const char* to, unsigned flags) {
            if (flags != RENAME_NOREPLACE) return host.renameat2(a, from, b, to, flags);
            errno = EXDEV;
            return -1;
        };
        systemCalls.copy_file_range = [](int, off64_t*, int, off64_t*, size_t, unsigned) -> ssize_t {
            errno = EXDEV;
            return -1;
        };
    }
    ~Apart() { systemCalls = host; }
};

class FileFaults : public testing::Test {
protected:
    FileFaults() {
        setenv("XDG_DATA_HOME", started.drive.Native("data").c_str(), 1);
        setenv("TESSEL_REGISTRY", started.drive.Native("store").c_str(), 1);
    }
    ~FileFaults() override {
        unsetenv("XDG_DATA_HOME");
        unsetenv("TESSEL_REGISTRY");
    }

    StartedFiles::Lasting At(const char* name) const { return started.At(name); }
    void Put(const char* name, const std::string& bytes) const { started.drive.Put(name, bytes); }
    bool IsThere(const char* name) const { return fs::exists(started.drive.Native(name)); }
    // Missing, whole, or what it is else.
    std::string State(const char* name, const std::string& whole) const {
        if (!IsThere(name)) return "-";
        const std::string found = started.drive.Get(name);
        return found == whole ? "whole" : "torn at " + std::to_string(found.size());
    }

    // ---- files ----
    const std::string bytes_ = std::string(3000, 'n') + std::string(200'000, '\0') + std::string(1500, 'm');
    const std::string before_ = std::string(2500, 'o');

    FaultScenario Copying() {
        return {"copy", [this] { Put("a", bytes_); }, [this] { return FCopy(At("a"), At("b")); },
                [this] { return State("a", bytes_) + State("b", bytes_); }};
    }
    // The source stays until the copy is there: whole in both places is as good as before.
    FaultScenario Moving(const char* name) {
        return {name, [this] { Put("a", bytes_); },
                [this] {
                    if (IsThere("a") && IsThere("b")) FRemove(At("b"));
                    return FMove(At("a"), At("b"));
                },
                [this] {
                    const std::string a = State("a", bytes_), b = State("b", bytes_);
                    return a == "whole" && b == "whole" ? "whole-" : a + b;
                }};
    }
    FaultScenario MovingInto() {
        return {"move into",
                [this] {
                    Put("a", bytes_);
                    Put("t", before_);
                },
                [this] { return FMoveInto(At("a"), At("t")); },
                [this] { return State("t", bytes_) == "whole" ? "new" : State("t", before_) + State("a", bytes_); }};
    }
    FaultScenario Making(const char* name, std::function<MgErr()> make, const char* what) {
        FaultScenario scenario{name, [] {}, std::move(make), [=, this] { return IsThere(what) ? "there" : "-"; }};
        scenario.durable = false;
        return scenario;
    }
    FaultScenario Trashing() {
        return {"recycle",
                [this] {
                    Put("item", bytes_);
                    for (const char* folder : {"files", "info"})
                        fs::create_directories(started.drive.Native(std::string("data/Trash/") + folder));
                },
                [this] { return FRemoveToRecycle(At("item"), 0); },
                [this] {
                    const std::string info = started.drive.Get("data/Trash/info/item.trashinfo");
                    const bool said = info.find("\nPath=") != std::string::npos && info.back() == '\n';
                    const std::string item = State("item", bytes_), trashed = State("data/Trash/files/item", bytes_);
                    return trashed == "-" ? item : item + trashed + (said ? "" : " without information");
                }};
    }

    // ---- preferences ----
    MgErr Prefer(const char* name) const {
        try {
            return BMINIConfigOperations(PathRef(At(name)), "View").SetValue("key", before_);
        } catch (const OVExcept& exception) {
            return exception.Code();
        }
    }
    FaultScenario Saving(const char* name, const std::string& before) {
        return {name,
                [=, this] {
                    if (!before.empty()) Put("prefs.ini", before);
                },
                [this] { return Prefer("prefs.ini"); },
                [this] { return IsThere("prefs.ini") ? started.drive.Get("prefs.ini") : "-"; }};
    }

    // ---- the registry ----
    static MgErr WithRoot(const std::function<platform::ErrorNumber(RegistryKey*)>& work) {
        RegistryKey* root = nullptr;
        platform::ErrorNumber number =
            platform::RegistryOpenRoot(platform::RegistryRoot::kUsers, platform::kRegistryDefaultView, root);
        if (!number) number = work(root);
        platform::RegistryClose(root);
        return static_cast<MgErr>(number);
    }
    static platform::ErrorNumber Set(RegistryKey* root, const char* path, const char* name, const std::string& data) {
        RegistryKey* key = nullptr;
        platform::ErrorNumber number = platform::RegistryCreate(root, path, key);
        if (!number) number = platform::RegistrySetValue(key, name, 3, data.data(), data.size());
        platform::RegistryClose(key);
        return number;
    }
    // What a key holds: its values with their sizes, and its keys.
    static std::string Holds(RegistryKey* root, const std::string& path) {
        RegistryKey* key = nullptr;
        if (const auto number = platform::RegistryOpen(root, path.c_str(), false, key)) return std::to_string(number);
        std::string text = "(", name, data;
        for (std::uint32_t i = 0, type = 0; platform::RegistryEnumerateValue(key, i, name) == 0; ++i) {
            const auto number = platform::RegistryQueryValue(key, name.c_str(), type, data);
            text += name.substr(0, 9) + "=" + (number ? "error" : std::to_string(std::hash<std::string>()(data))) + " ";
        }
        for (std::uint32_t i = 0; platform::RegistryEnumerateKey(key, i, name) == 0; ++i)
            text += name.substr(0, 9) + Holds(root, path + "\\" + name);
        platform::RegistryClose(key);
        return text + ")";
    }
    FaultScenario InRegistry(const char* name, std::function<platform::ErrorNumber(RegistryKey*)> change) {
        return {name,
                [this] {
                    EXPECT_EQ(kNoErr, WithRoot([this](RegistryKey* root) {
                                  for (const char* path : {"Key", "Key\\Sub", "Key\\Sub\\Deep"}) {
                                      for (const char* value : {"", "Value"}) Set(root, path, value, before_);
                                  }
                                  return Set(root, "Other", "x", "y");
                              }));
                },
                [=] { return WithRoot(change); },
                [] {
                    std::string text;
                    WithRoot([&](RegistryKey* root) {
                        text = Holds(root, "Key");
                        return 0u;
                    });
                    return text;
                }};
    }

    std::vector<FaultScenario> Scenarios() {
        std::vector<FaultScenario> all = {Copying(), Moving("move"), Moving("move across"), MovingInto(), Trashing()};
        all.push_back(Saving("make preferences", ""));
        all.push_back(Saving("save preferences", "; kept\n[View]\nkey=1\nother=" + before_ + "\n"));
        all.push_back(Making(
            "make a folder", [this] { return FNewDir(At("d"), 0); }, "d"));
        all.push_back(
            InRegistry("set a value", [this](RegistryKey* root) { return Set(root, "Key", "Value", bytes_); }));
        all.push_back(InRegistry("add a value", [this](RegistryKey* root) { return Set(root, "Key", "new", bytes_); }));
        all.push_back(InRegistry("delete a value", [](RegistryKey* root) {
            RegistryKey* key = nullptr;
            platform::ErrorNumber number = platform::RegistryOpen(root, "Key", true, key);
            if (!number) number = platform::RegistryDeleteValue(key, "Value");
            platform::RegistryClose(key);
            return number;
        }));
        all.push_back(
            InRegistry("delete a key", [](RegistryKey* root) { return platform::RegistryDelete(root, "Key"); }));
        all.push_back(InRegistry("make a key", [](RegistryKey* root) {
            RegistryKey* key = nullptr;
            const auto number = platform::RegistryCreate(root, ("Key\\" + std::string(255, '/')).c_str(), key);
            platform::RegistryClose(key);
            return number;
        }));
        return all;
    }

    // The next change of the kind clears what a dead process left.
    void ChangeNeighbour(const std::string& scenario) {
        if (IsThere("store")) WithRoot([](RegistryKey* root) { return Set(root, "Other", "x", "y"); });
        Put("neighbour", "");
        if (scenario == "recycle")
            FRemoveToRecycle(At("neighbour"), 0);
        else if (scenario.find("preferences") != std::string::npos)
            Prefer("neighbour");
        else
            FWriteWholeFile(At("neighbour"), "", 0);
        for (const char* left : {"neighbour", "data/Trash/files/neighbour", "data/Trash/info/neighbour.trashinfo"})
            fs::remove(started.drive.Native(left));
    }

    template <typename Work>
    FaultCount ForEachScenario(Work work, bool every = true) {
        FaultCount sum;
        for (FaultScenario& scenario : Scenarios()) {
            const bool isLong = scenario.name == "move" || scenario.name == "add a value" ||
                                scenario.name == "delete a value" || scenario.name == "make a folder" ||
                                scenario.name == "make a key";
            if ((isLong && !every && !FaultsAtLength()) || scenario.name == leftOut_) continue;
            const Apart apart(scenario.name == "move across");
            scenario.next = [this, name = scenario.name] { ChangeNeighbour(name); };
            scenario.undone = scenario.name != "move across" && scenario.name != "make a key";
            FaultRunner runner(started.drive, scenario);
            const FaultCount count = work(runner);
            EXPECT_EQ(0, count.bad) << count.first;
            sum += count;
        }
        std::cout << sum << "\n";
        return sum;
    }

    ReportRecorder reports_;
    StartedFiles started;
    std::string leftOut_;
};

TEST_F(FileFaults, AKillLeavesWhatWasThereOrWhatWasToBe) {
    ForEachScenario([](FaultRunner& runner) { return runner.Stopped(Stop::kKill, 0); });
}
TEST_F(FileFaults, APowerLossInOrderLeavesWhatWasThereOrWhatWasToBe) {
    ForEachScenario([](FaultRunner& runner) { return runner.Stopped(Stop::kPowerInOrder, 0); });
}
TEST_F(FileFaults, APowerLossInAnyOrderLeavesWhatWasThereOrWhatWasToBe) {
    const int most = FaultsAtLength() ? 256 : 12;
    ForEachScenario([&](FaultRunner& runner) { return runner.Stopped(Stop::kPowerAnyOrder, most); });
}

TEST_F(FileFaults, AFailingCallLeavesWhatWasThereOrDoesTheWork) {
    for (const int error : {EIO, ENOSPC, EINTR, EMFILE, EACCES, ENOMEM, EROFS, 0}) {
        if (!FaultsAtLength() && error != EIO) continue;
        SCOPED_TRACE(error);
        // Who may not use his own trash uses that of the file system, outside of the drive.
        leftOut_ = error == EACCES || error == EROFS ? "recycle" : "";
        ForEachScenario([&](FaultRunner& runner) { return runner.FailingCalls(error, false); }, false);
        if (error == EINTR || !FaultsAtLength()) continue;  // a signal for ever is none
        ForEachScenario([&](FaultRunner& runner) { return runner.FailingCalls(error, true); }, false);
    }
}

TEST_F(FileFaults, KilledProcessesLeaveOldOrNewAndNothingElse) {
    const FaultCount before = ForEachScenario([](FaultRunner& runner) { return runner.KilledBeforeCalls(); }, false);
    EXPECT_EQ(0, before.leftovers);
    const int kills = FaultsAtLength() ? 100 : 2;
    ForEachScenario([&](FaultRunner& runner) { return runner.KilledAtRandom(kills); });
}

}  // namespace
}  // namespace tessel::test
