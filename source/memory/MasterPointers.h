// Master pointers: the slots that handles point to.
//
// Slots live in blocks of 10,000 that stay until the memory manager stops. A slot in use holds the address of the
// handle's data, bit 0 clear; a free one holds the next free one with bit 0 set.
#ifndef TESSEL_SOURCE_MEMORY_MASTERPOINTERS_H
#define TESSEL_SOURCE_MEMORY_MASTERPOINTERS_H

#include "base/ReadMostlyTable.h"
#include "memory/ThreadMemory.h"
#include "sync/LibraryMutex.h"
#include <tessel/base/MgErr.h>
#include <tessel/base/Types.h>

namespace tessel {

constexpr uint32 kSlotsPerBlock = 10000;

struct MasterPointerBlock {
    MasterPointerBlock* next;  // newest first
    UPtr slots[kSlotsPerBlock];
};

inline uintptr_t SlotContent(UHandle slot) {
    return reinterpret_cast<uintptr_t>(__atomic_load_n(slot, __ATOMIC_ACQUIRE));
}
inline void SetSlotContent(UHandle slot, uintptr_t content) {
    __atomic_store_n(slot, reinterpret_cast<UPtr>(content), __ATOMIC_RELEASE);
}
inline bool IsLiveContent(uintptr_t content) {
    return content != 0 && (content & 1) == 0;
}

// All blocks, to tell a handle from any other address. A block stands under each of the stretches of memory that it
// covers.
class MasterPointerSet {
public:
    bool Contains(const void* address) const {
        const uintptr_t at = reinterpret_cast<uintptr_t>(address);
        bool isSlot = false;
        blocks_.Find(Stretches::HashOf(at >> kStretchBits), [&](const MasterPointerBlock* block) {
            uintptr_t offset = at - reinterpret_cast<uintptr_t>(block) - offsetof(MasterPointerBlock, slots);
            if (offset >= sizeof(MasterPointerBlock::slots)) return false;
            isSlot = offset % sizeof(UPtr) == 0;
            return true;
        });
        return isSlot;
    }
    // Callers serialise. False when there is no memory.
    bool Add(const MasterPointerBlock* block);
    // When no other thread uses handles.
    void Clear();

private:
    // Short enough that few handles lie in a stretch that belongs to two blocks, where a lookup takes two steps.
    static constexpr uint32 kStretchBits = sizeof(void*) == 8 ? 14 : 13;

    struct Stretches {
        static constexpr uint32 kFirstSlots = 256;
        static constexpr uint32 kSlotsPerUsed = 4;
        static constexpr uint32 kMostHashes = 6;
        static constexpr bool kRemoves = false;

        static uintptr_t First(const MasterPointerBlock* block) {
            return reinterpret_cast<uintptr_t>(block) >> kStretchBits;
        }
        static uint32 Hashes(const MasterPointerBlock* block) {
            const uintptr_t last = (reinterpret_cast<uintptr_t>(block + 1) - 1) >> kStretchBits;
            return static_cast<uint32>(last - First(block)) + 1;
        }
        static uint32 Hash(const MasterPointerBlock* block, uint32 n) { return HashOf(First(block) + n); }
        static uint32 HashOf(uintptr_t stretch) { return static_cast<uint32>(stretch) * 0x9E3779B1u; }
    };
    static_assert(sizeof(MasterPointerBlock) <= (Stretches::kMostHashes - 1) << kStretchBits);

    ReadMostlyTable<const MasterPointerBlock, Stretches> blocks_;
};

class MasterPointers {
public:
    // Adds the first five blocks. While nobody else uses handles, as Stop.
    MgErr Start();
    // Frees all blocks; no handle may be live.
    void Stop();

    // Nothing is called inside it that takes another lock of the memory manager, but for the heap's.
    mutable LibraryMutex mutex;

    // A slot for a new handle, or null. It is not live before it is given data.
    UHandle Take(ThreadMemory* mine) { return mine && mine->slots.head ? Pop(mine->slots) : TakeShared(mine); }
    // Frees a slot: the next that this thread takes.
    void Put(ThreadMemory* mine, UHandle slot) {
        if (mine && HasRoom(mine))
            Push(mine->slots, slot);
        else
            PutShared(mine, slot);
    }
    // The two without their exceptions: for a thread that has a slot at hand, and one that has room for it.
    UHandle TakePlain(ThreadMemory* mine) { return Pop(mine->slots); }
    static bool HasRoom(const ThreadMemory* mine) { return mine->slots.count != kChainSlots; }
    void PutPlain(ThreadMemory* mine, UHandle slot) { Push(mine->slots, slot); }

    // Gives back all slots of a chain.
    void Return(SlotChain& chain);

    bool Contains(UHandle slot) const { return set_.Contains(slot); }

    // The live slot that holds exactly this, or null.
    UHandle Find(const void* data) const;

    // Visits every live slot until the visitor returns false, which it then returns.
    template <class Visitor>
    bool ForEachLive(Visitor&& visitor) const {
        LibraryMutexHolder hold(mutex);
        for (MasterPointerBlock* block = blocks_; block; block = block->next)
            for (UPtr& slot : block->slots)
                if (IsLiveContent(SlotContent(&slot)) && !visitor(&slot)) return false;
        return true;
    }

    // The same without the mutex, for a visitor that frees what it sees. No other thread may be using handles.
    template <class Visitor>
    void ForEachLeft(Visitor&& visitor) const TESSEL_LOCKS_UNPROVEN {
        for (MasterPointerBlock* block = blocks_; block; block = block->next)
            for (UPtr& slot : block->slots)
                if (IsLiveContent(SlotContent(&slot))) visitor(&slot);
    }

    // Follows the shared chain and the calling thread's, and reports what is wrong with them. True: nothing.
    bool CheckChains(ThreadMemory* mine) const;

    // Counts the blocks along the list and reports a difference. kCorruptErr.
    MgErr CheckBlocks() const;

private:
    friend struct MasterPointersTest;
    static constexpr uint32 kChainSlots = 32;
    static constexpr int kFirstBlocks = 5;

    static UHandle Pop(SlotChain& chain) {
        UHandle slot = chain.head;
        chain.head = reinterpret_cast<UHandle>(SlotContent(slot) & ~uintptr_t{1});
        --chain.count;
        return slot;
    }
    static void Push(SlotChain& chain, UHandle slot) {
        if (!chain.head) chain.tail = slot;
        SetSlotContent(slot, reinterpret_cast<uintptr_t>(chain.head) | 1);
        chain.head = slot;
        ++chain.count;
    }
    UHandle TakeShared(ThreadMemory* mine);
    void PutShared(ThreadMemory* mine, UHandle slot);
    bool Refill(SlotChain& chain);
    bool AddBlock() TESSEL_REQUIRES(mutex);
    bool IsChain(UHandle head, uint32 count) const;

    UHandle freeHead_ TESSEL_GUARDED_BY(mutex) = nullptr;
    int32 freeCount_ TESSEL_GUARDED_BY(mutex) = 0;
    MasterPointerBlock* blocks_ TESSEL_GUARDED_BY(mutex) = nullptr;
    int32 blockCount_ TESSEL_GUARDED_BY(mutex) = 0;
    MasterPointerSet set_;
};

extern MasterPointers masterPointers;

}  // namespace tessel

#endif
