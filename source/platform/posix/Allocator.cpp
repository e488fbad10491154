#include "platform/Allocator.h"

#include <malloc.h>

namespace tessel::platform {

std::size_t AllocatedSize(void* block) noexcept {
    return malloc_usable_size(block);
}

void ReturnFreeMemory() noexcept {
    malloc_trim(0);
}

}  // namespace tessel::platform
