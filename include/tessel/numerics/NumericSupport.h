// The table of numeric types, conversion between any two of them, and small helpers on int32. The type codes are in
// <tessel/base/NumericTypes.h>.
#ifndef TESSEL_NUMERICS_NUMERICSUPPORT_H
#define TESSEL_NUMERICS_NUMERICSUPPORT_H

#include <tessel/base/NumericTypes.h>

// What NumClass returns.
enum {
    kNumClassSigned = 0,
    kNumClassUnsigned = 1,
    kNumClassReal = 2,
    kNumClassComplex = 3,
    kNumClassNone = 64  // not numeric
};

TESSEL_BEGIN_C

// Bytes of a value of the type; 0 when it is not numeric. Only the low four bits of the code count. Any thread.
TESSEL_API int32 NumSize(int16 code);

// Class of the type (kNumClass...). Only the low four bits of the code count. Any thread.
TESSEL_API int32 NumClass(int16 code);

// Sets the size of an extended real to `size` bytes (10 at first) and that of an extended complex to twice that, and
// returns the previous size. For hosts that pad extended values to 12 or 16 bytes: the functions that take a type code
// then find the imaginary part `size` bytes after the real part. A size below 10 makes the parts overlap. The typed
// functions keep to floatExt and cmplxExt. Process-wide; to be called while no other thread converts.
TESSEL_API uint8 SetFxSize(uint8 size);

// Converts the value at `source` to another numeric type. Integer to integer keeps the low bytes (wraps around). All
// else goes through an extended real: into an integer it saturates (a NaN stores the maximum) and rounds to the
// nearest, halves to even, into a narrower real it rounds in the direction in force (the rule is in
// <tessel/numerics/RoundingUtil.h>). A real has an imaginary part of 0; of a complex value a real destination gets the
// real part. A code outside 1-30, one that names no type (15 and 16) or a null pointer is reported (fatal), and nothing
// is stored. Any thread.
TESSEL_API void ConvertNum(int16 sourceCode, const void* source, int16 destinationCode, void* destination);

// The smaller of two.
TESSEL_API int32 Min(int32 a, int32 b);
// The larger of two.
TESSEL_API int32 Max(int32 a, int32 b);

// |a|; of -2147483648 it is -2147483648.
TESSEL_API int32 Abs(int32 a);

// a modulo b, never negative: Mod(-7, 3) is 2, Mod(7, -3) is 1. b must not be 0.
TESSEL_API int32 Mod(int32 a, int32 b);

// x held between low and high; low when high <= low.
TESSEL_API int32 Pin(int32 x, int32 low, int32 high);

TESSEL_END_C

#endif
