// The list forms: CPStr, CLStr, _LStrArray and CPStrList.
#include "strings/Support.h"
#include "support/ReportRecorder.h"
#include <tessel/strings/CPStrList.h>
#include <tessel/strings/StringCLStr.h>
#include <tessel/strings/StringCPStr.h>
#include <tessel/strings/StringLStrArray.h>
#include <tessel/strings/StringPStr.h>

#include <algorithm>
#include <cstring>
#include <random>

using namespace tessel;
using namespace tessel::test;

namespace {

using Texts = std::vector<std::string>;

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
    EXPECT_EQ(Bytes({3, 0, 0, 0, 2, 'a', 'b', 0, 1, 'c'}), BlockOf(list));
    EXPECT_EQ(10u, CPStrSize(*list));
    EXPECT_EQ("c", TextOf(CPStrIndex(list, 99)));
    EXPECT_EQ("ab", TextOf(CPStrIndex(list, -1)));
    EXPECT_EQ(kNoErr, CPStrClear(list));
    EXPECT_EQ(Bytes({0, 0, 0, 0}), BlockOf(list));
    EXPECT_EQ(kArgErr, CPStrRemove(list, 0));
    EXPECT_EQ(kArgErr, CPStrReplace(list, P("x"), 0));
    EXPECT_EQ(kNoErr, CPStrSetToNEmptyStrings(&list, 3));
    EXPECT_EQ(Bytes({3, 0, 0, 0, 0, 0, 0}), BlockOf(list));
    EXPECT_EQ(kArgErr, CPStrClear(nullptr));
    EXPECT_EQ(kArgErr, CPStrSetToNEmptyStrings(nullptr, 1));
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
    EXPECT_EQ(model[1], TextOf(CPStrIndex(list, 0)));
    EXPECT_EQ(CPStrSize(*list), DSGetHandleSize(reinterpret_cast<UHandle>(list)));

    ReportRecorder reports;
    EXPECT_EQ(kGenericErr, CPStrInsert(nullptr, P("x"), 0));
    EXPECT_EQ(kGenericErr, CPStrInsert(list, nullptr, 0));
    EXPECT_EQ(2u, reports.CountAt(kDebugError));
    EXPECT_TRUE(reports.Has(kDebugError, "Bad inputs to CPStrInsertEfficient"));
    Dispose(list);
}

TEST(StringCPStr, ComparesAndSearches) {
    CPStrHandle a = NewCPStr({"one", "Two"});
    CPStrHandle b = NewCPStr({"one", "two", "three"});
    EXPECT_EQ('T' - 't', CPStrCmp(*a, *b));
    EXPECT_FALSE(CPStrEqual(*a, *b));
    EXPECT_EQ(kNoErr, CPStrReplace(a, P("two"), 1));
    EXPECT_EQ(-1, CPStrCmp(*a, *b));
    EXPECT_EQ(kNoErr, CPStrRemove(b, 2));
    EXPECT_TRUE(CPStrEqual(*a, *b));
    EXPECT_EQ(1, CPStrSearch(a, P("TWO"), PStrCaseCmp));
    EXPECT_EQ(-1, CPStrSearch(a, P("TWO"), PStrCmp));
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
    EXPECT_EQ(2, reinterpret_cast<CPStrPtr>(room)->count);
    EXPECT_TRUE(reports.Has(kDebugError, "String list of 3 ends after 2"));
    DSDisposeHandle(resource);
}

CLStrHandle NewCLStr() {
    UHandle list = DSNewHClr(4);
    return reinterpret_cast<CLStrHandle>(list);
}

