// How the blocks of handles and pointers are laid out.
//
//   handle    [alignment record 4, padding]  header 8  [guard 8]  data  [guard 8]
//   pointer   [unused 4, size 4, guard 8]  data  [guard 8]
//
// The alignment record stands only in aligned blocks, at their start; guards only where the option word of the kind
// asks for guard room.
#ifndef TESSEL_SOURCE_MEMORY_HANDLEBLOCK_H
#define TESSEL_SOURCE_MEMORY_HANDLEBLOCK_H

#include "base/Compiler.h"
#include "memory/GuardBytes.h"
#include "platform/MemoryRead.h"
#include <tessel/base/Types.h>

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
    bool Suits(const void* data) const {
        return ((reinterpret_cast<uintptr_t>(data) + offset) & (alignment - 1u)) == 0;
    }
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

// How handle blocks are laid out now: looked up once for an operation.
class HandleLayout {
public:
    HandleLayout() : room_(GuardRoom(GuardKind::kHandle)) {}

    // Heap bytes for a handle; 0 when they do not fit in 32 bits.
    uint32 BlockSize(uint32 size, Alignment alignment) const {
        uint64 bytes = uint64{size} + 2 * room_ + sizeof(HandleHeader);
        if (TESSEL_UNLIKELY(!alignment.IsDefault())) {
            bytes += sizeof(Alignment);
            if (alignment.alignment > 8)
                bytes += ((alignment.offset & 4) ? 0u : 4u) + alignment.alignment + alignment.offset;
        }
        bytes = (bytes + alignment.alignment - 1) & ~uint64{alignment.alignment - 1u};
        return bytes <= UINT32_MAX ? static_cast<uint32>(bytes) : 0;
    }

    // The same for the default alignment, without guards, below the size from which larger alignments are chosen.
    static uint32 PlainBlockSize(uint32 size) { return (size + static_cast<uint32>(sizeof(HandleHeader)) + 7) & ~7u; }

    // From the data of a handle back to the start of its header.
    uint32 HeaderRoom() const { return static_cast<uint32>(sizeof(HandleHeader)) + room_; }

    HandleHeader* HeaderOf(const void* data) const {
        return reinterpret_cast<HandleHeader*>(reinterpret_cast<uintptr_t>(data) - HeaderRoom());
    }
    uint32 SizeOf(const void* data) const { return HeaderOf(data)->size; }
    void* BlockOf(const void* data) const {
        HandleHeader* header = HeaderOf(data);
        return reinterpret_cast<char*>(header) - header->distance;
    }
    Alignment AlignmentOf(const void* data) const {
        HandleHeader* header = HeaderOf(data);
        return header->distance == 0 ? Alignment() : *static_cast<Alignment*>(BlockOf(data));
    }

    // Whether the header may be trusted: no guard in front of the data is damaged, it leads to a block of the heap in
    // which the data would be placed there, and what it says fits in there. The data may be any address.
    bool IsSound(UPtr data, platform::ReadablePages& pages) const;

    // Where the data goes in a heap block.
    UPtr PlaceData(void* block, Alignment alignment) const {
        uintptr_t data = reinterpret_cast<uintptr_t>(block) + HeaderRoom();
        if (TESSEL_UNLIKELY(!alignment.IsDefault())) {
            uintptr_t least = data + sizeof(Alignment) + alignment.offset;
            data = ((least + alignment.alignment - 1) & ~uintptr_t{alignment.alignment - 1u}) - alignment.offset;
        }
        return reinterpret_cast<UPtr>(data);
    }

    // Writes header, alignment record and guard bytes for data placed at `data`.
    void WriteHeader(void* block, UPtr data, uint32 size, Alignment alignment) const {
        HandleHeader* header = HeaderOf(data);
        header->size = size;
        header->distance = static_cast<uint32>(reinterpret_cast<char*>(header) - static_cast<char*>(block));
        if (!alignment.IsDefault()) *static_cast<Alignment*>(block) = alignment;
        if (TESSEL_UNLIKELY(room_ != 0) && WritesGuards(GuardKind::kHandle)) WriteGuards(data, size);
    }

private:
    struct FoundBlock {
        void* block;
        Alignment alignment;
    };
    bool FindBlock(UPtr data, uint32 distance, FoundBlock& found, platform::ReadablePages& pages) const;

    uint32 room_;
};

// ---- pointer blocks without their tracking --------------------------------------------------------------------------

// A plain block with guards as the kind's option word says; null when there is no memory.
UPtr NewGuardedBlock(size_t size, GuardKind kind);
// False when the heap says that it is no block; then nothing is freed.
bool DisposeGuardedBlock(void* data, GuardKind kind);

inline UPtr NewPtrBlock(size_t size) {
    return NewGuardedBlock(size, GuardKind::kPointer);
}
inline bool DisposePtrBlock(void* data) {
    return DisposeGuardedBlock(data, GuardKind::kPointer);
}

}  // namespace tessel

#endif
