// Text to numbers: reals into decimal records, integers in any radix.
#include <array>
#include <limits>
#include <type_traits>

#include <tessel/numerics/NumericSupport.h>
#include <tessel/strings/NumericText.h>

#include "numerics/NumericAccess.h"
#include "strings/NumericTextParts.h"

namespace tessel {
namespace {

bool IsDigit(char c) {
    return c >= '0' && c <= '9';
}

// ---- reals ---------------------------------------------------------------------------------------------------------

constexpr int32 kMostExponentDigits = 4;
constexpr int32 kLargestExponent = 32765;  // of a finite record
constexpr int32 kFarPoint = 1000000;       // beyond any exponent; keeps the position of the point from overflowing

class RealParser {
public:
    RealParser(const char* text, int32 length, char decimalPoint)
        : at_(text), end_(text + length), decimalPoint_(decimalPoint) {}

    // True when the whole text was one number.
    bool Parse(PackedDecimal& record) {
        record = {};
        record.mdigits = 1;
        State state = State::kStart;
        while (state != State::kStop && state != State::kFinish) state = Step(state, record);
        if (state == State::kFinish) Finish(record);
        return whole_;
    }

private:
    enum class State {
        kStart,
        kAfterSign,
        kInteger,
        kFraction,
        kMantissaFull,
        kFractionIgnored,
        kExponentLetter,
        kExponentSign,
        kExponentDigits,
        kFinish,
        kStop
    };

    // The character at the cursor; the end of the text acts as a zero byte.
    char Peek() const { return at_ < end_ ? *at_ : '\0'; }
    bool AtPoint(char c) const { return c == '.' || (c == decimalPoint_ && c != 0); }
    static bool IsExponentLetter(char c) { return c == 'E' || c == 'e'; }

    State Step(State state, PackedDecimal& record) {
        switch (state) {
            case State::kStart:
            case State::kAfterSign:
                return Begin(state, record);
            case State::kInteger:
                return Integer();
            case State::kFraction:
                return Fraction();
            case State::kMantissaFull:
                return MantissaFull();
            case State::kFractionIgnored:
                return FractionIgnored();
            case State::kExponentLetter:
            case State::kExponentSign:
                return BeginExponent(state);
            default:
                return ExponentDigits();
        }
    }

    State Begin(State state, PackedDecimal& record) {
        const bool mayHaveSign = state == State::kStart;
        const char c = Peek();
        if (c >= '1' && c <= '9') return State::kInteger;
        if (c == 0) return State::kStop;
        if (AtPoint(c)) {
            ++at_;
            point_ = -1;
            return State::kFraction;
        }
        if (IsExponentLetter(c)) return TakeExponentLetter();
        if (TakeWord("inf")) return StopAtSpecial(record, kPackedDecimalInfExponent);
        if (TakeWord("nan")) return StopAtSpecial(record, kPackedDecimalNaNExponent);
        if (mayHaveSign && (c == '+' || c == '-')) {
            if (c == '-') record.sign = kPackedDecimalNegativeSign;
            ++at_;
            return State::kAfterSign;
        }
        if (c != '0' && (mayHaveSign || c != ' ')) {
            whole_ = false;
            if (!mayHaveSign) return State::kStop;
        }
        ++at_;
        return state;
    }

    bool TakeWord(const char* word) {
        if (end_ - at_ < 3) return false;
        for (int i = 0; i < 3; ++i) {
            if ((at_[i] | 0x20) != word[i]) return false;
        }
        at_ += 3;
        return true;
    }

    State StopAtSpecial(PackedDecimal& record, int16 exponent) {
        record.exponent = exponent;
        if (Peek() != 0) whole_ = false;
        return State::kStop;
    }

    // Copies digits while there is room for them.
    void KeepDigits() {
        for (; at_ < end_ && IsDigit(*at_) && count_ < kPackedDecimalDigits; ++at_) digits_[count_++] = *at_;
    }

    State Integer() {
        KeepDigits();
        point_ = count_ - 1;
        if (count_ == kPackedDecimalDigits) return State::kMantissaFull;
        const char c = Peek();
        if (AtPoint(c)) {
            ++at_;
            return State::kFraction;
        }
        if (IsExponentLetter(c)) return TakeExponentLetter();
        if (c == ' ') return State::kMantissaFull;
        return FinishAt(c);
    }

    State Fraction() {
        if (count_ == 0) {
            for (; Peek() == '0'; ++at_) point_ = std::max(point_ - 1, -kFarPoint);
        }
        KeepDigits();
        const char c = Peek();
        if (count_ == kPackedDecimalDigits || c == ' ') return State::kFractionIgnored;
        if (IsExponentLetter(c)) return TakeExponentLetter();
        return FinishAt(c);
    }

