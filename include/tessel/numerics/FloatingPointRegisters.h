// The register layer: a stack of eight extended reals for each thread, on which the numeric text converter and other
// callers compute whatever the width of their data.
//
// Loads push one value, stores pop one into memory, an operation replaces its operands by its result. "a, b" below
// names operands from the bottom to the top: b was pushed last. A complex value lies with its real part on top of its
// imaginary part; where two complex values or results lie on the stack, the first named is below unless said otherwise.
//
// A push on a full stack and a pop from an empty one give a quiet NaN and set the stack-fault and invalid bits of
// CheckFPStat. Nothing else fails: results follow the rules for NaN and infinities. Pointers must not be null and are
// not checked. How values are rounded is said in <tessel/numerics/RoundingUtil.h>. Any thread; each has its own stack.
#ifndef TESSEL_NUMERICS_FLOATINGPOINTREGISTERS_H
#define TESSEL_NUMERICS_FLOATINGPOINTREGISTERS_H

#include <tessel/base/NumericTypes.h>
#include <tessel/numerics/PackedDecimal.h>

// Bits of CheckFPStat. Bits 11 to 13 hold the number of the top register, 0 when the stack is empty.
enum {
    kFPStatInvalid = 0x01,
    kFPStatDenormal = 0x02,  // a denormal real was loaded, or stored
    kFPStatZeroDivide = 0x04,
    kFPStatOverflow = 0x08,
    kFPStatUnderflow = 0x10,  // a result below the smallest normal value was rounded
    kFPStatInexact = 0x20,    // a result was rounded
    kFPStatStackFault = 0x40,
    kFPStatStackOverflow = 0x200,  // with a stack fault: a push on a full stack, otherwise a pop from an empty one
};

TESSEL_BEGIN_C

// ---- state ----------------------------------------------------------------------------------------------------------

// Empties the calling thread's stack and puts its floating-point unit into the default state: exceptions masked, 64-bit
// precision, round to nearest, ties to even.
TESSEL_API void FPInit(void);

// Copies the calling thread's stack and status to the one process-wide save area and goes on with them unchanged.
TESSEL_API void FPSave(void);

// 1 when the calling thread's stack is empty, else 0. Overwrites the save area, as FPSave does.
TESSEL_API int32 FPCheck(void);

// The exceptions since FPInit and the top of the stack (kFPStat...).
TESSEL_API uint16 CheckFPStat(void);

// ---- loads ----------------------------------------------------------------------------------------------------------

// Pushes a signed 8-bit integer.
TESSEL_API void FPLoadInt8(const int8* value);
// Pushes a signed 16-bit integer.
TESSEL_API void FPLoadInt16(const int16* value);
// Pushes a signed 32-bit integer.
TESSEL_API void FPLoadInt32(const int32* value);
// Pushes a signed 64-bit integer.
TESSEL_API void FPLoadInt64(const int64* value);
// Pushes an unsigned 8-bit integer.
TESSEL_API void FPLoadUInt8(const uint8* value);
// Pushes an unsigned 16-bit integer.
TESSEL_API void FPLoadUInt16(const uint16* value);
// Pushes an unsigned 32-bit integer.
TESSEL_API void FPLoadUInt32(const uint32* value);
// Pushes an unsigned 64-bit integer.
TESSEL_API void FPLoadUInt64(const uint64* value);
// Pushes a single.
TESSEL_API void FPLoadFlt32(const float* value);
// Pushes a double.
TESSEL_API void FPLoadFlt64(const double* value);
// Pushes an extended real, unchanged.
TESSEL_API void FPLoadExt(const floatExt* value);

// Pushes the value of a decimal record.
TESSEL_API void FPLoadPDR(const PackedDecimal* record);

// Pushes a value of any numeric type; of a complex one the imaginary part, then the real part. A code that is not
// numeric pushes nothing.
TESSEL_API void NumToFPR(int16 code, const void* value);

// Pushes the top value once more.
TESSEL_API void FPPush(void);

// Drops the top value.
TESSEL_API void FPPop(void);

