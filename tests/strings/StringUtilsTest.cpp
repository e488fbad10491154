#include "strings/Support.h"
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
    EXPECT_EQ(narrow, ToNarrowString(wide));
    EXPECT_EQ(narrow, ToNarrowString(*text));
    EXPECT_EQ(narrow, ToNarrowString(static_cast<LStrHandle>(text), kKeepSource));
    EXPECT_EQ(narrow, ToNarrowString(static_cast<ConstPStr>(P(narrow))));
    EXPECT_EQ("", ToNarrowString(static_cast<LStrHandle>(nullptr), kReleaseSource));
    EXPECT_EQ(wide, ToWideString(narrow));
    EXPECT_EQ(wide, ToWideString(*text));
    EXPECT_EQ(wide, ToWideString(static_cast<ConstPStr>(P(narrow))));
    EXPECT_EQ(narrow, ToUTF8String(wide));
    EXPECT_EQ("\xEF\xBF\xBDx\xEF\xBF\xBD", ToUTF8String(std::u16string{0xDC00, u'x', 0xD800}));

    BSTR bstr = ToBSTR(narrow);
    EXPECT_EQ(4u, BSTRLength(bstr));
    EXPECT_EQ(wide, bstr);
    EXPECT_EQ(narrow, ToNarrowStringFromBSTR(bstr, kKeepSource));
    EXPECT_EQ(wide, ToWideString(bstr, kReleaseSource));
    EXPECT_EQ(u"", ToWideString(static_cast<BSTR>(nullptr), kReleaseSource));

    P p;
    EXPECT_EQ(narrow, test::TextOf(ToPStr(wide, p)));
    EXPECT_EQ(std::string(255, 'x'), test::TextOf(ToPStr(std::string(300, 'x'), p)));
    LStrHandle made = ToLStrHandle(narrow);
    EXPECT_EQ(made, ToLStrHandle("b", &made));
    EXPECT_EQ("b", ToNarrowString(made, kReleaseSource));

    const CodePage page(1252);
    EXPECT_EQ("a\x80", ToNarrowString(u"a\u20AC"));
    EXPECT_EQ("a\xE2\x82\xAC", ToUTF8String("a\x80"));
    EXPECT_EQ(u"\u20AC", ToWideString(static_cast<ConstPStr>(P("\x80"))));
}

TEST(StringUtils, HasFormsThatDoNotThrow) {
    std::string narrow;
    std::u16string wide;
    P p;
    EXPECT_EQ(kNoErr, ToNarrowStringNoThrow(u"ab", &narrow));
    EXPECT_EQ("ab", narrow);
    EXPECT_EQ(kArgErr, ToNarrowStringNoThrow(u"ab", nullptr));
    EXPECT_EQ(kNoErr, ToWideStringNoThrow("cd", &wide));
    EXPECT_EQ(u"cd", wide);
    EXPECT_EQ(kArgErr, ToWideStringNoThrow("cd", nullptr));
    EXPECT_EQ(kArgErr, ToUTF8StringNoThrow("cd", nullptr));
    EXPECT_EQ(kNoErr, ToPStrNoThrow(u"ef", p));
    EXPECT_EQ("ef", p.Text());
    EXPECT_EQ(kArgErr, ToPStrNoThrow("ef", nullptr));
    EXPECT_EQ(kArgErr, ToLStrHandleNoThrow("ef", nullptr));
    EXPECT_EQ(kArgErr, ToBSTRNoThrow("ef", nullptr));
    EXPECT_EQ(kNoErr, AssignNoThrow(&narrow, "1"));
    EXPECT_EQ(kNoErr, AppendNoThrow(&narrow, static_cast<ConstPStr>(P("2"))));
    EXPECT_EQ(kNoErr, AppendNoThrow(&narrow, std::string("3")));
    EXPECT_EQ("123", narrow);
    EXPECT_EQ(kNoErr, AppendNoThrow(&wide, u"e"));
    EXPECT_EQ(u"cde", wide);
    EXPECT_EQ(kArgErr, AppendNoThrow(static_cast<std::string*>(nullptr), "x"));

    LStrArrayHandle array = nullptr;
    EXPECT_EQ(kNoErr, ToLStrArrayHandleNoThrow({"replaced", "and disposed of"}, &array));
    EXPECT_EQ(kNoErr, ToLStrArrayHandleNoThrow({"one", "", "three"}, &array));
    ASSERT_EQ(3, (*array)->elementCount);
    EXPECT_EQ("three", test::TextOf(*(*array)->element[2]));
    EXPECT_EQ(kNoErr, ReallocLStrArrayHandle(&array, 0));
}

