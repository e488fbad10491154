#include "strings/Support.h"
#include "support/Test.h"
#include <tessel/strings/StringCPStr.h>
#include <tessel/strings/StringFmtPrint.h>
#include <tessel/strings/ovhandle.h>
#include <tessel/strings/ovstring.h>

using namespace tessel;
using namespace tessel::test;

namespace {

std::string TextOf(const OVSubString& view) {
    std::string text;
    EXPECT_EQ(kNoErr, view.CopyToNarrowString(text));
    return text;
}

TEST(OVHandle, ResizesAFieldInPlace) {
    OVHandle handle;
    uint8* field = nullptr;
    EXPECT_EQ(kArgErr, handle.ResizeField(field, 0, 1));
    ASSERT_EQ(kNoErr, handle.Resize(6));
    std::memcpy(*handle.Handle(), "abcdef", 6);
    field = *handle.Handle() + 2;
    ASSERT_EQ(kNoErr, handle.ResizeField(field, 2, 100));
    EXPECT_EACH(*handle.Handle() + 2 == field, handle.Size() == 104u, std::memcmp(field + 100, "ef", 2) == 0);
    ASSERT_EQ(kNoErr, handle.ResizeField(field, 100, 1));
    EXPECT_EACH(std::string(*handle.Handle(), *handle.Handle() + handle.Size()) == std::string("abcef"),
                handle.ResizeField(field, 4, 0) == kArgErr);

    ReportRecorder reports;
    UHandle held = handle.Handle();
    handle.AttachHandle(DSNewHandle(1));
    EXPECT_TRUE(reports.Has(kDebugFatal, "Can't attach to non null OVHandle."));
    DSDisposeHandle(held);
    OVHandle moved(std::move(handle));
    EXPECT_EACH(moved.Size() == 1u, moved.Resize(0) == kNoErr, moved.Handle() == nullptr, moved.Size() == 0u);
}

TEST(OVString, OwnsAText) {
    OVString text;
    EXPECT_EACH(text.Length() == 0, text.Printf("%d", 12) == kNoErr,
                text.AppendPrintf(reinterpret_cast<const unsigned char*>("%s"), "ab") == kNoErr);
    char buffer[4] = "xyz";
    text.CopyToCStr(buffer, 4);
    EXPECT_EACH(buffer == "12a", text.Assign(text.Bytes() + 2, 2) == kNoErr);
    P p;
    text.CopyToPStr(p);
    EXPECT_EACH(p.Text() == "ab", text.Size() == 6u, text.Resize(0) == kNoErr, text.LHandle() == nullptr,
                text.Resize(-1) == kArgErr);
    ReportRecorder reports;
    char one[] = "x";
    text.CopyToCStr(one, 0);
    text.CopyToCStr(one + 1, 1);
    EXPECT_EQ('x', one[0]);
    text.CopyToCStr(one, 1);
    EXPECT_EQ(0, one[0]);
    EXPECT_TRUE(reports.Has(kDebugError, "Bad Arg"));
    va_list none = {};
    EXPECT_EACH(OVSubStringPrintf(nullptr, false, "x", none) == kArgErr, reports.Has(kDebugError, "Bad string ptr"));
}

// The same edits on every kind that can be edited, and what is stored then.
template <class Stored>
void CheckEdits(OVSubString view, Stored stored) {
    EXPECT_EACH(TextOf(view) == "one", view.AppendCStr(" two three") == kNoErr, stored() == "one two three",
                view.ReplaceCStr("2", 4, 3) == kNoErr, view.InsertCStr("0 ", 0) == kNoErr);
    EXPECT_EQ(kNoErr, view.ReplaceCStr("!", -5, 0));  // an offset outside appends
    EXPECT_EQ("0 one 2 three!", stored());
    EXPECT_EQ(kNoErr, view.Append(view.Bytes() + 2, 3));  // from its own text
    EXPECT_EQ("0 one 2 three!one", stored());
    EXPECT_EQ(kNoErr, view.AssignCStr(" \t trimmed \r\n"));
    view.TrimWhitespace();
    EXPECT_EACH(view.Resize(INT32_MAX) != kNoErr, TextOf(view) == "trimmed", stored() == " \t trimmed \r\n",
                view.AppendPrintf(" %d", 7) == kNoErr, stored() == "trimmed 7");
    const FmtBytes own = {view.Bytes() + 7, 2};
    EXPECT_EACH(view.AppendPrintf("%h%h,", &own, &own) == kNoErr, stored() == "trimmed 7 7 7,",
                view.AssignPStr(P("p")) == kNoErr, view.AppendBSTR(u"\u20ACuro", 2) == kNoErr,
                stored() == "p\xE2\x82\xACu", view.Assign(nullptr, 0) == kNoErr, stored() == "",
                view.Printf("%s", "again") == kNoErr, stored() == "again");
}

TEST(OVSubString, EditsInPlace) {
    P pstr("one");
    char buffer[256] = "one";
    OVString string;
    ASSERT_EQ(kNoErr, string.Assign("one", 3));
    L handle("one");
    CPStrHandle list = nullptr;
    ASSERT_EQ(kNoErr, CPStrSetToNEmptyStrings(&list, 2));
    ASSERT_EQ(kNoErr, CPStrInsert(list, P("one"), 1));
    ASSERT_EQ(kNoErr, CPStrReplace(list, P("after"), 2));
    const auto element = [&] { return test::TextOf(CPStrIndex(list, 1)); };

    CheckEdits(OVSubString::OnPStr(pstr), [&] { return pstr.Text(); });
    CheckEdits(OVSubString(256, buffer), [&] { return std::string(buffer); });
    CheckEdits(OVSubString(&string), [&] { return TextOf(string); });
    CheckEdits(OVSubString(&handle), [&] { return handle.Text(); });
    CheckEdits(OVSubString(list, 1), element);
    EXPECT_EACH(test::TextOf(CPStrIndex(list, 0)) == "", test::TextOf(CPStrIndex(list, 2)) == "after");
    EXPECT_EQ(kNoErr, OVSubString(list, 1).Append(OVSubString(list, 2)));  // from a part of the list that moves
    EXPECT_EQ("againafter", element());
    DSDisposeHandle(reinterpret_cast<UHandle>(list));
}

TEST(OVSubString, RefusesWhatDoesNotFit) {
    char four[4] = "";
    OVSubString buffer(4, four);
    EXPECT_EACH(buffer.AssignCStr("abc") == kNoErr, buffer.AssignCStr("abcd") == kArgErr, four == "abc",
                buffer.Printf("%d", 1234) == kArgErr);
    for (const auto& [length, taken] : {std::pair{-1, 0}, {2, 2}, {3, 3}, {4, 3}}) {
        char bytes[4] = {'a', 'b', 'c', 'd'};
        EXPECT_EACH(TextOf(OVSubString(4, bytes, length)) == std::string("abc", static_cast<size_t>(taken)),
                    bytes[taken] == 0);
    }

    P p;
    OVSubString pstr = OVSubString::OnPStr(p);
    EXPECT_EACH(pstr.Resize(254) == kNoErr, pstr.Resize(255) == kArgErr);
    P full(std::string(255, 'x'));
    EXPECT_EACH(std::string(255, 'x') == TextOf(OVSubString::OnPStr(full)), std::string(255, 'x') == full.Text());

    CPStrHandle list = nullptr;
    ASSERT_EQ(kNoErr, CPStrSetToNEmptyStrings(&list, 1));
    EXPECT_EACH(OVSubString(list, 0).Resize(255) == kNoErr, OVSubString(list, 0).Resize(256) == kArgErr);
    ASSERT_EQ(kNoErr, CPStrClear(list));
    EXPECT_EQ(kArgErr, OVSubString(list, 0).Resize(1));
    DSDisposeHandle(reinterpret_cast<UHandle>(list));
}

struct OddKind : OVSubString {
    explicit OddKind(int32 kind) : OVSubString("abc", 3, kind) {}
};

TEST(OVSubString, RefusesToEditReadOnlyText) {
    ReportRecorder reports;
    L text("abc");
    OVString string;
    ASSERT_EQ(kNoErr, string.Assign("abc", 3));
    for (OVSubString view : {OVSubString("abc"), OVSubString(string), OVSubString(static_cast<LStrHandle>(text)),
                             OVSubString(*text), OVSubString(OddKind(2)), OVSubString(OddKind(3))}) {
        EXPECT_EACH(view.AssignCStr("x") == kArgErr, view.ReplaceCStr("x", 0, 2) == kArgErr,
                    view.ReplaceCStr("x", 0, 1) == kArgErr, TextOf(view) == "abc");
    }
    EXPECT_EQ(std::vector<std::string>(6, "Can't Change Fixed Strings!"), reports.Texts(kDebugInfo));

    OVSubString odd = OddKind(9);
    EXPECT_EACH(odd.Resize(2) == kNoErr, reports.Has(kDebugWarning, "OVSubString::Resize: Unknown m_class (9)"),
                odd.ReplaceCStr("", 0, 1) == kArgErr, TextOf(odd) == "abc");

    reports.Clear();
    OVTempString temp;
    ASSERT_EQ(kNoErr, temp.AssignCStr("abc"));
    EXPECT_EACH(temp.ReplaceCStr("x", 2, 2) == kArgErr,
                (std::vector<std::string>{"BadParams", "Bad Params:at:2\tdstLen:2\tSize:3 \n"}) == reports.Texts());
}

TEST(OVTempString, MovesBetweenItsBuffers) {
    OVTempString temp;
    EXPECT_EQ(0, temp.Length());
    const uint8* room = temp.Bytes();
    EXPECT_EACH(temp.AssignCStr("start") == kNoErr, room == temp.Bytes(),
                temp.Append(std::string(295, 'x').data(), 295) == kNoErr, room != temp.Bytes(),
                "start" + std::string(295, 'x') == TextOf(temp), temp.Resize(1000) == kNoErr, temp.Resize(6) == kNoErr,
                room == temp.Bytes(), TextOf(temp) == "startx");
}

TEST(OVSubString, Compares) {
    EXPECT_EACH(OVSubString("").CompareCStr("abc") == -1, OVSubString("").CompareCStr("") == 0,
                OVSubString("abc").CompareCStr("") == 1, OVSubString("abc").CompareCStr("abd") == -1,
                OVSubString("abc").CompareCStr("ab") == 1, 'A' - 'a' == OVSubString("A").Compare("a", 1),
                OVSubString("ABC").CompareNC(OVSubString("abc")) == 0, OVSubString("ABC").CompareNCCStr("abd") == -1,
                OVSubString("").CompareNCCStr("a") == -1, OVSubString("").CompareNCCStr("") == 0,
                OVSubString("a").CompareNCCStr("") == 1, OVSubString("b").CompareNCCStr("A") == 1);
}

TEST(OVSubString, Searches) {
    const OVSubString text("one two ONE");
    EXPECT_EACH(text.FindFirstOfCStr(" t", 0) == 3, text.FindFirstOf(OVSubString(" t"), 4) == 4,
                text.FindFirstOfCStr("xyz", 0) == -1, text.FindFirstOfCStr("", 0) == -1,
                text.SearchCStr("one", -4) == 0, text.SearchCStr("one", 1) == -1, text.SearchNCCStr("one", 1) == 8,
                text.SearchNCCStr("ones", 8) == -1, OVSubString("abcd", 2).SearchNCCStr("cd", 0) == -1,
                text.SearchCStr("", 0) == -1, text.SearchCStr("one", 100) == -1);
}

TEST(OVSubString, SearchReplaceMayUseItsOwnText) {
    OVString own;
    ASSERT_EQ(kNoErr, own.Assign("XaX", 3));
    OVSubString view(&own);
    EXPECT_EACH(view.SearchReplace({view.Bytes(), 1}, {view.Bytes() + 1, 2}, nullptr) == kNoErr,
                TextOf(view) == "aXaaX");
    char small[5] = "abab";
    int32 count = -1;
    EXPECT_EACH(OVSubString(5, small).SearchReplace("a", "xx", &count) == kArgErr, small == "abab", count == 0);
}

// Replacing one occurrence after the other, as it is described.
TEST(OVSubString, SearchReplaceAgreesWithSingleEdits) {
    std::mt19937 random(5);
    const auto text = [&](size_t longest) {
        std::string made(random() % (longest + 1), 'a');
        for (char& c : made) c = static_cast<char>('a' + random() % 2);
        return made;
    };
    for (int i = 0; i < 20000; ++i) {
        const std::string before = text(40), find = text(4), replacement = text(4).substr(0, find.size() + 1);
        std::string expected = before;
        int32 found = 0;
        size_t at = find.empty() ? std::string::npos : expected.find(find);
        while (at != std::string::npos && found < 100) {
            ++found;
            expected.replace(at, find.size(), replacement);
            const size_t behind = at + replacement.size() + 1;
            at = expected.find(find, behind > find.size() ? behind - find.size() : 0);
        }
        OVTempString edited;
        ASSERT_EQ(kNoErr, edited.AssignCStr(before.c_str()));
        int32 count = -1;
        ASSERT_EQ(kNoErr, edited.SearchReplace(find.c_str(), replacement.c_str(), &count));
        ASSERT_EQ(expected, TextOf(edited)) << before << ' ' << find << ' ' << replacement;
        ASSERT_EQ(found, count);
    }
}

}  // namespace
