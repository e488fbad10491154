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
    const auto guess = static_cast<size_t>(std::bit_width(value | 1) * 1233 >> 12); /* 1233 / 4096 is about log10(2) */
    return guess + (guess < kMaxDecimalDigits && (value | 1) >= kPowersOfTen[guess]);
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
