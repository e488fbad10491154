// Reading memory that may not be there.
#ifndef TESSEL_PLATFORM_MEMORYREAD_H
#define TESSEL_PLATFORM_MEMORYREAD_H

#include <cstddef>

namespace tessel::platform {

// Copies up to `count` bytes of this process at `from`, up to the first one that cannot be read. How many it copied.
// Goes through the kernel and never traps; about one system call a call. Any thread.
std::size_t ReadMemory(const void* from, void* to, std::size_t count) noexcept;

}  // namespace tessel::platform

#endif
