#include <tessel/utilities/SortSearch.h>

#include <gtest/gtest.h>

#include <algorithm>
#include <climits>
#include <cstdlib>
#include <cstring>
#include <functional>
#include <random>
#include <string>
#include <vector>

namespace {

using Record = std::string;  // the bytes of one record: the key is the first

/* An array of records with guard records around it. */
class Records {
public:
    Records(const std::vector<int>& keys, size_t size) : count_(keys.size()), size_(size) {
        bytes_.assign((count_ + 2) * size, '\x5A');
        for (size_t i = 0; i < count_; ++i) {
            At(i)[0] = static_cast<char>(keys[i]);
            for (size_t k = 1; k < size; ++k) At(i)[k] = static_cast<char>(keys[i] * 7 + static_cast<int>(k));
        }
    }
    char* At(size_t i) { return bytes_.data() + (i + 1) * size_; }
    std::vector<Record> All() {
        std::vector<Record> all;
        for (size_t i = 0; i < count_; ++i) all.emplace_back(At(i), size_);
        return all;
    }
    bool GuardsAreWhole() { return Record(At(0) - size_, size_) == Record(At(count_), size_); }
    bool Holds(const void* record) {
        auto offset = static_cast<const char*>(record) - At(0);
        return offset >= 0 && offset < At(count_) - At(0) && offset % static_cast<ptrdiff_t>(size_) == 0;
    }

private:
    size_t count_, size_;
    std::vector<char> bytes_;
};

/* Comparisons by the first byte, or by whatever `answer` says, that count and look where they are called. */
struct Judge {
    Records* records;
    std::function<int32(int32)> answer;
    int calls = 0;
    bool strayed = false;

