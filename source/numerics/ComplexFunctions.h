// The complex functions of the math family. W is double or the extended real; the members for singles and doubles
// compute in the next wider one, which has room for the intermediate values and rounds the result once.
#pragma once

#include "numerics/RealFunctions.h"
#include "numerics/Turns.h"
#include "numerics/TwoParts.h"

#include <algorithm>
#include <cmath>
#include <complex>
#include <limits>
#include <type_traits>

namespace tessel::cmplx {

template <class W>
using Complex = std::complex<W>;

template <class W>
bool IsFinite(const Complex<W>& z) {
    return std::isfinite(z.real()) && std::isfinite(z.imag());
}

template <class W>
bool IsNaN(const Complex<W>& z) {
    return std::isnan(z.real()) || std::isnan(z.imag());
}

template <class W>
bool IsZero(const Complex<W>& z) {
    return z.real() == 0 && z.imag() == 0;
}

// Constants in two parts, for arguments that must not lose their last bits.
template <class W>
constexpr TwoParts<W> kLn10 = {0x935D8DDDAAA8AC17p-62L, -0xAD494EA3E967AEB9p-129L};
template <>
inline constexpr TwoParts<double> kLn10<double> = {0x126BB1BBB55516p-51, -0x1F48AD494EA3E9p-105};

template <class W>
constexpr TwoParts<W> kLn2 = {0xB17217F7D1CF79ACp-64L, -0xD871319FF0342543p-130L};
template <>
inline constexpr TwoParts<double> kLn2<double> = {0x162E42FEFA39EFp-53, 0x1ABC9E3B39803Fp-108};

template <class W>
constexpr W kLog10E = static_cast<W>(0xDE5BD8A937287195p-65L);
template <class W>
constexpr W kLog2E = static_cast<W>(0xB8AA3B295C17F0BCp-63L);
template <class W>
constexpr W kHalfPi = static_cast<W>(0xC90FDAA22168C235p-63L);

// ---- exact steps ----------------------------------------------------------------------------------------------------

// ab - cd, keeping what cancellation would lose.
template <class W>
W DifferenceOfProducts(W a, W b, W c, W d) {
    constexpr W kCancelled = 4;
    const W first = a * b;
    const W second = c * d;
    const W difference = first - second;
    if (std::fabs(difference) * kCancelled >= std::fabs(first) || !std::isfinite(difference)) return difference;
    const W rest = ExactProduct(a, b).low - ExactProduct(c, d).low;
    return std::isfinite(rest) ? difference + rest : difference;
}

// ---- arithmetic -----------------------------------------------------------------------------------------------------

// (ac - bd) + (ad + bc) i
template <class W>
Complex<W> Multiply(const Complex<W>& x, const Complex<W>& y) {
    const W a = x.real();
    const W b = x.imag();
    const W c = y.real();
    const W d = y.imag();
    if (b == 0 && d == 0) return {a * c, 0};
    return {DifferenceOfProducts(a, c, b, d), DifferenceOfProducts(a, d, -b, c)};
}

template <class W>
Complex<W> ScaleByPowerOf2(const Complex<W>& z, int power) {
    return {std::scalbn(z.real(), power), std::scalbn(z.imag(), power)};
}

// ((ac + bd) + (bc - ad) i) / (cc + dd)
template <class W>
Complex<W> TextbookQuotient(const Complex<W>& x, const Complex<W>& y) {
    const W a = x.real();
    const W b = x.imag();
    const W c = y.real();
    const W d = y.imag();
    const W divisor = c * c + d * d;
    return {DifferenceOfProducts(a, c, -b, d) / divisor, DifferenceOfProducts(b, c, a, d) / divisor};
}

template <class W>
int Exponent(const Complex<W>& z) {
    return std::ilogb(std::fmax(std::fabs(z.real()), std::fabs(z.imag())));
}

template <class W>
constexpr W PowerOf2(int exponent) {
    W power = 1;
    for (; exponent > 0; --exponent) power *= 2;
    return power;
}

// ab - cd as a value times 2^exponent, so that no product of finite factors leaves the range.
template <class W>
W ScaledDifferenceOfProducts(W a, W b, W c, W d, int& exponent) {
    const bool onlySecond = a == 0 || b == 0;
    const bool onlyFirst = c == 0 || d == 0;
    const auto takeApart = [](W& x) {
        int power = 0;
        x = std::frexp(x, &power);
        return power;
    };
    const int first = takeApart(a) + takeApart(b);
    const int second = takeApart(c) + takeApart(d);
    exponent = onlySecond ? second : onlyFirst ? first : std::max(first, second);
    return DifferenceOfProducts(std::scalbn(a, std::min(first - exponent, 0)), b,
                                std::scalbn(c, std::min(second - exponent, 0)), d);
}

// The textbook quotient of any finite operands, y not being 0.
template <class W>
Complex<W> ScaledQuotient(const Complex<W>& x, const Complex<W>& y) {
    const int power = Exponent(y);
    const Complex<W> near = ScaleByPowerOf2(y, -power);
    const W divisor = near.real() * near.real() + near.imag() * near.imag();
    const auto part = [&](W a, W b, W c, W d) {
        int exponent = 0;
        const W dividend = ScaledDifferenceOfProducts(a, b, c, d, exponent);
        return std::scalbn(dividend / divisor, exponent - 2 * power);
    };
    return {part(x.real(), y.real(), -x.imag(), y.imag()), part(x.imag(), y.real(), x.real(), y.imag())};
}

// The textbook quotient; finite operands are scaled where squares or products would leave the range.
template <class W>
Complex<W> Divide(const Complex<W>& x, const Complex<W>& y) {
    if (!IsFinite(x) || !IsFinite(y) || IsZero(x) || IsZero(y)) return TextbookQuotient(x, y);
    const auto isSafe = [](W part) {
        constexpr int kSafe = std::numeric_limits<W>::max_exponent / 4;
        constexpr W kLarge = PowerOf2<W>(kSafe);
        const W size = std::fabs(part);
        return size == 0 || (size < kLarge && size > 1 / kLarge);
    };
    const bool safe = isSafe(x.real()) && isSafe(x.imag()) && isSafe(y.real()) && isSafe(y.imag());
    return safe ? TextbookQuotient(x, y) : ScaledQuotient(x, y);
}

// 1 / z: infinite for a zero, zero for an infinity.
template <class W>
Complex<W> Recip(const Complex<W>& z) {
    if (IsZero(z)) return {std::copysign(real::kInfinity<W>, z.real()), -z.imag()};
    if (std::isinf(z.real()) || std::isinf(z.imag())) {
        return {std::copysign(W{0}, z.real()), std::copysign(W{0}, -z.imag())};
    }
    return Divide(Complex<W>(1), z);
}

// z brought to magnitude 1; an infinite part outweighs a finite one.
template <class W>
Complex<W> Sign(const Complex<W>& z) {
    if (IsNaN(z) || IsZero(z)) return z;
    if (!IsFinite(z)) {
        const auto direction = [](W part) { return std::copysign(std::isinf(part) ? W{1} : W{0}, part); };
        return Sign(Complex<W>(direction(z.real()), direction(z.imag())));
    }
    const Complex<W> scaled = ScaleByPowerOf2(z, -Exponent(z));
    const W magnitude = std::hypot(scaled.real(), scaled.imag());
    return {scaled.real() / magnitude, scaled.imag() / magnitude};
}

// ---- forms ----------------------------------------------------------------------------------------------------------

template <class W>
W Magnitude(const Complex<W>& z) {
    return std::hypot(z.real(), z.imag());
}

template <class W>
W Angle(const Complex<W>& z) {
    return std::atan2(z.imag(), z.real());
}

template <class W>
Complex<W> ToPolar(const Complex<W>& z) {
    return IsZero(z) ? z : Complex<W>(Magnitude(z), Angle(z));
}

// Of magnitude and angle.
template <class W>
Complex<W> ToRectangular(const Complex<W>& polar) {
    const W magnitude = polar.real();
    const W angle = polar.imag();
    if (angle == 0) return {magnitude, angle};
    return {magnitude * std::cos(angle), magnitude * std::sin(angle)};
}

// ---- logarithms -----------------------------------------------------------------------------------------------------

template <class W>
Complex<W> Logn(const Complex<W>& z) {
    return std::log(z);
}

template <class W>
Complex<W> Log10(const Complex<W>& z) {
    const Complex<W> log = std::log(z);
    return {log.real() * kLog10E<W>, log.imag() * kLog10E<W>};
}

template <class W>
Complex<W> Log2(const Complex<W>& z) {
    const Complex<W> log = std::log(z);
    return {log.real() * kLog2E<W>, log.imag() * kLog2E<W>};
}

// ln z / ln base; two real logarithms give the real quotient, and one infinite logarithm an infinite or zero result in
// the direction of the quotient.
template <class W>
Complex<W> Logx(const Complex<W>& base, const Complex<W>& z) {
    const auto log = [](const Complex<W>& x) { return IsZero(x) ? Complex<W>(-real::kInfinity<W>) : std::log(x); };
    const Complex<W> dividend = log(z);
    const Complex<W> divisor = log(base);
    if (dividend.imag() == 0 && divisor.imag() == 0) return {dividend.real() / divisor.real(), 0};
    const bool infiniteDividend = std::isinf(dividend.real());
    const bool infiniteDivisor = std::isinf(divisor.real());
    if (infiniteDividend == infiniteDivisor) return Divide(dividend, divisor);
    const auto direction = [](const Complex<W>& x) { return Complex<W>(std::copysign(W{1}, x.real())); };
    const Complex<W> quotient =
        infiniteDividend ? Divide(direction(dividend), divisor) : Divide(dividend, direction(divisor));
    const W size = infiniteDividend ? real::kInfinity<W> : W{0};
    const auto part = [size](W x) { return x == 0 ? x : x * size; };
    return {part(quotient.real()), part(quotient.imag())};
}

// |1 + z|^2 - 1 = 2x + x^2 + y^2, without losing bits where the terms cancel.
template <class W>
W SquareOfOnePlusLessOne(W x, W y) {
    const TwoParts<W> xx = ExactProduct(x, x);
    const TwoParts<W> yy = ExactProduct(y, y);
    const TwoParts<W> first = ExactSum(2 * x, yy.high);
    const TwoParts<W> second = ExactSum(first.high, xx.high);
    return second.high + (first.low + second.low + xx.low + yy.low);
}

// ln(1 + z), by |1 + z|^2 where that is not near 0 nor large.
template <class W>
Complex<W> Lognp1(const Complex<W>& z) {
    constexpr W kNear = 2;
    const W x = z.real();
    const W y = z.imag();
    if (std::fabs(x) < kNear && std::fabs(y) < kNear) {
        const W square = SquareOfOnePlusLessOne(x, y);
        if (square > W{-0.5}) return {std::log1p(square) / 2, std::atan2(y, 1 + x)};
    }
    return std::log(Complex<W>(1 + x, y));
}

// ---- powers ---------------------------------------------------------------------------------------------------------

// power(x) times (a + bi), where power is an exponential function and |a|, |b| at most 1: a part may be in range though
// the power itself is not.
template <class W, class Power>
Complex<W> ScaledByPower(Power power, W x, W a, W b) {
    const W whole = power(x);
    if (std::isfinite(whole)) return {whole * a, whole * b};
    const W half = power(x / 2);
    return {half * a * half, half * b * half};
}

// e^z - 1 = (e^x - 1) cos y - 2 sin^2(y/2) + i e^x sin y
template <class W>
Complex<W> Expm1(const Complex<W>& z) {
    const W x = z.real();
    const W y = z.imag();
    if (y == 0) return {std::expm1(x), y};
    if (!IsFinite(z)) return std::exp(z) - Complex<W>(1);
    const W exp = std::exp(x);
    if (std::isinf(exp)) {
        return ScaledByPower([](W power) { return std::exp(power); }, x, std::cos(y), std::sin(y));
    }
    const W halfSine = std::sin(y / 2);
    return {std::expm1(x) * std::cos(y) - 2 * halfSine * halfSine, exp * std::sin(y)};
}

// An angle as cosine and sine.
template <class W>
Complex<W> Turned(const ReducedAngle& angle) {
    const W cosine = std::cos(static_cast<W>(angle.rest));
    const W sine = std::sin(static_cast<W>(angle.rest));
    switch (angle.quarters) {
        case 0:
            return {cosine, sine};
        case 1:
            return {-sine, cosine};
        case 2:
            return {-cosine, -sine};
        default:
            return {sine, -cosine};
    }
}

// b^iy as cosine and sine of the angle y ln b.
template <class W>
Complex<W> Turn(W y, const TwoParts<W>& lnBase, ReducedAngle (*reduce)(Extended)) {
    constexpr W kLarge = 256;  // up to here two parts of the angle are enough
    if (std::fabs(y) > kLarge) return Turned<W>(reduce(y));
    const TwoParts<W> angle = ExactProduct(y, lnBase.high);
    const W rest = angle.low + y * lnBase.low;
    const W cosine = std::cos(angle.high);
    const W sine = std::sin(angle.high);
    return {cosine - rest * sine, sine + rest * cosine};
}

template <class W>
Complex<W> Pow10(const Complex<W>& z) {
    if (!IsFinite(z)) return std::exp(Complex<W>(z.real() * kLn10<W>.high, z.imag() * kLn10<W>.high));
    const auto power = [](W x) { return real::Pow10(x); };
    if (z.imag() == 0) return {power(z.real()), z.imag()};
    const Complex<W> turn = Turn(z.imag(), kLn10<W>, AngleOfPowerOf10);
    return ScaledByPower(power, z.real(), turn.real(), turn.imag());
}

template <class W>
Complex<W> Pow2(const Complex<W>& z) {
    if (!IsFinite(z)) return std::exp(Complex<W>(z.real() * kLn2<W>.high, z.imag() * kLn2<W>.high));
    const auto power = [](W x) { return std::exp2(x); };
    if (z.imag() == 0) return {power(z.real()), z.imag()};
    const Complex<W> turn = Turn(z.imag(), kLn2<W>, AngleOfPowerOf2);
    return ScaledByPower(power, z.real(), turn.real(), turn.imag());
}

// z to a whole power by repeated squaring, with z brought near 1 where a product on the way could leave the range.
template <class W>
Complex<W> WholePower(Complex<W> z, int power) {
    const int size = std::abs(power);
    const int exponent = Exponent(z);
    const bool scaled = (std::abs(exponent) + 2) * size >= std::numeric_limits<W>::max_exponent;
    if (scaled) z = ScaleByPowerOf2(z, -exponent);
    Complex<W> result(1);
    for (int left = size; left != 0; left /= 2) {
        if (left % 2 != 0) result = Multiply(result, z);
        if (left > 1) z = Multiply(z, z);
    }
    if (power < 0) result = Recip(result);
    return scaled ? ScaleByPowerOf2(result, exponent * power) : result;
}

template <class W>
Complex<W> PowerOfZero(const Complex<W>& power) {
    if (power.real() > 0) return 0;
    if (power.real() < 0 && power.imag() == 0) return real::kInfinity<W>;
    return {real::NaN<W>(), real::NaN<W>()};
}

// x to the power y. Whole powers are products, all others e^(y ln x).
template <class W>
Complex<W> Powx(const Complex<W>& x, const Complex<W>& y) {
    constexpr W kLargestWhole = 64;
    if (IsZero(y)) return 1;
    if (IsZero(x)) return PowerOfZero(y);
    const bool isWhole = y.imag() == 0 && y.real() == std::trunc(y.real());
    if (x.imag() == 0 && y.imag() == 0 && (x.real() > 0 || isWhole)) return {std::pow(x.real(), y.real()), 0};
    if (!IsFinite(x) || !IsFinite(y)) return std::exp(Multiply(y, std::log(x)));
    if (isWhole && std::fabs(y.real()) <= kLargestWhole) return WholePower(x, static_cast<int>(y.real()));
    const Complex<W> log = std::log(x);
    const W angle = y.imag() * log.real() + y.real() * log.imag();
    return std::exp(Complex<W>(y.real() * log.real() - y.imag() * log.imag(), angle));
}

// ---- trigonometry ---------------------------------------------------------------------------------------------------

template <class W>
Complex<W> Sec(const Complex<W>& z) {
    return Recip(std::cos(z));
}

template <class W>
Complex<W> Csc(const Complex<W>& z) {
    return Recip(std::sin(z));
}

template <class W>
Complex<W> Cot(const Complex<W>& z) {
    return Recip(std::tan(z));
}

// sin z / z. Far from the real axis the sine is e^|y| / 2 times (sin x, +-cos x), and out of range before the quotient.
template <class W>
Complex<W> Sinc(const Complex<W>& z) {
    constexpr W kFar = 100;
    if (IsZero(z)) return 1;
    const W x = z.real();
    const W y = std::fabs(z.imag());
    if (!IsFinite(z) || y < kFar) return Divide(std::sin(z), z);
    const Complex<W> turn = Divide(Complex<W>(std::sin(x) / 2, z.imag() < 0 ? -std::cos(x) / 2 : std::cos(x) / 2), z);
    return ScaledByPower([](W power) { return std::exp(power); }, y, turn.real(), turn.imag());
}

// The arctangent of y / x.
template <class W>
Complex<W> Atan2(const Complex<W>& x, const Complex<W>& y) {
    if (!IsZero(x)) return std::atan(Divide(y, x));
    if (IsZero(y)) return 0;
    return std::copysign(kHalfPi<W>, y.real());
}

}  // namespace tessel::cmplx
