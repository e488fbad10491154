// Complex arithmetic and mathematics on single, double and extended operands (the final S, D or X of a name).
//
// Passing follows <tessel/numerics/RealMath.h>: by pointer, a result may be stored over an operand, a result may be
// null where there are two; other pointers must not be null and are not checked. Functions of several branches give the
// principal value, continuous from above on cuts along the real axis where the imaginary part is +0 and from below
// where it is -0. Nothing fails. Any thread.
#ifndef TESSEL_NUMERICS_COMPLEXMATH_H
#define TESSEL_NUMERICS_COMPLEXMATH_H

#include <tessel/base/NumericTypes.h>

TESSEL_BEGIN_C

// ---- arithmetic and rounding ----------------------------------------------------------------------------------------

// x + y
TESSEL_API void RTcAddS(const cmplx64* x, const cmplx64* y, cmplx64* result);
// x + y (double).
TESSEL_API void RTcAddD(const cmplx128* x, const cmplx128* y, cmplx128* result);
// x + y (extended).
TESSEL_API void RTcAddX(const cmplxExt* x, const cmplxExt* y, cmplxExt* result);

// x - y
TESSEL_API void RTcSubS(const cmplx64* x, const cmplx64* y, cmplx64* result);
// x - y (double).
TESSEL_API void RTcSubD(const cmplx128* x, const cmplx128* y, cmplx128* result);
// x - y (extended).
TESSEL_API void RTcSubX(const cmplxExt* x, const cmplxExt* y, cmplxExt* result);

// x y; of two values without imaginary part the real product, with an imaginary part of 0.
TESSEL_API void RTcMulS(const cmplx64* x, const cmplx64* y, cmplx64* result);
// x y; of two values without imaginary part the real product, with an imaginary part of 0 (double).
TESSEL_API void RTcMulD(const cmplx128* x, const cmplx128* y, cmplx128* result);
// x y; of two values without imaginary part the real product, with an imaginary part of 0 (extended).
TESSEL_API void RTcMulX(const cmplxExt* x, const cmplxExt* y, cmplxExt* result);

// x / y, by (ac + bd + (bc - ad) i) / (cc + dd): a zero divisor gives NaNs.
TESSEL_API void RTcDivS(const cmplx64* x, const cmplx64* y, cmplx64* result);
// x / y, by (ac + bd + (bc - ad) i) / (cc + dd): a zero divisor gives NaNs (double).
TESSEL_API void RTcDivD(const cmplx128* x, const cmplx128* y, cmplx128* result);
// x / y, by (ac + bd + (bc - ad) i) / (cc + dd): a zero divisor gives NaNs (extended).
TESSEL_API void RTcDivX(const cmplxExt* x, const cmplxExt* y, cmplxExt* result);

// 1 / x
TESSEL_API void RTcRecipS(const cmplx64* x, cmplx64* result);
// 1 / x (double).
TESSEL_API void RTcRecipD(const cmplx128* x, cmplx128* result);
// 1 / x (extended).
TESSEL_API void RTcRecipX(const cmplxExt* x, cmplxExt* result);

// -x
TESSEL_API void RTcNegS(const cmplx64* x, cmplx64* result);
// -x (double).
TESSEL_API void RTcNegD(const cmplx128* x, cmplx128* result);
// -x (extended).
TESSEL_API void RTcNegX(const cmplxExt* x, cmplxExt* result);

// The conjugate.
TESSEL_API void RTcConjS(const cmplx64* x, cmplx64* result);
// The conjugate (double).
TESSEL_API void RTcConjD(const cmplx128* x, cmplx128* result);
// The conjugate (extended).
TESSEL_API void RTcConjX(const cmplxExt* x, cmplxExt* result);

// x + 1
TESSEL_API void RTcIncS(const cmplx64* x, cmplx64* result);
// x + 1 (double).
TESSEL_API void RTcIncD(const cmplx128* x, cmplx128* result);
// x + 1 (extended).
TESSEL_API void RTcIncX(const cmplxExt* x, cmplxExt* result);

// x - 1
TESSEL_API void RTcDecS(const cmplx64* x, cmplx64* result);
// x - 1 (double).
TESSEL_API void RTcDecD(const cmplx128* x, cmplx128* result);
// x - 1 (extended).
TESSEL_API void RTcDecX(const cmplxExt* x, cmplxExt* result);

// Square root, real part not negative.
TESSEL_API void RTcSqrtS(const cmplx64* x, cmplx64* result);
// Square root, real part not negative (double).
TESSEL_API void RTcSqrtD(const cmplx128* x, cmplx128* result);
// Square root, real part not negative (extended).
TESSEL_API void RTcSqrtX(const cmplxExt* x, cmplxExt* result);