    static int32 Compare(const void* a, const void* b, void* context) {
        Judge& judge = *static_cast<Judge*>(context);
        ++judge.calls;
        judge.strayed |= !judge.records->Holds(a) || !judge.records->Holds(b);
        return judge.answer(*static_cast<const signed char*>(a) - *static_cast<const signed char*>(b));
    }
};

int32 Truth(int32 order) {
    return order;
}

std::vector<std::vector<int>> Shapes(int count) {
    std::mt19937 random(static_cast<unsigned>(count));
    std::vector<std::vector<int>> shapes(6);
    for (int i = 0; i < count; ++i) {
        const int scaled = count ? i * 256 / count - 128 : 0;
        shapes[0].push_back(static_cast<int>(random() % 256) - 128);
        shapes[1].push_back(static_cast<int>(random() % 3));
        shapes[2].push_back(scaled);
        shapes[3].push_back(-scaled - 1);
        shapes[4].push_back(42);
        shapes[5].push_back(std::abs(scaled) - 64);
    }
    return shapes;
}

TEST(QSort, SortsRecordsOfAnySizeAndShape) {
    for (size_t size : {1u, 2u, 3u, 4u, 5u, 6u, 8u, 12u, 24u, 33u}) {
        for (int count : {0, 1, 2, 3, 4, 5, 7, 8, 9, 31, 500}) {
            for (const auto& keys : Shapes(count)) {
                Records records(keys, size);
                Judge judge{&records, Truth};
                std::vector<Record> expected = records.All();
                std::stable_sort(expected.begin(), expected.end(), [](const Record& a, const Record& b) {
                    return static_cast<signed char>(a[0]) < static_cast<signed char>(b[0]);
                });
                QSortEx(records.At(0), count, static_cast<int32>(size), Judge::Compare, &judge);
                EXPECT_EQ(records.All(), expected) << "size " << size << " count " << count;
                EXPECT_TRUE(records.GuardsAreWhole());
                EXPECT_FALSE(judge.strayed);
            }
        }
    }
}

TEST(QSort, ThreeRecordsTakeTheMedianStepAlone) {
    Records records({3, 1, 2}, 1);
    Judge judge{&records, Truth};
    QSortEx(records.At(0), 3, 1, Judge::Compare, &judge);
    EXPECT_EQ(records.All(), (std::vector<Record>{"\1", "\2", "\3"}));
    EXPECT_EQ(judge.calls, 3);
}

TEST(QSort, PlacesEqualRecordsAsDescribed) {
    // Worked by hand: the median 2c goes before the last record, in place of 1d, and is where it belongs; of 2a 1b 1d
    // the median step makes 1b 1d 2a.
    char records[] = "2a1b2c1d2e";
    QSort(records, 5, 2, [](const void* a, const void* b) {
        return static_cast<int32>(*static_cast<const char*>(a)) - *static_cast<const char*>(b);
    });
    EXPECT_STREQ(records, "1b1d2a2c2e");
}

TEST(QSort, EndsWithinTheArrayWhateverTheComparisonAnswers) {
    std::mt19937 random(7);
    const std::function<int32(int32)> liars[] = {[](int32) { return 1; }, [](int32) { return 0; },
                                                 [](int32) { return -1; }, [](int32 order) { return -order * 2 + 1; },
                                                 [&](int32) { return static_cast<int32>(random() % 3) - 1; }};
    for (const auto& liar : liars) {
        for (int count : {2, 3, 4, 5, 8, 100, 1000}) {
            for (const auto& keys : Shapes(count)) {
                Records records(keys, 4);
                Judge judge{&records, liar};
                std::vector<Record> before = records.All();
                QSortEx(records.At(0), count, 4, Judge::Compare, &judge);
                std::vector<Record> after = records.All();
                EXPECT_TRUE(std::is_permutation(after.begin(), after.end(), before.begin()));
                EXPECT_FALSE(judge.strayed);
                EXPECT_TRUE(records.GuardsAreWhole());
            }
        }
    }
}

TEST(QSort, SwapsNoMoreThanTheSwapSize) {
    struct Row {
        int32 key;
        char label;
    };
    std::vector<Row> rows;
    for (int i = 0; i < 50; ++i) rows.push_back({(i * 37) % 50, static_cast<char>(i)});
    QSort2(rows.data(), 50, sizeof(int32), sizeof(Row), CompareInt32s);
    for (int i = 0; i < 50; ++i) {
        EXPECT_EQ(rows[static_cast<size_t>(i)].key, i);
        EXPECT_EQ(rows[static_cast<size_t>(i)].label, i);
    }
    std::vector<Row> alone = {{2, 'a'}, {1, 'b'}};
    QSort2Ex(
        alone.data(), 2, 0, sizeof(Row), [](const void*, const void*, void*) { return int32{1}; }, nullptr);
    EXPECT_EQ(alone[0].key, 2);
}

TEST(QSort, TheLibrarysComparisonsOrderNumbers) {
    std::vector<int32> ints = {5, -1000000000, 7, 0, 1000000000, -3, 5, 9, -9, 1};
    std::vector<int32> sorted = ints;
    std::sort(sorted.begin(), sorted.end());
    QSort(ints.data(), static_cast<int32>(ints.size()), sizeof(int32), CompareInt32s);
    EXPECT_EQ(ints, sorted);
    const int16 low = INT16_MIN, high = INT16_MAX;
    EXPECT_EQ(CompareInt16s(&low, &high), -65535);
    const uintptr_t least = 0, most = UINTPTR_MAX;
    EXPECT_EQ(CompareUIntPtrTs(&least, &most), -1);
    EXPECT_EQ(CompareUIntPtrTs(&most, &least), 1);
    EXPECT_EQ(CompareUIntPtrTs(&most, &most), 0);
}

TEST(BinSearch, FindsOrTellsWhereToInsert) {
    for (int count = 0; count < 40; ++count) {
        std::vector<int32> odd;
        for (int i = 0; i < count; ++i) odd.push_back(2 * i + 1);
        for (int32 key = 0; key <= 2 * count; ++key) {
            auto place = static_cast<int32>(std::lower_bound(odd.begin(), odd.end(), key) - odd.begin());
            EXPECT_EQ(BinSearch(odd.data(), count, sizeof(int32), &key, CompareInt32s), key % 2 ? place : -place - 1);
        }
    }
    const int32 key = 1;
    EXPECT_EQ(BinSearch(nullptr, 0, sizeof(int32), &key, CompareInt32s), -1);
}

TEST(BinSearch, HandsTheContextAndTheKeyFirst) {
    const char table[] = "bdf";
    std::string asked;
    auto compare = [](const void* key, const void* record, void* context) {
        static_cast<std::string*>(context)->push_back(*static_cast<const char*>(record));
        return static_cast<int32>(*static_cast<const int*>(key)) - *static_cast<const char*>(record);
    };
    const int key = 'e';
    EXPECT_EQ(BinSearchEx(table, 3, 1, &key, compare, &asked), -3);
    EXPECT_EQ(asked, "df");
}

}  // namespace
