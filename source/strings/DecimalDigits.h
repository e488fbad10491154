/* Decimal digits of an unsigned integer, two at a time. */
#ifndef TESSEL_STRINGS_DECIMALDIGITS_H
#define TESSEL_STRINGS_DECIMALDIGITS_H

#include <tessel/base/Types.h>

#include <array>
#include <bit>
#include <cstring>

namespace tessel {

constexpr size_t kMaxDecimalDigits = 20;

constexpr auto kPowersOfTen = [] {
    std::array<uint64, kMaxDecimalDigits> powers{};
    uint64 power = 1;
    for (uint64& entry : powers) {
        entry = power;
        power *= 10;
    }
    return powers;
}();

/* For the values of each bit width from 1: added to a value it brings the number of digits into the upper half. */
constexpr auto kDigitCounts = [] {
    std::array<uint64, 32> counts{};
    size_t digits = 1; /* of the smallest value of that width */
    for (size_t i = 0; i < counts.size(); ++i) {
        const uint64 smallest = uint64{1} << i;
        while (digits < 10 && smallest >= kPowersOfTen[digits]) ++digits;
        const bool grows = digits < 10 && kPowersOfTen[digits] < 2 * smallest;
        counts[i] = grows ? (uint64{digits + 1} << 32) - kPowersOfTen[digits] : uint64{digits} << 32;
    }
    return counts;
}();

/* "00" to "99" */
constexpr auto kDigitPairs = [] {
    std::array<char, 200> pairs{};
    for (size_t i = 0; i < 100; ++i) {
        pairs[2 * i] = static_cast<char>('0' + i / 10);
        pairs[2 * i + 1] = static_cast<char>('0' + i % 10);
    }
    return pairs;
}();

/* At least 1. */
inline size_t CountDecimalDigits(uint64 value) {
    if (value <= UINT32_MAX) {
        const auto small = static_cast<uint32>(value);
        return static_cast<size_t>((small + kDigitCounts[std::bit_width(small | 1u) - 1]) >> 32);
    }
    const auto guess = static_cast<size_t>(std::bit_width(value) * 1233 >> 12); /* 1233 / 4096 is about log10(2) */
    return guess + (guess < kMaxDecimalDigits && value >= kPowersOfTen[guess]);
}

/* Writes the digits so that they end at `end`. */
inline void WriteDecimalDigits(char* end, uint64 value) {
    while (value > UINT32_MAX) { /* 64-bit division is slow on 32-bit hosts */
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

}  // namespace tessel

#endif