// x scaled to magnitude 1; 0 stays 0.
TESSEL_API void RTcSignS(const cmplx64* x, cmplx64* result);
// x scaled to magnitude 1; 0 stays 0 (double).
TESSEL_API void RTcSignD(const cmplx128* x, cmplx128* result);
// x scaled to magnitude 1; 0 stays 0 (extended).
TESSEL_API void RTcSignX(const cmplxExt* x, cmplxExt* result);

// Both parts to the nearest integer, halves to even.
TESSEL_API void RTcRoundS(const cmplx64* x, cmplx64* result);
// Both parts to the nearest integer, halves to even (double).
TESSEL_API void RTcRoundD(const cmplx128* x, cmplx128* result);
// Both parts to the nearest integer, halves to even (extended).
TESSEL_API void RTcRoundX(const cmplxExt* x, cmplxExt* result);

// Both parts to the smallest integer not below.
TESSEL_API void RTcCeilS(const cmplx64* x, cmplx64* result);
// Both parts to the smallest integer not below (double).
TESSEL_API void RTcCeilD(const cmplx128* x, cmplx128* result);
// Both parts to the smallest integer not below (extended).
TESSEL_API void RTcCeilX(const cmplxExt* x, cmplxExt* result);

// Both parts to the largest integer not above.
TESSEL_API void RTcFloorS(const cmplx64* x, cmplx64* result);
// Both parts to the largest integer not above (double).
TESSEL_API void RTcFloorD(const cmplx128* x, cmplx128* result);
// Both parts to the largest integer not above (extended).
TESSEL_API void RTcFloorX(const cmplxExt* x, cmplxExt* result);

// x times 2 to the power trunc(n).
TESSEL_API void RTciScaleS(const cmplx64* x, const float* n, cmplx64* result);
// x times 2 to the power trunc(n) (double).
TESSEL_API void RTciScaleD(const cmplx128* x, const double* n, cmplx128* result);
// x times 2 to the power trunc(n) (extended).
TESSEL_API void RTciScaleX(const cmplxExt* x, const floatExt* n, cmplxExt* result);

// ---- forms: magnitude and angle, real and imaginary part ------------------------------------------------------------

// Magnitude
TESSEL_API void RTcAbsS(const cmplx64* x, float* result);
// Magnitude (double).
TESSEL_API void RTcAbsD(const cmplx128* x, double* result);
// Magnitude (extended).
TESSEL_API void RTcAbsX(const cmplxExt* x, floatExt* result);

// Magnitude (as the real part) and angle (as the imaginary part); 0 stays as it is.
TESSEL_API void RTcRToPS(const cmplx64* x, cmplx64* result);
// Magnitude (as the real part) and angle (as the imaginary part); 0 stays as it is (double).
TESSEL_API void RTcRToPD(const cmplx128* x, cmplx128* result);
// Magnitude (as the real part) and angle (as the imaginary part); 0 stays as it is (extended).
TESSEL_API void RTcRToPX(const cmplxExt* x, cmplxExt* result);

// The reverse of RTcRToP.
TESSEL_API void RTcPToRS(const cmplx64* x, cmplx64* result);
// The reverse of RTcRToP (double).
TESSEL_API void RTcPToRD(const cmplx128* x, cmplx128* result);
// The reverse of RTcRToP (extended).
TESSEL_API void RTcPToRX(const cmplxExt* x, cmplxExt* result);

// Magnitude and angle
TESSEL_API void RTcfCToRThS(const cmplx64* x, float* magnitude, float* angle);
// Magnitude and angle (double).
TESSEL_API void RTcfCToRThD(const cmplx128* x, double* magnitude, double* angle);
// Magnitude and angle (extended).
TESSEL_API void RTcfCToRThX(const cmplxExt* x, floatExt* magnitude, floatExt* angle);

// Of magnitude and angle.
TESSEL_API void RTfcRThToCS(const float* magnitude, const float* angle, cmplx64* result);
// Of magnitude and angle (double).
TESSEL_API void RTfcRThToCD(const double* magnitude, const double* angle, cmplx128* result);
// Of magnitude and angle (extended).
TESSEL_API void RTfcRThToCX(const floatExt* magnitude, const floatExt* angle, cmplxExt* result);

