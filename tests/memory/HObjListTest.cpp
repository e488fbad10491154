#include "support/StartedMemory.h"
#include "support/Test.h"
#include <tessel/memory/HObjList.h>
#include <tessel/memory/MemoryManager.h>

namespace tessel::test {
namespace {

struct ObjList : ::testing::Test {
    test::StartedMemory memory;
    UHandle list = DSNewHClr(4);

    ~ObjList() override { DSDisposeHandle(list); }

    std::vector<uint32> Values() {
        auto words = reinterpret_cast<uint32*>(*list);
        uint32 room = DSGetHandleSize(list) / 4 - 1;
        for (uint32 i = words[0]; i < room; ++i) EXPECT_EQ(0u, words[i + 1]);
        return std::vector<uint32>(words + 1, words + 1 + words[0]);
    }
};

TEST_F(ObjList, FollowsAModel) {
    std::mt19937 random(7);
    std::vector<uint32> model;
    for (int step = 0; step < 3000; ++step) {
        int32 pos = static_cast<int32>(random() % 60) - 5, count = static_cast<int32>(model.size());
        if (random() % 8 == 0) pos = kHObjListEnd;
        uint32 value = random() % 20;
        switch (random() % 5) {
            case 0:
            case 1:
                ASSERT_EQ(kNoErr, HObjListInsert(list, value, pos));
                model.insert(model.begin() + std::clamp(pos, 0, count), value);
                break;
            case 2: {
                uint32 removed = HObjListDelete(list, pos);
                if (count == 0) {
                    ASSERT_EQ(0u, removed);
                    break;
                }
                auto at = model.begin() + std::clamp(pos, 0, count - 1);
                ASSERT_EQ(*at, removed);
                model.erase(at);
                break;
            }
            case 3: {
                auto last = std::find(model.rbegin(), model.rend(), value);
                int32 index = static_cast<int32>(model.rend() - last) - 1;
                ASSERT_EQ(index, HObjListSearch(list, value));
                ASSERT_EQ(index > 0 ? 1 : 0, HObjListBringToFront(list, value));
                if (index > 0) std::rotate(model.begin(), model.begin() + index, model.begin() + index + 1);
                break;
            }
            default: {
                auto last = std::find(model.rbegin(), model.rend(), value);
                ASSERT_EQ(last != model.rend() ? 1 : 0, HObjListSearchDelete(list, value));
                if (last != model.rend()) model.erase(last.base() - 1);
                break;
            }
        }
        if (random() % 200 == 0) {
            HCompactObjList(list);
            std::erase(model, 0u);
        }
        ASSERT_THAT(Values(), ElementsAreArray(model));
    }
}

TEST_F(ObjList, GrowsAndShrinksBySixteenBytes) {
    std::vector<uint32> sizes;
    for (uint32 value : {5u, 0u, 7u, 0u, 9u}) {
        HObjListInsert(list, value, kHObjListEnd);
        sizes.push_back(DSGetHandleSize(list));
    }
    EXPECT_THAT(sizes, ElementsAre(16, 16, 16, 32, 32));
    EXPECT_EQ(9u, HObjListDelete(list, kHObjListEnd));
    EXPECT_EQ(32u, DSGetHandleSize(list));  // not above 5 * 4 + 16
    DSSetHSzClr(list, 60);
    HObjListSwap(list, 0, 3);
    EXPECT_THAT(Values(), ElementsAre(0, 0, 7, 5));
    EXPECT_EACH(HObjListDelete(list, 3) == 5u, DSGetHandleSize(list) == 48u, HObjListDelete(list, 99) == 7u,
                DSGetHandleSize(list) == 32u);
    HCompactObjList(list);
    EXPECT_EACH(DSGetHandleSize(list) == 16u, HObjListDelete(list, 0) == 0u);
}

TEST_F(ObjList, ReportsWhatIsWrong) {
    HObjListInsert(list, 1, 0);
    HObjListSwap(list, 0, 1);
    HObjListSwap(list, -1, 0);
    EXPECT_EACH(HObjListBringToFront(list, 2) == 0, HObjListInsert(nullptr, 1, 0) == kArgErr,
                HObjListSearch(nullptr, 1) == -1);
    constexpr char kRange[] = "HObjListSwap: pos out of range";
    EXPECT_THAT(memory.reports.Texts(),
                ElementsAre(kRange, kRange, "HObjListBringToFront: object not found!!!", "", ""));
    EXPECT_THAT(Values(), ElementsAre(1));
}

}  // namespace
}  // namespace tessel::test