// ---- stores: integers saturate (a NaN stores the maximum) and round halves to even ----------------------------------

// Pops into a signed 8-bit integer: halves to even, saturating, the maximum for a NaN.
TESSEL_API void FPStoreInt8(int8* value);
// Pops into a signed 16-bit integer: halves to even, saturating, the maximum for a NaN.
TESSEL_API void FPStoreInt16(int16* value);
// Pops into a signed 32-bit integer: halves to even, saturating, the maximum for a NaN.
TESSEL_API void FPStoreInt32(int32* value);
// Pops into a signed 64-bit integer: halves to even, saturating, the maximum for a NaN.
TESSEL_API void FPStoreInt64(int64* value);
// Pops into an unsigned 8-bit integer: halves to even, saturating, the maximum for a NaN.
TESSEL_API void FPStoreUInt8(uint8* value);
// Pops into an unsigned 16-bit integer: halves to even, saturating, the maximum for a NaN.
TESSEL_API void FPStoreUInt16(uint16* value);
// Pops into an unsigned 32-bit integer: halves to even, saturating, the maximum for a NaN.
TESSEL_API void FPStoreUInt32(uint32* value);
// Pops into an unsigned 64-bit integer: halves to even, saturating, the maximum for a NaN.
TESSEL_API void FPStoreUInt64(uint64* value);

// A narrower real is rounded in the direction in force.
TESSEL_API void FPStoreFlt32(float* value);
// Pops into a double, rounded in the direction in force.
TESSEL_API void FPStoreFlt64(double* value);
// Pops into an extended real, unchanged.
TESSEL_API void FPStoreExt(floatExt* value);

// Pops into a decimal record: digits >= 1 rounds to that many significant digits (at most 17), digits <= 0 to -digits
// decimals (at most 18 digits in all).
TESSEL_API void FPStorePDR(int32 digits, PackedDecimal* record);

// Pops into a value of any numeric type; a complex one takes the top as its real part and the next as its imaginary
// part. 1 when the store was exact, rounded or saturated, 0 when the operation was invalid (an empty stack, a signaling
// NaN stored into a narrower real, a code that is not numeric).
TESSEL_API int32 FPRToNum(int16 code, void* value);

// Conversions of a value in memory by the rules of the integer stores.
TESSEL_API int64 FloatExtToInt64(const floatExt* value);
// To the nearest integer, halves to even, saturating; the maximum for a NaN.
TESSEL_API uint64 FloatExtToUInt64(const floatExt* value);

// ---- real operations ------------------------------------------------------------------------------------------------

// a, b: ln b / ln a.
TESSEL_API void LogX(void);
// Base-2 logarithm; of 0 -infinity, of a negative value or NaN the NaN ENaN (all logs).
TESSEL_API void Log2(void);
// Base-10 logarithm.
TESSEL_API void Log10(void);
// Natural logarithm.
TESSEL_API void LogN(void);
// ln (1 + x).
TESSEL_API void Lognp1(void);
// e to the power x.
TESSEL_API void ExpX(void);
// 2 to the power x.
TESSEL_API void _F2X(void);
// 2 to the power x, minus 1.
TESSEL_API void _F2XM1(void);
// 10 to the power x.
TESSEL_API void Pow10X(void);
// 2 to the power x.
TESSEL_API void Pow2X(void);
// a, b: a to the power b.
TESSEL_API void PowerX(void);
// a, b: a times 2 to the power trunc b.
TESSEL_API void ScaleX(void);
// Largest integer not above x.
TESSEL_API void FloorX(void);
// Smallest integer not below x.
TESSEL_API void CeilX(void);
// -1, 0 or 1; NaN of a NaN.
TESSEL_API void SignX(void);
// Sine.
TESSEL_API void SinX(void);
// Cosine.
TESSEL_API void CosX(void);
// Tangent.
TESSEL_API void TanX(void);
// a, b: angle of the point (a, b), -pi to pi.
TESSEL_API void ATanX(void);
// sin x / x; 1 at 0.
TESSEL_API void SincX(void);
// 1 / x.
TESSEL_API void RecipX(void);
// Mantissa m on top, exponent e below: x = m 2^e, 1 <= |m| < 2; both 0 for x = 0.
TESSEL_API void FMantExpX(void);
// Hyperbolic sine.
TESSEL_API void Sinh(void);
// Hyperbolic cosine.
TESSEL_API void Cosh(void);
// Hyperbolic tangent.
TESSEL_API void Tanh(void);
// Inverse hyperbolic sine.
TESSEL_API void Asinh(void);
// Inverse hyperbolic cosine; below 1 a NaN.
TESSEL_API void Acosh(void);
// Inverse hyperbolic tangent.
TESSEL_API void Atanh(void);
// Arcsine in radians; beyond -1 to 1 a NaN.
TESSEL_API void ASinX(void);
// Arccosine in radians; beyond -1 to 1 a NaN.
TESSEL_API void ACosX(void);
// 1 when x is an integer, else 0.
TESSEL_API void FPIsInt(void);
// a, b: -1 when a < b, 0 when equal, 1 when a > b, NaN when one of them is a NaN.
TESSEL_API void FPCompareExt(void);

