// Real values to decimal digits and back, correctly rounded: the result is the one nearest to the exact value, and the
// even one of two that are equally near.
#pragma once

#include "numerics/Extended.h"
#include <tessel/base/NumericTypes.h>
#include <tessel/numerics/PackedDecimal.h>

#include <array>
#include <bit>
#include <cstring>

namespace tessel {

enum class RealKind : uint8 { kFinite, kInfinite, kNaN };

// A real taken apart: mantissa times 2 to the exponent, with bit 63 of the mantissa set, or a mantissa of 0.
struct RealParts {
    uint64 mantissa;
    int32 exponent;
    RealKind kind;
    bool negative;
};

RealParts TakeApart(double x);
RealParts TakeApart(const floatExt& x);

// digits times ten to the exponent. `count` is the number of digits (leading zeros included when the value is small).
struct DecimalDigits {
    uint64 digits;
    int32 exponent;
    int32 count;
};

// A finite value rounded to `precision` significant digits (precision >= 1, at most 17 count) or to -precision decimals
// (at most 18 digits in all). Zero is one digit 0 with the exponent 0.
DecimalDigits RoundToDecimal(RealParts x, int32 precision);

// The positive extended real nearest to digits * 10^exponent. digits must be below 10^18.
RoundedExtended FromDecimal(uint64 digits, int32 exponent);

// Eight decimal digits as bytes, the last digit in the lowest byte.
inline uint64 SpreadDigits(uint32 value) {
    // Every step splits what it has in two, in all lanes at once: 4 digits, 2, 1. The factors divide by 100 and by 10.
    uint64 lanes = (value % 10000) | static_cast<uint64>(value / 10000) << 32;
    const uint64 hundreds = (lanes * 10486 >> 20) & 0x0000007F0000007F;
    lanes = (lanes - 100 * hundreds) | hundreds << 16;
    const uint64 tens = (lanes * 103 >> 10) & 0x000F000F000F000F;
    return (lanes - 10 * tens) | tens << 8;
}

// The digits of a record as an integer, and the reverse (at most 18 digits).
uint64 UnpackDigits(const PackedDecimal& record);
void PackDigits(uint64 digits, PackedDecimal& record);

// 10 to the power 0 to 19.
inline constexpr std::array<uint64, 20> kPowersOfTen64 = [] {
    std::array<uint64, 20> powers{};
    powers[0] = 1;
    for (size_t i = 1; i < powers.size(); ++i) powers[i] = powers[i - 1] * 10;
    return powers;
}();
inline uint64 PowerOfTen64(int32 power) {
    return kPowersOfTen64[static_cast<size_t>(power)];
}

}  // namespace tessel
