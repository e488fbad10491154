#include "paths/PathItemStorage.h"

#include "base/ReadMostlyTable.h"
#include "paths/PathItemElement.h"
#include "paths/PathLock.h"
#include "sync/LibraryMutex.h"
#include <tessel/diagnostics/DebugStream.h>
#include <tessel/memory/TrackedMallocFree.h>

#include <bit>
#include <cstdlib>
#include <map>
#include <new>
#include <utility>

namespace tessel {
namespace {

constexpr uint32 kElementsPerBlock = 512;
constexpr int kBaseCount = 5;

struct Block {
    Block* next = this;
    uint32 cursor = kElementsPerBlock - 1;
    std::atomic<uint32> freeSlots{kElementsPerBlock};
    PathItemElement slots[kElementsPerBlock];
};

// A block lies at a multiple of this, so that the address of a slot gives that of its block.
constexpr size_t kBlockAlignment = std::bit_ceil(sizeof(Block));

Block* BlockOf(const PathItemElement* element) {
    return reinterpret_cast<Block*>(reinterpret_cast<uintptr_t>(element) & ~uintptr_t{kBlockAlignment - 1});
}

// All blocks. Read by any thread, changed by one that holds the storage mutex.
struct BlockKeys {
    static constexpr uint32 kFirstSlots = 16;
    static constexpr uint32 kSlotsPerUsed = 2;
    static constexpr uint32 kMostHashes = 1;
    static constexpr bool kRemoves = true;

