// Integer members of the math family. What does not fit wraps around. Any thread.
#ifndef TESSEL_NUMERICS_INTEGERMATH_H
#define TESSEL_NUMERICS_INTEGERMATH_H

#include <tessel/base/NumericTypes.h>

TESSEL_BEGIN_C

// x y; wraps around.
TESSEL_API int32 RTiMul(int32 x, int32 y);
// x y; wraps around.
TESSEL_API uint32 RTuMul(uint32 x, uint32 y);

// The quotient, truncated toward zero. The divisor must not be 0.
TESSEL_API int32 RTiDiv(int32 x, int32 y);
// x / y, truncated. The divisor must not be 0.
TESSEL_API uint32 RTuDiv(uint32 x, uint32 y);

// Quotient, truncated toward zero, and remainder, which has the sign of x. Either result pointer may be null. A zero
// divisor gives the quotient 0 and the remainder x; the minimum divided by -1 gives the minimum and 0.
TESSEL_API void RTQRemiQ(int64 x, int64 y, int64* quotient, int64* remainder);
// Unsigned quotient and remainder; either result pointer may be null. A zero divisor gives 0 and x.
TESSEL_API void RTQRemuQ(uint64 x, uint64 y, uint64* quotient, uint64* remainder);

TESSEL_END_C

#endif
