// The real functions of the math family, for float, double and the extended real. What the standard library has in the
// same form is used from there directly.
#pragma once

#include "numerics/DoubleMath.h"
#include "numerics/Extended.h"
#include "numerics/NumericAccess.h"
#include "numerics/TwoParts.h"

#include <bit>
#include <cmath>
#include <limits>
#include <type_traits>

namespace tessel::real {

template <class T>
constexpr T kInfinity = std::numeric_limits<T>::infinity();

// The NaN of a precision: all bits set in a single or double, the sign clear in an extended real.
template <class T>
T NaN() {
    if constexpr (std::is_same_v<T, float>) {
        return std::bit_cast<float>(~uint32{0});
    } else if constexpr (std::is_same_v<T, double>) {
        return std::bit_cast<double>(~uint64{0});
    } else {
        return ToExtended({~uint64{0}, kExtendedExponentMask});
    }
}

// The precision in which functions made of several steps are computed, so that the result is rounded once.
template <class T>
using Wider = std::conditional_t<std::is_same_v<T, float>, double, Extended>;

// An operand in that precision. No other type is turned into one of these silently.
template <class T>
T InWider(T x) = delete;
inline double InWider(float x) {
    return x;
}
inline Extended InWider(double x) {
    return x;
}
inline Extended InWider(Extended x) {
    return x;
}

// Singles go through double, doubles have a function of their own, and the extended reals take the library's.
template <class T, class OfDouble, class Function>
T Careful(T x, OfDouble ofDouble, Function function) {
    if constexpr (std::is_same_v<T, float>) {
        return static_cast<float>(function(double{x}));
    } else if constexpr (std::is_same_v<T, double>) {
        return ofDouble(x);
    } else {
        return function(x);
    }
}

// ---- logarithms -----------------------------------------------------------------------------------------------------

// What a logarithm is where it has no value: -infinity at 0, else (negative or NaN) a NaN.
template <class T>
T LogOutside(T distanceFromPole) {
    return distanceFromPole == 0 ? -kInfinity<T> : NaN<T>();
}

template <class T>
T Logn(T x) {
    return x > 0 ? std::log(x) : LogOutside(x);
}

// log10(m 2^e) = log10(m) + e log10(2), which is exact at the powers of ten where the library's own is not.
inline Extended ExtendedLog10(Extended x) {
    constexpr TwoParts<Extended> kLog10Of2 = {0x9A209A84FBCFp-49L, 0xF7988F8959AC0B7Dp-113L};  // high times e is exact
    constexpr Extended kRootOfHalf = 0.70710678118654752440L;
    if (!std::isfinite(x)) return x;
    int exponent = 0;
    Extended mantissa = std::frexp(x, &exponent);
    if (mantissa < kRootOfHalf) {
        mantissa *= 2;
        --exponent;
    }
    const auto power = static_cast<Extended>(exponent);
    return power * kLog10Of2.high + (power * kLog10Of2.low + std::log10(mantissa));
}

template <class T>
T Log10(T x) {
    if (!(x > 0)) return LogOutside(x);
    if constexpr (std::is_same_v<T, Extended>) {
        return ExtendedLog10(x);
    } else {
        return Careful(x, precise::Log10, [](double wide) { return std::log10(wide); });
    }
}

template <class T>
T Log2(T x) {
    return x > 0 ? std::log2(x) : LogOutside(x);
}

template <class T>
T Lognp1(T x) {
    return x > -1 ? std::log1p(x) : LogOutside(x + 1);
}

template <class T>
T Logx(T base, T x) {
    const auto quotient = Logn(InWider(x)) / Logn(InWider(base));
    return std::isnan(quotient) ? NaN<T>() : static_cast<T>(quotient);
}

// ---- powers ---------------------------------------------------------------------------------------------------------

template <class T>
T Pow10(T x) {
    return std::pow(T{10}, x);
}

// x times 2 to the power trunc(n).
template <class T>
T Scale(T x, T n) {
    constexpr T kFarthest = 40000;  // moves any value out of range
    if (std::isnan(n)) return n;
    if (std::isinf(n)) return n > 0 ? x * n : x / -n;
    const T bounded = std::fmin(std::fmax(n, -kFarthest), kFarthest);
    return std::scalbn(x, static_cast<int>(bounded));
}

template <class T>
struct MantissaAndExponent {
    T mantissa;
    T exponent;
};

template <class T>
MantissaAndExponent<T> GetMantExp(T x) {
    if (x == 0) return {0, 0};
    if (std::isnan(x)) return {x, x};
    if (std::isinf(x)) return {x, kInfinity<T>};
    int exponent = 0;
    const T half = std::frexp(x, &exponent);
    return {2 * half, static_cast<T>(exponent - 1)};
}

// ---- trigonometry ---------------------------------------------------------------------------------------------------

// Only doubles need more than the library gives.
template <class T>
T Sin(T x) {
    if constexpr (std::is_same_v<T, double>) return precise::Sin(x);
    return std::sin(x);
}

template <class T>
T Cos(T x) {
    if constexpr (std::is_same_v<T, double>) return precise::Cos(x);
    return std::cos(x);
}

template <class T>
T Tan(T x) {
    if constexpr (std::is_same_v<T, double>) return precise::Tan(x);
    return std::tan(x);
}

template <class T>
T Sec(T x) {
    return Careful(x, precise::Sec, [](auto wide) { return 1 / std::cos(wide); });
}

template <class T>
T Csc(T x) {
    return Careful(x, precise::Csc, [](auto wide) { return 1 / std::sin(wide); });
}

template <class T>
T Cot(T x) {
    return Careful(x, precise::Cot, [](auto wide) { return 1 / std::tan(wide); });
}

template <class T>
T Sinc(T x) {
    return x == 0 ? T{1} : Careful(x, precise::Sinc, [](auto wide) { return std::sin(wide) / wide; });
}

// Angle of the point (x, y).
template <class T>
T Atan2(T x, T y) {
    if constexpr (std::is_same_v<T, float>) {
        return static_cast<float>(std::atan2(double{y}, double{x}));
    } else {
        return std::atan2(y, x);
    }
}

template <class T>
T Sinh(T x) {
    return Careful(x, precise::Sinh, [](auto wide) { return std::sinh(wide); });
}

template <class T>
T Cosh(T x) {
    return Careful(x, precise::Cosh, [](auto wide) { return std::cosh(wide); });
}

template <class T>
T Tanh(T x) {
    return Careful(x, precise::Tanh, [](auto wide) { return std::tanh(wide); });
}

template <class T>
T Asinh(T x) {
    return Careful(x, precise::Asinh, [](auto wide) { return std::asinh(wide); });
}

template <class T>
T Acosh(T x) {
    return Careful(x, precise::Acosh, [](auto wide) { return std::acosh(wide); });
}

template <class T>
T Atanh(T x) {
    return Careful(x, precise::Atanh, [](auto wide) { return std::atanh(wide); });
}

// ---- arithmetic -----------------------------------------------------------------------------------------------------

template <class T>
T Recip(T x) {
    return 1 / x;
}

template <class T>
T Inc(T x) {
    return x + 1;
}

template <class T>
T Dec(T x) {
    return x - 1;
}

template <class T>
T Neg(T x) {
    return -x;
}

// Halves to even, whatever direction the host's unit rounds in; a zero is positive. From 2^63 on there are only
// integers, no operand having more than 64 digits.
template <class T>
T Round(T x) {
    constexpr T kAllWhole = 0x1p63;
    const T size = std::fabs(x);
    if (!(size < kAllWhole)) return x;
    const auto whole = static_cast<T>(static_cast<uint64>(NearestInteger(size)));
    return x < 0 && whole != 0 ? -whole : whole;
}

template <class T>
T Sign(T x) {
    if (std::isnan(x)) return NaN<T>();
    return x > 0 ? T{1} : x < 0 ? T{-1} : T{0};
}

// x - floor(x / y) y, without the rounding of the quotient where that is finite; a zero is positive.
template <class T>
T Mod(T x, T y) {
    if (!std::isfinite(x) || !std::isfinite(y)) return x - std::floor(x / y) * y;
    const T remainder = std::fmod(x, y);
    if (remainder == 0) return 0;
    return (remainder < 0) != (y < 0) ? remainder + y : remainder;
}

template <class T>
struct QuotientAndRemainder {
    T quotient;
    T remainder;
};

template <class T>
QuotientAndRemainder<T> QRem(T x, T y) {
    const T quotient = std::floor(x / y);
    if (!std::isfinite(x) || !std::isfinite(y) || y == 0) return {quotient, x - y * quotient};
    const T remainder = Mod(x, y);
    if (std::isinf(quotient) || x == 0) return {quotient, remainder};
    return {Round((x - remainder) / y), remainder};
}

template <class T>
struct MaximumAndMinimum {
    T max;
    T min;
};

template <class T>
MaximumAndMinimum<T> MaxMin(T x, T y) {
    if (std::isnan(x) || std::isnan(y)) return {NaN<T>(), NaN<T>()};
    return {y > x ? y : x, y < x ? y : x};
}

}  // namespace tessel::real
