// The list forms: CPStr, CLStr, _LStrArray and CPStrList.
#include "strings/Support.h"
#include "support/Test.h"
#include <tessel/strings/CPStrList.h>
#include <tessel/strings/StringCLStr.h>
#include <tessel/strings/StringCPStr.h>
#include <tessel/strings/StringLStrArray.h>
#include <tessel/strings/StringPStr.h>

using namespace tessel;
using namespace tessel::test;

namespace {

using tessel::test::Texts;

template <class T>
std::string BlockOf(T** handle) {
    auto* plain = reinterpret_cast<UHandle>(handle);
    return {reinterpret_cast<const char*>(*plain), DSGetHandleSize(plain)};
}

std::string Bytes(std::initializer_list<int> bytes) {
    return {bytes.begin(), bytes.end()};
}

template <class T>
void Dispose(T** handle) {
    EXPECT_EQ(kNoErr, DSDisposeHandle(reinterpret_cast<UHandle>(handle)));
}

CPStrHandle NewCPStr(const Texts& texts) {
    CPStrHandle list = nullptr;
    EXPECT_EQ(kNoErr, CPStrSetToNEmptyStrings(&list, 0));
    for (const std::string& text : texts) EXPECT_EQ(kNoErr, CPStrInsert(list, P(text), INT32_MAX));
    return list;
}

Texts Elements(CPStrHandle list) {
    Texts texts;
    for (int32 i = 0; list && i < (*list)->count; ++i) texts.push_back(TextOf(CPStrIndex(list, i)));
    return texts;
}

TEST(StringCPStr, LaysElementsEndToEnd) {
    CPStrHandle list = NewCPStr({"ab", "", "c"});
    EXPECT_EACH(Bytes({3, 0, 0, 0, 2, 'a', 'b', 0, 1, 'c'}) == BlockOf(list), CPStrSize(*list) == 10u,
                TextOf(CPStrIndex(list, 99)) == "c", TextOf(CPStrIndex(list, -1)) == "ab", CPStrClear(list) == kNoErr,
                Bytes({0, 0, 0, 0}) == BlockOf(list), CPStrRemove(list, 0) == kArgErr,
                CPStrReplace(list, P("x"), 0) == kArgErr, CPStrSetToNEmptyStrings(&list, 3) == kNoErr,
                Bytes({3, 0, 0, 0, 0, 0, 0}) == BlockOf(list), CPStrClear(nullptr) == kArgErr,
                CPStrSetToNEmptyStrings(nullptr, 1) == kArgErr);
    Dispose(list);
}

TEST(StringCPStr, EditsLikeAVector) {
    std::mt19937 random(2);
    CPStrHandle list = NewCPStr({});
    Texts model;
    for (int i = 0; i < 500; ++i) {
        const std::string text(random() % 5 == 0 ? 255 : random() % 6, static_cast<char>('a' + random() % 26));
        const auto index = static_cast<int32>(random() % 30) - 5;
        const auto place = static_cast<size_t>(std::clamp<int32>(index, 0, static_cast<int32>(model.size())));
        const size_t element = std::min(place, model.empty() ? 0 : model.size() - 1);
        if (random() % 2 || model.empty()) {
            ASSERT_EQ(kNoErr, CPStrInsertEfficient(list, P(text), index, random() % 2 != 0));
            model.insert(model.begin() + static_cast<std::ptrdiff_t>(place), text);
        } else if (random() % 2) {
            ASSERT_EQ(kNoErr, CPStrReplace(list, P(text), index));
            model[element] = text;
        } else {
            ASSERT_EQ(kNoErr, CPStrRemove(list, index));
            model.erase(model.begin() + static_cast<std::ptrdiff_t>(element));
        }
        ASSERT_EQ(model, Elements(list));
    }
    // Its own element as the one to insert.
    ASSERT_EQ(kNoErr, CPStrInsert(list, CPStrIndex(list, 1), 0));
    EXPECT_EACH(model[1] == TextOf(CPStrIndex(list, 0)),
                CPStrSize(*list) == DSGetHandleSize(reinterpret_cast<UHandle>(list)));

    ReportRecorder reports;
    EXPECT_EACH(CPStrInsert(nullptr, P("x"), 0) == kGenericErr, CPStrInsert(list, nullptr, 0) == kGenericErr,
                reports.CountAt(kDebugError) == 2u, reports.Has(kDebugError, "Bad inputs to CPStrInsertEfficient"));
    Dispose(list);
}

TEST(StringCPStr, ComparesAndSearches) {
    CPStrHandle a = NewCPStr({"one", "Two"}), b = NewCPStr({"one", "two", "three"});
    EXPECT_EACH('T' - 't' == CPStrCmp(*a, *b), !CPStrEqual(*a, *b), CPStrReplace(a, P("two"), 1) == kNoErr,
                CPStrCmp(*a, *b) == -1, CPStrRemove(b, 2) == kNoErr, CPStrEqual(*a, *b),
                CPStrSearch(a, P("TWO"), PStrCaseCmp) == 1, CPStrSearch(a, P("TWO"), PStrCmp) == -1,
                CPStrSearch(nullptr, P("x"), PStrCmp) == -1, CPStrSearch(a, P("x"), nullptr) == -1);
    Dispose(a);
    Dispose(b);

    UHandle resource = nullptr;
    ASSERT_EQ(kNoErr, DSSetHandleFromPtr(&resource, Bytes({2, 0, 1, 'x', 2, 'y', 'z'}).data(), 7));
    uint8 room[9];
    StrPoundToCPStr(resource, reinterpret_cast<CPStrPtr>(room));
    EXPECT_EQ(Bytes({2, 0, 0, 0, 1, 'x', 2, 'y', 'z'}), std::string(room, room + 9));
    ReportRecorder reports;
    **resource = 3;  // more than there are
    StrPoundToCPStr(resource, reinterpret_cast<CPStrPtr>(room));
    EXPECT_EACH(reinterpret_cast<CPStrPtr>(room)->count == 2,
                reports.Has(kDebugError, "String list of 3 ends after 2"));
    DSDisposeHandle(resource);
}

CLStrHandle NewCLStr() {
    UHandle list = DSNewHClr(4);
    return reinterpret_cast<CLStrHandle>(list);
}

TEST(StringCLStr, PadsElements) {
    CLStrHandle list = NewCLStr();
    EXPECT_EACH(CLStrInsert(list, *L("hello"), 7, true) == kNoErr,
                Bytes({1, 0, 0, 0, 5, 0, 0, 0, 'h', 'e', 'l', 'l', 'o', 0, 0, 0}) == BlockOf(list),
                CLStrInsert(list, *L("four"), -3, true) == kNoErr,
                Bytes({2, 0, 0, 0, 4, 0, 0, 0, 'f', 'o', 'u', 'r', 5, 0, 0, 0, 'h', 'e', 'l', 'l', 'o', 0, 0, 0}) ==
                    BlockOf(list),
                TextOf(CLStrIndex(*list, 9)) == "hello", TextOf(CLStrIndex(*list, -9)) == "four");
    EXPECT_EQ(kNoErr, CLStrInsert(list, CLStrIndex(*list, 1), 0, true));  // its own element
    EXPECT_EQ("hello", TextOf(CLStrIndex(*list, 0)));
    EXPECT_EACH(CLStrRemove(list, 0) == kNoErr, CLStrRemove(list, 0) == kNoErr, CLStrSize(*list) == 16u,
                CLStrRemove(list, 0) == kNoErr, CLStrRemove(list, 0) == kArgErr, CLStrSize(*list) == 4u);
    Dispose(list);
}

TEST(StringCLStr, KeepsASortedList) {
    CLStrHandle list = NewCLStr();
    int32 index = -1;
    bool inserted = false;
    for (CStr text : {"m", "c", "x", "d"})
        EXPECT_EACH(CLStrInsertSort(list, *L(text), false, &index, &inserted, false) == kNoErr, inserted,
                    text == TextOf(CLStrIndex(*list, index)));
    Texts texts;
    for (int32 i = 0; i < (*list)->count; ++i) texts.push_back(TextOf(CLStrIndex(*list, i)));
    EXPECT_EACH(texts == (Texts{"c", "d", "m", "x"}),
                CLStrInsertSort(list, *L("m"), false, &index, &inserted, true) == kNoErr, !inserted, index == 2,
                CLStrInsertSort(list, *L("m"), true, &index, &inserted, true) == kNoErr, inserted, (*list)->count == 5);
    Dispose(list);
}

TEST(StringCLStr, ConvertsTheByteOrder) {
    ReportRecorder reports;
    const std::string stored = Bytes({0, 0, 0, 2, 0, 0, 0, 1, 'a', 0, 0, 0, 0, 0, 0, 0});
    UHandle list = nullptr;
    ASSERT_EQ(kNoErr, DSSetHandleFromPtr(&list, stored.data(), 16));
    StdToCLStr(reinterpret_cast<CLStrHandle>(list));
    EXPECT_EACH(Bytes({2, 0, 0, 0, 1, 0, 0, 0, 'a', 0, 0, 0, 0, 0, 0, 0}) == BlockOf(list), reports.Count() == 0u);
    for (uint32 size : {0u, 3u, 6u, 9u, 11u, 12u}) {  // the last holds one element of two
        ASSERT_EQ(kNoErr, DSSetHandleFromPtr(&list, stored.data(), size));
        reports.Clear();
        StdToCLStr(reinterpret_cast<CLStrHandle>(list));
        EXPECT_EQ(Texts{""}, reports.Texts(kDebugFatal)) << size;
    }
    EXPECT_EQ(1, (*reinterpret_cast<CLStrHandle>(list))->count);
    DSDisposeHandle(list);

    EXPECT_EACH(CLStrIndex(nullptr, 0) == nullptr, CLStrInsert(nullptr, nullptr, 0, true) == kGenericErr,
                CLStrInsertSort(nullptr, nullptr, true, nullptr, nullptr, true) == kGenericErr,
                reports.Has(kDebugFatal, "invalid buffer passed to CLStrIndex"),
                reports.Has(kDebugFatal, "Invalid dest buffer or insert buffer passed to CLStrInsert"),
                reports.Has(kDebugFatal, "Invalid dest buffer or insert buffer passed to CLStrInsertSort"));
}

TEST(StringLStrArray, ConvertsToAndFromAList) {
    CPStrHandle list = NewCPStr({"one", "", "three"});
    LStrArrayHandle array = nullptr;
    ASSERT_EQ(kNoErr, tessel::CPStrPtrToLStrArray(*list, &array));
    ASSERT_EQ(3, (*array)->elementCount);
    EXPECT_EACH(LStrArraySize(3) == DSGetHandleSize(reinterpret_cast<UHandle>(array)), (*array)->element[1] == nullptr,
                TextOf(*(*array)->element[2]) == "three");

    ASSERT_EQ(kNoErr, ReallocLStrArrayHandle(&array, 5));
    EXPECT_EQ(nullptr, (*array)->element[4]);
    ASSERT_EQ(kNoErr, LStrFromPtr(&(*array)->element[3], 300, std::string(300, 'x').data()));
    CPStrHandle back = nullptr;
    ASSERT_EQ(kNoErr, tessel::LStrArrayToCPStrHandle(array, &back));
    EXPECT_EQ((Texts{"one", "", "three", std::string(255, 'x'), ""}), Elements(back));
    ASSERT_EQ(kNoErr, LStrArrayToCPStrHandle(array, 1, &back));
    EXPECT_EACH(Bytes({1, 0, 0, 0, 3, 'o', 'n', 'e'}) == BlockOf(back),
                LStrArrayToCPStrHandle(array, 6, &back) == kArgErr, LStrArrayToCPStrHandle(nullptr, 3, &back) == kNoErr,
                back == nullptr);

    ASSERT_EQ(kNoErr, CPStrPtrToLStrArray(*list, 2, &array));  // the old array is released
    EXPECT_EACH((*array)->elementCount == 2, CPStrPtrToLStrArray(*list, 4, &array) == kArgErr,
                tessel::CPStrPtrToLStrArray(nullptr, &array) == kNoErr, array == nullptr,
                ReallocLStrArrayHandle(nullptr, 1) == kArgErr);
    ReportRecorder reports;
    EXPECT_EACH(CPStrPtrToLStrArray(*list, 2, nullptr) == kGenericErr, reports.Has(kDebugError, "Null not allowed"));
    Dispose(list);
}

TEST(CPStrList, OwnsItsElements) {
    CPStrList list;
    EXPECT_EACH(list[0] == nullptr, list.Insert(nullptr, 0) == kArgErr, list.Handle() == nullptr,
                list.Insert(P("b"), -1) == kNoErr, list.Insert(P("c"), -1) == kNoErr, list.Insert(P("a"), 0) == kNoErr,
                Elements(list.Handle()) == (Texts{"a", "b", "c"}), list.Delete(1) == kNoErr, TextOf(list[5]) == "c");

    CPStrList copy(*list.Handle());
    EXPECT_EACH(copy.Compare(list) == 0, copy.Equal(list), copy.Copy(copy) == kNoErr,
                CPStrReplace(copy.Handle(), P("C"), 1) == kNoErr, 'C' - 'c' == copy.Compare(list),
                copy.CompareNC(list) == 0, copy.CompareFS(list) == 0, !copy.Equal(list), copy.EqualNC(list),
                copy.Insert(P("more"), -1) == kNoErr, copy.CompareNC(list) == 1, !copy.EqualNC(list),
                copy.Copy(static_cast<const CPStr*>(nullptr)) == kNoErr, copy.Count() == 0);
    CPStrList none;
    EXPECT_EACH(copy.Equal(none), none.ForceAllocate() == kNoErr, Bytes({0, 0, 0, 0}) == BlockOf(none.Handle()));
}

}  // namespace
