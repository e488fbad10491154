#include "strings/Support.h"
#include "support/Test.h"
#include <tessel/strings/StringLStr.h>
#include <tessel/strings/StringPStr.h>

using namespace tessel::test;

namespace {

// PStrs compare by the same rules.
TEST(StringLStr, ComparesWithNullAsEmpty) {
    const struct {
        CStr a, b;  // null: a null pointer
        int32 exact, noCase;
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
                  {"a text of words A", "a text of words a", 'A' - 'a', 0}};
    for (const auto& c : kCases) {
        uint8 aRoom[64], bRoom[64];
        auto* a = reinterpret_cast<LStrPtr>(aRoom);
        auto* b = reinterpret_cast<LStrPtr>(bRoom);
        CToLStr(c.a, a);
        CToLStr(c.b, b);
        EXPECT_EACH(c.exact == LStrCmp(c.a ? a : nullptr, c.b ? b : nullptr),
                    c.noCase == LStrCaseCmp(c.a ? a : nullptr, c.b ? b : nullptr),
                    (c.exact == 0) == LStrEqual(c.a ? a : nullptr, c.b ? b : nullptr));
        const uint8* aBytes = c.a ? a->bytes : nullptr;
        const uint8* bBytes = c.b ? b->bytes : nullptr;
        EXPECT_EACH(c.exact == PtrLenStrCmp(aBytes, a->count, bBytes, b->count),
                    c.noCase == PtrLenStrCaseCmp(aBytes, a->count, bBytes, b->count));
        if (!c.a || !c.b) continue;
        P pa(c.a), pb(c.b);
        ConstPStr aText = pa, bText = pb;
        EXPECT_EACH(c.exact == PLStrCmp(pa, b), c.noCase == PLStrCaseCmp(pa, b), c.exact == PPStrCmp(&aText, &bText),
                    c.noCase == PPStrCaseCmp(&aText, &bText), (c.exact == 0) == PPStrEqual(&aText, &bText),
                    (c.noCase == 0) == PPStrCaseEqual(&aText, &bText));
    }
    EXPECT_EACH(LHStrCmp(nullptr, L("abc")) == -3, LHStrCaseCmp(L("ab"), nullptr) == 2,
                LHStrCmp(L("abc"), L("abd")) == -1, LHStrEqual(nullptr, nullptr), !LHStrEqual(L("abc"), L("abd")));
}

TEST(StringLStr, ConvertsToTheCallersBuffers) {
    ReportRecorder reports;
    char text[16] = "junk";
    L abc("abc");
    EXPECT_EACH(LToCStr(*abc, text) == 3, text == "abc", LToCStr(nullptr, text) == 0, text == "",
                LToCStrN(*abc, text, 3) == 2, text == "ab", LToCStrNUnchecked(*abc, text, 0) == 0, text == "ab");

    int32 length = -1;
    L withZero(std::string_view("a\0b", 3));
    EXPECT_EACH(LToCStrNChecked(*withZero, text, 10, &length) == kEmbeddedZeroErr, length == 3,
                std::memcmp(text, "a\0b", 4) == 0, LToCStrNChecked(*withZero, text, 2, &length) == kNoErr, length == 1);

    P p;
    EXPECT_EACH(LToPStr(*abc, p) == 3, p.Text() == "abc", reports.Count() == 0u,
                LToPStr(*L(std::string(300, 'x')), p) == 255, std::string(255, 'x') == p.Text(),
                reports.Has(kDebugWarning, "LStr truncated when converting to PStr. Original LStr length=300"));
}

TEST(StringLStr, MakesAndReleasesHandles) {
    L text;
    EXPECT_EACH(PToLHStr(P("abc"), &text) == kNoErr, text.Text() == "abc", text.Size() == 7u,
                CToLHStr("defgh", &text) == kNoErr, text.Text() == "defgh", text.Size() == 9u,
                PStrToDSLStr(P("x"), &text) == kNoErr, text.Text() == "x", LStrFromPtr(&text, 5, nullptr) == kNoErr,
                *&text == nullptr, LStrFromPtr(nullptr, 1, "x") == kArgErr);

    ReportRecorder reports;
    EXPECT_EACH(CToLHStr("abc", nullptr) == kArgErr, PToLHStr(P("abc"), nullptr) == kArgErr,
                (std::vector<std::string>{"CToLHStr FAILED:abc, size 3, 0x00000000",
                                          "PToLHStr FAILED:abc, size 3, 0x00000000"}) == reports.Texts(kDebugInfo));
}

TEST(StringLStr, AppendsExactlyOrWithRoomLeft) {
    L text("ab");
    EXPECT_EACH(LStrCat(text, *L("cd")) == kNoErr, text.Text() == "abcd", text.Size() == 8u,
                LStrCat(text, nullptr) == kNoErr);

    ASSERT_EQ(kNoErr, DSSetHandleSize(reinterpret_cast<UHandle>(*&text), 100));
    EXPECT_EACH(LStrCatEfficient(text, *L("ef")) == kNoErr, LStrAppendChar(text, 'g') == kNoErr, text.Size() == 100u);
    EXPECT_EQ(kNoErr, LStrCat(text, *text));  // its own text
    EXPECT_EQ("abcdefgabcdefg", text.Text());
    EXPECT_EACH(text.Size() == 18u, LStrCat(nullptr, *text) == kArgErr,
                LStrFromPtr(&text, 4, (*LStrHandle(text))->bytes + 3) == kNoErr, text.Text() == "defg",
                text.Size() == 8u, LStrAppendChar(text, 0) == kNoErr,
                LStrPrependCStr(&text, reinterpret_cast<CStr>((*LStrHandle(text))->bytes + 1)) == kNoErr,
                text.Text() == std::string("efgdefg\0", 8));
    EXPECT_EQ(kNoErr, LStrFromPtr(&text, 12, *LStrHandle(text)));  // all of its block, its count included
    EXPECT_EQ("efgdefg", text.Text().substr(4, 7));
    EXPECT_EQ(16u, text.Size());

    L made;
    EXPECT_EACH(LStrAppendPStr(&made, nullptr) == kNoErr, *&made == nullptr,
                LStrAppendPStr(&made, P("world")) == kNoErr, LStrAppendCStr(&made, "!") == kNoErr,
                LStrPrependCStr(&made, "hello ") == kNoErr, made.Text() == "hello world!");
    L none;
    EXPECT_EACH(LStrPrependCStr(&none, "x") == kNoErr, *&none == nullptr);

    L counted("ab");
    EXPECT_EACH(LStrHNullTerminate(counted) == kNoErr, counted.Text() == std::string("ab\0", 3));

    LStrToUpper(made);
    EXPECT_EQ("HELLO WORLD!", made.Text());
    LStrToLower(made);
    EXPECT_EQ("hello world!", made.Text());
    LStrToUpper(nullptr);
}

}  // namespace
