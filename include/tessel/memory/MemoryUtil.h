// Operations on plain blocks of bytes. No checks: null is good only for count 0. Any thread; before start and after
// stop too.
#ifndef TESSEL_MEMORY_MEMORYUTIL_H
#define TESSEL_MEMORY_MEMORYUTIL_H

#include <tessel/base/Types.h>

TESSEL_BEGIN_C

// Copies `count` bytes from `source` to `destination`, which may overlap. Note the order. Nothing for count 0.
TESSEL_API void MoveBlock(const void* source, void* destination, size_t count);

// Zero-fills.
TESSEL_API void ClearMem(void* address, size_t count);

// The difference of the first two bytes (unsigned) that are unequal, or 0.
TESSEL_API int32 BlockCmp(const void* a, const void* b, size_t count);

// Exchanges two regions of the same size, which must not overlap.
TESSEL_API void SwapBlock(void* a, void* b, size_t count);

TESSEL_END_C

#endif
