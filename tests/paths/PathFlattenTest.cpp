// The flattened form, byte by byte, and what is damaged.
#include "paths/PathTestSupport.h"
#include "platform/CodePage.h"
#include "support/Test.h"
#include <tessel/streams/BinDataReader.h>
#include <tessel/streams/BinDataWriter.h>

namespace tessel::test {
namespace {

using std::string_literals::operator""s;

class PathFlatten : public PathTest {
protected:
    ~PathFlatten() override { platform::SetCodePage(platform::kCodePageUtf8); }

    static std::string Flattened(const PathRef& path) {
        PathRef copy(path);
        std::string bytes(static_cast<size_t>(FFlattenPath(&copy, nullptr)), '#');
        EXPECT_EQ(static_cast<int32>(bytes.size()), FFlattenPath(&copy, reinterpret_cast<uint8*>(bytes.data())));
        return bytes;
    }

    // What is read, and whether all of the bytes were; the code of the failure otherwise.
    static std::string Unflattened(const std::string& bytes, const Endianizer* order = BigEndianizer()) {
        MemInputBuf buffer(bytes.data(), static_cast<uint32>(bytes.size()));
        Path path = nullptr;
        const MgErr err = FUnFlattenPath2(&buffer, &path, order);
        if (err) return std::to_string(err);
        std::string shown = Show(path) + (buffer.GetBytesRead() == bytes.size() ? "" : " +");
        FDestroyPath(&path);
        return shown;
    }
};

TEST_F(PathFlatten, BytesOfBothFormats) {
    const std::pair<PathRef, std::string> rows[] = {{Abs({"C", "dir"}), "PTH0\0\0\0\12\0\0\0\2\1C\3dir"s},
                                                    {Rel({"..", "a"}), "PTH0\0\0\0\7\0\1\0\2\0\1a"s},
                                                    {Unc({"s"}), "PTH0\0\0\0\6\0\3\0\1\1s"s},
                                                    {PathRef(), "PTH0\0\0\0\4\0\2\0\0"s},
                                                    {Abs({}), "PTH0\0\0\0\4\0\0\0\0"s},
                                                    {Abs({"C", "\xC3\xA9"}), "PTH1\0\0\0\13abs \0\1C\0\2\xC3\xA9"s},
                                                    {Rel({"..", "\xC3\xA9"}), "PTH1\0\0\0\12rel \0\0\0\2\xC3\xA9"s}};
    for (const auto& [path, bytes] : rows)
        EXPECT_EACH(bytes == Flattened(path), Show(path) == Unflattened(bytes),
                    bytes.size() == path.FlattenedSize(bytes[3] == '0' ? PathRef::kPTH0 : PathRef::kPTH1));
    char block[64];
    StaticOutputBuf buffer(block, sizeof block);
    uint32 size;
    EXPECT_EACH(
        Unc({"s"}).Flatten(&buffer, PathRef::kPTH1, &size, LittleEndianizer()) == kNoErr,
        std::string(block, size) == "PTH1\7\0\0\0unc \1\0s"s,
        Unflattened("PTH1\7\0\0\0unc \1\0s"s, LittleEndianizer()) == "unc:s",
        Abs({}).Flatten(&buffer, static_cast<PathRef::FlattenFormat>(2), &size, BigEndianizer()) == kUnsupportedErr);
}

TEST_F(PathFlatten, TheNullPathIsNoPath) {
    const std::string null = "PTH0\0\0\0\0\0\0\0\0"s;
    std::string bytes(12, '#');
    EXPECT_EACH(FFlattenPath(nullptr, reinterpret_cast<uint8*>(bytes.data())) == 12, null == bytes,
                null == Flattened(PathRef(PathRef::kNullPath)));
    Path path = nullptr;
    EXPECT_EACH(FUnFlattenPath(reinterpret_cast<const uint8*>(null.data()), &path) == 12, path == nullptr);
    path = FEmptyPath(nullptr);
    EXPECT_EACH(FUnFlattenPath(reinterpret_cast<const uint8*>(null.data()), &path) == 0, Show(path) == "abs:");
    FDestroyPath(&path);
}

TEST_F(PathFlatten, LongNamesAndTheSettingChooseTheFormat) {
    EXPECT_EQ('0', Flattened(Abs({std::string(255, 'n').c_str()}))[3]);
    const PathRef longName = Abs({std::string(256, 'n').c_str()});
    EXPECT_EACH(Flattened(longName)[3] == '1', Show(longName) == Unflattened(Flattened(longName)),
                CodeOf([&] { longName.FlattenedSize(PathRef::kPTH0); }) == kArgErr);
    const PathRef longest = Abs({std::string(0x7FFF, 'n').c_str()}), tooLong = Abs({std::string(0x8000, 'n').c_str()});
    EXPECT_EACH(Show(longest) == Unflattened(Flattened(longest)),
                CodeOf([&] { tooLong.FlattenedSize(PathRef::kPTH1); }) == kArgErr);
    PathRef::Setting("utf8");
    EXPECT_EQ('1', Flattened(Abs({"C"}))[3]);
    PathRef::Setting("sysenc");
    EXPECT_EQ('0', Flattened(Abs({"C"}))[3]);
}

TEST_F(PathFlatten, NamesAreUtf8WhateverTheCodePage) {
    const PathRef badUtf8 = Abs({"C", "a\xFF\xC3"});  // as a disk may have it
    EXPECT_EQ(Show(badUtf8), Unflattened(Flattened(badUtf8)));
    const std::tuple<uint32, const char*, std::string> rows[] = {
        {1252, "b\351b", "PTH1\0\0\0\12abs \0\4b\xC3\251b"s},
        {932, "\x95\x5C", "PTH1\0\0\0\11abs \0\3\xE8\xA1\xA8"s},  // U+8868
    };
    for (const auto& [codePage, name, bytes] : rows) {
        ASSERT_TRUE(platform::SetCodePage(codePage));
        EXPECT_EACH(bytes == Flattened(Abs({name})), "abs:"s + name == Unflattened(bytes));
    }
}

TEST_F(PathFlatten, DamagedBytes) {
    const std::pair<std::string, const char*> rows[] = {
        {"", "74"},
        {"PTH0\0\0\0"s, "74"},
        {"PTH2\0\0\0\4\0\0\0\0"s, "74"},
        {"PTH0\0\0\0\3\0\0"s, "74"},
        {"PTH0\0\0\0\11\0\0\0\1\1C"s, "74"},  // the body is cut
        {"PTH0\xFF\xFF\xFF\xFF\0\0\0\1\1C"s, "74"},
        {"PTH0\0\0\0\6\0\0\0\1\2CC"s, "74"},        // the name runs past the body
        {"PTH0\0\0\0\6\0\0\0\2\1C\1D"s, "74"},      // and so does the second name
        {"PTH0\0\0\0\10\0\0\0\1\1C\1D"s, "abs:C"},  // bytes behind the last name
        {"PTH0\0\0\0\6\0\11\0\1\1C"s, "not"},       // an unknown type
        {"PTH1\0\0\0\4ABS "s, "1"},
        {"PTH1\0\0\0\2abs "s, "74"},
        {"PTH1\0\0\0\4ab"s, "74"},
        {"PTH1\0\0\0\6abs \x80\0"s, "74"},
        {"PTH1\0\0\0\7abs \0\2ab"s, "74"},  // the name runs past the body
        {"PTH1\0\0\0\5abs \0\0"s, "74"},
        {"PTH1\x7F\xFF\xFF\377abs \0\1a"s, "74"},  // a body that is not there
        {"PTH1\0\0\0\7!pth\0\1a"s, "1"},
        {"PTH1\0\0\0\4abs \0\1a"s, "abs: +"},  // what follows is not ours
    };
    for (const auto& [bytes, result] : rows) EXPECT_EQ(result, Unflattened(bytes)) << ::testing::PrintToString(bytes);
    Path path = FEmptyPath(nullptr);
    const auto* cut = reinterpret_cast<const uint8*>("PTH0\0\0\0\6\0\1\0\1\1C");
    EXPECT_EACH(FUnFlattenPath2(cut, &path, 14) == 14, Show(path) == "rel:C", FUnFlattenPath2(cut, &path, 13) == 14,
                FUnFlattenPath2(nullptr, &path, 0) == 1, Show(path) == "rel:C",
                CodeOf([] { PathRef(static_cast<InputBuf*>(nullptr), BigEndianizer()); }) == kArgErr);
    FDestroyPath(&path);
}

TEST_F(PathFlatten, PathsInStreams) {
    HandleOutputBuf out;
    BinDataWriter writer(&out, LittleEndianizer());
    PathRef path = Rel({"x"});
    EXPECT_EACH(writer.WritePath(&path) == 14u, writer.WritePath(nullptr) == 12u);
    UHandle handle = out.GetHandle(0);
    MemInputBuf in(*handle, 26);
    BinDataReader reader(&in, LittleEndianizer());
    Path read = reader.ReadPath();
    EXPECT_EQ("rel:x", Show(read));
    FDestroyPath(&read);
    EXPECT_EACH(reader.ReadPath() == nullptr, reader.GetError() == kNoErr, reader.ReadPath() == nullptr,
                reader.GetError() == kCorruptErr);
    char block[13];
    StaticOutputBuf tooSmall(block, sizeof block);
    BinDataWriter failing(&tooSmall, LittleEndianizer());
    EXPECT_EACH(failing.WritePath(&path) == 0u, failing.GetError() == kCorruptErr);
}

}  // namespace
}  // namespace tessel::test
