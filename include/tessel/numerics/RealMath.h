// Real arithmetic and mathematics on single, double and extended operands (the final S, D or X of a name).
//
// Operands and results are passed by pointer, so that a caller can use any member in the same way. A result may be
// stored over an operand. Pointers must not be null and are not checked, except those to the results of a member that
// has two: a null one is not stored. Nothing fails: a NaN operand gives a NaN (but x to the power 0 and 1 to any power
// are 1), a result without a value is a NaN or an infinity. How results are rounded is said in
// <tessel/numerics/RoundingUtil.h>. Any thread.
#ifndef TESSEL_NUMERICS_REALMATH_H
#define TESSEL_NUMERICS_REALMATH_H

#include <tessel/base/NumericTypes.h>

TESSEL_BEGIN_C

// ---- arithmetic and rounding ----------------------------------------------------------------------------------------

// x + y
TESSEL_API void RTfAddS(const float* x, const float* y, float* result);
// x + y (double).
TESSEL_API void RTfAddD(const double* x, const double* y, double* result);
// x + y (extended).
TESSEL_API void RTfAddX(const floatExt* x, const floatExt* y, floatExt* result);

// x - y
TESSEL_API void RTfSubS(const float* x, const float* y, float* result);
// x - y (double).
TESSEL_API void RTfSubD(const double* x, const double* y, double* result);
// x - y (extended).
TESSEL_API void RTfSubX(const floatExt* x, const floatExt* y, floatExt* result);

// x y
TESSEL_API void RTfMulS(const float* x, const float* y, float* result);
// x y (double).
TESSEL_API void RTfMulD(const double* x, const double* y, double* result);
// x y (extended).
TESSEL_API void RTfMulX(const floatExt* x, const floatExt* y, floatExt* result);

// x / y
TESSEL_API void RTfDivS(const float* x, const float* y, float* result);
// x / y (double).
TESSEL_API void RTfDivD(const double* x, const double* y, double* result);
// x / y (extended).
TESSEL_API void RTfDivX(const floatExt* x, const floatExt* y, floatExt* result);

// x - floor(x / y) y, the remainder that has the sign of y, or +0: RTfModD of -7 and 3 is 2.
TESSEL_API void RTfModS(const float* x, const float* y, float* result);
// x - floor(x / y) y, the remainder that has the sign of y, or +0: RTfModD of -7 and 3 is 2 (double).
TESSEL_API void RTfModD(const double* x, const double* y, double* result);
// x - floor(x / y) y, the remainder that has the sign of y, or +0: RTfModD of -7 and 3 is 2 (extended).
TESSEL_API void RTfModX(const floatExt* x, const floatExt* y, floatExt* result);

// The remainder of the truncated quotient, which has the sign of x. RTfRemX is not provided: it is reported (fatal) and
// gives a NaN.
TESSEL_API void RTfRemS(const float* x, const float* y, float* result);
// The remainder of the truncated quotient, which has the sign of x (double).
TESSEL_API void RTfRemD(const double* x, const double* y, double* result);
// The remainder of the truncated quotient, which has the sign of x (extended).
TESSEL_API void RTfRemX(const floatExt* x, const floatExt* y, floatExt* result);

// floor(x / y), and x - y times that (as RTfMod).
TESSEL_API void RTfQRemS(const float* x, const float* y, float* quotient, float* remainder);
// floor(x / y), and x - y times that (as RTfMod) (double).
TESSEL_API void RTfQRemD(const double* x, const double* y, double* quotient, double* remainder);
// floor(x / y), and x - y times that (as RTfMod) (extended).
TESSEL_API void RTfQRemX(const floatExt* x, const floatExt* y, floatExt* quotient, floatExt* remainder);

// The larger and the smaller of two; both NaN when one operand is. Equal operands give x.
TESSEL_API void RTfMaxMinS(const float* x, const float* y, float* max, float* min);
// The larger and the smaller of two; both NaN when one operand is (double).
TESSEL_API void RTfMaxMinD(const double* x, const double* y, double* max, double* min);
// The larger and the smaller of two; both NaN when one operand is (extended).
TESSEL_API void RTfMaxMinX(const floatExt* x, const floatExt* y, floatExt* max, floatExt* min);

