#include "memory/PouchTree.h"

#include <algorithm>
#include <cstddef>
#include <new>
#include <utility>

#include <tessel/memory/MemoryManager.h>

namespace tessel {

PouchTree::~PouchTree() {
    auto dispose = [](void* node, int, uint32) {
        DSDisposePtr(node);
        return true;
    };
    VisitNodes(root_, 0, 0, dispose);
    for (Directory* directory = directory_; directory != &first_;)
        TrackedFree(std::exchange(directory, directory->older));
}

// A pouch whose entries are threaded to each other, the last to the first of the next pouch. It is entered into the
// directory last: from then on it is found. Only a damaged free list asks for another than the next.
void* PouchTree::MakePouch(uint32 base) {
    if (base / kSlots[3] != directory_.load()->count || !MakeRoomInDirectory()) return nullptr;
    void* pouch = DSNewPClr(kSlots[3] * entrySize_);
    if (!pouch) return nullptr;
    for (uint32 i = 0; i < kSlots[3]; ++i) EntryIn(pouch, i)->link = static_cast<int32>(base + i + 1);
    Directory* directory = directory_.load(std::memory_order_relaxed);
    directory->pouches[base / kSlots[3]] = pouch;
    directory->count.store(base / kSlots[3] + 1, std::memory_order_release);
    return pouch;
}

bool PouchTree::MakeRoomInDirectory() {
    Directory* old = directory_.load(std::memory_order_relaxed);
    const uint32 count = old->count.load(std::memory_order_relaxed);
    if (count < old->room) return true;
    const uint32 room = std::max(kSlots[2], 2 * old->room);
    void* memory = TrackedMalloc(offsetof(Directory, pouches) + room * sizeof old->pouches[0]);
    if (!memory) return false;
    auto* larger = new (memory) Directory{old, room, {count}, {}};
    std::copy_n(old->pouches, count, larger->pouches);
    directory_.store(larger, std::memory_order_release);
    return true;
}

CookieEntry* PouchTree::FindOrMake(uint32 index) {
    void** place = &root_;
    for (int level = 0;; ++level) {
        void* node = *place;
        if (!node) {
            node = level < 3 ? DSNewPClr(kSlots[level] * static_cast<uint32>(sizeof(void*)))
                             : MakePouch(index & ~(kSlots[3] - 1));
            if (!node) return nullptr;
            __atomic_store_n(place, node, __ATOMIC_RELEASE);
        }
        if (level == 3) return EntryIn(node, index % kSlots[3]);
        place = static_cast<void**>(node) + (index >> kShifts[level]) % kSlots[level];
    }
}

PouchTree::Size PouchTree::Measure() const {
    Size size{0, 0, 0};
    auto measure = [&](void*, int level, uint32) {
        ++(level < 3 ? size.arrays : size.pouches);
        size.bytes += kSlots[level] * (level < 3 ? static_cast<uint32>(sizeof(void*)) : entrySize_);
        return true;
    };
    VisitNodes(root_, 0, 0, measure);
    return size;
}

}  // namespace tessel
