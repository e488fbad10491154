// Text to numbers: reals into decimal records, integers in any radix.
#include "base/Compiler.h"
#include "numerics/NumericAccess.h"
#include "strings/NumericTextParts.h"
#include <tessel/strings/NumericText.h>

#include <array>
#include <limits>

namespace tessel {
namespace {

bool IsDigit(char c) {
    return c >= '0' && c <= '9';
}

// ---- reals ----------------------------------------------------------------------------------------------------------

constexpr int32 kMostExponentDigits = 4;
constexpr int32 kLargestExponent = 32765;  // of a finite record
constexpr int32 kFarPoint = 1000000;       // beyond any exponent; keeps the position of the point from overflowing

// A state of the text is a function, which goes on to the next state. Each returns true when a number was read, and
// false when the record holds already what it should (a zero, a special value).
class RealParser {
public:
    RealParser(const char* text, int32 length, char decimalPoint)
        : at_(text), end_(text + std::max(length, int32{0})), decimalPoint_(decimalPoint == 0 ? '.' : decimalPoint) {}

    // True when the whole text was one number.
    bool Parse(PackedDecimal& record) {
        record = {{}, 0, 0, 1};
        if (Start(record)) Finish(record);
        return whole_;
    }

private:
    // The character at the cursor; the end of the text acts as a zero byte.
    char Peek() const { return at_ < end_ ? *at_ : '\0'; }
    bool AtPoint(char c) const { return c == '.' || c == decimalPoint_; }
    static bool IsExponentLetter(char c) { return c == 'E' || c == 'e'; }

    bool Start(PackedDecimal& record) {
        for (;; ++at_) {
            const char c = Peek();
            if (c == '+' || c == '-') {
                ++at_;
                if (c == '-') record.sign = kPackedDecimalNegativeSign;
                return AfterSign(record);
            }
            if (c == 0) return false;
            if (StartsNumber(c)) return Number(c, record);
            if (c != '0') whole_ = false;
        }
    }

    bool AfterSign(PackedDecimal& record) {
        for (;; ++at_) {
            const char c = Peek();
            if (StartsNumber(c)) return Number(c, record);
            if (c != ' ' && c != '0') return Stop(c);
        }
    }

    bool StartsNumber(char c) const {
        return (c >= '1' && c <= '9') || AtPoint(c) || IsExponentLetter(c) || AtWord("inf") || AtWord("nan");
    }

    bool Number(char c, PackedDecimal& record) {
        if (c >= '1' && c <= '9') return Integer();
        if (AtPoint(c)) {
            ++at_;
            point_ = -1;
            return Fraction();
        }
        if (IsExponentLetter(c)) return ExponentLetter();
        record.exponent = AtWord("inf") ? kPackedDecimalInfExponent : kPackedDecimalNaNExponent;
        at_ += 3;
        return Stop(Peek());
    }

    bool AtWord(const char* word) const {
        if (end_ - at_ < 3) return false;
        for (int i = 0; i < 3; ++i) {
            if ((at_[i] | 0x20) != word[i]) return false;
        }
        return true;
    }

    // Takes digits while there is room for them, eight at once where there are as many.
    void KeepDigits() {
        constexpr int32 kEight = 8;
        const char* at = at_;
        int32 count = count_;
        uint64 low = lowDigits_;
        uint64 high = highDigits_;
        uint32 eight = 0;
        while (count <= kPackedDecimalDigits - kEight && end_ - at >= kEight && EightDigits(at, eight)) {
            high = low >> 32;
            low = low << 32 | eight;
            at += kEight;
            count += kEight;
        }
        for (; at < end_ && IsDigit(*at) && count < kPackedDecimalDigits; ++at, ++count) {
            high = high << 4 | low >> 60;
            low = low << 4 | static_cast<uint64>(*at - '0');
        }
        at_ = at;
        count_ = count;
        lowDigits_ = low;
        highDigits_ = high;
    }

