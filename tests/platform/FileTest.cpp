#include "platform/File.h"
#include "platform/FileSystem.h"
#include "platform/LastError.h"
#include "support/FailingPlatform.h"
#include "support/ScratchDrive.h"

#include <atomic>
#include <cerrno>
#include <gtest/gtest.h>
#include <string>
#include <sys/stat.h>
#include <sys/wait.h>
#include <thread>
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
    EXPECT_EQ(kNoFile, Open(name));
    EXPECT_EQ(kErrorFileNotFound, LastError());
    EXPECT_EQ(kNoFile, Open(drive.Name("none/a.txt"), kWrite, 0, Disposition::kCreateAlways));
    EXPECT_EQ(kErrorPathNotFound, LastError());

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
    EXPECT_EQ(kNoFile, Open(name, kRead, 0, Disposition::kTruncateExisting));
    EXPECT_EQ(kErrorInvalidParameter, LastError());
    ASSERT_TRUE(FolderCreate(drive.Name("folder").c_str()));
    for (std::uint32_t access : {kRead, kWrite, kRead | kWrite}) {
        EXPECT_EQ(kNoFile, Open(drive.Name("folder"), access));
        EXPECT_EQ(kErrorAccessDenied, LastError());
    }
}

TEST(File, AccessIsThatOfTheHandle) {
    ScratchDrive drive;
    drive.Put("a", "abc");
    char buffer[4];
    std::size_t actual = 99;
    FileHandle reader = Open(drive.Name("a"), kRead);
    EXPECT_FALSE(FileWrite(reader, "x", 1, actual));
    EXPECT_EQ(kErrorAccessDenied, LastError());
    EXPECT_EQ(0u, actual);
    EXPECT_FALSE(FileSetSize(reader, 0));
    FileHandle writer = Open(drive.Name("a"), kWrite);
    SetLastError(0);
    EXPECT_FALSE(FileRead(writer, buffer, 3, actual));
    EXPECT_EQ(kErrorAccessDenied, LastError());
    EXPECT_TRUE(FileRead(reader, buffer, 4, actual));
    EXPECT_EQ("abc", std::string(buffer, actual));
    FileClose(reader);
    FileClose(writer);
}

TEST(File, PositionAndSize) {
    ScratchDrive drive;
    drive.Put("a", "0123456789");
    FileHandle file = Open(drive.Name("a"));
    std::int64_t value = 0;
    EXPECT_TRUE(FileSeek(file, -3, SeekFrom::kEnd));
    EXPECT_TRUE(FileTell(file, value));
    EXPECT_EQ(7, value);
    EXPECT_FALSE(FileSeek(file, -8, SeekFrom::kCurrent));
    EXPECT_EQ(kErrorNegativeSeek, LastError());
    EXPECT_TRUE(FileTell(file, value));
    EXPECT_EQ(7, value);
    EXPECT_TRUE(FileSeek(file, std::int64_t{5} << 32, SeekFrom::kStart));
    EXPECT_TRUE(FileTell(file, value));
    EXPECT_EQ(std::int64_t{5} << 32, value);
    EXPECT_TRUE(FileSetSize(file, 4));
    EXPECT_TRUE(FileSize(file, value));
    EXPECT_EQ(4, value);
    EXPECT_TRUE(FileFlush(file));
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
            EXPECT_TRUE(FileWrite(file, "0123456789", 10, actual));
            EXPECT_EQ(6, failing.Calls());
        }
        EXPECT_EQ(10u, actual);
        EXPECT_EQ("0123456789", drive.Get("a"));
        ASSERT_TRUE(FileSeek(file, 2, SeekFrom::kStart));
        FailingPlatform failing("read", 1, error, 3);
        EXPECT_TRUE(FileRead(file, buffer, sizeof buffer, actual));
        EXPECT_EQ("23456789", std::string(buffer, actual));
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
        EXPECT_FALSE(FileWrite(file, "abc", 3, actual));
        EXPECT_EQ(kErrorDiskFull, LastError());
        EXPECT_EQ(0u, actual);
    }
    {
        FailingPlatform failing("fsync", 1, EIO);
        EXPECT_FALSE(FileFlush(file));
        EXPECT_EQ(kErrorIODevice, LastError());
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
        EXPECT_EQ(kNoFile, Open(drive.Name("a")));
        EXPECT_EQ(number, LastError());
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
                    EXPECT_EQ(expected ? 0 : 32, attempt());
                    EXPECT_EQ(expected ? 0 : 32, InAnotherProcess(attempt));
                }
            }
            FileClose(first);
        }
    }
    FileHandle after = Open(name, kRead | kWrite, kRead | kWrite);
    EXPECT_NE(kNoFile, after);
    EXPECT_EQ(kNoFile, Open(name, kWrite, 0, Disposition::kCreateAlways));
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
    EXPECT_EQ(0, together);
    EXPECT_GT(wins, 0);
}

TEST(File, WithoutLocksNothingIsDenied) {
    ScratchDrive drive;
    drive.Put("a", "");
    FailingPlatform failing("lock", 1, ENOLCK, 1000);
    FileHandle first = Open(drive.Name("a"), kRead | kWrite, kRead | kWrite);
    FileHandle second = Open(drive.Name("a"), kRead | kWrite, kRead | kWrite);
    EXPECT_NE(kNoFile, first);
    EXPECT_NE(kNoFile, second);
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
            EXPECT_EQ(33, attempt(5, 10));
            EXPECT_EQ(33, attempt(0, 3));
            EXPECT_EQ(0, attempt(6, 10));
            EXPECT_EQ(0, attempt(3, 0));
        }
        EXPECT_TRUE(FileUnlock(holder, 2, 4));
        EXPECT_FALSE(FileUnlock(holder, 2, 4));
        EXPECT_EQ(kErrorNotLocked, LastError());
        EXPECT_TRUE(FileLock(holder, 2, 4));
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
    EXPECT_EQ(modified, byHandle.modified);
    EXPECT_EQ(modified, byName.modified);
    EXPECT_EQ(byName.created, byHandle.created);  // what was set, where the file system keeps attributes
}

}  // namespace
}  // namespace tessel::platform
