// Reading memory that may not be there.
#ifndef TESSEL_PLATFORM_MEMORYREAD_H
#define TESSEL_PLATFORM_MEMORYREAD_H

#include <array>
#include <cstddef>
#include <cstdint>

namespace tessel::platform {

// Copies up to `count` bytes of this process at `from`, up to the first one that cannot be read. How many it copied.
// Goes through the kernel and never traps; about one system call a call. Any thread.
std::size_t ReadMemory(const void* from, void* to, std::size_t count) noexcept;

// The same for a walk over much memory: a page that could be read is not asked for again. One for a walk, while nothing
// is given back to the system. Not shared by threads.
class ReadablePages {
public:
    // All of it or, with the answer false, nothing.
    bool Read(const void* from, void* to, std::size_t count) noexcept;

    template <class Record>
    bool Read(const void* from, Record& to) noexcept {
        return Read(from, &to, sizeof to);
    }

private:
    bool Cover(const void* from, std::size_t count) noexcept;
    bool CoverPage(std::uintptr_t page) noexcept;

    std::array<std::uintptr_t, 256> known_{};  // numbers of pages, each in the place of its last bits
};

}  // namespace tessel::platform

#endif
