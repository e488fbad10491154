// The millisecond clock: monotonic, from an arbitrary origin, wrapping every 2^32 ms (49.7 days). Any thread.
#ifndef TESSEL_TIME_MILLISECS_H
#define TESSEL_TIME_MILLISECS_H

#include <tessel/base/Types.h>

TESSEL_BEGIN_C

// The clock now.
TESSEL_API uint32 MilliSecs(void);

// a - b, positive when a is later; right across the wrap while they are less than 2^31 ms apart.
TESSEL_API int32 MillisecCmp(uint32 a, uint32 b);

// Whether the clock reads the host's multimedia timer. On this host both timers are one. For start-up.
TESSEL_API void MillisecSetUseMultimediaTimer(int32 on);

TESSEL_END_C

#endif
