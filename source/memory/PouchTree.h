// The entries of a cookie jar, by slot index.
//
//   level        0 (root)       1              2            3 (pouch)
//   index bits   19-16          15-11          10-6         5-0
//   a slot is    a level 1      a level 2      a pouch      an entry
//
// Arrays and pouches are pointer blocks, made when first needed and kept until the jar goes: an entry never moves, and
// finding one takes no lock. The arrays are what a jar's disposal report counts. Lookups do not walk them, which costs up to
// a third more: pouches are made in the order of their indices, so that a directory of them without gaps says the same.
#ifndef TESSEL_SOURCE_MEMORY_POUCHTREE_H
#define TESSEL_SOURCE_MEMORY_POUCHTREE_H

#include <tessel/base/Types.h>
#include <tessel/memory/TrackedMallocFree.h>

#include <atomic>

namespace tessel {

// One cookie. The info follows. The three words are read without a lock: through the functions below.
struct alignas(void*) CookieEntry {
    uint32 generation;  // 0 while free
    int32 link;         // kInUse, else the index of the next free entry
    uint32 rights;      // the count (0 in jars without rights) with the generation that it belongs to: see RightsOf

    static constexpr int32 kInUse = -1;
    static constexpr uint32 kRightsBits = 20;
    static constexpr uint32 kMostRights = (1u << kRightsBits) - 1;

    // Count and generation change as one word: a count is never changed for another cookie than the one meant.
    static uint32 RightsOf(uint32 generation, uint32 count) { return generation << kRightsBits | count; }

    uint8* Info() { return reinterpret_cast<uint8*>(this + 1); }
    uint32 Generation() const { return __atomic_load_n(&generation, __ATOMIC_ACQUIRE); }
    int32 Link() const { return __atomic_load_n(&link, __ATOMIC_ACQUIRE); }
    uint32 Rights() const { return __atomic_load_n(&rights, __ATOMIC_ACQUIRE); }
    void SetGeneration(uint32 value) { __atomic_store_n(&generation, value, __ATOMIC_RELEASE); }
    void SetLink(int32 value) { __atomic_store_n(&link, value, __ATOMIC_RELEASE); }
    void SetRights(uint32 value) { __atomic_store_n(&rights, value, __ATOMIC_RELEASE); }
    bool SwapRights(uint32 expected, uint32 value) {
        return __atomic_compare_exchange_n(&rights, &expected, value, false, __ATOMIC_ACQ_REL, __ATOMIC_RELAXED);
    }
};

class PouchTree : public TrackedObject {
public:
    static constexpr uint32 kIndexBits = 20;
    static constexpr uint32 kIndices = 1u << kIndexBits;

    explicit PouchTree(uint32 infoSize)
        : entrySize_((static_cast<uint32>(sizeof(CookieEntry)) + infoSize + (alignof(CookieEntry) - 1)) &
                     ~static_cast<uint32>(alignof(CookieEntry) - 1)) {}
    ~PouchTree();

    uint32 EntrySize() const { return entrySize_; }

    // The entry of an index below kIndices; null while its pouch has not been made.
    CookieEntry* Find(uint32 index) const {
        const Directory* directory = directory_.load(std::memory_order_acquire);
        uint32 pouch = index / kSlots[3];
        if (pouch >= directory->count.load(std::memory_order_acquire)) return nullptr;
        return EntryIn(directory->pouches[pouch], index % kSlots[3]);
    }
    // The bytes of the first array or pouch that is missing on the way to the entry of an index; 0: none. Callers
    // serialise, also with Add.
    uint32 SizeMissing(uint32 index);
    // Puts there a cleared pointer block of that size, which belongs to the tree from then on. False: not taken.
    bool Add(uint32 index, void* block);

    // Visits the entries in use by index until the visitor returns false. Callers serialise.
    template <class Visitor>
    void ForEachInUse(Visitor&& visitor) const {
        auto entries = [&](void* node, int level, uint32 base) {
            for (uint32 i = 0; level == 3 && i < kSlots[3]; ++i) {
                CookieEntry* entry = EntryIn(node, i);
                if (entry->Link() < 0 && !visitor(entry, base + i)) return false;
            }
            return true;
        };
        VisitNodes(root_, 0, 0, entries);
    }

    struct Size {
        uint32 arrays, pouches;
        uint32 bytes;  // of both
    };
    Size Measure() const;

private:
    static constexpr uint32 kBits[4] = {4, 5, 5, 6};
    static constexpr uint32 kSlots[4] = {1u << kBits[0], 1u << kBits[1], 1u << kBits[2], 1u << kBits[3]};
    static constexpr uint32 kShifts[4] = {kBits[1] + kBits[2] + kBits[3], kBits[2] + kBits[3], kBits[3], 0};
    static_assert(kBits[0] + kBits[1] + kBits[2] + kBits[3] == kIndexBits);

    static void* Slot(void* array, uint32 i) {
        return __atomic_load_n(static_cast<void**>(array) + i, __ATOMIC_ACQUIRE);
    }
    CookieEntry* EntryIn(void* pouch, uint32 i) const {
        return reinterpret_cast<CookieEntry*>(static_cast<uint8*>(pouch) + size_t{entrySize_} * i);
    }
    bool AddPouch(uint32 base, void* pouch);
    uint32 NodeSize(int level) const {
        return kSlots[level] * (level < 3 ? static_cast<uint32>(sizeof(void*)) : entrySize_);
    }
    // The first empty place on the way to an entry, and its level; null when there is none.
    void** EmptyPlace(uint32 index, int* level);
    bool MakeRoomInDirectory();

    // Visits the arrays and pouches below (and with) a node depth first, each after what hangs on it, by index:
    // visitor(node, level, index of its first entry). Ends when that returns false.
    template <class Visitor>
    static bool VisitNodes(void* node, int level, uint32 base, Visitor& visitor) {
        if (!node) return true;
        for (uint32 i = 0; level < 3 && i < kSlots[level]; ++i)
            if (!VisitNodes(Slot(node, i), level + 1, base + (i << kShifts[level]), visitor)) return false;
        return visitor(node, level, base);
    }

    // The pouches by index / 64. One that is full is replaced by a larger one, and stays for those who are reading it.
    struct Directory {
        Directory* older;
        uint32 room;
        std::atomic<uint32> count;
        void* pouches[1];  // `room` of them, the first `count` there
    };

    uint32 entrySize_;
    void* root_ = nullptr;
    Directory first_{nullptr, 1, {0}, {nullptr}};  // enough for a jar with few cookies
    std::atomic<Directory*> directory_{&first_};
};

}  // namespace tessel

#endif