// |x|
TESSEL_API void RTfAbsS(const float* x, float* result);
// |x| (double).
TESSEL_API void RTfAbsD(const double* x, double* result);
// |x| (extended).
TESSEL_API void RTfAbsX(const floatExt* x, floatExt* result);

// -x
TESSEL_API void RTfNegS(const float* x, float* result);
// -x (double).
TESSEL_API void RTfNegD(const double* x, double* result);
// -x (extended).
TESSEL_API void RTfNegX(const floatExt* x, floatExt* result);

// x + 1
TESSEL_API void RTfIncS(const float* x, float* result);
// x + 1 (double).
TESSEL_API void RTfIncD(const double* x, double* result);
// x + 1 (extended).
TESSEL_API void RTfIncX(const floatExt* x, floatExt* result);

// x - 1
TESSEL_API void RTfDecS(const float* x, float* result);
// x - 1 (double).
TESSEL_API void RTfDecD(const double* x, double* result);
// x - 1 (extended).
TESSEL_API void RTfDecX(const floatExt* x, floatExt* result);

// 1 / x
TESSEL_API void RTfRecipS(const float* x, float* result);
// 1 / x (double).
TESSEL_API void RTfRecipD(const double* x, double* result);
// 1 / x (extended).
TESSEL_API void RTfRecipX(const floatExt* x, floatExt* result);

// Square root; a negative x gives a NaN.
TESSEL_API void RTfSqrtS(const float* x, float* result);
// Square root; a negative x gives a NaN (double).
TESSEL_API void RTfSqrtD(const double* x, double* result);
// Square root; a negative x gives a NaN (extended).
TESSEL_API void RTfSqrtX(const floatExt* x, floatExt* result);

// -1, 0 or 1.
TESSEL_API void RTfSignS(const float* x, float* result);
// -1, 0 or 1 (double).
TESSEL_API void RTfSignD(const double* x, double* result);
// -1, 0 or 1 (extended).
TESSEL_API void RTfSignX(const floatExt* x, floatExt* result);

// Nearest integer, halves to even; a zero is +0.
TESSEL_API void RTfRoundS(const float* x, float* result);
// Nearest integer, halves to even; a zero is +0 (double).
TESSEL_API void RTfRoundD(const double* x, double* result);
// Nearest integer, halves to even; a zero is +0 (extended).
TESSEL_API void RTfRoundX(const floatExt* x, floatExt* result);

// Smallest integer not below x.
TESSEL_API void RTfCeilS(const float* x, float* result);
// Smallest integer not below x (double).
TESSEL_API void RTfCeilD(const double* x, double* result);
// Smallest integer not below x (extended).
TESSEL_API void RTfCeilX(const floatExt* x, floatExt* result);

// Largest integer not above x.
TESSEL_API void RTfFloorS(const float* x, float* result);
// Largest integer not above x (double).
TESSEL_API void RTfFloorD(const double* x, double* result);
// Largest integer not above x (extended).
TESSEL_API void RTfFloorX(const floatExt* x, floatExt* result);

// x times 2 to the power trunc(n).
TESSEL_API void RTfiScaleS(const float* x, const float* n, float* result);
// x times 2 to the power trunc(n) (double).
TESSEL_API void RTfiScaleD(const double* x, const double* n, double* result);
// x times 2 to the power trunc(n) (extended).
TESSEL_API void RTfiScaleX(const floatExt* x, const floatExt* n, floatExt* result);

