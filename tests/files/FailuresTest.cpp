// What copies and moves keep, and what failures say. What they leave behind is looked at in tests/faults.
#include "platform/Module.h"
#include "platform/posix/SystemCalls.h"
#include "support/FailingPlatform.h"
#include "support/StartedFiles.h"
#include <tessel/diagnostics/FileLoc.h>
#include <tessel/files/FileManager.h>
#include <tessel/resources/ResourceManager.h>
#include <tessel/strings/StringOutput.h>

#include <cerrno>
#include <fcntl.h>
#include <filesystem>
#include <memory>
#include <set>
#include <string>
#include <sys/stat.h>
#include <sys/wait.h>
#include <sys/xattr.h>
#include <unistd.h>

namespace tessel::test {
namespace {

namespace fs = std::filesystem;

// As if names lay on different file systems, between which the kernel does not copy.
class Apart {
public:
    Apart() {
        platform::systemCalls.renameat2 = [](int, const char*, int, const char*, unsigned) {
            errno = EXDEV;
            return -1;
        };
        platform::systemCalls.copy_file_range = [](int, off64_t*, int, off64_t*, size_t, unsigned) -> ssize_t {
            errno = EXDEV;
            return -1;
        };
    }
    ~Apart() { platform::systemCalls = before_; }
    Apart(const Apart&) = delete;
    Apart& operator=(const Apart&) = delete;

private:
    const platform::SystemCalls before_ = platform::systemCalls;
};

class FailuresTest : public testing::Test {
public:
    StartedFiles::Lasting At(std::string_view name) const { return started.At(name); }
    std::string Native(std::string_view name) const { return started.drive.Native(name); }
    struct stat StatusOf(std::string_view name) const {
        struct stat status {};
        EXPECT_EQ(0, lstat(Native(name).c_str(), &status)) << name;
        return status;
    }
    // All that is in the scratch folder, with its content.
    std::string Everything() const {
        std::string all;
        std::set<fs::path> paths;
        for (const auto& entry : fs::recursive_directory_iterator(started.drive.Native())) paths.insert(entry.path());
        for (const fs::path& path : paths) {
            const std::string name = fs::relative(path, started.drive.Native());
            all += name + (fs::is_regular_file(path) ? "=" + started.drive.Get(name) : "") + ";";
        }
        return all;
    }
    // Moves as if to another file system.
    MgErr MoveAcross(std::string_view from, std::string_view to) const {
        const Apart apart;
        return FMove(At(from), At(to));
    }