    // The digits at `text`, four bits each, the first one highest; false unless they are eight.
    static bool EightDigits(const char* text, uint32& digits) {
        constexpr uint64 kZeros = 0x3030303030303030;
        uint64 bytes = 0;
        std::memcpy(&bytes, text, sizeof bytes);
        const uint64 values = bytes - kZeros;
        if (((values | (bytes + 0x4646464646464646)) & 0x8080808080808080) != 0) return false;
        uint64 packed = __builtin_bswap64(values);
        packed = (packed | packed >> 4) & 0x00FF00FF00FF00FF;
        packed = (packed | packed >> 8) & 0x0000FFFF0000FFFF;
        digits = static_cast<uint32>(packed | packed >> 16);
        return true;
    }

    bool Integer() {
        KeepDigits();
        point_ = count_ - 1;
        if (count_ == kPackedDecimalDigits) return MantissaFull();
        const char c = Peek();
        if (AtPoint(c)) {
            ++at_;
            return Fraction();
        }
        if (IsExponentLetter(c)) return ExponentLetter();
        return c == ' ' ? MantissaFull() : FinishAt(c);
    }

    bool Fraction() {
        if (count_ == 0) {
            for (; Peek() == '0'; ++at_) point_ = std::max(point_ - 1, -kFarPoint);
        }
        KeepDigits();
        const char c = Peek();
        if (count_ == kPackedDecimalDigits || c == ' ') return FractionIgnored();
        return IsExponentLetter(c) ? ExponentLetter() : FinishAt(c);
    }

    // Digits that are not kept raise the exponent. A digit after a space is not part of the number.
    bool MantissaFull() {
        for (; IsDigit(Peek()); ++at_) point_ = std::min(point_ + 1, kFarPoint);
        while (Peek() == ' ') ++at_;
        const char c = Peek();
        if (AtPoint(c)) {
            ++at_;
            return FractionIgnored();
        }
        return IsExponentLetter(c) ? ExponentLetter() : FinishAt(c);
    }

    bool FractionIgnored() {
        for (;; ++at_) {
            const char c = Peek();
            if (c == 0) return true;
            if (IsExponentLetter(c)) return ExponentLetter();
            if (!IsDigit(c) && c != ' ') whole_ = false;
        }
    }

    bool ExponentLetter() {
        ++at_;
        SkipSpaces();
        const char c = Peek();
        if (c == '+' || c == '-') {
            exponentNegative_ = c == '-';
            ++at_;
            SkipSpaces();
        }
        return IsDigit(Peek()) ? ExponentDigits() : FinishAt(Peek());
    }

    bool ExponentDigits() {
        int32 read = 0;
        for (; read < kMostExponentDigits && IsDigit(Peek()); ++read) exponent_ = 10 * exponent_ + (*at_++ - '0');
        return read == kMostExponentDigits || FinishAt(Peek());
    }

    void SkipSpaces() {
        while (Peek() == ' ') ++at_;
    }

    bool FinishAt(char c) {
        if (c != 0) whole_ = false;
        return true;
    }

    bool Stop(char c) {
        FinishAt(c);
        return false;
    }

    void Finish(PackedDecimal& record) {
        const int32 exponent = (exponentNegative_ ? -exponent_ : exponent_) + point_ - count_ + 1;
        record.exponent = static_cast<int16>(std::clamp(exponent, -kLargestExponent, kLargestExponent));
        record.mdigits = static_cast<int16>(count_);
        std::memcpy(record.mantissa, &lowDigits_, sizeof lowDigits_);
        record.mantissa[sizeof lowDigits_] = static_cast<uint8>(highDigits_);
    }

