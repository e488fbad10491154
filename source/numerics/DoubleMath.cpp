// Functions of doubles computed in two parts and rounded once.
#include "numerics/DoubleMath.h"

#include "numerics/Extended.h"
#include "numerics/TwoParts.h"

#include <array>
#include <bit>
#include <cmath>
#include <limits>

namespace tessel {
namespace {

using Pair = TwoParts<double>;

constexpr Pair kLn2 = {0x162E42FEFA39EFp-53, 0x1ABC9E3B39803Fp-108};
constexpr Pair kLog10E = {0x1BCB7B1526E50Ep-54, 0x195355BAAAFAD3p-109};

// Below this, x^2 is lost beside 1.
constexpr double kTiny = 0x1p-28;
// Above this, 1 is lost beside x^2.
constexpr double kHuge = 0x1p28;

constexpr Pair Split(Extended x) {
    const auto high = static_cast<double>(x);
    return {high, static_cast<double>(x - high)};
}

// A high part of whole units, so that small multiples of it, and their sums, are exact.
constexpr Pair SplitAt(Extended x, double unit) {
    const double high = static_cast<double>(static_cast<int64>(x / unit)) * unit;
    return {high, static_cast<double>(x - high)};
}
constexpr Pair SplitAt(const Pair& x, double unit) {
    const double high = static_cast<double>(static_cast<int64>(x.high / unit)) * unit;
    return {high, (x.high - high) + x.low};
}

double PowerOfTwo(int64 exponent) {
    return std::bit_cast<double>(static_cast<uint64>(exponent + 1023) << 52);
}

Pair Negated(const Pair& x) {
    return {-x.high, -x.low};
}

// a + b, where the low parts are small.
Pair Sum(const Pair& a, const Pair& b) {
    const Pair sum = ExactSum(a.high, b.high);
    return {sum.high, sum.low + (a.low + b.low)};
}

Pair Quotient(const Pair& a, const Pair& b) {
    const double quotient = a.high / b.high;
    const double inverse = 1 / b.high;  // for the rest, without waiting for it
    const Pair product = ExactProduct(quotient, b.high);
    const double rest = ((a.high - product.high) - product.low) + (a.low - quotient * b.low);
    return {quotient, rest * inverse};
}

Pair SquareRoot(const Pair& x) {
    const double root = std::sqrt(x.high);
    const double inverse = 0.5 / root;
    const Pair square = ExactProduct(root, root);
    return {root, (((x.high - square.high) - square.low) + x.low) * inverse};
}

Pair Square(double x) {
    return ExactProduct(x, x);
}

double Rounded(const Pair& x) {
    return x.high + x.low;
}

// ---- logarithms -----------------------------------------------------------------------------------------------------

// x is 2^k z with z around 1, and z lies near one of 129 points, 1 among them. With a short number near the inverse of
// that point, z times it is 1 + r exactly; the logarithm is that of 2^k, that of the inverse and that of 1 + r.
constexpr uint64 kLowestZ = 0x3FE6000000000000;  // 0.6875
constexpr int kPointShift = 45;
constexpr double kInverseUnit = 0x1p-9;
constexpr double kLogUnit = 0x1p-42;

struct LogPoint {
    double inverse;
    Pair log;  // of 1 / inverse
};

// By the series for the logarithm of (1 + s) / (1 - s).
constexpr Extended LogSeries(Extended x) {
    const Extended s = (x - 1) / (x + 1);
    Extended sum = 0;
    Extended power = s;
    for (int n = 1; n < 40; n += 2, power *= s * s) sum += power / n;
    return 2 * sum;
}

constexpr std::array<LogPoint, 129> kLogPoints = [] {
    std::array<LogPoint, 129> points{};
    for (size_t i = 0; i < points.size(); ++i) {
        const auto point = std::bit_cast<double>(kLowestZ + (uint64{i} << kPointShift));
        const int64 units = (static_cast<int64>(2 / point / kInverseUnit) + 1) / 2;
        const double inverse = static_cast<double>(units) * kInverseUnit;
        points[i] = {inverse, SplitAt(-LogSeries(inverse), kLogUnit)};
    }
    return points;
}();

constexpr Pair kLn2InUnits = SplitAt(kLn2, kLogUnit);

// What ln(1 + r) has beyond the high part of r; |r| is at most 1/128.
double LogTail(const Pair& r) {
    const double h = r.high;
    const double hh = h * h;
    const double high = (1.0 / 7 - h * (1.0 / 8)) + hh * (1.0 / 9);
    const double series = (1.0 / 3 - h * (1.0 / 4)) + hh * ((1.0 / 5 - h * (1.0 / 6)) + hh * high);
    return (r.low - r.low * h) + (h * hh * series - 0.5 * hh);
}

// ln(x + rest), x being positive and finite and rest far smaller.
Pair Log(double x, double rest = 0) {
    int64 scaled = 0;
    if (x < std::numeric_limits<double>::min()) {
        constexpr int kIntoRange = 54;
        x *= 0x1p54;
        scaled = kIntoRange;
    }
    constexpr uint64 kMantissa = (uint64{1} << 52) - 1;
    const auto bits = std::bit_cast<uint64>(x);
    const uint64 offset = bits - kLowestZ;
    const int64 k = static_cast<int64>(offset) >> 52;
    const uint64 zBits = bits - (static_cast<uint64>(k) << 52);
    const uint64 half = uint64{1} << (kPointShift - 1);
    const LogPoint& point = kLogPoints[((offset & kMantissa) + half) >> kPointShift];

    const auto zHigh = std::bit_cast<double>(zBits & 0xFFFFFFFF00000000);
    double zLow = std::bit_cast<double>(zBits) - zHigh;
    if (rest != 0) zLow += rest * PowerOfTwo(-k);
    const Pair r = ExactSum(zHigh * point.inverse - 1, zLow * point.inverse);

    const auto power = static_cast<double>(k - scaled);
    const Pair sum = ExactSum(power * kLn2InUnits.high + point.log.high, r.high);
    return ExactSumOrdered(sum.high, sum.low + (power * kLn2InUnits.low + point.log.low + LogTail(r)));
}

// ln(1 + x)
Pair Log1p(const Pair& x) {
    constexpr double kNear = 0x1p-9;
    if (std::fabs(x.high) < kNear) return ExactSumOrdered(x.high, LogTail(x));
    const Pair sum = ExactSum(1.0, x.high);
    return Log(sum.high, sum.low + x.low);
}

// ---- exponential functions ------------------------------------------------------------------------------------------

// x is n (ln 2) / 128 + r.
constexpr int kSteps = 128;
constexpr Pair kStep = SplitAt(Pair{kLn2.high / kSteps, kLn2.low / kSteps}, 0x1p-43);

constexpr Extended ExpSeries(Extended x) {
    Extended sum = 1;
    Extended term = 1;
    for (int n = 1; n < 25; ++n) sum += term *= x / n;
    return sum;
}

constexpr std::array<Pair, kSteps> kPowers = [] {
    constexpr Extended kFullStep = 0xB17217F7D1CF79ACp-64L / kSteps;
    std::array<Pair, kSteps> powers{};
    for (size_t i = 0; i < powers.size(); ++i) powers[i] = Split(ExpSeries(static_cast<Extended>(i) * kFullStep));
    return powers;
}();

Pair PowerOfSteps(int64 n) {
    const Pair& power = kPowers[static_cast<size_t>(n & (kSteps - 1))];
    const double scale = PowerOfTwo(n >> 7);
    return {power.high * scale, power.low * scale};
}

constexpr double kHyperbolicEnd = 700;
constexpr double kHyperbolicLimit = 712;  // above it both are infinite

// sinh(x) and cosh(x), each times two; 0.5 <= x < kHyperbolicEnd. Far ones, from there to kHyperbolicLimit, where e^x
// may leave the range and e^-x is lost beside it, also times 2^-kLowered.
constexpr int64 kLowered = 64;
struct Hyperbolic {
    Pair sine;
    Pair cosine;
};

template <bool kFar>
Hyperbolic TwiceSinhCosh(double x) {
    constexpr double kRounder = 0x1.8p52;
    const double steps = (x * (1 / (kStep.high + kStep.low)) + kRounder) - kRounder;
    const double r = (x - steps * kStep.high) - steps * kStep.low;
    const auto n = static_cast<int64>(steps);
    const Pair up = PowerOfSteps(kFar ? n - kLowered * kSteps : n);
    const Pair down = kFar ? Pair{0, 0} : PowerOfSteps(-n);
    const double rr = r * r;
    const double sine = r + r * rr * (1.0 / 6 + rr * (1.0 / 120));
    const double cosineLess1 = rr * (0.5 + rr * (1.0 / 24 + rr * (1.0 / 720)));
    const Pair sum = Sum(up, down);
    const Pair difference = Sum(up, Negated(down));
    return {ExactSumOrdered(difference.high, difference.low + (difference.high * cosineLess1 + sum.high * sine)),
            ExactSumOrdered(sum.high, sum.low + (sum.high * cosineLess1 + difference.high * sine))};
}

// sinh(x) - x and cosh(x) - 1 for |x| <= 0.5.
double SinhTail(double x) {
    const double xx = x * x;
    const double high = 1.0 / 362880 + xx * (1.0 / 39916800 + xx * (1.0 / 6227020800 + xx * (1.0 / 1307674368000)));
    return x * xx * (1.0 / 6 + xx * (1.0 / 120 + xx * (1.0 / 5040 + xx * high)));
}
double CoshLess1(double x) {
    const double xx = x * x;
    const double high = 1.0 / 40320 + xx * (1.0 / 3628800 + xx * (1.0 / 479001600 + xx * (1.0 / 87178291200)));
    return xx * (0.5 + xx * (1.0 / 24 + xx * (1.0 / 720 + xx * high)));
}

constexpr double kSeriesEnd = 0.5;

// ---- angles ---------------------------------------------------------------------------------------------------------

// x is n pi / 64 + r. The three parts of pi / 64 are so short that n times the first two is exact.
constexpr int kAngles = 128;  // of the full circle
constexpr double kAngle1 = 0xC90FDAA2p-36;
constexpr double kAngle2 = 0x2168C234p-68;
constexpr double kAngle3 = 0xC4C6628B80DC1p-120;
constexpr double kAnglesPerUnit = 0x1.45F306DC9C883p+4;  // 64 / pi
constexpr double kLargestAngle = 50000;

constexpr Extended SinSeries(Extended x) {
    Extended sum = x;
    Extended term = x;
    for (int n = 2; n < 40; n += 2) {
        term *= -x * x / (static_cast<Extended>(n) * (n + 1));
        sum += term;
    }
    return sum;
}

constexpr std::array<Pair, kAngles> kSines = [] {
    constexpr Extended kAngle = 0xC90FDAA22168C235p-68L;
    constexpr size_t kQuarter = kAngles / 4;
    std::array<Pair, kAngles> sines{};
    for (size_t i = 0; i <= kQuarter; ++i) {
        const Pair sine = Split(SinSeries(static_cast<Extended>(i) * kAngle));
        sines[i] = sines[2 * kQuarter - i] = sine;
        if (i == 0) continue;
        sines[kAngles - i] = sines[2 * kQuarter + i] = {-sine.high, -sine.low};
    }
    return sines;
}();

struct Angle {
    int64 n;
    Pair r;
};

Angle Reduce(double x) {
    constexpr double kRounder = 0x1.8p52;
    const double n = (x * kAnglesPerUnit + kRounder) - kRounder;
    const Pair r = ExactSum(x - n * kAngle1, -n * kAngle2);
    return {static_cast<int64>(n), ExactSumOrdered(r.high, r.low - n * kAngle3)};
}

// sin(a + r) = sin a + cos a sin r + sin a (cos r - 1), a being angle `index` of the table.
Pair SineAt(int64 index, const Pair& r) {
    const Pair& sine = kSines[static_cast<size_t>(index & (kAngles - 1))];
    const Pair& cosine = kSines[static_cast<size_t>((index + kAngles / 4) & (kAngles - 1))];
    const double h = r.high;
    const double hh = h * h;
    const double sineTail = r.low - h * hh * (1.0 / 6 - hh * (1.0 / 120 - hh * (1.0 / 5040 - hh * (1.0 / 362880))));
    const double cosineLess1 = -hh * (0.5 - hh * (1.0 / 24 - hh * (1.0 / 720 - hh * (1.0 / 40320))));
    const Pair product = ExactProduct(cosine.high, h);
    const Pair sum = ExactSum(sine.high, product.high);
    const double rest = sine.low + product.low + (cosine.high * sineTail + cosine.low * h + sine.high * cosineLess1);
    return ExactSumOrdered(sum.high, sum.low + rest);
}

Pair Sine(const Angle& angle) {
    return SineAt(angle.n, angle.r);
}
Pair Cosine(const Angle& angle) {
    return SineAt(angle.n + kAngles / 4, angle.r);
}

// A function of an angle. The extended one serves where the reduction would lose digits: the angle is large, or near a
// multiple of a right angle.
template <class Function, class ExtendedFunction>
double OfAngle(double x, Function function, ExtendedFunction extended) {
    constexpr double kNear = 0x1p-24;
    if (std::fabs(x) <= kLargestAngle) {
        const Angle angle = Reduce(x);
        if (std::fabs(angle.r.high) > kNear || std::fabs(x) < 1) return Rounded(function(angle));
    }
    return static_cast<double>(extended(static_cast<Extended>(x)));
}

constexpr Pair kOne = {1, 0};

}  // namespace

namespace precise {

double Log10(double x) {
    if (!(x > 0) || std::isinf(x)) return std::log10(x);
    const Pair log = Log(x);
    const Pair product = ExactProduct(log.high, kLog10E.high);
    return product.high + (product.low + log.high * kLog10E.low + log.low * kLog10E.high);
}

double Sinh(double x) {
    const double size = std::fabs(x);
    if (size < kSeriesEnd) return x + SinhTail(x);
    if (!(size < kHyperbolicLimit)) return std::sinh(x);
    if (size < kHyperbolicEnd) return std::copysign(Rounded(TwiceSinhCosh<false>(size).sine) / 2, x);
    return std::copysign(Rounded(TwiceSinhCosh<true>(size).sine) * PowerOfTwo(kLowered - 1), x);
}

// The library's is as good but where the power leaves the range before the result does.
double Cosh(double x) {
    const double size = std::fabs(x);
    if (!(size >= kHyperbolicEnd && size < kHyperbolicLimit)) return std::cosh(x);
    return Rounded(TwiceSinhCosh<true>(size).cosine) * PowerOfTwo(kLowered - 1);
}

// The library reduces large angles with too few digits for those near a multiple of a right angle.
constexpr double kLibraryAngle = 0x1p26;

double Sin(double x) {
    return std::fabs(x) < kLibraryAngle ? std::sin(x) : static_cast<double>(std::sin(static_cast<Extended>(x)));
}

double Cos(double x) {
    return std::fabs(x) < kLibraryAngle ? std::cos(x) : static_cast<double>(std::cos(static_cast<Extended>(x)));
}

double Tan(double x) {
    return std::fabs(x) < kLibraryAngle ? std::tan(x) : static_cast<double>(std::tan(static_cast<Extended>(x)));
}

double Tanh(double x) {
    constexpr double kOneFrom = 22;  // 1 - tanh is less than half a unit
    const double size = std::fabs(x);
    if (size < kTiny) return x;
    if (size < kSeriesEnd) {
        return Rounded(Quotient(ExactSumOrdered(x, SinhTail(x)), ExactSumOrdered(1.0, CoshLess1(x))));
    }
    if (!(size < kOneFrom)) return std::tanh(x);
    const Hyperbolic both = TwiceSinhCosh<false>(size);
    return std::copysign(Rounded(Quotient(both.sine, both.cosine)), x);
}

// ln(x + sqrt(x^2 + 1)), by ln(1 + y) with y = x + (sqrt(x^2 + 1) - 1)
double Asinh(double x) {
    const double size = std::fabs(x);
    if (size < kTiny || !std::isfinite(x)) return x;
    if (size > kHuge) return std::copysign(Rounded(Sum(kLn2, Log(size))), x);
    const Pair root = SquareRoot(Sum(Square(size), kOne));
    return std::copysign(Rounded(Log1p(Sum({root.high - 1, root.low}, {size, 0}))), x);
}

// ln(x + sqrt(x^2 - 1)), by ln(1 + t + sqrt(2 t + t^2)) with t = x - 1
double Acosh(double x) {
    if (!(x > 1) || std::isinf(x)) return std::acosh(x);
    if (x > kHuge) return Rounded(Sum(kLn2, Log(x)));
    const double t = x - 1;
    const Pair root = SquareRoot(Sum({2 * t, 0}, Square(t)));
    return Rounded(Log1p(Sum(root, {t, 0})));
}

// ln((1 + x) / (1 - x)) / 2, by ln(1 + y) with y = 2 x / (1 - x)
double Atanh(double x) {
    const double size = std::fabs(x);
    if (size < kTiny) return x;
    if (!(size < 1)) return std::atanh(x);
    return std::copysign(Rounded(Log1p(Quotient({2 * size, 0}, ExactSum(1.0, -size)))) / 2, x);
}

double Sec(double x) {
    return OfAngle(
        x, [](const Angle& angle) { return Quotient(kOne, Cosine(angle)); },
        [](auto wide) { return 1 / std::cos(wide); });
}

double Csc(double x) {
    if (std::fabs(x) < kTiny) return 1 / x;
    return OfAngle(
        x, [](const Angle& angle) { return Quotient(kOne, Sine(angle)); },
        [](auto wide) { return 1 / std::sin(wide); });
}

double Cot(double x) {
    if (std::fabs(x) < kTiny) return 1 / x;
    return OfAngle(
        x, [](const Angle& angle) { return Quotient(Cosine(angle), Sine(angle)); },
        [](auto wide) { return 1 / std::tan(wide); });
}

double Sinc(double x) {
    if (std::fabs(x) < kTiny) return 1;
    return OfAngle(
        x,
        [x](const Angle& angle) {
            return Quotient(Sine(angle), {x, 0});
        },
        [](auto wide) { return std::sin(wide) / wide; });
}

}  // namespace precise
}  // namespace tessel
