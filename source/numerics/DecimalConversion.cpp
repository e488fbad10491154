// Decimal digits of a real, and the real nearest to decimal digits.
#include "numerics/DecimalConversion.h"

#include "base/Compiler.h"
#include "numerics/WideArithmetic.h"

#include <algorithm>
#include <array>

namespace tessel {
namespace {

constexpr int32 kMaxSignificant = 17;
constexpr int32 kLowestBitPosition = 64;

// ---- powers of ten --------------------------------------------------------------------------------------------------

// The powers of ten a double needs, in 128 bits each; those beyond are products of them.
constexpr int kTablePower = 348;
constexpr int kTableSize = 2 * kTablePower + 1;

// The highest 128 bits of 10^n, the rest cut off.
constexpr std::array<Uint128, kTableSize> MakePowerTable() {
    std::array<Uint128, kTableSize> table{};
    BigUnsigned<28> power(1);  // 5^n; 348 * log2(5) = 809 bits
    for (int n = 0; n <= kTablePower; ++n) {
        table[kTablePower + n] = power.Top128();
        power.MultiplyAdd(5, 0);
    }
    BigUnsigned<32> inverse(1);  // 2^1000 / 5^n, rounded down
    inverse.ShiftLeft(1000);
    for (int n = 1; n <= kTablePower; ++n) {
        inverse.DivideBy(5);
        table[kTablePower - n] = inverse.Top128();
    }
    return table;
}

constexpr std::array<Uint128, kTableSize> kPowerTable = MakePowerTable();

// 5^n for the n whose power fits 128 bits is exact in the table.
constexpr int kLastExactPower = 55;

// A power of ten: bits * 2^exponent <= 10^n < (bits + error) * 2^exponent, bit 127 of bits set.
struct Power {
    Uint128 bits;
    int32 exponent;
    uint32 error;
};

// floor(n * log2(10)), right for |n| up to 5000 (and more).
constexpr int32 FloorLog2OfPower(int32 n) {
    return static_cast<int32>((n * int64{14267572527}) >> 32);
}

// floor(n * log10(2)), right for |n| up to 17000 (and more).
constexpr int32 FloorLog10OfPowerOf2(int32 n) {
    return static_cast<int32>((n * int64{1292913986}) >> 32);
}

// sum += addend; 1 when it carries.
uint64 AddWithCarry(uint64& sum, uint64 addend) {
    sum += addend;
    return sum < addend ? 1 : 0;
}

// The highest 128 bits of a product, bit 127 set as in the factors.
Uint128 NormalizedProduct(const Uint128& a, const Uint128& b) {
    const Uint128 highs = Multiply64(a.high, b.high);
    const Uint128 cross1 = Multiply64(a.high, b.low);
    const Uint128 cross2 = Multiply64(a.low, b.high);
    uint64 lowest = cross1.low;
    uint64 low = highs.low;
    uint64 high = highs.high;
    high += AddWithCarry(low, AddWithCarry(lowest, cross2.low));
    high += AddWithCarry(low, cross1.high);
    high += AddWithCarry(low, cross2.high);
    if (high >> 63 != 0) return {high, low};
    return {(high << 1) | (low >> 63), (low << 1) | (lowest >> 63)};
}

TESSEL_NOT_INLINE Power DistantPowerOfTen(int32 n) {
    const int32 step = n > 0 ? kTablePower : -kTablePower;
    int32 rest = n;
    Uint128 bits = kPowerTable[kTablePower];
    for (; rest > kTablePower || rest < -kTablePower; rest -= step) {
        bits = NormalizedProduct(bits, kPowerTable[kTablePower + step]);
    }
    bits = NormalizedProduct(bits, kPowerTable[kTablePower + rest]);
    // At most 16 factors, each cut off by less than one unit, and as many products: under 64 units with the shifts.
    return {bits, FloorLog2OfPower(n) - 127, 64};
}

TESSEL_ALWAYS_INLINE Power PowerOfTen(int32 n) {
    if (n < -kTablePower || n > kTablePower) return DistantPowerOfTen(n);
    const uint32 error = n >= 0 && n <= kLastExactPower ? 0 : 1;
    return {kPowerTable[kTablePower + n], FloorLog2OfPower(n) - 127, error};
}

// ---- exact comparison -----------------------------------------------------------------------------------------------

// The widest operand is 64 bits times 5^4970 (11,540 bits).
using Exact = BigUnsigned<400>;

// a * 2^aExponent * 10^power compared with b * 2^bExponent, or with (b + 1/2) * 2^bExponent: -1, 0 or 1. The two must
// be of about the same size.
TESSEL_NOT_INLINE int CompareExactly(uint64 a, int32 aExponent, int32 power, uint64 b, int32 bExponent, bool plusHalf) {
    Exact left(a);
    Exact right(b);
    if (plusHalf) {
        if (b == 0) {
            right = Exact(1);
        } else {
            right.MultiplyAdd(2, 1);
        }
        --bExponent;
    }
    if (power > 0) left.MultiplyByPowerOfFive(power);
    if (power < 0) right.MultiplyByPowerOfFive(-power);
    const int32 shift = aExponent + power - bExponent;
    if (shift > 0) left.ShiftLeft(shift);
    if (shift < 0) right.ShiftLeft(-shift);
    return left.Compare(right);
}

// ---- scaled mantissas -----------------------------------------------------------------------------------------------

// A 64-bit mantissa times a power of ten: (high, middle, low) * 2^exponent, at most error * 2^64 less than the truth.
struct Scaled {
    uint64 high;
    uint64 middle;
    uint64 low;
    int32 exponent;
    uint32 error;
};

TESSEL_ALWAYS_INLINE Scaled Scale(uint64 mantissa, int32 exponent, const Power& power) {
    const Uint128 top = Multiply64(mantissa, power.bits.high);
    const Uint128 bottom = Multiply64(mantissa, power.bits.low);
    const uint64 middle = top.low + bottom.high;
    return {top.high + (middle < top.low ? 1 : 0), middle, bottom.low, exponent + power.exponent, power.error};
}

enum class Tail { kBelowHalf, kHalf, kAboveHalf, kUnclear };

// How what lies below bit `position` of the high word compares with half of that bit. position is 0 to 64.
TESSEL_ALWAYS_INLINE Tail ClassifyTail(const Scaled& x, int32 position) {
    const uint64 half = uint64{1} << (position == 0 ? 63 : position - 1);
    uint64 tail = x.middle;
    bool more = x.low != 0;
    uint64 reach = uint64{x.error} + 1;  // how far the truth may lie above the tail, in its units
    if (position > 0) {
        tail = x.high & (half | (half - 1));
        more = more || x.middle != 0;
        reach = x.middle >= ~uint64{x.error} ? 1 : 0;
    }
    if (tail > half || (tail == half && more)) return Tail::kAboveHalf;
    if (tail == half) return x.error == 0 ? Tail::kHalf : Tail::kUnclear;
    return x.error != 0 && half - tail <= reach ? Tail::kUnclear : Tail::kBelowHalf;
}

bool RoundsUp(int comparedWithHalf, uint64 kept) {
    return comparedWithHalf > 0 || (comparedWithHalf == 0 && (kept & 1) != 0);
}

// ---- binary to decimal ----------------------------------------------------------------------------------------------

// floor(log10(x))
int32 DecimalExponent(const RealParts& x) {
    const int32 binary = x.exponent + 63;
    const int32 guess = FloorLog10OfPowerOf2(binary);  // right, or one too low
    const Power next = PowerOfTen(guess + 1);
    const int32 nextBinary = next.exponent + 127;
    if (binary != nextBinary) return binary < nextBinary ? guess : guess + 1;
    if (next.error == 0) {
        const bool reached = x.mantissa > next.bits.high || (x.mantissa == next.bits.high && next.bits.low == 0);
        return reached ? guess + 1 : guess;
    }
    if (x.mantissa < next.bits.high) return guess;
    if (x.mantissa > next.bits.high + 1) return guess + 1;
    return CompareExactly(1, 0, guess + 1, x.mantissa, x.exponent, false) <= 0 ? guess + 1 : guess;
}

// x * 10^power to the nearest integer, which must be below 2^60.
uint64 RoundScaled(const RealParts& x, int32 power) {
    const Scaled scaled = Scale(x.mantissa, x.exponent, PowerOfTen(power));
    const int32 position = -scaled.exponent - 128;
    if (position > kLowestBitPosition) return 0;
    const uint64 kept = position == kLowestBitPosition ? 0 : scaled.high >> position;
    const Tail tail = ClassifyTail(scaled, position);
    const int compared = tail == Tail::kUnclear ? CompareExactly(x.mantissa, x.exponent, power, kept, 0, true)
                                                : static_cast<int>(tail) - static_cast<int>(Tail::kHalf);
    return RoundsUp(compared, kept) ? kept + 1 : kept;
}

// ---- decimal to binary ----------------------------------------------------------------------------------------------

constexpr int32 kInfiniteExponent = kExtendedExponentMask;

// Beyond these the result is certainly infinite or zero, whatever the digits.
constexpr int32 kLargestDecimalExponent = 4933;
constexpr int32 kSmallestDecimalExponent = -4970;

constexpr std::array<uint64, 28> MakePowersOfFive() {
    std::array<uint64, 28> powers{};
    powers[0] = 1;
    for (int i = 1; i < 28; ++i) powers[i] = powers[i - 1] * 5;
    return powers;
}
constexpr std::array<uint64, 28> kPowersOfFive = MakePowersOfFive();

RoundedExtended Exact64(uint64 mantissa, int32 exponent) {
    const int zeros = std::countl_zero(mantissa);
    return {mantissa << zeros, static_cast<uint32>(exponent - zeros + 63 + kExtendedBias), 0};
}

// ---- records --------------------------------------------------------------------------------------------------------

// Eight digits, two a byte.
uint32 PackEight(uint32 value) {
    uint64 lanes = SpreadDigits(value);
    lanes = (lanes | lanes >> 4) & 0x00FF00FF00FF00FF;
    lanes = (lanes | lanes >> 8) & 0x0000FFFF0000FFFF;
    return static_cast<uint32>(lanes | lanes >> 16);
}

}  // namespace

uint64 UnpackDigits(const PackedDecimal& record) {
    if (record.mdigits < 0) return 0;
    uint64 bcd = 0;  // the sixteen low digits
    std::memcpy(&bcd, record.mantissa, sizeof bcd);
    uint64 top = 0;
    if (record.mdigits >= 16) {
        const uint8 last = record.mantissa[8];
        top = record.mdigits == 16 ? last & 15 : static_cast<uint64>(last >> 4) * 10 + (last & 15);
    } else if (record.mdigits < 15) {
        bcd &= (uint64{1} << (4 * (record.mdigits + 1))) - 1;
    }
    // Neighbours are joined, at every step twice as many digits: 1, 2, 4, 8.
    constexpr uint64 kNibbles = 0x0F0F0F0F0F0F0F0F;
    constexpr uint64 kBytes = 0x00FF00FF00FF00FF;
    constexpr uint64 kWords = 0x0000FFFF0000FFFF;
    bcd = (bcd & kNibbles) + 10 * ((bcd >> 4) & kNibbles);
    bcd = (bcd & kBytes) + 100 * ((bcd >> 8) & kBytes);
    bcd = (bcd & kWords) + 10000 * ((bcd >> 16) & kWords);
    bcd = static_cast<uint32>(bcd) + 100000000 * (bcd >> 32);
    return bcd + top * PowerOfTen64(16);
}

void PackDigits(uint64 digits, PackedDecimal& record) {
    constexpr uint32 kEightDigits = 100000000;
    const uint64 upper = digits / kEightDigits;
    const uint64 low = PackEight(static_cast<uint32>(digits % kEightDigits)) |
                       static_cast<uint64>(PackEight(static_cast<uint32>(upper % kEightDigits))) << 32;
    std::memcpy(record.mantissa, &low, sizeof low);
    record.mantissa[8] = static_cast<uint8>(PackEight(static_cast<uint32>(upper / kEightDigits)));
}

RealParts TakeApart(double x) {
    constexpr int32 kMantissaBits = 52;
    constexpr int32 kBias = 1023;
    constexpr int32 kSpecial = 0x7FF;
    const auto bits = std::bit_cast<uint64>(x);
    const bool negative = bits >> 63 != 0;
    const auto exponent = static_cast<int32>((bits >> kMantissaBits) & kSpecial);
    const uint64 fraction = bits << (63 - kMantissaBits);  // at the mantissa's place, below bit 63
    if (exponent != 0 && exponent != kSpecial) {
        return {kExtendedIntegerBit | fraction, exponent - kBias - 63, RealKind::kFinite, negative};
    }
    const uint64 low = fraction & ~kExtendedIntegerBit;
    if (exponent == kSpecial) return {0, 0, low == 0 ? RealKind::kInfinite : RealKind::kNaN, negative};
    if (low == 0) return {0, 0, RealKind::kFinite, negative};
    const int zeros = std::countl_zero(low);
    return {low << zeros, 1 - kBias - 63 - zeros, RealKind::kFinite, negative};
}

RealParts TakeApart(const floatExt& x) {
    const bool negative = x.signExponent >> 15 != 0;
    const int32 exponent = x.signExponent & kInfiniteExponent;
    const uint64 mantissa = x.mantissa;
    if (exponent == kInfiniteExponent) {
        return {0, 0, mantissa << 1 == 0 ? RealKind::kInfinite : RealKind::kNaN, negative};
    }
    if (mantissa == 0) return {0, 0, RealKind::kFinite, negative};
    const int zeros = std::countl_zero(mantissa);
    return {mantissa << zeros, (exponent == 0 ? 1 : exponent) - kExtendedBias - 63 - zeros, RealKind::kFinite,
            negative};
}

DecimalDigits RoundToDecimal(RealParts x, int32 precision) {
    if (x.mantissa == 0) return {0, 0, 1};
    const int32 lead = DecimalExponent(x);
    const int32 unit = precision >= 1 ? lead - std::min(precision, kMaxSignificant) + 1
                                      : std::max(precision, lead - kPackedDecimalDigits + 1);
    const uint64 digits = RoundScaled(x, -unit);
    const int32 count = lead - unit + 1;
    if (count < 1) return {digits, unit, 1};
    if (digits < PowerOfTen64(count)) return {digits, unit, count};
    if (precision >= 1 || count == kPackedDecimalDigits) return {digits / 10, unit + 1, count};
    return {digits, unit, count + 1};
}

RoundedExtended FromDecimal(uint64 digits, int32 exponent) {
    if (digits == 0 || exponent < kSmallestDecimalExponent) return {0, 0, digits == 0 ? 0 : 1};
    if (exponent > kLargestDecimalExponent) return {kExtendedIntegerBit, kInfiniteExponent, 0};

    const int zeros = std::countl_zero(digits);
    Scaled scaled = Scale(digits << zeros, -zeros, PowerOfTen(exponent));
    if (scaled.high >> 63 == 0) {
        scaled.high = (scaled.high << 1) | (scaled.middle >> 63);
        scaled.middle = (scaled.middle << 1) | (scaled.low >> 63);
        scaled.low <<= 1;
        scaled.error *= 2;
        --scaled.exponent;
    }
    // A fraction that is exact in binary looks as if it missed an extended value by a hair.
    const bool hairsbreadth = scaled.error != 0 && (scaled.middle >= ~uint64{scaled.error} || scaled.middle == 0);
    if (hairsbreadth && exponent < 0 && -exponent < static_cast<int32>(kPowersOfFive.size()) &&
        digits % kPowersOfFive[-exponent] == 0) {
        return Exact64(digits / kPowersOfFive[-exponent], exponent);
    }

    int32 unit = scaled.exponent + 128;  // the value of bit 0 of the high word, as a power of two
    int32 biased = unit + 63 + kExtendedBias;
    const int32 position = biased > 0 ? 0 : 1 - biased;  // denormal: fewer bits are kept
    if (position > kLowestBitPosition) return {0, 0, 1};
    uint64 kept = position == kLowestBitPosition ? 0 : scaled.high >> position;
    unit += position;
    const Tail tail = ClassifyTail(scaled, position);
    const int compared = tail == Tail::kUnclear ? CompareExactly(digits, 0, exponent, kept, unit, true)
                                                : static_cast<int>(tail) - static_cast<int>(Tail::kHalf);
    int32 rest = scaled.error == 0 && scaled.middle == 0 && scaled.low == 0 && position == 0 ? 0 : 1;
    if (RoundsUp(compared, kept)) {
        ++kept;
        rest = -1;
    }
    if (position == 0 && kept == 0) {  // carried out of the mantissa
        kept = kExtendedIntegerBit;
        ++unit;
        ++biased;
    }
    if (hairsbreadth) rest = CompareExactly(digits, 0, exponent, kept, unit, false);
    if (position > 0) biased = kept >> 63 != 0 ? 1 : 0;
    if (biased >= kInfiniteExponent) return {kExtendedIntegerBit, kInfiniteExponent, 0};
    return {kept, static_cast<uint32>(biased), rest};
}

}  // namespace tessel
