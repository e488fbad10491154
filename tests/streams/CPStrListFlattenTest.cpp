#include "support/StartedPaths.h"
#include "support/Test.h"
#include <tessel/streams/BinDataReader.h>
#include <tessel/streams/BinDataWriter.h>
#include <tessel/strings/CPStrList.h>
#include <tessel/strings/StringPStr.h>

namespace tessel::test {
namespace {

class CPStrListFlatten : public testing::Test {
protected:
    static std::string Flattened(const CPStrList& list, const Endianizer* order) {
        uint8 room[64];
        StaticOutputBuf buffer(room, sizeof room);
        BinDataWriter writer(&buffer, order);
        EXPECT_EQ(kNoErr, list.Flatten(writer));
        return {reinterpret_cast<const char*>(room), buffer.GetBytesWritten()};
    }
    static MgErr UnFlatten(CPStrList& list, const std::string& bytes, const Endianizer* order) {
        MemInputBuf buffer(bytes.data(), static_cast<uint32>(bytes.size()));
        BinDataReader reader(&buffer, order);
        return list.UnFlatten(reader);
    }

    test::StartedPaths started_;
};

using std::string_literals::operator""s;

TEST_F(CPStrListFlatten, BytesOfBothOrders) {
    CPStrList list;
    EXPECT_EQ("\0\0\0\0"s, Flattened(list, BigEndianizer()));
    for (const char* text : {"\2ab", "\0", "\1c"})
        EXPECT_EQ(kNoErr, list.Insert(reinterpret_cast<ConstPStr>(text), -1));
    EXPECT_EACH(Flattened(list, BigEndianizer()) == "\0\0\0\3\2ab\0\1c"s,
                Flattened(list, LittleEndianizer()) == "\3\0\0\0\2ab\0\1c"s);

    CPStrList read;
    EXPECT_EACH(read.Insert(reinterpret_cast<ConstPStr>("\3old"), 0) == kNoErr,
                UnFlatten(read, "\0\0\0\3\2ab\0\1c"s, BigEndianizer()) == kNoErr, read.Equal(list),
                UnFlatten(read, "\0\0\0\0"s, BigEndianizer()) == kNoErr, read.Count() == 0);
}

TEST_F(CPStrListFlatten, StopsAtTheFirstError) {
    CPStrList list;
    EXPECT_EACH(UnFlatten(list, "\0\0"s, BigEndianizer()) == kCorruptErr, list.Count() == 0,
                UnFlatten(list, "\x7F\0\0\2\2ab\5c"s, BigEndianizer()) == kCorruptErr, list.Count() == 1,
                PStrEqual(list[0], reinterpret_cast<ConstPStr>("\2ab")));
    EXPECT_EQ(kNoErr, UnFlatten(list, "\xFF\xFF\xFF\xFF"s, BigEndianizer()));  // a count below 0
    EXPECT_EQ(0, list.Count());
}

}  // namespace
}  // namespace tessel::test
