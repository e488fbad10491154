// What the C allocator tells beyond the standard. Any thread.
#ifndef TESSEL_PLATFORM_ALLOCATOR_H
#define TESSEL_PLATFORM_ALLOCATOR_H

#include <cstddef>

namespace tessel::platform {

// Bytes that may be used of a block from malloc, at least those asked for.
std::size_t AllocatedSize(void* block) noexcept;

// Gives free memory back to the system.
void ReturnFreeMemory() noexcept;

}  // namespace tessel::platform

#endif
