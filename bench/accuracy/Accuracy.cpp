// How near the members of the math family come to the exact values: the largest error over random arguments, against
// MPFR and MPC. Prints the table that is docs/accuracy.md, and fails where an error is larger than it may be.
#include "numerics/Extended.h"
#include <tessel/numerics/ComplexMath.h>
#include <tessel/numerics/RealMath.h>

#include <algorithm>
#include <cmath>
#include <cstdio>
#include <mpc.h>
#include <random>
#include <string>
#include <vector>

namespace {

using tessel::Extended;
using tessel::FromExtended;
using tessel::ToExtended;

constexpr int kArguments = 10000;
constexpr mpfr_prec_t kPrecision = 200;

// ---- numbers of a precision -----------------------------------------------------------------------------------------

template <class T>
struct Format;
template <>
struct Format<float> {
    using Complex = cmplx64;
    static constexpr int kBits = 24, kMinExponent = -149, kLargestExponent = 128;
    static float Of(Extended x) { return static_cast<float>(x); }
    static Extended Wide(float x) { return x; }
};
template <>
struct Format<double> {
    using Complex = cmplx128;
    static constexpr int kBits = 53, kMinExponent = -1074, kLargestExponent = 1024;
    static double Of(Extended x) { return static_cast<double>(x); }
    static Extended Wide(double x) { return x; }
};
template <>
struct Format<floatExt> {
    using Complex = cmplxExt;
    static constexpr int kBits = 64, kMinExponent = -16445, kLargestExponent = 16384;
    static floatExt Of(Extended x) { return FromExtended(x); }
    static Extended Wide(const floatExt& x) { return ToExtended(x); }
};

class Real {
public:
    Real() { mpfr_init2(value_, kPrecision); }
    explicit Real(mpfr_prec_t bits) { mpfr_init2(value_, bits); }
    explicit Real(Extended x) : Real() { mpfr_set_ld(value_, x, MPFR_RNDN); }
    Real(const Real&) = delete;
    Real& operator=(const Real&) = delete;
    ~Real() { mpfr_clear(value_); }
    operator mpfr_ptr() { return value_; }

private:
    mpfr_t value_;
};

class Complex {
public:
    explicit Complex(mpfr_prec_t bits = kPrecision) { mpc_init2(value_, bits); }
    Complex(Extended re, Extended im) : Complex() { mpc_set_ld_ld(value_, re, im, MPC_RNDNN); }
    Complex(const Complex&) = delete;
    Complex& operator=(const Complex&) = delete;
    ~Complex() { mpc_clear(value_); }
    operator mpc_ptr() { return value_; }

private:
    mpc_t value_;
};

// The distance of `computed` from the exact value, in units of the last place of a value of the size of `scale`.
template <class T>
double Ulps(Extended computed, mpfr_ptr exact, mpfr_ptr scale) {
    const auto exponent =
        mpfr_zero_p(scale) ? mpfr_exp_t{Format<T>::kMinExponent} : mpfr_get_exp(scale) - Format<T>::kBits;
    if (!std::isfinite(computed)) {
        const bool isOutside = mpfr_get_exp(exact) > Format<T>::kLargestExponent;
        return std::isinf(computed) && isOutside && std::signbit(computed) == (mpfr_sgn(exact) < 0) ? 0 : HUGE_VAL;
    }
    Real difference(computed);
    mpfr_sub(difference, difference, exact, MPFR_RNDN);
    mpfr_mul_2si(difference, difference, -std::max<long>(exponent, Format<T>::kMinExponent), MPFR_RNDN);
    return std::fabs(mpfr_get_d(difference, MPFR_RNDN));
}

// ---- arguments ------------------------------------------------------------------------------------------------------

// Numbers around a centre, at distances of 2^least to 2^most on both sides, within (low, high). kFinite as an exponent
// stands for the end of the format, and `perBinade` bounds |x| by so much for each binade of it: where the results of
// an exponential function end. Half of those arguments lie evenly up to the bound.
constexpr int kFinite = 1 << 20;
struct Range {
    double centre = 0;
    int least = -20;
    int most = 20;
    double low = -HUGE_VAL;
    double high = HUGE_VAL;
    Extended perBinade = 0;
};

// From 1 to the largest value or to the smallest, whichever are more.
template <class T>
Extended Binades() {
    return 2 - Format<T>::kMinExponent;
}

template <class T>
Extended Draw(std::mt19937_64& random, const Range& range) {
    constexpr int kLargest = Format<T>::kLargestExponent;
    constexpr int kUsual = 20;
    for (;;) {
        const bool isUsual = random() % 2 == 0;  // where functions bend; else anywhere
        const int least = std::max(range.least, isUsual ? -kUsual : Format<T>::kMinExponent);
        const int most = std::min(range.most, isUsual ? kUsual : kLargest);
        const auto mantissa = static_cast<Extended>(random() | (uint64{1} << 63));
        const int exponent = least + static_cast<int>(random() % static_cast<uint64>(most - least));
        Extended distance = std::scalbn(mantissa, exponent - 63);
        if (range.perBinade != 0 && random() % 2 == 0) {
            distance = std::scalbn(mantissa - 0x1p63L, -62) * range.perBinade * Binades<T>() / 2;
        }
        const Extended x = range.centre + (random() % 2 == 0 ? distance : -distance);
        const bool inBounds = range.perBinade == 0 || std::fabs(x) < range.perBinade * Binades<T>();
        if (x > range.low && x < range.high && inBounds) return x;
    }
}

// The range as the table has it.
std::string Text(const Range& range) {
    char text[96];
    const bool narrow = range.most < kFinite;
    if (range.perBinade != 0) return "until the result leaves the range";
    if (range.centre != 0 && narrow) {
        std::snprintf(text, sizeof text, "%g ± 2^%d to 2^%d", range.centre, range.least, range.most);
    } else if (range.high < HUGE_VAL) {
        std::snprintf(text, sizeof text, "%g to %g", range.low, range.high);
    } else if (narrow) {
        std::snprintf(text, sizeof text, "%s2^%d to 2^%d", range.low == 0 ? "" : "±", range.least, range.most);
    } else if (range.low > -HUGE_VAL) {
        std::snprintf(text, sizeof text, "all above %g", range.low);
    } else {
        return "all";
    }
    return text;
}

// ---- the table ------------------------------------------------------------------------------------------------------

struct Row {
    std::string name;
    double single, real, extended;
    std::string arguments;
};
std::vector<Row> realRows;
std::vector<Row> complexRows;

void Print(const std::vector<Row>& rows) {
    std::puts("| member | arguments | single | double | extended |\n|---|---|---|---|---|");
    for (const Row& row : rows) {
        std::printf("| %s | %s | %.2f | %.2f | %.2f |\n", row.name.c_str(), row.arguments.c_str(), row.single, row.real,
                    row.extended);
    }
}

void PrintAll() {
    std::printf(
        "# Accuracy of the math family\n\n"
        "The largest error in units in the last place over %d random arguments each, measured\nagainst MPFR and MPC at "
        "%d bits on x86-64 with the C library of the build. 0.50 is correct rounding. Made by\n"
        "`./dev accuracy`; members that are exact or round once by definition are left out.\n\n## Real\n\n",
        kArguments, static_cast<int>(kPrecision));
    Print(realRows);
    std::puts(
        "\n## Complex\n\nThe larger error of the two parts. A part below a thousandth of the magnitude, which comes\n"
        "about by cancellation, is measured as if it were that large; an extended one, for which there is nothing\n"
        "wider to compute in, in units of the magnitude. Powers lose as many digits as y ln x has before the\n"
        "point, and the arctangent of a quotient near i, where it has its pole, as the quotient loses there.\n");
    Print(complexRows);
}

// Bounds for the three precisions.
struct Bounds {
    double single, real, extended;
};

bool areAllWithin = true;

void ExpectWithin(std::vector<Row>& rows, const Row& row, const Bounds& bounds) {
    rows.push_back(row);
    if (row.single <= bounds.single && row.real <= bounds.real && row.extended <= bounds.extended) return;
    std::fprintf(stderr, "%s is less accurate than %g, %g, %g\n", row.name.c_str(), bounds.single, bounds.real,
                 bounds.extended);
    areAllWithin = false;
}

#define ALL(NAME) "`" #NAME "`", NAME##S, NAME##D, NAME##X
#define NEAR_ONE(NAME) "`" #NAME "` near 1", NAME##S, NAME##D, NAME##X

// ---- real members ---------------------------------------------------------------------------------------------------

using RealReference = int (*)(mpfr_ptr, mpfr_srcptr, mpfr_rnd_t);
using RealReference2 = int (*)(mpfr_ptr, mpfr_srcptr, mpfr_srcptr, mpfr_rnd_t);

int Sinc(mpfr_ptr result, mpfr_srcptr x, mpfr_rnd_t mode) {
    Real sine;
    mpfr_sin(sine, x, mode);
    return mpfr_div(result, sine, x, mode);
}

int Recip(mpfr_ptr result, mpfr_srcptr x, mpfr_rnd_t mode) {
    return mpfr_ui_div(result, 1, x, mode);
}

int Logx(mpfr_ptr result, mpfr_srcptr base, mpfr_srcptr x, mpfr_rnd_t mode) {
    Real below;
    mpfr_log(below, base, mode);
    mpfr_log(result, x, mode);
    return mpfr_div(result, result, below, mode);
}

int Atan2(mpfr_ptr result, mpfr_srcptr x, mpfr_srcptr y, mpfr_rnd_t mode) {
    return mpfr_atan2(result, y, x, mode);
}

template <class T>
double Largest(void (*function)(const T*, T*), RealReference reference, const Range& range) {
    std::mt19937_64 random(51);
    double largest = 0;
    for (int i = 0; i < kArguments; ++i) {
        const T x = Format<T>::Of(Draw<T>(random, range));
        T computed;
        function(&x, &computed);
        Real argument(Format<T>::Wide(x));
        Real exact;
        reference(exact, argument, MPFR_RNDN);
        largest = std::max(largest, Ulps<T>(Format<T>::Wide(computed), exact, exact));
    }
    return largest;
}

template <class T>
double Largest(void (*function)(const T*, const T*, T*), RealReference2 reference, const Range& xs, const Range& ys) {
    std::mt19937_64 random(52);
    double largest = 0;
    for (int i = 0; i < kArguments; ++i) {
        const T x = Format<T>::Of(Draw<T>(random, xs));
        const T y = Format<T>::Of(Draw<T>(random, ys));
        T computed;
        function(&x, &y, &computed);
        Real first(Format<T>::Wide(x));
        Real second(Format<T>::Wide(y));
        Real exact;
        reference(exact, first, second, MPFR_RNDN);
        largest = std::max(largest, Ulps<T>(Format<T>::Wide(computed), exact, exact));
    }
    return largest;
}

void MeasureRealMembers() {
    constexpr Range kAll{.least = -kFinite, .most = kFinite};
    constexpr Range kPositive{.least = -kFinite, .most = kFinite, .low = 0};
    constexpr Range kNearOne{.centre = 1, .least = -20, .most = 3, .low = 0};
    constexpr Range kExponents{.least = -kFinite, .most = kFinite, .perBinade = 0.69314718055994530942L};
    constexpr Range kUnit{.least = -kFinite, .most = 0, .low = -1, .high = 1};
    const struct {
        const char* name;
        void (*single)(const float*, float*);
        void (*real)(const double*, double*);
        void (*extended)(const floatExt*, floatExt*);
        RealReference reference;
        Range range;
        Bounds bounds;
    } members[] = {
        {ALL(RTfRecip), Recip, kPositive, {0.5, 0.5, 0.5}},
        {ALL(RTfSqrt), mpfr_sqrt, kPositive, {0.5, 0.5, 0.5}},
        {ALL(RTfLogn), mpfr_log, kPositive, {1, 1, 1}},
        {NEAR_ONE(RTfLogn), mpfr_log, kNearOne, {1, 1, 1}},
        {ALL(RTfLog10), mpfr_log10, kPositive, {1, 1, 1.5}},
        {NEAR_ONE(RTfLog10), mpfr_log10, kNearOne, {1, 1, 1.5}},
        {ALL(RTfLog2), mpfr_log2, kPositive, {1, 1, 1}},
        {NEAR_ONE(RTfLog2), mpfr_log2, kNearOne, {1, 1, 1}},
        {ALL(RTfLognp1), mpfr_log1p, {.least = -kFinite, .most = kFinite, .low = -1}, {1, 1, 2.5}},
        {ALL(RTfExp), mpfr_exp, kExponents, {1, 1, 1.5}},
        {ALL(RTfExpm1), mpfr_expm1, kExponents, {1, 1, 2.5}},
        {ALL(RTfPow10),
         mpfr_exp10,
         {.least = -kFinite, .most = kFinite, .perBinade = 0.30102999566398119521L},
         {1, 1, 1}},
        {ALL(RTfPow2), mpfr_exp2, {.least = -kFinite, .most = kFinite, .perBinade = 1}, {1, 1, 1}},
        {ALL(RTfSin), mpfr_sin, kAll, {1, 1, 1}},
        {ALL(RTfCos), mpfr_cos, kAll, {1, 1, 1}},
        {ALL(RTfTan), mpfr_tan, kAll, {1, 1, 1.5}},
        {ALL(RTfSec), mpfr_sec, kAll, {1, 1, 2.5}},
        {ALL(RTfCsc), mpfr_csc, kAll, {1, 1, 2.5}},
        {ALL(RTfCot), mpfr_cot, kAll, {1, 1, 2.5}},
        {ALL(RTfSinc), Sinc, kAll, {1, 1, 2.5}},
        {ALL(RTfAsin), mpfr_asin, kUnit, {1, 1, 1}},
        {ALL(RTfAcos), mpfr_acos, kUnit, {1, 1, 1.5}},
        {ALL(RTfAtan), mpfr_atan, kAll, {1, 1, 1}},
        {ALL(RTfSinh), mpfr_sinh, kExponents, {1, 1, 2.5}},
        {ALL(RTfCosh), mpfr_cosh, kExponents, {1, 1, 2.5}},
        {ALL(RTfTanh), mpfr_tanh, kAll, {1, 1, 2.5}},
        {ALL(RTfAsinh), mpfr_asinh, kAll, {1, 1, 2.5}},
        {ALL(RTfAcosh), mpfr_acosh, {.centre = 1, .least = -60, .most = kFinite, .low = 1}, {1, 1, 2.5}},
        {ALL(RTfAtanh), mpfr_atanh, kUnit, {1, 1, 2.5}},
    };
    for (const auto& m : members) {
        const Row row{m.name, Largest<float>(m.single, m.reference, m.range),
                      Largest<double>(m.real, m.reference, m.range),
                      Largest<floatExt>(m.extended, m.reference, m.range), Text(m.range)};
        ExpectWithin(realRows, row, m.bounds);
    }
    const struct {
        const char* name;
        void (*single)(const float*, const float*, float*);
        void (*real)(const double*, const double*, double*);
        void (*extended)(const floatExt*, const floatExt*, floatExt*);
        RealReference2 reference;
        Range x, y;
        Bounds bounds;
    } pairs[] = {
        {ALL(RTfLogx), Logx, kPositive, kPositive, {1, 1, 3}},
        {ALL(RTfPowx), mpfr_pow, {.least = -10, .most = 10, .low = 0}, {.most = 3}, {1, 1, 1}},
        {ALL(RTfAtan2), Atan2, kAll, kAll, {1, 1, 1}},
    };
    for (const auto& m : pairs) {
        const Row row{m.name, Largest<float>(m.single, m.reference, m.x, m.y),
                      Largest<double>(m.real, m.reference, m.x, m.y),
                      Largest<floatExt>(m.extended, m.reference, m.x, m.y), Text(m.x) + "; " + Text(m.y)};
        ExpectWithin(realRows, row, m.bounds);
    }
}

// ---- complex members ------------------------------------------------------------------------------------------------

using ComplexReference = int (*)(mpc_ptr, mpc_srcptr, mpc_rnd_t);
using ComplexReference2 = int (*)(mpc_ptr, mpc_srcptr, mpc_srcptr, mpc_rnd_t);

int ComplexRecip(mpc_ptr result, mpc_srcptr z, mpc_rnd_t mode) {
    return mpc_ui_div(result, 1, z, mode);
}

template <ComplexReference kFunction>
int RecipOf(mpc_ptr result, mpc_srcptr z, mpc_rnd_t mode) {
    kFunction(result, z, mode);
    return mpc_ui_div(result, 1, result, mode);
}

int ComplexSinc(mpc_ptr result, mpc_srcptr z, mpc_rnd_t mode) {
    mpc_sin(result, z, mode);
    return mpc_div(result, result, z, mode);
}

int ComplexSign(mpc_ptr result, mpc_srcptr z, mpc_rnd_t mode) {
    Real magnitude;
    mpc_abs(magnitude, z, MPFR_RNDN);
    return mpc_div_fr(result, z, magnitude, mode);
}

int ComplexLognp1(mpc_ptr result, mpc_srcptr z, mpc_rnd_t mode) {
    mpc_add_ui(result, z, 1, mode);
    return mpc_log(result, result, mode);
}

int ComplexExpm1(mpc_ptr result, mpc_srcptr z, mpc_rnd_t mode) {
    mpc_exp(result, z, mode);
    return mpc_sub_ui(result, result, 1, mode);
}

int ComplexLog2(mpc_ptr result, mpc_srcptr z, mpc_rnd_t mode) {
    Real ln2;
    mpfr_const_log2(ln2, MPFR_RNDN);
    mpc_log(result, z, mode);
    return mpc_div_fr(result, result, ln2, mode);
}

// With as many bits as the largest exponent moves away from the point.
template <int kBase>
int PowerOf(mpc_ptr result, mpc_srcptr z, mpc_rnd_t mode) {
    static Real ln(mpfr_prec_t{17000});
    static const int made = mpfr_log_ui(ln, kBase, MPFR_RNDN);
    static_cast<void>(made);
    Complex product(mpfr_prec_t{17000});
    mpc_mul_fr(product, z, ln, mode);
    return mpc_exp(result, product, mode);
}

int ToPolar(mpc_ptr result, mpc_srcptr z, mpc_rnd_t) {
    Real magnitude;
    Real angle;
    mpc_abs(magnitude, z, MPFR_RNDN);
    mpc_arg(angle, z, MPFR_RNDN);
    return mpc_set_fr_fr(result, magnitude, angle, MPC_RNDNN);
}

int ComplexLogx(mpc_ptr result, mpc_srcptr base, mpc_srcptr z, mpc_rnd_t mode) {
    Complex below;
    mpc_log(below, base, mode);
    mpc_log(result, z, mode);
    return mpc_div(result, result, below, mode);
}

int ComplexAtan2(mpc_ptr result, mpc_srcptr x, mpc_srcptr y, mpc_rnd_t mode) {
    mpc_div(result, y, x, mode);
    return mpc_atan(result, result, mode);
}

// The larger error of the two parts. There is nothing wider to compute extended values in, so that theirs is measured
// against the magnitude.
template <class T>
constexpr unsigned long kSmallestPart = Format<T>::kBits < 64 ? 1000 : 1;

template <class T>
double Ulps(const typename Format<T>::Complex& computed, mpc_ptr exact) {
    Real floor;
    mpc_abs(floor, exact, MPFR_RNDN);
    mpfr_div_ui(floor, floor, kSmallestPart<T>, MPFR_RNDN);
    double largest = 0;
    const auto measure = [&](Extended part, mpfr_ptr exactPart) {
        mpfr_ptr const scale = mpfr_cmpabs(exactPart, floor) < 0 ? static_cast<mpfr_ptr>(floor) : exactPart;
        largest = std::max(largest, Ulps<T>(part, exactPart, scale));
    };
    measure(Format<T>::Wide(computed.re), mpc_realref(exact));
    measure(Format<T>::Wide(computed.im), mpc_imagref(exact));
    return largest;
}

template <class T>
typename Format<T>::Complex DrawComplex(std::mt19937_64& random, const Range& range, const Range& imaginary) {
    const Extended re = Draw<T>(random, range);
    return {Format<T>::Of(re), Format<T>::Of(Draw<T>(random, imaginary))};
}

template <class T, class Z = typename Format<T>::Complex>
double LargestComplex(void (*function)(const Z*, Z*), ComplexReference reference, const Range& range,
                      const Range& imaginary) {
    std::mt19937_64 random(53);
    double largest = 0;
    for (int i = 0; i < kArguments; ++i) {
        const Z z = DrawComplex<T>(random, range, imaginary);
        Z computed;
        function(&z, &computed);
        Complex argument(Format<T>::Wide(z.re), Format<T>::Wide(z.im));
        Complex exact;
        reference(exact, argument, MPC_RNDNN);
        largest = std::max(largest, Ulps<T>(computed, exact));
    }
    return largest;
}

template <class T, class Z = typename Format<T>::Complex>
double LargestComplex(void (*function)(const Z*, const Z*, Z*), ComplexReference2 reference, const Range& range) {
    std::mt19937_64 random(54);
    double largest = 0;
    for (int i = 0; i < kArguments; ++i) {
        const Z x = DrawComplex<T>(random, range, range);
        const Z y = DrawComplex<T>(random, range, range);
        Z computed;
        function(&x, &y, &computed);
        Complex first(Format<T>::Wide(x.re), Format<T>::Wide(x.im));
        Complex second(Format<T>::Wide(y.re), Format<T>::Wide(y.im));
        Complex exact;
        reference(exact, first, second, MPC_RNDNN);
        largest = std::max(largest, Ulps<T>(computed, exact));
    }
    return largest;
}

void MeasureComplexMembers() {
    constexpr Range kPlane{.least = -10, .most = 10};
    constexpr Range kExponents{.least = -10, .most = 6, .low = -30, .high = 30};
    constexpr Range kAll{.least = -kFinite, .most = kFinite};
    constexpr Bounds kUsual{1, 1, 6.5};
    const struct {
        const char* name;
        void (*single)(const cmplx64*, cmplx64*);
        void (*real)(const cmplx128*, cmplx128*);
        void (*extended)(const cmplxExt*, cmplxExt*);
        ComplexReference reference;
        Range range;
        Bounds bounds;
        Range imaginary = range;
    } members[] = {
        {ALL(RTcRecip), ComplexRecip, kPlane, kUsual},
        {ALL(RTcSign), ComplexSign, kPlane, kUsual},
        {ALL(RTcSqrt), mpc_sqrt, kPlane, kUsual},
        {ALL(RTcRToP), ToPolar, kPlane, kUsual},
        {ALL(RTcLogn), mpc_log, kPlane, kUsual},
        {ALL(RTcLog10), mpc_log10, kPlane, kUsual},
        {ALL(RTcLog2), ComplexLog2, kPlane, kUsual},
        {ALL(RTcLognp1), ComplexLognp1, {.least = -30, .most = 10}, kUsual},
        {ALL(RTcExp), mpc_exp, kExponents, kUsual},
        {ALL(RTcExpm1), ComplexExpm1, {.least = -30, .most = 6, .low = -30, .high = 30}, kUsual},
        {ALL(RTcPow10), PowerOf<10>, {.least = -10, .most = 6, .low = -15, .high = 15}, kUsual, kAll},
        {ALL(RTcPow2), PowerOf<2>, kExponents, kUsual, kAll},
        {ALL(RTcSin), mpc_sin, kExponents, kUsual},
        {ALL(RTcCos), mpc_cos, kExponents, kUsual},
        {ALL(RTcTan), mpc_tan, kExponents, kUsual},
        {ALL(RTcSec), RecipOf<mpc_cos>, kExponents, kUsual},
        {ALL(RTcCsc), RecipOf<mpc_sin>, kExponents, kUsual},
        {ALL(RTcCot), RecipOf<mpc_tan>, kExponents, kUsual},
        {ALL(RTcSinc), ComplexSinc, kExponents, kUsual},
        {ALL(RTcAsin), mpc_asin, kPlane, kUsual},
        {ALL(RTcAcos), mpc_acos, kPlane, kUsual},
        {ALL(RTcAtan), mpc_atan, kPlane, kUsual},
        {ALL(RTcSinh), mpc_sinh, kExponents, kUsual},
        {ALL(RTcCosh), mpc_cosh, kExponents, kUsual},
        {ALL(RTcTanh), mpc_tanh, kExponents, kUsual},
        {ALL(RTcAsinh), mpc_asinh, kPlane, kUsual},
        {ALL(RTcAcosh), mpc_acosh, kPlane, kUsual},
        {ALL(RTcAtanh), mpc_atanh, kPlane, kUsual},
    };
    for (const auto& m : members) {
        const Row row{m.name, LargestComplex<float>(m.single, m.reference, m.range, m.imaginary),
                      LargestComplex<double>(m.real, m.reference, m.range, m.imaginary),
                      LargestComplex<floatExt>(m.extended, m.reference, m.range, m.imaginary),
                      "parts " + Text(m.range) + (m.imaginary.most == m.range.most ? "" : "; " + Text(m.imaginary))};
        ExpectWithin(complexRows, row, m.bounds);
    }
    const struct {
        const char* name;
        void (*single)(const cmplx64*, const cmplx64*, cmplx64*);
        void (*real)(const cmplx128*, const cmplx128*, cmplx128*);
        void (*extended)(const cmplxExt*, const cmplxExt*, cmplxExt*);
        ComplexReference2 reference;
        Range range;
        Bounds bounds;
    } pairs[] = {
        {ALL(RTcMul), mpc_mul, kPlane, kUsual},
        {ALL(RTcDiv), mpc_div, kPlane, kUsual},
        {ALL(RTcLogx), ComplexLogx, kPlane, kUsual},
        {ALL(RTcPowx), mpc_pow, {.least = -5, .most = 3}, {1, 20, 50}},
        {ALL(RTcAtan2), ComplexAtan2, kPlane, {1, 1, 80}},
    };
    for (const auto& m : pairs) {
        const Row row{m.name, LargestComplex<float>(m.single, m.reference, m.range),
                      LargestComplex<double>(m.real, m.reference, m.range),
                      LargestComplex<floatExt>(m.extended, m.reference, m.range), "parts " + Text(m.range)};
        ExpectWithin(complexRows, row, m.bounds);
    }
}

}  // namespace

int main() {
    MeasureRealMembers();
    MeasureComplexMembers();
    PrintAll();
    return areAllWithin ? 0 : 1;
}
