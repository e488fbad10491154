// Arrays of LStr handles (_LStrArray), held in a handle. Each element may be null, the empty text.
//
// All functions may be called from any thread on distinct data.
#ifndef TESSEL_STRINGS_STRINGLSTRARRAY_H
#define TESSEL_STRINGS_STRINGLSTRARRAY_H

#include <tessel/base/MgErr.h>
#include <tessel/base/StringTypes.h>

// Bytes that an array of n elements takes up on this host.
#define LStrArraySize(n) ((uint32)(offsetof(_LStrArray, element) + (size_t)(n) * sizeof(LStrHandle)))

TESSEL_BEGIN_C

// Makes *array hold n elements: surplus ones are disposed of, new ones are null, and a null array is created. n of 0
// disposes of the array and stores null. The caller owns array and elements. kArgErr for a null pointer or a negative
// n, kMemFullErr when memory is short.
TESSEL_API MgErr ReallocLStrArrayHandle(LStrArrayHandle* array, int32 n);

// Replaces *array by a new array of the first n elements of the list; the old array is disposed of. On failure *array
// is as it was. kArgErr when the list has no n elements; a null out-pointer is reported and gives kGenericErr.
TESSEL_API MgErr CPStrPtrToLStrArray(const CPStr* list, int32 n, LStrArrayHandle* array);

// Makes *list hold the first n elements, each cut at 255 bytes, creating it when it is null; n of 0 or a null array
// disposes of it and stores null. kArgErr for a null pointer, a negative n and an array of fewer elements; kMemFullErr
// when *list cannot be made that large.
TESSEL_API MgErr LStrArrayToCPStrHandle(LStrArrayHandle array, int32 n, CPStrHandle* list);

TESSEL_END_C

#ifdef __cplusplus
namespace tessel {

using ::CPStrPtrToLStrArray;
using ::LStrArrayToCPStrHandle;

// The same over all elements; null is a list of none.
TESSEL_API MgErr CPStrPtrToLStrArray(const CPStr* list, LStrArrayHandle* array);
// The same over all elements; a null array is one of none.
TESSEL_API MgErr LStrArrayToCPStrHandle(LStrArrayHandle array, CPStrHandle* list);

}  // namespace tessel
#endif

#endif
