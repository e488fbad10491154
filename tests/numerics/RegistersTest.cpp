// The register layer.
#include "numerics/Extended.h"
#include "support/Test.h"
#include <tessel/numerics/FloatingPointConstants.h>
#include <tessel/numerics/FloatingPointRegisters.h>

#include <cfenv>
#include <cmath>

namespace {

using namespace tessel;

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
    EXPECT_EACH(std::isnan(Pop()), Pop() == 8);  // the value pushed on a full stack is lost
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
    FPPush();
    FPPop();
    FPSave();
    EXPECT_EACH(Pop() == 5, FPCheck() == 1);
}

template <class T>
T Stored(void (*store)(T*)) {
    T value{};
    store(&value);
    return value;
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
    EXPECT_EACH(Stored(FPStoreFlt64) == static_cast<double>(0.1f), Stored(FPStoreInt32) == INT32_MAX,
                Stored(FPStoreInt64) == INT64_MIN, Stored(FPStoreUInt8) == 255, Stored(FPStoreUInt8) == 0);
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
    const floatExt x = FromExtended(18446744073709551613.0L);
    EXPECT_EACH(FloatExtToUInt64(&x) == 18446744073709551613u, FloatExtToInt64(&x) == INT64_MAX,
                FloatExtToInt64(ENaN()) == INT64_MAX);
}

// ---- decimal records ------------------------------------------------------------------------------------------------

// The digits, the exponent and how many digits follow the first; a sign where there is one.
std::string Record(double value, int32 digits) {
    FPLoadFlt64(&value);
    PackedDecimal record;
    FPStorePDR(digits, &record);
    char text[64];
    char* at = text;
    for (int i = 8; i >= 0; --i) at += std::snprintf(at, 3, "%02X", record.mantissa[i]);
    std::snprintf(at, 40, "e%d:%d%s", record.exponent, record.mdigits, record.sign != 0 ? "-" : "");
    return text + std::strspn(text, "0");
}

TEST_F(Registers, DecimalRecords) {
    EXPECT_EACH(Record(1234.5678, 7) == "1234568e-3:6", Record(1234.5678, -2) == "123457e-2:5",
                Record(9.996, 3) == "100e-1:2", Record(9.996, -2) == "1000e-2:3", Record(2.5, 0) == "2e0:0",
                Record(3.5, 0) == "4e0:0", Record(0.007, -2) == "1e-2:0", Record(0.0007, -2) == "e-2:0",
                Record(-0.7, -1) == "7e-1:0-", Record(0, 5) == "e0:0", Record(1e20, -2) == "100000000000000000e3:17",
                Record(0.1, 40) == "10000000000000001e-17:16", Record(5e-324, 17) == "49406564584124654e-340:16");
    PackedDecimal record;
    Push(-INFINITY);
    FPStorePDR(5, &record);
    FPLoadPDR(&record);
    EXPECT_EACH(record.exponent == 32767, record.sign == 0x80, Pop() == -INFINITY);
    FPLoadExt(ENaN());
    FPStorePDR(-3, &record);
    FPLoadPDR(&record);
    EXPECT_EACH(record.exponent == 32766, std::isnan(Pop()));
}

constexpr int kDirections[] = {FE_TONEAREST, FE_UPWARD, FE_DOWNWARD, FE_TOWARDZERO};

