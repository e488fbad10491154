#include "platform/Clock.h"
#include "platform/LastError.h"
#include "support/FailingPlatform.h"
#include "support/HandClock.h"
#include "support/StartedFiles.h"
#include <tessel/files/FileManager.h>
#include <tessel/paths/PathRef.h>

#include <cerrno>
#include <climits>
#include <cstring>
#include <string>
#include <sys/stat.h>

namespace tessel::test {
namespace {

class FileManagerTest : public testing::Test {
protected:
    File_t* Open(std::string_view name, int32 mode, int32 deny = kFDenyNone) {
        File_t* file = nullptr;
        EXPECT_EQ(kNoErr, FMOpen(&file, started.At(name), mode, deny));
        return file;
    }
    MgErr TryOpen(const PathRef& path, int32 mode, int32 deny) {
        PathRef copy(path);
        File_t* file = nullptr;
        const MgErr err = FMOpen(&file, &copy, mode, deny);
        EXPECT_EQ(err != kNoErr, file == nullptr);
        if (file) FMClose(file);
        return err;
    }
    uint32 Position(File_t* file) {
        uint32 position = 0;
        EXPECT_EQ(kNoErr, FMTell(file, &position));
        return position;
    }

    StartedFiles started;
};

TEST_F(FileManagerTest, ModesGrantTheirAccess) {
    for (int32 mode = 0; mode <= 7; ++mode) {
        SCOPED_TRACE(mode);
        started.drive.Put("f", "old");
        File_t* file = Open("f", mode);
        char bytes[3];
        const bool reads = mode % 4 < 2, writes = mode % 4 != 1;
        EXPECT_EQ(reads ? kNoErr : kPermissionErr, FMRead(file, 3, nullptr, bytes));
        EXPECT_EQ(kNoErr, FMWrite(file, 0, nullptr, nullptr));
        EXPECT_EQ(writes ? kNoErr : kPermissionErr, FMWrite(file, 1, nullptr, "x"));
        EXPECT_EQ(kNoErr, FMClose(file));
        const char* const left[] = {"oldx", "old", "xld", "x", "oldx", "old", "xld", "xld"};
        EXPECT_EQ(left[mode], started.drive.Get("f"));
    }
}

TEST_F(FileManagerTest, OpeningRefusesWhatItCannotOpen) {
    started.drive.Put("f", "");
    const PathRef file = started.On("f");
    EXPECT_EQ(kArgErr, TryOpen(file, 8, kFDenyNone));
    EXPECT_EQ(kArgErr, TryOpen(file, -1, kFDenyNone));
    EXPECT_EQ(kArgErr, TryOpen(file, kFOpenRead, 3));
    EXPECT_EQ(kArgErr, TryOpen(PathRef("f", PathRef::StringDisplay()), kFOpenRead, kFDenyNone));
    EXPECT_EQ(kArgErr, TryOpen(started.On("").Volume(), kFOpenRead, kFDenyNone));
    EXPECT_EQ(kArgErr, TryOpen(started.On("a?b"), kFOpenRead, kFDenyNone));
    EXPECT_EQ(kNotFoundErr, TryOpen(started.On("missing"), kFOpenRead, kFDenyNone));
    EXPECT_EQ(kArgErr, FMClose(nullptr));
    // Nor does it wait for the other end of a pipe.
    ASSERT_EQ(0, mkfifo(started.drive.Native("pipe").c_str(), 0600));
    for (const int32 mode : {kFOpenReadWrite, kFOpenRead})
        EXPECT_EQ(kPermissionErr, TryOpen(started.On("pipe"), mode, kFDenyNone));
}

TEST_F(FileManagerTest, AFileHeldByOthersIsTriedThreeTimes) {
    started.drive.Put("f", "");
    File_t* holder = Open("f", kFOpenRead, kFDenyReadWrite);
    HandClock clock(1000);
    const uint32 before = platform::TickMilliseconds();
    EXPECT_EQ(kFileInUseErr, TryOpen(started.On("f"), kFOpenRead, kFDenyNone));
    EXPECT_EQ(100u, platform::TickMilliseconds() - before);
    FMClose(holder);
    EXPECT_EQ(kNoErr, TryOpen(started.On("f"), kFOpenRead, kFDenyReadWrite));
}

TEST_F(FileManagerTest, TransfersTellHowFarTheyCame) {
    started.drive.Put("f", std::string(90, 'a') + "0123456789");
    File_t* file = Open("f", kFOpenReadWrite);
    ASSERT_EQ(kNoErr, FMSeek(file, 90, kFSeekStart));
    char bytes[100] = {};
    uint32 actual = 77;
    EXPECT_EQ(kEOFErr, FMRead(file, 100, &actual, bytes));
    EXPECT_EQ("0123456789", std::string(bytes, actual));
    EXPECT_EQ(kNoErr, FMWriteEOL(file));
    {
        const FailingPlatform full("write", 1, ENOSPC);
        EXPECT_EQ(kDiskFullErr, FMWrite(file, 5, &actual, "12345"));
        EXPECT_EQ(0u, actual);
    }
    EXPECT_EQ(kArgErr, FMRead(file, 1, &actual, nullptr));
    EXPECT_EQ(kArgErr, FMRead(nullptr, 1, &actual, bytes));
    EXPECT_EQ(kNoErr, FFlush(file));
    FMClose(file);
    EXPECT_EQ(std::string(90, 'a') + "0123456789\r\n", started.drive.Get("f"));
}

TEST_F(FileManagerTest, SeekingStaysInTheFile) {
    started.drive.Put("f", "0123456789");
    File_t* file = Open("f", kFOpenRead);
    const struct {
        int64 offset;
        int32 mode;
        MgErr err;
        uint32 position;
    } kSteps[] = {
        {4, kFSeekStart, kNoErr, 4},     {3, kFSeekCurrent, kNoErr, 7},          {0, kFSeekCurrent, kNoErr, 7},
        {-8, kFSeekCurrent, kEOFErr, 0}, {-1, kFSeekStart, kEOFErr, 0},          {1, kFSeekEnd, kEOFErr, 10},
        {-3, kFSeekEnd, kNoErr, 7},      {INT64_MAX, kFSeekEnd, kEOFErr, 10},    {10, kFSeekStart, kNoErr, 10},
        {11, kFSeekStart, kEOFErr, 10},  {INT64_MIN, kFSeekCurrent, kEOFErr, 0},
    };
    for (const auto& step : kSteps) {
        SCOPED_TRACE(testing::Message() << step.offset << " mode " << step.mode);
        EXPECT_EQ(step.err, FMSeek64(file, step.offset, step.mode));
        EXPECT_EQ(step.position, Position(file));
    }
    const ReportRecorder reports;
    EXPECT_EQ(kNoErr, FMSeek(file, 2, 9));
    EXPECT_EQ(std::vector<std::string>{"FMSeek: Unknown mode (9)"}, reports.Texts());
    EXPECT_EQ(2u, Position(file));
    FMClose(file);
}

TEST_F(FileManagerTest, SizesAndPositionsBeyond32Bits) {
    started.drive.Put("f", "0123456789");
    File_t* file = Open("f", kFOpenReadWrite);
    constexpr int64 kSize = 0x140000000;
    EXPECT_EQ(kNoErr, FSetEOF64(file, kSize));
    EXPECT_EQ(0u, Position(file));
    uint64 size64 = 0;
    uint32 size = 0;
    EXPECT_EQ(kNoErr, FGetEOF64(file, &size64));
    EXPECT_EQ(kNoErr, FGetEOF(file, &size));
    EXPECT_EQ(static_cast<uint64>(kSize), size64);
    EXPECT_EQ(0x40000000u, size);
    int64 position = 0;
    EXPECT_EQ(kNoErr, FMSeek64(file, -1, kFSeekEnd));
    EXPECT_EQ(kNoErr, FMTell64(file, &position));
    EXPECT_EQ(kSize - 1, position);
    EXPECT_EQ(kNoErr, FSetEOF(file, 4));
    EXPECT_EQ(4u, Position(file));
    EXPECT_EQ(kArgErr, FSetEOF(file, -1));
    FMClose(file);
    EXPECT_EQ("0123", started.drive.Get("f"));
}

TEST_F(FileManagerTest, RangesAreLockedFromTheirBase) {
    started.drive.Put("f", "0123456789");
    File_t* one = Open("f", kFOpenReadWrite);
    File_t* two = Open("f", kFOpenReadWrite);
    ASSERT_EQ(kNoErr, FMSeek(one, 6, kFSeekStart));
    EXPECT_EQ(kNoErr, FLockOrUnlockRange(one, kFSeekCurrent, -1, 2, 1));
    EXPECT_EQ(kNoErr, FLockOrUnlockRange(two, kFSeekStart, 4, 1, 1));
    EXPECT_EQ(kPermissionErr, FLockOrUnlockRange(two, kFSeekEnd, -4, 1, 1));
    EXPECT_EQ(kNoErr, FLockOrUnlockRange(one, kFSeekStart, 5, 2, 0));
    EXPECT_EQ(kNoErr, FLockOrUnlockRange(two, kFSeekEnd, -4, 1, 1));
    EXPECT_EQ(kArgErr, FLockOrUnlockRange(one, kFSeekStart, 4, 1, 0));  // the other's
    EXPECT_EQ(kArgErr, FLockOrUnlockRange(one, 0, 0, 1, 1));
    EXPECT_EQ(kArgErr, FLockOrUnlockRange(one, kFSeekStart, 100, 1, 0));
    FMClose(one);
    FMClose(two);
}

char growing[10] = "x";

TEST_F(FileManagerTest, PrintsInTheLibrarysFormat) {
    started.drive.Put("f", "");
    File_t* file = Open("f", kFOpenReadWrite);
    EXPECT_EQ(6, FPrintf(file, "%05d;", 42));
    EXPECT_EQ(kNoErr, FPrintfWErr(file, "%s", "text"));
    EXPECT_EQ(0, FPrintf(file, ""));
    {
        const ReportRecorder reports;
        EXPECT_EQ(kFormatErr, FPrintfWErr(file, "lost %y"));
        EXPECT_EQ(kFormatErr, FPrintfWErr(file, "%2$d", 1, 2));
        EXPECT_EQ(5, FPrintf(file, "kept %y"));
        // A text that grows between the measuring and the writing of a long one is not cut.
        const auto grow = [](CStr, int32, CStr, int32, uint32, CStr) { std::strcat(growing, "x"); };
        const auto before = DebugOutputSetHandler(grow);
        EXPECT_EQ(-1, FPrintf(file, "%600d%s%y", 1, growing));
        DebugOutputSetHandler(before);
    }
    FMClose(file);
    EXPECT_EQ("00042;textkept ", started.drive.Get("f"));

    file = Open("f", kFOpenRead);
    EXPECT_EQ(-1, FPrintf(file, "x"));
    EXPECT_EQ(kPermissionErr, FPrintfWErr(file, "x"));
    EXPECT_EQ(kArgErr, FPrintfWErr(nullptr, "x"));
    FMClose(file);
}

TEST(Win32ToOVFileErr, MapsTheSystemsErrors) {
    const struct {
        platform::ErrorNumber number;
        MgErr err;
    } kTable[] = {{2, 7},   {3, 7},   {21, 7},   {53, 7}, {267, 7}, {5, 8},   {33, 8}, {8, 2}, {32, 5},  {39, 9},
                  {112, 9}, {80, 10}, {183, 10}, {87, 1}, {123, 1}, {158, 1}, {0, 6},  {4, 6}, {1117, 6}};
    for (const auto& row : kTable) {
        platform::SetLastError(row.number);
        EXPECT_EQ(row.err, Win32ToOVFileErr()) << row.number;
    }
    EXPECT_STREQ("the device failed", FErrorText(kIOErr));  // the last of them
    EXPECT_STREQ(MgErrMeaning(kNotFoundErr), FErrorText(kNotFoundErr));
}

}  // namespace
}  // namespace tessel::test
