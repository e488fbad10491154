// Counted text (LStr), usually held in a handle.
//
// A null LStr, PStr, CStr or handle counts as the empty text wherever text is read; with a null destination nothing is
// written and the length is 0. Bytes are compared unsigned; case is mapped a byte at a time with the tables of the
// active code page. Texts appended or inserted may lie in the handle that they are put into. All functions may be
// called from any thread on distinct data.
#ifndef TESSEL_STRINGS_STRINGLSTR_H
#define TESSEL_STRINGS_STRINGLSTR_H

#include <tessel/base/MgErr.h>
#include <tessel/base/StringTypes.h>

TESSEL_BEGIN_C

// ---- comparison -----------------------------------------------------------------------------------------------------

// The first difference of bytes, else of lengths. A null pointer is below every text that is not empty (-1, 1). The
// Case forms compare a differing pair after ToLower.
TESSEL_API int32 LStrCmp(const LStr* a, const LStr* b);
// As LStrCmp, but a differing pair is compared after ToLower.
TESSEL_API int32 LStrCaseCmp(const LStr* a, const LStr* b);
// Whether lengths and bytes are the same.
TESSEL_API bool LStrEqual(const LStr* a, const LStr* b);

// The same on handles; when either text is empty, the difference of lengths.
TESSEL_API int32 LHStrCmp(LStrHandle a, LStrHandle b);
// As LHStrCmp, but a differing pair is compared after ToLower.
TESSEL_API int32 LHStrCaseCmp(LStrHandle a, LStrHandle b);
// Whether the texts of two handles are the same.
TESSEL_API bool LHStrEqual(LStrHandle a, LStrHandle b);

// The rules of LStrCmp on byte ranges, and on a PStr and an LStr.
TESSEL_API int32 PtrLenStrCmp(const void* a, int32 aLength, const void* b, int32 bLength);
// As PtrLenStrCmp, but a differing pair is compared after ToLower.
TESSEL_API int32 PtrLenStrCaseCmp(const void* a, int32 aLength, const void* b, int32 bLength);
// The rules of LStrCmp on a PStr and an LStr.
TESSEL_API int32 PLStrCmp(ConstPStr a, const LStr* b);
// As PLStrCmp, but a differing pair is compared after ToLower.
TESSEL_API int32 PLStrCaseCmp(ConstPStr a, const LStr* b);

// ---- into and out of the caller's buffers: all return the length ----------------------------------------------------

// dst must take LStrSize(length) bytes.
TESSEL_API int32 CToLStr(CStr src, LStrPtr dst);
// Copies a PStr; dst must take LStrSize(length) bytes.
TESSEL_API int32 PToLStr(ConstPStr src, LStrPtr dst);

// dst must take count + 1 bytes.
TESSEL_API int32 LToCStr(const LStr* src, char* dst);

// At most size - 1 bytes and a terminator; size 0 writes nothing. Both names are the same function.
TESSEL_API int32 LToCStrN(const LStr* src, char* dst, uint32 size);
// The same function as LToCStrN.
TESSEL_API int32 LToCStrNUnchecked(const LStr* src, char* dst, uint32 size);

// As LToCStrN, with the length stored in *length (may be null). kEmbeddedZeroErr when a byte copied is 0, so that the
// text would seem to end early; kArgErr for a null dst.
TESSEL_API MgErr LToCStrNChecked(const LStr* src, char* dst, uint32 size, int32* length);

// dst must take 256 bytes. A longer text is cut at 255 and reported.
TESSEL_API int32 LToPStr(const LStr* src, PStr dst);

// ---- into handles ---------------------------------------------------------------------------------------------------

// Makes *handle hold these bytes, creating or resizing it; the caller owns it. A null source or a length of 0 disposes
// of it and stores null. kArgErr for a null handle pointer or a negative length, kMemFullErr when memory is short.
TESSEL_API MgErr LStrFromPtr(LStrHandle* handle, int32 length, const void* src);

// The same from a PStr or CStr; a failure is reported. PStrToDSLStr is another name of PToLHStr.
TESSEL_API MgErr PToLHStr(ConstPStr src, LStrHandle* handle);
// Makes *handle hold the text of a CStr; else as PToLHStr.
TESSEL_API MgErr CToLHStr(CStr src, LStrHandle* handle);
// The same function as PToLHStr.
TESSEL_API MgErr PStrToDSLStr(ConstPStr src, LStrHandle* handle);

// ---- editing in a handle: the handle manager's error when it cannot grow, the text then being unchanged -------------

// Appends. LStrCat leaves the handle exactly as large as the text; LStrCatEfficient and LStrAppendChar only ever grow
// it. kArgErr for a null handle.
TESSEL_API MgErr LStrCat(LStrHandle dst, const LStr* src);
// As LStrCat, but only ever grows the handle.
TESSEL_API MgErr LStrCatEfficient(LStrHandle dst, const LStr* src);
// Appends a byte; only ever grows the handle.
TESSEL_API MgErr LStrAppendChar(LStrHandle dst, uint8 c);

// Appends, creating *dst when it is null, and leaves it exactly as large as the text. A null source changes nothing.
// kArgErr for a null handle pointer, kMemFullErr when the handle cannot be created.
TESSEL_API MgErr LStrAppendPStr(LStrHandle* dst, ConstPStr src);
// The same for a CStr.
TESSEL_API MgErr LStrAppendCStr(LStrHandle* dst, CStr src);

// Inserts at the front. A null handle or source changes nothing.
TESSEL_API MgErr LStrPrependCStr(LStrHandle* dst, CStr src);

// Appends a zero byte, which is counted. kArgErr for a null handle.
TESSEL_API MgErr LStrHNullTerminate(LStrHandle handle);

// Map the text in place. A null handle is left alone.
TESSEL_API void LStrToUpper(LStrHandle handle);
// Maps the text in place to lower case. A null handle is left alone.
TESSEL_API void LStrToLower(LStrHandle handle);

TESSEL_END_C

#endif
