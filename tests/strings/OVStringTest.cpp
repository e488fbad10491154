#include "strings/Support.h"
#include "support/ReportRecorder.h"
#include <tessel/strings/StringCPStr.h>
#include <tessel/strings/StringFmtPrint.h>
#include <tessel/strings/ovhandle.h>
#include <tessel/strings/ovstring.h>

#include <cstring>
#include <random>

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
    EXPECT_EQ(*handle.Handle() + 2, field);
    EXPECT_EQ(104u, handle.Size());
    EXPECT_EQ(0, std::memcmp(field + 100, "ef", 2));
    ASSERT_EQ(kNoErr, handle.ResizeField(field, 100, 1));
    EXPECT_EQ(std::string("abcef"), std::string(*handle.Handle(), *handle.Handle() + handle.Size()));
    EXPECT_EQ(kArgErr, handle.ResizeField(field, 4, 0));

    ReportRecorder reports;
    UHandle held = handle.Handle();
    handle.AttachHandle(DSNewHandle(1));
    EXPECT_TRUE(reports.Has(kDebugFatal, "Can't attach to non null OVHandle."));
    DSDisposeHandle(held);
    OVHandle moved(std::move(handle));
    EXPECT_EQ(1u, moved.Size());
    EXPECT_EQ(kNoErr, moved.Resize(0));
    EXPECT_EQ(nullptr, moved.Handle());
}

TEST(OVString, OwnsAText) {
    OVString text;
    EXPECT_EQ(0, text.Length());
    EXPECT_EQ(kNoErr, text.Printf("%d", 12));
    EXPECT_EQ(kNoErr, text.AppendPrintf(reinterpret_cast<const unsigned char*>("%s"), "ab"));
    char buffer[4] = "xyz";
    text.CopyToCStr(buffer, 4);
    EXPECT_STREQ("12a", buffer);
    EXPECT_EQ(kNoErr, text.Assign(text.Bytes() + 2, 2));
    P p;
    text.CopyToPStr(p);
    EXPECT_EQ("ab", p.Text());
    EXPECT_EQ(6u, text.Size());
    EXPECT_EQ(kNoErr, text.Resize(0));
    EXPECT_EQ(nullptr, text.LHandle());
    EXPECT_EQ(kArgErr, text.Resize(-1));
    ReportRecorder reports;
    text.CopyToCStr(buffer, 0);
    EXPECT_TRUE(reports.Has(kDebugError, "Bad Arg"));
    va_list none = {};
    EXPECT_EQ(kArgErr, OVSubStringPrintf(nullptr, false, "x", none));
    EXPECT_TRUE(reports.Has(kDebugError, "Bad string ptr"));
}

// The same edits on every kind that can be edited, and what is stored then.
template <class Stored>
void CheckEdits(OVSubString view, Stored stored) {
    EXPECT_EQ("one", TextOf(view));
    EXPECT_EQ(kNoErr, view.AppendCStr(" two three"));
    EXPECT_EQ("one two three", stored());
    EXPECT_EQ(kNoErr, view.ReplaceCStr("2", 4, 3));
    EXPECT_EQ(kNoErr, view.InsertCStr("0 ", 0));
    EXPECT_EQ(kNoErr, view.ReplaceCStr("!", -5, 0));  // an offset outside appends
    EXPECT_EQ("0 one 2 three!", stored());
    EXPECT_EQ(kNoErr, view.Append(view.Bytes() + 2, 3));  // from its own text
    EXPECT_EQ("0 one 2 three!one", stored());
    EXPECT_EQ(kNoErr, view.AssignCStr(" \t trimmed \r\n"));
    view.TrimWhitespace();
    EXPECT_NE(kNoErr, view.Resize(INT32_MAX));
    EXPECT_EQ("trimmed", TextOf(view));
    EXPECT_EQ(" \t trimmed \r\n", stored());
    EXPECT_EQ(kNoErr, view.AppendPrintf(" %d", 7));
    EXPECT_EQ("trimmed 7", stored());
    const FmtBytes own = {view.Bytes() + 7, 2};
    EXPECT_EQ(kNoErr, view.AppendPrintf("%h%h,", &own, &own));
    EXPECT_EQ("trimmed 7 7 7,", stored());
    EXPECT_EQ(kNoErr, view.AssignPStr(P("p")));
    EXPECT_EQ(kNoErr, view.AppendBSTR(u"\u20ACuro", 2));
    EXPECT_EQ("p\xE2\x82\xACu", stored());
    EXPECT_EQ(kNoErr, view.Assign(nullptr, 0));
    EXPECT_EQ("", stored());
    EXPECT_EQ(kNoErr, view.Printf("%s", "again"));
    EXPECT_EQ("again", stored());
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
    EXPECT_EQ("", test::TextOf(CPStrIndex(list, 0)));
    EXPECT_EQ("after", test::TextOf(CPStrIndex(list, 2)));
    EXPECT_EQ(kNoErr, OVSubString(list, 1).Append(OVSubString(list, 2)));  // from a part of the list that moves
    EXPECT_EQ("againafter", element());
    DSDisposeHandle(reinterpret_cast<UHandle>(list));
}