TEST(StringUtils, TakesParts) {
    EXPECT_EQ("abc", Left("abc", 5));
    EXPECT_EQ("ab", Left("abc", 2));
    EXPECT_EQ("abc", Left("abc", 0));
    EXPECT_EQ("bc", Right("abc", 2));
    EXPECT_EQ(u"abc", Right(u"abc", 9));
    EXPECT_TRUE(StartsWith("abc", 'a'));
    EXPECT_TRUE(StartsWith("abc", "ab"));
    EXPECT_FALSE(StartsWith("a", "ab"));
    EXPECT_TRUE(EndsWith("abc", "bc"));
    EXPECT_TRUE(EndsWith(u"abc", u'c'));
    EXPECT_FALSE(EndsWith("", 'c'));
    for (CStr quoted : {"\"", "'", "\"a\"", "'a'"}) EXPECT_TRUE(IsSurroundedByQuotes(quoted)) << quoted;
    for (CStr plain : {"", "a", "\"'", "\"a'", "a\""}) EXPECT_FALSE(IsSurroundedByQuotes(plain)) << plain;
}

template <class Edit>
std::string Edited(std::string text, Edit edit) {
    edit(&text);
    return text;
}

TEST(StringUtils, Edits) {
    EXPECT_EQ("a ", Edited("  a ", [](std::string* s) { Trim(s, kTrimStart); }));
    EXPECT_EQ("  a", Edited("  a \t", [](std::string* s) { Trim(s, kTrimEnd); }));
    EXPECT_EQ("a", Edited(" a ", [](std::string* s) { Trim(s, kTrimBoth); }));
    EXPECT_EQ("", Edited(" \t ", [](std::string* s) { Trim(s, kTrimStart); }));
    EXPECT_EQ("aabaabb", Edited("ababb", [](std::string* s) { SearchAndReplace(s, "a", "aa"); }));
    EXPECT_EQ("ab", Edited("ab", [](std::string* s) { SearchAndReplace(s, "", "x"); }));
    EXPECT_EQ("AB1", Edited("aB1", [](std::string* s) { ToUpperCase(s); }));
    EXPECT_EQ("ab1", Edited("aB1", [](std::string* s) { ToLowerCase(s); }));
    EXPECT_EQ("a\r\nb\nc", Edited("a;x;y\r\nb\nc;", [](std::string* s) { RemoveLineComments(s, ";"); }));
    EXPECT_EQ("ac/*d", Edited("a/*b*/c/*d", [](std::string* s) { RemoveBlockComments(s, "/*", "*/"); }));
    EXPECT_EQ("a/*/b", Edited("a/*/b", [](std::string* s) { RemoveBlockComments(s, "/*", "*/"); }));
    EXPECT_EQ("12", Edited("", [](std::string* s) { Join({"1", "2"}, "", s); }));
    EXPECT_EQ("1, , 3", Edited("x", [](std::string* s) { Join({"1", "", "3"}, ", ", s); }));
    EXPECT_EQ("", Edited("x", [](std::string* s) { Join({}, ", ", s); }));
}

TEST(StringUtils, ComparesWithoutCase) {
    EXPECT_TRUE(CaseInsensitiveEqual("Path\\To", "pATH\\tO"));
    EXPECT_FALSE(CaseInsensitiveEqual("abc", "ab"));
    EXPECT_TRUE(CaseInsensitiveEqual(u"ABC", u"abc"));
    EXPECT_EQ(-1, CaseInsensitiveCompare("AB", "abc"));
    EXPECT_EQ(-1, CaseInsensitiveCompare("a text of Many words", "A TEXT OF MANY ZEBRAS"));
    EXPECT_EQ(1, CaseInsensitiveCompare("a", "\xE4"));  // bytes are signed
    EXPECT_EQ(-1, CaseInsensitiveCompare(u"a", u"\u00E4"));
}

TEST(StringUtils, HashesSignedCharacters) {
    EXPECT_EQ(0, Hash("", false));
    EXPECT_EQ(0x6783, Hash("abc", false));
    EXPECT_EQ(Hash("ABC", false), Hash("aBc", true));
    EXPECT_EQ(0x6783, Hash(std::string("abc\0d", 5), false));
    EXPECT_EQ(0x0FFFFF14, Hash("\xE4", false));  // -28
}

}  // namespace
