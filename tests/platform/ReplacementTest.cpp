// Replacing a file whole. What kills and power losses leave is looked at in tests/faults.
#include "platform/FileSystem.h"
#include "platform/LastError.h"
#include "platform/Replacement.h"
#include "support/FailingPlatform.h"
#include "support/ScratchDrive.h"
#include "support/Test.h"

#include <cerrno>
#include <filesystem>
#include <set>
#include <sys/stat.h>
#include <sys/wait.h>
#include <sys/xattr.h>
#include <unistd.h>

namespace tessel::platform {
namespace {

using test::FailingPlatform;
using test::ScratchDrive;

class ReplacementTest : public testing::Test {
protected:
    ReplaceFailure Replace(ReplaceRequest request, const std::string& bytes, const char* inside = "f") {
        const std::string name = drive.Name(inside);
        request.name = name.c_str();
        Replacement replacement;
        std::size_t put = 0;
        SetLastError(0);
        const bool done = replacement.Begin(request) &&
                          FileWrite(replacement.File(), bytes.data(), bytes.size(), put) && replacement.Finish();
        EXPECT_EACH(done == (replacement.Failure() == ReplaceFailure::kNone), done == replacement.HasName());
        return replacement.Failure();
    }
    std::set<std::string> Names() const {
        std::set<std::string> names;
        for (const auto& entry : std::filesystem::directory_iterator(drive.Native()))
            names.insert(entry.path().filename());
        return names;
    }
    unsigned ModeOf(const char* inside) const {
        struct stat status {};
        EXPECT_EQ(0, stat(drive.Native(inside).c_str(), &status));
        return status.st_mode & 07777;
    }