TEST(OVSubString, RefusesWhatDoesNotFit) {
    char four[4] = "";
    OVSubString buffer(4, four);
    EXPECT_EQ(kNoErr, buffer.AssignCStr("abc"));
    EXPECT_EQ(kArgErr, buffer.AssignCStr("abcd"));
    EXPECT_STREQ("abc", four);
    EXPECT_EQ(kArgErr, buffer.Printf("%d", 1234));
    for (const auto& [length, taken] : {std::pair{-1, 0}, {2, 2}, {3, 3}, {4, 3}}) {
        char bytes[4] = {'a', 'b', 'c', 'd'};
        EXPECT_EQ(std::string("abc", static_cast<size_t>(taken)), TextOf(OVSubString(4, bytes, length)));
        EXPECT_EQ(0, bytes[taken]);
    }

    P p;
    OVSubString pstr = OVSubString::OnPStr(p);
    EXPECT_EQ(kNoErr, pstr.Resize(254));
    EXPECT_EQ(kArgErr, pstr.Resize(255));
    P full(std::string(255, 'x'));
    EXPECT_EQ(std::string(255, 'x'), TextOf(OVSubString::OnPStr(full)));
    EXPECT_EQ(std::string(255, 'x'), full.Text());

    CPStrHandle list = nullptr;
    ASSERT_EQ(kNoErr, CPStrSetToNEmptyStrings(&list, 1));
    EXPECT_EQ(kNoErr, OVSubString(list, 0).Resize(255));
    EXPECT_EQ(kArgErr, OVSubString(list, 0).Resize(256));
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
        EXPECT_EQ(kArgErr, view.AssignCStr("x"));
        EXPECT_EQ(kArgErr, view.ReplaceCStr("x", 0, 2));
        EXPECT_EQ(kArgErr, view.ReplaceCStr("x", 0, 1));
        EXPECT_EQ("abc", TextOf(view));
    }
    EXPECT_EQ(std::vector<std::string>(6, "Can't Change Fixed Strings!"), reports.Texts(kDebugInfo));

    OVSubString odd = OddKind(9);
    EXPECT_EQ(kNoErr, odd.Resize(2));
    EXPECT_TRUE(reports.Has(kDebugWarning, "OVSubString::Resize: Unknown m_class (9)"));
    EXPECT_EQ(kArgErr, odd.ReplaceCStr("", 0, 1));
    EXPECT_EQ("abc", TextOf(odd));

    reports.Clear();
    OVTempString temp;
    ASSERT_EQ(kNoErr, temp.AssignCStr("abc"));
    EXPECT_EQ(kArgErr, temp.ReplaceCStr("x", 2, 2));
    EXPECT_EQ((std::vector<std::string>{"BadParams", "Bad Params:at:2\tdstLen:2\tSize:3 \n"}), reports.Texts());
}

TEST(OVTempString, MovesBetweenItsBuffers) {
    OVTempString temp;
    EXPECT_EQ(0, temp.Length());
    const uint8* room = temp.Bytes();
    EXPECT_EQ(kNoErr, temp.AssignCStr("start"));
    EXPECT_EQ(room, temp.Bytes());
    EXPECT_EQ(kNoErr, temp.Append(std::string(295, 'x').data(), 295));
    EXPECT_NE(room, temp.Bytes());
    EXPECT_EQ("start" + std::string(295, 'x'), TextOf(temp));
    EXPECT_EQ(kNoErr, temp.Resize(1000));
    EXPECT_EQ(kNoErr, temp.Resize(6));
    EXPECT_EQ(room, temp.Bytes());
    EXPECT_EQ("startx", TextOf(temp));
}

TEST(OVSubString, Compares) {
    EXPECT_EQ(-1, OVSubString("").CompareCStr("abc"));
    EXPECT_EQ(0, OVSubString("").CompareCStr(""));
    EXPECT_EQ(1, OVSubString("abc").CompareCStr(""));
    EXPECT_EQ(-1, OVSubString("abc").CompareCStr("abd"));
    EXPECT_EQ(1, OVSubString("abc").CompareCStr("ab"));
    EXPECT_EQ('A' - 'a', OVSubString("A").Compare("a", 1));
    EXPECT_EQ(0, OVSubString("ABC").CompareNC(OVSubString("abc")));
    EXPECT_EQ(-1, OVSubString("ABC").CompareNCCStr("abd"));
}

TEST(OVSubString, Searches) {
    const OVSubString text("one two ONE");
    EXPECT_EQ(3, text.FindFirstOfCStr(" t", 0));
    EXPECT_EQ(4, text.FindFirstOf(OVSubString(" t"), 4));
    EXPECT_EQ(-1, text.FindFirstOfCStr("xyz", 0));
    EXPECT_EQ(-1, text.FindFirstOfCStr("", 0));
    EXPECT_EQ(0, text.SearchCStr("one", -4));
    EXPECT_EQ(-1, text.SearchCStr("one", 1));
    EXPECT_EQ(8, text.SearchNCCStr("one", 1));
    EXPECT_EQ(-1, text.SearchNCCStr("ones", 8));
    EXPECT_EQ(-1, text.SearchCStr("", 0));
    EXPECT_EQ(-1, text.SearchCStr("one", 100));
}

TEST(OVSubString, SearchReplaceMayUseItsOwnText) {
    OVString own;
    ASSERT_EQ(kNoErr, own.Assign("XaX", 3));
    OVSubString view(&own);
    EXPECT_EQ(kNoErr, view.SearchReplace({view.Bytes(), 1}, {view.Bytes() + 1, 2}, nullptr));
    EXPECT_EQ("aXaaX", TextOf(view));
    char small[5] = "abab";
    int32 count = -1;
    EXPECT_EQ(kArgErr, OVSubString(5, small).SearchReplace("a", "xx", &count));
    EXPECT_STREQ("abab", small);
    EXPECT_EQ(0, count);
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
