#include "memory/PouchTree.h"

#include <tessel/memory/MemoryManager.h>

#include <algorithm>
#include <cstddef>
#include <new>
#include <utility>

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

// Threads the entries to each other, the last to the first of the next pouch. The pouch is entered into the directory
// last: from then on it is found. Only a damaged free list asks for another than the next.
bool PouchTree::AddPouch(uint32 base, void* pouch) {
    if (base / kSlots[3] != directory_.load()->count || !MakeRoomInDirectory()) return false;
    for (uint32 i = 0; i < kSlots[3]; ++i) EntryIn(pouch, i)->link = static_cast<int32>(base + i + 1);
    Directory* directory = directory_.load(std::memory_order_relaxed);
    directory->pouches[base / kSlots[3]] = pouch;
    directory->count.store(base / kSlots[3] + 1, std::memory_order_release);
    return true;
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

void** PouchTree::EmptyPlace(uint32 index, int* level) {
    void** place = &root_;
    for (*level = 0; *place; ++*level) {
        if (*level == 3) return nullptr;
        place = static_cast<void**>(*place) + (index >> kShifts[*level]) % kSlots[*level];
    }
    return place;
}

uint32 PouchTree::SizeMissing(uint32 index) {
    int level;
    return EmptyPlace(index, &level) ? NodeSize(level) : 0;
}

bool PouchTree::Add(uint32 index, void* block) {
    int level;
    void** place = EmptyPlace(index, &level);
    if (!place || (level == 3 && !AddPouch(index & ~(kSlots[3] - 1), block))) return false;
    __atomic_store_n(place, block, __ATOMIC_RELEASE);
    return true;
}

PouchTree::Size PouchTree::Measure() const {
    Size size{0, 0, 0};
    auto measure = [&](void*, int level, uint32) {
        ++(level < 3 ? size.arrays : size.pouches);
        size.bytes += NodeSize(level);
        return true;
    };
    VisitNodes(root_, 0, 0, measure);
    return size;
}

}  // namespace tessel
