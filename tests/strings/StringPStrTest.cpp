#include "strings/Support.h"
#include "support/Test.h"
#include <tessel/memory/MemoryManager.h>
#include <tessel/strings/StringPStr.h>

using namespace tessel::test;

namespace {

TEST(StringPStr, Copies) {
    P to;
    EXPECT_EACH(TextOf(PStrCpy(to, P("hello"))) == "hello", TextOf(PStrNCpy(to, P("hello"), 3)) == "he",
                TextOf(PStrNCpy(to, P("hello"), 100)) == "hello", TextOf(PStrNCpy(to, P("hello"), 1)) == "");
    PStrCpy(to, P("x"));
    EXPECT_EQ("x", TextOf(PStrNCpy(to, P("hello"), 0)));

    P big(std::string(200, 'a'));
    EXPECT_EACH(PStrCat(big, P(std::string(200, 'b'))) == 255,
                std::string(200, 'a') + std::string(55, 'b') == big.Text(), PStrCat(P("x"), P("y")) == 2);

    char text[256];
    EXPECT_EACH(PToCStr(big, text) == 255, big.Text() == text, CToPStr(std::string(300, 'c').c_str(), to) == 255,
                std::string(255, 'c') == to.Text());

    PStr copy = PStrDup(P("dup"));
    EXPECT_EACH(TextOf(copy) == "dup", DSDisposePtr(copy) == kNoErr, PStrDup(nullptr) == nullptr);
}

TEST(StringPStr, Terminates) {
    uint8 text[257];
    std::fill(std::begin(text), std::end(text), 'x');
    text[0] = 2;
    EXPECT_EACH(PStrNullTerminate(text) == 2, text[3] == 0, PStrNullTerminate(nullptr) == 0,
                PStrTerminateIfPossible(nullptr) == 0, PStrCmp(P("a"), nullptr) == 1, PStrCmp(nullptr, P("a")) == -1,
                PStrCaseCmp(P("a"), nullptr) == 1, PStrCaseCmp(nullptr, nullptr) == 0, PStrEndsWith(nullptr, ""),
                !PStrEndsWith(nullptr, "a"));
    text[0] = 255;
    EXPECT_EACH(PStrTerminateIfPossible(text) == 255, text[255] == 'x', PStrNullTerminate(text) == 255, text[255] == 0,
                text[0] == 255, text[256] == 'x');
}

TEST(StringPStr, Searches) {
    P text("one Two one");
    EXPECT_EACH(PStrInPStr(text, 0, P("ONE")) == 3, PStrInPStr(text, 1, P("one")) == 11,
                PStrInPStr(text, 9, P("one")) == -1, PStrInPStr(text, 0, P("")) == -1,
                PStrInPStr(text, 11, P("e")) == -1, PStrInPStr(text, INT32_MAX, P("e")) == -1,
                PStrInPStr(text, 0, P("two one and more")) == -1);

    P file("FILE.TXT");
    EXPECT_EACH(PStrEndsWith(file, ".txt"), !PStrEndsWith(file, ".TXT"), PStrEndsWith(file, ""),
                !PStrEndsWith(P("t"), "txt"));
}

TEST(StringPStr, SplitsAtTheFirstUnescapedCharacter) {
    const auto split = [](CStr text) {
        P first("junk"), second("junk");
        const bool found = PStrSplitAtChar(P(text), ',', first, second);
        return first.Text() + (found ? "|" : "!") + second.Text();
    };
    EXPECT_EACH(split("a\\,b,c") == "a,b|c", split("a,b,c") == "a|b,c", split(",b") == "|b", split("a,") == "a|",
                split("abc") == "abc!", split("a\\,b") == "a,b!", split("") == "!", split("a\\b,") == "a\\b|");
    P left, text("one,and more");
    EXPECT_EACH(PStrSplitAtChar(text, ',', left, text), text.Text() == "and more");  // over its own rest
}

TEST(StringPStr, Replaces) {
    P to;
    EXPECT_EACH(PStrFindReplace(to, P("aXXbXXX"), "XX", "-"), to.Text() == "a-b-X",
                !PStrFindReplace(to, P("abc"), "XX", "-"), to.Text() == "abc", !PStrFindReplace(to, P("abc"), "", "-"),
                to.Text() == "abc", PStrFindReplace(to, to, "abc", std::string(255, 'y').c_str()),
                std::string(255, 'y') == to.Text(), !PStrFindReplace(to, P(std::string(200, 'x')), "x", "xx"),
                to.Text() == "");
}

TEST(StringPStr, HashesAsElf) {
    EXPECT_EACH(PStrHash32(nullptr, false) == 0, PStrHash32(P(""), false) == 0, PStrHash32(P("abc"), false) == 0x6783,
                PStrHash32(P("printf and \xE4 more"), false) == 0x0498D2B5,
                PStrHash32(P("ABC"), false) == PStrHash32(P("aBc"), true),
                PStrHash32(P(std::string(255, '\xFF')), false) <= 0x0FFFFFFF);
}

}  // namespace
