#include <gtest/gtest.h>
#include <tessel/memory/MemoryManager.h>
#include <tessel/resources/ResourceManager.h>
#include <tessel/strings/CPStrList.h>
#include <tessel/strings/StringPStr.h>

#include <string>
#include <vector>

#include "support/StartedLibrary.h"

namespace tessel {
namespace {

constexpr int32 kID = 128;
constexpr ResType kType = TESSEL_FOURCC('L', 'i', 's', 't');

class CPStrListResource : public testing::Test {
protected:
    ~CPStrListResource() override { EXPECT_EQ(kNoErr, file_ ? RCloseFile(file_) : kNoErr); }

    // The handle of a resource with this body, in a file that has nothing to write.
    UHandle Loaded(const std::string& body) {
        RsrcFile made = 0;
        UHandle data = nullptr;
        UHandle image = nullptr;
        EXPECT_EQ(kNoErr, RCreateMemFile(&made, 0, 0));
        EXPECT_EQ(kNoErr, DSPtrToHand(body.data(), &data, static_cast<uint32>(body.size())));
        EXPECT_EQ(kNoErr, RAdd(data, made, kType, kID, nullptr));
        EXPECT_EQ(kNoErr, RGetMemFileHandle(made, &image));
        EXPECT_EQ(kNoErr, RCloseFile(made));
        EXPECT_EQ(kNoErr, file_ ? RCloseFile(file_) : kNoErr);
        EXPECT_EQ(kNoErr, ROpenUHandle(image, kROpenReadOnly, &file_, nullptr, nullptr));
        EXPECT_EQ(kNoErr, RGet(file_, kType, kID, &data));
        return data;
    }

    static std::vector<std::string> Elements(const CPStrList& list) {
        std::vector<std::string> texts;
        for (int32 i = 0; i < list.Count(); ++i) {
            ConstPStr text = list[i];
            texts.emplace_back(text + 1, text + 1 + text[0]);
        }
        return texts;
    }

    test::StartedLibrary library_;
    RsrcFile file_ = 0;
};

using std::string_literals::operator""s;
using Texts = std::vector<std::string>;

TEST_F(CPStrListResource, TakesTheDataOver) {
    UHandle data = Loaded("\0\0\0\2\2ab\1c"s);
    const CPStrList list(data);
    EXPECT_EQ((Texts{"ab", "c"}), Elements(list));
    EXPECT_EQ(data, reinterpret_cast<UHandle>(list.Handle()));
    EXPECT_NE(kNoErr, RRelease(data));  // no longer the file's
    UHandle again = nullptr;
    EXPECT_EQ(kNoErr, RGet(file_, kType, kID, &again));
    EXPECT_NE(data, again);
}

TEST_F(CPStrListResource, HoldsNoMoreThanTheDataDo) {
    EXPECT_EQ(Texts{"ab"}, Elements(CPStrList(Loaded("\0\0\0\2\2ab\5c"s))));
    EXPECT_EQ(Texts{}, Elements(CPStrList(Loaded("\x7F\xFF\xFF\xFF"s))));
    EXPECT_EQ(Texts{}, Elements(CPStrList(Loaded("\xFF\xFF\xFF\xFE\1a"s))));
    EXPECT_EQ(nullptr, CPStrList(Loaded("\0\0"s)).Handle());
    EXPECT_EQ(nullptr, CPStrList(static_cast<UHandle>(nullptr)).Handle());
    UHandle plain = DSNewHClr(4);  // no resource: stays the caller's
    EXPECT_EQ(nullptr, CPStrList(plain).Handle());
    EXPECT_EQ(kNoErr, DSDisposeHandle(plain));
}

}  // namespace
}  // namespace tessel
