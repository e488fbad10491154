// A hash table of pointers that is read without a lock, by any number of threads, while one changes it.
//
// Readers    Find takes no lock, writes nothing and never waits. It meets every entry that was added before it began
// and
//            is not removed before it ends; what is added or removed meanwhile it may meet or not. What an entry points
//            to is seen as it was when it was added.
// Writers    Add, Remove and Clear are for one thread at a time: their callers serialise. Clear is for when nobody
//            reads any more, and so is the end of the table, which releases nothing by itself.
// Entries    Not null. What an entry's hashes are made from must not change while it is in the table. Removing one does
//            not wait for those who have just found it.
// Memory     A table of slots that is full is replaced by one of twice the size. Who reads may still be in the old one,
//            so it stays until Clear; together the old ones are smaller than the newest.
// Failure    Add is false when there is no memory for a larger table; then nothing has changed.
//
// `Keys` says how entries are found, by 32-bit hashes of which the top bits count most:
//
//     static constexpr uint32 kFirstSlots;      how many slots there are at first, a power of two
//     static constexpr uint32 kSlotsPerUsed;    slots for each that is in use, at least 2
//     static constexpr uint32 kMostHashes;      under how many hashes an entry stands at most
//     static constexpr bool kRemoves;           whether entries are removed; then it is one hash each
//     static uint32 Hashes(T* entry);           how many hashes it has
//     static uint32 Hash(T* entry, uint32 n);   the n-th of them
#ifndef TESSEL_SOURCE_BASE_READMOSTLYTABLE_H
#define TESSEL_SOURCE_BASE_READMOSTLYTABLE_H

#include "base/Compiler.h"
#include <tessel/base/Types.h>

#include <atomic>
#include <bit>
#include <utility>

namespace tessel {

template <class T, class Keys>
class ReadMostlyTable {
public:
    // The first entry that `match` is true for, of those under a hash and of some others; null: none.
    template <class Match>
    T* Find(uint32 hash, Match match) const {
        const Table* table = table_.load(std::memory_order_acquire);
        if (TESSEL_UNLIKELY(table == nullptr)) return nullptr;
        for (uint32 i = hash >> table->shift;; ++i) {
            T* entry = table->slots[i & table->mask].load(std::memory_order_acquire);
            if (!entry) return nullptr;
            if constexpr (Keys::kRemoves)
                if (entry == Removed()) continue;
            if (match(entry)) return entry;
        }
    }

    // Adds an entry that is not there. `allocate(size)` gives zeroed memory, aligned for any plain type, or null.
    template <class Allocate>
    bool Add(T* entry, Allocate allocate) {
        const Table* table = table_.load(std::memory_order_relaxed);
        if ((!table || (used_ + Keys::kMostHashes) * Keys::kSlotsPerUsed > table->mask + 1) && !Grow(allocate))
            return false;
        Put(*table_.load(std::memory_order_relaxed), entry);
        return true;
    }

    // Removes an entry that is there. A removed one that no other stands behind is empty again, and so are those before
    // it: who looks for an entry ends there either way.
    void Remove(T* entry) {
        static_assert(Keys::kRemoves && Keys::kMostHashes == 1);
        Table& table = *table_.load(std::memory_order_relaxed);
        uint32 i = Keys::Hash(entry, 0) >> table.shift;
        while (table.At(i) != entry) ++i;
        table.slots[i & table.mask].store(Removed(), std::memory_order_relaxed);
        if (table.At(i + 1)) return;
        for (; table.At(i) == Removed(); --i, --used_)
            table.slots[i & table.mask].store(nullptr, std::memory_order_relaxed);
    }

    // Forgets all entries; `release(memory)` takes back what `allocate` gave.
    template <class Release>
    void Clear(Release release) {
        Table* table = table_.exchange(nullptr, std::memory_order_acq_rel);
        while (table) release(std::exchange(table, table->older));
        used_ = 0;
    }

private:
    static_assert(std::has_single_bit(Keys::kFirstSlots) && Keys::kSlotsPerUsed >= 2);
    static_assert(Keys::kFirstSlots >= Keys::kMostHashes * Keys::kSlotsPerUsed);

    struct Table {
        Table* older;
        uint32 mask;   // slots - 1
        uint32 shift;  // from a hash to its first slot
        std::atomic<T*> slots[1];

        T* At(uint32 i) const { return slots[i & mask].load(std::memory_order_relaxed); }
    };

    static T* Removed() { return reinterpret_cast<T*>(uintptr_t{1}); }

    void Put(Table& table, T* entry) {
        const uint32 hashes = Keys::Hashes(entry);
        for (uint32 n = 0; n < hashes; ++n) {
            uint32 i = Keys::Hash(entry, n) >> table.shift;
            while (table.At(i)) ++i;
            table.slots[i & table.mask].store(entry, std::memory_order_release);
        }
        used_ += hashes;
    }

    static bool Holds(const Table& table, T* entry) {
        for (uint32 i = Keys::Hash(entry, 0) >> table.shift;; ++i)
            if (T* there = table.At(i); !there || there == entry) return there;
    }

    template <class Allocate>
    bool Grow(Allocate& allocate) {
        Table* old = table_.load(std::memory_order_relaxed);
        const uint32 slots = old ? 2 * (old->mask + 1) : Keys::kFirstSlots;
        auto* table = static_cast<Table*>(allocate(offsetof(Table, slots) + size_t{slots} * sizeof(Table::slots[0])));
        if (!table) return false;
        table->older = old;
        table->mask = slots - 1;
        table->shift = static_cast<uint32>(32 - std::countr_zero(slots));
        used_ = 0;
        for (uint32 i = 0; old && i <= old->mask; ++i) {
            T* entry = old->At(i);
            if (!entry || entry == Removed()) continue;
            if (Keys::kMostHashes == 1 || !Holds(*table, entry)) Put(*table, entry);  // once, with all its hashes
        }
        table_.store(table, std::memory_order_release);
        return true;
    }

    std::atomic<Table*> table_{nullptr};
    uint32 used_ = 0;  // slots that are not empty; the writer's
};

}  // namespace tessel

#endif
