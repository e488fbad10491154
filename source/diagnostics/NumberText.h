// Numbers as text without the C library's formatter: no locale, no allocation, no lock.
#ifndef TESSEL_SOURCE_DIAGNOSTICS_NUMBERTEXT_H
#define TESSEL_SOURCE_DIAGNOSTICS_NUMBERTEXT_H

#include <cstdint>

namespace tessel {

inline constexpr int kMaxIntegerText = 21;                                  // "-9223372036854775808" and a terminator
inline constexpr int kAddressDigits = 2 * static_cast<int>(sizeof(void*));  // every digit of an address

// Writes an integer so that it ends before `end`, and returns where it begins.
inline char* DecimalBackwards(char* end, uint64_t value) {
    do *--end = static_cast<char>('0' + value % 10);
    while ((value /= 10) != 0);
    return end;
}

// The same in hexadecimal, with at least `minDigits` digits.
inline char* HexBackwards(char* end, uint64_t value, int minDigits, const char* digits) {
    do {
        *--end = digits[value & 15];
        value >>= 4;
    } while (--minDigits > 0 || value != 0);
    return end;
}

inline constexpr char kLowerHexDigits[] = "0123456789abcdef";
inline constexpr char kUpperHexDigits[] = "0123456789ABCDEF";

// An address as reports write it: upper-case hexadecimal digits of a pointer's width, without prefix.
class AddressText {
public:
    explicit AddressText(const void* address) {
        text_[kAddressDigits] = 0;
        HexBackwards(text_ + kAddressDigits, reinterpret_cast<uintptr_t>(address), kAddressDigits, kUpperHexDigits);
    }
    const char* Text() const { return text_; }

private:
    char text_[kAddressDigits + 1];
};

}  // namespace tessel

#endif
