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

TESSEL_API void FPLoadInt8(const int8* value);
TESSEL_API void FPLoadInt16(const int16* value);
TESSEL_API void FPLoadInt32(const int32* value);
TESSEL_API void FPLoadInt64(const int64* value);
TESSEL_API void FPLoadUInt8(const uint8* value);
TESSEL_API void FPLoadUInt16(const uint16* value);
TESSEL_API void FPLoadUInt32(const uint32* value);
TESSEL_API void FPLoadUInt64(const uint64* value);
TESSEL_API void FPLoadFlt32(const float* value);
TESSEL_API void FPLoadFlt64(const double* value);
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

TESSEL_API void FPStoreInt8(int8* value);
TESSEL_API void FPStoreInt16(int16* value);
TESSEL_API void FPStoreInt32(int32* value);
TESSEL_API void FPStoreInt64(int64* value);
TESSEL_API void FPStoreUInt8(uint8* value);
TESSEL_API void FPStoreUInt16(uint16* value);
TESSEL_API void FPStoreUInt32(uint32* value);
TESSEL_API void FPStoreUInt64(uint64* value);

// A narrower real is rounded in the direction in force.
TESSEL_API void FPStoreFlt32(float* value);
TESSEL_API void FPStoreFlt64(double* value);
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
TESSEL_API uint64 FloatExtToUInt64(const floatExt* value);

// ---- real operations ------------------------------------------------------------------------------------------------

TESSEL_API void LogX(void);    // a, b: ln b / ln a
TESSEL_API void Log2(void);    // base-2 logarithm; of 0 -infinity, of a negative value or NaN the NaN ENaN (all logs)
TESSEL_API void Log10(void);   // base-10 logarithm
TESSEL_API void LogN(void);    // natural logarithm
TESSEL_API void Lognp1(void);  // ln (1 + x)
TESSEL_API void ExpX(void);    // e to the power x
TESSEL_API void _F2X(void);    // 2 to the power x
TESSEL_API void _F2XM1(void);  // 2 to the power x, minus 1
TESSEL_API void Pow10X(void);  // 10 to the power x
TESSEL_API void Pow2X(void);   // 2 to the power x
TESSEL_API void PowerX(void);  // a, b: a to the power b
TESSEL_API void ScaleX(void);  // a, b: a times 2 to the power trunc b
TESSEL_API void FloorX(void);  // largest integer not above x
TESSEL_API void CeilX(void);   // smallest integer not below x
TESSEL_API void SignX(void);   // -1, 0 or 1; NaN of a NaN
TESSEL_API void SinX(void);    // sine
TESSEL_API void CosX(void);    // cosine
TESSEL_API void TanX(void);    // tangent
TESSEL_API void ATanX(void);   // a, b: angle of the point (a, b), -pi to pi
TESSEL_API void SincX(void);   // sin x / x; 1 at 0
TESSEL_API void RecipX(void);  // 1 / x
TESSEL_API void FMantExpX(void);  // mantissa m on top, exponent e below: x = m 2^e, 1 <= |m| < 2; both 0 for x = 0
TESSEL_API void Sinh(void);
TESSEL_API void Cosh(void);
TESSEL_API void Tanh(void);
TESSEL_API void Asinh(void);
TESSEL_API void Acosh(void);
TESSEL_API void Atanh(void);
TESSEL_API void ASinX(void);
TESSEL_API void ACosX(void);
TESSEL_API void FPIsInt(void);       // 1 when x is an integer, else 0
TESSEL_API void FPCompareExt(void);  // a, b: -1 when a < b, 0 when equal, 1 when a > b, NaN when one of them is a NaN

// ---- complex operations ---------------------------------------------------------------------------------------------

