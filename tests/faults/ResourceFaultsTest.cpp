// Resource files: what is found after any call that fails, any kill and any power loss. Old or new, whole.
#include "platform/posix/SystemCalls.h"
#include "resources/ResourceTestSupport.h"
#include "support/FailingPlatform.h"
#include "support/FaultScenario.h"
#include "support/ReportRecorder.h"
#include <tessel/files/FileManager.h>
#include <tessel/resources/ovresfile.h>

#include <cerrno>
#include <filesystem>
#include <iostream>
#include <linux/fs.h>
#include <sys/wait.h>
#include <unistd.h>

namespace tessel::test {
namespace {

using platform::systemCalls;

platform::SystemCalls host;

// A file system that lacks what some lack.
struct PoorHost {
    enum Lack { kNothing, kUnnamed, kExchange };
    explicit PoorHost(Lack lack) {
        host = systemCalls;
        if (lack == kNothing) return;
        systemCalls.openat = [](int folder, const char* name, int flags, mode_t mode) {
            if ((flags & O_TMPFILE) != O_TMPFILE) return host.openat(folder, name, flags, mode);
            errno = EOPNOTSUPP;
            return -1;
        };
        if (lack == kUnnamed) return;
        systemCalls.renameat2 = [](int a, const char* from, int b, const char* to, unsigned flags) {
            if (!flags) return host.renameat2(a, from, b, to, flags);
            errno = EINVAL;
            return -1;
        };
    }
    ~PoorHost() { systemCalls = host; }
};

class ResourceFaults : public ResourceTest {
protected:
    enum Way { kByName, kLinked, kByReference };
    using Change = std::function<MgErr(RsrcFile)>;

    // What the file holds, read whole at once and piece by piece, and, where it is to be seen, byte by byte.
    std::string Look(const char* name, bool bytes) {
        std::string text[2];
        for (const int32 mode : {kROpenReadOnly, kROpenReadWrite}) {
            RsrcFile file = 0;
            _FMFileType type = 0;
            const MgErr err = ROpenFile(started.At(name), mode, &file, &type, nullptr);
            std::string& found = text[mode];
            found = err ? "error " + std::to_string(err) : std::to_string(type);
            UHandle data = nullptr;
            MgErr last = kNoErr;
            for (int32 i = 1, id = 0; !err && (last = RGetInd(file, kData, i, &data)) == kNoErr; ++i) {
                RGetInfo(data, &id, nullptr, nullptr);
                found += " " + std::to_string(id) + "=" + std::to_string(std::hash<std::string>()(BytesOf(data)));
            }
            if (!err && last != kResNotFoundErr) found += " error " + std::to_string(last);
            if (!err) RCloseFile(file);
        }
        if (text[0] != text[1]) text[0] += " or " + text[1];
        return text[0] + (bytes ? " " + std::to_string(std::hash<std::string>()(started.drive.Get(name))) : "");
    }

    // A file with a hole in front and one in the midst, small and large resources.
    void MakeFile(Way way) {
        ASSERT_EQ(kNoErr, RCreateFile(started.At("f"), 0, kCreator, kType, 0));
        const RsrcFile file = OpenDisk("f");
        const uint32 sizes[] = {700, 3000, 0, 9000, 5, 1200};
        for (int32 id = 0; id < 6; ++id) Add(file, kData, id, std::string(sizes[id], static_cast<char>('a' + id)));
        ASSERT_EQ(kNoErr, RCloseFile(file));
        if (way == kLinked) std::filesystem::create_hard_link(started.drive.Native("f"), started.drive.Native("g"));
    }

    MgErr Update(Way way, const Change& change) {
        RsrcFile file = 0;
        File_t* open = nullptr;
        MgErr err = kNoErr;
        if (way == kByReference) {
            err = FMOpen(&open, started.At("f"), kFOpenReadWrite, kFDenyWrite);
            if (!err) err = ROpenFileRefnum(open, kROpenReadWrite, &file, nullptr, nullptr);
        } else {
            err = ROpenFile(started.At("f"), kROpenReadWrite, &file, nullptr, nullptr);
        }
        if (!err) err = change(file);
        if (!err) err = RUpdateFile(file);
        if (file) {
            RSetFileAttrs(file, 0);  // what failed is given up
            RCloseFile(file);
        }
        if (open) FMClose(open);
        return err;
    }

    static MgErr TryRemove(RsrcFile file, int32 id) {
        UHandle data = nullptr;
        MgErr err = RGet(file, kData, id, &data);
        if (!err) err = RRemove(data, file);
        if (!err) DSDisposeHandle(data);
        return err;
    }
    static MgErr TryReplace(RsrcFile file, int32 id, uint32 size) {
        const std::string bytes(size, 'R');
        return RsrcFileToRMapResFile(file)->RReplacePtr(bytes.data(), size, kData, id);
    }

