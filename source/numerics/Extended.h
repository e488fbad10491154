// The extended real as something to compute with: the host's long double where that is the 80-bit type.
#pragma once

#include <tessel/base/NumericTypes.h>

#include <cfloat>
#include <cmath>
#include <cstring>
#include <limits>

namespace tessel {

using Extended = long double;

inline constexpr uint16 kExtendedSign = 0x8000;
inline constexpr uint16 kExtendedExponentMask = 0x7FFF;
inline constexpr int kExtendedBias = 16383;
inline constexpr uint64 kExtendedIntegerBit = uint64{1} << 63;

// An extended real that came about by rounding, as it is kept in registers: `rest` tells on which side of it the exact
// value lies (-1 below, 1 above, 0 when they are equal), for those who round once more.
struct RoundedExtended {
    uint64 mantissa;
    uint32 signExponent;
    int32 rest;
};

inline floatExt Pack(const RoundedExtended& x) {
    return {x.mantissa, static_cast<uint16>(x.signExponent)};
}

inline RoundedExtended Unpack(const floatExt& x) {
    return {x.mantissa, x.signExponent, 0};
}

#if LDBL_MANT_DIG == 64 && LDBL_MAX_EXP == 16384

inline Extended ToExtended(const floatExt& value) {
    Extended x = 0;
    std::memcpy(&x, &value, sizeof value);
    return x;
}

inline floatExt FromExtended(Extended x) {
    floatExt value;
    std::memcpy(&value, &x, sizeof value);
    return value;
}

#else

static_assert(DBL_MANT_DIG == 53, "computing needs at least IEEE double precision");

// The host computes with another format: values are taken apart and put together. What the host's format cannot hold is
// rounded, or becomes an infinity or zero, by the host's own rules.
inline Extended ToExtended(const floatExt& value) {
    const bool negative = (value.signExponent & kExtendedSign) != 0;
    const int exponent = value.signExponent & kExtendedExponentMask;
    const uint64 mantissa = value.mantissa;
    Extended x;
    if (exponent == kExtendedExponentMask) {
        const bool infinite = (mantissa & ~kExtendedIntegerBit) == 0;
        x = infinite ? std::numeric_limits<Extended>::infinity() : std::numeric_limits<Extended>::quiet_NaN();
    } else {
        x = std::ldexp(static_cast<Extended>(mantissa), (exponent == 0 ? 1 : exponent) - kExtendedBias - 63);
    }
    return negative ? -x : x;
}

inline floatExt FromExtended(Extended x) {
    const uint16 sign = std::signbit(x) ? kExtendedSign : 0;
    if (std::isnan(x)) return {~uint64{0}, static_cast<uint16>(sign | kExtendedExponentMask)};
    if (std::isinf(x)) return {kExtendedIntegerBit, static_cast<uint16>(sign | kExtendedExponentMask)};
    if (x == 0) return {0, sign};
    int exponent = 0;
    uint64 mantissa = 0;
    const Extended whole = std::nearbyint(std::ldexp(std::frexp(std::fabs(x), &exponent), 64));
    if (whole >= 18446744073709551616.0L) {
        mantissa = kExtendedIntegerBit;
        ++exponent;
    } else {
        mantissa = static_cast<uint64>(whole);
    }
    exponent += kExtendedBias - 1;
    if (exponent >= kExtendedExponentMask)
        return {kExtendedIntegerBit, static_cast<uint16>(sign | kExtendedExponentMask)};
    if (exponent <= 0) {  // denormal
        mantissa = exponent > -63 ? mantissa >> (1 - exponent) : 0;
        exponent = 0;
    }
    return {mantissa, static_cast<uint16>(sign | exponent)};
}

#endif

}  // namespace tessel
