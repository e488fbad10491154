// What the C allocator tells beyond the standard. Any thread.
#ifndef TESSEL_PLATFORM_ALLOCATOR_H
#define TESSEL_PLATFORM_ALLOCATOR_H

#include <cstddef>

namespace tessel::platform {

class ReadablePages;

// Bytes that may be used of a block from malloc, at least those asked for.
std::size_t AllocatedSize(void* block) noexcept;

// The same for an address that may be no block; then 0, as surely as the host's allocator lets it be told. Nothing
// else may free or allocate meanwhile.
std::size_t AllocatedSizeIfAny(void* block, ReadablePages& pages) noexcept;

// Gives free memory back to the system.
void ReturnFreeMemory() noexcept;

}  // namespace tessel::platform

#endif
