// The table of types, conversions, rounding and constants.
#include "numerics/Extended.h"
#include "support/Test.h"
#include <tessel/numerics/FloatingPointConstants.h>
#include <tessel/numerics/NumericSupport.h>
#include <tessel/numerics/RealMath.h>
#include <tessel/numerics/RoundingUtil.h>

#include <cfenv>
#include <cmath>
#include <limits>
#include <tuple>

namespace {

using namespace tessel;
using namespace tessel::test;

constexpr double kNaN = std::numeric_limits<double>::quiet_NaN();

TEST(NumericSupport, SizesAndClasses) {
    const int32 sizes[] = {0, 1, 2, 4, 8, 1, 2, 4, 8, 4, 8, 10, 8, 16, 20, 0};
    const int32 classes[] = {64, 0, 0, 0, 0, 1, 1, 1, 1, 2, 2, 2, 3, 3, 3, 64};
    for (int16 code = 0; code < 16; ++code)
        EXPECT_EACH(NumSize(code) == sizes[code], NumClass(static_cast<int16>(code + 16)) == classes[code]);
}

TEST(NumericSupport, ExtendedSizeIsSettable) {
    const cmplxExt packed = {FromExtended(1.5L), FromExtended(-2.5L)};
    EXPECT_EACH(SetFxSize(12) == 10, NumSize(11) == 12, NumSize(14) == 24);
    uint8 padded[24] = {};
    const cmplx128 z = {1.5, -2.5};
    ConvertNum(kNumComplexDouble, &z, kNumComplexExtended, padded);
    EXPECT_EACH(std::memcmp(padded, &packed.re, 10) == 0, std::memcmp(padded + 12, &packed.im, 10) == 0,
                SetFxSize(128) == 12, NumSize(14) == 256, SetFxSize(10) == 128);
}

TEST(NumericSupport, SmallHelpers) {
    EXPECT_EACH(Min(-3, 2) == -3, Max(-3, 2) == 2, Abs(-7) == 7, Abs(INT32_MIN) == INT32_MIN, Mod(-7, 3) == 2,
                Mod(7, -3) == 1, Mod(-6, 3) == 0, Mod(INT32_MIN, -1) == 0, Mod(-1, INT32_MIN) == INT32_MAX,
                Pin(5, 10, 0) == 10, Pin(15, 0, 10) == 10, Pin(-15, 0, 10) == 0, Pin(5, 0, 10) == 5);
}

TEST(RoundingUtil, ToAnIncrementHalvesAwayFromZero) {
    EXPECT_EACH(RndToInc(7, 5) == 5, RndToInc(8, 5) == 10, RndToInc(-8, 5) == -10, RndToInc(5, 10) == 10,
                RndToInc(-5, 10) == -10, RndToInc(4, 1) == 4, RndToInc(INT32_MAX, 10) == INT32_MIN + 2);
    EXPECT_EACH(UInt64ToFloat64(0) == 0.0, UInt64ToFloat64(0x8000000000000400) == 0x1p63,  // a tie
                UInt64ToFloat64(0x8000000000000401) == 0x1.0000000000001p63,
                UInt64ToFloat64(0x8000000000000C00) == 0x1.0000000000002p63);
}

// ---- between integers -----------------------------------------------------------------------------------------------

template <class From, class To>
void ExpectWrapAround(int16 from, int16 to) {
    for (const uint64 bits : {uint64{0}, uint64{1}, uint64{300}, ~uint64{0}, uint64{0x80}, uint64{0x8000},
                              uint64{0x80000000}, uint64{0x8123456789ABCDEF}}) {
        const auto source = static_cast<From>(bits);
        To destination = 0;
        ConvertNum(from, &source, to, &destination);
        EXPECT_EQ(destination, static_cast<To>(source)) << from << " to " << to;
    }
}

template <class... Ints>
struct Types {};

template <class From, class... To>
void ExpectWrapAroundIntoAll(int16 from, Types<To...>) {
    int16 to = 0;
    (ExpectWrapAround<From, To>(from, ++to), ...);
}

template <class... From>
void ExpectWrapAroundFromAll(Types<From...> all) {
    int16 from = 0;
    (ExpectWrapAroundIntoAll<From>(++from, all), ...);
}

TEST(ConvertNum, IntegersWrapAround) {
    ExpectWrapAroundFromAll(Types<int8, int16, int32, int64, uint8, uint16, uint32, uint64>());
}

// ---- reals into integers --------------------------------------------------------------------------------------------

// The rule, by comparing the distance to the two neighbours.
template <class Int>
Int Nearest(Extended x) {
    const auto maximum = static_cast<Extended>(std::numeric_limits<Int>::max());
    const auto minimum = static_cast<Extended>(std::numeric_limits<Int>::min());
    if (std::isnan(x) || x > maximum) return std::numeric_limits<Int>::max();
    if (x < minimum) return std::numeric_limits<Int>::min();
    const Extended below = std::floor(x), distance = x - below;
    const bool up = distance > 0.5L || (distance == 0.5L && std::fmod(below, 2.0L) != 0);
    return static_cast<Int>(up ? below + 1 : below);
}

template <class Int>
void ExpectNearest(double x, Int (*convert)(double), int16 code) {
    EXPECT_EQ(convert(x), Nearest<Int>(x)) << x;
    Int converted = 0;
    ConvertNum(kNumDouble, &x, code, &converted);
    EXPECT_EQ(converted, Nearest<Int>(x)) << x;
}

TEST(ConvertNum, DoublesSaturateAndRoundHalvesToEven) {
    std::vector<double> values{0.0, -0.0, 0.5, -0.5, 2.5, 3.5, -2.5, kNaN, INFINITY, -INFINITY, 0.49999999999999994};
    for (const double limit : {127.0, 128.0, 255.0, 32767.0, 65535.0, 2147483647.0, 2147483648.0, 4294967295.0, 0x1p53,
                               0x1p62, 0x1p63, 0x1p64, 1e300}) {
        for (const double offset : {-1.0, -0.5, 0.0, 0.25, 0.5, 1.0}) {
            values.push_back(limit + offset);
            values.push_back(-limit + offset);
        }
        values.push_back(std::nextafter(limit, 0));
    }
    std::mt19937_64 random(31);
    for (int i = 0; i < 20000; ++i)
        values.push_back(
            std::ldexp(static_cast<double>(static_cast<int64>(random())), -static_cast<int>(random() % 70)));
    std::vector<std::pair<int, double>> cases;  // whatever direction the host rounds in
    for (const double x : values) {
        for (const int direction : {FE_TONEAREST, FE_UPWARD, FE_DOWNWARD, FE_TOWARDZERO})
            cases.emplace_back(direction, x);
    }
    for (const auto& [direction, x] : cases) {
        std::fesetround(direction);
        ExpectNearest(x, Float64ToInt8, kNumInt8);
        ExpectNearest(x, Float64ToInt16, kNumInt16);
        ExpectNearest(x, Float64ToInt32, kNumInt32);
        ExpectNearest(x, Float64ToInt64, kNumInt64);
        ExpectNearest(x, Float64ToUInt8, kNumUInt8);
        ExpectNearest(x, Float64ToUInt16, kNumUInt16);
        ExpectNearest(x, Float64ToUInt32, kNumUInt32);
        ExpectNearest(x, Float64ToUInt64, kNumUInt64);
        EXPECT_EACH(RndToNearest(x) == Nearest<int32>(x), RndToNearestI64(x) == Nearest<int64>(x),
                    RndToNearestU32(x) == Nearest<uint32>(x), RndToNearestU64(x) == Nearest<uint64>(x));
        double rounded = 0;
        RTfRoundD(&x, &rounded);
        const bool isSmall = std::fabs(x) < 0x1p62;
        EXPECT_EQ(isSmall ? rounded : 0, isSmall ? static_cast<double>(Nearest<int64>(x)) : 0) << x;
    }
    std::fesetround(FE_TONEAREST);
}

// ---- the rest -------------------------------------------------------------------------------------------------------

template <class To, class From>
To Converted(int16 from, const From& value, int16 to) {
    To result{};
    ConvertNum(from, &value, to, &result);
    return result;
}

TEST(ConvertNum, RealsAndComplexValues) {
    const struct {
        Extended value;
        int64 asInt64;
        uint64 asUInt64;
    } limits[] = {{9223372036854775807.0L, INT64_MAX, 9223372036854775807u},
                  {9223372036854775807.0L + 0.5L, INT64_MAX, 9223372036854775808u},
                  {18446744073709551615.0L, INT64_MAX, UINT64_MAX},
                  {18446744073709551616.0L, INT64_MAX, UINT64_MAX},
                  {4611686018427387904.5L, 4611686018427387904, 4611686018427387904u},
                  {-9223372036854775808.0L, INT64_MIN, 0},
                  {-0.75L, -1, 0}};
    for (const auto& c : limits) {
        const floatExt x = FromExtended(c.value);
        EXPECT_EACH((Converted<int64>(kNumExtended, x, kNumInt64)) == c.asInt64,
                    (Converted<uint64>(kNumExtended, x, kNumUInt64)) == c.asUInt64);
    }
    EXPECT_EACH((Converted<uint8, int32>(kNumInt32, 300, kNumUInt8)) == 44,
                (Converted<uint8>(kNumDouble, 300.0, kNumUInt8)) == 255,
                (Converted<float>(kNumDouble, 0.1, kNumSingle)) == 0.1f,
                (Converted<float>(kNumDouble, 1e300, kNumSingle)) == INFINITY,
                (Converted<double>(kNumUInt64, ~uint64{0}, kNumDouble)) == 0x1p64,
                (Converted<double>(kNumInt64, int64{9007199254740993}, kNumDouble)) == 9007199254740992.0,
                ToExtended(Converted<floatExt>(kNumInt64, INT64_MIN, kNumExtended)) == -0x1p63L);
    const auto z = Converted<cmplx64>(kNumComplexDouble, cmplx128{0.1, -2}, kNumComplexSingle);
    EXPECT_EACH(z.re == 0.1f, z.im == -2.0f, (Converted<cmplx128>(kNumInt8, int8{-3}, kNumComplexDouble).im) == 0,
                (Converted<int16>(kNumComplexSingle, cmplx64{-7.5f, 3}, kNumInt16)) == -8);
    EXPECT_EQ((Converted<int16>(static_cast<int16>(kNumInt32 + 16), int32{5}, kNumInt16)), 5) << "only four bits count";
}

TEST(ConvertNum, BadArgumentsAreReportedAndStoreNothing) {
    ReportRecorder reports;
    int32 value = 7;
    ConvertNum(0, &value, kNumInt32, &value);
    for (const int16 none : {15, 16, 31}) ConvertNum(kNumInt32, &value, none, &value);
    ConvertNum(15, &value, kNumInt32, &value);
    ConvertNum(kNumInt32, nullptr, kNumInt32, &value);
    ConvertNum(kNumInt32, &value, kNumInt32, nullptr);
    const std::string codes = "ConvertNum called with non-numeric", data = "ConvertNum called with Empty Data";
    EXPECT_EACH(reports.Texts(4) == (std::vector<std::string>{codes, codes, codes, codes, codes, data, data}),
                value == 7);
}

TEST(FloatingPointConstants, BytesOfSpecialAndWidenedValues) {
    const auto is = [](const floatExt* value, uint16 signExponent, uint64 mantissa) {
        return value->mantissa == mantissa && value->signExponent == signExponent;
    };
    EXPECT_EACH(is(EOne(), 0x3FFF, 0x8000000000000000), is(EZero(), 0, 0), is(EInfinity(), 0x7FFF, 0x8000000000000000),
                is(ENegInfinity(), 0xFFFF, 0x8000000000000000), is(ENaN(), 0x7FFF, 0xFFFFFFFFFFFFFFFF),
                is(ETwoPi(), 0x4001, 0xC90FDAA22168C000), is(EEpsilon(), 0x3FCB, 0x8000000000000000),
                is(EEpsilonExt(), 0x3FC0, 0x8000000000000000), is(EEpsilonSgl(), 0x3FE8, 0x8000000000000000));
    const auto bits = [](auto x) {
        uint64 result = 0;
        std::memcpy(&result, &x, sizeof x);
        return result;
    };
    EXPECT_EACH(bits(SInfinity()) == 0x7F800000u, bits(SNegInfinity()) == 0xFF800000u,
                bits(DInfinity()) == 0x7FF0000000000000u, bits(DNegInfinity()) == 0xFFF0000000000000u,
                bits(DNaN()) == ~uint64{0});
}

TEST(FloatingPointConstants, Values) {
    const auto value = [](const floatExt* constant) { return static_cast<double>(ToExtended(*constant)); };
    EXPECT_EACH(value(ERecipPi()) == 1 / M_PI, value(EE()) == M_E, value(ERecipE()) == std::exp(-1.0),
                value(Eln10()) == M_LN10, value(EPlanck()) == 6.6260693e-34, value(EElemChg()) == 1.60217653e-19,
                value(ESpeedLt()) == 299792458.0, value(EGravity()) == 6.6742e-11, value(EAvgdro()) == 6.0221415e23,
                value(ERydbrg()) == 10973731.568525, value(EMlrGas()) == 8.314472, value(ELnOfTwo()) == M_LN2,
                value(ELogOfE()) == M_LOG10E, value(ELnOfPi()) == std::log(M_PI));
}

}  // namespace
