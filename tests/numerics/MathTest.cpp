// The conventions of the math family: where values are special, halves, missing results. How near the results are to
// the exact ones is measured in MathAccuracyTest.cpp.
#include "numerics/Extended.h"
#include "support/Test.h"
#include <tessel/numerics/ComplexMath.h>
#include <tessel/numerics/FloatingPointConstants.h>
#include <tessel/numerics/IntegerMath.h>
#include <tessel/numerics/RealMath.h>

#include <cmath>
#include <limits>
#include <ostream>

namespace {

using tessel::Extended;
using tessel::FromExtended;
using tessel::ToExtended;

constexpr double kInf = std::numeric_limits<double>::infinity();
constexpr double kNaN = std::numeric_limits<double>::quiet_NaN();
constexpr double kPi = 3.14159265358979323846;

bool Same(double a, double b) {
    return std::isnan(a) ? std::isnan(b) : a == b && std::signbit(a) == std::signbit(b);
}

#define ALL(NAME) #NAME, NAME##S, NAME##D, NAME##X

using UnaryS = void (*)(const float*, float*);
using UnaryD = void (*)(const double*, double*);
using UnaryX = void (*)(const floatExt*, floatExt*);
using BinaryS = void (*)(const float*, const float*, float*);
using BinaryD = void (*)(const double*, const double*, double*);
using BinaryX = void (*)(const floatExt*, const floatExt*, floatExt*);

struct UnaryCase {
    const char* name;
    UnaryS single;
    UnaryD real;
    UnaryX extended;
    std::vector<std::pair<double, double>> values;  // an argument and its result, representable in a single
};

TEST(RealMath, SpecialValuesInEveryPrecision) {
    const UnaryCase cases[] = {
        {ALL(RTfAbs), {{-2.5, 2.5}}},
        {ALL(RTfNeg), {{0.0, -0.0}}},
        {ALL(RTfSqrt), {{6.25, 2.5}, {-1, kNaN}}},
        {ALL(RTfRound), {{2.5, 2}, {3.5, 4}, {-2.5, -2}}},
        {ALL(RTfCeil), {{-2.5, -2}}},
        {ALL(RTfFloor), {{-2.5, -3}}},
        {ALL(RTfInc), {{-2.5, -1.5}}},
        {ALL(RTfDec), {{-2.5, -3.5}}},
        {ALL(RTfRecip), {{-0.0, -kInf}}},
        {ALL(RTfSign), {{-3, -1}, {0, 0}, {kInf, 1}, {kNaN, kNaN}}},
        {ALL(RTfLogn), {{1, 0}, {0, -kInf}, {-0.0, -kInf}, {-1, kNaN}, {kNaN, kNaN}, {kInf, kInf}}},
        {ALL(RTfLog10), {{1000, 3}, {0, -kInf}, {-kInf, kNaN}}},
        {ALL(RTfLog2), {{0.125, -3}, {0, -kInf}}},
        {ALL(RTfLognp1), {{-1, -kInf}, {-1.5, kNaN}, {0, 0}}},
        {ALL(RTfExp), {{-kInf, 0}}},
        {ALL(RTfExpm1), {{-kInf, -1}}},
        {ALL(RTfPow10), {{3, 1000}, {5000, kInf}}},
        {ALL(RTfPow2), {{-3, 0.125}}},
        {ALL(RTfSin), {{kInf, kNaN}}},
        {ALL(RTfSec), {{0, 1}}},
        {ALL(RTfCsc), {{0, kInf}}},
        {ALL(RTfCot), {{-0.0, -kInf}}},
        {ALL(RTfSinc), {{0, 1}}},
        {ALL(RTfAsin), {{2, kNaN}}},
        {ALL(RTfAcos), {{1, 0}}},
        {ALL(RTfTanh), {{-kInf, -1}}},
        {ALL(RTfAcosh), {{0.5, kNaN}}},
        {ALL(RTfAtanh), {{1, kInf}}},
    };
    for (const UnaryCase& c : cases) {
        for (const auto& [argument, result] : c.values) {
            const auto x = static_cast<float>(argument);
            const floatExt extendedX = FromExtended(argument);
            float single = 99;
            double real = 99;
            floatExt extended{};
            c.single(&x, &single);
            c.real(&argument, &real);
            c.extended(&extendedX, &extended);
            EXPECT_TRUE(Same(single, result)) << c.name << "S of " << argument << ": " << single;
            EXPECT_TRUE(Same(real, result)) << c.name << "D of " << argument << ": " << real;
            EXPECT_TRUE(Same(static_cast<double>(ToExtended(extended)), result)) << c.name << "X of " << argument;
        }
    }
}

struct BinaryCase {
    const char* name;
    BinaryS single;
    BinaryD real;
    BinaryX extended;
    double x;
    double y;
    double result;
};

TEST(RealMath, TwoOperandsInEveryPrecision) {
    const BinaryCase cases[] = {
        {ALL(RTfAdd), 1.5, 2, 3.5},       {ALL(RTfSub), 1.5, 2, -0.5},   {ALL(RTfMul), 1.5, -2, -3},
        {ALL(RTfDiv), 1.5, 0, kInf},      {ALL(RTfMod), -7, 3, 2},       {ALL(RTfMod), 7, -3, -2},
        {ALL(RTfMod), 6, -3, 0.0},        {ALL(RTfMod), -6, 3, 0.0},     {ALL(RTfMod), 6, 0, kNaN},
        {ALL(RTfMod), 5, kInf, kNaN},     {ALL(RTfMod), 16777216, 3, 1}, {ALL(RTfLogx), 2, 8, 3},
        {ALL(RTfLogx), 10, 1000, 3},      {ALL(RTfLogx), 10, 0, -kInf},  {ALL(RTfLogx), 10, -1, kNaN},
        {ALL(RTfPowx), -2, 3, -8},        {ALL(RTfPowx), -2, 0.5, kNaN}, {ALL(RTfAtan2), 1, 0, 0},
        {ALL(RTfAtan2), 1, -0.0, -0.0},   {ALL(RTfiScale), 3, 2.9, 12},  {ALL(RTfiScale), 3, -1.9, 1.5},
        {ALL(RTfiScale), -3, 1e9, -kInf}, {ALL(RTfiScale), 3, -kInf, 0}, {ALL(RTfiScale), 3, kNaN, kNaN},
    };
    for (const BinaryCase& c : cases) {
        const auto x = static_cast<float>(c.x);
        const auto y = static_cast<float>(c.y);
        const floatExt extendedX = FromExtended(c.x);
        const floatExt extendedY = FromExtended(c.y);
        float single = 99;
        double real = c.y;
        floatExt extended{};
        c.single(&x, &y, &single);
        c.real(&c.x, &real, &real);  // over an operand
        c.extended(&extendedX, &extendedY, &extended);
        EXPECT_TRUE(Same(single, c.result)) << c.name << "S of " << c.x << ", " << c.y << ": " << single;
        EXPECT_TRUE(Same(real, c.result)) << c.name << "D of " << c.x << ", " << c.y << ": " << real;
        EXPECT_TRUE(Same(static_cast<double>(ToExtended(extended)), c.result)) << c.name << "X";
    }
    const double x = -1;
    const double y = 0;
    double angle = 0;
    RTfAtan2D(&x, &y, &angle);
    EXPECT_EQ(angle, kPi);
}

TEST(RealMath, NaNsOfThePrecisions) {
    const double minusOne = -1;
    double real = 0;
    RTfLognD(&minusOne, &real);
    uint64 bits = 0;
    std::memcpy(&bits, &real, sizeof bits);
    EXPECT_EQ(bits, ~uint64{0});
    const floatExt extended = FromExtended(-1);
    floatExt result;
    RTfLognX(&extended, &result);
    EXPECT_EQ(std::memcmp(&result, ENaN(), sizeof result), 0);
}

TEST(RealMath, RemainderExistsInTwoPrecisions) {
    const double x = -7;
    const double y = 3;
    double result = 0;
    RTfRemD(&x, &y, &result);
    EXPECT_EQ(result, -1);
    const float sx = 7.5f;
    const float sy = -2;
    float single = 0;
    RTfRemS(&sx, &sy, &single);
    EXPECT_EQ(single, 1.5f);
    tessel::test::ReportRecorder reports;
    floatExt extended{};
    RTfRemX(EOne(), EOne(), &extended);
    EXPECT_EACH(reports.Has(4, "RTfRemX not implemented on this platform"), std::isnan(ToExtended(extended)));
}

TEST(RealMath, TwoResultsEitherOfWhichMayBeNull) {
    const struct {
        void (*function)(const double*, const double*, double*, double*);
        double x, y, first, second;
    } cases[] = {
        {RTfQRemD, -7, 3, -3, 2},
        {RTfQRemD, -6, 3, -2, 0.0},
        {RTfQRemD, -0.0, 3, -0.0, 0.0},
        {RTfQRemD, 7, -3, -3, -2},
        {RTfQRemD, 1, 0, kInf, kNaN},
        {RTfQRemD, 5, kInf, 0, kNaN},  // as the formula has it
        {RTfMaxMinD, 1, 2, 2, 1},
        {RTfMaxMinD, 2, 1, 2, 1},
        {RTfMaxMinD, kNaN, 1, kNaN, kNaN},
        {RTfMaxMinD, 1, kNaN, kNaN, kNaN},
        {RTfMaxMinD, -0.0, 0.0, -0.0, -0.0},
    };
    for (const auto& c : cases) {
        double first = 99;
        double second = 99;
        c.function(&c.x, &c.y, &first, nullptr);
        c.function(&c.x, &c.y, nullptr, &second);
        EXPECT_TRUE(Same(first, c.first)) << c.x << ", " << c.y << ": " << first;
        EXPECT_TRUE(Same(second, c.second)) << c.x << ", " << c.y << ": " << second;
    }
    const double parts[][3] = {{-40, -1.25, 5},       {0, 0, 0},          {1, 1, 0},
                               {0x1p-1074, 1, -1074}, {kInf, kInf, kInf}, {kNaN, kNaN, kNaN}};
    for (const auto& c : parts) {
        double mantissa = 99;
        double exponent = 99;
        RTfGetMantExpD(c, &mantissa, nullptr);
        RTfGetMantExpD(c, nullptr, &exponent);
        EXPECT_TRUE(Same(mantissa, c[1])) << c[0];
        EXPECT_TRUE(Same(exponent, c[2])) << c[0];
    }
    const floatExt x = FromExtended(0x1.8p-16400L);
    floatExt mantissa;
    floatExt exponent;
    RTfGetMantExpX(&x, &mantissa, &exponent);
    EXPECT_EACH(ToExtended(mantissa) == 1.5L, ToExtended(exponent) == -16400);
    const float zero = 0;
    float sine = 9;
    float cosine = 9;
    RTfSinCosS(&zero, &sine, nullptr);
    RTfSinCosS(&zero, nullptr, &cosine);
    EXPECT_EACH(sine == 0, cosine == 1);
}

TEST(RealMath, Predicates) {
    const double values[] = {-1, 0, 1, kNaN};
    const int expected[4][7] = {
        {0, 0, 1, 0, 1, 0, 1}, {0, 1, 0, 1, 1, 0, 0}, {0, 0, 1, 1, 0, 1, 0}, {1, 0, 1, 0, 0, 0, 0}};
    for (int i = 0; i < 4; ++i) {
        const double d = values[i];
        const auto s = static_cast<float>(d);
        const floatExt x = FromExtended(d);
        const int32 results[3][7] = {
            {RTfIsNanS(&s), RTfEQ0S(&s), RTfNE0S(&s), RTfGE0S(&s), RTfLE0S(&s), RTfGT0S(&s), RTfLT0S(&s)},
            {RTfIsNanD(&d), RTfEQ0D(&d), RTfNE0D(&d), RTfGE0D(&d), RTfLE0D(&d), RTfGT0D(&d), RTfLT0D(&d)},
            {RTfIsNanX(&x), RTfEQ0X(&x), RTfNE0X(&x), RTfGE0X(&x), RTfLE0X(&x), RTfGT0X(&x), RTfLT0X(&x)}};
        for (const auto& row : results) {
            for (int k = 0; k < 7; ++k) EXPECT_EQ(row[k], expected[i][k]) << d << ", predicate " << k;
        }
    }
    const struct {
        double x, y;
        int eq, ne, ge, le, gt, lt;
    } pairs[] = {
        {1, 2, 0, 1, 0, 1, 0, 1}, {2, 1, 0, 1, 1, 0, 1, 0}, {2, 2, 1, 0, 1, 1, 0, 0}, {kNaN, kNaN, 0, 1, 0, 0, 0, 0}};
    for (const auto& c : pairs) {
        EXPECT_EACH(RTfEQD(&c.x, &c.y) == c.eq, RTfNED(&c.x, &c.y) == c.ne, RTfGED(&c.x, &c.y) == c.ge,
                    RTfLED(&c.x, &c.y) == c.le, RTfGTD(&c.x, &c.y) == c.gt, RTfLTD(&c.x, &c.y) == c.lt);
    }
}

// ---- complex --------------------------------------------------------------------------------------------------------

using ComplexUnary = void (*)(const cmplx128*, cmplx128*);
using ComplexBinary = void (*)(const cmplx128*, const cmplx128*, cmplx128*);

void ExpectSame(const char* name, const cmplx128& z, const cmplx128& result, const cmplx128& expected) {
    EXPECT_TRUE(Same(result.re, expected.re) && Same(result.im, expected.im))
        << name << " of " << z.re << ", " << z.im << ": " << result.re << ", " << result.im;
}

TEST(ComplexMath, EdgesAndBranchCuts) {
    const struct {
        const char* name;
        ComplexUnary function;
        std::vector<std::pair<cmplx128, cmplx128>> values;
    } cases[] = {
        {"neg", RTcNegD, {{{1, -2}, {-1, 2}}}},
        {"conj", RTcConjD, {{{1, 0.0}, {1, -0.0}}}},
        {"inc", RTcIncD, {{{1, -2}, {2, -2}}}},
        {"dec", RTcDecD, {{{1, -2}, {0, -2}}}},
        {"round", RTcRoundD, {{{2.5, -3.5}, {2, -4}}}},
        {"ceil", RTcCeilD, {{{2.5, -3.5}, {3, -3}}}},
        {"floor", RTcFloorD, {{{2.5, -3.5}, {2, -4}}}},
        {"recip",
         RTcRecipD,
         {{{0, -2}, {0, 0.5}},
          {{0, 0}, {kInf, -0.0}},
          {{-kInf, 1}, {-0.0, -0.0}},
          {{0x1p-1023, 0x1p-1023}, {0x1p1022, -0x1p1022}}}},
        {"sign", RTcSignD, {{{0, 0}, {0, 0}}, {{3, -4}, {0.6, -0.8}}, {{-kInf, 7}, {-1, 0}}}},
        {"sqrt", RTcSqrtD, {{{-4, 0.0}, {0, 2}}, {{-4, -0.0}, {0, -2}}, {{3e300, 4e300}, {2e150, 1e150}}}},
        {"logn", RTcLognD, {{{0, 0}, {-kInf, 0}}, {{-1, 0.0}, {0, kPi}}, {{-1, -0.0}, {0, -kPi}}}},
        {"log10", RTcLog10D, {{{1000, 0}, {3, 0}}}},
        {"log2", RTcLog2D, {{{0.125, 0}, {-3, 0}}}},
        {"lognp1", RTcLognp1D, {{{1e-300, 1e-300}, {1e-300, 1e-300}}, {{-1, 0}, {-kInf, 0}}}},
        {"exp", RTcExpD, {{{-kInf, 1}, {0, 0}}}},
        {"expm1", RTcExpm1D, {{{1e-300, -1e-300}, {1e-300, -1e-300}}}},
        {"pow10", RTcPow10D, {{{3, 0}, {1000, 0}}}},
        {"pow2", RTcPow2D, {{{-3, -0.0}, {0.125, -0.0}}}},
        {"polar", RTcRToPD, {{{-0.0, 0}, {-0.0, 0}}, {{0, -3}, {3, -kPi / 2}}}},
        {"rectangular", RTcPToRD, {{{5, 0}, {5, 0}}}},
        {"tan", RTcTanD, {{{1, 1000}, {0, 1}}}},
        {"cot", RTcCotD, {{{0, 1000}, {0, -1}}}},
        {"sec", RTcSecD, {{{0, 0}, {1, 0}}}},
        {"sinc", RTcSincD, {{{0, 0}, {1, 0}}, {{1, 12000}, {kInf, -kInf}}}},
        {"asin", RTcAsinD, {{{0, 0}, {0, 0}}}},
        {"acos", RTcAcosD, {{{1, 0.0}, {0, -0.0}}}},
        {"atanh", RTcAtanhD, {{{1, 0}, {kInf, 0}}}},
        {"sin", RTcSinD, {{{0, 0}, {0, 0}}}},
        {"cos", RTcCosD, {{{0, 0.0}, {1, -0.0}}}},
    };
    for (const auto& c : cases) {
        for (const auto& [z, expected] : c.values) {
            cmplx128 result{99, 99};
            c.function(&z, &result);
            ExpectSame(c.name, z, result, expected);
        }
    }
    double magnitude = 0;
    const cmplx128 large = {3e307, -4e307};
    RTcAbsD(&large, &magnitude);
    EXPECT_EQ(magnitude, 5e307);
}

TEST(ComplexMath, TwoOperands) {
    const struct {
        const char* name;
        ComplexBinary function;
        cmplx128 x, y, result;
    } cases[] = {
        {"add", RTcAddD, {1, 2}, {3, -4}, {4, -2}},
        {"sub", RTcSubD, {1, 2}, {3, -4}, {-2, 6}},
        {"mul", RTcMulD, {1, 2}, {3, -4}, {11, 2}},
        {"mul", RTcMulD, {-2, 0}, {kInf, -0.0}, {-kInf, 0}},  // real product
        {"mul", RTcMulD, {1e200, 1e200}, {1e200, -1e200}, {kInf, 0}},
        {"div", RTcDivD, {1, 2}, {3, -4}, {-0.2, 0.4}},
        {"div", RTcDivD, {1e300, 2e300}, {3e300, -4e300}, {-0.2, 0.4}},
        {"div", RTcDivD, {1e-310, 1e-310}, {1e-310, 1e-310}, {1, 0}},
        {"div", RTcDivD, {1, 0}, {0, 0}, {kNaN, kNaN}},  // as the formula has it
        {"powx", RTcPowxD, {0, 1}, {2, 0}, {-1, 0}},
        {"powx", RTcPowxD, {0, 0}, {0, 0}, {1, 0}},
        {"powx", RTcPowxD, {0, 0}, {2, 5}, {0, 0}},
        {"powx", RTcPowxD, {0, 0}, {-2, 0}, {kInf, 0}},
        {"powx", RTcPowxD, {-8, 0}, {3, 0}, {-512, 0}},
        {"powx", RTcPowxD, {1, 1}, {-4, 0}, {-0.25, -0.0}},
        {"powx", RTcPowxD, {1e300, 1e299}, {-40, 0}, {-0.0, 0.0}},
        {"powx", RTcPowxD, {1e300, 1e299}, {40, 0}, {-kInf, -kInf}},
        {"logx", RTcLogxD, {2, 0}, {8, 0}, {3, 0}},
        {"logx", RTcLogxD, {2, 0}, {0, 0}, {-kInf, 0}},
        {"logx", RTcLogxD, {0, 0}, {2, 0}, {-0.0, 0}},
        {"logx", RTcLogxD, {0, 2}, {0, 0}, {-kInf, kInf}},
        {"atan2", RTcAtan2D, {1, 0}, {1, 0}, {kPi / 4, 0}},
        {"atan2", RTcAtan2D, {0, 0}, {-5, 0}, {-kPi / 2, 0}},
    };
    for (const auto& c : cases) {
        cmplx128 result = c.y;
        c.function(&c.x, &result, &result);  // over an operand
        ExpectSame(c.name, c.x, result, c.result);
    }
}

TEST(ComplexMath, FormsScalesAndPredicates) {
    const cmplx64 z = {-3, 4};
    float magnitude = 0;
    float angle = 9;
    RTcfCToRThS(&z, &magnitude, nullptr);
    EXPECT_EQ(magnitude, 5);
    RTcfCToRThS(&z, nullptr, &angle);
    EXPECT_EQ(angle, std::atan2(4.0f, -3.0f));
    cmplx64 back{};
    RTfcRThToCS(&magnitude, &angle, &back);
    EXPECT_NEAR(back.re, -3, 1e-6);
    float re = 0;
    float im = 0;
    RTcfCToReImS(&z, &re, &im);
    RTfcReImToCS(&im, &re, &back);
    EXPECT_EACH(back.re == 4, back.im == -3);
    const float n = 2.5f;
    RTciScaleS(&z, &n, &back);
    EXPECT_EACH(back.re == -12, back.im == 16);

    const cmplxExt x = {FromExtended(0), FromExtended(1)};
    const cmplxExt nan = {FromExtended(0), *ENaN()};
    EXPECT_EACH(RTcEQ0X(&x) == 0, RTcNE0X(&x) == 1, RTcEQX(&x, &x) == 1, RTcEQX(&x, &nan) == 0, RTcNEX(&x, &nan) == 1,
                RTcIsNanX(&x) == 0, RTcIsNanX(&nan) == 1);
}

TEST(ComplexMath, ExtendedQuotientsStayInRange) {
    const Extended quotients[][6] = {{3e4900L, -4e4900L, 3e4900L, -4e4900L, 1, 0},
                                     {3e-4920L, 4e-4920L, 3e-4920L, 4e-4920L, 1, 0},
                                     {0x1p9000L, 0x1p-9000L, 1, 0, 0x1p9000L, 0x1p-9000L}};
    cmplxExt result{};
    for (const auto& q : quotients) {
        const cmplxExt x = {FromExtended(q[0]), FromExtended(q[1])};
        const cmplxExt y = {FromExtended(q[2]), FromExtended(q[3])};
        RTcDivX(&x, &y, &result);
        EXPECT_EQ(ToExtended(result.re), q[4]) << q[0];
        EXPECT_EQ(ToExtended(result.im), q[5]) << q[0];
    }
    const cmplxExt x = {FromExtended(3e4900L), FromExtended(-4e4900L)};
    RTcSignX(&x, &result);
    EXPECT_EQ(ToExtended(result.im), -0.8L);
    const cmplxExt large = {FromExtended(11356.6L), FromExtended(1.5707L)};
    RTcExpX(&large, &result);
    cmplxExt less1{};
    RTcExpm1X(&large, &less1);
    EXPECT_NEAR(static_cast<double>(ToExtended(less1.re) / ToExtended(result.re)), 1, 1e-15);
    floatExt half = FromExtended(-9223372036854775807.5L);
    RTfRoundX(&half, &half);
    EXPECT_EQ(ToExtended(half), -0x1p63L);
    floatExt log = FromExtended(1000);
    RTfLog10X(&log, &log);
    EXPECT_EQ(ToExtended(log), 3);
}

// ---- integers -------------------------------------------------------------------------------------------------------

TEST(IntegerMath, WrapAroundAndQuotients) {
    EXPECT_EACH(RTiMul(0x10001, 0x10001) == 0x20001, RTuMul(0xFFFFFFFF, 2) == 0xFFFFFFFE, RTiDiv(-7, 2) == -3,
                RTiDiv(INT32_MIN, -1) == INT32_MIN, RTuDiv(0xFFFFFFFF, 2) == 0x7FFFFFFFu);
    const int64 cases[][4] = {{-7, 2, -3, -1}, {7, -2, -3, 1}, {INT64_MIN, -1, INT64_MIN, 0}, {5, 0, 0, 5}};
    for (const auto& c : cases) {
        int64 quotient = 99;
        int64 remainder = 99;
        RTQRemiQ(c[0], c[1], &quotient, nullptr);
        RTQRemiQ(c[0], c[1], nullptr, &remainder);
        EXPECT_EACH(quotient == c[2], remainder == c[3]);
    }
    uint64 quotient = 99;
    uint64 remainder = 99;
    RTQRemuQ(UINT64_MAX, 10, &quotient, &remainder);
    EXPECT_EACH(quotient == 1844674407370955161u, remainder == 5u);
    RTQRemuQ(7, 0, nullptr, &remainder);
    EXPECT_EQ(remainder, 7u);
}

}  // namespace
