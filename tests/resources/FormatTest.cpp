// The bytes: what is written, what is accepted, and what is refused without a step outside.
#include "resources/ResourceTestSupport.h"

#include <gmock/gmock.h>

namespace tessel::test {
namespace {

using namespace std::string_literals;

class FormatTest : public ResourceTest {
protected:
    // Opens, reads everything through every road, edits if it may, and updates. Results must be documented ones.
    void Walk(const std::string& bytes, int32 mode) {
        RsrcFile file = 0;
        const MgErr opened = TryOpen(bytes, mode, &file);
        EXPECT_THAT(opened, testing::AnyOf(kNoErr, kMemFullErr, kEOFErr, kIOErr, kNotResFileErr, kVersionErr));
        if (opened) return;
        int32 types = 0;
        EXPECT_EQ(kNoErr, RCountTypes(file, &types));
        for (int32 t = 1; t <= types; ++t) WalkType(file, t);
        Add(file, kData, 77, "new", "new name");
        UHandle data = nullptr;
        if (mode == kROpenReadWrite && RGetInd(file, kStrList, 1, &data) == kNoErr && RRemove(data, file) == kNoErr)
            DSDisposeHandle(data);
        UHandle image = nullptr;
        if (RGetMemFileHandle(file, &image) == kNoErr) {
            // What an update has written is good.
            const std::string updated = BytesOf(image);
            EXPECT_EQ(kNoErr, OpenErr(updated, kROpenReadOnly));
        }
        RCloseFileForce(file);
        DSDisposeHandle(image);
    }
    void WalkType(RsrcFile file, int32 index) {
        ResType type = 0;
        int32 count = 0;
        EXPECT_EQ(kNoErr, RGetIndType(file, &type, index));
        EXPECT_EQ(kNoErr, RCount(file, type, &count));
        for (int32 i = 1; i <= count; ++i) {
            UHandle data = nullptr;
            if (RGetInd(file, type, i, &data)) continue;
            int32 id = 0;
            Str255 name;
            EXPECT_EQ(kNoErr, RGetInfo(data, &id, nullptr, name));
            std::string text;
            RGetIndexLongStringStd(file, &text, id, 2, type);
            RGetIndexStringStd(file, &text, id, 2);
            Path path = nullptr;
            RGetIndPath(file, &path, id, 2);
            RGetPath(file, type, id, &path);
            PathRef::DisposePath(path);
        }
    }
};

TEST_F(FormatTest, EmptyAndOneResourceByteForByte) {
    const std::string kEmpty = "RSRC\r\n\0\3OVRSORVN\0\0\0\x20\0\0\0\0\0\0\0\x20\0\0\0\0"s;
    RsrcFile file = CreateDisk("f");
    EXPECT_EQ(kEmpty, started.drive.Get("f"));
    ASSERT_EQ(kNoErr, Add(file, kStr, -2, "\4text", "nam"));
    ASSERT_EQ(kNoErr, RCloseFile(file));

    const std::string header = "RSRC\r\n\0\3OVRSORVN\0\0\0\x2C\0\0\0\x5C\0\0\0\x20\0\0\0\x0C"s;
    const std::string data = "\0\0\0\5\4text\0\0\0"s;
    const std::string map = header + "\0\0\0\0\0\0\0\0\0\0\0\x20\0\0\0\x34\0\0\0\x58"s +  //
                            "\0\0\0\0STR \0\0\0\0\0\0\0\x10"s +                           //
                            "\xFF\xFF\xFF\xFE\0\0\0\0\0\0\0\0\0\0\0\0\0\0\0\0"s + "\3nam";
    EXPECT_EQ(header + data + map, started.drive.Get("f"));

    file = OpenDisk("f");
    Remove(file, kStr, -2);
    ASSERT_EQ(kNoErr, RCloseFile(file));
    EXPECT_EQ(kEmpty, started.drive.Get("f"));
}

TEST_F(FormatTest, HeadersAreAcceptedByTheirVersion) {
    const std::string plain = Fixture("plain.rsrc");
    const auto with = [&](char eol, char version) {
        std::string bytes = plain;
        for (const size_t base : {size_t{0}, plain.size() - 550}) {
            bytes[base + 5] = eol;
            bytes[base + 7] = version;
        }
        return bytes;
    };
    const struct {
        char eol, version;
        MgErr writable, readOnly;
    } kTable[] = {{'\n', 3, 0, 0},   {'\r', 3, 13, 13}, {'\n', 2, 0, 0},     {'x', 2, 0, 0},
                  {'\n', 1, 13, 13}, {'\n', 0, 13, 13}, {'\n', 4, 122, 122}, {'x', 4, 13, 13}};
    for (const auto& row : kTable) {
        SCOPED_TRACE(testing::Message() << int(row.eol) << " version " << int(row.version));
        EXPECT_EQ(row.writable, OpenErr(with(row.eol, row.version), kROpenReadWrite));
        EXPECT_EQ(row.readOnly, OpenErr(with(row.eol, row.version), kROpenReadOnly));
    }
    EXPECT_EQ(kEOFErr, OpenErr(plain.substr(0, 31), kROpenReadOnly));
    EXPECT_EQ(kEOFErr, OpenErr("", kROpenReadWrite));
    // Read-only, a bad header sends the reader after the trailer, and what is there decides.
    EXPECT_EQ(kNoErr, OpenErr("host bytes, longer than a header is" + plain + Big32(35), kROpenReadOnly));
    EXPECT_EQ(kNotResFileErr, OpenErr("host bytes, longer than a header is" + plain + Big32(35), kROpenReadWrite));
    EXPECT_EQ(kEOFErr, OpenErr(std::string(40, 'x') + Big32(30), kROpenReadOnly));
    EXPECT_EQ(kNotResFileErr, OpenErr(std::string(40, 'x') + Big32(4), kROpenReadOnly));
    EXPECT_EQ(kNotResFileErr, OpenErr(std::string(40, 'x') + Big32(0xFFFFFFF0), kROpenReadOnly));
}

TEST_F(FormatTest, DamagedMapsAreRefused) {
    const std::string plain = Fixture("plain.rsrc");
    const size_t map = 6116, types = map + 52, first = types + 4;
    const size_t lists = first + 12 * 5;
    const struct {
        const char* what;
        size_t at;
        uint32 value;
        MgErr err;
    } kTable[] = {
        {"map beyond the file", 16, 6117, kEOFErr},
        {"map far beyond the file", 16, 0xFFFFFFFF, kEOFErr},
        {"4 GiB of map", 20, 0xFFFFFFFF, kEOFErr},
        {"map that ends in its type list", 20, 60, kIOErr},
        {"type list over the header", map + 44, 40, kIOErr},
        {"type list behind the map", map + 44, 551, kIOErr},
        {"type list at the very end", map + 44, 548, kIOErr},
        {"type list far off", map + 44, 0xFFFFFFF0, kIOErr},
        {"names over the lists", map + 48, 200, kIOErr},
        {"names at a negative place", map + 48, 0x80000000, kIOErr},
        {"named resources without names", map + 48, 0, kIOErr},
        {"more types than fit", types, 1000, kIOErr},
        {"2^31 types", types, 0x7FFFFFFF, kIOErr},
        {"negative types", types, 0x80000000, kIOErr},
        {"more resources than fit", first + 4, 100, kIOErr},
        {"2^31 resources", first + 4, 0x7FFFFFFF, kIOErr},
        {"a type of no resources", first + 4, 0xFFFFFFFF, kIOErr},
        {"negative resources", first + 4, 0x80000000, kIOErr},
        {"a list in the type list", first + 8, 32, kIOErr},
        {"a list over another", first + 8, 100, kIOErr},
        {"a list beyond the map", first + 8, 490, kIOErr},
        {"a list whose offset wraps", first + 8, 0xFFFFFFF0, kIOErr},
        {"a type twice", first + 12, kStrList, kIOErr},
        {"a name behind the map", lists + 24, 600, kIOErr},
        {"a name that does not end in the map", lists + 24, 273, kIOErr},
        {"a name in the middle of another", lists + 24, 1, kIOErr},
        {"a negative name", lists + 24, 0xFFFFFFFE, kIOErr},
    };
    ASSERT_EQ(kNoErr, OpenErr(plain, kROpenReadWrite));
    for (const auto& row : kTable) {
        SCOPED_TRACE(row.what);
        std::string bytes = WithWord(plain, row.at, row.value);
        if (row.value == kStrList) bytes.replace(row.at, 4, "STR#");
        EXPECT_EQ(row.err, OpenErr(bytes, kROpenReadWrite));
        EXPECT_EQ(row.err, OpenErr(bytes, kROpenReadOnly));
    }
}

TEST_F(FormatTest, DamagedDataFailOnlyTheirOwnResource) {
    const std::string plain = Fixture("plain.rsrc");
    const size_t firstEntry = 6116 + 52 + 4 + 12 * 5;
    const std::pair<std::string, const char*> rows[] = {
        {WithWord(plain, firstEntry + 12, 6084 - 3), "error 4"},
        {WithWord(plain, firstEntry + 12, 0xFFFFFFFE), "error 4"},
        {WithWord(plain, 32, 6081), "error 4"},
        {WithWord(plain, 32, 0xFFFFFFFC), "error 4"},
        // The data section claims more than the file has.
        {WithWord(WithWord(plain, 28, 0xFFFFFFFF), 32, 0xFFFFFF00), "error 4"},
        {WithWord(WithWord(plain, 28, 0xFFFFFFFF), firstEntry + 12, 7000), "error 13"},
    };
    for (const int32 mode : {kROpenReadOnly, kROpenReadWrite}) {
        for (const auto& [bytes, error] : rows) {
            const RsrcFile damaged = Open(bytes, mode);
            EXPECT_EQ(error, Get(damaged, kStrList, 5));
            EXPECT_EQ("\x0bnegative id", Get(damaged, kStr, -1));
        }
    }
    // An update does not begin what it cannot finish.
    const RsrcFile file = Open(WithWord(plain, 32, 6081));
    ASSERT_EQ(kNoErr, Add(file, kData, 1, "x"));
    EXPECT_EQ(kEOFErr, RUpdateFile(file));
    EXPECT_EQ("\x0bnegative id", Get(file, kStr, -1));
    EXPECT_EQ(kEOFErr, RCloseFileForce(file));
    EXPECT_EQ(kNotResFileErr, RUpdateFile(file));
}

TEST_F(FormatTest, EntriesThatOverlapAreSavedFromEachOther) {
    // Two resources that share their bytes, behind a hole: each keeps what it reads as.
    const RsrcFile made = CreateDisk("f");
    ASSERT_EQ(kNoErr, Add(made, kData, 1, "drop"));
    ASSERT_EQ(kNoErr, Add(made, kData, 2, "\0\0\0\4abcd"s));
    ASSERT_EQ(kNoErr, Add(made, kData, 3, "gone"));
    ASSERT_EQ(kNoErr, RCloseFile(made));
    std::string bytes = started.drive.Get("f");
    const size_t thirdEntry = bytes.size() - 20;
    bytes = WithWord(bytes, thirdEntry + 12, 12);  // the length word inside of resource 2
    const RsrcFile file = Open(bytes);
    Remove(file, kData, 1);
    EXPECT_EQ(kNoErr, RUpdateFile(file));
    EXPECT_EQ("\0\0\0\4abcd"s, Get(file, kData, 2));
    EXPECT_EQ("abcd", Get(file, kData, 3));
}

TEST_F(FormatTest, NoDamageLeadsOutside) {
    const ReportRecorder quiet;
    const std::string plain = Fixture("plain.rsrc");
    for (size_t length = 0; length < plain.size(); length += length < 64 || length > 6100 ? 1 : 97)
        for (const int32 mode : {kROpenReadOnly, kROpenReadWrite}) Walk(plain.substr(0, length), mode);
    for (size_t at = 0; at < plain.size(); at = at == 60 ? 6110 : at + 1) {
        for (const int flip : {0x01, 0x80, 0xFF}) {
            std::string bytes = plain;
            bytes[at] = static_cast<char>(bytes[at] ^ flip);
            Walk(bytes, at % 2 ? kROpenReadOnly : kROpenReadWrite);
        }
    }
}

}  // namespace
}  // namespace tessel::test
