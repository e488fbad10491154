// High-resolution time: a 64-bit count in two words.
//
// The clock mode is decided once by the operating system (OpSystemFeatureFlags::kIsNTOS). In process-time mode the
// count is the processor time that the process has used, in 100 ns; in tick mode it is milliseconds, the high word
// counting the wraps of the tick (up to 255, when read at least once a wrap). Any thread. Pointers are not checked for
// null.
#ifndef TESSEL_TIME_HRTIME_H
#define TESSEL_TIME_HRTIME_H

#include <tessel/base/Types.h>

// A count in two words, in the unit of the clock mode.
typedef struct _HRTime {
    uint32 high;
    uint32 low;
} _HRTime;

TESSEL_BEGIN_C

// *t = 0.
TESSEL_API void HRTimeZero(_HRTime* t);

// *out = a + b, or a - b, modulo 2^64. `out` may be an operand.
TESSEL_API void HRTimeAdd(const _HRTime* a, const _HRTime* b, _HRTime* out);
// *out = a - b, modulo 2^64. `out` may be an operand.
TESSEL_API void HRTimeSubtract(const _HRTime* a, const _HRTime* b, _HRTime* out);

// 1 when a > b, -1 when a < b, else 0; as unsigned counts.
TESSEL_API int32 HRTimeCompare(const _HRTime* a, const _HRTime* b);

// *out = the count now, in the clock mode.
TESSEL_API void HRWallClockTime(_HRTime* out);

// The count in seconds, in the clock mode.
TESSEL_API double HRTimeToSeconds(const _HRTime* t);
// *out = so many seconds as a count, in the clock mode.
TESSEL_API void SecondsToHRTime(double seconds, _HRTime* out);

// Whether tick mode reads the host's multimedia timer. On this host both timers are one. For start-up.
TESSEL_API void HRTimeSetUseMultimediaTimer(int32 on);
// What was set; 0 at first.
TESSEL_API int32 HRTimeGetUseMultimediaTimer(void);

TESSEL_END_C

#endif