    ScratchDrive drive;
    using Names_ = std::set<std::string>;
};

TEST_F(ReplacementTest, KeepsWhatBelongsToTheFileWithAndWithoutUnnamedFiles) {
    // The file that is opened after the folder, the old file and eight leftovers; the name that is looked at as a link
    // after the link and the file.
    const struct {
        const char* call;
        int n, error;
    } kHosts[] = {{"openat", 1000, EIO}, {"openat", 10, EOPNOTSUPP}, {"readlink", 3, ENOENT}};
    for (const auto& host : kHosts) {
        SCOPED_TRACE(host.call);
        drive.Put("f", "old");
        const std::string native = drive.Native("f");
        ASSERT_EQ(0, chmod(native.c_str(), 0640));
        ASSERT_EQ(0, setxattr(native.c_str(), "user.colour", "blue", 4, 0));
        std::filesystem::create_symlink("f", drive.Native("link"));
        ItemInfo before, after;
        ASSERT_TRUE(ItemGetInfo(drive.Name("f").c_str(), before));
        {
            const FailingPlatform failing(host.call, host.n, host.error);
            EXPECT_EQ(ReplaceFailure::kNone, Replace({}, "new", "LINK"));
        }
        EXPECT_EACH(drive.Get("f") == "new", std::filesystem::is_symlink(drive.Native("link")), ModeOf("f") == 0640u);
        char colour[5] = {};
        EXPECT_EACH(getxattr(native.c_str(), "user.colour", colour, 4) == 4, colour == "blue",
                    getxattr(native.c_str(), "user.tessel.temporary", colour, 0) == -1);
        ASSERT_TRUE(ItemGetInfo(drive.Name("f").c_str(), after));
        EXPECT_EACH(before.created == after.created, Names() == (Names_{"f", "link"}),
                    ReplaceFailure::kCannotRename == Replace({.mustNotExist = true}, "x"),
                    LastError() == kErrorFileExists,
                    ReplaceFailure::kNone == Replace({.mustNotExist = true}, "x", "fresh"),
                    (0666u & ~PermissionMask()) == ModeOf("fresh"));
        std::filesystem::remove(drive.Native("fresh"));
        std::filesystem::remove(drive.Native("link"));
    }
}

TEST_F(ReplacementTest, SaysHowFarItCameAndLeavesNothing) {
    const struct {
        const char* call;
        int n, error;
        ReplaceFailure failure;
        ErrorNumber number;
    } kTable[] = {{"openat", 10, EROFS, ReplaceFailure::kCannotMake, kErrorAccessDenied},
                  {"fchown", 1, EPERM, ReplaceFailure::kCannotMake, kErrorAccessDenied},
                  {"fsync", 1, EROFS, ReplaceFailure::kCannotFlush, kErrorAccessDenied},
                  {"fsync", 2, EIO, ReplaceFailure::kCannotFlush, kErrorIODevice},
                  {"fchmod", 2, EIO, ReplaceFailure::kCannotFlush, kErrorIODevice},
                  {"renameat2", 1, EACCES, ReplaceFailure::kCannotRename, kErrorAccessDenied}};
    for (const auto& row : kTable) {
        SCOPED_TRACE(std::string(row.call) + std::to_string(row.n));
        drive.Put("f", "old");
        const bool root = geteuid() == 0;
        if (!root && std::string(row.call) == "fchown") continue;  // only root makes files that are another's
        ASSERT_EQ(0, chown(drive.Native("f").c_str(), root ? 1 : geteuid(), getegid()));
        const FailingPlatform failing(row.call, row.n, row.error);
        EXPECT_EACH(row.failure == Replace({}, "new"), row.number == LastError(), drive.Get("f") == "old",
                    Names() == (Names_{"f"}));
    }
}

TEST_F(ReplacementTest, TheNameMustLeadToTheFileToTheEnd) {
    drive.Put("f", "old");
    const std::string name = drive.Name("f");
    const FileHandle file = FileOpen(name.c_str(), kRead | kWrite, kWrite, Disposition::kOpenExisting);
    Replacement replacement;
    ASSERT_TRUE(replacement.Begin({.name = name.c_str(), .opened = file, .deny = kWrite}));
    std::filesystem::rename(drive.Native("f"), drive.Native("away"));
    drive.Put("f", "another's");
    EXPECT_EACH(!replacement.Finish(), ReplaceFailure::kCannotRename == replacement.Failure(),
                LastError() == kErrorFileNotFound, drive.Get("f") == "another's");
    std::filesystem::rename(drive.Native("away"), drive.Native("f"));

    // The marks are on the new file when it takes the name, and stay with its handle.
    Replacement second;
    ASSERT_TRUE(second.Begin({.name = name.c_str(), .opened = file, .deny = kWrite}));
    ASSERT_TRUE(second.Finish());
    const FileHandle fresh = second.Release();
    FileClose(file);
    EXPECT_EACH(FileOpen(name.c_str(), kWrite, 0, Disposition::kOpenExisting) == kNoFile,
                LastError() == kErrorSharingViolation);
    FileClose(fresh);
    std::filesystem::create_hard_link(drive.Native("f"), drive.Native("g"));
    EXPECT_EACH(ReplaceFailure::kCannotMake == Replace({}, "new"), LastError() == kErrorTooManyLinks,
                ReplaceFailure::kNone == Replace({.breaksLinks = true}, "new"), drive.Get("f") == "new",
                drive.Get("g") == "");
}

TEST_F(ReplacementTest, ClearsWhatTheDeadLeftAndNothingElse) {
    const char* const kPattern = "ini$$%d.TMP";
    drive.Put("ini$$0.TMP", "a stranger's");
    drive.Put("f", "old");
    const pid_t child = fork();
    if (child == 0) {
        const FailingPlatform named("openat", 10, EOPNOTSUPP);
        const std::string name = drive.Name("f");
        Replacement replacement;
        _exit(replacement.Begin({.name = name.c_str(), .pattern = kPattern}) ? 0 : 1);
    }
    int status = 1;
    ASSERT_EQ(child, waitpid(child, &status, 0));
    ASSERT_EQ(0, status);
    ASSERT_EQ((Names_{"f", "ini$$0.TMP", "ini$$1.TMP"}), Names());
    EXPECT_EACH(ModeOf("ini$$1.TMP") == 0600u,
                ReplaceFailure::kCannotMake == Replace({.pattern = kPattern, .limit = 1}, "new"));
    {
        const FailingPlatform named("openat", 10, EOPNOTSUPP);
        const std::string name = drive.Name("f");
        Replacement living;
        ASSERT_TRUE(living.Begin({.name = name.c_str(), .pattern = kPattern}));
        ASSERT_EQ((Names_{"f", "ini$$0.TMP", "ini$$1.TMP"}), Names());  // the dead writer's went, this is another
        EXPECT_EACH(ReplaceFailure::kNone == Replace({.pattern = kPattern}, "new"),
                    Names() == (Names_{"f", "ini$$0.TMP", "ini$$1.TMP"}), !living.Finish());
    }
    EXPECT_EACH(Names() == (Names_{"f", "ini$$0.TMP"}), drive.Get("ini$$0.TMP") == "a stranger's",
                drive.Get("f") == "new");
}

}  // namespace
}  // namespace tessel::platform
