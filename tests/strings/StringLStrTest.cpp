#include "strings/Support.h"
#include "support/ReportRecorder.h"
#include <tessel/strings/StringLStr.h>
#include <tessel/strings/StringPStr.h>

#include <cstring>

using namespace tessel::test;

namespace {

// PStrs compare by the same rules.
TEST(StringLStr, ComparesWithNullAsEmpty) {
    const struct {
        CStr a;  // null: a null pointer
        CStr b;
        int32 exact;
        int32 noCase;
    } kCases[] = {{nullptr, "", 0, 0},
                  {"", nullptr, 0, 0},
                  {nullptr, nullptr, 0, 0},
                  {nullptr, "a", -1, -1},
                  {"abc", nullptr, 1, 1},
                  {nullptr, "abc", -1, -1},
                  {"ab", "abc", -1, -1},
                  {"abcde", "ab", 3, 3},
                  {"ABC", "abd", 'A' - 'a', -1},
                  {"\xFF", "\x01", 254, 254},
                  {"B", "a", 'B' - 'a', 1},
                  {"same", "same", 0, 0},
                  {"SAME", "same", 'S' - 's', 0},
                  {"long enough for words A", "long enough for words a", 'A' - 'a', 0}};
    for (const auto& c : kCases) {
        uint8 aRoom[64];
        uint8 bRoom[64];
        auto* a = reinterpret_cast<LStrPtr>(aRoom);
        auto* b = reinterpret_cast<LStrPtr>(bRoom);
        CToLStr(c.a, a);
        CToLStr(c.b, b);
        EXPECT_EQ(c.exact, LStrCmp(c.a ? a : nullptr, c.b ? b : nullptr)) << (c.a ? c.a : "null");
        EXPECT_EQ(c.noCase, LStrCaseCmp(c.a ? a : nullptr, c.b ? b : nullptr)) << (c.a ? c.a : "null");
        EXPECT_EQ(c.exact == 0, LStrEqual(c.a ? a : nullptr, c.b ? b : nullptr));
        const uint8* aBytes = c.a ? a->bytes : nullptr;
        const uint8* bBytes = c.b ? b->bytes : nullptr;
        EXPECT_EQ(c.exact, PtrLenStrCmp(aBytes, a->count, bBytes, b->count));
        EXPECT_EQ(c.noCase, PtrLenStrCaseCmp(aBytes, a->count, bBytes, b->count));
        if (!c.a || !c.b) continue;
        P pa(c.a);
        P pb(c.b);
        ConstPStr aText = pa;
        ConstPStr bText = pb;
        EXPECT_EQ(c.exact, PLStrCmp(pa, b));
        EXPECT_EQ(c.noCase, PLStrCaseCmp(pa, b));
        EXPECT_EQ(c.exact, PPStrCmp(&aText, &bText));
        EXPECT_EQ(c.noCase, PPStrCaseCmp(&aText, &bText));
        EXPECT_EQ(c.exact == 0, PPStrEqual(&aText, &bText));
        EXPECT_EQ(c.noCase == 0, PPStrCaseEqual(&aText, &bText));
    }
    EXPECT_EQ(-3, LHStrCmp(nullptr, L("abc")));
    EXPECT_EQ(2, LHStrCaseCmp(L("ab"), nullptr));
    EXPECT_EQ(-1, LHStrCmp(L("abc"), L("abd")));
    EXPECT_TRUE(LHStrEqual(nullptr, nullptr));
    EXPECT_FALSE(LHStrEqual(L("abc"), L("abd")));
}

TEST(StringLStr, ConvertsToTheCallersBuffers) {
    ReportRecorder reports;
    char text[16] = "junk";
    L abc("abc");
    EXPECT_EQ(3, LToCStr(*abc, text));
    EXPECT_STREQ("abc", text);
    EXPECT_EQ(0, LToCStr(nullptr, text));
    EXPECT_STREQ("", text);
    EXPECT_EQ(2, LToCStrN(*abc, text, 3));
    EXPECT_STREQ("ab", text);
    EXPECT_EQ(0, LToCStrNUnchecked(*abc, text, 0));
    EXPECT_STREQ("ab", text);

    int32 length = -1;
    L withZero(std::string_view("a\0b", 3));
    EXPECT_EQ(kEmbeddedZeroErr, LToCStrNChecked(*withZero, text, 10, &length));
    EXPECT_EQ(3, length);
    EXPECT_EQ(0, std::memcmp(text, "a\0b", 4));
    EXPECT_EQ(kNoErr, LToCStrNChecked(*withZero, text, 2, &length));
    EXPECT_EQ(1, length);

    P p;
    EXPECT_EQ(3, LToPStr(*abc, p));
    EXPECT_EQ("abc", p.Text());
    EXPECT_EQ(0u, reports.Count());
    EXPECT_EQ(255, LToPStr(*L(std::string(300, 'x')), p));
    EXPECT_EQ(std::string(255, 'x'), p.Text());
    EXPECT_TRUE(reports.Has(kDebugWarning, "LStr truncated when converting to PStr. Original LStr length=300"));
}

TEST(StringLStr, MakesAndReleasesHandles) {
    L text;
    EXPECT_EQ(kNoErr, PToLHStr(P("abc"), &text));
    EXPECT_EQ("abc", text.Text());
    EXPECT_EQ(7u, text.Size());
    EXPECT_EQ(kNoErr, CToLHStr("defgh", &text));
    EXPECT_EQ("defgh", text.Text());
    EXPECT_EQ(9u, text.Size());
    EXPECT_EQ(kNoErr, PStrToDSLStr(P("x"), &text));
    EXPECT_EQ("x", text.Text());
    EXPECT_EQ(kNoErr, LStrFromPtr(&text, 5, nullptr));
    EXPECT_EQ(nullptr, *&text);
    EXPECT_EQ(kArgErr, LStrFromPtr(nullptr, 1, "x"));

    ReportRecorder reports;
    EXPECT_EQ(kArgErr, CToLHStr("abc", nullptr));
    EXPECT_EQ(kArgErr, PToLHStr(P("abc"), nullptr));
    EXPECT_EQ((std::vector<std::string>{"CToLHStr FAILED:abc, size 3, 0x00000000",
                                        "PToLHStr FAILED:abc, size 3, 0x00000000"}),
              reports.Texts(kDebugInfo));
}

TEST(StringLStr, AppendsExactlyOrWithRoomLeft) {
    L text("ab");
    EXPECT_EQ(kNoErr, LStrCat(text, *L("cd")));
    EXPECT_EQ("abcd", text.Text());
    EXPECT_EQ(8u, text.Size());
    EXPECT_EQ(kNoErr, LStrCat(text, nullptr));

    ASSERT_EQ(kNoErr, DSSetHandleSize(reinterpret_cast<UHandle>(*&text), 100));
    EXPECT_EQ(kNoErr, LStrCatEfficient(text, *L("ef")));
    EXPECT_EQ(kNoErr, LStrAppendChar(text, 'g'));
    EXPECT_EQ(100u, text.Size());
    EXPECT_EQ(kNoErr, LStrCat(text, *text));  // its own text
    EXPECT_EQ("abcdefgabcdefg", text.Text());
    EXPECT_EQ(18u, text.Size());
    EXPECT_EQ(kArgErr, LStrCat(nullptr, *text));
    EXPECT_EQ(kNoErr, LStrFromPtr(&text, 4, (*LStrHandle(text))->bytes + 3));
    EXPECT_EQ("defg", text.Text());
    EXPECT_EQ(8u, text.Size());
    EXPECT_EQ(kNoErr, LStrAppendChar(text, 0));
    EXPECT_EQ(kNoErr, LStrPrependCStr(&text, reinterpret_cast<CStr>((*LStrHandle(text))->bytes + 1)));
    EXPECT_EQ(std::string("efgdefg\0", 8), text.Text());
    EXPECT_EQ(kNoErr, LStrFromPtr(&text, 12, *LStrHandle(text)));  // all of its block, its count included
    EXPECT_EQ("efgdefg", text.Text().substr(4, 7));
    EXPECT_EQ(16u, text.Size());

    L made;
    EXPECT_EQ(kNoErr, LStrAppendPStr(&made, nullptr));
    EXPECT_EQ(nullptr, *&made);
    EXPECT_EQ(kNoErr, LStrAppendPStr(&made, P("world")));
    EXPECT_EQ(kNoErr, LStrAppendCStr(&made, "!"));
    EXPECT_EQ(kNoErr, LStrPrependCStr(&made, "hello "));
    EXPECT_EQ("hello world!", made.Text());
    L none;
    EXPECT_EQ(kNoErr, LStrPrependCStr(&none, "x"));
    EXPECT_EQ(nullptr, *&none);

    L counted("ab");
    EXPECT_EQ(kNoErr, LStrHNullTerminate(counted));
    EXPECT_EQ(std::string("ab\0", 3), counted.Text());

    LStrToUpper(made);
    EXPECT_EQ("HELLO WORLD!", made.Text());
    LStrToLower(made);
    EXPECT_EQ("hello world!", made.Text());
    LStrToUpper(nullptr);
}

}  // namespace
