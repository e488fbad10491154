// Pieces that the numeric text files share.
#pragma once

#include "numerics/DecimalConversion.h"
#include "strings/DecimalDigits.h"
#include <tessel/base/NumericTypes.h>

#include <algorithm>
#include <cstring>

namespace tessel {

// ---- digits ---------------------------------------------------------------------------------------------------------

// The digits of a real, most significant first, with zeros after them: what is copied may run past the last digit.
struct DigitText {
    static constexpr int32 kDigits = 24;
    static constexpr int32 kZeros = 24;

    char text[kDigits + kZeros];
    int32 count;

    const char* First() const { return text + kDigits - count; }

    void Set(uint64 value, int32 digits) {
        count = digits;
        constexpr uint32 kEight = 100000000;
        const uint64 upper = value / kEight;
        SetEight(2, static_cast<uint32>(value % kEight));
        if (digits > 8) SetEight(1, static_cast<uint32>(upper % kEight));
        if (digits > 16) SetEight(0, static_cast<uint32>(upper / kEight));
        std::memset(text + kDigits, '0', kZeros);
    }

private:
    void SetEight(int32 group, uint32 value) {
        const uint64 characters = __builtin_bswap64(SpreadDigits(value) | 0x3030303030303030);
        std::memcpy(text + 8 * group, &characters, sizeof characters);
    }
};

// ---- bounded output -------------------------------------------------------------------------------------------------

// Appends to a buffer and drops what does not fit.
class TextOut {
public:
    TextOut(char* buffer, int32 size) : begin_(buffer), at_(buffer), end_(buffer + std::max(size, int32{0})) {}

    void Put(char c) {
        if (at_ < end_) *at_++ = c;
    }
    void Put(const char* text, int32 length) {
        const size_t fitting = std::min(static_cast<size_t>(length), Room());
        std::memcpy(at_, text, fitting);
        at_ += fitting;
    }
    void Put(CStr text) { Put(text, static_cast<int32>(std::strlen(text))); }
    void Fill(char c, int32 count) {
        if (count <= 0) return;
        const size_t fitting = std::min(static_cast<size_t>(count), Room());
        std::memset(at_, c, fitting);
        at_ += fitting;
    }
    // Digits from the `from`-th on, zeros after the last.
    void PutDigits(const DigitText& digits, int32 from, int32 length) {
        constexpr int32 kChunk = DigitText::kZeros;
        if (length <= kChunk && from <= digits.count && Room() >= static_cast<size_t>(kChunk)) {
            std::memcpy(at_, digits.First() + from, kChunk);
            at_ += length;
            return;
        }
        const int32 known = std::clamp(digits.count - from, int32{0}, length);
        Put(digits.First() + std::min(from, digits.count), known);
        Fill('0', length - known);
    }
    void Skip(int32 length) { at_ += length; }  // over what was written at At()

    char* At() const { return at_; }
    size_t Room() const { return static_cast<size_t>(end_ - at_); }
    int32 Length() const { return static_cast<int32>(at_ - begin_); }

private:
    char* begin_;
    char* at_;
    char* end_;
};

// "E", the sign and the digits of an exponent. Returns the length, at most kExponentTextSize.
inline constexpr int32 kExponentTextSize = 12;
int32 WriteExponent(int32 exponent, char* out);

// ---- reals ----------------------------------------------------------------------------------------------------------

// A real as decimal digits: d.ddd times ten to `lead`.
struct RealText {
    RealKind kind;
    bool negative;
    int32 lead;
    DigitText digits;
};

// What is rendered: a real, or an integer that is rendered exactly.
struct RealSource {
    RealParts parts;
    bool isInteger;
    uint64 magnitude;  // of an integer; its sign is in parts
};

// Renders a real with an exponential code (k > 0) or a fixed one (k <= 0). Not terminated. Returns the length, which is
// `size` when the text was cut.
int32 FormatReal(const RealText& text, int32 k, char* buffer, int32 size, char decimalPoint);
int32 RenderReal(const RealSource& source, int32 k, char* buffer, int32 size, char decimalPoint);

// Terminates a rendering of that length; one that fills the buffer was cut, which is reported. Returns the length.
int32 Terminate(char* buffer, int32 size, int32 length);

// ---- integers -------------------------------------------------------------------------------------------------------

inline constexpr int32 kLongestDecimal = 20;  // of 64 bits, or of 63 and a sign

// Renders an integer, terminated; a minus sign stands before the magnitude of a negative one. What does not fit is cut
// at the front, which is reported. Returns the length; 0 for a radix other than 2, 8, 10 and 16.
int32 RenderDigits(uint64 magnitude, bool negative, int32 radix, char* buffer, int32 size);

// The same; most are decimal and have room.
inline int32 NumToStr(uint64 magnitude, bool negative, int32 radix, char* buffer, int32 size) {
    if (radix != 10 || size <= kLongestDecimal) return RenderDigits(magnitude, negative, radix, buffer, size);
    char* const end = WriteDecimal(buffer, magnitude, negative);
    *end = 0;
    return static_cast<int32>(end - buffer);
}

}  // namespace tessel
