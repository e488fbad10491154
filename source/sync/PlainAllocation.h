// operator new and delete over the C allocator alone, for objects below the tracked heap.
#ifndef TESSEL_SOURCE_SYNC_PLAINALLOCATION_H
#define TESSEL_SOURCE_SYNC_PLAINALLOCATION_H

#include <cstddef>
#include <cstdlib>
#include <new>

namespace tessel {

struct PlainAllocation {
    static void* operator new(std::size_t size, const std::nothrow_t&) noexcept { return std::malloc(size); }
    static void operator delete(void* address, const std::nothrow_t&) noexcept { std::free(address); }
    static void operator delete(void* address) noexcept { std::free(address); }
};

}  // namespace tessel

#endif
