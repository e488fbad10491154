// Text with a length byte (PStr): 0 to 255 bytes. A buffer that takes any PStr is 256 bytes (Str255).
//
// Bytes are compared unsigned; case is mapped a byte at a time with the tables of the active code page. A null text
// is the empty text; into a null destination nothing is written, and the result is 0. All functions may be called from
// any thread on distinct data.
#ifndef TESSEL_STRINGS_STRINGPSTR_H
#define TESSEL_STRINGS_STRINGPSTR_H

#include <tessel/base/StringTypes.h>

TESSEL_BEGIN_C

// ---- copying --------------------------------------------------------------------------------------------------------

// Copies length byte and text. Returns dst.
TESSEL_API PStr PStrCpy(PStr dst, ConstPStr src);

// Copies at most n bytes, the length byte counted, and sets the length to the bytes of text copied. n of 0 or less
// copies nothing. Returns dst.
TESSEL_API PStr PStrNCpy(PStr dst, ConstPStr src, int32 n);

// Appends as much as 255 bytes in all allow. Returns the new length.
TESSEL_API int32 PStrCat(PStr dst, ConstPStr src);

// A copy in a new pointer block, which the caller disposes of with DSDisposePtr. Null for null, and when memory is
// short (reported).
TESSEL_API PStr PStrDup(ConstPStr s);

// Conversions; both return the length. PToCStr writes up to 256 bytes; CToPStr cuts at 255.
TESSEL_API int32 PToCStr(ConstPStr src, char* dst);
// Copies a terminated text, cut at 255 bytes; returns the length.
TESSEL_API int32 CToPStr(CStr src, PStr dst);

// Writes a 0 after the text and returns the length. Of a 255-byte text PStrNullTerminate overwrites the last byte, its
// length byte unchanged; PStrTerminateIfPossible leaves it alone.
TESSEL_API int32 PStrNullTerminate(PStr s);
// Writes a 0 after the text unless it has 255 bytes; returns the length.
TESSEL_API int32 PStrTerminateIfPossible(PStr s);

// ---- comparison -----------------------------------------------------------------------------------------------------

// The first difference of bytes, else of lengths. The Case forms compare a differing pair after ToLower. The PPStr
// forms take pointers to PStrs, as a sort over an array of them does.
TESSEL_API int32 PStrCmp(ConstPStr a, ConstPStr b);
// As PStrCmp, but a differing pair is compared after ToLower.
TESSEL_API int32 PStrCaseCmp(ConstPStr a, ConstPStr b);
// Whether lengths and bytes are the same.
TESSEL_API bool PStrEqual(ConstPStr a, ConstPStr b);
// Whether the texts are equal after ToLower.
TESSEL_API bool PStrCaseEqual(ConstPStr a, ConstPStr b);
// PStrCmp of what the pointers point to.
TESSEL_API int32 PPStrCmp(const ConstPStr* a, const ConstPStr* b);
// PStrCaseCmp of what the pointers point to.
TESSEL_API int32 PPStrCaseCmp(const ConstPStr* a, const ConstPStr* b);
// PStrEqual of what the pointers point to.
TESSEL_API bool PPStrEqual(const ConstPStr* a, const ConstPStr* b);
// PStrCaseEqual of what the pointers point to.
TESSEL_API bool PPStrCaseEqual(const ConstPStr* a, const ConstPStr* b);

// ---- searching and splitting ----------------------------------------------------------------------------------------

// Offset just past the first occurrence of pattern in the text, without regard to case, that begins at offset `start`
// or later. -1 if there is none, if start is outside the text, or if pattern is empty.
TESSEL_API int32 PStrInPStr(ConstPStr s, int32 start, ConstPStr pattern);

// Whether the text ends with the suffix. The text's tail is lower-cased, the suffix is taken as it is: give it in lower
// case. An empty suffix always matches.
TESSEL_API bool PStrEndsWith(ConstPStr s, CStr suffix);

// Splits at the first c that no backslash precedes: left gets what is before it, right what is after it, and the result
// is true. Without one left gets everything and right nothing. A backslash before a c is dropped from left.
TESSEL_API bool PStrSplitAtChar(ConstPStr s, uint8 c, PStr left, PStr right);

// Copies src to dst with every occurrence of find replaced, left to right. True if there was one. False, with dst
// empty, if the result would exceed 255 bytes. An empty find replaces nothing. dst may not be src.
TESSEL_API bool PStrFindReplace(PStr dst, ConstPStr src, CStr find, CStr replacement);

// ---- hashing --------------------------------------------------------------------------------------------------------

// 28-bit ELF hash of the bytes, or of their upper-case form. 0 for null and for the empty text.
TESSEL_API int32 PStrHash32(ConstPStr s, bool caseInsensitive);

TESSEL_END_C

#endif
