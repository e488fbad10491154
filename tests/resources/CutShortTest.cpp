// A resource file that another program cuts short, or that cannot be read, while it is open.
#include "resources/ResourceTestSupport.h"
#include "support/FailingPlatform.h"

#include <cerrno>
#include <fstream>
#include <unistd.h>
#include <utility>

namespace tessel::test {
namespace {

class CutShort : public ResourceTest {
protected:
    MgErr TryGet(RsrcFile file, int32 id) {
        UHandle data = nullptr;
        const MgErr err = RGet(file, kData, id, &data);
        if (data) RRelease(data);
        return err;
    }
    void Make() {
        const RsrcFile file = CreateDisk("f");
        for (int32 id = 0; id < 4; ++id) Add(file, kData, id, std::string(20'000, 'x'));
        ASSERT_EQ(kNoErr, RCloseFile(file));
    }
};

// Every cut, of a file that was read already and of one that was not: the host lives, what is there is right, and what
// is not says the same each time. Nothing is mapped, which such a cut would turn into the end of the host.
TEST_F(CutShort, GivesTheSameErrorEachTime) {
    for (const long size : {80'000L, 70'000L, 60'050L, 60'046L, 60'044L, 40'000L, 4097L, 100L, 33L, 32L, 31L, 0L}) {
        for (const bool readBefore : {false, true}) {
            SCOPED_TRACE(testing::Message() << size << ' ' << readBefore);
            unlink(started.drive.Native("f").c_str());
            Make();
            const RsrcFile file = OpenDisk("f");
            EXPECT_EQ(kNoErr, readBefore ? TryGet(file, 3) : kNoErr);
            std::ifstream maps("/proc/self/maps");
            for (std::string line; std::getline(maps, line);)
                EXPECT_EQ(std::string::npos, line.find(started.drive.Native()));
            ASSERT_EQ(0, truncate(started.drive.Native("f").c_str(), size));
            for (int32 id = 0; id < 4; ++id) {
                const long word = 32 + id * 20'004L;
                const MgErr expected = size >= word + 20'004 ? kNoErr : size >= word + 4 ? kEOFErr : kNotResFileErr;
                for (int round = 0; round < 3; ++round) EXPECT_EQ(expected, TryGet(file, id)) << id << ' ' << round;
            }
            EXPECT_EQ(kNoErr, RCloseFile(file));
        }
    }
}

TEST_F(CutShort, AReadThatFailsSaysItsCause) {
    Make();
    for (const auto& [error, expected] : {std::pair{EIO, kIOErr}, {ENOMEM, kMemFullErr}, {EACCES, kPermissionErr}}) {
        const RsrcFile file = OpenDisk("f");
        for (int n = 1; n <= 2; ++n) {  // of the length, of the bytes
            const FailingPlatform failing("read", n, error);
            EXPECT_EQ(expected, TryGet(file, n)) << n;
            EXPECT_EQ(n, failing.Calls());
        }
        EXPECT_EQ(kNoErr, TryGet(file, 1));
        EXPECT_EQ(kNoErr, RCloseFile(file));
    }
}

}  // namespace
}  // namespace tessel::test