    const char* at_;
    const char* const end_;
    const char decimalPoint_;
    bool whole_ = true;
    uint64 lowDigits_ = 0;  // the digits kept, four bits each
    uint64 highDigits_ = 0;
    int32 count_ = 0;
    int32 point_ = 0;  // the power of ten of the first digit kept
    int32 exponent_ = 0;
    bool exponentNegative_ = false;
};

// ---- integers -------------------------------------------------------------------------------------------------------

constexpr uint8 kNoDigit = 0xFF;

constexpr std::array<uint8, 256> kDigitValues = [] {
    std::array<uint8, 256> values{};
    values.fill(kNoDigit);
    for (int i = 0; i < 10; ++i) values['0' + i] = static_cast<uint8>(i);
    for (int i = 0; i < 26; ++i) values['a' + i] = values['A' + i] = static_cast<uint8>(10 + i);
    return values;
}();

// Text in memory.
class MemoryText {
public:
    MemoryText(const char* text, int32 length) : begin_(text), at_(text), end_(text + std::max(length, int32{0})) {}
    bool AtEnd() const { return at_ == end_; }
    uint8 Current() const { return static_cast<uint8>(*at_); }
    void Advance() { ++at_; }
    void Rewind() { at_ = begin_; }
    const char* At() const { return at_; }

private:
    const char* begin_;
    const char* at_;
    const char* end_;
};

// The characters of a source, up to a length.
class SourceText {
public:
    SourceText(CharacterSource& source, int32 length) : source_(source), length_(length) {}
    bool AtEnd() const { return read_ >= length_; }
    uint8 Current() const { return source_.Current(); }
    void Advance() {
        source_.Advance();
        ++read_;
    }
    void Rewind() {
        if (read_ != 0) source_.StepBack(read_);
    }

private:
    CharacterSource& source_;
    int32 length_;
    int32 read_ = 0;
};

// What an integer is parsed into: its width and whether it is signed.
struct IntegerType {
    int32 bits;
    bool isSigned;
};

IntegerType IntegerTypeOf(int16 typeCode, int32 widest) {
    const int16 type = TypeOfCode(typeCode);
    if (!IsIntegerType(type)) return {32, true};
    return {std::min(IntegerBits(type), widest), IsSignedType(type)};
}

// Magnitude and sign of a text, before they are fitted to the type.
template <class Word>
struct Parsed {
    Word value;
    bool negative;
};

template <class Word>
constexpr Word kSignBit = Word{1} << (8 * sizeof(Word) - 1);

template <class Word>
bool AddDigit(Word& value, uint32 radix, uint32 digit, Word limit) {
    if constexpr (sizeof(Word) < sizeof(uint64)) {
        const uint64 next = uint64{value} * radix + digit;
        if (next > limit) return false;
        value = static_cast<Word>(next);
    } else {
        Word next;
        if (__builtin_mul_overflow(value, Word{radix}, &next) || __builtin_add_overflow(next, Word{digit}, &next) ||
            next > limit) {
            return false;
        }
        value = next;
    }
    return true;
}

template <class Text>
uint32 DigitAt(const Text& text) {
    return text.AtEnd() ? kNoDigit : kDigitValues[text.Current()];
}

template <class Text>
TESSEL_ALWAYS_INLINE bool TakeSign(Text& text) {
    if (text.AtEnd()) return false;
    const uint8 c = text.Current();
    if (c == '+' || c == '-') text.Advance();
    return c == '-';
}

// Reads spaces, sign and digits. The text is left where it was when there is no digit.
template <class Word, class Text>
TESSEL_ALWAYS_INLINE Parsed<Word> ScanInteger(Text& text, bool isSigned, uint32 radix, bool noSign) {
    while (!text.AtEnd() && text.Current() == ' ') text.Advance();
    const bool negative = !noSign && TakeSign(text);
    Word limit = std::numeric_limits<Word>::max();
    if (isSigned && radix == 10) limit = kSignBit<Word> - (negative ? 0 : 1);
    if (DigitAt(text) >= radix) {
        text.Rewind();
        return {0, false};
    }
    Word value = 0;
    for (uint32 digit = DigitAt(text); digit < radix; digit = DigitAt(text)) {
        text.Advance();
        if (AddDigit(value, radix, digit, limit)) continue;
        while (DigitAt(text) < radix) text.Advance();
        return {isSigned && radix != 10 ? kSignBit<Word> - 1 : limit, negative};
    }
    return {value, negative};
}

// In radix 10: the number, held at the limits of the type.
template <class Word>
TESSEL_ALWAYS_INLINE Word FitNumber(const Parsed<Word>& parsed, const IntegerType& type) {
    const Word unsignedMaximum =
        std::numeric_limits<Word>::max() >> (8 * sizeof(Word) - static_cast<size_t>(type.bits));
    if (!type.isSigned) return parsed.negative ? 0 : std::min(parsed.value, unsignedMaximum);
    const Word maximum = unsignedMaximum >> 1;
    return parsed.negative ? Word{0} - std::min<Word>(parsed.value, maximum + 1) : std::min(parsed.value, maximum);
}

// In another radix: the bits, or the largest value of the type when there are too many.
template <class Word>
TESSEL_ALWAYS_INLINE Word FitBits(const Parsed<Word>& parsed, const IntegerType& type) {
    const Word mask = std::numeric_limits<Word>::max() >> (8 * sizeof(Word) - static_cast<size_t>(type.bits));
    Word bits = parsed.value;
    if (bits > mask) bits = type.isSigned ? mask >> 1 : mask;
    return parsed.negative ? Word{0} - bits : bits;
}

template <class Word, class Text>
TESSEL_ALWAYS_INLINE Word ParseInteger(Text& text, const IntegerType& type, int32 radix, bool noSign) {
    if (radix == 10) return FitNumber(ScanInteger<Word>(text, type.isSigned, 10, noSign), type);
    if (radix < 2 || radix > 36) return 0;
    return FitBits(ScanInteger<Word>(text, type.isSigned, static_cast<uint32>(radix), noSign), type);
}

template <class Text>
TESSEL_ALWAYS_INLINE int32 Parse32(Text& text, int16 typeCode, int32 radix, bool noSign) {
    return static_cast<int32>(ParseInteger<uint32>(text, IntegerTypeOf(typeCode, 32), radix, noSign));
}

template <class Text>
TESSEL_ALWAYS_INLINE int64 Parse64(Text& text, int16 typeCode, int32 radix, bool noSign) {
    const IntegerType type = IntegerTypeOf(typeCode, 64);
    if (type.bits == 64) return static_cast<int64>(ParseInteger<uint64>(text, type, radix, noSign));
    const auto value = ParseInteger<uint32>(text, type, radix, noSign);
    const bool hasSign = type.isSigned || type.bits < 32;  // negated, a narrow unsigned value is below 0
    return hasSign ? static_cast<int32>(value) : int64{value};
}

}  // namespace

CharacterSource::~CharacterSource() = default;

int32 StringToNumL(CharacterSource& source, int32 length, int16 typeCode, int32 radix, bool noSign) {
    SourceText text(source, length);
    return Parse32(text, typeCode, radix, noSign);
}

int64 StringToNumQ(CharacterSource& source, int32 length, int16 typeCode, int32 radix, bool noSign) {
    SourceText text(source, length);
    return Parse64(text, typeCode, radix, noSign);
}

}  // namespace tessel

using namespace tessel;

bool StringToPacked(const char* text, int32 length, PackedDecimal* record, uint8 decimalPoint) {
    if (record == nullptr) return false;
    return RealParser(text, text != nullptr ? length : 0, static_cast<char>(decimalPoint)).Parse(*record);
}

int32 StringToNum32(const char** cursor, int32 length, int16 typeCode, int32 radix, bool noSign) {
    if (cursor == nullptr) return 0;
    MemoryText text(*cursor, *cursor != nullptr ? length : 0);
    const int32 value = Parse32(text, typeCode, radix, noSign);
    *cursor = text.At();
    return value;
}

int64 StringToNum64(const char** cursor, int32 length, int16 typeCode, int32 radix, bool noSign) {
    if (cursor == nullptr) return 0;
    MemoryText text(*cursor, *cursor != nullptr ? length : 0);
    const int64 value = Parse64(text, typeCode, radix, noSign);
    *cursor = text.At();
    return value;
}
