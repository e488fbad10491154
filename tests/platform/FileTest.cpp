#include "platform/File.h"
#include "platform/FileSystem.h"
#include "platform/LastError.h"
#include "support/FailingPlatform.h"
#include "support/ScratchDrive.h"
#include "support/Test.h"

#include <cerrno>
#include <sys/stat.h>
#include <sys/wait.h>
#include <unistd.h>

namespace tessel::platform {
namespace {

using test::FailingPlatform;
using test::ScratchDrive;

// Runs `work` in a forked process; its result comes back as the exit status.
template <typename Work>
int InAnotherProcess(Work work) {
    pid_t child = fork();
    if (child == 0) _exit(work());
    int status = 0;
    waitpid(child, &status, 0);
    return WIFEXITED(status) ? WEXITSTATUS(status) : -1;
}

FileHandle Open(const std::string& name, std::uint32_t access = kRead | kWrite, std::uint32_t deny = 0,
                Disposition disposition = Disposition::kOpenExisting) {
    return FileOpen(name.c_str(), access, deny, disposition);
}

TEST(File, DispositionsDecideWhatIsMade) {
    ScratchDrive drive;
    std::string name = drive.Name("a.txt");
    EXPECT_EACH(Open(name) == kNoFile, LastError() == kErrorFileNotFound,
                Open(drive.Name("none/a.txt"), kWrite, 0, Disposition::kCreateAlways) == kNoFile,
                LastError() == kErrorPathNotFound);

    FileHandle file = Open(name, kWrite, 0, Disposition::kCreateNew);
    ASSERT_NE(kNoFile, file);
    EXPECT_TRUE(FileClose(file));
    EXPECT_EQ(kNoFile, Open(drive.Name("A.TXT"), kWrite, 0, Disposition::kCreateNew));  // the same to the library
    EXPECT_EQ(kErrorFileExists, LastError());

    for (Disposition emptying : {Disposition::kTruncateExisting, Disposition::kCreateAlways}) {
        drive.Put("a.txt", "content");
        file = Open(name, kWrite, 0, emptying);
        ASSERT_NE(kNoFile, file);
        FileClose(file);
        EXPECT_EQ("", drive.Get("a.txt"));
    }
    EXPECT_EACH(Open(name, kRead, 0, Disposition::kTruncateExisting) == kNoFile, LastError() == kErrorInvalidParameter);
    ASSERT_TRUE(FolderCreate(drive.Name("folder").c_str()));
    for (std::uint32_t access : {kRead, kWrite, kRead | kWrite})
        EXPECT_EACH(Open(drive.Name("folder"), access) == kNoFile, LastError() == kErrorAccessDenied);
}

TEST(File, AccessIsThatOfTheHandle) {
    ScratchDrive drive;
    drive.Put("a", "abc");
    char buffer[4];
    std::size_t actual = 99;
    FileHandle reader = Open(drive.Name("a"), kRead);
    EXPECT_EACH(!FileWrite(reader, "x", 1, actual), LastError() == kErrorAccessDenied, actual == 0u,
                !FileSetSize(reader, 0));
    FileHandle writer = Open(drive.Name("a"), kWrite);
    SetLastError(0);
    EXPECT_EACH(!FileRead(writer, buffer, 3, actual), LastError() == kErrorAccessDenied,
                FileRead(reader, buffer, 4, actual), std::string(buffer, actual) == "abc");
    FileClose(reader);
    FileClose(writer);
}

TEST(File, PositionAndSize) {
    ScratchDrive drive;
    drive.Put("a", "0123456789");
    FileHandle file = Open(drive.Name("a"));
    std::int64_t value = 0;
    EXPECT_EACH(FileSeek(file, -3, SeekFrom::kEnd), FileTell(file, value), value == 7,
                !FileSeek(file, -8, SeekFrom::kCurrent), LastError() == kErrorNegativeSeek, FileTell(file, value),
                value == 7, FileSeek(file, std::int64_t{5} << 32, SeekFrom::kStart), FileTell(file, value),
                (std::int64_t{5} << 32) == value, FileSetSize(file, 4), FileSize(file, value), value == 4,
                FileFlush(file));
    FileClose(file);
}

TEST(File, TransfersGoOnAfterInterruptions) {
    ScratchDrive drive;
    drive.Put("a", "");
    FileHandle file = Open(drive.Name("a"));
    std::size_t actual = 0;
    char buffer[16];
    for (int error : {0, EINTR}) {  // 0: one byte at a time
        ASSERT_TRUE(FileSetSize(file, 0) && FileSeek(file, 0, SeekFrom::kStart));
        {
            FailingPlatform failing("write", 1, error, 5);
            EXPECT_EACH(FileWrite(file, "0123456789", 10, actual), failing.Calls() == 6);
        }
        EXPECT_EACH(actual == 10u, drive.Get("a") == "0123456789");
        ASSERT_TRUE(FileSeek(file, 2, SeekFrom::kStart));
        FailingPlatform failing("read", 1, error, 3);
        EXPECT_EACH(FileRead(file, buffer, sizeof buffer, actual), std::string(buffer, actual) == "23456789");
    }
    FileClose(file);
}

TEST(File, FailuresTellWhatWasDone) {
    ScratchDrive drive;
    drive.Put("a", "");
    FileHandle file = Open(drive.Name("a"));
    std::size_t actual = 0;
    {
        FailingPlatform failing("write", 1, ENOSPC);
        EXPECT_EACH(!FileWrite(file, "abc", 3, actual), LastError() == kErrorDiskFull, actual == 0u);
    }
    {
        FailingPlatform failing("fsync", 1, EIO);
        EXPECT_EACH(!FileFlush(file), LastError() == kErrorIODevice);
    }
    {
        FailingPlatform failing("close", 1, EINTR);
        EXPECT_TRUE(FileClose(file));
    }
    for (auto [error, number] : {std::pair{EACCES, kErrorAccessDenied},
                                 {EMFILE, kErrorTooManyOpenFiles},
                                 {ETXTBSY, kErrorSharingViolation},
                                 {EROFS, kErrorAccessDenied}}) {
        FailingPlatform failing("open", 1, error, 2);
        EXPECT_EACH(Open(drive.Name("a")) == kNoFile, number == LastError());
    }
}

// Rows of what a first opener has and denies, against a second one. The expectation is the rule itself: neither may
// have what the other denies.
TEST(File, ShareModesHoldWithinAndBetweenProcesses) {
    ScratchDrive drive;
    drive.Put("a", "content");
    std::string name = drive.Name("a");
    for (std::uint32_t access = 1; access <= 3; ++access) {
        for (std::uint32_t deny = 0; deny <= 3; ++deny) {
            FileHandle first = Open(name, access, deny);
            ASSERT_NE(kNoFile, first);
            for (std::uint32_t access2 = 1; access2 <= 3; ++access2) {
                for (std::uint32_t deny2 = 0; deny2 <= 3; ++deny2) {
                    bool expected = !(access2 & deny) && !(access & deny2);
                    auto attempt = [&] {
                        FileHandle second = Open(name, access2, deny2);
                        if (second == kNoFile) return static_cast<int>(LastError());
                        FileClose(second);
                        return 0;
                    };
                    SCOPED_TRACE(::testing::Message() << access << deny << access2 << deny2);
                    EXPECT_EACH((expected ? 0 : 32) == attempt(), (expected ? 0 : 32) == InAnotherProcess(attempt));
                }
            }
            FileClose(first);
        }
    }
    FileHandle after = Open(name, kRead | kWrite, kRead | kWrite);
    EXPECT_EACH(after != kNoFile, Open(name, kWrite, 0, Disposition::kCreateAlways) == kNoFile);
    FileClose(after);
    EXPECT_EQ("content", drive.Get("a"));  // the refused opening did not empty it
}

TEST(File, NeverDoTwoExclusiveOpenersWin) {
    ScratchDrive drive;
    drive.Put("a", "");
    std::string name = drive.Name("a");
    std::atomic<int> inside{0}, together{0}, wins{0};
    auto contend = [&] {
        for (int i = 0; i < 2000; ++i) {
            FileHandle file = Open(name, kRead | kWrite, kRead | kWrite);
            if (file == kNoFile) continue;
            if (++inside > 1) ++together;
            ++wins;
            --inside;
            FileClose(file);
        }
    };
    std::thread other(contend);
    contend();
    other.join();
    EXPECT_EACH(together == 0, wins > 0);
}

TEST(File, WithoutLocksNothingIsDenied) {
    ScratchDrive drive;
    drive.Put("a", "");
    FailingPlatform failing("lock", 1, ENOLCK, 1000);
    FileHandle first = Open(drive.Name("a"), kRead | kWrite, kRead | kWrite);
    FileHandle second = Open(drive.Name("a"), kRead | kWrite, kRead | kWrite);
    EXPECT_EACH(first != kNoFile, second != kNoFile);
    FileClose(first);
    FileClose(second);
}

TEST(File, RangeLocksAreExclusiveForReadersToo) {
    ScratchDrive drive;
    drive.Put("a", "0123456789");
    std::string name = drive.Name("a");
    for (std::uint32_t access : {kRead, kRead | kWrite}) {
        FileHandle holder = Open(name, access);
        EXPECT_TRUE(FileLock(holder, 2, 4));
        for (std::uint32_t access2 : {kRead, kRead | kWrite}) {
            auto attempt = [&](std::int64_t offset, std::int64_t count) {
                return InAnotherProcess([&] {
                    FileHandle file = Open(name, access2);
                    return FileLock(file, offset, count) ? 0 : static_cast<int>(LastError());
                });
            };
            EXPECT_EACH(attempt(5, 10) == 33, attempt(0, 3) == 33, attempt(6, 10) == 0, attempt(3, 0) == 0);
        }
        EXPECT_EACH(FileUnlock(holder, 2, 4), !FileUnlock(holder, 2, 4), LastError() == kErrorNotLocked,
                    FileLock(holder, 2, 4));
        FileClose(holder);
        EXPECT_EQ(0, InAnotherProcess([&] { return FileLock(Open(name), 0, 100) ? 0 : 1; }));
    }
}

TEST(File, TimesAreKept) {
    ScratchDrive drive;
    drive.Put("a", "");
    constexpr std::int64_t created = 125911584000000000, modified = 126227808001234567;  // 2000, 2001
    FileHandle file = Open(drive.Name("a"), kWrite);
    ASSERT_TRUE(FileSetTimes(file, created, 0, modified));
    ItemInfo byHandle, byName;
    ASSERT_TRUE(FileGetInfo(file, byHandle) && ItemGetInfo(drive.Name("a").c_str(), byName));
    FileClose(file);
    struct stat status;
    ASSERT_EQ(0, stat(drive.Native("a").c_str(), &status));
    EXPECT_EQ(978307200, status.st_mtime);  // 2001-01-01 00:00:00 UTC
    EXPECT_EQ(123456700, status.st_mtim.tv_nsec);
    EXPECT_EACH(modified == byHandle.modified, modified == byName.modified);
    EXPECT_EQ(byName.created, byHandle.created);  // what was set, where the file system keeps attributes
}

}  // namespace
}  // namespace tessel::platform
