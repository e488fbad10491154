#include "strings/Support.h"
#include <tessel/memory/MemoryManager.h>
#include <tessel/strings/StringPStr.h>

using namespace tessel::test;

namespace {

TEST(StringPStr, Copies) {
    P to;
    EXPECT_EQ("hello", TextOf(PStrCpy(to, P("hello"))));
    EXPECT_EQ("he", TextOf(PStrNCpy(to, P("hello"), 3)));
    EXPECT_EQ("hello", TextOf(PStrNCpy(to, P("hello"), 100)));
    EXPECT_EQ("", TextOf(PStrNCpy(to, P("hello"), 1)));
    PStrCpy(to, P("x"));
    EXPECT_EQ("x", TextOf(PStrNCpy(to, P("hello"), 0)));

    P big(std::string(200, 'a'));
    EXPECT_EQ(255, PStrCat(big, P(std::string(200, 'b'))));
    EXPECT_EQ(std::string(200, 'a') + std::string(55, 'b'), big.Text());
    EXPECT_EQ(2, PStrCat(P("x"), P("y")));

    char text[256];
    EXPECT_EQ(255, PToCStr(big, text));
    EXPECT_EQ(big.Text(), text);
    EXPECT_EQ(255, CToPStr(std::string(300, 'c').c_str(), to));
    EXPECT_EQ(std::string(255, 'c'), to.Text());

    PStr copy = PStrDup(P("dup"));
    EXPECT_EQ("dup", TextOf(copy));
    EXPECT_EQ(kNoErr, DSDisposePtr(copy));
    EXPECT_EQ(nullptr, PStrDup(nullptr));
}

TEST(StringPStr, Terminates) {
    uint8 text[257];
    std::fill(std::begin(text), std::end(text), 'x');
    text[0] = 2;
    EXPECT_EQ(2, PStrNullTerminate(text));
    EXPECT_EQ(0, text[3]);
    text[0] = 255;
    EXPECT_EQ(255, PStrTerminateIfPossible(text));
    EXPECT_EQ('x', text[255]);
    EXPECT_EQ(255, PStrNullTerminate(text));
    EXPECT_EQ(0, text[255]);
    EXPECT_EQ(255, text[0]);
    EXPECT_EQ('x', text[256]);
}

TEST(StringPStr, Searches) {
    P text("one Two one");
    EXPECT_EQ(3, PStrInPStr(text, 0, P("ONE")));
    EXPECT_EQ(11, PStrInPStr(text, 1, P("one")));
    EXPECT_EQ(-1, PStrInPStr(text, 9, P("one")));
    EXPECT_EQ(-1, PStrInPStr(text, 0, P("")));
    EXPECT_EQ(-1, PStrInPStr(text, 11, P("e")));
    EXPECT_EQ(-1, PStrInPStr(text, INT32_MAX, P("e")));
    EXPECT_EQ(-1, PStrInPStr(text, 0, P("two one and more")));

    P file("FILE.TXT");
    EXPECT_TRUE(PStrEndsWith(file, ".txt"));
    EXPECT_FALSE(PStrEndsWith(file, ".TXT"));
    EXPECT_TRUE(PStrEndsWith(file, ""));
    EXPECT_FALSE(PStrEndsWith(P("t"), "txt"));
}

TEST(StringPStr, SplitsAtTheFirstUnescapedCharacter) {
    const struct {
        CStr text;
        bool split;
        CStr left;
        CStr right;
    } kCases[] = {{"a\\,b,c", true, "a,b", "c"}, {"a,b,c", true, "a", "b,c"}, {",b", true, "", "b"},
                  {"a,", true, "a", ""},         {"abc", false, "abc", ""},   {"a\\,b", false, "a,b", ""},
                  {"", false, "", ""},           {"a\\b,", true, "a\\b", ""}};
    for (const auto& c : kCases) {
        P left("junk");
        P right("junk");
        EXPECT_EQ(c.split, PStrSplitAtChar(P(c.text), ',', left, right)) << c.text;
        EXPECT_EQ(c.left, left.Text());
        EXPECT_EQ(c.right, right.Text());
    }
    P left;
    P text("one,and more");
    EXPECT_TRUE(PStrSplitAtChar(text, ',', left, text));  // over its own rest
    EXPECT_EQ("and more", text.Text());
}

TEST(StringPStr, Replaces) {
    P to;
    EXPECT_TRUE(PStrFindReplace(to, P("aXXbXXX"), "XX", "-"));
    EXPECT_EQ("a-b-X", to.Text());
    EXPECT_FALSE(PStrFindReplace(to, P("abc"), "XX", "-"));
    EXPECT_EQ("abc", to.Text());
    EXPECT_FALSE(PStrFindReplace(to, P("abc"), "", "-"));
    EXPECT_EQ("abc", to.Text());
    EXPECT_TRUE(PStrFindReplace(to, to, "abc", std::string(255, 'y').c_str()));
    EXPECT_EQ(std::string(255, 'y'), to.Text());
    EXPECT_FALSE(PStrFindReplace(to, P(std::string(200, 'x')), "x", "xx"));
    EXPECT_EQ("", to.Text());
}

TEST(StringPStr, HashesAsElf) {
    EXPECT_EQ(0, PStrHash32(nullptr, false));
    EXPECT_EQ(0, PStrHash32(P(""), false));
    EXPECT_EQ(0x6783, PStrHash32(P("abc"), false));
    EXPECT_EQ(0x0498D2B5, PStrHash32(P("printf and \xE4 more"), false));
    EXPECT_EQ(PStrHash32(P("ABC"), false), PStrHash32(P("aBc"), true));
    EXPECT_GE(0x0FFFFFFF, PStrHash32(P(std::string(255, '\xFF')), false));
}

}  // namespace
