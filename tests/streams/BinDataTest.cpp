#include <gtest/gtest.h>
#include <tessel/memory/MemoryManager.h>
#include <tessel/streams/BinDataReader.h>
#include <tessel/streams/BinDataWriter.h>

#include <cstring>
#include <functional>
#include <string>
#include <vector>

#include "support/ReportRecorder.h"
#include "support/StartedPaths.h"

namespace tessel {
namespace {

using Write = std::function<uint32(BinDataWriter&)>;

class BinData : public ::testing::Test {
protected:
    // The bytes of what is written; that the sizes agree, also where nothing is stored, is checked.
    static std::string Written(const Endianizer* order, const Write& write) {
        char block[400];
        std::memset(block, 0x55, sizeof block);
        StaticOutputBuf buffer(block, sizeof block);
        BinDataWriter writer(&buffer, order);
        const uint32 size = write(writer);
        EXPECT_EQ(size, buffer.GetBytesWritten());
        PreflightOutputBuf counter;
        BinDataWriter counting(&counter, order);
        EXPECT_EQ(size, write(counting));
        EXPECT_EQ(size, counter.GetBytesWritten());
        return std::string(block, size);
    }

    test::StartedPaths started_;
    test::ReportRecorder reports_;
};

std::string Bytes(std::initializer_list<int> values) {
    return std::string(values.begin(), values.end());
}

TEST_F(BinData, ValuesAreWrittenInTheOrderOfTheStream) {
    struct Row {
        Write write;
        std::string big, little;
    };
    const Row rows[] = {
        {[](auto& w) { return w.WriteI8(-2); }, Bytes({0xFE}), Bytes({0xFE})},
        {[](auto& w) { return w.WriteU16(0x0102); }, Bytes({1, 2}), Bytes({2, 1})},
        {[](auto& w) { return w.WriteI32(0x01020304); }, Bytes({1, 2, 3, 4}), Bytes({4, 3, 2, 1})},
        {[](auto& w) { return w.Write4Char(0x01020304); }, Bytes({4, 3, 2, 1}), Bytes({4, 3, 2, 1})},
        {[](auto& w) { return w.WriteU64(0x0102030405060708u); }, Bytes({1, 2, 3, 4, 5, 6, 7, 8}),
         Bytes({8, 7, 6, 5, 4, 3, 2, 1})},
        {[](auto& w) { return w.WriteF32(-1.5f); }, Bytes({0xBF, 0xC0, 0, 0}), Bytes({0, 0, 0xC0, 0xBF})},
        {[](auto& w) { return w.WriteF64(1.0); }, Bytes({0x3F, 0xF0, 0, 0, 0, 0, 0, 0}),
         Bytes({0, 0, 0, 0, 0, 0, 0xF0, 0x3F})},
        {[](auto& w) { return w.WriteBool(1); }, Bytes({1}), Bytes({1})},
        {[](auto& w) { return w.WriteLStrFromNarrow("ab"); }, Bytes({0, 0, 0, 2, 'a', 'b'}),
         Bytes({2, 0, 0, 0, 'a', 'b'})},
        {[](auto& w) { return w.WriteLStr(nullptr); }, Bytes({0, 0, 0, 0}), Bytes({0, 0, 0, 0})},
        {[](auto& w) { return w.WriteBytes("xy", 2); }, "xy", "xy"},
        {[](auto& w) { return w.WriteU8(7) + w.Align(4) + w.Align(4); }, Bytes({7, 0, 0, 0}), Bytes({7, 0, 0, 0})},
    };
    for (const Row& row : rows) {
        EXPECT_EQ(row.big, Written(BigEndianizer(), row.write));
        EXPECT_EQ(row.little, Written(LittleEndianizer(), row.write));
    }
    EXPECT_EQ(16u, Written(BigEndianizer(), [](auto& w) { return w.WriteFX(floatExt{}); }).size());
    EXPECT_EQ(10u, Written(NativeEndianizer(), [](auto& w) { return w.WriteFX(floatExt{}); }).size());
}

TEST_F(BinData, PStrsArePadded) {
    const uint8 abc[] =
        "\x03"
        "abc";
    const uint8 empty[] = {0};
    struct Row {
        ConstPStr text;
        uint32 align;
        std::string bytes;
    };
    const Row rows[] = {{abc, 1,
                         "\x03"
                         "abc"},
                        {abc, 2,
                         "\x03"
                         "abc"},
                        {abc, 4,
                         "\x03"
                         "abc"},
                        {abc, 0,
                         "\x03"
                         "abc"},
                        {abc, 3, Bytes({3, 'a', 'b', 'c', 0, 0})},
                        {empty, 4, Bytes({0, 0, 0, 0})},
                        {nullptr, 4, ""}};
    for (const Row& row : rows) {
        EXPECT_EQ(row.bytes, Written(BigEndianizer(), [&](auto& w) { return w.WritePStr(row.text, row.align); }));
    }
    const std::string cut =
        Written(BigEndianizer(), [](auto& w) { return w.WritePStrFromNarrow(std::string(300, 'z'), 4); });
    EXPECT_EQ(std::string(1, '\xFF') + std::string(255, 'z'), cut);
}

TEST_F(BinData, WhatIsWrittenIsReadBack) {
    floatExt extended = {};
    extended.signExponent = 0x4000;
    extended.mantissa = 0xC90FDAA22168C235u;  // pi
    for (const Endianizer* order : {BigEndianizer(), LittleEndianizer(), NativeEndianizer()}) {
        HandleOutputBuf out(1);
        BinDataWriter writer(&out, order);
        writer.WriteI8(-1);
        writer.Align(8);
        writer.WriteI64(INT64_MIN);
        writer.WriteFX(extended);
        writer.WritePStrFromNarrow("name", 4);
        writer.WriteLStrFromNarrow("text");
        writer.WriteF32(0.1f);
        writer.WriteF64(-0.1);
        writer.Write4Char(0x41424344);
        writer.WriteBytes("12345", 5);
        EXPECT_EQ(kNoErr, writer.GetError());
        UHandle handle = out.GetHandle(0);
        MemInputBuf in(*handle, DSGetHandleSize(handle));
        BinDataReader reader(&in, order);
        EXPECT_EQ(-1, reader.ReadI8());
        reader.Align(8);
        EXPECT_EQ(INT64_MIN, reader.ReadI64());
        const floatExt back = reader.ReadFX();
        EXPECT_EQ(0, std::memcmp(&extended, &back, sizeof back));
        std::string text;
        reader.ReadPStrAsNarrow(text, 4);
        EXPECT_EQ("name", text);
        reader.ReadLStrAsNarrow(text);
        EXPECT_EQ("text", text);
        EXPECT_EQ(0.1f, reader.ReadF32());
        EXPECT_EQ(-0.1, reader.ReadF64());
        EXPECT_EQ(0x41424344, reader.Read4Char());
        char last[2];
        reader.ReadBytes(nullptr, 2);
        reader.Skip(1);
        reader.ReadBytes(last, 2);
        EXPECT_EQ(0, std::memcmp(last, "45", 2));
        EXPECT_EQ(kNoErr, reader.GetError());
        EXPECT_EQ(in.GetSize(), in.GetBytesRead());
    }
}

TEST_F(BinData, TheFirstErrorStays) {
    MemInputBuf in("\x01\x02\x03", 3);
    BinDataReader reader(&in, BigEndianizer());
    EXPECT_EQ(0, reader.ReadI32());
    EXPECT_EQ(kCorruptErr, reader.GetError());
    EXPECT_EQ(0, reader.ReadU8());
    char bytes[3] = {9, 9, 9};
    reader.ReadBytes(bytes, 2);
    EXPECT_EQ(Bytes({0, 0, 9}), std::string(bytes, 3));
    reader.SetError(kArgErr);
    EXPECT_EQ(kCorruptErr, reader.GetError());
    {
        StaticOutputBuf out(bytes, 1);
        BinDataWriter writer(&out, BigEndianizer());
        EXPECT_EQ(0u, writer.WriteI16(1));
        PreflightOutputBuf other;
        EXPECT_EQ(&out, writer.SetBuffer(&other));
        EXPECT_EQ(0u, writer.WriteI8(1));
        EXPECT_EQ(kCorruptErr, writer.GetError());
    }
    EXPECT_TRUE(reports_.Has(0, "BinDataWriter finished with 74 error"));
}

// A reader that asks for its error learns of one that the buffer met elsewhere.
TEST_F(BinData, TheErrorOfTheBufferIsAdopted) {
    MemInputBuf in("a", 1);
    BinDataReader reader(&in, BigEndianizer());
    MgErr err;
    in.GetDataPointer(2, err);
    EXPECT_EQ(kCorruptErr, reader.GetError());
}

TEST_F(BinData, CountsOfStringsAreChecked) {
    struct Row {
        int32 count;
        MgErr err;
    };
    for (const Row& row : {Row{0, kNoErr}, Row{-1, kLengthErr}, Row{0x200001, kLengthErr}, Row{0x7FFFFFFF, kLengthErr},
                           Row{0x200000, kCorruptErr}, Row{5, kCorruptErr}}) {
        std::string stream = Written(LittleEndianizer(), [&](auto& w) { return w.WriteI32(row.count); }) + "abcd";
        MemInputBuf in(stream.data(), static_cast<uint32>(stream.size()));
        BinDataReader reader(&in, LittleEndianizer());
        EXPECT_EQ(nullptr, reader.ReadLStr());
        EXPECT_EQ(row.err, reader.GetError()) << row.count;
    }
    MemInputBuf in("\0\0\0\3abc", 7);
    BinDataReader reader(&in, BigEndianizer());
    LStrHandle text = reader.ReadLStr();
    EXPECT_EQ(3, (*text)->count);
    EXPECT_EQ(0, std::memcmp((*text)->bytes, "abc", 3));
    DSDisposeHandle(reinterpret_cast<UHandle>(text));
}

TEST_F(BinData, LargeStringsThatAreThereAreRead) {
    const uint32 count = 0x200001;
    std::string stream = Written(BigEndianizer(), [&](auto& w) { return w.WriteU32(count); }) + std::string(count, 'q');
    MemInputBuf in(stream.data(), static_cast<uint32>(stream.size()));
    BinDataReader reader(&in, BigEndianizer());
    std::string text;
    reader.ReadLStrAsNarrow(text);
    EXPECT_EQ(count, text.size());
}

}  // namespace
}  // namespace tessel