// Real and imaginary part
TESSEL_API void RTcfCToReImS(const cmplx64* x, float* re, float* im);
// Real and imaginary part (double).
TESSEL_API void RTcfCToReImD(const cmplx128* x, double* re, double* im);
// Real and imaginary part (extended).
TESSEL_API void RTcfCToReImX(const cmplxExt* x, floatExt* re, floatExt* im);

// Of real and imaginary part.
TESSEL_API void RTfcReImToCS(const float* re, const float* im, cmplx64* result);
// Of real and imaginary part (double).
TESSEL_API void RTfcReImToCD(const double* re, const double* im, cmplx128* result);
// Of real and imaginary part (extended).
TESSEL_API void RTfcReImToCX(const floatExt* re, const floatExt* im, cmplxExt* result);

// ---- logarithms and powers ------------------------------------------------------------------------------------------

// Natural logarithm; of 0 a real part of -infinity.
TESSEL_API void RTcLognS(const cmplx64* x, cmplx64* result);
// Natural logarithm; of 0 a real part of -infinity (double).
TESSEL_API void RTcLognD(const cmplx128* x, cmplx128* result);
// Natural logarithm; of 0 a real part of -infinity (extended).
TESSEL_API void RTcLognX(const cmplxExt* x, cmplxExt* result);

// Logarithm to base 10
TESSEL_API void RTcLog10S(const cmplx64* x, cmplx64* result);
// Logarithm to base 10 (double).
TESSEL_API void RTcLog10D(const cmplx128* x, cmplx128* result);
// Logarithm to base 10 (extended).
TESSEL_API void RTcLog10X(const cmplxExt* x, cmplxExt* result);

// Logarithm to base 2
TESSEL_API void RTcLog2S(const cmplx64* x, cmplx64* result);
// Logarithm to base 2 (double).
TESSEL_API void RTcLog2D(const cmplx128* x, cmplx128* result);
// Logarithm to base 2 (extended).
TESSEL_API void RTcLog2X(const cmplxExt* x, cmplxExt* result);

// ln(1 + x), exact for small x.
TESSEL_API void RTcLognp1S(const cmplx64* x, cmplx64* result);
// ln(1 + x), exact for small x (double).
TESSEL_API void RTcLognp1D(const cmplx128* x, cmplx128* result);
// ln(1 + x), exact for small x (extended).
TESSEL_API void RTcLognp1X(const cmplxExt* x, cmplxExt* result);

// ln x / ln base; of two real logarithms the real quotient, so that a base or x of 0 gives what RTfLogx does.
TESSEL_API void RTcLogxS(const cmplx64* base, const cmplx64* x, cmplx64* result);
// ln x / ln base; of two real logarithms the real quotient, so that a base or x of 0 gives what RTfLogx does (double).
TESSEL_API void RTcLogxD(const cmplx128* base, const cmplx128* x, cmplx128* result);
// ln x / ln base (extended).
TESSEL_API void RTcLogxX(const cmplxExt* base, const cmplxExt* x, cmplxExt* result);

// e to the power x
TESSEL_API void RTcExpS(const cmplx64* x, cmplx64* result);
// e to the power x (double).
TESSEL_API void RTcExpD(const cmplx128* x, cmplx128* result);
// e to the power x (extended).
TESSEL_API void RTcExpX(const cmplxExt* x, cmplxExt* result);

// e to the power x, minus 1; exact for small x.
TESSEL_API void RTcExpm1S(const cmplx64* x, cmplx64* result);
// e to the power x, minus 1; exact for small x (double).
TESSEL_API void RTcExpm1D(const cmplx128* x, cmplx128* result);
// e to the power x, minus 1; exact for small x (extended).
TESSEL_API void RTcExpm1X(const cmplxExt* x, cmplxExt* result);

// 10 to the power x
TESSEL_API void RTcPow10S(const cmplx64* x, cmplx64* result);
// 10 to the power x (double).
TESSEL_API void RTcPow10D(const cmplx128* x, cmplx128* result);
// 10 to the power x (extended).
TESSEL_API void RTcPow10X(const cmplxExt* x, cmplxExt* result);

// 2 to the power x
TESSEL_API void RTcPow2S(const cmplx64* x, cmplx64* result);
// 2 to the power x (double).
TESSEL_API void RTcPow2D(const cmplx128* x, cmplx128* result);
// 2 to the power x (extended).
TESSEL_API void RTcPow2X(const cmplxExt* x, cmplxExt* result);

