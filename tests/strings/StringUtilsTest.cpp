#include "strings/Support.h"
#include "support/Test.h"
#include <tessel/strings/StringLStrArray.h>
#include <tessel/strings/StringPStr.h>
#include <tessel/strings/StringUtils.h>

using namespace tessel;
using namespace tessel::StringUtils;
using namespace tessel::test;

namespace {

TEST(StringUtils, ConvertsBetweenTheForms) {
    const std::string narrow = "a\xE2\x82\xAC\xF0\x9F\x98\x80";  // the code page is UTF-8
    const std::u16string wide = u"a\u20AC\U0001F600";
    L text(narrow);
    EXPECT_EACH(narrow == ToNarrowString(wide), narrow == ToNarrowString(*text),
                narrow == ToNarrowString(static_cast<LStrHandle>(text), kKeepSource),
                narrow == ToNarrowString(static_cast<ConstPStr>(P(narrow))),
                ToNarrowString(static_cast<LStrHandle>(nullptr), kReleaseSource) == "", wide == ToWideString(narrow),
                wide == ToWideString(*text), wide == ToWideString(static_cast<ConstPStr>(P(narrow))),
                narrow == ToUTF8String(wide),
                ToUTF8String(std::u16string{0xDC00, u'x', 0xD800}) == "\xEF\xBF\xBDx\xEF\xBF\xBD");

    BSTR bstr = ToBSTR(narrow);
    EXPECT_EACH(BSTRLength(bstr) == 4u, wide == bstr, narrow == ToNarrowStringFromBSTR(bstr, kKeepSource),
                wide == ToWideString(bstr, kReleaseSource),
                u"" == ToWideString(static_cast<BSTR>(nullptr), kReleaseSource));

    P p;
    EXPECT_EACH(narrow == test::TextOf(ToPStr(wide, p)),
                std::string(255, 'x') == test::TextOf(ToPStr(std::string(300, 'x'), p)));
    LStrHandle made = ToLStrHandle(narrow);
    EXPECT_EACH(made == ToLStrHandle("b", &made), ToNarrowString(made, kReleaseSource) == "b");

    const CodePage page(1252);
    EXPECT_EACH(ToNarrowString(u"a\u20AC") == "a\x80", ToUTF8String("a\x80") == "a\xE2\x82\xAC",
                u"\u20AC" == ToWideString(static_cast<ConstPStr>(P("\x80"))));
}

TEST(StringUtils, HasFormsThatDoNotThrow) {
    std::string narrow;
    std::u16string wide;
    P p;
    EXPECT_EACH(
        ToNarrowStringNoThrow(u"ab", &narrow) == kNoErr, narrow == "ab",
        ToNarrowStringNoThrow(u"ab", nullptr) == kArgErr, ToWideStringNoThrow("cd", &wide) == kNoErr, u"cd" == wide,
        ToWideStringNoThrow("cd", nullptr) == kArgErr, ToUTF8StringNoThrow("cd", nullptr) == kArgErr,
        ToPStrNoThrow(u"ef", p) == kNoErr, p.Text() == "ef", ToPStrNoThrow("ef", nullptr) == kArgErr,
        ToLStrHandleNoThrow("ef", nullptr) == kArgErr, ToBSTRNoThrow("ef", nullptr) == kArgErr,
        AssignNoThrow(&narrow, "1") == kNoErr, AppendNoThrow(&narrow, static_cast<ConstPStr>(P("2"))) == kNoErr,
        AppendNoThrow(&narrow, std::string("3")) == kNoErr, narrow == "123", AppendNoThrow(&wide, u"e") == kNoErr,
        u"cde" == wide, AppendNoThrow(static_cast<std::string*>(nullptr), "x") == kArgErr);

    LStrArrayHandle array = nullptr;
    EXPECT_EACH(ToLStrArrayHandleNoThrow({"replaced", "and disposed of"}, &array) == kNoErr,
                ToLStrArrayHandleNoThrow({"one", "", "three"}, &array) == kNoErr);
    ASSERT_EQ(3, (*array)->elementCount);
    EXPECT_EACH(test::TextOf(*(*array)->element[2]) == "three", ReallocLStrArrayHandle(&array, 0) == kNoErr);
}

TEST(StringUtils, TakesParts) {
    EXPECT_EACH(Left("abc", 5) == "abc", Left("abc", 2) == "ab", Left("abc", 0) == "abc", Right("abc", 2) == "bc",
                u"abc" == Right(u"abc", 9), StartsWith("abc", 'a'), StartsWith("abc", "ab"), !StartsWith("a", "ab"),
                EndsWith("abc", "bc"), EndsWith(u"abc", u'c'), !EndsWith("", 'c'));
    for (CStr quoted : {"\"", "'", "\"a\"", "'a'"}) EXPECT_TRUE(IsSurroundedByQuotes(quoted)) << quoted;
    for (CStr plain : {"", "a", "\"'", "\"a'", "a\""}) EXPECT_FALSE(IsSurroundedByQuotes(plain)) << plain;
}

template <class Edit>
std::string Edited(std::string text, Edit edit) {
    edit(&text);
    return text;
}

TEST(StringUtils, Edits) {
    EXPECT_EACH(Edited("  a ", [](std::string* s) { Trim(s, kTrimStart); }) == "a ",
                Edited("  a \t", [](std::string* s) { Trim(s, kTrimEnd); }) == "  a",
                Edited(" a ", [](std::string* s) { Trim(s, kTrimBoth); }) == "a",
                Edited(" \t ", [](std::string* s) { Trim(s, kTrimStart); }) == "",
                Edited("ababb", [](std::string* s) { SearchAndReplace(s, "a", "aa"); }) == "aabaabb",
                Edited("ab", [](std::string* s) { SearchAndReplace(s, "", "x"); }) == "ab",
                Edited("aB1", [](std::string* s) { ToUpperCase(s); }) == "AB1",
                Edited("aB1", [](std::string* s) { ToLowerCase(s); }) == "ab1",
                Edited("a;x;y\r\nb\nc;", [](std::string* s) { RemoveLineComments(s, ";"); }) == "a\r\nb\nc",
                Edited("a/*b*/c/*d", [](std::string* s) { RemoveBlockComments(s, "/*", "*/"); }) == "ac/*d",
                Edited("a/*/b", [](std::string* s) { RemoveBlockComments(s, "/*", "*/"); }) == "a/*/b",
                Edited("",
                       [](std::string* s) {
                           Join({"1", "2"}, "", s);
                       }) == "12",
                Edited("x",
                       [](std::string* s) {
                           Join({"1", "", "3"}, ", ", s);
                       }) == "1, , 3",
                Edited("x", [](std::string* s) { Join({}, ", ", s); }) == "");
}

TEST(StringUtils, ComparesWithoutCase) {
    EXPECT_EACH(CaseInsensitiveEqual("Path\\To", "pATH\\tO"), !CaseInsensitiveEqual("abc", "ab"),
                CaseInsensitiveEqual(u"ABC", u"abc"), CaseInsensitiveCompare("AB", "abc") == -1,
                CaseInsensitiveCompare("a text of Many words", "A TEXT OF MANY ZEBRAS") == -1);
    EXPECT_EQ(1, CaseInsensitiveCompare("a", "\xE4"));  // bytes are signed
    EXPECT_EQ(-1, CaseInsensitiveCompare(u"a", u"\u00E4"));
}

TEST(StringUtils, HashesSignedCharacters) {
    EXPECT_EACH(Hash("", false) == 0, Hash("abc", false) == 0x6783, Hash("ABC", false) == Hash("aBc", true),
                Hash(std::string("abc\0d", 5), false) == 0x6783);
    EXPECT_EQ(0x0FFFFF14, Hash("\xE4", false));  // -28
}

}  // namespace
