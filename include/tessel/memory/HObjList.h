// Handle object lists: an ordered list of 32-bit object references in one handle.
//
// The data is {int32 count, uint32 values[capacity]}; slots beyond the count hold 0. Make a list with DSNewHClr(4) and
// dispose of it with DSDisposeHandle. A null list is a fatal report. Callers serialise.
#ifndef TESSEL_MEMORY_HOBJLIST_H
#define TESSEL_MEMORY_HOBJLIST_H

#include <tessel/base/MgErr.h>
#include <tessel/base/Types.h>

// The position past the last value (insert), or of the last value (delete).
#define kHObjListEnd ((int32)0x7FFFFFFF)

TESSEL_BEGIN_C

// Inserts before position pos, which is pinned to [0, count]. Out of memory leaves the list unchanged.
TESSEL_API MgErr HObjListInsert(UHandle list, uint32 value, int32 pos);

// Removes the value at pos, which is pinned to [0, count - 1], and returns it; 0 for an empty list.
TESSEL_API uint32 HObjListDelete(UHandle list, int32 pos);

// Index of the last occurrence, or -1.
TESSEL_API int32 HObjListSearch(UHandle list, uint32 value);

// Removes the last occurrence: 1, or 0 when there is none.
TESSEL_API int32 HObjListSearchDelete(UHandle list, uint32 value);

// Moves the last occurrence to index 0: 1. 0 when it is there already, or (with a report) absent.
TESSEL_API int32 HObjListBringToFront(UHandle list, uint32 value);

// Exchanges the values at two positions; a fatal report when one is out of range.
TESSEL_API void HObjListSwap(UHandle list, int32 a, int32 b);

// Removes the values that are 0, keeps the order of the others, and shrinks the handle.
TESSEL_API void HCompactObjList(UHandle list);

TESSEL_END_C

#endif
