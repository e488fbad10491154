// Text to numbers and back: nothing is read outside the text or written outside the buffer, a real is what strtod makes
// of it, and an integer is what arithmetic in 128 bits makes of it, from memory and from a character source.
//
// Input: four bytes (type code, radix, size of a buffer, format code), then the text.
#include <tessel/diagnostics/DebugOutput.h>
#include <tessel/numerics/FloatingPointRegisters.h>
#include <tessel/numerics/NumericSupport.h>
#include <tessel/strings/NumericText.h>

#include <algorithm>
#include <cctype>
#include <cstdlib>
#include <cstring>
#include <string>
#include <vector>

namespace {

__extension__ using Wide = __int128;

void Quiet(CStr, int32, CStr, int32, uint32, CStr) {
}

void Check(bool good) {
    if (!good) std::abort();
}

// ---- reals ----------------------------------------------------------------------------------------------------------

size_t CountWhile(const std::string& text, size_t& at, int (*is)(int)) {
    const size_t start = at;
    while (at < text.size() && is(static_cast<unsigned char>(text[at]))) ++at;
    return at - start;
}

// Digits with an optional point, an optional exponent of up to four digits, and no more digits than a record has.
bool IsPlainNumber(const std::string& text) {
    size_t at = !text.empty() && (text[0] == '-' || text[0] == '+') ? 1 : 0;
    size_t digits = CountWhile(text, at, std::isdigit);
    if (at < text.size() && text[at] == '.') digits += CountWhile(text, ++at, std::isdigit);
    if (digits == 0 || digits > kPackedDecimalDigits) return false;
    if (at < text.size() && (text[at] == 'e' || text[at] == 'E')) {
        ++at;
        if (at < text.size() && (text[at] == '-' || text[at] == '+')) ++at;
        const size_t exponentDigits = CountWhile(text, at, std::isdigit);
        if (exponentDigits == 0 || exponentDigits > 4) return false;
    }
    return at == text.size();
}

void CheckReal(const std::string& text, int32 size, int8 formatCode) {
    const std::vector<char> exact(text.begin(), text.end());
    PackedDecimal record;
    const bool whole = StringToPacked(exact.data(), static_cast<int32>(exact.size()), &record, '.');
    Check(record.mdigits >= 0 && record.mdigits <= kPackedDecimalDigits);
    Check(record.sign == 0 || record.sign == kPackedDecimalNegativeSign);
    for (const uint8 pair : record.mantissa) Check((pair & 15) <= 9 && pair >> 4 <= 9);

    double value = 0;
    FPInit();
    FPLoadPDR(&record);
    FPStoreFlt64(&value);
    if (IsPlainNumber(text)) {
        const double expected = std::strtod(text.c_str(), nullptr);
        Check(whole && std::memcmp(&value, &expected, sizeof value) == 0);
    }

    std::vector<char> buffer(static_cast<size_t>(size));
    Check(PackedToString(&record, formatCode, buffer.data(), size, '.') <= size);
    const int16 code = formatCode;
    const int32 length = NumToAnyString(&value, kNumDouble, &code, buffer.data(), size, '.', nullptr);
    Check(size == 0 ? length == 0 : length < size && buffer[static_cast<size_t>(length)] == 0);
}

// ---- integers -------------------------------------------------------------------------------------------------------

class StringSource final : public tessel::CharacterSource {
public:
    explicit StringSource(const std::string& text) : text_(text) {}
    uint8 Current() const override {
        Check(at_ < text_.size());
        return static_cast<uint8>(text_[at_]);
    }
    void Advance() override { ++at_; }
    void StepBack(int32 count) override { at_ -= static_cast<size_t>(count); }
    size_t At() const { return at_; }

private:
    const std::string& text_;
    size_t at_ = 0;
};

struct Parsed {
    Wide value;
    size_t read;
};

// Radix 10: the number, held at the limits of the type.
Parsed Expected(const std::string& text, Wide least, Wide most) {
    constexpr Wide kFar = Wide{1} << 100;
    size_t at = text.find_first_not_of(' ');
    if (at == std::string::npos) return {0, 0};
    const bool negative = text[at] == '-';
    if (negative || text[at] == '+') ++at;
    const size_t start = at;
    Wide value = 0;
    for (; at < text.size() && std::isdigit(static_cast<unsigned char>(text[at])); ++at) {
        value = std::min(10 * value + (text[at] - '0'), kFar);
    }
    if (at == start) return {0, 0};
    return {std::clamp(negative ? -value : value, least, most), at};
}

void CheckInteger(const std::string& text, int16 type, int32 radix) {
    const std::vector<char> exact(text.begin(), text.end());
    const auto length = static_cast<int32>(exact.size());
    const char* cursor = exact.data();
    const int64 value = StringToNum64(&cursor, length, type, radix, false);
    const auto read = static_cast<size_t>(cursor - exact.data());

    StringSource source(text);
    Check(tessel::StringToNumQ(source, length, type, radix, false) == value && source.At() == read);
    if (NumSize(type) < 8) {
        cursor = exact.data();
        const int32 narrow = StringToNum32(&cursor, length, type, radix, false);
        Check(static_cast<uint32>(narrow) == static_cast<uint32>(value));
        Check(static_cast<size_t>(cursor - exact.data()) == read);
    }
    if (radix == 10) {
        const int bits = 8 * NumSize(type);
        const bool isSigned = type <= kNumInt64;
        const Wide most = (Wide{1} << (isSigned ? bits - 1 : bits)) - 1;
        const Parsed expected = Expected(text, isSigned ? -most - 1 : 0, most);
        Check(expected.read == read && static_cast<int64>(expected.value) == value);
    }
}

}  // namespace

extern "C" int LLVMFuzzerTestOneInput(const uint8* data, size_t length) {
    constexpr size_t kHeader = 4;
    if (length < kHeader) return 0;
    DebugOutputSetHandler(Quiet);
    const std::string text(reinterpret_cast<const char*>(data + kHeader), length - kHeader);
    CheckReal(text, data[2], static_cast<int8>(data[3]));
    CheckInteger(text, static_cast<int16>(kNumInt8 + data[0] % 8), data[1] % 2 == 0 ? 10 : data[1] % 40);
    return 0;
}