    FaultScenario Updating(const char* name, Way way, Change change) {
        const bool bytes = way == kByName;
        return {name, [=, this] { MakeFile(way); }, [=, this] { return Update(way, change); },
                [=, this] { return Look("f", bytes) + (way == kLinked ? Look("g", false) : ""); }};
    }
    FaultScenario Calling(const char* name, Way way, bool there, std::function<MgErr()> call) {
        return {name,
                [=, this] {
                    if (there) MakeFile(way);
                },
                call, [=, this] { return Look("f", way == kByName) + (way == kLinked ? Look("g", false) : ""); }};
    }

    std::vector<FaultScenario> Scenarios() {
        std::vector<FaultScenario> all;
        const char* const kWays[] = {"", " (linked)", " (by reference)"};
        for (const Way way : {kByName, kLinked, kByReference}) {
            const auto add = [&](const char* what, Change change) {
                all.push_back(Updating("", way, std::move(change)));
                all.back().name = std::string(what) + kWays[way];
            };
            add("add", [this](RsrcFile file) { return Add(file, kData, 9, std::string(2000, 'n')); });
            add("remove", [](RsrcFile file) { return TryRemove(file, 1); });
            add("replace and remove", [](RsrcFile file) {
                const MgErr err = TryRemove(file, 0);
                return err ? err : TryReplace(file, 3, 20000);
            });
            add("empty", [](RsrcFile file) {
                MgErr err = kNoErr;
                for (int32 id = 0; id < 6 && !err; ++id) err = TryRemove(file, id);
                return err;
            });
        }
        for (const Way way : {kByName, kLinked}) {
            all.push_back(Calling(way ? "set type (linked)" : "set type", way, true,
                                  [this] { return RSetFileType(started.At("f"), kStr, kStr); }));
            all.push_back(Calling(way ? "create and replace (linked)" : "create and replace", way, true,
                                  [this] { return RCreateFile(started.At("f"), 1, kStr, kStr, 0); }));
        }
        all.push_back(
            Calling("create", kByName, false, [this] { return RCreateFile(started.At("f"), 0, kStr, kStr, 0); }));
        all.push_back(Calling("write whole", kByName, true, [this] {
            const std::string bytes = Fixture("appended.bin");
            return FWriteWholeFile(started.At("f"), bytes.data(), bytes.size());
        }));
        return all;
    }

    ReportRecorder reports_;

    void ChangeNeighbour() {
        EXPECT_EQ(kNoErr, FWriteWholeFile(started.At("h"), "h", 1));
        EXPECT_EQ(kNoErr, FRemove(started.At("h")));
    }

    // Runs `work` for every scenario, on the hosts that there are, or in a short run on this one.
    template <typename Work>
    FaultCount ForEachScenario(Work work, bool every = FaultsAtLength()) {
        FaultCount sum;
        for (const PoorHost::Lack lack : {PoorHost::kNothing, PoorHost::kUnnamed, PoorHost::kExchange}) {
            if (lack && !every) continue;
            for (FaultScenario& scenario : Scenarios()) {
                const PoorHost poor(lack);
                scenario.next = [this] { ChangeNeighbour(); };
                scenario.undone = lack != PoorHost::kExchange;
                scenario.name += lack == PoorHost::kNothing   ? ""
                                 : lack == PoorHost::kUnnamed ? ", named"
                                                              : ", no exchange";
                FaultRunner runner(started.drive, scenario);
                const FaultCount count = work(runner);
                EXPECT_EQ(0, count.bad) << count.first;
                sum += count;
            }
        }
        std::cout << sum << std::endl;  // children that are killed would print it again
        return sum;
    }
};

TEST_F(ResourceFaults, AKillLeavesTheOldOrTheNewFile) {
    ForEachScenario([](FaultRunner& runner) { return runner.Stopped(Stop::kKill, 0); }, true);
}
TEST_F(ResourceFaults, APowerLossInOrderLeavesTheOldOrTheNewFile) {
    ForEachScenario([](FaultRunner& runner) { return runner.Stopped(Stop::kPowerInOrder, 0); }, true);
}
TEST_F(ResourceFaults, APowerLossInAnyOrderLeavesTheOldOrTheNewFile) {
    const int most = FaultsAtLength() ? 256 : 12;
    ForEachScenario([&](FaultRunner& runner) { return runner.Stopped(Stop::kPowerAnyOrder, most); }, true);
}

TEST_F(ResourceFaults, AFailingCallLeavesWhatWasThereOrDoesTheWork) {
    for (const int error : {EIO, ENOSPC, EINTR, EMFILE, EACCES, ENOMEM, EROFS, 0}) {
        if (!FaultsAtLength() && error != EIO && error != ENOSPC && error != 0) continue;
        SCOPED_TRACE(error);
        ForEachScenario([&](FaultRunner& runner) { return runner.FailingCalls(error, false); });
        if (error == EINTR || (error != ENOSPC && !FaultsAtLength())) continue;  // a signal for ever is none
        ForEachScenario([&](FaultRunner& runner) { return runner.FailingCalls(error, true); });
    }
}

// Within one session: what could not be written is still there, still pending, and goes with the next update.
TEST_F(ResourceFaults, AFailedUpdateLosesNothingThatCanBeWrittenLater) {
    for (const Way way : {kByName, kLinked}) {
        int calls = 1;
        for (int n = 1; calls >= n - 1; ++n) {
            SCOPED_TRACE(std::to_string(way) + " " + std::to_string(n));
            DiskState().PutInto(started.drive.Native());
            MakeFile(way);
            const std::string old = Look("f", false);
            const RsrcFile file = OpenDisk("f");
            ASSERT_EQ(kNoErr, TryRemove(file, 0));
            ASSERT_EQ(kNoErr, TryReplace(file, 3, 500));
            ASSERT_EQ(kNoErr, Add(file, kData, 9, "new"));
            MgErr err = kNoErr;
            {
                const FailingPlatform failing("*", n, EIO);
                err = RUpdateFile(file);
                calls = failing.Calls();
            }
            uint32 attrs = 0;
            EXPECT_EQ(kNoErr, RGetFileAttrs(file, &attrs));
            EXPECT_EQ(err ? uint32{kRFileChanged} : 0, attrs);
            EXPECT_EQ(std::string(500, 'R'), Get(file, kData, 3));
            EXPECT_EQ(std::string(5, 'e'), Get(file, kData, 4));
            EXPECT_EQ(kNoErr, RCloseFile(file));
            EXPECT_NE(old, Look("f", false));
            const RsrcFile again = OpenDisk("f", kROpenReadOnly);
            EXPECT_EQ("new", Get(again, kData, 9));
            EXPECT_EQ(std::string(1200, 'f'), Get(again, kData, 5));
            EXPECT_EQ(kNoErr, RCloseFile(again));
        }
    }
}

TEST_F(ResourceFaults, KilledProcessesLeaveTheOldOrTheNewFileAndNothingElse) {
    const FaultCount before = ForEachScenario([](FaultRunner& runner) { return runner.KilledBeforeCalls(); });
    EXPECT_EQ(0, before.leftovers);
    const int kills = FaultsAtLength() ? 40 : 2;
    ForEachScenario([&](FaultRunner& runner) { return runner.KilledAtRandom(kills); });
}

// Two processes that add, replace and remove, each counting in the file what it did.
class TwoProcesses : public ResourceFaults {
protected:
    static std::string Pattern(int32 id, uint32 size) { return std::string(size, static_cast<char>('A' + id)); }