// ---- complex operations ---------------------------------------------------------------------------------------------

// Magnitude on top of the angle; 0 stays 0.
TESSEL_API void ComplexRToP(void);
// The reverse: magnitude on top of the angle to real on top of imaginary.
TESSEL_API void ComplexPToR(void);
// a, b: a / b.
TESSEL_API void ComplexDivide(void);
// 1 / z.
TESSEL_API void ComplexRecip(void);
// Sine, complex, in radians.
TESSEL_API void ComplexSin(void);
// Cosine, complex, in radians.
TESSEL_API void ComplexCos(void);
// Tangent, complex, in radians.
TESSEL_API void ComplexTan(void);
// Cotangent, complex, in radians.
TESSEL_API void ComplexCot(void);
// Hyperbolic sine, complex.
TESSEL_API void ComplexSinh(void);
// Hyperbolic cosine, complex.
TESSEL_API void ComplexCosh(void);
// Hyperbolic tangent, complex.
TESSEL_API void ComplexTanh(void);
// Two results: the sine on top of the cosine.
TESSEL_API void ComplexSincos(void);
// sin z / z; 1 at 0.
TESSEL_API void ComplexSinc(void);
// Arcsine, complex, in radians.
TESSEL_API void ComplexAsin(void);
// Arccosine, complex, in radians.
TESSEL_API void ComplexAcos(void);
// Inverse hyperbolic sine, complex.
TESSEL_API void ComplexAsinh(void);
// Inverse hyperbolic cosine, complex.
TESSEL_API void ComplexAcosh(void);
// Arctangent, complex, in radians.
TESSEL_API void ComplexAtan(void);
// Inverse hyperbolic tangent, complex.
TESSEL_API void ComplexAtanh(void);

// ---- one precision from memory to memory: load, operate, store; operands as for the operation, below first ----------

