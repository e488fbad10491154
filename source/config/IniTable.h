// Numbers of records, found by hash. The hashes lie with the numbers, side by side, so that a record which is not there
// is mostly not found with one look at memory.
#ifndef TESSEL_SOURCE_CONFIG_INITABLE_H
#define TESSEL_SOURCE_CONFIG_INITABLE_H

#include <tessel/memory/TrackedMallocFree.h>

#include <cstddef>
#include <cstdint>
#include <vector>

namespace tessel {

class IniTable {
public:
    using Index = std::uint32_t;
    static constexpr Index kNone = UINT32_MAX;

    // The first record of that hash for which matches(index) is true, or kNone.
    template <class Matches>
    Index Find(std::uint32_t hash, Matches matches) const {
        if (slots_.empty()) return kNone;
        for (std::size_t at = hash & mask_; slots_[at].index != kNone; at = (at + 1) & mask_) {
            if (slots_[at].hash == hash && matches(slots_[at].index)) return slots_[at].index;
        }
        return kNone;
    }

    // Room for so many records. May raise std::bad_alloc; the others do not.
    void MakeRoom(std::size_t count) {
        if (count < slots_.size() / 3 * 2) return;
        std::size_t size = 64;
        while (size / 3 * 2 <= count) size *= 2;
        Slots old(size, Slot{0, kNone});
        old.swap(slots_);
        mask_ = size - 1;
        for (const Slot& slot : old) {
            if (slot.index != kNone) Insert(slot.hash, slot.index);
        }
    }

    void Insert(std::uint32_t hash, Index index) {
        std::size_t at = hash & mask_;
        while (slots_[at].index != kNone) at = (at + 1) & mask_;
        slots_[at] = {hash, index};
    }

    // What stands behind it moves up, unless it would come before its own place.
    void Erase(std::uint32_t hash, Index index) {
        std::size_t hole = hash & mask_;
        while (slots_[hole].index != index) hole = (hole + 1) & mask_;
        for (std::size_t at = (hole + 1) & mask_; slots_[at].index != kNone; at = (at + 1) & mask_) {
            const std::size_t home = slots_[at].hash & mask_;
            if (((at - home) & mask_) < ((at - hole) & mask_)) continue;
            slots_[hole] = slots_[at];
            hole = at;
        }
        slots_[hole].index = kNone;
    }

private:
    struct Slot {
        std::uint32_t hash;
        Index index;
    };
    using Slots = std::vector<Slot, TrackedAllocator<Slot>>;

    Slots slots_;  // a power of two of them, or none; never full
    std::size_t mask_ = 0;
};

}  // namespace tessel

#endif