// The host's text conversion rounds once, in the direction in force.
void ExpectStoredAsText(const PackedDecimal& record) {
    char text[64] = {record.sign != 0 ? '-' : '+'};
    char* at = text + 1;
    for (int digit = 17; digit >= 0; --digit)
        *at++ = static_cast<char>('0' + (record.mantissa[digit / 2] >> (digit % 2 * 4) & 15));
    std::snprintf(at, 16, "e%d", record.exponent);
    FPLoadPDR(&record);
    EXPECT_EQ(Pop(), std::strtold(text, nullptr)) << text;
    for (const int direction : kDirections) {
        if (record.exponent > 4900) break;  // infinite already as an extended value
        std::fesetround(direction);
        float single = 0;
        FPLoadPDR(&record);
        EXPECT_EQ(Stored(FPStoreFlt64), std::strtod(text, nullptr)) << text << ", direction " << direction;
        FPLoadPDR(&record);
        FPRToNum(kNumSingle, &single);
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
    const Real stored = Stored(store);
    const int status = CheckFPStat();
    std::feclearexcept(FE_ALL_EXCEPT);
    const volatile Real host = static_cast<Real>(x);
    const int raised = std::fetestexcept(kFlags);
    EXPECT_EQ(stored, host) << x;
    const int expected = ((raised & FE_INEXACT) != 0 ? kFPStatInexact : 0) |
                         ((raised & FE_UNDERFLOW) != 0 ? kFPStatUnderflow : 0) |
                         ((raised & FE_OVERFLOW) != 0 ? kFPStatOverflow : 0) |
                         (std::fpclassify(stored) == FP_SUBNORMAL ? kFPStatDenormal : 0);
    EXPECT_EQ(status & (kFPStatInexact | kFPStatUnderflow | kFPStatOverflow | kFPStatDenormal), expected) << x;
}

TEST_F(Registers, NarrowStoresRoundAsTheHost) {
    std::mt19937_64 random(42);
    for (int i = 0; i < 20000; ++i) {
        std::fesetround(kDirections[i % 4]);
        const uint64 mask = random() % 2 != 0 ? ~uint64{0} : ~uint64{0} << random() % 64;  // ties and exact values
        const auto mantissa = static_cast<Extended>((random() | uint64{1} << 63) & mask);
        const Extended sign = random() % 2 != 0 ? 1 : -1;
        const int exponent = static_cast<int>(random() % 64);
        for (const int end : {1024 - 32, -1022 - 62})
            ExpectStoredAsTheHost<double>(sign * std::scalbn(mantissa, end + exponent - 63), FPStoreFlt64);
        for (const int end : {128 - 32, -126 - 33})
            ExpectStoredAsTheHost<float>(sign * std::scalbn(mantissa, end + exponent - 63), FPStoreFlt32);
    }
    std::fesetround(FE_TONEAREST);
}

// ---- operations -----------------------------------------------------------------------------------------------------

// What an operation makes of what is pushed, which leaves nothing else behind.
Extended Of(void (*operation)(), const std::vector<Extended>& operands) {
    for (const Extended operand : operands) Push(operand);
    operation();
    const Extended result = Pop();
    EXPECT_EQ(FPCheck(), 1);
    return result;
}

TEST_F(Registers, RealOperations) {
    EXPECT_EACH(Of(LogX, {2, 8}) == 3, Of(LogX, {10, 0}) == -INFINITY, Of(Log2, {0.125L}) == -3,
                Of(Log10, {1e20L}) == 20, Of(LogN, {1}) == 0, Of(LogN, {0}) == -INFINITY, std::isnan(Of(LogN, {-1})),
                Of(Lognp1, {-1}) == -INFINITY, Of(ExpX, {0}) == 1, Of(_F2X, {-3}) == 0.125L,
                Of(_F2XM1, {0x1p-70L}) == 0x1p-70L * 0.69314718055994530942L, Of(Pow10X, {3}) == 1000,
                Of(Pow2X, {10}) == 1024, Of(PowerX, {2, 0.5L}) == 1.41421356237309504880L,
                Of(ScaleX, {3, -1.9L}) == 1.5L, Of(ScaleX, {3, 1e30L}) == INFINITY, Of(FloorX, {-1.5L}) == -2,
                Of(CeilX, {-1.5L}) == -1, Of(SignX, {-1e-4900L}) == -1, Of(SinX, {0}) == 0, Of(CosX, {0}) == 1,
                Of(TanX, {0}) == 0, Of(ATanX, {-1, 0}) == 3.14159265358979323851L, Of(SincX, {0}) == 1,
                Of(RecipX, {-4}) == -0.25L);
    EXPECT_EACH(Of(Sinh, {0}) == 0, Of(Cosh, {0}) == 1, Of(Tanh, {INFINITY}) == 1, Of(Asinh, {0}) == 0,
                Of(Acosh, {1}) == 0, Of(Atanh, {1}) == INFINITY, Of(ASinX, {1}) == 1.57079632679489661926L,
                Of(ACosX, {1}) == 0, Of(FPIsInt, {-7}) == 1, Of(FPIsInt, {0.5L}) == 0, Of(FPIsInt, {INFINITY}) == 0,
                Of(FPCompareExt, {1, 2}) == -1, Of(FPCompareExt, {0.0L, -0.0L}) == 0,
                Of(FPCompareExt, {INFINITY, 2}) == 1);
    Push(-40);
    FMantExpX();
    EXPECT_EACH(Pop() == -1.25L, Pop() == 5);
}

TEST_F(Registers, ComplexOperations) {
    using Operation = void (*)();
    const std::pair<Operation, Operation> inverses[] = {{ComplexRToP, ComplexPToR},  {ComplexRecip, ComplexRecip},
                                                        {ComplexSin, ComplexAsin},   {ComplexCos, ComplexAcos},
                                                        {ComplexTan, ComplexAtan},   {ComplexSinh, ComplexAsinh},
                                                        {ComplexCosh, ComplexAcosh}, {ComplexTanh, ComplexAtanh}};
    const auto near = [](Extended exact) { return std::fabs(Pop() - exact) < 1e-18L; };
    for (const auto& [there, back] : inverses) {
        Push(0.5L);  // imaginary
        Push(0.75L);
        there();
        back();
        EXPECT_EACH(near(0.75L), near(0.5L), FPCheck() == 1);
    }
    for (const Extended part : {2, 1, -4, 3}) Push(part);  // 1 + 2i, divided by 3 - 4i
    ComplexDivide();
    EXPECT_EACH(Pop() == -0.2L, Pop() == 0.4L);
    Push(1);  // the sine of i
    Push(0);
    ComplexSincos();
    EXPECT_EACH(Pop() == 0, Pop() == std::sinh(1.0L), near(std::cosh(1.0L)), Pop() == 0);
    Push(0);
    Push(0);
    ComplexSinc();
    EXPECT_EACH(Pop() == 1, Pop() == 0);
    Push(0);
    Push(1);
    ComplexCot();
    EXPECT_TRUE(near(0.642092615934330703006L));
    FPPop();
}

TEST_F(Registers, FromMemoryToMemory) {
    const float f8 = 8, f2 = 2;
    float logx = 0, log2 = 0;
    const double ten = 10, thousand = 1000;
    double real[5] = {};
    floatExt e, one;
    FLogX32(&f2, &f8, &logx);
    FLog2_32(&f8, &log2);
    FLog10_64(&thousand, &real[0]);
    FLogX64(&ten, &thousand, &real[1]);
    FScaleX64(&thousand, &ten, &real[2]);
    FATan2_64(&ten, &ten, &real[3]);
    FPowerX64(&ten, &ten, &real[4]);
    FExpXExt(EOne(), &e);
    FLogNExt(&e, &one);
    EXPECT_EACH(logx == 3, log2 == 3, ToExtended(e) == 2.71828182845904523536L, ToExtended(one) == 1);
    EXPECT_THAT(real, testing::ElementsAre(3, 3, 1024000, std::atan(1.0), 1e10));
    cmplx128 z = {-3, 0};
    FComplexRToP64(&z, &z);
    EXPECT_EACH(z.re == 3, z.im == std::acos(-1.0));
    FComplexPToR64(&z, &z);
    EXPECT_EACH(z.re == -3, FPCheck() == 1);
}

// ---- sums -----------------------------------------------------------------------------------------------------------

template <class T>
T Sum(void (*sum)(const T*, int32, int32, T*), const T* first, int32 step, int32 count) {
    T total{};
    sum(first, step * static_cast<int32>(sizeof(T)), count, &total);
    return total;
}

TEST(Sums, AreAccumulatedInExtendedPrecisionWithAnyStep) {
    const double values[] = {1e20, 3.5, 1, 99, -1e20, 99}, doubles[] = {0x1p53, 1, -0x1p53};
    std::vector<float> singles(10001, 1e-5f);
    singles[0] = 1;
    const floatExt extended[] = {FromExtended(0x1p-4000L), FromExtended(1e4000L)};
    EXPECT_EACH(
        Sum(Sum1DDoubleArray, values, 2, 3) == 0, Sum(Sum1DDoubleArray, values + 3, -1, 3) == 103.5,
        Sum(Sum1DDoubleArray, values, 1, 0) == 0, Sum(Sum1DDoubleArray, doubles, 1, 3) == 1,
        Sum(Sum1DSingleArray, singles.data(), 1, 10001) == static_cast<float>(1 + 1e4 * static_cast<double>(1e-5f)),
        ToExtended(Sum(Sum1DExtendedArray, extended, 1, 2)) == 1e4000L);
}

}  // namespace
