// Text to numbers.
#include "support/Test.h"
#include <tessel/numerics/FloatingPointConstants.h>
#include <tessel/numerics/FloatingPointRegisters.h>
#include <tessel/strings/NumericText.h>

#include <cerrno>
#include <cinttypes>
#include <cmath>
#include <cstdio>

namespace {

// The digits of a record as an integer.
int64 DigitsOf(const PackedDecimal& record) {
    int64 digits = 0;
    for (int i = 8; i >= 0; --i) digits = 100 * digits + (record.mantissa[i] >> 4) * 10 + (record.mantissa[i] & 15);
    return digits;
}

double ValueOf(const PackedDecimal& record) {
    double value = 0;
    FPLoadPDR(&record);
    FPStoreFlt64(&value);
    return value;
}

TEST(NumericTextParse, RealsIntoRecords) {
    const struct {
        std::string_view text;
        bool whole;
        int64 digits;
        int exponent;
        int count;
        bool negative = false;
    } cases[] = {
        {"-12.5e3", true, 125, 2, 3, true},
        {"12abc", false, 12, 0, 2},
        {"  12", false, 12, 0, 2},
        {"12  ", true, 12, 0, 2},
        {"1 234", false, 1, 0, 1},  // a digit after a space ends the number
        {"1 e3", true, 1, 3, 1},
        {"1.5 3", true, 15, -1, 2},
        {"0.00125", true, 125, -5, 3},
        {"1e12345", true, 1, 1234, 1},
        {"007", true, 7, 0, 1},
        {"+ 3", true, 3, 0, 1},
        {"++3", false, 0, 0, 1},
        {"-0", true, 0, 0, 1, true},
        {"", true, 0, 0, 1},
        {"abc", false, 0, 0, 1},
        {"3e", true, 3, 0, 1},
        {"3e+", true, 3, 0, 1},
        {"3e- 2", true, 3, -2, 1},
        {"3e-2x", false, 3, -2, 1},
        {"3;5", true, 35, -1, 2},  // the decimal point given
        {"3,5", false, 3, 0, 1},
        {"123456789012345678901", true, 123456789012345678, 3, 18},
        {"0.000123456789012345678901", true, 123456789012345678, -21, 18},
        {std::string_view("5\0"
                          "7",
                          3),
         true, 5, 0, 1},  // a zero byte ends the text
    };
    for (const auto& c : cases) {
        PackedDecimal record;
        EXPECT_EQ(StringToPacked(c.text.data(), static_cast<int32>(c.text.size()), &record, ';'), c.whole) << c.text;
        EXPECT_EQ(DigitsOf(record), c.digits) << c.text;
        EXPECT_EQ(record.exponent, c.exponent) << c.text;
        EXPECT_EQ(record.mdigits, c.count) << c.text;
        EXPECT_EQ(record.sign, c.negative ? 0x80 : 0) << c.text;
    }
}

TEST(NumericTextParse, SpecialValues) {
    const struct {
        std::string_view text;
        bool whole;
        int exponent;
        bool negative = false;
    } cases[] = {{"inf", true, 32767},    {"-Inf", true, 32767, true}, {"infinity", false, 32767},
                 {"NaN", true, 32766},    {"-nan", true, 32766, true}, {"in", false, 0},
                 {"x inf", false, 32767}, {"+nano", false, 32766}};
    for (const auto& c : cases) {
        PackedDecimal record;
        EXPECT_EQ(StringToPacked(c.text.data(), static_cast<int32>(c.text.size()), &record, '.'), c.whole) << c.text;
        EXPECT_EQ(record.exponent, c.exponent) << c.text;
        EXPECT_EQ(record.sign, c.negative ? 0x80 : 0) << c.text;
    }
}

// Eighteen digits or fewer: nothing is cut, so the value is strtod's.
TEST(NumericTextParse, RandomRealsAgreeWithStrtod) {
#if defined(__SANITIZE_ADDRESS__) || defined(__SANITIZE_THREAD__) || !defined(__x86_64__)
    constexpr int kCount = 20000;
#else
    constexpr int kCount = 1000000;
#endif
    std::mt19937_64 random(21);
    int differing = 0;
    for (int i = 0; i < kCount; ++i) {
        const uint64 digits = random() % 1000000000000000000 >> (random() % 60);
        char text[64];
        if (i % 3 == 0) {
            std::snprintf(text, sizeof text, "%" PRIu64 ".%" PRIu64, digits % 1000000, random() % 100000000000);
        } else {
            const int exponent =
                i % 3 == 1 ? static_cast<int>(random() % 700) - 360 : static_cast<int>(random() % 50) - 25;
            std::snprintf(text, sizeof text, "%" PRIu64 "e%d", digits, exponent);
        }
        PackedDecimal record;
        ASSERT_TRUE(StringToPacked(text, static_cast<int32>(std::string_view(text).size()), &record, '.')) << text;
        if (ValueOf(record) != std::strtod(text, nullptr) && differing++ < 5) ADD_FAILURE() << text;
    }
    EXPECT_EQ(differing, 0);
}

TEST(NumericTextParse, SeventeenDigitsComeBackAsTheSameDouble) {
    std::mt19937_64 random(22);
    for (int i = 0; i < 50000; ++i) {
        const uint64 bits = random();
        double value = 0;
        std::memcpy(&value, &bits, sizeof value);
        if (!std::isfinite(value)) continue;
        char text[64];
        const int16 format = 17;
        const int32 length = NumToAnyString(&value, kNumDouble, &format, text, sizeof text, '.', nullptr);
        PackedDecimal record;
        ASSERT_TRUE(StringToPacked(text, length, &record, '.'));
        ASSERT_EQ(ValueOf(record), value) << text;
    }
}

// ---- integers -------------------------------------------------------------------------------------------------------

struct IntegerCase {
    std::string_view text;
    int16 type;
    int32 radix;
    int64 value;
    size_t read;
    bool noSign = false;
};

constexpr IntegerCase kIntegerCases[] = {
    {"300", kNumInt8, 10, 127, 3},
    {"-300", kNumInt8, 10, -128, 4},
    {"FF", kNumInt8, 16, 255, 2},
    {"1FF", kNumInt8, 16, 127, 3},
    {"1FFFF", kNumUInt16, 16, 0xFFFF, 5},
    {"   ", kNumInt32, 10, 0, 0},
    {"  +x", kNumInt32, 10, 0, 0},
    {"99999999999", kNumInt32, 10, 2147483647, 11},
    {"-99999999999", kNumInt32, 10, -2147483648LL, 12},
    {"-2147483648", kNumInt32, 10, -2147483648LL, 11},
    {"ffffffff", kNumInt32, 16, -1, 8},
    {"1ffffffff", kNumInt32, 16, 0x7FFFFFFF, 9},
    {"-1", kNumInt16, 16, -1, 2},
    {"-F", kNumUInt8, 16, -15, 2},
    {"-5", kNumUInt8, 10, 0, 2},
    {"-5", kNumUInt8, 10, 0, 0, true},
    {"  42 ", kNumUInt8, 10, 42, 4},
    {"1289", kNumInt32, 8, 10, 2},
    {"zZ/", kNumInt32, 36, 35 * 36 + 35, 2},
    {"12", kNumInt32, 1, 0, 0},
};

TEST(NumericTextParse, IntegersOfUpTo32Bits) {
    for (const IntegerCase& c : kIntegerCases) {
        const char* cursor = c.text.data();
        const auto length = static_cast<int32>(c.text.size());
        EXPECT_EQ(StringToNum32(&cursor, length, c.type, c.radix, c.noSign), c.value) << c.text;
        EXPECT_EQ(static_cast<size_t>(cursor - c.text.data()), c.read) << c.text;
    }
    const char* cursor = "4294967299";
    EXPECT_EQ(static_cast<uint32>(StringToNum32(&cursor, 10, kNumUInt32, 10, false)), 4294967295u);
    cursor = "123456";
    EXPECT_EQ(StringToNum32(&cursor, 3, kNumInt32, 10, false), 123) << "no further than the length";
}

TEST(NumericTextParse, IntegersOf64Bits) {
    const struct {
        std::string_view text;
        int16 type;
        int32 radix;
        uint64 value;
    } cases[] = {
        {"99999999999999999999", kNumInt64, 10, 0x7FFFFFFFFFFFFFFF},
        {"-99999999999999999999", kNumInt64, 10, 0x8000000000000000},
        {"18446744073709551615", kNumUInt64, 10, 0xFFFFFFFFFFFFFFFF},
        {"18446744073709551616", kNumUInt64, 10, 0xFFFFFFFFFFFFFFFF},
        {"FFFFFFFFFFFFFFFE", kNumInt64, 16, 0xFFFFFFFFFFFFFFFE},
        {"1FFFFFFFFFFFFFFFE", kNumInt64, 16, 0x7FFFFFFFFFFFFFFF},
        {"FFFFFFFF", kNumUInt32, 16, 0xFFFFFFFF},
        {"-7", kNumInt8, 10, static_cast<uint64>(-7)},
        {"-F", kNumUInt8, 16, static_cast<uint64>(-15)},
        {"-1FFFF", kNumUInt16, 16, static_cast<uint64>(-0xFFFF)},
    };
    for (const auto& c : cases) {
        const char* cursor = c.text.data();
        const int64 value = StringToNum64(&cursor, static_cast<int32>(c.text.size()), c.type, c.radix, false);
        EXPECT_EQ(static_cast<uint64>(value), c.value) << c.text;
        EXPECT_EQ(cursor, c.text.data() + c.text.size());
    }
}

TEST(NumericTextParse, RandomIntegersAgreeWithStrtoll) {
    std::mt19937_64 random(23);
    for (int i = 0; i < 50000; ++i) {
        const auto radix = static_cast<int32>(2 + random() % 35);
        std::string text = random() % 2 == 0 ? "-" : "";
        for (uint64 n = random() % 22; n > 0; --n) text += "0123456789abcdefghijklmnopqrstuvwxyzQ"[random() % 37];
        const char* cursor = text.c_str();
        const int64 value = StringToNum64(&cursor, static_cast<int32>(text.size()), kNumInt64, radix, false);
        char* end = nullptr;
        errno = 0;
        const int64 expected = radix == 10 ? std::strtoll(text.c_str(), &end, 10)
                                           : static_cast<int64>(std::strtoull(text.c_str(), &end, radix));
        if (radix == 16 && text.find("0x") < 2) continue;  // strtoull takes a prefix
        ASSERT_EQ(cursor, end) << text << " radix " << radix;
        if (errno == ERANGE && radix != 10) {
            ASSERT_EQ(value, text[0] == '-' ? -INT64_MAX : INT64_MAX) << text << " radix " << radix;
        } else {
            ASSERT_EQ(value, expected) << text << " radix " << radix;
        }
    }
}

class StringSource final : public tessel::CharacterSource {
public:
    explicit StringSource(std::string_view text) : text_(text) {}
    uint8 Current() const override { return static_cast<uint8>(text_.at(at_)); }  // throws beyond the text
    void Advance() override { ++at_; }
    void StepBack(int32 count) override { at_ -= static_cast<size_t>(count); }
    size_t At() const { return at_; }

private:
    std::string_view text_;
    size_t at_ = 0;
};

TEST(NumericTextParse, SourcesParseAsMemoryDoes) {
    for (const IntegerCase& c : kIntegerCases) {
        const auto length = static_cast<int32>(c.text.size());
        StringSource source(c.text);
        EXPECT_EQ(tessel::StringToNumL(source, length, c.type, c.radix, c.noSign), c.value) << c.text;
        EXPECT_EQ(source.At(), c.read) << c.text;
    }
    StringSource source("-99999999999999999999");
    EXPECT_EQ(tessel::StringToNumQ(source, 21, kNumInt64, 10, false), INT64_MIN);
}

TEST(NumericTextParse, ClassifiesReals) {
    const struct {
        double value;
        int32 kind;
    } cases[] = {{1.5, kFloatFinite}, {INFINITY, kFloatInfinity}, {-INFINITY, kFloatNegInfinity}, {-NAN, kFloatNaN}};
    for (const auto& c : cases) {
        const auto single = static_cast<float>(c.value);
        EXPECT_EACH(ClassifyFloatNumber(&c.value, kNumDouble) == c.kind,
                    ClassifyFloatNumber(&single, kNumSingle) == c.kind);
        EXPECT_EQ(ClassifyFloatNumber(&c.value, kNumComplexDouble), kFloatFinite) << "other types are finite";
    }
    EXPECT_EACH(ClassifyFloatNumber(ENaN(), kNumExtended) == kFloatNaN,
                ClassifyFloatNumber(ENegInfinity(), kNumExtended) == kFloatNegInfinity);
}

}  // namespace
