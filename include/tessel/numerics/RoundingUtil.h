// Rounding, and conversions between doubles and integers. Nothing here fails, whatever the argument: what lies outside
// the result's range saturates. Any thread.
//
// The rule for rounding, which all numeric functions follow:
//
// 1. A real that becomes an integer - by Float64To..., RndToNearest..., FPStoreInt... and FPStoreUInt...,
//    FloatExtTo..., FPRToNum, ConvertNum, RTfRound and RTcRound - goes to the nearest one, halves to the even
//    neighbour, whatever direction the host rounds in. Only ceiling, floor and RndToInc (halves away from zero) are
//    named after another.
// 2. A real result is rounded once, in the direction in force in the calling thread (fesetround; FPInit sets the
//    nearest, halves to even): sums, products, quotients, square roots, UInt64ToFloat64, and a value stored into a
//    narrower real by FPStoreFlt32, FPStoreFlt64, FPRToNum or ConvertNum. The other mathematical functions are made
//    for the nearest; docs/accuracy.md says how near they come. In another direction they are off by a little more.
// 3. Decimals are rounded to the nearest, halves to even: FPStorePDR and the numeric text functions in the digits they
//    make, FPLoadPDR in the extended real it pushes. A narrower real that FPLoadPDR's value is stored into comes of the
//    decimal by one rounding, that of 2.
//
// A zero that RTfRound, RTfMod or RTfQRem's remainder gives is positive, as their formulas have it.
#ifndef TESSEL_NUMERICS_ROUNDINGUTIL_H
#define TESSEL_NUMERICS_ROUNDINGUTIL_H

#include <tessel/base/NumericTypes.h>

TESSEL_BEGIN_C

// x rounded to a multiple of `increment`, halves away from zero: RndToInc(8, 5) is 10, RndToInc(-5, 10) is -10. A
// result that does not fit wraps around. increment must not be 0.
TESSEL_API int32 RndToInc(int32 x, int32 increment);

// The nearest integer, halves to the even neighbour. A value outside the range gives the nearer limit, a NaN the
// maximum.
TESSEL_API int32 RndToNearest(double x);
// The nearest 64-bit integer, halves to even, saturating; the maximum for a NaN.
TESSEL_API int64 RndToNearestI64(double x);
// The nearest unsigned integer, halves to even; 0 below the range, the maximum above it and for a NaN.
TESSEL_API uint32 RndToNearestU32(double x);
// The nearest unsigned 64-bit integer, halves to even; 0 below the range, the maximum above it and for a NaN.
TESSEL_API uint64 RndToNearestU64(double x);

// The value, rounded as every real result is.
TESSEL_API double UInt64ToFloat64(uint64 value);

// The same rule as RndToNearest, for every width: nearest, halves to even, saturating, a NaN gives the maximum.
TESSEL_API int8 Float64ToInt8(double x);
// The nearest int16, halves to even, saturating; the maximum for a NaN.
TESSEL_API int16 Float64ToInt16(double x);
// The nearest int32, halves to even, saturating; the maximum for a NaN.
TESSEL_API int32 Float64ToInt32(double x);
// The nearest int64, halves to even, saturating; the maximum for a NaN.
TESSEL_API int64 Float64ToInt64(double x);
// The nearest uint8, halves to even, saturating; the maximum for a NaN.
TESSEL_API uint8 Float64ToUInt8(double x);
// The nearest uint16, halves to even, saturating; the maximum for a NaN.
TESSEL_API uint16 Float64ToUInt16(double x);
// The nearest uint32, halves to even, saturating; the maximum for a NaN.
TESSEL_API uint32 Float64ToUInt32(double x);
// The nearest uint64, halves to even, saturating; the maximum for a NaN.
TESSEL_API uint64 Float64ToUInt64(double x);

TESSEL_END_C

#endif
