// Moving, comparing, swapping and clearing blocks of memory.
#include <tessel/memory/MemoryManager.h>
#include <tessel/memory/MemoryUtil.h>

#include <algorithm>
#include <atomic>
#include <cstring>

namespace {

std::atomic<MemoryCheckCallback> checkCallback{nullptr};

void CallCheck() {
    if (MemoryCheckCallback callback = checkCallback.load(std::memory_order_relaxed)) callback(0);
}

}  // namespace

void SetMemoryCheckCallback(MemoryCheckCallback proc) {
    checkCallback.store(proc);
}

void MoveBlock(const void* source, void* destination, size_t count) {
    if (count == 0) return;
    std::memmove(destination, source, count);
    CallCheck();
}

void ClearMem(void* address, size_t count) {
    if (count != 0) std::memset(address, 0, count);
    CallCheck();
}

int32 BlockCmp(const void* a, const void* b, size_t count) {
    const auto first = static_cast<const uint8*>(a), second = static_cast<const uint8*>(b);
    // memcmp is fast but does not tell the difference.
    if (count == 0 || std::memcmp(first, second, count) == 0) return 0;
    const auto unequal = std::mismatch(first, first + count, second);
    return *unequal.first - *unequal.second;
}

void SwapBlock(void* a, void* b, size_t count) {
    const auto first = static_cast<uint8*>(a);
    std::swap_ranges(first, first + count, static_cast<uint8*>(b));
}
