#include "support/Test.h"
#include <tessel/utilities/SortSearch.h>

#include <climits>
#include <cmath>

namespace {

using Record = std::string;  // its bytes; the first is the key

// Records between guards, and comparisons of them that may lie.
struct Bench {
    size_t count, size;
    std::vector<char> bytes;
    int32 (*answer)(int32 order) = [](int32 order) { return order; };
    int calls = 0;
    bool strayed = false;

    Bench(const std::vector<int>& keys, size_t recordSize)
        : count(keys.size()), size(recordSize), bytes((count + 2) * size, '\x5A') {
        for (size_t i = 0; i < count * size; ++i) At(0)[i] = static_cast<char>(keys[i / size] + 7 * (i % size));
    }
    char* At(size_t i) { return &bytes[(i + 1) * size]; }
    std::vector<Record> All() {
        std::vector<Record> all;
        for (size_t i = 0; i < count; ++i) all.emplace_back(At(i), size);
        return all;
    }
    void Sort() { QSortEx(At(0), static_cast<int32>(count), static_cast<int32>(size), Compare, this); }
    bool IsIntact() { return !strayed && bytes.front() == '\x5A' && bytes.back() == '\x5A'; }

    static int32 Compare(const void* a, const void* b, void* context) {
        Bench& bench = *static_cast<Bench*>(context);
        ++bench.calls;
        for (const void* record : {a, b}) {
            auto offset = static_cast<size_t>(static_cast<const char*>(record) - bench.At(0));
            bench.strayed |= offset >= bench.count * bench.size || offset % bench.size != 0;
        }
        return bench.answer(*static_cast<const signed char*>(a) - *static_cast<const signed char*>(b));
    }
};

// random, few distinct, rising, falling, equal, falling then rising
std::vector<std::vector<int>> Shapes(int count) {
    std::mt19937 random(static_cast<unsigned>(count));
    std::vector<std::vector<int>> shapes(6);
    for (int i = 0; i < count; ++i) {
        const int rising = i * 256 / count - 128;
        const int keys[] = {static_cast<int>(random() % 256) - 128,
                            static_cast<int>(random() % 3),
                            rising,
                            -rising - 1,
                            42,
                            std::abs(rising) - 64};
        for (size_t shape = 0; shape < 6; ++shape) shapes[shape].push_back(keys[shape]);
    }
    return shapes;
}

TEST(QSort, SortsRecordsOfAnySizeAndShape) {
    for (size_t size : {1u, 2u, 3u, 4u, 5u, 6u, 8u, 12u, 24u}) {
        for (int count : {0, 1, 2, 3, 4, 5, 8, 31, 500}) {
            for (const auto& keys : Shapes(count)) {
                Bench bench(keys, size);
                std::vector<Record> expected = bench.All();
                std::stable_sort(expected.begin(), expected.end(), [](const Record& a, const Record& b) {
                    return static_cast<signed char>(a[0]) < static_cast<signed char>(b[0]);
                });
                bench.Sort();
                EXPECT_EQ(bench.All(), expected) << "size " << size << " count " << count;
                EXPECT_TRUE(bench.IsIntact());
            }
        }
    }
}

TEST(QSort, EndsWithinTheArrayWhateverTheComparisonAnswers) {
    int32 (*const liars[])(int32) = {[](int32) { return 1; }, [](int32) { return 0; }, [](int32) { return -1; },
                                     [](int32 order) { return 1 - 2 * order; },
                                     [](int32) {
                                         static std::mt19937 random(7);
                                         return static_cast<int32>(random() % 3) - 1;
                                     }};
    for (auto liar : liars) {
        for (int count : {2, 3, 4, 5, 8, 1000}) {
            Bench bench(Shapes(count)[0], 4);
            std::vector<Record> before = bench.All();
            bench.answer = liar;
            bench.Sort();
            std::vector<Record> after = bench.All();
            EXPECT_EACH(std::is_permutation(after.begin(), after.end(), before.begin()), bench.IsIntact());
        }
    }
}

using Marked = std::pair<int32, int32>;  // a key, and where it stood

int32 CompareMarked(const void* a, const void* b) {
    const int32 left = static_cast<const Marked*>(a)->first, right = static_cast<const Marked*>(b)->first;
    return (left > right) - (left < right);
}

void SortByTheSteps(std::vector<Marked>& records, int lo, int hi) {
    auto at = [&](int i) -> Marked& { return records[static_cast<size_t>(i)]; };
    auto order = [&](int a, int b) {
        if (at(a).first > at(b).first) std::swap(at(a), at(b));
    };
    if (hi - lo < 2) {
        if (hi > lo) order(lo, hi);
        return;
    }
    const int mid = lo + (hi - lo) / 2, pivot = hi - 1;
    order(lo, mid);
    order(lo, hi);
    order(mid, hi);
    if (hi - lo == 2) return;
    std::swap(at(mid), at(pivot));
    int i = lo, j = pivot;
    while (i != j) {
        do ++i;
        while (i != j && at(i).first < at(pivot).first);
        if (i == j) break;
        do --j;
        while (j != i && at(j).first > at(pivot).first);
        if (i != j) std::swap(at(i), at(j));
    }
    std::swap(at(i), at(pivot));
    const bool largerBefore = i - lo > hi - i;
    SortByTheSteps(records, largerBefore ? i : lo, largerBefore ? hi : i);
    if (largerBefore)
        SortByTheSteps(records, lo, i - 1);
    else
        SortByTheSteps(records, i + 1, hi);
}

TEST(QSort, TakesTheStepsDescribed) {
    Bench three({3, 1, 2}, 1);
    three.Sort();
    EXPECT_EQ(three.calls, 3);  // the median step alone

    // The described steps, record by record, leave equal keys in one certain order.
    for (int count : {4, 5, 100, 131, 400, 5000}) {
        std::mt19937 random(static_cast<unsigned>(count));
        std::vector<Marked> sorted(static_cast<size_t>(count)), model;
        for (int distinct : {2, 50, 100000}) {
            for (int i = 0; i < count; ++i)
                sorted[static_cast<size_t>(i)] = {static_cast<int32>(random()) % distinct, i};
            model = sorted;
            SortByTheSteps(model, 0, count - 1);
            QSort(sorted.data(), count, sizeof(Marked), CompareMarked);
            EXPECT_EQ(sorted, model) << count << " of " << distinct;
        }
    }

    // Worked by hand: the median 2c goes before the last record, in place of 1d, and is where it belongs; of 2a 1b 1d
    // the median step makes 1b 1d 2a.
    auto compareChars = [](const void* a, const void* b) {
        return static_cast<int32>(*static_cast<const char*>(a)) - *static_cast<const char*>(b);
    };
    char equals[] = "2a1b2c1d2e", keysOnly[] = "3a1b2c";
    QSort(equals, 5, 2, compareChars);
    EXPECT_STREQ(equals, "1b1d2a2c2e");
    QSort2(keysOnly, 3, 1, 2, compareChars);
    QSort2(keysOnly, 3, 3, 2, compareChars);  // exchanges would reach beyond the last record: nothing happens
    EXPECT_STREQ(keysOnly, "1a2b3c");

    int32 ints[] = {5, -1000000000, 7, 0, 1000000000, -3, 5, 9, -9, 1};
    QSort(ints, 10, sizeof(int32), CompareInt32s);
    EXPECT_TRUE(std::is_sorted(ints, ints + 10));
    const int16 low = INT16_MIN, high = INT16_MAX;
    EXPECT_EQ(CompareInt16s(&low, &high), -65535);
    const uintptr_t least = 0, most = UINTPTR_MAX;
    EXPECT_EACH(CompareUIntPtrTs(&least, &most) == -1, CompareUIntPtrTs(&most, &least) == 1,
                CompareUIntPtrTs(&most, &most) == 0);
}

// Chooses its answers as it goes (McIlroy's adversary): a record has no value yet until it must have one.
TEST(QSort, HasNoBadCase) {
    static constexpr int32 kCount = 32000, kGas = kCount;
    struct Adversary {
        std::vector<int32> values = std::vector<int32>(kCount, kGas), records;
        int32 solid = 0, candidate = 0;
        int64 calls = 0;
    } adversary;
    for (int32 i = 0; i < kCount; ++i) adversary.records.push_back(i);
    auto compare = [](const void* a, const void* b, void* context) -> int32 {
        Adversary& self = *static_cast<Adversary*>(context);
        const int32 left = *static_cast<const int32*>(a), right = *static_cast<const int32*>(b);
        ++self.calls;
        if (self.values[left] == kGas && self.values[right] == kGas)
            self.values[left == self.candidate ? left : right] = self.solid++;
        if (self.values[left] == kGas) self.candidate = left;
        if (self.values[right] == kGas) self.candidate = right;
        return self.values[left] - self.values[right];
    };
    QSortEx(adversary.records.data(), kCount, sizeof(int32), compare, &adversary);
    EXPECT_LE(adversary.calls, 3.1 * kCount * std::log2(kCount));
    for (int32 i = 1; i < kCount; ++i)
        ASSERT_LE(adversary.values[adversary.records[i - 1]], adversary.values[adversary.records[i]]);
}

TEST(BinSearch, FindsOrTellsWhereToInsert) {
    std::vector<int32> odd;
    for (int32 count = 0; count < 40; ++count, odd.push_back(2 * count - 1)) {
        for (int32 key = 0; key <= 2 * count; ++key) {
            auto place = static_cast<int32>(std::lower_bound(odd.begin(), odd.end(), key) - odd.begin());
            EXPECT_EQ(BinSearch(odd.data(), count, sizeof(int32), &key, CompareInt32s), key % 2 ? place : -place - 1);
        }
    }
    std::string asked;
    auto compare = [](const void* key, const void* record, void* context) {
        static_cast<std::string*>(context)->push_back(*static_cast<const char*>(record));
        return static_cast<int32>(*static_cast<const int*>(key)) - *static_cast<const char*>(record);
    };
    const int key = 'e';
    EXPECT_EACH(BinSearchEx("bdf", 3, 1, &key, compare, &asked) == -3, asked == "df");
}

}  // namespace
