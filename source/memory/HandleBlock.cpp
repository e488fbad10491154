#include "memory/HandleBlock.h"

#include "memory/Heap.h"
#include "platform/Allocator.h"

#include <algorithm>
#include <bit>

namespace tessel {
namespace {

constexpr uint32 kPtrHeader = 16;  // unused 4, size 4, guard 8
constexpr uint32 kMostAlignment = 32768;

}  // namespace

Alignment AlignmentFor(uint32 alignment, uint32 offset) {
    uint32 power = 8;
    while (power < alignment && power < kMostAlignment) power *= 2;
    uint64 rounded = (uint64{offset} + 3) & ~uint64{3};
    if (rounded > UINT16_MAX) rounded %= power;  // places the data as well
    if (power == 8) rounded &= 4;
    return {static_cast<uint16>(power), static_cast<uint16>(rounded)};
}

// Where the header says that the block starts, if the data would be placed there, and how it is aligned. A distance
// that no block can have is told without following it.
bool HandleLayout::FindBlock(UPtr data, uint32 distance, FoundBlock& found, platform::ReadablePages& pages) const {
    constexpr uint32 kMostDistance = sizeof(Alignment) + UINT16_MAX + kMostAlignment;
    found = {reinterpret_cast<char*>(HeaderOf(data)) - distance, Alignment()};
    if (distance == 0) return true;
    if (distance > kMostDistance || distance % sizeof(Alignment) != 0) return false;
    return pages.Read(found.block, found.alignment) && std::has_single_bit(found.alignment.alignment) &&
           PlaceData(found.block, found.alignment) == data;
}

bool HandleLayout::IsSound(UPtr data, platform::ReadablePages& pages) const {
    constexpr size_t kMostUnused = 4 << 20;  // a mapped block ends with its last page, which may be a large one
    HandleHeader header;
    FoundBlock found;
    char guard[kGuardSize];
    if (!pages.Read(HeaderOf(data), header)) return false;
    if (room_ != 0 && WritesGuards(GuardKind::kHandle) && !(pages.Read(data - kGuardSize, guard) && IsGuard(guard)))
        return false;
    if (!FindBlock(data, header.distance, found, pages)) return false;
    const uint32 bytes = BlockSize(header.size, found.alignment);
    const size_t room = platform::AllocatedSizeIfAny(found.block, pages);
    return bytes != 0 && bytes <= room && room - bytes <= bytes / 7 + kMostUnused;
}

UPtr NewGuardedBlock(size_t size, GuardKind kind) {
    const bool guarded = GuardRoom(kind) != 0;
    const size_t room = guarded ? kPtrHeader + kGuardSize : 0;
    const size_t bytes = (std::max<size_t>(size + room, 1) + 7) & ~size_t{7};
    if (bytes < size || (guarded && size > UINT32_MAX)) return static_cast<UPtr>(heap::OutOfMemory());
    const auto block = static_cast<UPtr>(heap::Allocate(bytes));
    if (!block || !guarded) return block;
    UPtr data = block + kPtrHeader;
    *GuardedPtrSize(data) = static_cast<uint32>(size);
    if (WritesGuards(kind)) WriteGuards(data, size);
    return data;
}

bool DisposeGuardedBlock(void* data, GuardKind kind) {
    return heap::Free(static_cast<UPtr>(data) - (GuardRoom(kind) != 0 ? kPtrHeader : 0));
}

}  // namespace tessel
