// Digits of an unsigned integer: decimal ones two at a time, hexadecimal ones all at once.
#ifndef TESSEL_STRINGS_DECIMALDIGITS_H
#define TESSEL_STRINGS_DECIMALDIGITS_H

#include "numerics/DecimalConversion.h"
#include <tessel/base/Types.h>

#include <array>
#include <bit>
#include <cstring>

namespace tessel {

constexpr size_t kMaxDecimalDigits = 20;

// For the values of each bit width from 1: added to a value it brings the number of digits into the upper half.
constexpr auto kDigitCounts = [] {
    std::array<uint64, 32> counts{};
    size_t digits = 1;  // of the smallest value of that width
    for (size_t i = 0; i < counts.size(); ++i) {
        const uint64 smallest = uint64{1} << i;
        while (digits < 10 && smallest >= kPowersOfTen64[digits]) ++digits;
        const bool grows = digits < 10 && kPowersOfTen64[digits] < 2 * smallest;
        counts[i] = grows ? (uint64{digits + 1} << 32) - kPowersOfTen64[digits] : uint64{digits} << 32;
    }
    return counts;
}();

// "00" to "99"
constexpr auto kDigitPairs = [] {
    std::array<char, 200> pairs{};
    for (size_t i = 0; i < 100; ++i) {
        pairs[2 * i] = static_cast<char>('0' + i / 10);
        pairs[2 * i + 1] = static_cast<char>('0' + i % 10);
    }
    return pairs;
}();

// At least 1.
inline size_t CountDecimalDigits(uint64 value) {
    if (value <= UINT32_MAX) {
        const auto small = static_cast<uint32>(value);
        return static_cast<size_t>((small + kDigitCounts[std::bit_width(small | 1u) - 1]) >> 32);
    }
    const auto guess = static_cast<size_t>(std::bit_width(value) * 1233 >> 12);  // 1233 / 4096 is about log10(2)
    return guess + (guess < kPowersOfTen64.size() && value >= kPowersOfTen64[guess]);
}

// Writes the digits so that they end at `end`.
inline void WriteDecimalDigits(char* end, uint64 value) {
    while (value > UINT32_MAX) {  // 64-bit division is slow on 32-bit hosts
        end -= 2;
        std::memcpy(end, &kDigitPairs[value % 100 * 2], 2);
        value /= 100;
    }
    auto rest = static_cast<uint32>(value);
    while (rest >= 100) {
        end -= 2;
        std::memcpy(end, &kDigitPairs[rest % 100 * 2], 2);
        rest /= 100;
    }
    if (rest >= 10) {
        std::memcpy(end - 2, &kDigitPairs[rest * 2], 2);
    } else {
        end[-1] = static_cast<char>('0' + rest);
    }
}

inline uint64 Magnitude(int64 value) {
    return value < 0 ? uint64{0} - static_cast<uint64>(value) : static_cast<uint64>(value);
}

// Writes a decimal integer, at most 20 characters, and returns where it ends.
inline char* WriteDecimal(char* out, uint64 magnitude, bool negative) {
    *out = '-';
    char* const end = out + negative + CountDecimalDigits(magnitude);
    WriteDecimalDigits(end, magnitude);
    return end;
}

// The eight hexadecimal digits of a value as bytes in memory order of a text, leading zeros included.
inline uint64 HexDigits(uint32 value) {
    constexpr uint64 kEveryByte = 0x0101010101010101;
    uint64 digits = value;
    digits = (digits | digits << 16) & 0x0000FFFF0000FFFF;
    digits = (digits | digits << 8) & 0x00FF00FF00FF00FF;
    digits = (digits | digits << 4) & 0x0F0F0F0F0F0F0F0F;
    const uint64 isLetter = (digits + 6 * kEveryByte) >> 4 & kEveryByte;
    return __builtin_bswap64(digits + '0' * kEveryByte + isLetter * ('A' - '0' - 10));
}

}  // namespace tessel

#endif
