#include "platform/CodePage.h"
#include "platform/LastError.h"
#include "support/Test.h"

namespace tessel::platform {
namespace {

class CodePage : public ::testing::Test {
protected:
    ~CodePage() override { SetCodePage(kCodePageUtf8); }
};

// Lengths of the characters, walking forward; and the same walking back.
std::vector<std::size_t> Lengths(const std::string& text) {
    std::vector<std::size_t> lengths;
    const char* end = text.data() + text.size();
    for (const char* at = text.c_str(); at < end; at += lengths.back()) {
        lengths.push_back(CharLength(at, end));
        EXPECT_EACH(at + lengths.back() == NextChar(at), at == PrevChar(text.data(), at + lengths.back()));
    }
    return lengths;
}

TEST_F(CodePage, CharactersAreWhole) {
    struct Row {
        std::uint32_t codePage;
        std::string text;
        std::vector<std::size_t> lengths;
    };
    const Row rows[] = {
        {65001, "a\xC3\xA4\xE2\x82\xAC\xF0\x9F\x98\x80z", {1, 2, 3, 4, 1}},
        {65001, "\x80\xC3z\xC0\xAF\xED\xA0\x80\xF5\xE2\x82", {1, 1, 1, 1, 1, 1, 1, 1, 1, 1, 1}},  // none is valid
        {1252, "\xE4\xF6z", {1, 1, 1}},
        {932, "\x83\x5C\xB1\\\x81\x81\x81\x81z\x83", {2, 1, 1, 2, 2, 1, 1}},  // the last lead byte has no trail
        {936, "\xC4\xE3z", {2, 1}},
        {949, "\xB0\xA1z", {2, 1}},
        {950, "\xA4\x5Cz", {2, 1}},
        {54936, "\xC4\xE3\x81\x30\x84\x36z", {2, 4, 1}},
        {51932, "\x8F\xB0\xA1\xB0\xA1\x8E\xB1z", {3, 2, 2, 1}},
    };
    for (const Row& row : rows) {
        SCOPED_TRACE(row.codePage);
        ASSERT_TRUE(SetCodePage(row.codePage));
        EXPECT_EQ(row.lengths, Lengths(row.text));
    }
    const char* empty = "";
    EXPECT_EACH(empty == NextChar(empty), empty == PrevChar(empty, empty));
}

TEST_F(CodePage, LeadBytesAreTheDocumentedOnes) {
    SetCodePage(932);
    for (unsigned byte = 0; byte < 256; ++byte) {
        EXPECT_EQ((byte >= 0x81 && byte <= 0x9F) || (byte >= 0xE0 && byte <= 0xFC), IsLeadByte(std::uint8_t(byte)));
    }
    SetCodePage(1252);
    for (unsigned byte = 0; byte < 256; ++byte) EXPECT_FALSE(IsLeadByte(std::uint8_t(byte)));
}

TEST_F(CodePage, CaseMapsLeaveTrailBytesAlone) {
    struct Row {
        std::uint32_t codePage;
        const char* text;
        const char* upper;
    };
    const Row rows[] = {
        {1252, "az\xE4\xFF\xB5\xDF\x9A", "AZ\xC4\x9F\xB5\xDF\x8A"},  // no capital of the micro sign and the sharp s
        {1251, "\xE0\xB8", "\xC0\xA8"},
        {932, "a\x83\x61\xB1z", "A\x83\x61\xB1Z"},
        {65001, "a\xC3\xA4z", "A\xC3\xA4Z"},
    };
    for (const Row& row : rows) {
        SCOPED_TRACE(row.codePage);
        ASSERT_TRUE(SetCodePage(row.codePage));
        std::string text = row.text;
        UpperText(text.data(), text.size());
        EXPECT_EQ(row.upper, text);
    }
    SetCodePage(1252);
    EXPECT_EACH(LowerByte(0xC4) == 0xE4, LowerByte(0x9F) == 0xFF);
    std::string text = "\xC4Z";
    LowerText(text.data(), text.size());
    EXPECT_EQ("\xE4z", text);
}

TEST_F(CodePage, Conversions) {
    struct Row {
        std::uint32_t codePage;
        std::string text;
        std::string utf8;
        std::u16string utf16;
    };
    const Row rows[] = {
        {65001, "\xF0\x9F\x98\x80\xC3\xA4", "\xF0\x9F\x98\x80\xC3\xA4", u"\xD83D\xDE00\xE4"},
        {1252, "\x80\xE4", "\xE2\x82\xAC\xC3\xA4", u"\x20AC\xE4"},
        {1252, "\x81\x8D\x8F\x90\x9D", "\xC2\x81\xC2\x8D\xC2\x8F\xC2\x90\xC2\x9D", u"\x81\x8D\x8F\x90\x9D"},
        {932, "\x83\x5C\xB1\\", "\xE3\x82\xBD\xEF\xBD\xB1\\", u"\x30BD\xFF71\\"},
        {936, std::string(1000, 'a') + "\xC4\xE3", std::string(1000, 'a') + "\xE4\xBD\xA0",
         std::u16string(1000, 'a') + u"\x4F60"},
        {28605, "\xA4", "\xE2\x82\xAC", u"\x20AC"},
    };
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
