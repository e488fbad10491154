// Pseudo-random numbers: doubles in [0, 1), the same stream from the same seeds on every host (Wichmann-Hill, AS 183;
// the period is about 7e12). Not for secrets. Nothing is done, and no number drawn, for a null pointer.
#ifndef TESSEL_UTILITIES_RANDOMGEN_H
#define TESSEL_UTILITIES_RANDOMGEN_H

#include <tessel/base/MgErr.h>
#include <tessel/base/Types.h>

TESSEL_BEGIN_C

// Seeds the process-wide generator from the clock and makes its lock; before and after all its numbers are 0.
// kMemFullErr when the lock cannot be made. Both for start and stop: no other thread may be using the generator.
TESSEL_API MgErr InitRandomGen(void);
// Always kNoErr.
TESSEL_API MgErr UninitRandomGen(void);

// The next number of the process-wide generator. Any thread.
TESSEL_API void RandomGen(double* out);

// The next number of a generator of the caller's, who keeps its three seeds (1 to 30000 or so; 0 stays 0) and is alone
// in using them.
TESSEL_API void RandomGenWithState(double* out, int32 state[3]);

// Seeds a generator of the caller's with the next number of the process-wide one.
TESSEL_API void RandomGenInitState(int32 state[3]);

TESSEL_END_C

#endif
