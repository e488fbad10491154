// The numeric types beyond the plain integers and reals, and the codes that name every numeric type.
#ifndef TESSEL_BASE_NUMERICTYPES_H
#define TESSEL_BASE_NUMERICTYPES_H

#include <tessel/base/Types.h>

// The extended real: 80 bits, in ten bytes without padding. The mantissa has an explicit integer bit (bit 63); the
// top bit of signExponent is the sign, the rest the exponent with a bias of 16383. It may lie at any address.
#pragma pack(push, 1)
typedef struct floatExt {
    uint64 mantissa;
    uint16 signExponent;
} floatExt;
#pragma pack(pop)

// Complex values: the real part, then the imaginary part.
typedef struct cmplx64 {
    float re;
    float im;
} cmplx64;

// A complex value of two doubles.
typedef struct cmplx128 {
    double re;
    double im;
} cmplx128;

// A complex value of two extended reals.
typedef struct cmplxExt {
    floatExt re;
    floatExt im;
} cmplxExt;

// Numeric type codes. Where a code is passed as an int16 only its low four bits select the type.
enum {
    kNumInt8 = 1,
    kNumInt16 = 2,
    kNumInt32 = 3,
    kNumInt64 = 4,
    kNumUInt8 = 5,
    kNumUInt16 = 6,
    kNumUInt32 = 7,
    kNumUInt64 = 8,
    kNumSingle = 9,            // float
    kNumDouble = 10,           // double
    kNumExtended = 11,         // floatExt
    kNumComplexSingle = 12,    // cmplx64
    kNumComplexDouble = 13,    // cmplx128
    kNumComplexExtended = 14,  // cmplxExt
};

#endif
