#include "platform/MemoryRead.h"

#include "platform/posix/Interrupted.h"

#include <algorithm>
#include <atomic>
#include <errno.h>
#include <pthread.h>
#include <unistd.h>

namespace tessel::platform {

namespace {

// Whether memory can be read is the same for a whole page; larger pages are multiples of this one.
constexpr std::size_t kPage = 4096;
constexpr std::size_t kPiecesAtOnce = 16;

// Asking the kernel for the process id would double the cost of a read. It changes in a forked child only.
std::atomic<pid_t> processId{0};

pid_t OwnProcess() {
    pid_t known = processId.load(std::memory_order_relaxed);
    if (known) return known;
    static const int registered = pthread_atfork(nullptr, nullptr, [] { processId = 0; });
    pid_t own = systemCalls.getpid();
    if (registered == 0) processId.store(own, std::memory_order_relaxed);
    return own;
}

// Cuts the range at the bounds of pages, because the kernel copies a piece whole or not at all.
std::size_t CutAtPages(const char* from, std::size_t count, iovec (&pieces)[kPiecesAtOnce], std::size_t& bytes) {
    std::size_t used = 0;
    bytes = 0;
    while (used < kPiecesAtOnce && bytes < count) {
        std::size_t toBound = kPage - reinterpret_cast<std::uintptr_t>(from + bytes) % kPage;
        std::size_t size = std::min(toBound, count - bytes);
        pieces[used++] = {const_cast<char*>(from + bytes), size};
        bytes += size;
    }
    return used;
}

enum class Outcome { kRead, kStopped, kRefused };

Outcome ReadPieces(const char* from, char* to, std::size_t count, std::size_t& done) {
    iovec pieces[kPiecesAtOnce];
    std::size_t bytes = 0;
    std::size_t used = CutAtPages(from, count, pieces, bytes);
    iovec target = {to, bytes};
    ssize_t moved = systemCalls.process_vm_readv(OwnProcess(), &target, 1, pieces, used, 0);
    if (moved < 0 && errno != EFAULT) return Outcome::kRefused;
    done = moved < 0 ? 0 : static_cast<std::size_t>(moved);
    return done == bytes ? Outcome::kRead : Outcome::kStopped;
}

// For kernels and sandboxes that do not let a process read itself: a pipe takes what can be read of a page.
std::size_t ReadThroughPipe(const char* from, char* to, std::size_t count) {
    int ends[2];
    if (systemCalls.pipe2(ends, O_CLOEXEC) != 0) return 0;
    std::size_t done = 0;
    while (done < count) {
        std::size_t toBound = kPage - reinterpret_cast<std::uintptr_t>(from + done) % kPage;
        const ssize_t put =
            Retry([&] { return systemCalls.write(ends[1], from + done, std::min(toBound, count - done)); });
        if (put <= 0) break;
        ssize_t got = systemCalls.read(ends[0], to + done, static_cast<std::size_t>(put));
        if (got != put) break;
        done += static_cast<std::size_t>(got);
    }
    systemCalls.close(ends[0]);
    systemCalls.close(ends[1]);
    return done;
}

}  // namespace

std::size_t ReadMemory(const void* from, void* to, std::size_t count) noexcept {
    int savedError = errno;
    const char* source = static_cast<const char*>(from);
    char* target = static_cast<char*>(to);
    count = std::min(count, static_cast<std::size_t>(0) - 1 - reinterpret_cast<std::uintptr_t>(from));
    std::size_t total = 0;
    Outcome outcome = Outcome::kRead;
    while (outcome == Outcome::kRead && total < count) {
        std::size_t done = 0;
        outcome = ReadPieces(source + total, target + total, count - total, done);
        total += done;
    }
    if (outcome == Outcome::kRefused) total += ReadThroughPipe(source + total, target + total, count - total);
    errno = savedError;
    return total;
}

bool ReadablePages::CoverPage(std::uintptr_t page) noexcept {
    std::uintptr_t& known = known_[page % known_.size()];
    char byte;
    if (page == 0 || (known != page && ReadMemory(reinterpret_cast<const void*>(page * kPage), &byte, 1) != 1))
        return false;
    known = page;
    return true;
}

bool ReadablePages::Cover(const void* from, std::size_t count) noexcept {
    const auto first = reinterpret_cast<std::uintptr_t>(from);
    if (count == 0) return true;
    if (first + (count - 1) < first) return false;
    for (std::uintptr_t page = first / kPage; page <= (first + (count - 1)) / kPage; ++page)
        if (!CoverPage(page)) return false;
    return true;
}

// What is read may lie between the objects that a sanitizer knows.
__attribute__((no_sanitize("address", "thread", "undefined"))) bool ReadablePages::Read(const void* from, void* to,
                                                                                        std::size_t count) noexcept {
    if (!Cover(from, count)) return false;
    const auto source = static_cast<const volatile unsigned char*>(from);
    const auto target = static_cast<unsigned char*>(to);
    for (std::size_t i = 0; i < count; ++i) target[i] = source[i];
    return true;
}

}  // namespace tessel::platform