// Logarithm of x to the given base, ln x / ln base (single).
TESSEL_API void FLogX32(const float* base, const float* x, float* result);
// Logarithm of x to the given base, ln x / ln base (double).
TESSEL_API void FLogX64(const double* base, const double* x, double* result);
// Logarithm of x to the given base, ln x / ln base (extended).
TESSEL_API void FLogXExt(const floatExt* base, const floatExt* x, floatExt* result);
// Logarithm to base 2 (single).
TESSEL_API void FLog2_32(const float* x, float* result);
// Logarithm to base 2 (double).
TESSEL_API void FLog2_64(const double* x, double* result);
// Logarithm to base 2 (extended).
TESSEL_API void FLog2_Ext(const floatExt* x, floatExt* result);
// Logarithm to base 10 (single).
TESSEL_API void FLog10_32(const float* x, float* result);
// Logarithm to base 10 (double).
TESSEL_API void FLog10_64(const double* x, double* result);
// Logarithm to base 10 (extended).
TESSEL_API void FLog10_Ext(const floatExt* x, floatExt* result);
// Natural logarithm (single).
TESSEL_API void FLogN32(const float* x, float* result);
// Natural logarithm (double).
TESSEL_API void FLogN64(const double* x, double* result);
// Natural logarithm (extended).
TESSEL_API void FLogNExt(const floatExt* x, floatExt* result);
// e to the power x (single).
TESSEL_API void FExpX32(const float* x, float* result);
// e to the power x (double).
TESSEL_API void FExpX64(const double* x, double* result);
// e to the power x (extended).
TESSEL_API void FExpXExt(const floatExt* x, floatExt* result);
// 10 to the power x (single).
TESSEL_API void FPow10X32(const float* x, float* result);
// 10 to the power x (double).
TESSEL_API void FPow10X64(const double* x, double* result);
// 10 to the power x (extended).
TESSEL_API void FPow10XExt(const floatExt* x, floatExt* result);
// 2 to the power x (single).
TESSEL_API void FPow2X32(const float* x, float* result);
// 2 to the power x (double).
TESSEL_API void FPow2X64(const double* x, double* result);
// 2 to the power x (extended).
TESSEL_API void FPow2XExt(const floatExt* x, floatExt* result);
// x times 2 to the power trunc(n) (single).
TESSEL_API void FScaleX32(const float* x, const float* n, float* result);
// x times 2 to the power trunc(n) (double).
TESSEL_API void FScaleX64(const double* x, const double* n, double* result);
// x times 2 to the power trunc(n) (extended).
TESSEL_API void FScaleXExt(const floatExt* x, const floatExt* n, floatExt* result);
// Angle of the point (x, y), -pi to pi (single).
TESSEL_API void FATan2_32(const float* x, const float* y, float* result);
// Angle of the point (x, y), -pi to pi (double).
TESSEL_API void FATan2_64(const double* x, const double* y, double* result);
// Angle of the point (x, y), -pi to pi (extended).
TESSEL_API void FATan2_Ext(const floatExt* x, const floatExt* y, floatExt* result);
// x to the power y (single).
TESSEL_API void FPowerX32(const float* x, const float* y, float* result);
// x to the power y (double).
TESSEL_API void FPowerX64(const double* x, const double* y, double* result);
// x to the power y (extended).
TESSEL_API void FPowerXExt(const floatExt* x, const floatExt* y, floatExt* result);
// Magnitude as real part and angle as imaginary part; 0 stays 0 (single).
TESSEL_API void FComplexRToP32(const cmplx64* z, cmplx64* result);
// Magnitude as real part and angle as imaginary part; 0 stays 0 (double).
TESSEL_API void FComplexRToP64(const cmplx128* z, cmplx128* result);
// Magnitude as real part and angle as imaginary part; 0 stays 0 (extended).
TESSEL_API void FComplexRToPExt(const cmplxExt* z, cmplxExt* result);
// Real and imaginary part of a magnitude (real part) and an angle (imaginary part) (single).
TESSEL_API void FComplexPToR32(const cmplx64* polar, cmplx64* result);
// Real and imaginary part of a magnitude (real part) and an angle (imaginary part) (double).
TESSEL_API void FComplexPToR64(const cmplx128* polar, cmplx128* result);
// Real and imaginary part of a magnitude (real part) and an angle (imaginary part) (extended).
TESSEL_API void FComplexPToRExt(const cmplxExt* polar, cmplxExt* result);

// ---- sums -----------------------------------------------------------------------------------------------------------

// The sum of `count` elements, the first at `first` and each `stride` bytes after the one before (any sign), added in
// extended precision and stored in the type of the elements. 0 for a count of 0.
TESSEL_API void Sum1DSingleArray(const float* first, int32 stride, int32 count, float* result);
// Sum of doubles `stride` bytes apart, added in extended precision; 0 for a count of 0.
TESSEL_API void Sum1DDoubleArray(const double* first, int32 stride, int32 count, double* result);
// Sum of extended reals `stride` bytes apart; 0 for a count of 0.
TESSEL_API void Sum1DExtendedArray(const floatExt* first, int32 stride, int32 count, floatExt* result);

TESSEL_END_C

#endif
