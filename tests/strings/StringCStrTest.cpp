#include "strings/Support.h"
#include "support/Test.h"
#include <tessel/strings/StringCStr.h>

#include <strings.h>

using namespace tessel::test;

namespace {

TEST(StringCStr, ComparesByTheFirstDifference) {
    const struct {
        CStr a, b;
        int32 exact, noCase;
    } kCases[] = {
        {"abc", "abc", 0, 0},
        {"abc", "abd", -1, -1},
        {"ABC", "abd", 'A' - 'a', -1},
        {"Zebra", "apple", 'Z' - 'a', 'z' - 'a'},
        {"ab", "abC", -'C', -'c'},  // the first ends: minus the next byte of the second
        {"abC", "ab", 1, 1},
        {"", "", 0, 0},
        {"\xFF", "\x01", 254, 254},
        {"a long text with its DIFFERENCE far on", "a long text with its difference far of", 'D' - 'd', 'n' - 'f'}};
    for (const auto& c : kCases) {
        EXPECT_EQ(c.exact, StrCmp(c.a, c.b)) << c.a << " " << c.b;
        EXPECT_EQ(c.noCase, StrCaseCmp(c.a, c.b)) << c.a << " " << c.b;
        EXPECT_EACH((c.exact == 0) == StrEqual(c.a, c.b), c.noCase == StrNCaseCmp(c.a, c.b, 100));
    }
    EXPECT_EACH(StrNCmp("abcX", "abcY", 3) == 0, StrNCmp("abcX", "abcY", 4) == -1, StrNEqual("a", "b", 0),
                StrNCaseEqual("abcX", "ABCy", 3), !StrNCaseEqual("abcX", "ABCy", 4));
}

TEST(StringCStr, OrdersWithoutCaseAsTheSystemDoes) {
    std::mt19937 random(1);
    for (int i = 0; i < 2000; ++i) {
        std::string a(random() % 40, 'x');
        for (char& c : a) c = static_cast<char>(1 + random() % 127);
        std::string b = a;
        for (char& c : b) {
            if (random() % 4 == 0) c = static_cast<char>(std::isalpha(c) ? c ^ 0x20 : c);
        }
        if (!b.empty() && random() % 2) b[random() % b.size()] = static_cast<char>(1 + random() % 127);
        EXPECT_EQ(Sign(strcasecmp(a.c_str(), b.c_str())), Sign(StrCaseCmp(a.c_str(), b.c_str()))) << a << "\n" << b;
    }
}

TEST(StringCStr, CopiesAndPads) {
    char text[8] = "1234567";
    EXPECT_EACH(text == StrNCpy(text, "ab", 4), std::string(text, 8) == std::string("ab\0\0"
                                                                                    "567\0",
                                                                                    8));
    StrNCpy(text, "xyz", 2);
    EXPECT_STREQ("xy", text);
    StrNCpy(text, "q", 0);
    EXPECT_EACH(text == "xy", StrCat(text, "cde") == 5, text == "xycde");
    StrCpy(text, text + 1);
    EXPECT_STREQ("ycde", text);
    StrCpy(text, nullptr);
    EXPECT_EQ(0, StrLen(text));
}

TEST(StringCStr, Searches) {
    CStr text = "a,b,c";
    EXPECT_EACH(text + 1 == StrChr(text, ','), text + 3 == StrRChr(text, ','), StrChr(text, 'x') == nullptr,
                StrChr(text, 0) == nullptr, StrRChr(text, 0) == nullptr);

    EXPECT_EACH(StrIStr("the Quick \tBr own fox", "quickbrown"), StrIStr(" a", ""), !StrIStr("", ""),
                !StrIStr("quick", "quick b"), !StrIStr("qui", "quick"));
}

TEST(StringCStr, MapsCaseWithTheCodePage) {
    EXPECT_EACH(ToLower('A') == 'a', ToLower(0x141) == 0x141, ToUpper(-30) == -30);
    EXPECT_EQ(0xE4, ToUpper(0xE4));  // begins a character in UTF-8
    {
        const CodePage page(1252);
        EXPECT_EACH(ToUpper(0xE4) == 0xC4, IsLower(0xE4), !IsUpper(0xE4), StrCaseCmp("\xC4rger", "\xE4RGER") == 0);
        char text[] = "gr\xFC\xDFn";
        StrToUpper(text, 4);
        EXPECT_STREQ("GR\xDC\xDFn", text);
    }
    const CodePage page(932);
    char text[] = "a\x83\x61z";  // the second byte of the katakana looks like a letter
    StrToUpper(text, 4);
    EXPECT_STREQ("A\x83\x61Z", text);
    StrToLower(text, 4);
    EXPECT_STREQ("a\x83\x61z", text);
}

TEST(StringCStr, StepsOverWholeCharacters) {
    ReportRecorder reports;
    {
        const CodePage page(932);
        CStr text = "a\x83\x5Cz";
        EXPECT_EACH(StrNextChar(text, 0) == 1, StrNextChar(text, 1) == 3, StrNextChar(text, 3) == 4);
        EXPECT_EQ(5, StrNextChar(text, 4));  // at the terminator
        EXPECT_EQ(1, StrPrevChar(text, 3));
        EXPECT_EQ(0, StrPrevChar(text, 1));
    }
    CStr utf8 = "\xE2\x82\xAC\xF0\x9F\x98\x80z";
    EXPECT_EACH(StrNextChar(utf8, 0) == 3, StrNextChar(utf8, 3) == 7, StrPrevChar(utf8, 7) == 3,
                StrPrevChar(utf8, 0) == 0, StrPrevChar(nullptr, 3) == 0, reports.Count() == 0u,
                StrPrevChar(utf8, -1) == 0, reports.Has(kDebugWarning, "Negative index into string in StrPrevChar"));
}

TEST(StringCStr, ClassifiesPlainAscii) {
    for (int32 c = -200; c < 400; ++c) {
        const bool ascii = c >= 0 && c < 128;
        EXPECT_EQ(ascii && std::isdigit(c), IsDigit(c)) << c;
        EXPECT_EQ(ascii && std::isalpha(c), IsAlpha(c)) << c;
        EXPECT_EQ(ascii && std::ispunct(c), IsPunct(c)) << c;
    }
    EXPECT_EQ('F', HexChar(31));
}

}  // namespace
