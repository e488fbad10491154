/* Pieces that the numeric text files share. */
#pragma once

#include <algorithm>
#include <bit>
#include <cstring>

#include <tessel/base/NumericTypes.h>

#include "numerics/DecimalConversion.h"

namespace tessel {

// ---- digits ----

/* Number of decimal digits; 1 for 0. */
inline int32 CountDigits(uint64 value) {
    const int32 bits = 64 - std::countl_zero(value | 1);
    const int32 guess = (bits * 1233) >> 12;  // floor(bits * log10(2)): right, or one short
    return value >= PowerOfTen64(guess) ? guess + 1 : std::max(guess, int32{1});
}

/* Writes exactly `count` decimal digits, leading zeros included. */
void WriteDigits(uint64 value, int32 count, char* out);

// ---- bounded output ----

/* Appends to a buffer and drops what does not fit. */
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
        const size_t fitting = std::min(static_cast<size_t>(std::max(count, int32{0})), Room());
        std::memset(at_, c, fitting);
        at_ += fitting;
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

/* "E", the sign and the digits of an exponent. Returns the length, at most kExponentTextSize. */
inline constexpr int32 kExponentTextSize = 12;
int32 WriteExponent(int32 exponent, char* out);

// ---- reals ----

/* A real as decimal digits, most significant first: d.ddd times ten to `lead`. */
struct RealText {
    RealKind kind;
    bool negative;
    int32 lead;
    int32 count;
    char digits[20];
};

/* What is rendered: a real, or an integer that is rendered exactly. */
struct RealSource {
    RealParts parts;
    bool isInteger;
    uint64 magnitude;  // of an integer; its sign is in parts
};

/* Renders a real with an exponential code (k > 0) or a fixed one (k <= 0). Not terminated. Returns the length, which is
   `size` when the text was cut. */
int32 FormatReal(const RealText& text, int32 k, char* buffer, int32 size, char decimalPoint);
int32 RenderReal(const RealSource& source, int32 k, char* buffer, int32 size, char decimalPoint);

// ---- integers ----

/* Renders an integer, terminated; a minus sign stands before the magnitude of a negative one. What does not fit is cut
   at the front: that is reported, or tells `complete` where it is given. Returns the length; 0 for a radix other than
   2, 8, 10 and 16. */
int32 NumToStr(uint64 magnitude, bool negative, int32 radix, char* buffer, int32 size, bool* complete = nullptr);

}  // namespace tessel
