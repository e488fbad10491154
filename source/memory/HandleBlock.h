// How the blocks of handles and pointers are laid out.
//
//   handle    [alignment record 4, padding]  header 8  [guard 8]  data  [guard 8]
//   pointer   [unused 4, size 4, guard 8]  data  [guard 8]
//
// The alignment record stands only in aligned blocks, at their start; guards only where the option word of the kind
// asks for guard room.
#ifndef TESSEL_SOURCE_MEMORY_HANDLEBLOCK_H
#define TESSEL_SOURCE_MEMORY_HANDLEBLOCK_H

#include <tessel/base/Types.h>

#include "memory/GuardBytes.h"

namespace tessel {

// In front of the (guarded) data of a handle.
struct HandleHeader {
    uint32 size;      // of the data
    uint32 distance;  // back to the start of the heap block; 0 when the header is its start
};
static_assert(sizeof(HandleHeader) == 8);

// What a block is aligned to: data address + offset is a multiple of the alignment.
struct Alignment {
    uint16 alignment = 8;
    uint16 offset = 0;

    bool operator==(const Alignment&) const = default;
    bool IsDefault() const { return alignment == 8 && offset == 0; }
};
static_assert(sizeof(Alignment) == 4);

// The alignment of a handle of that size.
inline Alignment AlignmentForSize(uint32 size) {
    constexpr uint32 kMedium = 1024, kLarge = 1048576;
    uint16 offset = (size & 3) != 0 ? 0 : (size & 4) != 0 ? 4 : size != 0 ? 8 : 0;
    if (size < kMedium) return {8, static_cast<uint16>(offset & 4)};  // 8 is as good as 0 to an alignment of 8
    return {static_cast<uint16>(size < kLarge ? 16 : 4096), offset};
}

// The alignment that a caller asked for, made good.
Alignment AlignmentFor(uint32 alignment, uint32 offset);

// Heap bytes for a handle; 0 when they do not fit in 32 bits.
uint32 AlignedBlockSize(uint32 size, Alignment alignment, uint32 guards);
inline uint32 BlockSize(uint32 size, Alignment alignment) {
    uint32 guards = 2 * GuardRoom(GuardKind::kHandle);
    if (__builtin_expect(!alignment.IsDefault(), false)) return AlignedBlockSize(size, alignment, guards);
    uint32 bytes = (size + guards + static_cast<uint32>(sizeof(HandleHeader)) + 7) & ~7u;
    return bytes > size ? bytes : 0;
}

// ---- a handle's block, by the address of its data
// ---------------------------------------------------------------------

inline HandleHeader* HeaderOf(const void* data) {
    uintptr_t header = reinterpret_cast<uintptr_t>(data) - GuardRoom(GuardKind::kHandle) - sizeof(HandleHeader);
    return reinterpret_cast<HandleHeader*>(header);
}
inline uint32 SizeOfData(const void* data) {
    return HeaderOf(data)->size;
}
inline void* BlockOf(const void* data) {
    HandleHeader* header = HeaderOf(data);
    return reinterpret_cast<char*>(header) - header->distance;
}
inline Alignment AlignmentOf(const void* data) {
    return HeaderOf(data)->distance == 0 ? Alignment() : *static_cast<Alignment*>(BlockOf(data));
}

// Where the data of a handle goes in a heap block.
UPtr PlaceData(void* block, Alignment alignment);

// Writes header, alignment record and guard bytes for data placed at `data`.
inline void WriteHeader(void* block, UPtr data, uint32 size, Alignment alignment) {
    HandleHeader* header = HeaderOf(data);
    header->size = size;
    header->distance = static_cast<uint32>(reinterpret_cast<char*>(header) - static_cast<char*>(block));
    if (header->distance != 0) *static_cast<Alignment*>(block) = alignment;
    if (__builtin_expect(WritesGuards(GuardKind::kHandle), false)) WriteGuards(data, size);
}

// ---- pointer blocks without their tracking
// ------------------------------------------------------------------------------

// A plain block with guards as the kind's option word says; null when there is no memory.
UPtr NewGuardedBlock(size_t size, GuardKind kind);
void DisposeGuardedBlock(void* data, GuardKind kind);

inline UPtr NewPtrBlock(size_t size) {
    return NewGuardedBlock(size, GuardKind::kPointer);
}
inline void DisposePtrBlock(void* data) {
    DisposeGuardedBlock(data, GuardKind::kPointer);
}

}  // namespace tessel

#endif
