#include "support/StartedPaths.h"
#include "support/Test.h"
#include <tessel/memory/MemoryManager.h>
#include <tessel/streams/BinDataReader.h>
#include <tessel/streams/BinDataWriter.h>

namespace tessel::test {
namespace {

using std::string_literals::operator""s;
using Writing = std::function<uint32(BinDataWriter&)>;
using Reading = std::function<bool(BinDataReader&)>;

class BinData : public ::testing::Test {
protected:
    // The bytes of what is written; that the sizes agree, also where nothing is stored, is checked.
    static std::string Written(const Endianizer* order, const Writing& write) {
        char block[400];
        std::memset(block, 0x55, sizeof block);
        StaticOutputBuf buffer(block, sizeof block);
        BinDataWriter writer(&buffer, order);
        const uint32 size = write(writer);
        EXPECT_EQ(size, buffer.GetBytesWritten());
        PreflightOutputBuf counter;
        BinDataWriter counting(&counter, order);
        EXPECT_EACH(size == write(counting), size == counter.GetBytesWritten());
        return std::string(block, size);
    }
    // Whether all of the bytes, and no more, are read as what is expected.
    static bool Read(const Endianizer* order, const std::string& bytes, const Reading& read) {
        MemInputBuf buffer(bytes.data(), static_cast<uint32>(bytes.size()));
        BinDataReader reader(&buffer, order);
        return read(reader) && reader.GetError() == kNoErr && buffer.GetBytesRead() == bytes.size();
    }