    // Digits that are not kept raise the exponent. A digit after a space is not part of the number.
    State MantissaFull() {
        for (; IsDigit(Peek()); ++at_) point_ = std::min(point_ + 1, kFarPoint);
        while (Peek() == ' ') ++at_;
        const char c = Peek();
        if (AtPoint(c)) {
            ++at_;
            return State::kFractionIgnored;
        }
        if (IsExponentLetter(c)) return TakeExponentLetter();
        return FinishAt(c);
    }

    State FractionIgnored() {
        const char c = Peek();
        if (c == 0) return State::kFinish;
        if (IsExponentLetter(c)) return TakeExponentLetter();
        if (!IsDigit(c) && c != ' ') whole_ = false;
        ++at_;
        return State::kFractionIgnored;
    }

    State TakeExponentLetter() {
        ++at_;
        return State::kExponentLetter;
    }

    State BeginExponent(State state) {
        while (Peek() == ' ') ++at_;
        const char c = Peek();
        if (IsDigit(c)) return State::kExponentDigits;
        if (state == State::kExponentLetter && (c == '+' || c == '-')) {
            exponentNegative_ = c == '-';
            ++at_;
            return State::kExponentSign;
        }
        return FinishAt(c);
    }

    State ExponentDigits() {
        int32 read = 0;
        for (; read < kMostExponentDigits && IsDigit(Peek()); ++read) exponent_ = 10 * exponent_ + (*at_++ - '0');
        return read == kMostExponentDigits ? State::kFinish : FinishAt(Peek());
    }

    State FinishAt(char c) {
        if (c != 0) whole_ = false;
        return State::kFinish;
    }

    void Finish(PackedDecimal& record) {
        const int32 exponent = (exponentNegative_ ? -exponent_ : exponent_) + point_ - count_ + 1;
        record.exponent = static_cast<int16>(std::clamp(exponent, -kLargestExponent, kLargestExponent));
        record.mdigits = static_cast<int16>(count_);
        for (int32 i = 0; i < count_; ++i) {
            const int32 digit = digits_[count_ - 1 - i] - '0';
            record.mantissa[i / 2] |= static_cast<uint8>(i % 2 == 0 ? digit : digit << 4);
        }
    }

