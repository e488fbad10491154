// Updates: what they write, and what is left when they fail or are killed.
#include "resources/ResourceTestSupport.h"
#include "support/FailingPlatform.h"
#include <tessel/resources/RFReadWrite.h>

#include <cerrno>
#include <filesystem>
#include <map>
#include <sys/stat.h>
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

// Each way of updating leaves the same bytes: a new file, in place because of a second name, and in memory.
TEST_F(UpdateTest, TheLayoutIsTheSameWhicheverWayItIsWritten) {
    std::string images[3];
    for (int way = 0; way < 3; ++way) {
        RsrcFile file = FileWithHole(model_);
        if (way == 1) std::filesystem::create_hard_link(started.drive.Native("f"), started.drive.Native("g"));
        if (way == 2) {
            EXPECT_EQ(kNoErr, RSetFileAttrs(file, 0));
            EXPECT_EQ(kNoErr, RCloseFile(file));
            file = Open(started.drive.Get("f"));
            Remove(file, kData, 0);
        }
        ASSERT_EQ(kNoErr, Add(file, kData, 9, std::string(70000, 'n'), "name"));
        ASSERT_EQ(kNoErr, RUpdateFile(file));
        UHandle image = nullptr;
        EXPECT_EQ(kNoErr, way == 2 ? RGetMemFileHandle(file, &image) : kNoErr);
        images[way] = way == 2 ? BytesOf(image) : started.drive.Get("f");
        EXPECT_EQ(kNoErr, RCloseFile(file));
        EXPECT_EQ(kNoErr, image ? DSDisposeHandle(image) : kNoErr);
        std::filesystem::remove(started.drive.Native("g"));
    }
    EXPECT_EQ(images[0], images[1]);
    EXPECT_EQ(images[0], images[2]);
    // Header, five entries and the new one as long as they are, and the map of six references and one name.
    EXPECT_EQ(32u + 3004 + 704 + 4 + 5004 + 8 + 70004 + (52 + 4 + 12 + 6 * 20 + 5), images[0].size());
}

// With less and less room a removal still works: in place, without moving anything, and on the spot.
TEST_F(UpdateTest, AFullDiskDoesNotKeepResourcesFromBeingRemoved) {
    for (const int failures : {1, 2, 3, 1000}) {
        SCOPED_TRACE(failures);
        const RsrcFile file = FileWithHole(model_);
        {
            const FailingPlatform full("fallocate", 1, ENOSPC, failures);
            EXPECT_EQ(kNoErr, RUpdateFile(file));
        }
        EXPECT_EQ(model_, ContentsOf(file));
        EXPECT_EQ(kNoErr, RCloseFile(file));
        const RsrcFile again = OpenDisk("f");
        EXPECT_EQ(model_, ContentsOf(again));
        // What was left unpacked the next update packs.
        Remove(again, kData, 5);
        EXPECT_EQ(kNoErr, RCloseFile(again));
        EXPECT_EQ(32u + 3004 + 704 + 4 + 5004 + (52 + 4 + 12 + 4 * 20), started.drive.Get("f").size());
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

// The file stays what it is to others: mode, the link that leads to it, whom it is denied to. One whose name leads
// elsewhere is not written behind everybody's back.
TEST_F(UpdateTest, TheNewFileStandsInForTheOldOne) {
    ASSERT_EQ(kNoErr, RCloseFile(FileWithHole(model_)));
    const std::string native = started.drive.Native("f");
    ASSERT_EQ(0, chmod(native.c_str(), 0604));
    std::filesystem::create_symlink("f", started.drive.Native("link"));
    const RsrcFile file = OpenDisk("link");
    RsrcFile second = 0;
    for (int32 id = 10; id < 12; ++id) {
        ASSERT_EQ(kNoErr, Add(file, kData, id, "more"));
        ASSERT_EQ(kNoErr, RUpdateFile(file));
        EXPECT_EQ(kFileInUseErr, ROpenFile(started.At("f"), kROpenReadWrite, &second, nullptr, nullptr));
    }
    struct stat status {};
    EXPECT_EQ(0, stat(native.c_str(), &status));
    EXPECT_EQ(0604u, status.st_mode & 07777u);
    EXPECT_TRUE(std::filesystem::is_symlink(started.drive.Native("link")));
    std::filesystem::rename(native, started.drive.Native("away"));
    started.drive.Put("f", "another's");
    ASSERT_EQ(kNoErr, Add(file, kData, 12, "lost?"));
    EXPECT_EQ(kNotFoundErr, RUpdateFile(file));
    EXPECT_EQ("another's", started.drive.Get("f"));
    std::filesystem::rename(started.drive.Native("away"), native);
    EXPECT_EQ(kNoErr, RCloseFile(file));
    const RsrcFile again = OpenDisk("f", kROpenReadOnly);
    EXPECT_EQ("lost?", Get(again, kData, 12));
    EXPECT_EQ(kNoErr, RCloseFile(again));
}

}  // namespace
}  // namespace tessel::test
