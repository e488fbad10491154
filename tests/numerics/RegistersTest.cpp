// The register layer.
#include "numerics/Extended.h"
#include "support/Test.h"
#include <tessel/numerics/FloatingPointConstants.h>
#include <tessel/numerics/FloatingPointRegisters.h>

#include <cfenv>
#include <cmath>

namespace {

using tessel::Extended;
using tessel::FromExtended;
using tessel::ToExtended;

void Push(Extended x) {
    const floatExt value = FromExtended(x);
    FPLoadExt(&value);
}

Extended Pop() {
    floatExt value;
    FPStoreExt(&value);
    return ToExtended(value);
}

void FPInitKeepingDirection() {
    const int direction = std::fegetround();
    FPInit();
    std::fesetround(direction);
}

class Registers : public testing::Test {
protected:
    void SetUp() override { FPInit(); }
    void TearDown() override { FPInit(); }
};

TEST_F(Registers, StackOfEightAndItsFaults) {
    EXPECT_EQ(FPCheck(), 1);
    for (int i = 1; i <= 8; ++i) Push(i);
    EXPECT_EACH(FPCheck() == 0, (CheckFPStat() & kFPStatStackFault) == 0);
    for (int i = 8; i >= 1; --i) EXPECT_EQ(Pop(), i);
    EXPECT_EACH(FPCheck() == 1, std::isnan(Pop()), (CheckFPStat() & 0x3FF) == (kFPStatInvalid | kFPStatStackFault));
    std::fesetround(FE_UPWARD);
    FPInit();
    EXPECT_EACH(std::fegetround() == FE_TONEAREST, CheckFPStat() == 0);
    for (int i = 1; i <= 9; ++i) Push(i);
    EXPECT_EQ(CheckFPStat() & 0x3FF, kFPStatInvalid | kFPStatStackFault | kFPStatStackOverflow);
    EXPECT_TRUE(std::isnan(Pop())) << "the value pushed on a full stack is lost";
    EXPECT_EQ(Pop(), 8);
    FPInit();
    Push(1);
    EXPECT_EQ(CheckFPStat() >> 11 & 7, 7) << "the top";
    Push(0);
    RecipX();
    EXPECT_EACH((CheckFPStat() & 0x7F) == kFPStatZeroDivide, Pop() == INFINITY);
}

TEST_F(Registers, EveryThreadHasItsOwnStack) {
    Push(5);
    std::thread([] {
        FPInit();
        Push(6);
        FPPop();
        EXPECT_TRUE(std::isnan(Pop()));
    }).join();
    EXPECT_EQ(Pop(), 5);
}

TEST_F(Registers, PushDoublesAndPopDrops) {
    Push(3);
    FPPush();
    FPPop();
    FPSave();
    EXPECT_EACH(Pop() == 3, FPCheck() == 1);
}

TEST_F(Registers, TypedLoadsAndStores) {
    const int8 i8 = -128;
    const uint16 u16 = 65535;
    const int64 i64 = INT64_MIN;
    const uint64 u64 = UINT64_MAX;
    const float f32 = 0.1f;
    FPLoadInt8(&i8);
    FPLoadUInt16(&u16);
    FPLoadInt64(&i64);
    FPLoadUInt64(&u64);
    FPLoadFlt32(&f32);
    double d = 0;
    FPStoreFlt64(&d);
    EXPECT_EQ(d, static_cast<double>(0.1f));
    int32 i = 0;
    FPStoreInt32(&i);
    EXPECT_EQ(i, INT32_MAX) << "saturates";
    int64 back = 0;
    FPStoreInt64(&back);
    EXPECT_EQ(back, INT64_MIN);
    uint8 u8 = 0;
    FPStoreUInt8(&u8);
    EXPECT_EQ(u8, 255);
    FPStoreUInt8(&u8);
    EXPECT_EQ(u8, 0);
}

TEST_F(Registers, AnyTypeByItsCode) {
    const cmplx128 z = {1.25, -3.5};
    NumToFPR(kNumComplexDouble, &z);
    EXPECT_EACH(Pop() == 1.25, Pop() == -3.5);
    NumToFPR(kNumComplexDouble, &z);
    cmplx64 narrow{};
    EXPECT_EACH(FPRToNum(kNumComplexSingle, &narrow) == 1, narrow.re == 1.25f, narrow.im == -3.5f);

    Push(1e30L);
    int16 small = 0;
    EXPECT_EQ(FPRToNum(kNumInt16, &small), 1) << "saturation is no fault";
    EXPECT_EQ(small, 32767);
    EXPECT_EQ(FPRToNum(kNumInt16, &small), 0) << "the stack is empty";
    const floatExt signaling = {0x8000000000000001, 0x7FFF};
    double d = 0;
    FPLoadExt(&signaling);
    EXPECT_EACH(FPRToNum(kNumDouble, &d) == 0, std::isnan(d));
}

TEST_F(Registers, ExtendedInMemoryToIntegers) {
    const floatExt x = FromExtended(18446744073709551613.0L);
    EXPECT_EACH(FloatExtToUInt64(&x) == 18446744073709551613u, FloatExtToInt64(&x) == INT64_MAX,
                FloatExtToInt64(ENaN()) == INT64_MAX);
}

// ---- decimal records ------------------------------------------------------------------------------------------------

TEST_F(Registers, DecimalRecords) {
    const struct {
        double value;
        int32 digits;
        uint8 top;      // the two highest digits
        uint64 packed;  // the others
        int16 exponent;
        int16 mdigits;
    } cases[] = {
        {1234.5678, 7, 0, 0x1234568, -3, 6},
        {1234.5678, -2, 0, 0x123457, -2, 5},
        {9.996, 3, 0, 0x100, -1, 2},
        {9.996, -2, 0, 0x1000, -2, 3},
        {2.5, 0, 0, 0x2, 0, 0},
        {3.5, 0, 0, 0x4, 0, 0},
        {0.007, -2, 0, 0x1, -2, 0},
        {0.0007, -2, 0, 0, -2, 0},
        {0, 5, 0, 0, 0, 0},
        {1e20, -2, 0x10, 0, 3, 17},
        {0.1, 40, 0x01, 1, -17, 16},
        {5e-324, 17, 0x04, 0x9406564584124654, -340, 16},
    };
    for (const auto& c : cases) {
        FPLoadFlt64(&c.value);
        PackedDecimal record;
        FPStorePDR(c.digits, &record);
        uint64 packed = 0;
        std::memcpy(&packed, record.mantissa, sizeof packed);
        EXPECT_EQ(packed, c.packed) << c.value;
        EXPECT_EQ(record.mantissa[8], c.top) << c.value;
        EXPECT_EQ(record.exponent, c.exponent) << c.value;
        EXPECT_EQ(record.mdigits, c.mdigits) << c.value;
        EXPECT_EQ(record.sign, 0) << c.value;
    }
}

TEST_F(Registers, SpecialDecimalRecords) {
    PackedDecimal record;
    Push(-INFINITY);
    FPStorePDR(5, &record);
    EXPECT_EACH(record.exponent == 32767, record.sign == 0x80);
    FPLoadPDR(&record);
    EXPECT_EQ(Pop(), -INFINITY);
    FPLoadExt(ENaN());
    FPStorePDR(-3, &record);
    EXPECT_EQ(record.exponent, 32766);
    FPLoadPDR(&record);
    EXPECT_TRUE(std::isnan(Pop()));
}

constexpr int kDirections[] = {FE_TONEAREST, FE_UPWARD, FE_DOWNWARD, FE_TOWARDZERO};

// The host's text conversion rounds once, in the direction in force.
void ExpectStoredAsText(const PackedDecimal& record) {
    char text[64] = {record.sign != 0 ? '-' : '+'};
    char* at = text + 1;
    for (int digit = 17; digit >= 0; --digit) {
        *at++ = static_cast<char>('0' + (record.mantissa[digit / 2] >> (digit % 2 * 4) & 15));
    }
    std::snprintf(at, 16, "e%d", record.exponent);
    FPLoadPDR(&record);
    EXPECT_EQ(Pop(), std::strtold(text, nullptr)) << text;
    for (const int direction : kDirections) {
        if (record.exponent > 4900) break;  // infinite already as an extended value
        std::fesetround(direction);
        double value = 0;
        float single = 0;
        FPLoadPDR(&record);
        FPStoreFlt64(&value);
        FPLoadPDR(&record);
        FPRToNum(kNumSingle, &single);
        EXPECT_EQ(value, std::strtod(text, nullptr)) << text << ", direction " << direction;
        EXPECT_EQ(single, std::strtof(text, nullptr)) << text << ", direction " << direction;
    }
    std::fesetround(FE_TONEAREST);
}

// The extended values nearest to the first lie halfway between two doubles, or at one, on the other side of it than the
// decimals: rounding twice goes wrong.
TEST_F(Registers, DecimalsAreRoundedOnce) {
    PackedDecimal record = {{0x93, 0x70, 0x13, 0x01, 0x16, 0x86, 0x32, 0x52, 0x55}, 0, 6, 17};
    ExpectStoredAsText(record);
    record.sign = 0x80;
    ExpectStoredAsText(record);
    ExpectStoredAsText({{0x97, 0x82, 0x14, 0x00, 0x32, 0x75, 0x57, 0x43, 0x29}, 0, -19, 17});
    ExpectStoredAsText({{0x39, 0x79, 0x60, 0x09, 0x52, 0x18, 0x93, 0x71, 0x10}, 0, 291, 17});  // the largest exponent
    // Just below 2^-64 and 2^501, nearest to which they are: the mantissa carries.
    ExpectStoredAsText({{0x17, 0x22, 0x75, 0x42, 0x62, 0x08, 0x01, 0x21, 0x54}, 0, -37, 17});
    ExpectStoredAsText({{0x74, 0x83, 0x22, 0x79, 0x15, 0x12, 0x78, 0x46, 0x65}, 0, 133, 17});
    std::mt19937_64 random(41);
    for (int i = 0; i < 5000; ++i) {
        for (uint8& byte : record.mantissa) byte = static_cast<uint8>(random() % 10 << 4 | random() % 10);
        record.sign = random() % 2 != 0 ? 0x80 : 0;
        const int range = i % 2 != 0 ? 9900 : 700;
        record.exponent = static_cast<int16>(static_cast<int>(random() % range) - range / 2 - 10);
        ExpectStoredAsText(record);
    }
}

// ---- narrow stores --------------------------------------------------------------------------------------------------

template <class Real>
void ExpectStoredAsTheHost(Extended x, void (*store)(Real*)) {
    constexpr int kFlags = FE_INEXACT | FE_UNDERFLOW | FE_OVERFLOW;
    FPInitKeepingDirection();
    Push(x);
    Real stored = 0;
    store(&stored);
    const int status = CheckFPStat();
    std::feclearexcept(FE_ALL_EXCEPT);
    const volatile Real host = static_cast<Real>(x);
    const int raised = std::fetestexcept(kFlags);
    EXPECT_EQ(stored, host) << x;
    EXPECT_EQ((status & kFPStatInexact) != 0, (raised & FE_INEXACT) != 0) << x;
    EXPECT_EQ((status & kFPStatUnderflow) != 0, (raised & FE_UNDERFLOW) != 0) << x;
    EXPECT_EQ((status & kFPStatOverflow) != 0, (raised & FE_OVERFLOW) != 0) << x;
    EXPECT_EQ((status & kFPStatDenormal) != 0, std::fpclassify(stored) == FP_SUBNORMAL) << x;
}

TEST_F(Registers, NarrowStoresRoundAsTheHost) {
    std::mt19937_64 random(42);
    for (int i = 0; i < 20000; ++i) {
        std::fesetround(kDirections[i % 4]);
        const uint64 mask = random() % 2 != 0 ? ~uint64{0} : ~uint64{0} << random() % 64;  // ties and exact values
        const auto mantissa = static_cast<Extended>((random() | uint64{1} << 63) & mask);
        const Extended sign = random() % 2 != 0 ? 1 : -1;
        const int exponent = static_cast<int>(random() % 64);
        for (const int end : {1024 - 32, -1022 - 62}) {
            ExpectStoredAsTheHost<double>(sign * std::scalbn(mantissa, end + exponent - 63), FPStoreFlt64);
        }
        for (const int end : {128 - 32, -126 - 33}) {
            ExpectStoredAsTheHost<float>(sign * std::scalbn(mantissa, end + exponent - 63), FPStoreFlt32);
        }
    }
    std::fesetround(FE_TONEAREST);
}

// ---- operations -----------------------------------------------------------------------------------------------------

TEST_F(Registers, RealOperations) {
    const struct {
        const char* name;
        void (*operation)();
        std::vector<Extended> operands;
        Extended result;
    } cases[] = {
        {"LogX", LogX, {2, 8}, 3},
        {"LogX of 0", LogX, {10, 0}, -INFINITY},
        {"Log2", Log2, {0.125L}, -3},
        {"Log10", Log10, {1e20L}, 20},
        {"LogN", LogN, {1}, 0},
        {"LogN of 0", LogN, {0}, -INFINITY},
        {"Lognp1", Lognp1, {-1}, -INFINITY},
        {"ExpX", ExpX, {0}, 1},
        {"_F2X", _F2X, {-3}, 0.125L},
        {"_F2XM1", _F2XM1, {0x1p-70L}, 0x1p-70L * 0.69314718055994530942L},
        {"Pow10X", Pow10X, {3}, 1000},
        {"Pow2X", Pow2X, {10}, 1024},
        {"PowerX", PowerX, {2, 0.5L}, 1.41421356237309504880L},
        {"ScaleX", ScaleX, {3, -1.9L}, 1.5L},
        {"ScaleX far", ScaleX, {3, 1e30L}, INFINITY},
        {"FloorX", FloorX, {-1.5L}, -2},
        {"CeilX", CeilX, {-1.5L}, -1},
        {"SignX", SignX, {-1e-4900L}, -1},
        {"SinX", SinX, {0}, 0},
        {"CosX", CosX, {0}, 1},
        {"TanX", TanX, {0}, 0},
        {"ATanX", ATanX, {-1, 0}, 3.14159265358979323851L},
        {"SincX", SincX, {0}, 1},
        {"RecipX", RecipX, {-4}, -0.25L},
        {"Sinh", Sinh, {0}, 0},
        {"Cosh", Cosh, {0}, 1},
        {"Tanh", Tanh, {INFINITY}, 1},
        {"Asinh", Asinh, {0}, 0},
        {"Acosh", Acosh, {1}, 0},
        {"Atanh", Atanh, {1}, INFINITY},
        {"ASinX", ASinX, {1}, 1.57079632679489661926L},
        {"ACosX", ACosX, {1}, 0},
        {"FPIsInt", FPIsInt, {-7}, 1},
        {"FPIsInt of a fraction", FPIsInt, {0.5L}, 0},
        {"FPIsInt of infinity", FPIsInt, {INFINITY}, 0},
        {"FPCompareExt", FPCompareExt, {1, 2}, -1},
        {"FPCompareExt equal", FPCompareExt, {0.0L, -0.0L}, 0},
        {"FPCompareExt greater", FPCompareExt, {INFINITY, 2}, 1},
    };
    for (const auto& c : cases) {
        for (const Extended operand : c.operands) Push(operand);
        c.operation();
        EXPECT_EQ(Pop(), c.result) << c.name;
        EXPECT_EQ(FPCheck(), 1) << c.name << " leaves the stack as deep as it should be";
    }
    Push(-1);
    LogN();
    EXPECT_TRUE(std::isnan(Pop()));
    Push(-40);
    FMantExpX();
    EXPECT_EACH(Pop() == -1.25L, Pop() == 5);
}

TEST_F(Registers, ComplexOperations) {
    using Operation = void (*)();
    const struct {
        const char* name;
        Operation there;
        Operation back;
    } inverses[] = {
        {"polar", ComplexRToP, ComplexPToR},  {"reciprocal", ComplexRecip, ComplexRecip},
        {"sine", ComplexSin, ComplexAsin},    {"cosine", ComplexCos, ComplexAcos},
        {"tangent", ComplexTan, ComplexAtan}, {"sinh", ComplexSinh, ComplexAsinh},
        {"cosh", ComplexCosh, ComplexAcosh},  {"tanh", ComplexTanh, ComplexAtanh},
    };
    for (const auto& c : inverses) {
        Push(0.5L);  // imaginary
        Push(0.75L);
        c.there();
        c.back();
        EXPECT_NEAR(static_cast<double>(Pop() - 0.75L), 0, 1e-18) << c.name;
        EXPECT_NEAR(static_cast<double>(Pop() - 0.5L), 0, 1e-18) << c.name;
        EXPECT_EQ(FPCheck(), 1);
    }
    Push(2);  // 1 + 2i, divided by 3 - 4i
    Push(1);
    Push(-4);
    Push(3);
    ComplexDivide();
    EXPECT_EACH(Pop() == -0.2L, Pop() == 0.4L);
    Push(1);  // the sine of i
    Push(0);
    ComplexSincos();
    EXPECT_EACH(Pop() == 0, Pop() == std::sinh(1.0L));
    EXPECT_NEAR(static_cast<double>(Pop()), std::cosh(1.0), 1e-15);
    EXPECT_EQ(Pop(), 0);
    Push(0);
    Push(0);
    ComplexSinc();
    EXPECT_EQ(Pop(), 1);
    FPPop();
    Push(0);
    Push(1);
    ComplexCot();
    EXPECT_NEAR(static_cast<double>(Pop()), 0.642092615934330703, 1e-15);
    FPPop();
}

TEST_F(Registers, FromMemoryToMemory) {
    const float f8 = 8;
    const float f2 = 2;
    float single = 0;
    FLogX32(&f2, &f8, &single);
    EXPECT_EQ(single, 3);
    FLog2_32(&f8, &single);
    EXPECT_EQ(single, 3);
    const double ten = 10;
    const double thousand = 1000;
    double real = 0;
    FLog10_64(&thousand, &real);
    EXPECT_EQ(real, 3);
    FLogX64(&ten, &thousand, &real);
    EXPECT_EQ(real, 3);
    FScaleX64(&thousand, &ten, &real);
    EXPECT_EQ(real, 1024000);
    FATan2_64(&ten, &ten, &real);
    EXPECT_EQ(real, std::atan(1.0));
    FPowerX64(&ten, &ten, &real);
    EXPECT_EQ(real, 1e10);
    floatExt extended;
    FExpXExt(EOne(), &extended);
    EXPECT_EQ(ToExtended(extended), 2.71828182845904523536L);
    FLogNExt(&extended, &extended);
    EXPECT_EQ(ToExtended(extended), 1);
    cmplx128 z = {-3, 0};
    FComplexRToP64(&z, &z);
    EXPECT_EACH(z.re == 3, z.im == std::acos(-1.0));
    FComplexPToR64(&z, &z);
    EXPECT_EACH(z.re == -3, FPCheck() == 1);
}

// ---- sums -----------------------------------------------------------------------------------------------------------

TEST(Sums, ElementsApartAndBackwards) {
    const double values[] = {1e20, 3.5, 1, 99, -1e20, 99};
    double sum = -1;
    Sum1DDoubleArray(values, 2 * sizeof(double), 3, &sum);
    EXPECT_EQ(sum, 0) << "1e20 + 1 - 1e20 in 64 bits";
    Sum1DDoubleArray(values + 3, -static_cast<int32>(sizeof(double)), 3, &sum);
    EXPECT_EQ(sum, 103.5);
    Sum1DDoubleArray(values, 8, 0, &sum);
    EXPECT_EQ(sum, 0);
}

TEST(Sums, AreAccumulatedInExtendedPrecision) {
    std::vector<float> singles(10001, 1e-5f);
    singles[0] = 1;
    float single = 0;
    Sum1DSingleArray(singles.data(), sizeof(float), 10001, &single);
    EXPECT_EQ(single, static_cast<float>(1 + 1e4 * static_cast<double>(1e-5f)));
    const double doubles[] = {0x1p53, 1, -0x1p53};
    double real = 0;
    Sum1DDoubleArray(doubles, sizeof(double), 3, &real);
    EXPECT_EQ(real, 1) << "a sum of doubles would lose it";
    const floatExt extended[] = {FromExtended(0x1p-4000L), FromExtended(1e4000L)};
    floatExt total;
    Sum1DExtendedArray(extended, sizeof(floatExt), 2, &total);
    EXPECT_EQ(ToExtended(total), 1e4000L);
}

}  // namespace