// x to the power y
TESSEL_API void RTcPowxS(const cmplx64* x, const cmplx64* y, cmplx64* result);
// x to the power y (double).
TESSEL_API void RTcPowxD(const cmplx128* x, const cmplx128* y, cmplx128* result);
// x to the power y (extended).
TESSEL_API void RTcPowxX(const cmplxExt* x, const cmplxExt* y, cmplxExt* result);

// ---- trigonometry, in radians ---------------------------------------------------------------------------------------

// Sine of x radians.
TESSEL_API void RTcSinS(const cmplx64* x, cmplx64* result);
// Sine of x radians (double).
TESSEL_API void RTcSinD(const cmplx128* x, cmplx128* result);
// Sine of x radians (extended).
TESSEL_API void RTcSinX(const cmplxExt* x, cmplxExt* result);

// Cosine of x radians.
TESSEL_API void RTcCosS(const cmplx64* x, cmplx64* result);
// Cosine of x radians (double).
TESSEL_API void RTcCosD(const cmplx128* x, cmplx128* result);
// Cosine of x radians (extended).
TESSEL_API void RTcCosX(const cmplxExt* x, cmplxExt* result);

// Tangent of x radians.
TESSEL_API void RTcTanS(const cmplx64* x, cmplx64* result);
// Tangent of x radians (double).
TESSEL_API void RTcTanD(const cmplx128* x, cmplx128* result);
// Tangent of x radians (extended).
TESSEL_API void RTcTanX(const cmplxExt* x, cmplxExt* result);

// Sine and cosine at once.
TESSEL_API void RTcSinCosS(const cmplx64* x, cmplx64* sine, cmplx64* cosine);
// Sine and cosine at once (double).
TESSEL_API void RTcSinCosD(const cmplx128* x, cmplx128* sine, cmplx128* cosine);
// Sine and cosine at once (extended).
TESSEL_API void RTcSinCosX(const cmplxExt* x, cmplxExt* sine, cmplxExt* cosine);

// 1 / cos x
TESSEL_API void RTcSecS(const cmplx64* x, cmplx64* result);
// 1 / cos x (double).
TESSEL_API void RTcSecD(const cmplx128* x, cmplx128* result);
// 1 / cos x (extended).
TESSEL_API void RTcSecX(const cmplxExt* x, cmplxExt* result);

// 1 / sin x
TESSEL_API void RTcCscS(const cmplx64* x, cmplx64* result);
// 1 / sin x (double).
TESSEL_API void RTcCscD(const cmplx128* x, cmplx128* result);
// 1 / sin x (extended).
TESSEL_API void RTcCscX(const cmplxExt* x, cmplxExt* result);

// 1 / tan x
TESSEL_API void RTcCotS(const cmplx64* x, cmplx64* result);
// 1 / tan x (double).
TESSEL_API void RTcCotD(const cmplx128* x, cmplx128* result);
// 1 / tan x (extended).
TESSEL_API void RTcCotX(const cmplxExt* x, cmplxExt* result);

// sin x / x; 1 at 0.
TESSEL_API void RTcSincS(const cmplx64* x, cmplx64* result);
// sin x / x; 1 at 0 (double).
TESSEL_API void RTcSincD(const cmplx128* x, cmplx128* result);
// sin x / x; 1 at 0 (extended).
TESSEL_API void RTcSincX(const cmplxExt* x, cmplxExt* result);

// Arcsine.
TESSEL_API void RTcAsinS(const cmplx64* x, cmplx64* result);
// Arcsine (double).
TESSEL_API void RTcAsinD(const cmplx128* x, cmplx128* result);
// Arcsine (extended).
TESSEL_API void RTcAsinX(const cmplxExt* x, cmplxExt* result);

// Arccosine.
TESSEL_API void RTcAcosS(const cmplx64* x, cmplx64* result);
// Arccosine (double).
TESSEL_API void RTcAcosD(const cmplx128* x, cmplx128* result);
// Arccosine (extended).
TESSEL_API void RTcAcosX(const cmplxExt* x, cmplxExt* result);

// Arctangent.
TESSEL_API void RTcAtanS(const cmplx64* x, cmplx64* result);
// Arctangent (double).
TESSEL_API void RTcAtanD(const cmplx128* x, cmplx128* result);
// Arctangent (extended).
TESSEL_API void RTcAtanX(const cmplxExt* x, cmplxExt* result);

// The arctangent of y / x.
TESSEL_API void RTcAtan2S(const cmplx64* x, const cmplx64* y, cmplx64* result);
// The arctangent of y / x (double).
TESSEL_API void RTcAtan2D(const cmplx128* x, const cmplx128* y, cmplx128* result);
// The arctangent of y / x (extended).
TESSEL_API void RTcAtan2X(const cmplxExt* x, const cmplxExt* y, cmplxExt* result);

