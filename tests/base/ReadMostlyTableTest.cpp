#include "base/ReadMostlyTable.h"
#include "support/Test.h"

#include <array>
#include <set>

namespace tessel::test {
namespace {

struct Item {
    uint32 hash = 0, content = 0;
};

template <uint32 kHashes>
struct ItemKeys {
    static constexpr uint32 kFirstSlots = 8, kSlotsPerUsed = 2, kMostHashes = kHashes;
    static constexpr bool kRemoves = kHashes == 1;
    static uint32 Hashes(const Item* item) { return kHashes - item->hash % kHashes; }
    static uint32 Hash(const Item* item, uint32 n) { return (item->hash + n) * 0x0C000000u; }
};

template <uint32 kHashes>
class Items {
public:
    static constexpr uint32 kItems = 200;

    // Few hashes, so that entries stand in each other's way, and at the end of the table.
    Items() {
        for (uint32 i = 0; i < kItems; ++i) items_[i].hash = i * i % 41;
    }
    ~Items() { table_.Clear(std::free); }

    bool Add(uint32 i, bool memory = true) {
        items_[i].content = i + 1;
        return table_.Add(&items_[i],
                          [&](size_t size) { return ++allocations, memory ? std::calloc(1, size) : nullptr; });
    }
    void Remove(uint32 i) { table_.Remove(&items_[i]); }

    // Whether it is found, with its content, under each of its hashes.
    bool Holds(uint32 i) const {
        uint32 found = 0;
        for (uint32 n = 0; n < ItemKeys<kHashes>::Hashes(&items_[i]); ++n) {
            const Item* item = table_.Find(ItemKeys<kHashes>::Hash(&items_[i], n),
                                           [&](const Item* candidate) { return candidate == &items_[i]; });
            if (item && item->content == i + 1) ++found;
        }
        EXPECT_TRUE(found == 0 || found == ItemKeys<kHashes>::Hashes(&items_[i])) << i;
        return found != 0;
    }

    uint32 allocations = 0;

private:
    std::array<Item, kItems> items_;
    ReadMostlyTable<const Item, ItemKeys<kHashes>> table_;
};

template <uint32 kHashes>
void CompareWithSet(uint32 steps) {
    Items<kHashes> items;
    std::set<uint32> model;
    std::minstd_rand random(17);
    for (uint32 step = 0; step < steps; ++step) {
        const uint32 i = random() % (step < steps / 2 ? 30 : items.kItems);
        if (model.count(i) == 0) {
            if (items.Add(i, random() % 4 != 0)) model.insert(i);
        } else if constexpr (kHashes == 1) {
            items.Remove(i);
            model.erase(i);
        }
        for (uint32 k = 0; k < items.kItems; ++k) ASSERT_EQ(model.count(k), items.Holds(k)) << step << " " << k;
    }
    EXPECT_LT(30u, model.size());
}

TEST(ReadMostlyTable, HoldsWhatASetHolds) {
    CompareWithSet<1>(3000);
    CompareWithSet<3>(1000);
}

TEST(ReadMostlyTable, GrowsWithWhatIsInIt) {
    Items<1> items;
    for (uint32 i = 0; i < 10 * items.kItems; ++i) {
        EXPECT_TRUE(items.Add(i % items.kItems));
        items.Remove(i % items.kItems);
    }
    EXPECT_EQ(1u, items.allocations);
}

// The first half of the items stay once they are there; the others come and go.
TEST(ReadMostlyTable, IsReadWhileItIsChanged) {
    for (int round = 0; round < 20; ++round) {
        Items<1> items;
        std::atomic<uint32> there{0};
        std::atomic<bool> missed{false};
        auto read = [&] {
            for (uint32 last = 0; last < items.kItems / 2;) {
                last = there.load(std::memory_order_acquire);
                for (uint32 i = 0; i < last; ++i)
                    if (!items.Holds(i)) missed = true;
                for (uint32 i = items.kItems / 2; i < items.kItems; ++i) items.Holds(i);
            }
        };
        std::array<std::thread, 3> readers;
        for (std::thread& reader : readers) reader = std::thread(read);
        for (uint32 i = 0; i < items.kItems / 2; ++i) {
            const uint32 guest = items.kItems / 2 + i;
            EXPECT_EACH(items.Add(guest), items.Add(i));
            there.store(i + 1, std::memory_order_release);
            items.Remove(guest);
            if (i % 8 == 7) std::this_thread::yield();
        }
        for (std::thread& reader : readers) reader.join();
        EXPECT_FALSE(missed);
    }
}

}  // namespace
}  // namespace tessel::test