TEST(StringCLStr, PadsElements) {
    CLStrHandle list = NewCLStr();
    EXPECT_EQ(kNoErr, CLStrInsert(list, *L("hello"), 7, true));
    EXPECT_EQ(Bytes({1, 0, 0, 0, 5, 0, 0, 0, 'h', 'e', 'l', 'l', 'o', 0, 0, 0}), BlockOf(list));
    EXPECT_EQ(kNoErr, CLStrInsert(list, *L("four"), -3, true));
    EXPECT_EQ(Bytes({2, 0, 0, 0, 4, 0, 0, 0, 'f', 'o', 'u', 'r', 5, 0, 0, 0, 'h', 'e', 'l', 'l', 'o', 0, 0, 0}),
              BlockOf(list));
    EXPECT_EQ("hello", TextOf(CLStrIndex(*list, 9)));
    EXPECT_EQ("four", TextOf(CLStrIndex(*list, -9)));
    EXPECT_EQ(kNoErr, CLStrInsert(list, CLStrIndex(*list, 1), 0, true));  // its own element
    EXPECT_EQ("hello", TextOf(CLStrIndex(*list, 0)));
    EXPECT_EQ(kNoErr, CLStrRemove(list, 0));
    EXPECT_EQ(kNoErr, CLStrRemove(list, 0));
    EXPECT_EQ(16u, CLStrSize(*list));
    EXPECT_EQ(kNoErr, CLStrRemove(list, 0));
    EXPECT_EQ(kArgErr, CLStrRemove(list, 0));
    EXPECT_EQ(4u, CLStrSize(*list));
    Dispose(list);
}

TEST(StringCLStr, KeepsASortedList) {
    CLStrHandle list = NewCLStr();
    int32 index = -1;
    bool inserted = false;
    for (CStr text : {"m", "c", "x", "d"}) {
        EXPECT_EQ(kNoErr, CLStrInsertSort(list, *L(text), false, &index, &inserted, false));
        EXPECT_TRUE(inserted);
        EXPECT_EQ(text, TextOf(CLStrIndex(*list, index)));
    }
    Texts texts;
    for (int32 i = 0; i < (*list)->count; ++i) texts.push_back(TextOf(CLStrIndex(*list, i)));
    EXPECT_EQ((Texts{"c", "d", "m", "x"}), texts);
    EXPECT_EQ(kNoErr, CLStrInsertSort(list, *L("m"), false, &index, &inserted, true));
    EXPECT_FALSE(inserted);
    EXPECT_EQ(2, index);
    EXPECT_EQ(kNoErr, CLStrInsertSort(list, *L("m"), true, &index, &inserted, true));
    EXPECT_TRUE(inserted);
    EXPECT_EQ(5, (*list)->count);
    Dispose(list);
}

TEST(StringCLStr, ConvertsTheByteOrder) {
    ReportRecorder reports;
    const std::string stored = Bytes({0, 0, 0, 2, 0, 0, 0, 1, 'a', 0, 0, 0, 0, 0, 0, 0});
    UHandle list = nullptr;
    ASSERT_EQ(kNoErr, DSSetHandleFromPtr(&list, stored.data(), 16));
    StdToCLStr(reinterpret_cast<CLStrHandle>(list));
    EXPECT_EQ(Bytes({2, 0, 0, 0, 1, 0, 0, 0, 'a', 0, 0, 0, 0, 0, 0, 0}), BlockOf(list));
    EXPECT_EQ(0u, reports.Count());
    for (uint32 size : {0u, 3u, 6u, 9u, 11u, 12u}) {  // the last holds one element of two
        ASSERT_EQ(kNoErr, DSSetHandleFromPtr(&list, stored.data(), size));
        reports.Clear();
        StdToCLStr(reinterpret_cast<CLStrHandle>(list));
        EXPECT_EQ(Texts{""}, reports.Texts(kDebugFatal)) << size;
    }
    EXPECT_EQ(1, (*reinterpret_cast<CLStrHandle>(list))->count);
    DSDisposeHandle(list);

    EXPECT_EQ(nullptr, CLStrIndex(nullptr, 0));
    EXPECT_EQ(kGenericErr, CLStrInsert(nullptr, nullptr, 0, true));
    EXPECT_EQ(kGenericErr, CLStrInsertSort(nullptr, nullptr, true, nullptr, nullptr, true));
    EXPECT_TRUE(reports.Has(kDebugFatal, "invalid buffer passed to CLStrIndex"));
    EXPECT_TRUE(reports.Has(kDebugFatal, "Invalid dest buffer or insert buffer passed to CLStrInsert"));
    EXPECT_TRUE(reports.Has(kDebugFatal, "Invalid dest buffer or insert buffer passed to CLStrInsertSort"));
}

