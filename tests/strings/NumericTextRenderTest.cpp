// Numbers to text.
#include "numerics/Extended.h"
#include "support/Test.h"
#include <tessel/numerics/NumericSupport.h>
#include <tessel/strings/NumericText.h>

#include <bit>
#include <cinttypes>
#include <cmath>
#include <cstdio>
#include <limits>
#include <type_traits>

namespace {

using namespace tessel::test;

template <class T>
constexpr int16 kCode = std::is_class_v<T>         ? kNumComplexDouble
                        : std::is_same_v<T, float> ? kNumSingle
                        : std::is_same_v<T, double>
                            ? kNumDouble
                            : (std::is_signed_v<T> ? kNumInt8 : kNumUInt8) + std::bit_width(sizeof(T)) - 1;

constexpr int32 kSize = 256;

template <class T>
std::string Text(T value, int16 format, int32 size = kSize, int32* slot = nullptr) {
    std::vector<char> buffer(static_cast<size_t>(size) + 1, '#');
    const int32 length = NumToAnyString(&value, kCode<T>, &format, buffer.data(), size, '.', slot);
    EXPECT_EQ(buffer[static_cast<size_t>(length)], '\0');
    EXPECT_EQ(buffer.back(), '#') << "written past the buffer";
    return {buffer.data(), static_cast<size_t>(length)};
}

template <class T>
std::string IntText(T value, int32 radix, bool isSigned, int32 size = kSize) {
    std::vector<char> buffer(static_cast<size_t>(size) + 1, '#');
    const int32 length = NumToIntString(&value, buffer.data(), size, radix, isSigned, kCode<T>);
    EXPECT_EQ(buffer.back(), '#') << "written past the buffer";
    return {buffer.data(), static_cast<size_t>(length)};
}

// ---- integer formats ------------------------------------------------------------------------------------------------

TEST(NumericTextRender, IntegersInEveryRadix) {
    EXPECT_EACH(IntText<int32>(-255, 16, true) == "FFFFFF01", IntText<int32>(-255, 10, true) == "-255",
                IntText<int32>(-255, 10, false) == "4294967041",
                IntText<int64>(std::numeric_limits<int64>::min(), 10, true) == "-9223372036854775808",
                IntText<uint64>(~uint64{0}, 2, false) == std::string(64, '1'), IntText<int16>(-1, 8, true) == "177777");
    EXPECT_EACH(IntText<int32>(5, 7, true) == "", Text<int8>(-1, kFormatHex) == "FF",
                Text<uint16>(0x1234, kFormatHex) == "1234", Text<int64>(-2, kFormatHex) == "FFFFFFFFFFFFFFFE");
    EXPECT_EACH(Text<uint8>(200, kFormatDecimal) == "200", Text<int8>(-56, kFormatUnsigned) == "200",
                Text<int32>(8, kFormatOctal) == "10", Text<int32>(5, kFormatBinary) == "101");
}

TEST(NumericTextRender, RealsInIntegerFormats) {
    EXPECT_EACH(Text(2.5, kFormatDecimal) == "2", Text(1e10, kFormatDecimal) == "2147483647",
                Text(-1.0, kFormatUnsigned) == "0", Text(-1.0, kFormatHex) == "FFFFFFFFFFFFFFFF",
                Text(1e19, kFormatHex) == "8AC7230489E80000");
    ReportRecorder reports;
    EXPECT_EACH(Text(cmplx128{255, 3}, kFormatHex) == "FF",
                reports.Has(3, "Complex number can't be shown in bin/hex/oct"),
                Text(cmplx128{-7, 3}, kFormatDecimal) == "-7");
}

TEST(NumericTextRender, RandomIntegersAgreeWithToChars) {
    std::mt19937_64 random(11);
    for (int i = 0; i < 20000; ++i) {
        const uint64 bits = random() >> (random() % 64);
        const auto number = static_cast<int64>(random() % 2 == 0 ? bits : 0 - bits);
        EXPECT_EACH(Text(number, kFormatDecimal) == std::to_string(number),
                    Text(static_cast<int32>(number), kFormatDecimal) == std::to_string(static_cast<int32>(number)),
                    Text(bits, kFormatUnsigned) == std::to_string(bits));
        char hex[32];
        std::snprintf(hex, sizeof hex, "%" PRIX64, bits);
        EXPECT_EQ(Text(bits, kFormatHex), hex);
    }
}

TEST(NumericTextRender, IntegersThatDoNotFitAreCutAtTheFront) {
    const std::string cut =
        "Incomplete conversion in NumToStr: buffer provided was not large enough to represent the number in base ";
    ReportRecorder reports;
    EXPECT_EACH(IntText<int32>(12345, 10, true, 4) == "345", reports.Has(2, cut + "10."),
                IntText<int32>(-1, 16, true, 6) == "FFFFF", reports.Has(2, cut + "16."));
    reports.Clear();
    EXPECT_EACH(IntText<int32>(-123, 10, true, 4) == "123",
                reports.Texts() == std::vector<std::string>{"Unable to include sign in NumToStr: buffer too small."},
                IntText<int32>(-123, 10, true, 5) == "-123");
    reports.Clear();
    EXPECT_EACH(IntText<int32>(7, 10, true, 1) == "",
                reports.Has(2, "NumToStr requires at least 2 bytes in the input buffer."));
}

// ---- reals ----------------------------------------------------------------------------------------------------------

TEST(NumericTextRender, RealsFixedAndExponential) {
    EXPECT_EACH(Text(1234.5678, -2) == "1234.57", Text(1234.5678, 7) == "1.234568E+3", Text(1234.5678, 1) == "1E+3",
                Text(0.5, 0) == "0", Text(1.5, 0) == "2", Text(9.996, -2) == "10.00", Text(9.996, 3) == "1.00E+1",
                Text(0.007, -2) == "0.01", Text(0.004, -2) == "0.00", Text(-0.004, -2) == "-0.00",
                Text(-0.0, 3) == "-0.00E+0", Text(0.0, -3) == "0.000", Text(1e21, 0) == "1000000000000000000000",
                Text(INFINITY, -2) == "Inf", Text(-INFINITY, 5) == "-Inf", Text(-NAN, 5) == "NaN");
    EXPECT_EACH(Text(123456789012345678901.0, -1) == "123456789012345684000.0",               // 18 digits are exact
                Text(1e308, -2) == "1.00E+308", Text(0.1, 20) == "1.0000000000000001000E-1",  // 17 digits, then zeros
                Text(5e-324, 4) == "4.941E-324", Text(1.0, -63) == "1." + std::string(63, '0'));
    EXPECT_EQ(Text(0.1f, 9), "1.00000001E-1") << "a single is rendered as what it is";
    EXPECT_EQ(Text<int32>(1234, -2), "1234.00");
    const floatExt huge = tessel::FromExtended(1.5e4900L);
    char buffer[64];
    const int16 format = 3;
    NumToAnyString(&huge, kNumExtended, &format, buffer, sizeof buffer, ',', nullptr);
    EXPECT_STREQ(buffer, "1,50E+4900");
}

TEST(NumericTextRender, WideIntegersInRealFormatsAreExact) {
    EXPECT_EACH(Text<int64>(9007199254740993, -1) == "9007199254740993.0",
                Text<int64>(std::numeric_limits<int64>::min(), 20) == "-9.2233720368547758080E+18",
                Text<uint64>(12345, 3) == "1.23E+4");
    EXPECT_EACH(Text<uint64>(12350, 3) == "1.24E+4", Text<uint64>(99995, 4) == "1.000E+5", Text<int64>(7, 1) == "7E+0");
}

// The described way scales in extended precision before it rounds; where that meets a tie the exact value does not,
// either neighbour is right. Ours rounds the exact value, as printf does, so nothing may differ.
TEST(NumericTextRender, RandomDoublesAgreeWithPrintf) {
#if defined(__SANITIZE_ADDRESS__) || defined(__SANITIZE_THREAD__) || !defined(__x86_64__)
    constexpr int kCount = 20000;
#else
    constexpr int kCount = 1000000;
#endif
    std::mt19937_64 random(12);
    int differing = 0;
    for (int i = 0; i < kCount; ++i) {
        const uint64 bits = random();
        double value = 0;
        if (i % 4 == 0) {
            std::memcpy(&value, &bits, sizeof value);
            if (!std::isfinite(value)) continue;
        } else if (i % 4 == 1) {
            value = static_cast<double>(static_cast<int64>(bits) >> (bits % 60)) / 4096;  // many exact ties
        } else {
            value = std::ldexp(static_cast<double>(static_cast<int64>(bits)), -static_cast<int>(60 + bits % 30));
        }
        char expected[400];
        int16 format = 0;
        if (i % 2 == 0) {
            format = static_cast<int16>(1 + bits % 17);
            std::snprintf(expected, sizeof expected, "%.*e", format - 1, value);
            char* exponent = std::strchr(expected, 'e');  // as ours: upper case, no leading zeros
            std::snprintf(exponent, 8, "E%+d", std::atoi(exponent + 1));
        } else {
            format = static_cast<int16>(-static_cast<int>(bits % 8));
            std::snprintf(expected, sizeof expected, "%.*f", -format, value);
            if (std::fabs(value) >= 1e10) continue;  // more than 18 digits in all
        }
        if (Text(value, format) != expected && differing++ < 5) ADD_FAILURE() << Text(value, format) << " " << expected;
    }
    EXPECT_EQ(differing, 0);
}

// ---- engineering and SI notation ------------------------------------------------------------------------------------

TEST(NumericTextRender, EngineeringAndSI) {
    EXPECT_EACH(Text(0.000123, 133) == "123.00E-6", Text(0.000123, 102) == "123.00u", Text(1e30, 102) == "1.00E+30",
                Text(1234.5, 101) == "1.2k", Text(999.96, 101) == "1.0k", Text(9.996, 102) == "10.00",
                Text(99.96, 132) == "100.0E+0", Text(-47e3, 100) == "-47k", Text(1e-24, 100) == "1y",
                Text(2.5e24, 101) == "2.5Y", Text(1e-27, 100) == "1E-27", Text(0.0, 102) == "0.00",
                Text(INFINITY, 102) == "Inf", Text(-INFINITY, 133) == "-Inf", Text(3e-9, 131) == "3E-9");
    EXPECT_EACH(Text<int64>(12345678, 102) == "12.35M", Text(1.0, 130) == "1." + std::string(30, '0'));
}

TEST(NumericTextRender, SharedExponentTakesTheSuffix) {
    int32 slot = 0;
    const auto text = [&](auto value, int16 format, int32 unit) {
        return slot = unit, Text(value, format, kSize, &slot);
    };
    EXPECT_EACH(text(12346.0, 102, 0) == "12.35", slot == 3, text(1e30, 133, 0) == "1.00E+30", slot == 0,  // too far
                text(12346.0, 102, kNoSharedExponent) == "12.35E+3",  // as if there were no slot, and no SI prefix
                text(cmplx128{1500, 2500}, 133, 0) == "1.50 +2.50 i", slot == 3,
                text(cmplx128{1500, 2.5}, 133, 0) == "1.50 +2.50E+0 i", slot == 3,
                text(cmplx128{1.5, -2.5}, 133, 6) == "1.50 -2.50 i", slot == 6);
}

// ---- complex values and odd codes -----------------------------------------------------------------------------------

TEST(NumericTextRender, ComplexValues) {
    EXPECT_EACH(Text(cmplx128{1.5, -2.25}, -2) == "1.50 -2.25 i", Text(cmplx128{1.5, 2.25}, -2) == "1.50 +2.25 i",
                Text(cmplx128{0, NAN}, -1) == "0.0 +NaN i", Text(cmplx128{0, -INFINITY}, -1) == "0.0 -Inf i",
                Text(cmplx128{3, 4}, -102) == "5.00 arg 0.93", Text(cmplx128{-0.0, 0}, -102) == "0.00 arg 0.00",
                Text(cmplx128{3000, 0.004}, 101) == "3.0k +4.0m i");
    char complex[16], real[16];
    const int16 format = 64;
    NumToAnyString(nullptr, kNumComplexSingle, &format, complex, sizeof complex, '.', nullptr);
    NumToAnyString(nullptr, kNumDouble, &format, real, sizeof real, '.', nullptr);
    EXPECT_EACH(complex == "0 + 0i", real == "0");
}

TEST(NumericTextRender, CodesOutsideTheTable) {
    ReportRecorder reports;
    EXPECT_EACH(Text(1.5, 69) == "1.5" + std::string(67, '0') + "E+0", reports.Has(2, "Bad k_code: 69"),
                Text(1.5, -64) == "1.5" + std::string(62, '0'), reports.Has(2, "Bad k_code: -64"),
                Text(1.5, 250) == "");
    for (const int16 code : {299, 600}) EXPECT_EQ(Text(cmplx128{1, 2}, code), "1.000000 +2.000000 i");
    EXPECT_EACH(reports.Has(2, "Wrong k-code in SetFormat function 299"),
                reports.Has(2, "Wrong output k-code in SetFormat function:600"));
}

TEST(NumericTextRender, TextThatDoesNotFit) {
    ReportRecorder reports;
    EXPECT_EACH(Text(123456.0, -2, 10) == "1.2E+5", Text(3.0, 9, 10) == "3.0E+0", reports.Count() == 0u,
                Text<int64>(1234567, -2, 6) == "12345", reports.Has(4, "buffer overflow"),
                Text(1.25e-9, 135, 8) == "1.2500", reports.Has(4, "buffer overflow imminent"));
}

// ---- decimal records ------------------------------------------------------------------------------------------------

std::string Packed(const PackedDecimal& record, int16 format) {
    char buffer[128];
    const int32 length = PackedToString(&record, format, buffer, sizeof buffer, '.');
    return {buffer, static_cast<size_t>(length)};
}

TEST(NumericTextRender, Records) {
    const auto packed = [](int16 exponent, int32 format, int16 digits = 7) {
        return Packed({{0x78, 0x56, 0x34, 0x12}, 0x80, exponent, digits}, static_cast<int16>(format));
    };
    EXPECT_EACH(packed(-3, -2) == "-12345.67", packed(-3, -5) == "-12345.67800", packed(-3, 5) == "-1.2345E+4",
                packed(-3, 5, 8) == "-1.2345E+4", packed(-10, -4, 8) == "-0.0012", packed(2, -1, 8) == "-1234567800.0",
                packed(-4930, 3, 8) == "-0.00E+0");  // too small to show
    const PackedDecimal record{};
    EXPECT_EQ(PackedToString(&record, 3, nullptr, 0, '.'), 0);
}

TEST(NumericTextRender, CorruptRecordsAreReported) {
    const PackedDecimal record{{0x1A, 0x02}, 0, 5, 2};
    ReportRecorder reports;
    Packed(record, 3);
    EXPECT_EQ(reports.Texts(),
              (std::vector<std::string>{"sign 0, exp 5, mdigits 2, m0x1a0x020x000x000x000x000x000x000x00",
                                        "bad pdr, exp fmt"}));
    Packed(record, -3);
    EXPECT_TRUE(reports.Has(4, "bad pdr, dec fmt"));
    reports.Clear();
    Packed({{0x1A, 0x02}, 0, 306, 2}, -3);
    EXPECT_EQ(reports.Texts(4), std::vector<std::string>{"bad pdr, exp fmt"}) << "too large for the fixed form";
}

TEST(NumericTextRender, SpecialTextsCanBeReplaced) {
    CStr nan = NumSetNaNText("nada"), inf = NumSetInfText("inf");
    EXPECT_EACH(Text(NAN, -2) == "nada", Text(-INFINITY, 102) == "-inf", NumSetNaNText(nan) == "nada");
    NumSetInfText(inf);
    EXPECT_EQ(Text(NAN, -2), "NaN");
}

}  // namespace
