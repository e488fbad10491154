// The decimal form of a real value: what FPStorePDR makes of a value and FPLoadPDR makes a value of, and what the
// numeric text functions format and parse.
#ifndef TESSEL_NUMERICS_PACKEDDECIMAL_H
#define TESSEL_NUMERICS_PACKEDDECIMAL_H

#include <tessel/base/Types.h>

enum {
    kPackedDecimalDigits = 18,          // digits a record has room for
    kPackedDecimalNaNExponent = 32766,  // exponent of a NaN
    kPackedDecimalInfExponent = 32767,  // exponent of an infinity
    kPackedDecimalNegativeSign = 0x80,  // sign of a negative value; that of a positive one is 0
};

// The value is the decimal integer formed by nibbles mdigits down to 0, times ten to the exponent. Two digits a byte;
// the low nibble of byte 0 is the last digit, nibble 0.
typedef struct PackedDecimal {
    uint8 mantissa[9];
    uint8 sign;
    int16 exponent;  // power of ten of nibble 0, or one of the two marks
    int16 mdigits;   // index of the highest nibble in use, which may be a leading zero
} PackedDecimal;

#endif
