// Updates: what they write, and what is left when they fail or are killed.
#include "platform/posix/SystemCalls.h"
#include "resources/ResourceTestSupport.h"
#include "support/FailingPlatform.h"
#include <tessel/resources/RFReadWrite.h>

#include <cerrno>
#include <gmock/gmock.h>
#include <map>
#include <sys/wait.h>
#include <unistd.h>

namespace tessel::test {
namespace {

class UpdateTest : public ResourceTest {
protected:
    using Model = std::map<int32, std::string>;

    // A file with the resources of `model`, and one more in front of them that is gone from the map: a hole.
    RsrcFile FileWithHole(const Model& model) {
        const RsrcFile made = CreateDisk("f");
        EXPECT_EQ(kNoErr, Add(made, kData, 0, std::string(500, 'h')));
        for (const auto& [id, bytes] : model) EXPECT_EQ(kNoErr, Add(made, kData, id, bytes));
        EXPECT_EQ(kNoErr, RCloseFile(made));
        const RsrcFile file = OpenDisk("f");
        Remove(file, kData, 0);
        return file;
    }
    Model ContentsOf(RsrcFile file) {
        Model contents;
        UHandle data = nullptr;
        for (int32 i = 1, id = 0; RGetInd(file, kData, i, &data) == kNoErr; ++i) {
            EXPECT_EQ(kNoErr, RGetInfo(data, &id, nullptr, nullptr));
            contents[id] = BytesOf(data);
        }
        return contents;
    }

    const Model model_ = {
        {1, std::string(3000, 'a')}, {2, std::string(700, 'b')}, {3, ""}, {4, std::string(5000, 'd')}, {5, "e"}};
};

TEST_F(UpdateTest, WritesEntriesUpTo4096BytesAtOnceAndMovesOnlyWhatMustMove) {
    const RsrcFile file = CreateDisk("f");
    const struct {
        uint32 size;
        int writes;
    } kTable[] = {{0, 1}, {4088, 1}, {4092, 1}, {4093, 3}, {4096, 2}};
    for (const auto& row : kTable) {
        SCOPED_TRACE(row.size);
        ASSERT_EQ(kNoErr, Add(file, kData, static_cast<int32>(row.size), std::string(row.size, 'x')));
        const FailingPlatform counting("write", 1000000, EIO);
        ASSERT_EQ(kNoErr, RUpdateFile(file));
        // The entry, the map and the header: what was packed before stays where it is.
        EXPECT_EQ(row.writes + 2, counting.Calls());
    }
}

TEST_F(UpdateTest, AFullDiskLosesNothingThatCanBeWrittenLater) {
    for (int n = 1; n <= 12; ++n) {
        SCOPED_TRACE(n);
        const RsrcFile file = FileWithHole(model_);
        ASSERT_EQ(kNoErr, Add(file, kData, 9, "new"));
        bool failed = false;
        {
            const FailingPlatform full("write", n, ENOSPC);
            const MgErr err = RUpdateFile(file);
            failed = full.Calls() >= n;
            EXPECT_EQ(failed ? kDiskFullErr : kNoErr, err);
        }
        uint32 attrs = 0;
        EXPECT_EQ(kNoErr, RGetFileAttrs(file, &attrs));
        EXPECT_EQ(failed ? uint32{kRFileChanged} : 0, attrs);
        Model expected = model_;
        expected[9] = "new";
        EXPECT_EQ(expected, ContentsOf(file));
        EXPECT_EQ(kNoErr, RUpdateFile(file));
        EXPECT_EQ(expected, ContentsOf(file));
        EXPECT_EQ(kNoErr, RCloseFile(file));
        const RsrcFile again = OpenDisk("f", kROpenReadOnly);
        EXPECT_EQ(expected, ContentsOf(again));
        EXPECT_EQ(kNoErr, RCloseFile(again));
    }
}

TEST_F(UpdateTest, AnUpdateThatFailsKeepsTheFileOpenUnlessForced) {
    RsrcFile file = FileWithHole(model_);
    const std::string before = started.drive.Get("f");
    {
        const FailingPlatform full("write", 1, ENOSPC, 1000);
        EXPECT_EQ(kDiskFullErr, RCloseFile(file));
        EXPECT_EQ(model_, ContentsOf(file));
        EXPECT_EQ(kDiskFullErr, RCloseFileForce(file));
    }
    EXPECT_EQ(kNotResFileErr, RUpdateFile(file));
    EXPECT_EQ(before, started.drive.Get("f"));

    // Without room for the whole update nothing of it is begun, and who loses changes hears of it.
    const ReportRecorder reports;
    {
        const FailingPlatform full("fallocate", 1, ENOSPC, 1000);
        RFReadWrite writer;
        ASSERT_EQ(kNoErr, writer.OpenPath(started.At("f"), kROpenReadWrite, nullptr, nullptr));
        ASSERT_EQ(kNoErr, writer.AddFromPtr(before.data(), 9000, kData, 9, nullptr));
        EXPECT_EQ(kDiskFullErr, writer.UpdateFile());
    }
    EXPECT_TRUE(reports.Has(kDebugError, "A resource file goes with changes that are not written!"));
    EXPECT_EQ(before, started.drive.Get("f"));
    file = OpenDisk("f");
    const auto size = started.drive.Get("f").size();
    {
        const FailingPlatform full("write", 2, ENOSPC);
        EXPECT_EQ(kDiskFullErr, RPreAllocFile(file, 30000));
        EXPECT_EQ(size, started.drive.Get("f").size());
    }
    EXPECT_EQ(kNoErr, RPreAllocFile(file, 30000));
    EXPECT_EQ(size + 30000, started.drive.Get("f").size());
}

// In a child: its n-th write goes half through, and then it is gone.
int gWritesLeft;
ssize_t WriteHalfAndDie(int file, const void* data, size_t count) {
    if (--gWritesLeft > 0) return write(file, data, count);
    static_cast<void>(!write(file, data, count / 2));
    _exit(0);
}

TEST_F(UpdateTest, KilledInMidWriteTheFileOpensOrIsRefused) {
    for (int n = 1; n <= 9; ++n) {
        SCOPED_TRACE(n);
        const pid_t child = fork();
        if (child == 0) {
            const RsrcFile file = FileWithHole(model_);
            gWritesLeft = n;
            platform::systemCalls.write = WriteHalfAndDie;
            RUpdateFile(file);
            _exit(1);
        }
        int status = 0;
        ASSERT_EQ(child, waitpid(child, &status, 0));
        ASSERT_TRUE(WIFEXITED(status));
        const bool killed = WEXITSTATUS(status) == 0;

        RsrcFile file = 0;
        const MgErr err = ROpenFile(started.At("f"), kROpenReadOnly, &file, nullptr, nullptr);
        if (!killed) {
            EXPECT_EQ(model_, ContentsOf(file));
        }
        EXPECT_THAT(err, testing::AnyOf(kNoErr, kEOFErr, kIOErr, kNotResFileErr));
        for (int32 id = 0; id <= 5 && !err; ++id) Get(file, kData, id);
        if (!err) RCloseFile(file);
        EXPECT_EQ(n > 8, !killed);
    }
}

}  // namespace
}  // namespace tessel::test