// Hyperbolic sine.
TESSEL_API void RTcSinhS(const cmplx64* x, cmplx64* result);
// Hyperbolic sine (double).
TESSEL_API void RTcSinhD(const cmplx128* x, cmplx128* result);
// Hyperbolic sine (extended).
TESSEL_API void RTcSinhX(const cmplxExt* x, cmplxExt* result);

// Hyperbolic cosine.
TESSEL_API void RTcCoshS(const cmplx64* x, cmplx64* result);
// Hyperbolic cosine (double).
TESSEL_API void RTcCoshD(const cmplx128* x, cmplx128* result);
// Hyperbolic cosine (extended).
TESSEL_API void RTcCoshX(const cmplxExt* x, cmplxExt* result);

// Hyperbolic tangent.
TESSEL_API void RTcTanhS(const cmplx64* x, cmplx64* result);
// Hyperbolic tangent (double).
TESSEL_API void RTcTanhD(const cmplx128* x, cmplx128* result);
// Hyperbolic tangent (extended).
TESSEL_API void RTcTanhX(const cmplxExt* x, cmplxExt* result);

// Inverse hyperbolic sine.
TESSEL_API void RTcAsinhS(const cmplx64* x, cmplx64* result);
// Inverse hyperbolic sine (double).
TESSEL_API void RTcAsinhD(const cmplx128* x, cmplx128* result);
// Inverse hyperbolic sine (extended).
TESSEL_API void RTcAsinhX(const cmplxExt* x, cmplxExt* result);

// Inverse hyperbolic cosine.
TESSEL_API void RTcAcoshS(const cmplx64* x, cmplx64* result);
// Inverse hyperbolic cosine (double).
TESSEL_API void RTcAcoshD(const cmplx128* x, cmplx128* result);
// Inverse hyperbolic cosine (extended).
TESSEL_API void RTcAcoshX(const cmplxExt* x, cmplxExt* result);

// Inverse hyperbolic tangent.
TESSEL_API void RTcAtanhS(const cmplx64* x, cmplx64* result);
// Inverse hyperbolic tangent (double).
TESSEL_API void RTcAtanhD(const cmplx128* x, cmplx128* result);
// Inverse hyperbolic tangent (extended).
TESSEL_API void RTcAtanhX(const cmplxExt* x, cmplxExt* result);

// ---- predicates: 1 or 0, of both parts; RTcIsNan is 1 when either part is a NaN -------------------------------------

// 1 when either part is a NaN, else 0.
TESSEL_API int32 RTcIsNanS(const cmplx64* x);
// 1 when either part is a NaN, else 0 (double).
TESSEL_API int32 RTcIsNanD(const cmplx128* x);
// 1 when either part is a NaN, else 0 (extended).
TESSEL_API int32 RTcIsNanX(const cmplxExt* x);
// 1 when x == 0 in both parts, else 0.
TESSEL_API int32 RTcEQ0S(const cmplx64* x);
// 1 when x == 0 in both parts, else 0 (double).
TESSEL_API int32 RTcEQ0D(const cmplx128* x);
// 1 when x == 0 in both parts, else 0 (extended).
TESSEL_API int32 RTcEQ0X(const cmplxExt* x);
// 1 when x != 0 in either part, else 0.
TESSEL_API int32 RTcNE0S(const cmplx64* x);
// 1 when x != 0 in either part, else 0 (double).
TESSEL_API int32 RTcNE0D(const cmplx128* x);
// 1 when x != 0 in either part, else 0 (extended).
TESSEL_API int32 RTcNE0X(const cmplxExt* x);
// 1 when x == y in both parts, else 0.
TESSEL_API int32 RTcEQS(const cmplx64* x, const cmplx64* y);
// 1 when x == y in both parts, else 0 (double).
TESSEL_API int32 RTcEQD(const cmplx128* x, const cmplx128* y);
// 1 when x == y in both parts, else 0 (extended).
TESSEL_API int32 RTcEQX(const cmplxExt* x, const cmplxExt* y);
// 1 when x != y in either part, else 0.
TESSEL_API int32 RTcNES(const cmplx64* x, const cmplx64* y);
// 1 when x != y in either part, else 0 (double).
TESSEL_API int32 RTcNED(const cmplx128* x, const cmplx128* y);
// 1 when x != y in either part, else 0 (extended).
TESSEL_API int32 RTcNEX(const cmplxExt* x, const cmplxExt* y);

TESSEL_END_C

#endif
