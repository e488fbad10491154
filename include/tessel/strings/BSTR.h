// Counted wide strings (BSTR): a pointer to UTF-16 text with its size in bytes, a uint32, just before it and a
// terminating zero after it. Null is the empty text. Any thread.
#ifndef TESSEL_STRINGS_BSTR_H
#define TESSEL_STRINGS_BSTR_H

#include <tessel/base/Types.h>

#ifdef __cplusplus
namespace tessel {

using BSTR = char16_t*;

// A new string of `length` units, copied from text (null leaves them unset). The caller frees it with BSTRFree. Null
// when memory is short.
TESSEL_API BSTR BSTRAlloc(const char16_t* text, uint32 length);
// Frees a string that BSTRAlloc made.
TESSEL_API void BSTRFree(BSTR text);

// Length in 16-bit units.
TESSEL_API uint32 BSTRLength(const char16_t* text);

}  // namespace tessel
#endif

#endif
