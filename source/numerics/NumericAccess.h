// Reading and writing values of any numeric type in memory, whatever their alignment.
#pragma once

#include "numerics/Extended.h"

#include <cmath>
#include <cstring>
#include <limits>
#include <type_traits>

namespace tessel {

// The nearest integer, halves to even, whatever direction the host's unit rounds in; |x| is below 2^63. What rounds up
// to 2^63 wraps around, to the bits of the unsigned value.
template <class Real>
int64 NearestInteger(Real x) {
    constexpr Real kHalf = 0.5;
    const auto whole = static_cast<int64>(x);
    const Real rest = std::fabs(x - static_cast<Real>(whole));  // exact
    const bool stays = rest < kHalf || (rest == kHalf && whole % 2 == 0);
    return stays ? whole : static_cast<int64>(static_cast<uint64>(whole) + (x < 0 ? ~uint64{0} : 1));
}

// The same for an integer type: what lies outside the range saturates, a NaN gives the maximum.
template <class Int, class Real>
Int SaturatedRound(Real x) {
    constexpr Int kMax = std::numeric_limits<Int>::max();
    constexpr Int kMin = std::numeric_limits<Int>::min();
    constexpr Real kTwoTo63 = 0x1p63;
    if (!(x < static_cast<Real>(kMax))) return kMax;
    if (x <= static_cast<Real>(kMin)) return kMin;
    if constexpr (std::is_same_v<Int, uint64>) {
        if (x >= kTwoTo63) return static_cast<uint64>(NearestInteger(x - kTwoTo63)) + (uint64{1} << 63);
    }
    return static_cast<Int>(NearestInteger(x));
}

template <class T>
T ReadAs(const void* source) {
    T value;
    std::memcpy(&value, source, sizeof value);
    return value;
}

template <class T>
void WriteAs(void* destination, T value) {
    std::memcpy(destination, &value, sizeof value);
}

// The low four bits of a type code select the type.
inline int16 TypeOfCode(int16 code) {
    return static_cast<int16>(code & 15);
}

// The integer types are 1 to 4 (signed) and 5 to 8 (unsigned), by width.
inline bool IsIntegerType(int16 type) {
    return type >= kNumInt8 && type <= kNumUInt64;
}
inline bool IsSignedType(int16 type) {
    return type <= kNumInt64;
}
inline int32 IntegerBits(int16 type) {
    return 8 << ((type - kNumInt8) & 3);
}

// The bits of an integer, sign- or zero-extended; 0 for a type that is not an integer.
inline uint64 ReadInteger(int16 type, const void* source) {
    switch (type) {
        case kNumInt8:
            return static_cast<uint64>(int64{ReadAs<int8>(source)});
        case kNumInt16:
            return static_cast<uint64>(int64{ReadAs<int16>(source)});
        case kNumInt32:
            return static_cast<uint64>(int64{ReadAs<int32>(source)});
        case kNumUInt8:
            return ReadAs<uint8>(source);
        case kNumUInt16:
            return ReadAs<uint16>(source);
        case kNumUInt32:
            return ReadAs<uint32>(source);
        case kNumInt64:
        case kNumUInt64:
            return ReadAs<uint64>(source);
        default:
            return 0;
    }
}

// Writes the low bytes.
void WriteInteger(int16 type, uint64 value, void* destination);

// The value of an integer or real, or one part of a complex value.
struct ExtendedComplex {
    Extended re;
    Extended im;
};
ExtendedComplex ReadNumber(int16 type, const void* source);

// Writes by the store rules: integers saturate, narrower reals round. Types that are not complex take the real part.
void WriteNumber(int16 type, const ExtendedComplex& value, void* destination);

}  // namespace tessel
