// Comparing runs of bytes, the ground of every comparison in this folder.
#ifndef TESSEL_STRINGS_BYTEOPS_H
#define TESSEL_STRINGS_BYTEOPS_H

#include "platform/CodePage.h"
#include <tessel/base/Types.h>

#include <bit>
#include <cstring>

namespace tessel {

// Up to eight bytes as a word, the first lowest; what is missing is 0.
inline uint64 LoadWord(const uint8* bytes, size_t n) {
    if (n >= sizeof(uint64)) {
        uint64 word;
        std::memcpy(&word, bytes, sizeof word);
        return word;
    }
    if (n >= sizeof(uint32)) {
        uint32 first;
        uint32 last;
        std::memcpy(&first, bytes, sizeof first);
        std::memcpy(&last, bytes + n - sizeof last, sizeof last);
        return first | uint64{last} << 8 * (n - sizeof last);
    }
    if (n == 0) return 0;
    return bytes[0] | uint64{bytes[n / 2]} << 8 * (n / 2) | uint64{bytes[n - 1]} << 8 * (n - 1);
}

// Index of the first byte for which difference(word of a, word of b) has bits set, or n.
template <class Difference>
size_t FirstDifferenceBy(const uint8* a, const uint8* b, size_t n, Difference difference) {
    for (size_t i = 0; i < n; i += sizeof(uint64)) {
        const uint64 bits = difference(LoadWord(a + i, n - i), LoadWord(b + i, n - i));
        if (bits != 0) return i + static_cast<size_t>(std::countr_zero(bits)) / 8;
    }
    return n;
}

// Index of the first byte in which the two differ, or n.
inline size_t FirstDifference(const uint8* a, const uint8* b, size_t n) {
    return FirstDifferenceBy(a, b, n, [](uint64 x, uint64 y) { return x ^ y; });
}

// Index of the first byte in which the two differ when ASCII letters are taken without regard to case, or n.
size_t FirstAsciiDifference(const uint8* a, const uint8* b, size_t n);

// The same where bytes do not differ that `lower` maps to the same; it must treat ASCII letters as usual.
template <class Lower>
size_t FirstDifferenceMapped(const uint8* a, const uint8* b, size_t n, Lower lower) {
    size_t at = FirstAsciiDifference(a, b, n);
    while (at < n && lower(a[at]) == lower(b[at])) {
        ++at;
        at += FirstAsciiDifference(a + at, b + at, n - at);
    }
    return at;
}

// With the case of the active code page.
inline size_t FirstDifferenceNoCase(const uint8* a, const uint8* b, size_t n) {
    const platform::CodePageTables& page = platform::ActiveCodePage();
    return FirstDifferenceMapped(a, b, n, [&](uint8 byte) { return page.lower[byte]; });
}

// The first difference of bytes, else of lengths.
inline int32 CompareBytes(const uint8* a, size_t aLength, const uint8* b, size_t bLength) {
    constexpr size_t kWorthACall = 32;
    const size_t n = aLength < bLength ? aLength : bLength;
    if (n < kWorthACall || std::memcmp(a, b, n) != 0) {
        const size_t at = FirstDifference(a, b, n);
        if (at < n) return a[at] - b[at];
    }
    return static_cast<int32>(aLength) - static_cast<int32>(bLength);
}

inline int32 CompareBytesNoCase(const uint8* a, size_t aLength, const uint8* b, size_t bLength) {
    const size_t n = aLength < bLength ? aLength : bLength;
    const size_t at = FirstDifferenceNoCase(a, b, n);
    if (at < n) return platform::LowerByte(a[at]) - platform::LowerByte(b[at]);
    return static_cast<int32>(aLength) - static_cast<int32>(bLength);
}

// The classic ELF hash: one step for each character, which may be negative, from 0; then the result. What a step leaves
// in the upper four bits is shifted out by the next.
inline uint32 ElfHashStep(uint32 hash, int32 character) {
    hash = (hash << 4) + static_cast<uint32>(character);
    return hash ^ (hash >> 24 & 0xF0);
}

inline int32 ElfHashResult(uint32 hash) {
    return static_cast<int32>(hash & 0x0FFFFFFF);
}

}  // namespace tessel

#endif
