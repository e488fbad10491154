#include "platform/CodePage.h"
#include "platform/LastError.h"
#include "support/Test.h"

namespace tessel::platform {
namespace {

class CodePage : public ::testing::Test {
protected:
    ~CodePage() override { SetCodePage(kCodePageUtf8); }
};

// Lengths of the characters in a code page, walking forward; and the same walking back.
std::string Lengths(std::uint32_t codePage, const std::string& text) {
    EXPECT_TRUE(SetCodePage(codePage)) << codePage;
    std::string lengths;
    const char* end = text.data() + text.size();
    for (const char* at = text.c_str(); at < end;) {
        const std::size_t length = CharLength(at, end);
        EXPECT_EACH(at + length == NextChar(at), at == PrevChar(text.data(), at + length));
        lengths += std::to_string(length);
        at += length;
    }
    return lengths;
}

TEST_F(CodePage, CharactersAreWhole) {
    EXPECT_EACH(Lengths(65001, "a\xC3\xA4\xE2\x82\xAC\xF0\x9F\x98\x80z") == "12341",
                Lengths(65001, "\x80\xC3z\xC0\xAF\xED\xA0\x80\xF5\xE2\x82") == "11111111111",  // none is valid
                Lengths(1252, "\xE4\xF6z") == "111", Lengths(932, "\x83\x5C\xB1\\\x81\x81\x81\x81z\x83") == "2112211",
                Lengths(936, "\xC4\xE3z") == "21", Lengths(949, "\xB0\xA1z") == "21", Lengths(950, "\xA4\x5Cz") == "21",
                Lengths(54936, "\xC4\xE3\x81\x30\x84\x36z") == "241",
                Lengths(51932, "\x8F\xB0\xA1\xB0\xA1\x8E\xB1z") == "3221");
    const char* empty = "";
    EXPECT_EACH(empty == NextChar(empty), empty == PrevChar(empty, empty));
}

TEST_F(CodePage, LeadBytesAreTheDocumentedOnes) {
    SetCodePage(932);
    for (unsigned byte = 0; byte < 256; ++byte)
        EXPECT_EQ((byte >= 0x81 && byte <= 0x9F) || (byte >= 0xE0 && byte <= 0xFC), IsLeadByte(std::uint8_t(byte)));
    SetCodePage(1252);
    for (unsigned byte = 0; byte < 256; ++byte) EXPECT_FALSE(IsLeadByte(std::uint8_t(byte)));
}

TEST_F(CodePage, CaseMapsLeaveTrailBytesAlone) {
    const auto upper = [](std::uint32_t codePage, std::string text) {
        EXPECT_TRUE(SetCodePage(codePage));
        UpperText(text.data(), text.size());
        return text;
    };
    // There is no capital of the micro sign and the sharp s.
    EXPECT_EACH(upper(1252, "az\xE4\xFF\xB5\xDF\x9A") == "AZ\xC4\x9F\xB5\xDF\x8A",
                upper(1251, "\xE0\xB8") == "\xC0\xA8", upper(932, "a\x83\x61\xB1z") == "A\x83\x61\xB1Z",
                upper(65001, "a\xC3\xA4z") == "A\xC3\xA4Z");
    SetCodePage(1252);
    EXPECT_EACH(LowerByte(0xC4) == 0xE4, LowerByte(0x9F) == 0xFF);
    std::string text = "\xC4Z";
    LowerText(text.data(), text.size());
    EXPECT_EQ("\xE4z", text);
}

TEST_F(CodePage, Conversions) {
    struct Row {
        std::uint32_t codePage;
        std::string text, utf8;
        std::u16string utf16;
    };
    const Row rows[] = {
        {65001, "\xF0\x9F\x98\x80\xC3\xA4", "\xF0\x9F\x98\x80\xC3\xA4", u"\xD83D\xDE00\xE4"},
        {1252, "\x80\xE4", "\xE2\x82\xAC\xC3\xA4", u"\x20AC\xE4"},
        {1252, "\x81\x8D\x8F\x90\x9D", "\xC2\x81\xC2\x8D\xC2\x8F\xC2\x90\xC2\x9D", u"\x81\x8D\x8F\x90\x9D"},
        {932, "\x83\x5C\xB1\\", "\xE3\x82\xBD\xEF\xBD\xB1\\", u"\x30BD\xFF71\\"},
        {936, std::string(1000, 'a') + "\xC4\xE3", std::string(1000, 'a') + "\xE4\xBD\xA0",
         std::u16string(1000, 'a') + u"\x4F60"},
        {28605, "\xA4", "\xE2\x82\xAC", u"\x20AC"}};
    for (const Row& row : rows) {
        SCOPED_TRACE(row.codePage);
        ASSERT_TRUE(SetCodePage(row.codePage));
        std::string utf8, text;
        std::u16string utf16;
        EXPECT_EACH(ToUtf8(row.text, utf8), row.utf8 == utf8, FromUtf8(row.utf8, text), row.text == text,
                    ToUtf16(row.text, utf16), row.utf16 == utf16, FromUtf16(row.utf16, text), row.text == text);
    }
}

TEST_F(CodePage, WhatCannotBeConvertedIsReplaced) {
    std::string result;
    SetCodePage(1252);
    EXPECT_EACH(!FromUtf8("a\xE3\x82\xBDz\xFF", result), result == "a?z?", LastError() == kErrorNoUnicodeTranslation);
    SetCodePage(932);
    EXPECT_EACH(!ToUtf8("a\x83", result), result == "a\xEF\xBF\xBD");
    SetCodePage(kCodePageUtf8);
    EXPECT_EACH(!ToUtf8("a\xC0z", result), result == "a\xEF\xBF\xBDz", !FromUtf16(u"a\xD800z", result),
                result == "a\xEF\xBF\xBDz");
}

TEST_F(CodePage, UnknownPagesAreRefused) {
    for (std::uint32_t page : {0u, 1200u, 65000u, 99999u}) EXPECT_FALSE(SetCodePage(page)) << page;
    EXPECT_EQ(kCodePageUtf8, ActiveCodePage().codePage);
}

}  // namespace
}  // namespace tessel::platform