    test::StartedPaths started_;
    test::ReportRecorder reports_;
};

TEST_F(BinData, ValuesInTheOrderOfTheStream) {
    using W = BinDataWriter;
    using R = BinDataReader;
    floatExt pi = {};
    pi.signExponent = 0x4000;
    pi.mantissa = 0xC90FDAA22168C235u;
    const auto readsPi = [&](R& r) {
        const floatExt read = r.ReadFX();
        return std::memcmp(&pi, &read, sizeof pi) == 0;
    };
    std::string text;
    char two[2];
    const struct {
        Writing write;
        Reading read;
        std::string big, little;
    } rows[] = {
        {[](W& w) { return w.WriteI8(-2); }, [](R& r) { return r.ReadI8() == -2; }, "\xFE", "\xFE"},
        {[](W& w) { return w.WriteU16(0x0102); }, [](R& r) { return r.ReadU16() == 0x0102; }, "\1\2", "\2\1"},
        {[](W& w) { return w.WriteI32(0x01020304); }, [](R& r) { return r.ReadI32() == 0x01020304; },  //
         "\1\2\3\4", "\4\3\2\1"},
        {[](W& w) { return w.Write4Char(0x01020304); }, [](R& r) { return r.Read4Char() == 0x01020304; },  //
         "\4\3\2\1", "\4\3\2\1"},
        {[](W& w) { return w.WriteU64(0x8000000000000001u); }, [](R& r) { return r.ReadI64() == INT64_MIN + 1; },
         "\x80\0\0\0\0\0\0\1"s, "\1\0\0\0\0\0\0\x80"s},
        {[](W& w) { return w.WriteF32(-1.5f); }, [](R& r) { return r.ReadF32() == -1.5f; },  //
         "\xBF\xC0\0\0"s, "\0\0\xC0\xBF"s},
        {[](W& w) { return w.WriteF64(1.0); }, [](R& r) { return r.ReadF64() == 1.0; },  //
         "\x3F\xF0\0\0\0\0\0\0"s, "\0\0\0\0\0\0\xF0\x3F"s},
        {[&](W& w) { return w.WriteFX(pi); }, readsPi,  //
         "\x40\0\x92\x1F\xB5\x44\x42\xD1\x84\x6A\0\0\0\0\0\0"s, "\0\0\0\0\0\0\x6A\x84\xD1\x42\x44\xB5\x1F\x92\0\x40"s},
        {[](W& w) { return w.WriteBool(1); }, [](R& r) { return r.ReadU8() == 1; }, "\1", "\1"},
        {[](W& w) { return w.WriteLStrFromNarrow("ab"); }, [&](R& r) { return r.ReadLStrAsNarrow(text), text == "ab"; },
         "\0\0\0\2ab"s, "\2\0\0\0ab"s},
        {[](W& w) { return w.WriteLStr(nullptr); }, [](R& r) { return r.ReadLStr() == nullptr; }, "\0\0\0\0"s,
         "\0\0\0\0"s},
        {[](W& w) { return w.WritePStrFromNarrow("ab", 4); },
         [&](R& r) { return r.ReadPStrAsNarrow(text, 4), text == "ab"; }, "\2ab\0"s, "\2ab\0"s},
        {[](W& w) { return w.WriteBytes("12345", 5); },
         [&](R& r) { return r.ReadBytes(nullptr, 2), r.Skip(1), r.ReadBytes(two, 2), std::string(two, 2) == "45"; },
         "12345", "12345"},
        {[](W& w) { return w.WriteU8(7) + w.Align(4) + w.Align(4); },
         [](R& r) { return r.ReadU8() == 7 && (r.Align(4), true); }, "\7\0\0\0"s, "\7\0\0\0"s}};
    for (const auto& row : rows) {
        for (const auto& [order, bytes] : {std::pair{BigEndianizer(), row.big}, {LittleEndianizer(), row.little}}) {
            EXPECT_EQ(bytes, Written(order, row.write));
            EXPECT_TRUE(Read(order, bytes, row.read)) << testing::PrintToString(bytes);
        }
    }
    const std::string native = Written(NativeEndianizer(), [&](W& w) { return w.WriteFX(pi); });
    EXPECT_EACH(native.size() == 10u, Read(NativeEndianizer(), native, readsPi));
}

TEST_F(BinData, PStrsArePadded) {
    const struct {
        const char* text;
        uint32 align;
        std::string bytes;
    } rows[] = {{"\3abc", 1, "\3abc"},      {"\3abc", 2, "\3abc"},  {"\3abc", 4, "\3abc"}, {"\3abc", 0, "\3abc"},
                {"\3abc", 3, "\3abc\0\0"s}, {"\0", 4, "\0\0\0\0"s}, {nullptr, 4, ""}};
    for (const auto& row : rows) {
        const auto text = reinterpret_cast<ConstPStr>(row.text);
        EXPECT_EQ(row.bytes, Written(BigEndianizer(), [&](auto& w) { return w.WritePStr(text, row.align); }));
    }
    EXPECT_EQ("\xFF" + std::string(255, 'z'),
              Written(BigEndianizer(), [](auto& w) { return w.WritePStrFromNarrow(std::string(300, 'z'), 4); }));
}

TEST_F(BinData, TheFirstErrorStays) {
    MemInputBuf in("\x01\x02\x03", 3);
    BinDataReader reader(&in, BigEndianizer());
    EXPECT_EACH(reader.ReadI32() == 0, reader.GetError() == kCorruptErr, reader.ReadU8() == 0);
    char bytes[3] = {9, 9, 9};
    reader.ReadBytes(bytes, 2);
    EXPECT_EQ("\0\0\x9"s, std::string(bytes, 3));
    reader.SetError(kArgErr);
    EXPECT_EQ(kCorruptErr, reader.GetError());
    // An error that the buffer met elsewhere is the reader's too.
    MemInputBuf shared("a", 1);
    BinDataReader learns(&shared, BigEndianizer());
    MgErr err;
    shared.GetDataPointer(2, err);
    EXPECT_EQ(kCorruptErr, learns.GetError());
    {
        StaticOutputBuf out(bytes, 1);
        BinDataWriter writer(&out, BigEndianizer());
        EXPECT_EACH(writer.WriteI8(1) == 1u, writer.Align(4) == 0u, writer.GetError() == kCorruptErr,
                    writer.WriteI16(1) == 0u, writer.Align(4) == 0u);
        PreflightOutputBuf other;
        EXPECT_EACH(&out == writer.SetBuffer(&other), writer.WriteI8(1) == 0u, writer.GetError() == kCorruptErr);
    }
    EXPECT_TRUE(reports_.Has(0, "BinDataWriter finished with 74 error"));
}

TEST_F(BinData, CountsOfStringsAreChecked) {
    const std::pair<int32, MgErr> rows[] = {
        {0, kNoErr},     {-1, kLengthErr}, {0x200001, kLengthErr}, {0x7FFFFFFF, kLengthErr}, {0x200000, kCorruptErr},
        {5, kCorruptErr}};
    for (const auto& [count, err] : rows) {
        std::string stream =
            Written(LittleEndianizer(), [count = count](auto& w) { return w.WriteI32(count); }) + "abcd";
        MemInputBuf in(stream.data(), static_cast<uint32>(stream.size()));
        BinDataReader reader(&in, LittleEndianizer());
        EXPECT_EQ(nullptr, reader.ReadLStr());
        EXPECT_EQ(err, reader.GetError()) << count;
    }
    // Above the bound, what is there is read.
    for (const uint32 count : {3u, 0x200001u}) {
        std::string stream = Written(BigEndianizer(), [&](auto& w) { return w.WriteU32(count); });
        stream.append(count, 'q');
        MemInputBuf in(stream.data(), static_cast<uint32>(stream.size()));
        LStrHandle text = BinDataReader(&in, BigEndianizer()).ReadLStr();
        ASSERT_NE(nullptr, text) << count;
        ASSERT_EQ(count, static_cast<uint32>((*text)->count));
        EXPECT_EQ(0, std::memcmp((*text)->bytes, stream.data() + 4, count));
        DSDisposeHandle(reinterpret_cast<UHandle>(text));
    }
}

}  // namespace
}  // namespace tessel::test