    // The next round; false when the file could not be had.
    bool Round(int32 who, unsigned random) {
        RsrcFile file = 0;
        if (ROpenFile(started.At("f"), kROpenReadWrite, &file, nullptr, nullptr)) return false;
        UHandle data = nullptr;
        MgErr err = RGet(file, kStr, who, &data);
        int count = 0;
        if (!err) count = std::stoi(BytesOf(data)) + 1;
        const std::string text = std::to_string(count);
        auto* object = RsrcFileToRMapResFile(file);
        if (!err) err = object->RReplacePtr(text.data(), static_cast<uint32>(text.size()), kStr, who);
        const auto id = static_cast<int32>(random % 10);
        if (!err && RGet(file, kData, id, &data) == kNoErr)
            err = TryRemove(file, id);
        else if (!err)
            err = Add(file, kData, id, Pattern(id, random / 16 % 6000));
        if (!err) err = RCloseFile(file);
        if (err) RCloseFileForce(file);
        return !err;
    }
    int Work(int32 who, int rounds) {
        unsigned random = static_cast<unsigned>(who) * 2654435761u + 1;
        for (int done = 0; done < rounds;) {
            random = random * 1664525u + 1013904223u;
            if (Round(who, random >> 8)) ++done;
        }
        return 0;
    }
};

TEST_F(TwoProcesses, LoseNothingAndNeverSeeHalfAFile) {
    const int rounds = FaultsAtLength() ? 5000 : 25;
    ASSERT_EQ(kNoErr, RCreateFile(started.At("f"), 0, kCreator, kType, 0));
    const RsrcFile made = OpenDisk("f");
    for (int32 who = 0; who < 2; ++who) Add(made, kStr, who, "0");
    ASSERT_EQ(kNoErr, RCloseFile(made));
    pid_t children[2];
    for (int32 who = 0; who < 2; ++who) {
        children[who] = fork();
        if (children[who] == 0) _exit(Work(who, rounds));
    }
    for (const pid_t child : children) {
        int status = 1;
        ASSERT_EQ(child, waitpid(child, &status, 0));
        EXPECT_EQ(0, status);
    }
    const RsrcFile file = OpenDisk("f", kROpenReadOnly);
    for (int32 who = 0; who < 2; ++who) EXPECT_EQ(std::to_string(rounds), Get(file, kStr, who));
    UHandle data = nullptr;
    for (int32 i = 1, id = 0; RGetInd(file, kData, i, &data) == kNoErr; ++i) {
        RGetInfo(data, &id, nullptr, nullptr);
        EXPECT_EQ(Pattern(id, DSGetHandleSize(data)), BytesOf(data));
    }
    EXPECT_EQ(kNoErr, RCloseFile(file));
    EXPECT_EQ(1, std::distance(std::filesystem::directory_iterator(started.drive.Native()), {}));
}

}  // namespace
}  // namespace tessel::test
