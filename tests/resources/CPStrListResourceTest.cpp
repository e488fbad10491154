// Lists of strings over the data of resources.
#include "resources/ResourceTestSupport.h"
#include <tessel/strings/CPStrList.h>

namespace tessel::test {
namespace {

class CPStrListResource : public ResourceTest {
protected:
    // The handle of a resource with this body, in a file that has nothing to write.
    UHandle Body(const std::string& body) {
        const RsrcFile made = NewMemFile();
        UHandle image = nullptr;
        EXPECT_EQ(kNoErr, Add(made, kStrList, 128, body));
        EXPECT_EQ(kNoErr, RGetMemFileHandle(made, &image));
        file_ = Open(BytesOf(image), kROpenReadOnly);
        DSDisposeHandle(image);
        return Loaded(file_, kStrList, 128);
    }
    static std::vector<std::string> Elements(const CPStrList& list) {
        std::vector<std::string> texts;
        for (int32 i = 0; i < list.Count(); ++i) texts.emplace_back(list[i] + 1, list[i] + 1 + list[i][0]);
        return texts;
    }

    RsrcFile file_ = 0;
};

using std::string_literals::operator""s;
using Texts = std::vector<std::string>;

TEST_F(CPStrListResource, TakesTheDataOver) {
    UHandle data = Body("\0\0\0\2\2ab\1c"s);
    const CPStrList list(data);
    EXPECT_EQ((Texts{"ab", "c"}), Elements(list));
    EXPECT_EQ(data, reinterpret_cast<UHandle>(list.Handle()));
    EXPECT_NE(kNoErr, RRelease(data));  // no longer the file's
    EXPECT_NE(data, Loaded(file_, kStrList, 128));
}

TEST_F(CPStrListResource, HoldsNoMoreThanTheDataDo) {
    EXPECT_EQ(Texts{"ab"}, Elements(CPStrList(Body("\0\0\0\2\2ab\5c"s))));
    EXPECT_EQ(Texts{}, Elements(CPStrList(Body("\x7F\xFF\xFF\xFF"s))));
    EXPECT_EQ(Texts{}, Elements(CPStrList(Body("\xFF\xFF\xFF\xFE\1a"s))));
    EXPECT_EQ(nullptr, CPStrList(Body("\0\0"s)).Handle());
    EXPECT_EQ(nullptr, CPStrList(static_cast<UHandle>(nullptr)).Handle());
    UHandle plain = DSNewHClr(4);  // no resource: stays the caller's
    EXPECT_EQ(nullptr, CPStrList(plain).Handle());
    EXPECT_EQ(kNoErr, DSDisposeHandle(plain));
}

}  // namespace
}  // namespace tessel::test
