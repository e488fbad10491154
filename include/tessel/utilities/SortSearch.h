// Sorting in place, and binary search, over arrays of records of one size.
//
// A comparison returns a negative number, 0 or a positive one as its first argument stands before, with or behind its
// second. `context` is handed through to it. Whatever a comparison answers, sorting ends and stays within the array.
// Sizes are bytes. A null array or comparison counts as no records; a null key goes to the comparison as it is. Nothing
// allocates; an exception of the comparison's passes through. Any thread on its own array.
#ifndef TESSEL_UTILITIES_SORTSEARCH_H
#define TESSEL_UTILITIES_SORTSEARCH_H

#include <tessel/base/Types.h>

// Compares two records, or a key with a record.
typedef int32 (*CompareProc)(const void* a, const void* b);
// The same with the caller's context.
typedef int32 (*CompareProcEx)(const void* a, const void* b, void* context);

TESSEL_BEGIN_C

// Sorts `count` records (quicksort, not stable; equal records and sorted arrays are no bad case, and whatever the
// comparison answers the time is in proportion to n log n).
TESSEL_API void QSort(void* base, int32 count, int32 recordSize, CompareProc compare);
// The same with `context` handed to the comparison.
TESSEL_API void QSortEx(void* base, int32 count, int32 recordSize, CompareProcEx compare, void* context);

// The same where only the first `swapSize` bytes of each record are exchanged; the rest stays where it is. Nothing for
// more bytes than a record has.
TESSEL_API void QSort2(void* base, int32 count, int32 swapSize, int32 recordSize, CompareProc compare);
// QSort2 with `context` handed to the comparison.
TESSEL_API void QSort2Ex(void* base, int32 count, int32 swapSize, int32 recordSize, CompareProcEx compare,
                         void* context);

// The index of a record that matches `key`, in a sorted array; else -(i) - 1 where i is the index at which the key
// would be inserted. `compare` gets the key first.
TESSEL_API int32 BinSearch(const void* base, int32 count, int32 recordSize, const void* key, CompareProc compare);
// BinSearch with `context` handed to the comparison.
TESSEL_API int32 BinSearchEx(const void* base, int32 count, int32 recordSize, const void* key, CompareProcEx compare,
                             void* context);

// Comparisons to hand in: of int16, of int32 (right only while the difference of any two fits in an int32), and of
// unsigned numbers as wide as a pointer. Not for null.
TESSEL_API int32 CompareInt16s(const void* a, const void* b);
// Compares int32 values; right only while the difference of any two fits in an int32.
TESSEL_API int32 CompareInt32s(const void* a, const void* b);
// Compares unsigned numbers as wide as a pointer.
TESSEL_API int32 CompareUIntPtrTs(const void* a, const void* b);

TESSEL_END_C

#endif
