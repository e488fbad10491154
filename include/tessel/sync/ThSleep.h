// Sleeping, and waiting without sleep. Any thread.
#ifndef TESSEL_SYNC_THSLEEP_H
#define TESSEL_SYNC_THSLEEP_H

#include <tessel/base/Types.h>

TESSEL_BEGIN_C

// At least so many milliseconds. 0 gives up the rest of the time slice.
TESSEL_API void ThSleep(uint32 milliseconds);

// The processor's spin-wait hint, `count` times (at least 1).
TESSEL_API void ThPause(uint32 count);

// Sleeps until just before a deadline on the millisecond clock (MilliSecs), where `now` is that clock's time. Returns
// the clock afterwards; `now` at once when the deadline has passed.
TESSEL_API uint32 ThWaitTill(uint32 deadline, uint32 now);

TESSEL_END_C

#endif
