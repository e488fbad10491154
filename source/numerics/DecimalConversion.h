/* Real values to decimal digits and back, correctly rounded: the result is the one nearest to the exact value, and the
   even one of two that are equally near. */
#pragma once

#include <bit>
#include <cstring>

#include <tessel/base/NumericTypes.h>
#include <tessel/numerics/PackedDecimal.h>

namespace tessel {

enum class RealKind : uint8 { kFinite, kInfinite, kNaN };

/* A real taken apart: mantissa times 2 to the exponent, with bit 63 of the mantissa set, or a mantissa of 0. */
struct RealParts {
    uint64 mantissa;
    int32 exponent;
    RealKind kind;
    bool negative;
};

RealParts TakeApart(double x);
RealParts TakeApart(const floatExt& x);

/* digits times ten to the exponent. `count` is the number of digits (leading zeros included when the value is small).
 */
struct DecimalDigits {
    uint64 digits;
    int32 exponent;
    int32 count;
};

/* A finite value rounded to `precision` significant digits (precision >= 1, at most 17 count) or to -precision decimals
   (at most 18 digits in all). Zero is one digit 0 with the exponent 0. */
DecimalDigits RoundToDecimal(const RealParts& x, int32 precision);

/* The positive extended real nearest to a decimal, and on which side of it the exact value lies (-1 below, 1 above, 0
   when they are equal), for those who round once more. */
struct NearestExtended {
    floatExt value;
    int32 rest;
};

/* digits must be below 10^18. */
NearestExtended FromDecimal(uint64 digits, int32 exponent);

/* The digits of a record as an integer, and the reverse (at most 18 digits). */
uint64 UnpackDigits(const PackedDecimal& record);
void PackDigits(uint64 digits, PackedDecimal& record);

/* 10 to the power 0 to 19. */
uint64 PowerOfTen64(int32 power);

}  // namespace tessel