    static uint32 Hashes(const Block*) { return 1; }
    static uint32 Hash(const Block* block, uint32 = 0) {
        return static_cast<uint32>(reinterpret_cast<uintptr_t>(block) / kBlockAlignment) * 0x9E3779B1u;
    }
};
using BlockSet = ReadMostlyTable<const Block, BlockKeys>;

using Locations = std::map<std::string, PathItemElement*, std::less<>,
                           TrackedAllocator<std::pair<const std::string, PathItemElement*>>>;

LibraryMutex storageMutex;
Block* currentBlock TESSEL_GUARDED_BY(storageMutex) = nullptr;
BlockSet blocks;
Locations* locations TESSEL_GUARDED_BY(storageMutex) = nullptr;

std::atomic<PathItemElement*> standards[kBaseCount];
std::atomic<bool> standardsRead{false};

Block* NewBlock() TESSEL_REQUIRES(storageMutex) {
    void* room = ::operator new (sizeof(Block), std::align_val_t{kBlockAlignment}, std::nothrow);
    if (!room) return nullptr;
    Block* block = new (room) Block;
    if (!blocks.Add(block, [](size_t size) { return std::calloc(1, size); })) {
        block->~Block();
        ::operator delete (room, std::align_val_t{kBlockAlignment});
        return nullptr;
    }
    if (currentBlock) {
        block->next = currentBlock->next;
        currentBlock->next = block;
    }
    currentBlock = block;
    return block;
}

// Frees the block after `before`, which may be `before` itself.
void FreeBlockAfter(Block* before) TESSEL_REQUIRES(storageMutex) {
    Block* block = before->next;
    before->next = block->next;
    if (currentBlock == block) currentBlock = before == block ? nullptr : before;
    blocks.Remove(block);
    block->~Block();
    ::operator delete (block, std::align_val_t{kBlockAlignment});
}

template <class Visitor>
void ForEachBlock(Visitor visit) TESSEL_REQUIRES(storageMutex) {
    Block* block = currentBlock;
    if (!block) return;
    do {
        visit(*block);
        block = block->next;
    } while (block != currentBlock);
}

bool IsUnused(const Block& block) {
    return block.freeSlots.load(std::memory_order_acquire) == kElementsPerBlock;
}

PathItemElement* ClaimSlot(Block& block) TESSEL_REQUIRES(storageMutex) {
    if (block.freeSlots.load(std::memory_order_acquire) == 0) return nullptr;
    for (uint32 i = 0; i < kElementsPerBlock; ++i) {
        PathItemElement& slot = block.slots[block.cursor];
        block.cursor = block.cursor ? block.cursor - 1 : kElementsPerBlock - 1;
        if (slot.Claim()) {
            block.freeSlots.fetch_sub(1, std::memory_order_relaxed);
            return &slot;
        }
    }
    return nullptr;
}

// The first free slot from the current block on. That block becomes the current one.
PathItemElement* ClaimAnySlot() TESSEL_REQUIRES(storageMutex) {
    Block* block = currentBlock;
    if (!block) return nullptr;
    do {
        if (PathItemElement* slot = ClaimSlot(*block)) {
            currentBlock = block;
            return slot;
        }
        block = block->next;
    } while (block != currentBlock);
    return nullptr;
}

uint32 FreeUnusedBlocks() TESSEL_REQUIRES(storageMutex) {
    uint32 unvisited = 0;
    ForEachBlock([&](Block&) { ++unvisited; });
    uint32 bytes = 0;
    for (Block* before = currentBlock; unvisited > 0; --unvisited) {
        if (IsUnused(*before->next)) {
            FreeBlockAfter(before);
            bytes += sizeof(Block);
        } else {
            before = before->next;
        }
    }
    return bytes;
}

template <class Visitor>
void ForEachLiveElement(Block& block, Visitor visit) {
    for (PathItemElement& slot : block.slots)
        if (slot.InUse()) visit(slot);
}

void ReportLiveElements(Block& block) {
    const uint32 live = kElementsPerBlock - block.freeSlots.load(std::memory_order_relaxed);
    TESSEL_REPORT(kDebugWarning, 0x7A10D2C4u) << "Killing a storage buffer with " << live << " live object(s)";
    ForEachLiveElement(block, [](const PathItemElement& element) {
        TESSEL_REPORT(kDebugWarning, 0x7A10D2C5u) << "element= " << DbgFmtPtr(&element);
        TESSEL_REPORT(kDebugWarning, 0x7A10D2C6u) << "name= " << element.Name();
        TESSEL_REPORT(kDebugWarning, 0x7A10D2C7u) << "parent= " << DbgFmtPtr(element.Parent());
    });
}

struct LeakedElement {
    int32 retains;
    std::string name;
};
using LeakedElements = std::vector<LeakedElement, TrackedAllocator<LeakedElement>>;

// Elements that paths still refer to. The holds of children are no leaks, nor are the bases.
LeakedElements FindLeakedElements() TESSEL_REQUIRES(pathMutex, storageMutex) {
    LeakedElements leaked;
    ForEachBlock([&](Block& block) {
        ForEachLiveElement(block, [&](const PathItemElement& element) TESSEL_LOCKS_UNPROVEN {  // called at once
            const int32 retains = element.OutsideRetains();
            if (retains > 0 && element.Parent()) leaked.push_back({retains, element.Name()});
        });
    });
    return leaked;
}

}  // namespace

// ---- start and stop -------------------------------------------------------------------------------------------------

MgErr PathItemStorage::Start() {
    return storageMutex.Create("PathStorageMutex");
}

// Alone: nobody uses paths any more.
void PathItemStorage::Stop() TESSEL_LOCKS_UNPROVEN {
    FreeUnusedBlocks();
    ForEachBlock(ReportLiveElements);
    if (!currentBlock) blocks.Clear(std::free);
    standardsRead.store(false, std::memory_order_relaxed);
    storageMutex.Destroy();
}

// ---- slots ----------------------------------------------------------------------------------------------------------

PathItemElement* PathItemStorage::Allocate() {
    LibraryMutexHolder lock(storageMutex);
    PathItemElement* element = ClaimAnySlot();
    if (!element && NewBlock()) element = ClaimSlot(*currentBlock);
    return element;
}

void PathItemStorage::SlotVacated(const PathItemElement* element) {
    BlockOf(element)->freeSlots.fetch_add(1, std::memory_order_release);
}

bool PathItemStorage::Owns(const PathItemElement* element) {
    const Block* block = BlockOf(element);
    if (!blocks.Find(BlockKeys::Hash(block), [block](const Block* there) { return there == block; })) return false;
    const uintptr_t offset = reinterpret_cast<uintptr_t>(element) - reinterpret_cast<uintptr_t>(block->slots);
    return offset < sizeof block->slots && offset % sizeof(PathItemElement) == 0;
}

// ---- bases ----------------------------------------------------------------------------------------------------------

void PathItemStorage::SetStandard(PathRef::PathBase base, PathItemElement* element) {
    if (standardsRead.load(std::memory_order_relaxed) && element)
        TESSEL_REPORT(kDebugWarning, 0x90C3F1A8u)
            << "Possible threading issue, see documentation note for PathItemStorage::SetStandard!";
    if (element) element->Retain();
    if (PathItemElement* previous = standards[base].exchange(element)) previous->Release();
}

PathItemElement* PathItemStorage::Standard(PathRef::PathBase base) {
    if (!standardsRead.load(std::memory_order_relaxed)) standardsRead.store(true, std::memory_order_relaxed);
    return standards[base].load(std::memory_order_acquire);
}

// ---- standard locations ---------------------------------------------------------------------------------------------

MgErr PathItemStorage::AddLocation(const char* name, PathItemElement* element) {
    LibraryMutexHolder lock(storageMutex);
    if (!locations) locations = new (TrackedNew(sizeof(Locations))) Locations;
    if (!locations->emplace(name, element).second) return kArgErr;
    element->Retain();
    return kNoErr;
}

PathItemElement* PathItemStorage::FindLocation(const char* name) {
    LibraryMutexHolder lock(storageMutex);
    if (!locations) return nullptr;
    const auto found = locations->find(std::string_view(name));
    if (found == locations->end()) return nullptr;
    found->second->Retain();
    return found->second;
}

void PathItemStorage::ForgetLocations() {
    Locations* forgotten;
    {
        LibraryMutexHolder lock(storageMutex);
        forgotten = std::exchange(locations, nullptr);
    }
    if (!forgotten) return;
    for (const auto& entry : *forgotten) entry.second->Release();
    forgotten->~Locations();
    TrackedFree(forgotten);
}

// ---- garbage collection ---------------------------------------------------------------------------------------------

uint32 PathItemStorage::GarbageCollect(PathRef::OptimizationMethod method) {
    uint32 bytes = 0;
    LeakedElements leaked;
    {
        PathLock pathLock;
        LibraryMutexHolder lock(storageMutex);
        if (method == PathRef::kFreeUnusedAndReport) leaked = FindLeakedElements();
        if (method != PathRef::kCountOnly) bytes = FreeUnusedBlocks();
    }
    for (const LeakedElement& element : leaked)
        TESSEL_REPORT(kDebugWarning, 0x21F4B9E3u)
            << "Leaked Path Element: " << element.retains << " refs to " << element.name;
    TESSEL_REPORT(kDebugInfo, 0x44D8E026u) << "Path Garbage Collect: " << bytes << " bytes reclaimed";
    return bytes;
}

}  // namespace tessel