TEST(StringLStrArray, ConvertsToAndFromAList) {
    CPStrHandle list = NewCPStr({"one", "", "three"});
    LStrArrayHandle array = nullptr;
    ASSERT_EQ(kNoErr, tessel::CPStrPtrToLStrArray(*list, &array));
    ASSERT_EQ(3, (*array)->elementCount);
    EXPECT_EQ(LStrArraySize(3), DSGetHandleSize(reinterpret_cast<UHandle>(array)));
    EXPECT_EQ(nullptr, (*array)->element[1]);
    EXPECT_EQ("three", TextOf(*(*array)->element[2]));

    ASSERT_EQ(kNoErr, ReallocLStrArrayHandle(&array, 5));
    EXPECT_EQ(nullptr, (*array)->element[4]);
    ASSERT_EQ(kNoErr, LStrFromPtr(&(*array)->element[3], 300, std::string(300, 'x').data()));
    CPStrHandle back = nullptr;
    ASSERT_EQ(kNoErr, tessel::LStrArrayToCPStrHandle(array, &back));
    EXPECT_EQ((Texts{"one", "", "three", std::string(255, 'x'), ""}), Elements(back));
    ASSERT_EQ(kNoErr, LStrArrayToCPStrHandle(array, 1, &back));
    EXPECT_EQ(Bytes({1, 0, 0, 0, 3, 'o', 'n', 'e'}), BlockOf(back));
    EXPECT_EQ(kArgErr, LStrArrayToCPStrHandle(array, 6, &back));
    EXPECT_EQ(kNoErr, LStrArrayToCPStrHandle(nullptr, 3, &back));
    EXPECT_EQ(nullptr, back);

    ASSERT_EQ(kNoErr, CPStrPtrToLStrArray(*list, 2, &array));  // the old array is released
    EXPECT_EQ(2, (*array)->elementCount);
    EXPECT_EQ(kArgErr, CPStrPtrToLStrArray(*list, 4, &array));
    EXPECT_EQ(kNoErr, tessel::CPStrPtrToLStrArray(nullptr, &array));
    EXPECT_EQ(nullptr, array);
    EXPECT_EQ(kArgErr, ReallocLStrArrayHandle(nullptr, 1));
    ReportRecorder reports;
    EXPECT_EQ(kGenericErr, CPStrPtrToLStrArray(*list, 2, nullptr));
    EXPECT_TRUE(reports.Has(kDebugError, "Null not allowed"));
    Dispose(list);
}

TEST(CPStrList, OwnsItsElements) {
    CPStrList list;
    EXPECT_EQ(nullptr, list[0]);
    EXPECT_EQ(kArgErr, list.Insert(nullptr, 0));
    EXPECT_EQ(nullptr, list.Handle());
    EXPECT_EQ(kNoErr, list.Insert(P("b"), -1));
    EXPECT_EQ(kNoErr, list.Insert(P("c"), -1));
    EXPECT_EQ(kNoErr, list.Insert(P("a"), 0));
    EXPECT_EQ((Texts{"a", "b", "c"}), Elements(list.Handle()));
    EXPECT_EQ(kNoErr, list.Delete(1));
    EXPECT_EQ("c", TextOf(list[5]));

    CPStrList copy(*list.Handle());
    EXPECT_EQ(0, copy.Compare(list));
    EXPECT_TRUE(copy.Equal(list));
    EXPECT_EQ(kNoErr, copy.Copy(copy));
    EXPECT_EQ(kNoErr, CPStrReplace(copy.Handle(), P("C"), 1));
    EXPECT_EQ('C' - 'c', copy.Compare(list));
    EXPECT_EQ(0, copy.CompareNC(list));
    EXPECT_EQ(0, copy.CompareFS(list));
    EXPECT_FALSE(copy.Equal(list));
    EXPECT_TRUE(copy.EqualNC(list));
    EXPECT_EQ(kNoErr, copy.Insert(P("more"), -1));
    EXPECT_EQ(1, copy.CompareNC(list));
    EXPECT_FALSE(copy.EqualNC(list));
    EXPECT_EQ(kNoErr, copy.Copy(static_cast<const CPStr*>(nullptr)));
    EXPECT_EQ(0, copy.Count());
    CPStrList none;
    EXPECT_TRUE(copy.Equal(none));
    EXPECT_EQ(kNoErr, none.ForceAllocate());
    EXPECT_EQ(Bytes({0, 0, 0, 0}), BlockOf(none.Handle()));
}

}  // namespace
