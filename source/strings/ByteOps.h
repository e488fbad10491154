/* Comparing runs of bytes, the ground of every comparison in this folder. */
#ifndef TESSEL_STRINGS_BYTEOPS_H
#define TESSEL_STRINGS_BYTEOPS_H

#include <tessel/base/Types.h>

#include <bit>
#include <cstring>

#include "platform/CodePage.h"

namespace tessel {

/* Index of the first byte in which the two differ, or n. */
inline size_t FirstDifference(const uint8* a, const uint8* b, size_t n) {
    size_t i = 0;
    for (; i + sizeof(uint64) <= n; i += sizeof(uint64)) {
        uint64 x;
        uint64 y;
        std::memcpy(&x, a + i, sizeof x);
        std::memcpy(&y, b + i, sizeof y);
        if (x != y) return i + static_cast<size_t>(std::countr_zero(x ^ y)) / 8;
    }
    while (i < n && a[i] == b[i]) ++i;
    return i;
}

/* Index of the first byte in which the two differ when ASCII letters are taken without regard to case, or n. */
size_t FirstAsciiDifference(const uint8* a, const uint8* b, size_t n);

/* The same where bytes do not differ that `lower` maps to the same; it must treat ASCII letters as usual. */
template <class Lower>
size_t FirstDifferenceMapped(const uint8* a, const uint8* b, size_t n, Lower lower) {
    size_t at = FirstAsciiDifference(a, b, n);
    while (at < n && lower(a[at]) == lower(b[at])) {
        ++at;
        at += FirstAsciiDifference(a + at, b + at, n - at);
    }
    return at;
}

/* With the case of the active code page. */
inline size_t FirstDifferenceNoCase(const uint8* a, const uint8* b, size_t n) {
    const platform::CodePageTables& page = platform::ActiveCodePage();
    return FirstDifferenceMapped(a, b, n, [&](uint8 byte) { return page.lower[byte]; });
}

/* The first difference of bytes, else of lengths. */
inline int32 CompareBytes(const uint8* a, size_t aLength, const uint8* b, size_t bLength) {
    const size_t n = aLength < bLength ? aLength : bLength;
    if (n != 0 && std::memcmp(a, b, n) != 0) {
        const size_t at = FirstDifference(a, b, n);
        return a[at] - b[at];
    }
    return static_cast<int32>(aLength) - static_cast<int32>(bLength);
}

inline int32 CompareBytesNoCase(const uint8* a, size_t aLength, const uint8* b, size_t bLength) {
    const size_t n = aLength < bLength ? aLength : bLength;
    const size_t at = FirstDifferenceNoCase(a, b, n);
    if (at < n) return platform::LowerByte(a[at]) - platform::LowerByte(b[at]);
    return static_cast<int32>(aLength) - static_cast<int32>(bLength);
}

/* One step of the classic ELF hash, with a character that may be negative. The result is below 2^28. */
inline uint32 ElfHashStep(uint32 hash, int32 character) {
    hash = (hash << 4) + static_cast<uint32>(character);
    const uint32 top = hash & 0xF0000000u;
    return (hash ^ (top >> 24)) & ~top;
}

}  // namespace tessel

#endif
