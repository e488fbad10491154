// StringUtils: functions on the standard strings.
//
// Narrow text is bytes in the active code page, wide text is UTF-16. A plain function throws std::bad_alloc when memory
// is short; its NoThrow form throws nothing and returns kArgErr for a null output pointer, kMemFullErr when memory is
// short. A null source pointer or handle is the empty text. What cannot be converted becomes "?". Any thread, on
// distinct data.
#ifndef TESSEL_STRINGS_STRINGUTILS_H
#define TESSEL_STRINGS_STRINGUTILS_H

#include <tessel/base/MgErr.h>
#include <tessel/base/StringTypes.h>
#include <tessel/strings/BSTR.h>

#ifdef __cplusplus
#    include <string>
#    include <vector>

namespace tessel {
namespace StringUtils {

// Whether a conversion releases its source, a handle or a BSTR, afterwards. Any other value keeps it.
enum DeallocationPolicy : int32 { kKeepSource = 0, kReleaseSource = 1 };

// Which ends Trim trims.
enum StringTrimmingPolicy : int32 { kTrimStart = 1, kTrimEnd = 2, kTrimBoth = 3 };

// ---- to narrow, wide and UTF-8 --------------------------------------------------------------------------------------

// The text of a string handle, narrow.
TESSEL_API std::string ToNarrowString(LStrHandle source, DeallocationPolicy policy);
// The text of an LStr, narrow.
TESSEL_API std::string ToNarrowString(const LStr* source);
// The text of a PStr, narrow.
TESSEL_API std::string ToNarrowString(ConstPStr source);
// Wide text, narrow.
TESSEL_API std::string ToNarrowString(const std::u16string& source);
// The text of a BSTR, narrow.
TESSEL_API std::string ToNarrowStringFromBSTR(BSTR source, DeallocationPolicy policy);
// The text of a string handle, narrow, into *out.
TESSEL_API void ToNarrowString(LStrHandle source, DeallocationPolicy policy, std::string* out);
// The text of an LStr, narrow, into *out.
TESSEL_API void ToNarrowString(const LStr* source, std::string* out);
// The text of a PStr, narrow, into *out.
TESSEL_API void ToNarrowString(ConstPStr source, std::string* out);
// Wide text, narrow, into *out.
TESSEL_API void ToNarrowString(const std::u16string& source, std::string* out);
// The text of a BSTR, narrow, into *out.
TESSEL_API void ToNarrowStringFromBSTR(BSTR source, DeallocationPolicy policy, std::string* out);
// The text of a string handle, narrow, into *out; errors as the result.
TESSEL_API MgErr ToNarrowStringNoThrow(LStrHandle source, DeallocationPolicy policy, std::string* out);
// The text of an LStr, narrow, into *out; errors as the result.
TESSEL_API MgErr ToNarrowStringNoThrow(const LStr* source, std::string* out);
// The text of a PStr, narrow, into *out; errors as the result.
TESSEL_API MgErr ToNarrowStringNoThrow(ConstPStr source, std::string* out);
// Wide text, narrow, into *out; errors as the result.
TESSEL_API MgErr ToNarrowStringNoThrow(const std::u16string& source, std::string* out);
// The text of a BSTR, narrow, into *out; errors as the result.
TESSEL_API MgErr ToNarrowStringFromBSTRNoThrow(BSTR source, DeallocationPolicy policy, std::string* out);

// Narrow text, wide.
TESSEL_API std::u16string ToWideString(const std::string& source);
// The text of a string handle, wide.
TESSEL_API std::u16string ToWideString(LStrHandle source, DeallocationPolicy policy);
// The text of an LStr, wide.
TESSEL_API std::u16string ToWideString(const LStr* source);
// The text of a PStr, wide.
TESSEL_API std::u16string ToWideString(ConstPStr source);
// The text of a BSTR, wide.
TESSEL_API std::u16string ToWideString(BSTR source, DeallocationPolicy policy);
// Narrow text, wide, into *out.
TESSEL_API void ToWideString(const std::string& source, std::u16string* out);
// The text of a string handle, wide, into *out.
TESSEL_API void ToWideString(LStrHandle source, DeallocationPolicy policy, std::u16string* out);
// The text of an LStr, wide, into *out.
TESSEL_API void ToWideString(const LStr* source, std::u16string* out);
// The text of a PStr, wide, into *out.
TESSEL_API void ToWideString(ConstPStr source, std::u16string* out);
// The text of a BSTR, wide, into *out.
TESSEL_API void ToWideString(BSTR source, DeallocationPolicy policy, std::u16string* out);
// Narrow text, wide, into *out; errors as the result.
TESSEL_API MgErr ToWideStringNoThrow(const std::string& source, std::u16string* out);
// The text of a string handle, wide, into *out; errors as the result.
TESSEL_API MgErr ToWideStringNoThrow(LStrHandle source, DeallocationPolicy policy, std::u16string* out);
// The text of an LStr, wide, into *out; errors as the result.
TESSEL_API MgErr ToWideStringNoThrow(const LStr* source, std::u16string* out);
// The text of a PStr, wide, into *out; errors as the result.
TESSEL_API MgErr ToWideStringNoThrow(ConstPStr source, std::u16string* out);
// The text of a BSTR, wide, into *out; errors as the result.
TESSEL_API MgErr ToWideStringNoThrow(BSTR source, DeallocationPolicy policy, std::u16string* out);

// Wide text as UTF-8.
TESSEL_API std::string ToUTF8String(const std::u16string& source);
// Narrow text as UTF-8.
TESSEL_API std::string ToUTF8String(const std::string& source);
// Wide text as UTF-8 into *out; errors as the result.
TESSEL_API MgErr ToUTF8StringNoThrow(const std::u16string& source, std::string* out);
// Narrow text as UTF-8 into *out; errors as the result.
TESSEL_API MgErr ToUTF8StringNoThrow(const std::string& source, std::string* out);

// ---- to the counted forms -------------------------------------------------------------------------------------------

// At most 255 bytes; the buffer must take 256. Returns the buffer; null gives null.
TESSEL_API PStr ToPStr(const std::string& source, PStr buffer);
// The same from wide text.
TESSEL_API PStr ToPStr(const std::u16string& source, PStr buffer);
// The same with errors as the result.
TESSEL_API MgErr ToPStrNoThrow(const std::string& source, PStr buffer);
// The same from wide text, with errors as the result.
TESSEL_API MgErr ToPStrNoThrow(const std::u16string& source, PStr buffer);

// A new handle, or *handle resized (created when it is null), which is also returned. The caller owns it.
TESSEL_API LStrHandle ToLStrHandle(const std::string& source);
// Into *handle, which is made when it is null, and returned.
TESSEL_API LStrHandle ToLStrHandle(const std::string& source, LStrHandle* handle);
// The same with errors as the result.
TESSEL_API MgErr ToLStrHandleNoThrow(const std::string& source, LStrHandle* handle);

// Replaces *array by a new array with a handle for each string, which the caller owns; the old array, unless it is
// null, is disposed of. On failure *array is unchanged.
TESSEL_API MgErr ToLStrArrayHandleNoThrow(const std::vector<std::string>& source, LStrArrayHandle* array);

// A new BSTR, which the caller frees with BSTRFree.
TESSEL_API BSTR ToBSTR(const std::string& source);
// The same from wide text.
TESSEL_API BSTR ToBSTR(const std::u16string& source);
// The same with errors as the result.
TESSEL_API MgErr ToBSTRNoThrow(const std::string& source, BSTR* out);
// The same from wide text, with errors as the result.
TESSEL_API MgErr ToBSTRNoThrow(const std::u16string& source, BSTR* out);

// ---- assigning and appending ----------------------------------------------------------------------------------------

// *dst = the text.
TESSEL_API MgErr AssignNoThrow(std::string* dst, const std::string& source);
// *dst = the text.
TESSEL_API MgErr AssignNoThrow(std::string* dst, CStr source);
// *dst = the text.
TESSEL_API MgErr AssignNoThrow(std::string* dst, ConstPStr source);
// *dst = the text.
TESSEL_API MgErr AssignNoThrow(std::u16string* dst, const std::u16string& source);
// *dst = the text.
TESSEL_API MgErr AssignNoThrow(std::u16string* dst, const char16_t* source);
// *dst = *dst and the text.
TESSEL_API MgErr AppendNoThrow(std::string* dst, const std::string& source);
// *dst = *dst and the text.
TESSEL_API MgErr AppendNoThrow(std::string* dst, CStr source);
// *dst = *dst and the text.
TESSEL_API MgErr AppendNoThrow(std::string* dst, ConstPStr source);
// *dst = *dst and the text.
TESSEL_API MgErr AppendNoThrow(std::u16string* dst, const std::u16string& source);
// *dst = *dst and the text.
TESSEL_API MgErr AppendNoThrow(std::u16string* dst, const char16_t* source);

// ---- parts ----------------------------------------------------------------------------------------------------------

// The first (last) n characters; n of 0 or beyond the length is all of them.
TESSEL_API std::string Left(const std::string& text, uint32 n);
// The first n characters of wide text.
TESSEL_API std::u16string Left(const std::u16string& text, uint32 n);
// The last n characters; n of 0 or beyond the length is all of them.
TESSEL_API std::string Right(const std::string& text, uint32 n);
// The last n characters of wide text.
TESSEL_API std::u16string Right(const std::u16string& text, uint32 n);

// Whether the first character is c.
TESSEL_API bool StartsWith(const std::string& text, char c);
// Whether the text begins with `start`.
TESSEL_API bool StartsWith(const std::string& text, const std::string& start);
// Whether the first character is c.
TESSEL_API bool StartsWith(const std::u16string& text, char16_t c);
// Whether the text begins with `start`.
TESSEL_API bool StartsWith(const std::u16string& text, const std::u16string& start);
// Whether the last character is c.
TESSEL_API bool EndsWith(const std::string& text, char c);
// Whether the text ends with `end`.
TESSEL_API bool EndsWith(const std::string& text, const std::string& end);
// Whether the last character is c.
TESSEL_API bool EndsWith(const std::u16string& text, char16_t c);
// Whether the text ends with `end`.
TESSEL_API bool EndsWith(const std::u16string& text, const std::u16string& end);

// Whether it starts and ends with a double quote, or starts and ends with a single quote; one quote alone does.
TESSEL_API bool IsSurroundedByQuotes(const std::string& text);
// The same for wide text.
TESSEL_API bool IsSurroundedByQuotes(const std::u16string& text);

// ---- editing in place: null is left alone ---------------------------------------------------------------------------

// Replaces every occurrence, left to right, resuming after each replacement. An empty `find` replaces nothing.
TESSEL_API void SearchAndReplace(std::string* text, const std::string& find, const std::string& replacement);
// The same for wide text.
TESSEL_API void SearchAndReplace(std::u16string* text, const std::u16string& find, const std::u16string& replacement);

// Maps the letters to upper case.
TESSEL_API void ToUpperCase(std::string* text);
// The same for wide text.
TESSEL_API void ToUpperCase(std::u16string* text);
// Maps the letters to lower case.
TESSEL_API void ToLowerCase(std::string* text);
// The same for wide text.
TESSEL_API void ToLowerCase(std::u16string* text);

// Removes spaces and tabs from the chosen ends.
TESSEL_API void Trim(std::string* text, StringTrimmingPolicy policy);
// The same for wide text.
TESSEL_API void Trim(std::u16string* text, StringTrimmingPolicy policy);

// The elements with the separator between them.
TESSEL_API void Join(const std::vector<std::string>& elements, const std::string& separator, std::string* out);
// The same for wide text.
TESSEL_API void Join(const std::vector<std::u16string>& elements, const std::u16string& separator, std::u16string* out);

// Removes each marker and what follows it up to, not including, the next CR or LF, or to the end.
TESSEL_API void RemoveLineComments(std::string* text, const std::string& marker);
// The same for wide text.
TESSEL_API void RemoveLineComments(std::u16string* text, const std::u16string& marker);

// Removes each block from an opening marker through the next closing one. A block that is not closed stays.
TESSEL_API void RemoveBlockComments(std::string* text, const std::string& opening, const std::string& closing);
// The same for wide text.
TESSEL_API void RemoveBlockComments(std::u16string* text, const std::u16string& opening, const std::u16string& closing);

// ---- comparing and hashing ------------------------------------------------------------------------------------------

// Without regard to case, as tolower and towlower of the current locale see it. Compare gives -1, 0 or 1.
TESSEL_API bool CaseInsensitiveEqual(const std::string& a, const std::string& b);
// The same for wide text.
TESSEL_API bool CaseInsensitiveEqual(const std::u16string& a, const std::u16string& b);
// The order without regard to case: -1, 0 or 1.
TESSEL_API int32 CaseInsensitiveCompare(const std::string& a, const std::string& b);
// The same for wide text.
TESSEL_API int32 CaseInsensitiveCompare(const std::u16string& a, const std::u16string& b);

// 28-bit ELF hash of the characters up to the first zero, or of their upper-case form. Characters are signed: it
// differs from PStrHash32 for bytes above 127.
TESSEL_API int32 Hash(const std::string& text, bool caseInsensitive);

// Shared empty strings.
TESSEL_API const std::string& EmptyNarrowString();
// A shared empty wide string.
TESSEL_API const std::u16string& EmptyWideString();

}  // namespace StringUtils
}  // namespace tessel
#endif

#endif