// x as mantissa times 2 to the power exponent, 1 <= |mantissa| < 2; both 0 for x = 0. An infinity has mantissa and
// exponent infinite, a NaN both NaN.
TESSEL_API void RTfGetMantExpS(const float* x, float* mantissa, float* exponent);
// x as mantissa times 2 to the power exponent, 1 <= |mantissa| < 2; both 0 for x = 0 (double).
TESSEL_API void RTfGetMantExpD(const double* x, double* mantissa, double* exponent);
// x as mantissa times 2 to the power exponent, 1 <= |mantissa| < 2; both 0 for x = 0 (extended).
TESSEL_API void RTfGetMantExpX(const floatExt* x, floatExt* mantissa, floatExt* exponent);

// ---- logarithms: of 0 -infinity, of a negative value or a NaN the NaN of the precision ------------------------------

// Natural logarithm
TESSEL_API void RTfLognS(const float* x, float* result);
// Natural logarithm (double).
TESSEL_API void RTfLognD(const double* x, double* result);
// Natural logarithm (extended).
TESSEL_API void RTfLognX(const floatExt* x, floatExt* result);

// Logarithm to base 10
TESSEL_API void RTfLog10S(const float* x, float* result);
// Logarithm to base 10 (double).
TESSEL_API void RTfLog10D(const double* x, double* result);
// Logarithm to base 10 (extended).
TESSEL_API void RTfLog10X(const floatExt* x, floatExt* result);

// Logarithm to base 2
TESSEL_API void RTfLog2S(const float* x, float* result);
// Logarithm to base 2 (double).
TESSEL_API void RTfLog2D(const double* x, double* result);
// Logarithm to base 2 (extended).
TESSEL_API void RTfLog2X(const floatExt* x, floatExt* result);

// ln(1 + x), exact for small x: of -1 -infinity, below it a NaN.
TESSEL_API void RTfLognp1S(const float* x, float* result);
// ln(1 + x), exact for small x: of -1 -infinity, below it a NaN (double).
TESSEL_API void RTfLognp1D(const double* x, double* result);
// ln(1 + x), exact for small x: of -1 -infinity, below it a NaN (extended).
TESSEL_API void RTfLognp1X(const floatExt* x, floatExt* result);

// Logarithm to the given base: ln x / ln base.
TESSEL_API void RTfLogxS(const float* base, const float* x, float* result);
// Logarithm to the given base: ln x / ln base (double).
TESSEL_API void RTfLogxD(const double* base, const double* x, double* result);
// Logarithm to the given base: ln x / ln base (extended).
TESSEL_API void RTfLogxX(const floatExt* base, const floatExt* x, floatExt* result);

// ---- powers ---------------------------------------------------------------------------------------------------------

// e to the power x
TESSEL_API void RTfExpS(const float* x, float* result);
// e to the power x (double).
TESSEL_API void RTfExpD(const double* x, double* result);
// e to the power x (extended).
TESSEL_API void RTfExpX(const floatExt* x, floatExt* result);

// e to the power x, minus 1; exact for small x.
TESSEL_API void RTfExpm1S(const float* x, float* result);
// e to the power x, minus 1; exact for small x (double).
TESSEL_API void RTfExpm1D(const double* x, double* result);
// e to the power x, minus 1; exact for small x (extended).
TESSEL_API void RTfExpm1X(const floatExt* x, floatExt* result);

// 10 to the power x
TESSEL_API void RTfPow10S(const float* x, float* result);
// 10 to the power x (double).
TESSEL_API void RTfPow10D(const double* x, double* result);
// 10 to the power x (extended).
TESSEL_API void RTfPow10X(const floatExt* x, floatExt* result);

// 2 to the power x
TESSEL_API void RTfPow2S(const float* x, float* result);
// 2 to the power x (double).
TESSEL_API void RTfPow2D(const double* x, double* result);
// 2 to the power x (extended).
TESSEL_API void RTfPow2X(const floatExt* x, floatExt* result);

// x to the power y
TESSEL_API void RTfPowxS(const float* x, const float* y, float* result);
// x to the power y (double).
TESSEL_API void RTfPowxD(const double* x, const double* y, double* result);
// x to the power y (extended).
TESSEL_API void RTfPowxX(const floatExt* x, const floatExt* y, floatExt* result);

