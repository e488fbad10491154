// Named constants and the special values of the real types. All are constant from the moment the library is loaded.
// Any thread.
#ifndef TESSEL_NUMERICS_FLOATINGPOINTCONSTANTS_H
#define TESSEL_NUMERICS_FLOATINGPOINTCONSTANTS_H

#include <tessel/base/NumericTypes.h>

TESSEL_BEGIN_C

// Each returns a pointer to static data, ready to be passed to any function that takes an extended operand. The
// mathematical and physical constants are the nearest double widened to extended; the epsilons are exact.
TESSEL_API const floatExt* ETwoPi(void);  // 2 pi
// 1 / pi.
TESSEL_API const floatExt* ERecipPi(void);
// e.
TESSEL_API const floatExt* EE(void);
// 1 / e.
TESSEL_API const floatExt* ERecipE(void);
// ln 10.
TESSEL_API const floatExt* Eln10(void);
// 1.
TESSEL_API const floatExt* EOne(void);
// 0.
TESSEL_API const floatExt* EZero(void);
// +infinity.
TESSEL_API const floatExt* EInfinity(void);
// -infinity.
TESSEL_API const floatExt* ENegInfinity(void);
// Quiet NaN, sign clear, all mantissa bits set.
TESSEL_API const floatExt* ENaN(void);
// Planck constant, J s: 6.6260693e-34 (CODATA 2002).
TESSEL_API const floatExt* EPlanck(void);
// Elementary charge, C: 1.60217653e-19 (CODATA 2002).
TESSEL_API const floatExt* EElemChg(void);
// Speed of light in vacuum, m/s: 299792458 (exact since 1983).
TESSEL_API const floatExt* ESpeedLt(void);
// Constant of gravitation, m^3/(kg s^2): 6.6742e-11 (CODATA 2002).
TESSEL_API const floatExt* EGravity(void);
// Avogadro constant, 1/mol: 6.0221415e23 (CODATA 2002).
TESSEL_API const floatExt* EAvgdro(void);
// Rydberg constant, 1/m: 10973731.568525 (CODATA 2002).
TESSEL_API const floatExt* ERydbrg(void);
// Molar gas constant, J/(mol K): 8.314472 (CODATA 2002).
TESSEL_API const floatExt* EMlrGas(void);
// ln 2.
TESSEL_API const floatExt* ELnOfTwo(void);
// Log10 e.
TESSEL_API const floatExt* ELogOfE(void);
// ln pi.
TESSEL_API const floatExt* ELnOfPi(void);
// 2^-52, the spacing of doubles at 1.
TESSEL_API const floatExt* EEpsilon(void);
// 2^-63, the spacing of extended reals at 1.
TESSEL_API const floatExt* EEpsilonExt(void);
// 2^-23, the spacing of singles at 1.
TESSEL_API const floatExt* EEpsilonSgl(void);

// Bits 0x7F800000.
TESSEL_API float SInfinity(void);
// Bits 0xFF800000.
TESSEL_API float SNegInfinity(void);
// Bits 0x7FF0000000000000.
TESSEL_API double DInfinity(void);
// Bits 0xFFF0000000000000.
TESSEL_API double DNegInfinity(void);
// All 64 bits set.
TESSEL_API double DNaN(void);

TESSEL_END_C

#endif
