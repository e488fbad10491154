#include "strings/ByteOps.h"

namespace tessel {
namespace {

constexpr uint64 kEveryByte = 0x0101010101010101u;
constexpr uint64 kHighBits = 0x80 * kEveryByte;

uint64 Load(const uint8* bytes) {
    uint64 word;
    std::memcpy(&word, bytes, sizeof word);
    return word;
}

/* Eight bytes at a time, "A" to "Z" become "a" to "z", which is so in every code page. */
uint64 LowerAscii(uint64 word) {
    const uint64 low = word & ~kHighBits;
    const uint64 fromA = low + (0x80 - 'A') * kEveryByte;
    const uint64 beyondZ = low + (0x7F - 'Z') * kEveryByte;
    const uint64 upper = (fromA ^ beyondZ) & kHighBits & ~word;
    return word | (upper >> 2);
}

}  // namespace

size_t FirstAsciiDifference(const uint8* a, const uint8* b, size_t n) {
    size_t i = 0;
    for (; i + sizeof(uint64) <= n; i += sizeof(uint64)) {
        const uint64 x = Load(a + i);
        const uint64 y = Load(b + i);
        if (x == y) continue;
        const uint64 difference = LowerAscii(x) ^ LowerAscii(y);
        if (difference != 0) return i + static_cast<size_t>(std::countr_zero(difference)) / 8;
    }
    while (i < n && LowerAscii(a[i]) == LowerAscii(b[i])) ++i;
    return i;
}

}  // namespace tessel