    StartedFiles started;
};

TEST_F(FailuresTest, MovesKeepWhatAFileHasAndCopiesItsContent) {
    constexpr off_t kHole = 64 << 20;
    started.drive.Put("a", "begin");
    const int file = open(Native("a").c_str(), O_RDWR | O_CLOEXEC);
    ASSERT_EQ(3, pwrite(file, "end", 3, kHole));
    ASSERT_EQ(0, ftruncate(file, kHole + 10'000'000));
    close(file);
    const bool hasAttributes = setxattr(Native("a").c_str(), "user.colour", "blue", 4, 0) == 0;
    ASSERT_EQ(0, chmod(Native("a").c_str(), 04750));
    const timespec times[] = {{1'000'000'000, 0}, {1'100'000'000, 0}};
    for (const bool copied : {false, true}) {
        ASSERT_EQ(0, utimensat(AT_FDCWD, Native("a").c_str(), times, 0));
        EXPECT_EQ(copied ? kExistsErr : kNoErr, FCopy(At("a"), At("copy")));
    }
    EXPECT_EQ(kNoErr, MoveAcross("a", "moved"));
    EXPECT_FALSE(fs::exists(Native("a")));
    for (const char* name : {"copy", "moved"}) {
        const struct stat status = StatusOf(name);
        const bool moved = name[0] == 'm';
        EXPECT_EQ(moved ? 04750u : 0750u, status.st_mode & 07777) << name;
        EXPECT_EQ(1'100'000'000, status.st_mtim.tv_sec) << name;
        EXPECT_EQ(moved, status.st_atim.tv_sec == 1'000'000'000) << name;
        EXPECT_EQ(kHole + 10'000'000, status.st_size) << name;
        EXPECT_LT(status.st_blocks * 512, 1 << 20) << name << ": the hole was filled";
        char text[5];
        EXPECT_EQ(moved && hasAttributes ? 4 : -1, getxattr(Native(name).c_str(), "user.colour", text, 4)) << name;
        const int copy = open(Native(name).c_str(), O_RDONLY | O_CLOEXEC);
        EXPECT_TRUE(pread(copy, text, 5, 0) == 5 && std::string(text, 5) == "begin") << name;
        EXPECT_TRUE(pread(copy, text, 5, kHole) == 5 && std::string(text, 5) == std::string("end\0\0", 5)) << name;
        close(copy);
    }
    fs::create_symlink("nowhere", Native("link"));
    EXPECT_EQ(kNoErr, MoveAcross("link", "moved link"));
    EXPECT_EQ("nowhere", fs::read_symlink(Native("moved link")));
    EXPECT_FALSE(fs::is_symlink(Native("link")));
}

TEST_F(FailuresTest, OnlyRegularFilesAreCopied) {
    ASSERT_EQ(0, mkfifo(Native("pipe").c_str(), 0600));
    fs::create_symlink("/dev/zero", Native("endless"));
    fs::create_directory(Native("folder"));
    started.drive.Put("f", "kept");
    for (const char* name : {"pipe", "endless", "folder"}) {
        EXPECT_EQ(kPermissionErr, FCopy(At(name), At("copy"))) << name;
        EXPECT_NE(kNoErr, FMoveInto(At(name), At("f"))) << name;
        EXPECT_NE(kNoErr, FMoveInto(At("f"), At(name))) << name;
        EXPECT_EQ(name[0] == 'e'   ? kNoErr
                  : name[0] == 'f' ? kIOErr
                                   : kPermissionErr,
                  MoveAcross(name, std::string("moved ") + name));
    }
    EXPECT_EQ("kept", started.drive.Get("f"));
    EXPECT_FALSE(fs::exists(Native("copy")));
}

// Nor does anything wait for the other end of a pipe, whatever it is called.
TEST_F(FailuresTest, NothingWaitsForAPipe) {
    for (const char* name : {"pipe", "pipe.lnk", "pipe.so", "pipe.rsrc"})
        ASSERT_EQ(0, mkfifo(Native(name).c_str(), 0600));
    started.drive.Put("f", "kept");
    File_t* file = nullptr;
    EXPECT_EQ(kPermissionErr, FCreateAlways(&file, At("pipe"), 0, kFOpenReadWrite, kFDenyNone, 0));
    EXPECT_EQ(kPermissionErr, FMOpen(&file, At("PIPE"), kFOpenReadWrite, kFDenyNone));
    EXPECT_EQ(kPermissionErr, FMOpen(&file, At("pipe.lnk"), kFOpenRead, kFDenyNone));
    const std::unique_ptr<StringOutput> output(
        StringOutputFactory::CreateFileOutput(CreateFileLoc(1, started.drive.Name("pipe").c_str(), false)));
    for (const auto mode : {StringOutput::kTruncate, StringOutput::kAppendAtEnd}) output->Open(mode);
    output->PrintData("lost");
    EXPECT_EQ(nullptr, platform::LibraryLoad(started.drive.Name("pipe.so").c_str()));
    RsrcFile resources = 0;
    EXPECT_NE(kNoErr, ROpenFile(At("pipe.rsrc"), kFOpenRead, &resources, nullptr, nullptr));
    EXPECT_EQ(kNoErr, FMove(At("pipe"), At("moved")));
    EXPECT_EQ(kNoErr, FRemove(At("moved")));
}

// In place where the file cannot be replaced: it has other names.
TEST_F(FailuresTest, MovingIntoKeepsWhatTheTargetIs) {
    for (const bool linked : {false, true}) {
        started.drive.Put("from", "new content");
        started.drive.Put("to", "what was there before");
        ASSERT_EQ(0, chmod(Native("to").c_str(), 0640));
        fs::create_symlink("to", Native("link"));
        if (linked) fs::create_hard_link(Native("to"), Native("other"));
        EXPECT_EQ(kNoErr, FMoveInto(At("from"), At("link")));
        EXPECT_EQ("new content", started.drive.Get("to"));
        EXPECT_EQ(0640u, StatusOf("to").st_mode & 07777);
        EXPECT_TRUE(fs::is_symlink(Native("link")) && !fs::exists(Native("from")));
        EXPECT_EQ(linked ? "new content" : "", started.drive.Get("other"));
        fs::remove(Native("link"));
    }
}

TEST_F(FailuresTest, AFileThatEndsTooEarlyIsNoCopy) {
    started.drive.Put("a", std::string(10'000, 'a'));
    started.drive.Put("t", "old");
    for (const bool into : {false, true}) {
        const Apart apart;
        // Data is said to reach beyond the end: the file was cut after the look at it.
        static auto* const real = platform::systemCalls.statx;
        platform::systemCalls.statx = [](int folder, const char* name, int flags, unsigned mask, struct statx* status) {
            const int result = real(folder, name, flags, mask, status);
            if (result == 0 && status->stx_size == 10'000) status->stx_size = 20'000;
            return result;
        };
        EXPECT_EQ(kIOErr, into ? FMoveInto(At("a"), At("t")) : FCopy(At("a"), At("b")));
        EXPECT_STREQ("the file ends too early", FErrorText(kIOErr));
        EXPECT_EQ(kIOErr, FMove(At("a"), At("b")));
    }
    EXPECT_EQ("a=" + std::string(10'000, 'a') + ";t=old;", Everything());
}

// Eight processes copy to one name in two spellings: one wins, and the others hear of it.
TEST_F(FailuresTest, OneNameIsGivenOnce) {
    started.drive.Put("a", "content");
    for (int round = 0; round < 20; ++round) {
        pid_t children[8];
        for (int i = 0; i < 8; ++i) {
            children[i] = fork();
            if (children[i] == 0) _exit(FCopy(At("a"), At(i % 2 ? "to" : "TO")));
        }
        int wins = 0;
        for (const pid_t child : children) {
            int status = 0;
            waitpid(child, &status, 0);
            wins += WEXITSTATUS(status) == kNoErr;
            EXPECT_TRUE(WEXITSTATUS(status) == kNoErr || WEXITSTATUS(status) == kExistsErr);
        }
        EXPECT_EQ(1, wins);
        EXPECT_NE(fs::exists(Native("to")), fs::exists(Native("TO")));
        fs::remove(Native("to"));
        fs::remove(Native("TO"));
    }
}

TEST_F(FailuresTest, ALookThatFailsIsNoMissingName) {
    started.drive.Put("Name", "x");
    const struct {
        const char* call;
        int error;
        MgErr expected;
    } kRows[] = {{"opendir", EMFILE, kIOErr},      {"opendir", EIO, kIOErr},
                 {"readdir", EIO, kIOErr},         {"opendir", EACCES, kPermissionErr},
                 {"opendir", ENOMEM, kMemFullErr}, {"statx", EACCES, kPermissionErr},
                 {"statx", ENOMEM, kMemFullErr},   {"statx", EIO, kIOErr}};
    for (const auto& row : kRows) {
        SCOPED_TRACE(testing::Message() << row.call << ' ' << row.error);
        const FailingPlatform failing(row.call, 1, row.error, 100);
        File_t* file = nullptr;
        FInfo64Rec info;
        EXPECT_EQ(row.expected, FCreate(&file, At("NAME"), 0, kFOpenReadWrite, kFDenyNone, 0));
        EXPECT_EQ(row.expected, FNewDir(At("name"), 0));
        EXPECT_EQ(row.expected, FGetInfo64(At("NAME"), &info, kFInfoAll));
        EXPECT_EQ(row.expected, FRemove(At("NAME")));
        EXPECT_EQ(row.expected, FCopy(At("Name"), At("NAME")));
        EXPECT_EQ(row.expected, FMove(At("Name"), At("other")));
    }
    EXPECT_EQ("Name=x;", Everything());
    File_t* file = nullptr;
    EXPECT_EQ(kArgErr, FCreate(&file, At(std::string(256, 'n')), 0, kFOpenReadWrite, kFDenyNone, 0));
    EXPECT_EQ(kArgErr, FMOpen(&file, At(std::string(256, 'n')), kFOpenRead, kFDenyNone));
}

}  // namespace
}  // namespace tessel::test
