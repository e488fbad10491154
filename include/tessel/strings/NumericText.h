// Numbers of any numeric type to text and back.
//
// Format codes (int16), the first rule that matches wins:
//
//     64  d   signed decimal integer
//     65  u   unsigned decimal integer
//     66  x   hexadecimal, upper-case digits
//     67  o   octal
//     68  b   binary
//     below -64    a complex number as magnitude and phase; each part is rendered with code + 100
//     1 to 63      exponential: so many significant digits, one of them before the decimal point
//     100 to 130   SI prefix, code - 100 decimals
//     131 to 162   engineering: an exponent that is a multiple of 3, code - 131 decimals
//     200 to 299, 512 to 16895   accepted: a real renders no text; a complex value renders with six decimals, reported
//     -63 to 0     fixed: -code decimals
//
// Any other code is reported (warning) and used as exponential when positive, else as fixed. Text that does not fit is
// cut and reported. Nothing here fails: a null text is the empty text, and with any other null pointer that is not
// spoken of there is no result (0, false, an empty text). Any thread.
#ifndef TESSEL_STRINGS_NUMERICTEXT_H
#define TESSEL_STRINGS_NUMERICTEXT_H

#include <tessel/base/NumericTypes.h>
#include <tessel/numerics/PackedDecimal.h>

enum {
    kFormatDecimal = 64,
    kFormatUnsigned = 65,
    kFormatHex = 66,
    kFormatOctal = 67,
    kFormatBinary = 68,
    kFormatSI = 100,           // + decimals, at most 30
    kFormatEngineering = 131,  // + decimals, at most 31

    kNoSharedExponent = 100  // in the slot of NumToAnyString: as if there were no slot
};

// What ClassifyFloatNumber returns.
enum { kFloatFinite = 0, kFloatNegInfinity = 1, kFloatInfinity = 2, kFloatNaN = 3 };

TESSEL_BEGIN_C

// Renders the value in the given format, terminated, and returns its length. A null value renders "0" (a complex one
// "0 + 0i"). `size` counts the terminator.
//
// `sharedExponent` (may be null) is for engineering and SI notation. On entry it holds the power of ten that the value
// is counted in, 0 for ones, or kNoSharedExponent. The suffix is left out, and its exponent is stored there for the
// caller to append; where that is beyond -24 to 24 the suffix is written and 0 stored. Of a complex value it is the
// real part's exponent; an imaginary part with another one carries its own suffix.
TESSEL_API int32 NumToAnyString(const void* value, int16 typeCode, const int16* formatCode, char* buffer, int32 size,
                                uint8 decimalPoint, int32* sharedExponent);

// Renders an integer in radix 2, 8, 10 or 16, terminated, and returns its length. In radix 10 a negative value of a
// signed rendering has a minus sign; in the others its bits are shown.
TESSEL_API int32 NumToIntString(const void* value, char* buffer, int32 size, int32 radix, bool isSigned,
                                int16 typeCode);

// Renders a decimal record, exponential (formatCode > 0) or fixed (formatCode <= 0), and returns the length. Not
// terminated: the caller does that.
TESSEL_API int32 PackedToString(const PackedDecimal* record, int16 formatCode, char* buffer, int32 size,
                                uint8 decimalPoint);

// Parses a real number: optional sign, digits with a decimal point ("." or the given character), optional exponent, or
// "inf" or "nan" in any case. At most 18 significant digits are kept. True when the whole text was one number;
// otherwise the part that was read is stored.
TESSEL_API bool StringToPacked(const char* text, int32 length, PackedDecimal* record, uint8 decimalPoint);

// Parses an integer of the given type in a radix from 2 to 36: leading spaces, a sign unless `noSign`, digits. What
// does not fit saturates. In a radix other than 10 a signed type takes the bit pattern of its unsigned twin. The cursor
// is left after the last digit, or untouched when there is no digit (the result is then 0).
TESSEL_API int32 StringToNum32(const char** cursor, int32 length, int16 typeCode, int32 radix, bool noSign);
// The same for types of 64 bits.
TESSEL_API int64 StringToNum64(const char** cursor, int32 length, int16 typeCode, int32 radix, bool noSign);

// Which kind of value a single, double or extended real is (kFloat...). Other types are finite.
TESSEL_API int32 ClassifyFloatNumber(const void* value, int16 typeCode);

// Replace the texts of a NaN ("NaN") and of an infinity ("Inf") for the whole process and return the previous ones;
// null restores those. The text is not copied. To be called while no other thread renders.
TESSEL_API CStr NumSetNaNText(CStr text);
// Replaces the text of an infinity; else as NumSetNaNText.
TESSEL_API CStr NumSetInfText(CStr text);

TESSEL_END_C

#ifdef __cplusplus
namespace tessel {

// Where the integer parses read from when the text does not lie in memory in one piece.
class TESSEL_API CharacterSource {
public:
    virtual ~CharacterSource();
    // The character at the cursor.
    virtual uint8 Current() const = 0;
    // One character on.
    virtual void Advance() = 0;
    // So many characters back.
    virtual void StepBack(int32 count) = 0;
};

// As StringToNum32 and StringToNum64. At most `length` characters are read.
TESSEL_API int32 StringToNumL(CharacterSource& source, int32 length, int16 typeCode, int32 radix, bool noSign);
// As StringToNum64.
TESSEL_API int64 StringToNumQ(CharacterSource& source, int32 length, int16 typeCode, int32 radix, bool noSign);

}  // namespace tessel
#endif

#endif
