// Atomic operations on words. All are full barriers. Any thread. Addresses are not checked for null.
#ifndef TESSEL_SYNC_THATOMIC_H
#define TESSEL_SYNC_THATOMIC_H

#include <tessel/base/Types.h>
#include <tessel/sync/ThMutex.h>

TESSEL_BEGIN_C

// The new value.
TESSEL_API int32 _ThAtomicInc(int32* address);
// Subtracts 1 and returns the new value.
TESSEL_API int32 _ThAtomicDec(int32* address);

// The previous value.
TESSEL_API int32 ThAtomicSwap(int32* address, int32 value);
// Stores `value` and returns the previous pointer.
TESSEL_API void* ThAtomicSwapPtr(void** address, void* value);

// 1 when the word held `expected` and holds `value` now, else 0. Note the order.
TESSEL_API int32 ThSwapIfSame(int32* address, int32 value, int32 expected);
// The same for a pointer: 1 when it held `expected` and holds `value` now, else 0.
TESSEL_API int32 ThSwapIfSamePtr(void** address, void* value, void* expected);

// Reads the 8 bytes at `shared` into those at `own` (direction 0) or writes them there, at once. Where the processor
// has no 8-byte atomics they are copied under the mutex (null: without a lock).
TESSEL_API void Th8ByteAtomicWrtRd(void* own, void* shared, int32 direction, ThMutex mutex);

TESSEL_END_C

#endif
