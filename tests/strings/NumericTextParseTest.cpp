// Text to numbers.
#include "support/Test.h"
#include <tessel/numerics/FloatingPointConstants.h>
#include <tessel/numerics/FloatingPointRegisters.h>
#include <tessel/strings/NumericText.h>

#include <bit>
#include <cerrno>
#include <cinttypes>
#include <cmath>
#include <cstdio>

namespace {

double ValueOf(const PackedDecimal& record) {
    double value = 0;
    FPLoadPDR(&record);
    FPStoreFlt64(&value);
    return value;
}

// What a text is read as: its digits, the exponent and how many there are; a mark where not all of it is a number.
std::string Read(std::string_view text) {
    PackedDecimal record;
    const bool whole = StringToPacked(text.data(), static_cast<int32>(text.size()), &record, ';');
    int64 digits = 0;
    for (int i = 8; i >= 0; --i) digits = 100 * digits + (record.mantissa[i] >> 4) * 10 + (record.mantissa[i] & 15);
    return (record.sign == 0x80 ? "-" : "") + std::to_string(digits) + "e" + std::to_string(record.exponent) + ":" +
           std::to_string(record.mdigits) + (whole ? "" : "?");
}

TEST(NumericTextParse, RealsIntoRecords) {
    EXPECT_EACH(Read("-12;5e3") == "-125e2:3", Read("12abc") == "12e0:2?", Read("  12") == "12e0:2?",
                Read("12  ") == "12e0:2", Read("1 234") == "1e0:1?", Read("1 e3") == "1e3:1",
                Read("1;5 3") == "15e-1:2", Read("0;00125") == "125e-5:3", Read("1e12345") == "1e1234:1",
                Read("007") == "7e0:1", Read("+ 3") == "3e0:1", Read("++3") == "0e0:1?", Read("-0") == "-0e0:1",
                Read("") == "0e0:1", Read("abc") == "0e0:1?");
    EXPECT_EACH(Read("3e") == "3e0:1", Read("3e+") == "3e0:1", Read("3e- 2") == "3e-2:1", Read("3e-2x") == "3e-2:1?",
                Read("3;5") == "35e-1:2", Read("3,5") == "3e0:1?",
                Read("123456789012345678901") == "123456789012345678e3:18",
                Read("0;000123456789012345678901") == "123456789012345678e-21:18",
                Read({"5\0007", 3}) == "5e0:1");  // a zero byte ends the text
    EXPECT_EACH(Read("inf") == "0e32767:1", Read("-Inf") == "-0e32767:1", Read("infinity") == "0e32767:1?",
                Read("NaN") == "0e32766:1", Read("-nan") == "-0e32766:1", Read("in") == "0e0:1?",
                Read("x inf") == "0e32767:1?", Read("+nano") == "0e32766:1?");
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
        const auto value = std::bit_cast<double>(uint64{random()});
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

// Whether so much of a text is read as a value, from memory and from a source.
bool Reads(std::string_view text, int16 type, int32 radix, int64 value, size_t read, bool noSign = false) {
    const char* cursor = text.data();
    const auto length = static_cast<int32>(text.size());
    StringSource source(text);
    return StringToNum32(&cursor, length, type, radix, noSign) == value && cursor == text.data() + read &&
           tessel::StringToNumL(source, length, type, radix, noSign) == value && source.At() == read;
}

// The same of a whole text and 64 bits.
bool ReadsAll(std::string_view text, int16 type, int32 radix, uint64 value) {
    const char* cursor = text.data();
    const auto length = static_cast<int32>(text.size());
    StringSource source(text);
    return static_cast<uint64>(StringToNum64(&cursor, length, type, radix, false)) == value &&
           cursor == text.data() + text.size() &&
           static_cast<uint64>(tessel::StringToNumQ(source, length, type, radix, false)) == value;
}

TEST(NumericTextParse, Integers) {
    EXPECT_EACH(Reads("300", kNumInt8, 10, 127, 3), Reads("-300", kNumInt8, 10, -128, 4),
                Reads("FF", kNumInt8, 16, 255, 2), Reads("1FF", kNumInt8, 16, 127, 3),
                Reads("1FFFF", kNumUInt16, 16, 0xFFFF, 5), Reads("   ", kNumInt32, 10, 0, 0),
                Reads("  +x", kNumInt32, 10, 0, 0), Reads("99999999999", kNumInt32, 10, 2147483647, 11),
                Reads("-99999999999", kNumInt32, 10, -2147483648LL, 12),
                Reads("-2147483648", kNumInt32, 10, -2147483648LL, 11), Reads("ffffffff", kNumInt32, 16, -1, 8),
                Reads("1ffffffff", kNumInt32, 16, 0x7FFFFFFF, 9));
    EXPECT_EACH(Reads("-1", kNumInt16, 16, -1, 2), Reads("-F", kNumUInt8, 16, -15, 2), Reads("-5", kNumUInt8, 10, 0, 2),
                Reads("-5", kNumUInt8, 10, 0, 0, true), Reads("  42 ", kNumUInt8, 10, 42, 4),
                Reads("1289", kNumInt32, 8, 10, 2), Reads("zZ/", kNumInt32, 36, 35 * 36 + 35, 2),
                Reads("12", kNumInt32, 1, 0, 0), Reads("4294967299", kNumUInt32, 10, -1, 10),
                Reads(std::string_view("123456", 3), kNumInt32, 10, 123, 3));
    EXPECT_EACH(ReadsAll("99999999999999999999", kNumInt64, 10, 0x7FFFFFFFFFFFFFFF),
                ReadsAll("-99999999999999999999", kNumInt64, 10, 0x8000000000000000),
                ReadsAll("18446744073709551615", kNumUInt64, 10, 0xFFFFFFFFFFFFFFFF),
                ReadsAll("18446744073709551616", kNumUInt64, 10, 0xFFFFFFFFFFFFFFFF),
                ReadsAll("FFFFFFFFFFFFFFFE", kNumInt64, 16, 0xFFFFFFFFFFFFFFFE),
                ReadsAll("1FFFFFFFFFFFFFFFE", kNumInt64, 16, 0x7FFFFFFFFFFFFFFF),
                ReadsAll("FFFFFFFF", kNumUInt32, 16, 0xFFFFFFFF), ReadsAll("-7", kNumInt8, 10, ~uint64{6}),
                ReadsAll("-F", kNumUInt8, 16, ~uint64{14}), ReadsAll("-1FFFF", kNumUInt16, 16, ~uint64{0xFFFE}));
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

TEST(NumericTextParse, ClassifiesReals) {
    const double values[] = {1.5, INFINITY, -INFINITY, -NAN};
    const int32 kinds[] = {kFloatFinite, kFloatInfinity, kFloatNegInfinity, kFloatNaN};
    for (int i = 0; i < 4; ++i) {
        const auto single = static_cast<float>(values[i]);
        EXPECT_EACH(ClassifyFloatNumber(&values[i], kNumDouble) == kinds[i],
                    ClassifyFloatNumber(&single, kNumSingle) == kinds[i],
                    ClassifyFloatNumber(&values[i], kNumComplexDouble) == kFloatFinite);  // other types are finite
    }
    EXPECT_EACH(ClassifyFloatNumber(ENaN(), kNumExtended) == kFloatNaN,
                ClassifyFloatNumber(ENegInfinity(), kNumExtended) == kFloatNegInfinity);
}

}  // namespace
