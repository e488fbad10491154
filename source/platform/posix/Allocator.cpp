#include "platform/Allocator.h"

#include "platform/MemoryRead.h"

#include <cstdint>
#include <cstdlib>
#include <malloc.h>

// Of the sanitizers' allocators, which know their blocks; null in other programs.
extern "C" __attribute__((weak)) int __sanitizer_get_ownership(const volatile void* block);

namespace tessel::platform {
namespace {

constexpr std::size_t kWord = sizeof(std::size_t);
constexpr std::size_t kBlockAlignment = 2 * kWord;
constexpr std::size_t kBeforeInUse = 1, kMapped = 2, kFlags = 7;  // in the word in front of a block

// Whether the host's allocator keeps the size of a block, with three flags, in the word in front of it.
bool SizesStandInFront() {
    static const bool inFront = [] {
        void* const block = std::calloc(1, 100);
        std::size_t word = 0;
        const bool isRead = block && ReadablePages().Read(static_cast<char*>(block) - kWord, word);
        const bool stands = isRead && (word & ~kFlags) == malloc_usable_size(block) + kWord;
        std::free(block);
        return stands;
    }();
    return inFront;
}

// Whether the words around a block are what the allocator writes there.
bool WordsAreRight(const char* block, ReadablePages& pages) {
    std::size_t word = 0, next = 0;
    if (!pages.Read(block - kWord, word)) return false;
    const std::size_t size = word & ~kFlags;
    if (size < 4 * kWord || size % kBlockAlignment != 0) return false;
    return (word & kMapped) != 0 || (pages.Read(block + size - kWord, next) && (next & kBeforeInUse) != 0);
}

}  // namespace

std::size_t AllocatedSize(void* block) noexcept {
    return malloc_usable_size(block);
}

std::size_t AllocatedSizeIfAny(void* block, ReadablePages& pages) noexcept {
    if (reinterpret_cast<std::uintptr_t>(block) % kBlockAlignment != 0) return 0;
    if (__sanitizer_get_ownership) return __sanitizer_get_ownership(block) ? malloc_usable_size(block) : 0;
    if (SizesStandInFront() && !WordsAreRight(static_cast<const char*>(block), pages)) return 0;
    char byte;
    return pages.Read(block, byte) ? malloc_usable_size(block) : 0;
}

void ReturnFreeMemory() noexcept {
    malloc_trim(0);
}

}  // namespace tessel::platform