// ---- trigonometry, in radians ---------------------------------------------------------------------------------------

// Sine of x radians.
TESSEL_API void RTfSinS(const float* x, float* result);
// Sine of x radians (double).
TESSEL_API void RTfSinD(const double* x, double* result);
// Sine of x radians (extended).
TESSEL_API void RTfSinX(const floatExt* x, floatExt* result);

// Cosine of x radians.
TESSEL_API void RTfCosS(const float* x, float* result);
// Cosine of x radians (double).
TESSEL_API void RTfCosD(const double* x, double* result);
// Cosine of x radians (extended).
TESSEL_API void RTfCosX(const floatExt* x, floatExt* result);

// Tangent of x radians.
TESSEL_API void RTfTanS(const float* x, float* result);
// Tangent of x radians (double).
TESSEL_API void RTfTanD(const double* x, double* result);
// Tangent of x radians (extended).
TESSEL_API void RTfTanX(const floatExt* x, floatExt* result);

// Sine and cosine at once.
TESSEL_API void RTfSinCosS(const float* x, float* sine, float* cosine);
// Sine and cosine at once (double).
TESSEL_API void RTfSinCosD(const double* x, double* sine, double* cosine);
// Sine and cosine at once (extended).
TESSEL_API void RTfSinCosX(const floatExt* x, floatExt* sine, floatExt* cosine);

// 1 / cos x
TESSEL_API void RTfSecS(const float* x, float* result);
// 1 / cos x (double).
TESSEL_API void RTfSecD(const double* x, double* result);
// 1 / cos x (extended).
TESSEL_API void RTfSecX(const floatExt* x, floatExt* result);

// 1 / sin x
TESSEL_API void RTfCscS(const float* x, float* result);
// 1 / sin x (double).
TESSEL_API void RTfCscD(const double* x, double* result);
// 1 / sin x (extended).
TESSEL_API void RTfCscX(const floatExt* x, floatExt* result);

// 1 / tan x
TESSEL_API void RTfCotS(const float* x, float* result);
// 1 / tan x (double).
TESSEL_API void RTfCotD(const double* x, double* result);
// 1 / tan x (extended).
TESSEL_API void RTfCotX(const floatExt* x, floatExt* result);

// sin x / x; 1 at 0.
TESSEL_API void RTfSincS(const float* x, float* result);
// sin x / x; 1 at 0 (double).
TESSEL_API void RTfSincD(const double* x, double* result);
// sin x / x; 1 at 0 (extended).
TESSEL_API void RTfSincX(const floatExt* x, floatExt* result);

// Arcsine, in radians, -pi/2 to pi/2; beyond -1 to 1 a NaN.
TESSEL_API void RTfAsinS(const float* x, float* result);
// Arcsine, in radians, -pi/2 to pi/2; beyond -1 to 1 a NaN (double).
TESSEL_API void RTfAsinD(const double* x, double* result);
// Arcsine, in radians, -pi/2 to pi/2; beyond -1 to 1 a NaN (extended).
TESSEL_API void RTfAsinX(const floatExt* x, floatExt* result);

// Arccosine, in radians, 0 to pi; beyond -1 to 1 a NaN.
TESSEL_API void RTfAcosS(const float* x, float* result);
// Arccosine, in radians, 0 to pi; beyond -1 to 1 a NaN (double).
TESSEL_API void RTfAcosD(const double* x, double* result);
// Arccosine, in radians, 0 to pi; beyond -1 to 1 a NaN (extended).
TESSEL_API void RTfAcosX(const floatExt* x, floatExt* result);

// Arctangent, in radians, -pi/2 to pi/2.
TESSEL_API void RTfAtanS(const float* x, float* result);
// Arctangent, in radians, -pi/2 to pi/2 (double).
TESSEL_API void RTfAtanD(const double* x, double* result);
// Arctangent, in radians, -pi/2 to pi/2 (extended).
TESSEL_API void RTfAtanX(const floatExt* x, floatExt* result);

