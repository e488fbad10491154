// The math family: how near its results are to the exact ones, and its conventions, where values are special, halves,
// missing results.
#include "numerics/Extended.h"
#include "support/Test.h"
#include <tessel/numerics/ComplexMath.h>
#include <tessel/numerics/FloatingPointConstants.h>
#include <tessel/numerics/IntegerMath.h>
#include <tessel/numerics/RealMath.h>

#include <cmath>
#include <fstream>
#include <limits>
#include <map>
#include <sstream>

namespace {

using namespace tessel;
using Values = std::vector<Extended>;

constexpr double kInf = std::numeric_limits<double>::infinity(), kNaN = std::numeric_limits<double>::quiet_NaN();

bool Same(Extended a, Extended b) {
    return std::isnan(a) ? std::isnan(b) : a == b && std::signbit(a) == std::signbit(b);
}

// ---- the members in every precision against a table -----------------------------------------------------------------

template <class T>
constexpr bool kIsComplex = requires(T z) {
    z.re;
};

template <class T>
T Make(const Extended* x) {
    if constexpr (kIsComplex<T>)
        return {Make<decltype(T::re)>(x), Make<decltype(T::im)>(x + 1)};
    else if constexpr (std::is_same_v<T, floatExt>)
        return FromExtended(*x);
    else
        return static_cast<T>(*x);
}

template <class T>
Values Parts(const T& value) {
    if constexpr (kIsComplex<T>)
        return {Parts(value.re)[0], Parts(value.im)[0]};
    else if constexpr (std::is_same_v<T, floatExt>)
        return {ToExtended(value)};
    else
        return {value};
}

// A function of so many numbers.
struct Function {
    template <class T>
    Function(void (*function)(const T*, T*)) : arguments(kIsComplex<T> ? 2 : 1) {
        call = [=](const Extended* row) {
            const Extended old[] = {99, 99};
            const T x = Make<T>(row);
            T result = Make<T>(old);
            return function(&x, &result), Parts(result);
        };
    }
    template <class T>
    Function(void (*function)(const T*, const T*, T*)) : arguments(kIsComplex<T> ? 4 : 2) {
        call = [=](const Extended* row) {
            const T x = Make<T>(row);
            T result = Make<T>(row + (kIsComplex<T> ? 2 : 1));
            return function(&x, &result, &result), Parts(result);  // over an operand
        };
    }
    size_t arguments;
    std::function<Values(const Extended*)> call;
};

using Member = std::pair<const std::string, std::vector<Function>>;
#define ALL(NAME) Member(#NAME, {NAME##S, NAME##D, NAME##X})
const std::map<std::string, std::vector<Function>> kMembers = {
    ALL(RTfRecip), ALL(RTfSqrt),   ALL(RTfLogn),  ALL(RTfLog10), ALL(RTfLog2),  ALL(RTfLognp1), ALL(RTfExp),
    ALL(RTfExpm1), ALL(RTfPow10),  ALL(RTfPow2),  ALL(RTfSin),   ALL(RTfCos),   ALL(RTfTan),    ALL(RTfSec),
    ALL(RTfCsc),   ALL(RTfCot),    ALL(RTfSinc),  ALL(RTfAsin),  ALL(RTfAcos),  ALL(RTfAtan),   ALL(RTfSinh),
    ALL(RTfCosh),  ALL(RTfTanh),   ALL(RTfAsinh), ALL(RTfAcosh), ALL(RTfAtanh), ALL(RTfLogx),   ALL(RTfPowx),
    ALL(RTfAtan2), ALL(RTcRecip),  ALL(RTcSign),  ALL(RTcSqrt),  ALL(RTcRToP),  ALL(RTcLogn),   ALL(RTcLog10),
    ALL(RTcLog2),  ALL(RTcLognp1), ALL(RTcExp),   ALL(RTcExpm1), ALL(RTcPow10), ALL(RTcPow2),   ALL(RTcSin),
    ALL(RTcCos),   ALL(RTcTan),    ALL(RTcSec),   ALL(RTcCsc),   ALL(RTcCot),   ALL(RTcSinc),   ALL(RTcAsin),
    ALL(RTcAcos),  ALL(RTcAtan),   ALL(RTcSinh),  ALL(RTcCosh),  ALL(RTcTanh),  ALL(RTcAsinh),  ALL(RTcAcosh),
    ALL(RTcAtanh), ALL(RTcMul),    ALL(RTcDiv),   ALL(RTcLogx),  ALL(RTcPowx),  ALL(RTcAtan2),  ALL(RTfAbs),
    ALL(RTfNeg),   ALL(RTfRound),  ALL(RTfCeil),  ALL(RTfFloor), ALL(RTfInc),   ALL(RTfDec),    ALL(RTfSign),
    ALL(RTfAdd),   ALL(RTfSub),    ALL(RTfMul),   ALL(RTfDiv),   ALL(RTfMod),   ALL(RTfiScale), ALL(RTcNeg),
    ALL(RTcConj),  ALL(RTcInc),    ALL(RTcDec),   ALL(RTcRound), ALL(RTcCeil),  ALL(RTcFloor),  ALL(RTcPToR),
    ALL(RTcAdd),   ALL(RTcSub)};

// A value as a precision has it, and the numbers of that precision.
Extended Rounded(size_t precision, Extended x) {
    return precision == 0 ? static_cast<Extended>(static_cast<float>(x)) : precision == 1 ? static_cast<double>(x) : x;
}
constexpr int kBits[] = {24, 53, 64}, kLeastExponent[] = {-149, -1074, -16445};

// The error in units of the last place. A part of a complex number far below the other comes about by cancellation, and
// for extended values there is nothing wider to compute in.
double Error(size_t precision, Extended got, Extended exact, Extended magnitude) {
    if (std::isinf(Rounded(precision, exact))) return Same(got, Rounded(precision, exact)) ? 0 : kInf;
    const Extended scale = std::max(std::fabs(exact), magnitude);
    const int exponent = scale == 0 ? kLeastExponent[precision] : std::ilogb(scale) + 1 - kBits[precision];
    return static_cast<double>(std::scalbn(std::fabs(got - exact), -std::max(exponent, kLeastExponent[precision])));
}

TEST(Math, MembersInEveryPrecision) {
    std::ifstream file("data/math.txt");
    std::string line, name;
    double allowed[3] = {};
    int checked = 0;
    while (std::getline(file, line)) {
        std::istringstream words(line);
        if (line[0] == '#') continue;
        if (line[0] == 'R') {
            words >> name >> allowed[0] >> allowed[1] >> allowed[2];
            ASSERT_TRUE(kMembers.contains(name)) << name;
            continue;
        }
        Values row;
        for (std::string word; words >> word;) row.push_back(std::strtold(word.c_str(), nullptr));
        for (size_t p = 0; p < 3; ++p) {
            const Function& function = kMembers.at(name)[p];
            const bool isHeld = std::all_of(row.begin(), row.begin() + static_cast<long>(function.arguments),
                                            [=](Extended x) { return Same(x, Rounded(p, x)); });
            if (!isHeld || allowed[p] < 0) continue;
            const Values got = function.call(row.data()),
                         exact(row.begin() + static_cast<long>(function.arguments), row.end());
            ASSERT_EQ(exact.size(), got.size()) << name << " " << line;
            const Extended magnitude = got.size() == 1 ? 0 : std::hypot(exact[0], exact[1]) / (p == 2 ? 1 : 1000);
            for (size_t i = 0; i < got.size(); ++i, ++checked) {
                const bool isRight = allowed[p] == 0
                                         ? Same(got[i], Rounded(p, exact[i]))
                                         : Error(p, got[i], exact[i], magnitude) <= allowed[p] + (p == 2 ? 0.5 : 0.001);
                EXPECT_TRUE(isRight) << name << "SDX"[p] << " of " << line << ": " << got[i];
            }
        }
    }
    EXPECT_GT(checked, 2500);
}

// ---- what is not alike in every precision ---------------------------------------------------------------------------

TEST(RealMath, NaNsAndRemainders) {
    const double minusOne = -1, x = -7, y = 3;
    double real = 0;
    RTfLognD(&minusOne, &real);
    uint64 bits = 0;
    std::memcpy(&bits, &real, sizeof bits);
    EXPECT_EQ(bits, ~uint64{0});
    const floatExt extended = FromExtended(-1);
    floatExt result;
    RTfLognX(&extended, &result);
    EXPECT_EQ(std::memcmp(&result, ENaN(), sizeof result), 0);
    RTfRemD(&x, &y, &real);
    const float sx = 7.5f, sy = -2;
    float single = 0;
    RTfRemS(&sx, &sy, &single);
    tessel::test::ReportRecorder reports;
    RTfRemX(EOne(), EOne(), &result);
    EXPECT_EACH(real == -1, single == 1.5f, std::isnan(ToExtended(result)),
                reports.Has(4, "RTfRemX not implemented on this platform"));
}

TEST(RealMath, TwoResultsEitherOfWhichMayBeNull) {
    const auto gives = [](void (*function)(const double*, const double*, double*, double*), double x, double y,
                          double first, double second) {
        double got[] = {99, 99};
        function(&x, &y, &got[0], nullptr);
        function(&x, &y, nullptr, &got[1]);
        return Same(got[0], first) && Same(got[1], second);
    };
    EXPECT_EACH(gives(RTfQRemD, -7, 3, -3, 2), gives(RTfQRemD, -6, 3, -2, 0.0), gives(RTfQRemD, -0.0, 3, -0.0, 0.0),
                gives(RTfQRemD, 7, -3, -3, -2), gives(RTfQRemD, 1, 0, kInf, kNaN), gives(RTfQRemD, 5, kInf, 0, kNaN),
                gives(RTfMaxMinD, 1, 2, 2, 1), gives(RTfMaxMinD, 2, 1, 2, 1), gives(RTfMaxMinD, kNaN, 1, kNaN, kNaN),
                gives(RTfMaxMinD, 1, kNaN, kNaN, kNaN), gives(RTfMaxMinD, -0.0, 0.0, -0.0, -0.0));
    const double parts[][3] = {{-40, -1.25, 5},       {0, 0, 0},          {1, 1, 0},
                               {0x1p-1074, 1, -1074}, {kInf, kInf, kInf}, {kNaN, kNaN, kNaN}};
    for (const auto& c : parts) {
        double mantissa = 99, exponent = 99;
        RTfGetMantExpD(c, &mantissa, nullptr);
        RTfGetMantExpD(c, nullptr, &exponent);
        EXPECT_TRUE(Same(mantissa, c[1]) && Same(exponent, c[2])) << c[0];
    }
    const floatExt x = FromExtended(0x1.8p-16400L);
    floatExt mantissa, exponent;
    RTfGetMantExpX(&x, &mantissa, &exponent);
    EXPECT_EACH(ToExtended(mantissa) == 1.5L, ToExtended(exponent) == -16400);
    const auto check = [](auto function, auto angle) {
        auto sine = angle, cosine = angle;
        function(&angle, &sine, nullptr);
        function(&angle, nullptr, &cosine);
        EXPECT_EACH(Parts(sine)[0] == 0, Parts(cosine)[0] == 1);
    };
    check(RTfSinCosS, 0.0f);
    check(RTfSinCosD, 0.0);
    check(RTfSinCosX, FromExtended(0));
}

TEST(RealMath, Predicates) {
    const double values[] = {-1, 0, 1, kNaN};
    const std::vector<int32> expected[] = {
        {0, 0, 1, 0, 1, 0, 1}, {0, 1, 0, 1, 1, 0, 0}, {0, 0, 1, 1, 0, 1, 0}, {1, 0, 1, 0, 0, 0, 0}};
    for (int i = 0; i < 4; ++i) {
        const double d = values[i];
        const auto s = static_cast<float>(d);
        const floatExt x = FromExtended(d);
        EXPECT_EQ(
            (std::vector{RTfIsNanS(&s), RTfEQ0S(&s), RTfNE0S(&s), RTfGE0S(&s), RTfLE0S(&s), RTfGT0S(&s), RTfLT0S(&s)}),
            expected[i]);
        EXPECT_EQ(
            (std::vector{RTfIsNanD(&d), RTfEQ0D(&d), RTfNE0D(&d), RTfGE0D(&d), RTfLE0D(&d), RTfGT0D(&d), RTfLT0D(&d)}),
            expected[i]);
        EXPECT_EQ(
            (std::vector{RTfIsNanX(&x), RTfEQ0X(&x), RTfNE0X(&x), RTfGE0X(&x), RTfLE0X(&x), RTfGT0X(&x), RTfLT0X(&x)}),
            expected[i]);
        for (const double other : {0.0, 2.0, kNaN})
            EXPECT_EACH(RTfEQD(&d, &other) == (d == other), RTfNED(&d, &other) == (d != other),
                        RTfGED(&d, &other) == (d >= other), RTfLED(&d, &other) == (d <= other),
                        RTfGTD(&d, &other) == (d > other), RTfLTD(&d, &other) == (d < other));
    }
}

TEST(ComplexMath, FormsScalesAndPredicates) {
    const cmplx64 z = {-3, 4};
    const cmplx128 large = {3e307, -4e307};
    float magnitude = 0, angle = 9, re = 0, im = 0;
    cmplx64 back{}, swapped{}, scaled{};
    const float n = 2.5f;
    double size = 0;
    RTcAbsD(&large, &size);
    RTcfCToRThS(&z, &magnitude, nullptr);
    RTcfCToRThS(&z, nullptr, &angle);
    RTfcRThToCS(&magnitude, &angle, &back);
    RTcfCToReImS(&z, &re, &im);
    RTfcReImToCS(&im, &re, &swapped);
    RTciScaleS(&z, &n, &scaled);
    EXPECT_EACH(size == 5e307, magnitude == 5, angle == std::atan2(4.0f, -3.0f), std::fabs(back.re + 3) < 1e-6,
                swapped.re == 4, swapped.im == -3, scaled.re == -12, scaled.im == 16);
    const cmplxExt x = {FromExtended(0), FromExtended(1)}, nan = {FromExtended(0), *ENaN()};
    EXPECT_EACH(RTcEQ0X(&x) == 0, RTcNE0X(&x) == 1, RTcEQX(&x, &x) == 1, RTcEQX(&x, &nan) == 0, RTcNEX(&x, &nan) == 1,
                RTcIsNanX(&x) == 0, RTcIsNanX(&nan) == 1);
    const cmplxExt far = {FromExtended(11356.6L), FromExtended(1.5707L)};  // where the real exponential is infinite
    cmplxExt result{}, less1{};
    RTcExpX(&far, &result);
    RTcExpm1X(&far, &less1);
    EXPECT_NEAR(static_cast<double>(ToExtended(less1.re) / ToExtended(result.re)), 1, 1e-15);
}

TEST(IntegerMath, WrapAroundAndQuotients) {
    EXPECT_EACH(RTiMul(0x10001, 0x10001) == 0x20001, RTuMul(0xFFFFFFFF, 2) == 0xFFFFFFFE, RTiDiv(-7, 2) == -3,
                RTiDiv(INT32_MIN, -1) == INT32_MIN, RTuDiv(0xFFFFFFFF, 2) == 0x7FFFFFFFu);
    for (const auto& c : std::vector<std::vector<int64>>{
             {-7, 2, -3, -1}, {7, -2, -3, 1}, {INT64_MIN, -1, INT64_MIN, 0}, {5, 0, 0, 5}}) {
        int64 quotient = 99, remainder = 99;
        RTQRemiQ(c[0], c[1], &quotient, nullptr);
        RTQRemiQ(c[0], c[1], nullptr, &remainder);
        EXPECT_EACH(quotient == c[2], remainder == c[3]);
    }
    uint64 quotient = 99, remainder = 99, only = 99;
    RTQRemuQ(UINT64_MAX, 10, &quotient, &remainder);
    RTQRemuQ(7, 0, nullptr, &only);
    EXPECT_EACH(quotient == 1844674407370955161u, remainder == 5u, only == 7u);
}

}  // namespace