TESSEL_API void ComplexRToP(void);    // magnitude on top of the angle; 0 stays 0
TESSEL_API void ComplexPToR(void);    // the reverse: magnitude on top of the angle to real on top of imaginary
TESSEL_API void ComplexDivide(void);  // a, b: a / b
TESSEL_API void ComplexRecip(void);   // 1 / z
TESSEL_API void ComplexSin(void);
TESSEL_API void ComplexCos(void);
TESSEL_API void ComplexTan(void);
TESSEL_API void ComplexCot(void);
TESSEL_API void ComplexSinh(void);
TESSEL_API void ComplexCosh(void);
TESSEL_API void ComplexTanh(void);
TESSEL_API void ComplexSincos(void);  // two results: the sine on top of the cosine
TESSEL_API void ComplexSinc(void);    // sin z / z; 1 at 0
TESSEL_API void ComplexAsin(void);
TESSEL_API void ComplexAcos(void);
TESSEL_API void ComplexAsinh(void);
TESSEL_API void ComplexAcosh(void);
TESSEL_API void ComplexAtan(void);
TESSEL_API void ComplexAtanh(void);

// ---- one precision from memory to memory: load, operate, store; operands as for the operation, below first ----------

TESSEL_API void FLogX32(const float* base, const float* x, float* result);
TESSEL_API void FLogX64(const double* base, const double* x, double* result);
TESSEL_API void FLogXExt(const floatExt* base, const floatExt* x, floatExt* result);
TESSEL_API void FLog2_32(const float* x, float* result);
TESSEL_API void FLog2_64(const double* x, double* result);
TESSEL_API void FLog2_Ext(const floatExt* x, floatExt* result);
TESSEL_API void FLog10_32(const float* x, float* result);
TESSEL_API void FLog10_64(const double* x, double* result);
TESSEL_API void FLog10_Ext(const floatExt* x, floatExt* result);
TESSEL_API void FLogN32(const float* x, float* result);
TESSEL_API void FLogN64(const double* x, double* result);
TESSEL_API void FLogNExt(const floatExt* x, floatExt* result);
TESSEL_API void FExpX32(const float* x, float* result);
TESSEL_API void FExpX64(const double* x, double* result);
TESSEL_API void FExpXExt(const floatExt* x, floatExt* result);
TESSEL_API void FPow10X32(const float* x, float* result);
TESSEL_API void FPow10X64(const double* x, double* result);
TESSEL_API void FPow10XExt(const floatExt* x, floatExt* result);
TESSEL_API void FPow2X32(const float* x, float* result);
TESSEL_API void FPow2X64(const double* x, double* result);
TESSEL_API void FPow2XExt(const floatExt* x, floatExt* result);
TESSEL_API void FScaleX32(const float* x, const float* n, float* result);
TESSEL_API void FScaleX64(const double* x, const double* n, double* result);
TESSEL_API void FScaleXExt(const floatExt* x, const floatExt* n, floatExt* result);
TESSEL_API void FATan2_32(const float* x, const float* y, float* result);
TESSEL_API void FATan2_64(const double* x, const double* y, double* result);
TESSEL_API void FATan2_Ext(const floatExt* x, const floatExt* y, floatExt* result);
TESSEL_API void FPowerX32(const float* x, const float* y, float* result);
TESSEL_API void FPowerX64(const double* x, const double* y, double* result);
TESSEL_API void FPowerXExt(const floatExt* x, const floatExt* y, floatExt* result);
TESSEL_API void FComplexRToP32(const cmplx64* z, cmplx64* result);
TESSEL_API void FComplexRToP64(const cmplx128* z, cmplx128* result);
TESSEL_API void FComplexRToPExt(const cmplxExt* z, cmplxExt* result);
TESSEL_API void FComplexPToR32(const cmplx64* polar, cmplx64* result);
TESSEL_API void FComplexPToR64(const cmplx128* polar, cmplx128* result);
TESSEL_API void FComplexPToRExt(const cmplxExt* polar, cmplxExt* result);

// ---- sums -----------------------------------------------------------------------------------------------------------

// The sum of `count` elements, the first at `first` and each `stride` bytes after the one before (any sign), added in
// extended precision and stored in the type of the elements. 0 for a count of 0.
TESSEL_API void Sum1DSingleArray(const float* first, int32 stride, int32 count, float* result);
TESSEL_API void Sum1DDoubleArray(const double* first, int32 stride, int32 count, double* result);
TESSEL_API void Sum1DExtendedArray(const floatExt* first, int32 stride, int32 count, floatExt* result);

TESSEL_END_C

#endif
