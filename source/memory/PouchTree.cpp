#include "memory/PouchTree.h"

#include <tessel/memory/MemoryManager.h>

namespace tessel {

PouchTree::~PouchTree() {
    auto dispose = [](void* node, int, uint32) {
        DSDisposePtr(node);
        return true;
    };
    VisitNodes(root_, 0, 0, dispose);
}

// A pouch whose entries are threaded to each other, the last to the first of the next pouch.
void* PouchTree::MakePouch(uint32 base) const {
    void* pouch = DSNewPClr(kSlots[3] * entrySize_);
    for (uint32 i = 0; pouch && i < kSlots[3]; ++i) EntryIn(pouch, i)->link = static_cast<int32>(base + i + 1);
    return pouch;
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
        if (level == 3) {
            if (index < kSlots[3]) __atomic_store_n(&firstPouch_, node, __ATOMIC_RELEASE);
            return EntryIn(node, index % kSlots[3]);
        }
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
