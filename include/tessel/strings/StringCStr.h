// Zero-terminated text (CStr), characters, and the process-wide decimal point.
//
// Bytes are compared unsigned. Case is mapped a byte at a time with the tables of the active code page. Lengths and
// indices are bytes. No destination is checked for room: it must take the result and its terminator, and may overlap
// what is copied. A null text is the empty text; into a null destination nothing is written. All functions may be
// called from any thread on distinct data.
#ifndef TESSEL_STRINGS_STRINGCSTR_H
#define TESSEL_STRINGS_STRINGCSTR_H

#include <tessel/base/Types.h>

TESSEL_BEGIN_C

// ---- length and copying ---------------------------------------------------------------------------------------------

// Bytes before the terminator.
TESSEL_API int32 StrLen(CStr s);

// Copies the text and its terminator.
TESSEL_API void StrCpy(char* dst, CStr src);

// Copies at most n bytes; when src ends first, the rest of the n bytes become 0. No terminator is added after n bytes.
// Returns dst.
TESSEL_API char* StrNCpy(char* dst, CStr src, int32 n);

// Appends src and a terminator. Returns the new length.
TESSEL_API int32 StrCat(char* dst, CStr src);

// ---- comparison: negative, zero or positive -------------------------------------------------------------------------

// The difference at the first differing byte; when a ends first, minus the next byte of b; when b ends first, 1.
TESSEL_API int32 StrCmp(CStr a, CStr b);
// Whether the bytes are the same.
TESSEL_API bool StrEqual(CStr a, CStr b);

// The same over at most n bytes; n of 0 or less is equal.
TESSEL_API int32 StrNCmp(CStr a, CStr b, int32 n);
// Whether the first n bytes are the same; n of 0 or less is equal.
TESSEL_API bool StrNEqual(CStr a, CStr b, int32 n);

// As StrCmp, but a differing pair is compared after ToLower.
TESSEL_API int32 StrCaseCmp(CStr a, CStr b);
// As StrCaseCmp over at most n bytes.
TESSEL_API int32 StrNCaseCmp(CStr a, CStr b, int32 n);
// Whether the first n bytes are equal after ToLower.
TESSEL_API bool StrNCaseEqual(CStr a, CStr b, int32 n);

// ---- searching ------------------------------------------------------------------------------------------------------

// First and last occurrence of the byte c before the terminator, or null. Searching for 0 gives null.
TESSEL_API char* StrChr(CStr s, int32 c);
// The last occurrence of the byte before the terminator, or null.
TESSEL_API char* StrRChr(CStr s, int32 c);

// Whether pattern occurs in s, without regard to case and to the spaces and tabs of s. An empty s has no occurrence.
TESSEL_API bool StrIStr(CStr s, CStr pattern);

// ---- case and stepping ----------------------------------------------------------------------------------------------

// Maps len bytes in place. Bytes of multi-byte characters are left alone.
TESSEL_API void StrToUpper(char* s, int32 len);
// Maps len bytes in place to lower case. Bytes of multi-byte characters are left alone.
TESSEL_API void StrToLower(char* s, int32 len);

// Index of the character after the one at `index`: a multi-byte character is stepped over whole. At the terminator
// index + 1.
TESSEL_API int32 StrNextChar(CStr s, int32 index);

// Index where the character before `index` starts; 0 for index 0. A negative index is reported and gives 0.
TESSEL_API int32 StrPrevChar(CStr s, int32 index);

// ---- characters -----------------------------------------------------------------------------------------------------

// Plain ASCII classes; IsPunct is every printing character but letters, digits and the space.
TESSEL_API bool IsDigit(int32 c);
// A to Z and a to z.
TESSEL_API bool IsAlpha(int32 c);
// Every printing ASCII character but letters, digits and the space.
TESSEL_API bool IsPunct(int32 c);

// Whether c differs from its upper-case (lower-case) mapping.
TESSEL_API bool IsLower(int32 c);
// Whether c differs from its lower-case mapping.
TESSEL_API bool IsUpper(int32 c);

// Single-byte mapping of the active code page. What is not a single byte, 0 to 255, comes back unchanged.
TESSEL_API int32 ToLower(int32 c);
// Single-byte mapping of the active code page; what is not 0 to 255 comes back unchanged.
TESSEL_API int32 ToUpper(int32 c);

// "0123456789ABCDEF"[n & 15]
TESSEL_API char HexChar(int32 n);

// ---- decimal point --------------------------------------------------------------------------------------------------

// The process-wide decimal point of formatted printing and number text, "." at first. Set it while the program is being
// configured: it is not synchronised with the calls that read it. StrSetDecimalPoint returns the byte it was given.
TESSEL_API uint8 StrGetDecimalPoint(void);
// Sets the process-wide decimal point while the program is being configured; returns the byte given.
TESSEL_API uint8 StrSetDecimalPoint(uint8 decimalPoint);

TESSEL_END_C

#endif
