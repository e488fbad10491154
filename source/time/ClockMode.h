// The two modes of the high-resolution time.
#ifndef TESSEL_SOURCE_TIME_CLOCKMODE_H
#define TESSEL_SOURCE_TIME_CLOCKMODE_H

#include <tessel/time/HRTime.h>

#include <atomic>

namespace tessel {

enum class ClockMode { kUndecided, kTick, kProcessTime };

// Decided on first use, and the same ever after.
ClockMode CurrentClockMode();

_HRTime ReadClock(ClockMode mode);
double SecondsOf(const _HRTime& t, ClockMode mode);
_HRTime TimeOf(double seconds, ClockMode mode);

// Extends a 32-bit tick by the number of wraps seen, modulo 256. The state holds bits 31-8 of the last tick above the
// wraps; it starts as 0. No lock: at worst two callers at once count one wrap twice.
_HRTime ExtendTick(std::atomic<uint32>& state, uint32 tick);

}  // namespace tessel

#endif
