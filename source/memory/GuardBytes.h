// Guard bytes around the three kinds of block, and the words that govern them.
#ifndef TESSEL_SOURCE_MEMORY_GUARDBYTES_H
#define TESSEL_SOURCE_MEMORY_GUARDBYTES_H

#include <tessel/base/Types.h>

#include <atomic>

namespace tessel {

enum class GuardKind { kHandle, kPointer, kNewDelete };
constexpr int kGuardKinds = 3;

constexpr uint32 kGuardSize = 8;
constexpr char kGuardPattern[] = "ORV13MEM";

// Bits of an option word.
constexpr uint32 kGuardRoom = 1;   // room before and after the data
constexpr uint32 kGuardWrite = 2;  // the pattern is written there
constexpr uint32 kGuardCheck = 4;  // and checked whenever the block is passed in

extern std::atomic<uint32> guardOptions[kGuardKinds];

inline uint32 GuardOptions(GuardKind kind) {
    return guardOptions[static_cast<int>(kind)].load(std::memory_order_relaxed);
}
inline uint32 GuardRoom(GuardKind kind) {
    return (GuardOptions(kind) & kGuardRoom) != 0 ? kGuardSize : 0;
}
inline bool WritesGuards(GuardKind kind) {
    return (GuardOptions(kind) & (kGuardRoom | kGuardWrite)) == (kGuardRoom | kGuardWrite);
}
inline bool ChecksGuards(GuardKind kind) {
    return (GuardOptions(kind) & kGuardCheck) != 0;
}

// The size word of a pointer block with guard room.
inline uint32* GuardedPtrSize(const void* data) {
    return reinterpret_cast<uint32*>(reinterpret_cast<uintptr_t>(data) - 12);
}

void WriteGuards(void* data, size_t size);

// Whether the eight bytes are a guard, of whatever version.
bool IsGuard(const char* guard);

// True when both guards of a block are intact; else the guard-failure procedure has been called.
bool CheckGuards(const void* data, GuardKind kind);

}  // namespace tessel

#endif