// Angle of the point (x, y), from -pi to pi: atan2(y, x).
TESSEL_API void RTfAtan2S(const float* x, const float* y, float* result);
// Angle of the point (x, y), from -pi to pi: atan2(y, x) (double).
TESSEL_API void RTfAtan2D(const double* x, const double* y, double* result);
// Angle of the point (x, y), from -pi to pi: atan2(y, x) (extended).
TESSEL_API void RTfAtan2X(const floatExt* x, const floatExt* y, floatExt* result);

// Hyperbolic sine.
TESSEL_API void RTfSinhS(const float* x, float* result);
// Hyperbolic sine (double).
TESSEL_API void RTfSinhD(const double* x, double* result);
// Hyperbolic sine (extended).
TESSEL_API void RTfSinhX(const floatExt* x, floatExt* result);

// Hyperbolic cosine.
TESSEL_API void RTfCoshS(const float* x, float* result);
// Hyperbolic cosine (double).
TESSEL_API void RTfCoshD(const double* x, double* result);
// Hyperbolic cosine (extended).
TESSEL_API void RTfCoshX(const floatExt* x, floatExt* result);

// Hyperbolic tangent.
TESSEL_API void RTfTanhS(const float* x, float* result);
// Hyperbolic tangent (double).
TESSEL_API void RTfTanhD(const double* x, double* result);
// Hyperbolic tangent (extended).
TESSEL_API void RTfTanhX(const floatExt* x, floatExt* result);

// Inverse hyperbolic sine.
TESSEL_API void RTfAsinhS(const float* x, float* result);
// Inverse hyperbolic sine (double).
TESSEL_API void RTfAsinhD(const double* x, double* result);
// Inverse hyperbolic sine (extended).
TESSEL_API void RTfAsinhX(const floatExt* x, floatExt* result);

// Inverse hyperbolic cosine; below 1 a NaN.
TESSEL_API void RTfAcoshS(const float* x, float* result);
// Inverse hyperbolic cosine; below 1 a NaN (double).
TESSEL_API void RTfAcoshD(const double* x, double* result);
// Inverse hyperbolic cosine; below 1 a NaN (extended).
TESSEL_API void RTfAcoshX(const floatExt* x, floatExt* result);

// Inverse hyperbolic tangent; of 1 and -1 an infinity, beyond them a NaN.
TESSEL_API void RTfAtanhS(const float* x, float* result);
// Inverse hyperbolic tangent; of 1 and -1 an infinity, beyond them a NaN (double).
TESSEL_API void RTfAtanhD(const double* x, double* result);
// Inverse hyperbolic tangent; of 1 and -1 an infinity, beyond them a NaN (extended).
TESSEL_API void RTfAtanhX(const floatExt* x, floatExt* result);

// ---- predicates: 1 or 0. A comparison with a NaN is false, except NE, which is true ---------------------------------

