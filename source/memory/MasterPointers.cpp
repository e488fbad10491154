#include "memory/MasterPointers.h"

#include "memory/HandleBlock.h"
#include "memory/Heap.h"
#include <tessel/diagnostics/DebugStream.h>
#include <tessel/memory/MemoryManager.h>

#include <cstdlib>
#include <utility>

namespace tessel {

MasterPointers masterPointers;

// ---- the set --------------------------------------------------------------------------------------------------------

bool MasterPointerSet::Add(const MasterPointerBlock* block) {
    return blocks_.Add(block, [](size_t size) { return std::calloc(1, size); });
}

void MasterPointerSet::Clear() {
    blocks_.Clear(std::free);
}

// ---- blocks ---------------------------------------------------------------------------------------------------------

MgErr MasterPointers::Start() TESSEL_LOCKS_UNPROVEN {
    for (int i = 0; i < kFirstBlocks; ++i)
        if (!AddBlock()) {
            Stop();
            CallSetMemFullProc(sizeof(MasterPointerBlock));
            return kMemFullErr;
        }
    return kNoErr;
}

void MasterPointers::Stop() TESSEL_LOCKS_UNPROVEN {
    ThreadMemory::ForgetHandles();
    set_.Clear();
    while (blocks_) DisposePtrBlock(std::exchange(blocks_, blocks_->next));
    freeHead_ = nullptr;
    freeCount_ = blockCount_ = 0;
}

// Threads all slots of a new block onto the chain.
bool MasterPointers::AddBlock() {
    auto* block = static_cast<MasterPointerBlock*>(static_cast<void*>(NewPtrBlock(sizeof(MasterPointerBlock))));
    if (!block) return false;
    if (!set_.Add(block)) {
        DisposePtrBlock(block);
        return false;
    }
    for (uint32 i = 0; i < kSlotsPerBlock; ++i) {
        UHandle next = i + 1 < kSlotsPerBlock ? &block->slots[i + 1] : freeHead_;
        SetSlotContent(&block->slots[i], reinterpret_cast<uintptr_t>(next) | 1);
    }
    freeHead_ = &block->slots[0];
    freeCount_ += kSlotsPerBlock;
    block->next = blocks_;
    blocks_ = block;
    ++blockCount_;
    return true;
}

// ---- taking and returning slots -------------------------------------------------------------------------------------

// Cuts a chain for a thread off the shared one.
bool MasterPointers::Refill(SlotChain& chain) {
    LibraryMutexHolder hold(mutex);
    if (!freeHead_ && !AddBlock()) return false;
    chain.head = chain.tail = freeHead_;
    for (chain.count = 1; chain.count < kChainSlots; ++chain.count) {
        UHandle next = reinterpret_cast<UHandle>(SlotContent(chain.tail) & ~uintptr_t{1});
        if (!next) break;
        chain.tail = next;
    }
    freeHead_ = reinterpret_cast<UHandle>(SlotContent(chain.tail) & ~uintptr_t{1});
    freeCount_ -= static_cast<int32>(chain.count);
    SetSlotContent(chain.tail, 1);
    return true;
}

UHandle MasterPointers::TakeShared(ThreadMemory* mine) {
    SlotChain single;
    SlotChain& chain = mine ? mine->slots : single;
    if (mine && mine->reserve.head)
        chain = std::exchange(mine->reserve, SlotChain());
    else if (!Refill(chain)) {
        CallSetMemFullProc(sizeof(MasterPointerBlock));
        return nullptr;
    }
    UHandle slot = Pop(chain);
    if (!mine) Return(single);
    return slot;
}

void MasterPointers::PutShared(ThreadMemory* mine, UHandle slot) {
    SlotChain single;
    if (mine) {
        Return(mine->reserve);
        mine->reserve = std::exchange(mine->slots, SlotChain());
    }
    Push(mine ? mine->slots : single, slot);
    if (!mine) Return(single);
}

void MasterPointers::Return(SlotChain& chain) {
    if (!chain.head) return;
    LibraryMutexHolder hold(mutex);
    SetSlotContent(chain.tail, reinterpret_cast<uintptr_t>(freeHead_) | 1);
    freeHead_ = chain.head;
    freeCount_ += static_cast<int32>(chain.count);
    chain = SlotChain();
}

// ---- looking at all -------------------------------------------------------------------------------------------------

UHandle MasterPointers::Find(const void* data) const {
    UHandle found = nullptr;
    ForEachLive([&](UHandle slot) {
        if (SlotContent(slot) != reinterpret_cast<uintptr_t>(data)) return true;
        found = slot;
        return false;
    });
    return found;
}

// No link is followed that does not lead to a slot.
bool MasterPointers::IsChain(UHandle head, uint32 count) const {
    for (; count > 0; --count) {
        if (!Contains(head)) return false;
        head = reinterpret_cast<UHandle>(SlotContent(head) & ~uintptr_t{1});
    }
    return head == nullptr;
}

bool MasterPointers::CheckChains(ThreadMemory* mine) const {
    bool countIsBad, chainIsBad;
    {
        LibraryMutexHolder hold(mutex);
        countIsBad = freeCount_ < 0;
        chainIsBad = !countIsBad && !IsChain(freeHead_, static_cast<uint32>(freeCount_));
    }
    if (mine)
        chainIsBad |=
            !IsChain(mine->slots.head, mine->slots.count) || !IsChain(mine->reserve.head, mine->reserve.count);
    if (countIsBad) TESSEL_REPORT(kDebugFatal, 0x6C0D37A5u) << "bad freemaster count";
    if (chainIsBad) TESSEL_REPORT(kDebugFatal, 0x11F2E8B4u) << "freemaster chain isn't NULL terminated!";
    return !countIsBad && !chainIsBad;
}

MgErr MasterPointers::CheckBlocks() const {
    int32 difference;
    {
        LibraryMutexHolder hold(mutex);
        int32 count = 0;
        for (MasterPointerBlock* block = blocks_; block && count <= blockCount_; block = block->next) ++count;
        difference = count - blockCount_;
    }
    if (difference > 0) TESSEL_REPORT(kDebugFatal, 0x59E3C1D0u) << "MemCheck error, m.p. block chain error 1";
    if (difference < 0) TESSEL_REPORT(kDebugFatal, 0x0A7B64F9u) << "MemCheck error, m.p. block chain error 2";
    return difference == 0 ? kNoErr : kCorruptErr;
}

}  // namespace tessel
