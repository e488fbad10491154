// Between start and stop, every handle and pointer block that is made and not freed is remembered with its call stack.
// For one thread at a time, between start and stop of the library.
#ifndef TESSEL_MEMORY_SCOPEDALLOCATIONTRACKING_H
#define TESSEL_MEMORY_SCOPEDALLOCATIONTRACKING_H

#include <tessel/base/Types.h>

TESSEL_BEGIN_C

// An error report when tracking is on already; it stays on.
TESSEL_API void StartScopedAllocationTracking(void);

// Reports what is left, size and call stack, and forgets it. An error report when tracking is not on.
TESSEL_API void StopScopedAllocationTracking(void);

TESSEL_END_C

#endif
