// Texts that end with a zero byte.
#include "platform/CodePage.h"
#include "strings/ByteOps.h"
#include "strings/DecimalPoint.h"
#include <tessel/diagnostics/DebugStream.h>
#include <tessel/strings/StringCStr.h>

#include <algorithm>

using namespace tessel;

uint8 tessel::systemDecimalPoint = '.';

namespace {

CStr TextOf(CStr s) {
    return s ? s : "";
}

const uint8* Bytes(CStr s) {
    return reinterpret_cast<const uint8*>(s);
}

// Bytes before the terminator, at most n. Reads no byte behind the terminator.
size_t LengthUpTo(CStr s, int32 n) {
    if (n <= 0 || !s) return 0;
    const void* terminator = std::memchr(s, 0, static_cast<size_t>(n));
    return terminator ? static_cast<size_t>(static_cast<CStr>(terminator) - s) : static_cast<size_t>(n);
}

// The rule for texts of which one is the beginning of the other; `next` is the byte of b there.
int32 CompareEnds(size_t aLength, size_t bLength, int32 next) {
    if (aLength == bLength) return 0;
    return aLength < bLength ? -next : 1;
}

int32 Compare(CStr a, size_t aLength, CStr b, size_t bLength) {
    const size_t n = std::min(aLength, bLength);
    const size_t at = FirstDifference(Bytes(a), Bytes(b), n);
    if (at < n) return Bytes(a)[at] - Bytes(b)[at];
    return CompareEnds(aLength, bLength, aLength < bLength ? Bytes(b)[at] : 0);
}

int32 CompareNoCase(CStr a, size_t aLength, CStr b, size_t bLength) {
    const size_t n = std::min(aLength, bLength);
    const size_t at = FirstDifferenceNoCase(Bytes(a), Bytes(b), n);
    if (at < n) return platform::LowerByte(Bytes(a)[at]) - platform::LowerByte(Bytes(b)[at]);
    return CompareEnds(aLength, bLength, aLength < bLength ? platform::LowerByte(Bytes(b)[at]) : 0);
}

bool IsBlank(char c) {
    return c == ' ' || c == '\t';
}

// Whether pattern stands at s, the blanks of s left out.
bool MatchesWithoutBlanks(CStr s, CStr pattern) {
    while (*pattern) {
        while (IsBlank(*s)) ++s;
        if (!*s || platform::LowerByte(static_cast<uint8>(*s)) != platform::LowerByte(static_cast<uint8>(*pattern))) {
            return false;
        }
        ++s;
        ++pattern;
    }
    return true;
}

bool IsByte(int32 c) {
    return c >= 0 && c <= 0xFF;
}

}  // namespace

// ---- length and copying ---------------------------------------------------------------------------------------------

int32 StrLen(CStr s) {
    return static_cast<int32>(std::strlen(TextOf(s)));
}

void StrCpy(char* dst, CStr src) {
    if (dst) std::memmove(dst, TextOf(src), std::strlen(TextOf(src)) + 1);
}

char* StrNCpy(char* dst, CStr src, int32 n) {
    if (n <= 0 || !dst) return dst;
    const size_t length = LengthUpTo(src, n);
    if (length != 0) std::memmove(dst, src, length);
    std::memset(dst + length, 0, static_cast<size_t>(n) - length);
    return dst;
}

int32 StrCat(char* dst, CStr src) {
    if (!dst) return 0;
    const size_t dstLength = std::strlen(dst);
    const size_t srcLength = std::strlen(TextOf(src));
    std::memmove(dst + dstLength, TextOf(src), srcLength);
    dst[dstLength + srcLength] = 0;
    return static_cast<int32>(dstLength + srcLength);
}

// ---- comparison -----------------------------------------------------------------------------------------------------

int32 StrCmp(CStr a, CStr b) {
    a = TextOf(a);
    b = TextOf(b);
    return Compare(a, std::strlen(a), b, std::strlen(b));
}

bool StrEqual(CStr a, CStr b) {
    return std::strcmp(TextOf(a), TextOf(b)) == 0;
}

int32 StrNCmp(CStr a, CStr b, int32 n) {
    return Compare(a, LengthUpTo(a, n), b, LengthUpTo(b, n));
}

bool StrNEqual(CStr a, CStr b, int32 n) {
    return StrNCmp(a, b, n) == 0;
}

int32 StrCaseCmp(CStr a, CStr b) {
    a = TextOf(a);
    b = TextOf(b);
    return CompareNoCase(a, std::strlen(a), b, std::strlen(b));
}

int32 StrNCaseCmp(CStr a, CStr b, int32 n) {
    return CompareNoCase(a, LengthUpTo(a, n), b, LengthUpTo(b, n));
}

bool StrNCaseEqual(CStr a, CStr b, int32 n) {
    return StrNCaseCmp(a, b, n) == 0;
}

// ---- searching ------------------------------------------------------------------------------------------------------

char* StrChr(CStr s, int32 c) {
    const char sought = static_cast<char>(c);
    return sought && s ? const_cast<char*>(std::strchr(s, sought)) : nullptr;
}

char* StrRChr(CStr s, int32 c) {
    const char sought = static_cast<char>(c);
    return sought && s ? const_cast<char*>(std::strrchr(s, sought)) : nullptr;
}

bool StrIStr(CStr s, CStr pattern) {
    for (s = TextOf(s); *s; ++s) {
        if (MatchesWithoutBlanks(s, TextOf(pattern))) return true;
    }
    return false;
}

// ---- case and stepping ----------------------------------------------------------------------------------------------

void StrToUpper(char* s, int32 len) {
    if (len > 0 && s) platform::UpperText(s, static_cast<size_t>(len));
}

void StrToLower(char* s, int32 len) {
    if (len > 0 && s) platform::LowerText(s, static_cast<size_t>(len));
}

int32 StrNextChar(CStr s, int32 index) {
    return s && s[index] ? static_cast<int32>(platform::NextChar(s + index) - s) : index + 1;
}

int32 StrPrevChar(CStr s, int32 index) {
    if (index < 0) {
        TESSEL_REPORT(kDebugWarning, 0x6B1D94C3u) << "Negative index into string in StrPrevChar";
        return 0;
    }
    if (!s) return 0;
    return static_cast<int32>(platform::PrevChar(s, s + index) - s);
}

// ---- characters -----------------------------------------------------------------------------------------------------

bool IsDigit(int32 c) {
    return c >= '0' && c <= '9';
}

bool IsAlpha(int32 c) {
    return (c >= 'a' && c <= 'z') || (c >= 'A' && c <= 'Z');
}

bool IsPunct(int32 c) {
    return c > ' ' && c < 0x7F && !IsDigit(c) && !IsAlpha(c);
}

bool IsLower(int32 c) {
    return ToUpper(c) != c;
}

bool IsUpper(int32 c) {
    return ToLower(c) != c;
}

int32 ToLower(int32 c) {
    return IsByte(c) ? platform::LowerByte(static_cast<uint8>(c)) : c;
}

int32 ToUpper(int32 c) {
    return IsByte(c) ? platform::UpperByte(static_cast<uint8>(c)) : c;
}

char HexChar(int32 n) {
    return "0123456789ABCDEF"[n & 15];
}

// ---- decimal point --------------------------------------------------------------------------------------------------

uint8 StrGetDecimalPoint(void) {
    return systemDecimalPoint;
}

uint8 StrSetDecimalPoint(uint8 decimalPoint) {
    return systemDecimalPoint = decimalPoint;
}