// 1 when x is a NaN, else 0.
TESSEL_API int32 RTfIsNanS(const float* x);
// 1 when x is a NaN, else 0 (double).
TESSEL_API int32 RTfIsNanD(const double* x);
// 1 when x is a NaN, else 0 (extended).
TESSEL_API int32 RTfIsNanX(const floatExt* x);
// 1 when x == 0, else 0; 0 with a NaN.
TESSEL_API int32 RTfEQ0S(const float* x);
// 1 when x == 0, else 0; 0 with a NaN (double).
TESSEL_API int32 RTfEQ0D(const double* x);
// 1 when x == 0, else 0; 0 with a NaN (extended).
TESSEL_API int32 RTfEQ0X(const floatExt* x);
// 1 when x != 0, else 0; 1 with a NaN.
TESSEL_API int32 RTfNE0S(const float* x);
// 1 when x != 0, else 0; 1 with a NaN (double).
TESSEL_API int32 RTfNE0D(const double* x);
// 1 when x != 0, else 0; 1 with a NaN (extended).
TESSEL_API int32 RTfNE0X(const floatExt* x);
// 1 when x >= 0, else 0; 0 with a NaN.
TESSEL_API int32 RTfGE0S(const float* x);
// 1 when x >= 0, else 0; 0 with a NaN (double).
TESSEL_API int32 RTfGE0D(const double* x);
// 1 when x >= 0, else 0; 0 with a NaN (extended).
TESSEL_API int32 RTfGE0X(const floatExt* x);
// 1 when x <= 0, else 0; 0 with a NaN.
TESSEL_API int32 RTfLE0S(const float* x);
// 1 when x <= 0, else 0; 0 with a NaN (double).
TESSEL_API int32 RTfLE0D(const double* x);
// 1 when x <= 0, else 0; 0 with a NaN (extended).
TESSEL_API int32 RTfLE0X(const floatExt* x);
// 1 when x > 0, else 0; 0 with a NaN.
TESSEL_API int32 RTfGT0S(const float* x);
// 1 when x > 0, else 0; 0 with a NaN (double).
TESSEL_API int32 RTfGT0D(const double* x);
// 1 when x > 0, else 0; 0 with a NaN (extended).
TESSEL_API int32 RTfGT0X(const floatExt* x);
// 1 when x < 0, else 0; 0 with a NaN.
TESSEL_API int32 RTfLT0S(const float* x);
// 1 when x < 0, else 0; 0 with a NaN (double).
TESSEL_API int32 RTfLT0D(const double* x);
// 1 when x < 0, else 0; 0 with a NaN (extended).
TESSEL_API int32 RTfLT0X(const floatExt* x);
// 1 when x == y, else 0; 0 with a NaN.
TESSEL_API int32 RTfEQS(const float* x, const float* y);
// 1 when x == y, else 0; 0 with a NaN (double).
TESSEL_API int32 RTfEQD(const double* x, const double* y);
// 1 when x == y, else 0; 0 with a NaN (extended).
TESSEL_API int32 RTfEQX(const floatExt* x, const floatExt* y);
// 1 when x != y, else 0; 1 with a NaN.
TESSEL_API int32 RTfNES(const float* x, const float* y);
// 1 when x != y, else 0; 1 with a NaN (double).
TESSEL_API int32 RTfNED(const double* x, const double* y);
// 1 when x != y, else 0; 1 with a NaN (extended).
TESSEL_API int32 RTfNEX(const floatExt* x, const floatExt* y);
// 1 when x >= y, else 0; 0 with a NaN.
TESSEL_API int32 RTfGES(const float* x, const float* y);
// 1 when x >= y, else 0; 0 with a NaN (double).
TESSEL_API int32 RTfGED(const double* x, const double* y);
// 1 when x >= y, else 0; 0 with a NaN (extended).
TESSEL_API int32 RTfGEX(const floatExt* x, const floatExt* y);
// 1 when x <= y, else 0; 0 with a NaN.
TESSEL_API int32 RTfLES(const float* x, const float* y);
// 1 when x <= y, else 0; 0 with a NaN (double).
TESSEL_API int32 RTfLED(const double* x, const double* y);
// 1 when x <= y, else 0; 0 with a NaN (extended).
TESSEL_API int32 RTfLEX(const floatExt* x, const floatExt* y);
// 1 when x > y, else 0; 0 with a NaN.
TESSEL_API int32 RTfGTS(const float* x, const float* y);
// 1 when x > y, else 0; 0 with a NaN (double).
TESSEL_API int32 RTfGTD(const double* x, const double* y);
// 1 when x > y, else 0; 0 with a NaN (extended).
TESSEL_API int32 RTfGTX(const floatExt* x, const floatExt* y);
// 1 when x < y, else 0; 0 with a NaN.
TESSEL_API int32 RTfLTS(const float* x, const float* y);
// 1 when x < y, else 0; 0 with a NaN (double).
TESSEL_API int32 RTfLTD(const double* x, const double* y);
// 1 when x < y, else 0; 0 with a NaN (extended).
TESSEL_API int32 RTfLTX(const floatExt* x, const floatExt* y);

TESSEL_END_C

#endif