    const char* at_;
    const char* const end_;
    const char decimalPoint_;
    bool whole_ = true;
    char digits_[kPackedDecimalDigits];
    int32 count_ = 0;
    int32 point_ = 0;  // the power of ten of the first kept digit
    int32 exponent_ = 0;
    bool exponentNegative_ = false;
};

// ---- integers ------------------------------------------------------------------------------------------------------

constexpr uint8 kNoDigit = 0xFF;

constexpr std::array<uint8, 256> kDigitValues = [] {
    std::array<uint8, 256> values{};
    values.fill(kNoDigit);
    for (int i = 0; i < 10; ++i) values['0' + i] = static_cast<uint8>(i);
    for (int i = 0; i < 26; ++i) values['a' + i] = values['A' + i] = static_cast<uint8>(10 + i);
    return values;
}();

class PointerSource {
public:
    explicit PointerSource(const char* at) : at_(at) {}
    uint8 Current() const { return static_cast<uint8>(*at_); }
    void Advance() { ++at_; }
    void StepBack(int32 count) { at_ -= count; }
    const char* At() const { return at_; }

private:
    const char* at_;
};

// What an integer is parsed into: its width and whether it is signed.
struct IntegerType {
    int32 bits;
    bool isSigned;
};

IntegerType IntegerTypeOf(int16 typeCode, int32 widest) {
    const int16 type = TypeOfCode(typeCode);
    const int32 numberClass = NumClass(type);
    if (numberClass > kNumClassUnsigned) return {32, true};
    return {std::min(8 * NumSize(type), widest), numberClass == kNumClassSigned};
}

// Value and sign of a text, before they are fitted to the type; `value` is held at `limit`.
template <class Word>
struct Parsed {
    Word value;
    bool negative;
    bool overflowed;
};

template <class Word>
constexpr Word kSignBit = Word{1} << (8 * sizeof(Word) - 1);

template <class Word>
bool AddDigit(Word& value, uint32 radix, uint32 digit, Word limit) {
    Word next;
    if (__builtin_mul_overflow(value, static_cast<Word>(radix), &next) ||
        __builtin_add_overflow(next, static_cast<Word>(digit), &next) || next > limit) {
        return false;
    }
    value = next;
    return true;
}

// Reads spaces, sign and digits. The source is left where it was when there is no digit.
template <class Word, class Source>
Parsed<Word> ScanInteger(Source& source, int32 length, bool isSigned, int32 radix, bool noSign) {
    Parsed<Word> parsed{0, false, false};
    int32 read = 0;
    auto advance = [&] {
        source.Advance();
        ++read;
    };
    while (read < length && source.Current() == ' ') advance();
    if (!noSign && read < length && (source.Current() == '+' || source.Current() == '-')) {
        parsed.negative = source.Current() == '-';
        advance();
    }
    Word limit = std::numeric_limits<Word>::max();
    if (isSigned && radix == 10) limit = parsed.negative ? kSignBit<Word> : kSignBit<Word> - 1;
    const int32 beforeDigits = read;
    while (read < length) {
        const uint32 digit = kDigitValues[source.Current()];
        if (digit >= static_cast<uint32>(radix)) break;
        if (!parsed.overflowed && !AddDigit(parsed.value, static_cast<uint32>(radix), digit, limit)) {
            parsed.overflowed = true;
            parsed.value = isSigned && radix != 10 ? kSignBit<Word> - 1 : limit;
        }
        advance();
    }
    if (read == beforeDigits) {
        if (read != 0) source.StepBack(read);
        return {0, false, false};
    }
    return parsed;
}

// In radix 10: the number, held at the limits of the type.
template <class Word>
Word FitNumber(const Parsed<Word>& parsed, const IntegerType& type) {
    const Word unsignedMaximum =
        std::numeric_limits<Word>::max() >> (8 * sizeof(Word) - static_cast<size_t>(type.bits));
    if (!type.isSigned) return parsed.negative ? 0 : std::min(parsed.value, unsignedMaximum);
    const Word maximum = unsignedMaximum >> 1;
    return parsed.negative ? Word{0} - std::min<Word>(parsed.value, maximum + 1) : std::min(parsed.value, maximum);
}

// In another radix: the bits, or the largest value of the type when there are too many.
template <class Word>
Word FitBits(const Parsed<Word>& parsed, const IntegerType& type) {
    const Word mask = std::numeric_limits<Word>::max() >> (8 * sizeof(Word) - static_cast<size_t>(type.bits));
    Word bits = parsed.value;
    if (bits > mask) bits = type.isSigned ? mask >> 1 : mask;
    return parsed.negative ? Word{0} - bits : bits;
}

template <class Word, class Source>
Word ParseInteger(Source& source, int32 length, const IntegerType& type, int32 radix, bool noSign) {
    if (radix < 2 || radix > 36) return 0;
    const Parsed<Word> parsed = ScanInteger<Word>(source, length, type.isSigned, radix, noSign);
    return radix == 10 ? FitNumber(parsed, type) : FitBits(parsed, type);
}

template <class Source>
int32 Parse32(Source& source, int32 length, int16 typeCode, int32 radix, bool noSign) {
    return static_cast<int32>(ParseInteger<uint32>(source, length, IntegerTypeOf(typeCode, 32), radix, noSign));
}

template <class Source>
int64 Parse64(Source& source, int32 length, int16 typeCode, int32 radix, bool noSign) {
    const IntegerType type = IntegerTypeOf(typeCode, 64);
    if (type.bits == 64) return static_cast<int64>(ParseInteger<uint64>(source, length, type, radix, noSign));
    const auto value = ParseInteger<uint32>(source, length, type, radix, noSign);
    return type.isSigned ? static_cast<int32>(value) : int64{value};
}

}  // namespace

CharacterSource::~CharacterSource() = default;

int32 StringToNumL(CharacterSource& source, int32 length, int16 typeCode, int32 radix, bool noSign) {
    return Parse32(source, length, typeCode, radix, noSign);
}

int64 StringToNumQ(CharacterSource& source, int32 length, int16 typeCode, int32 radix, bool noSign) {
    return Parse64(source, length, typeCode, radix, noSign);
}

}  // namespace tessel

using namespace tessel;

bool StringToPacked(const char* text, int32 length, PackedDecimal* record, uint8 decimalPoint) {
    return RealParser(text, length, static_cast<char>(decimalPoint)).Parse(*record);
}

int32 StringToNum32(const char** cursor, int32 length, int16 typeCode, int32 radix, bool noSign) {
    PointerSource source(*cursor);
    const int32 value = Parse32(source, length, typeCode, radix, noSign);
    *cursor = source.At();
    return value;
}

int64 StringToNum64(const char** cursor, int32 length, int16 typeCode, int32 radix, bool noSign) {
    PointerSource source(*cursor);
    const int64 value = Parse64(source, length, typeCode, radix, noSign);
    *cursor = source.At();
    return value;
}
