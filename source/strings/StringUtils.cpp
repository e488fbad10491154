// std::string and std::u16string: conversions from and to every form of text, and common operations.
#include "diagnostics/Guarded.h"
#include "platform/CodePage.h"
#include "strings/ByteOps.h"
#include "strings/HandleOps.h"
#include "strings/LStrView.h"
#include <tessel/strings/StringLStr.h>
#include <tessel/strings/StringLStrArray.h>
#include <tessel/strings/StringUtils.h>

#include <algorithm>
#include <cctype>
#include <cwctype>
#include <new>

namespace tessel {
namespace StringUtils {
namespace {

// ---- the three shapes of a conversion: a new string, a given one, without exceptions --------------------------------

template <class String, class Convert>
String Made(Convert convert) {
    String made;
    convert(&made);
    return made;
}

template <class Out, class Convert>
MgErr NoThrow(Out* out, Convert convert) {
    if (!out) return kArgErr;
    return Guarded([&] {
        convert(out);
        return kNoErr;
    });
}

void Release(LStrHandle source, DeallocationPolicy policy) {
    if (policy == kReleaseSource) DSDisposeHandle(AsHandle(source));
}

void Release(BSTR source, DeallocationPolicy policy) {
    if (policy == kReleaseSource) BSTRFree(source);
}

std::string_view TextOf(LStrView text) {
    return {reinterpret_cast<const char*>(text.bytes), text.length};
}

std::u16string_view TextOf(const char16_t* text) {
    return {text, BSTRLength(text)};
}

void ThrowIf(MgErr err) {
    if (err) throw std::bad_alloc();
}

void ConvertToUtf8(const std::u16string& source, std::string* out) {
    std::string utf8;
    platform::Utf16ToUtf8(source, utf8);
    out->swap(utf8);
}

// ---- algorithms over both kinds of characters -----------------------------------------------------------------------

template <class Char>
using String = std::basic_string<Char>;

template <class Char>
String<Char> LeftPart(const String<Char>& text, uint32 n) {
    return n == 0 ? text : text.substr(0, n);
}

template <class Char>
String<Char> RightPart(const String<Char>& text, uint32 n) {
    return n == 0 || n >= text.size() ? text : text.substr(text.size() - n);
}

template <class Char>
bool HasSuffix(const String<Char>& text, const String<Char>& end) {
    return text.size() >= end.size() && text.compare(text.size() - end.size(), end.size(), end) == 0;
}

template <class Char>
bool Quoted(const String<Char>& text) {
    if (text.empty() || text.front() != text.back()) return false;
    return text.front() == Char{'"'} || text.front() == Char{'\''};
}

template <class Char>
void ReplaceEvery(String<Char>* text, const String<Char>& find, const String<Char>& replacement) {
    if (!text || find.empty()) return;
    size_t at = text->find(find);
    if (at == String<Char>::npos) return;
    String<Char> result;
    size_t start = 0;
    for (; at != String<Char>::npos; at = text->find(find, start)) {
        result.append(*text, start, at - start).append(replacement);
        start = at + find.size();
    }
    result.append(*text, start, String<Char>::npos);
    text->swap(result);
}

template <class Char, class Map>
void MapEvery(String<Char>* text, Map map) {
    if (text) std::transform(text->begin(), text->end(), text->begin(), map);
}

template <class Char>
void TrimEnds(String<Char>* text, StringTrimmingPolicy policy) {
    if (!text) return;
    const auto isBlank = [](Char c) { return c == Char{' '} || c == Char{'\t'}; };
    if (policy & kTrimEnd) text->erase(std::find_if_not(text->rbegin(), text->rend(), isBlank).base(), text->end());
    if (policy & kTrimStart) text->erase(text->begin(), std::find_if_not(text->begin(), text->end(), isBlank));
}

template <class Char>
void JoinAll(const std::vector<String<Char>>& elements, const String<Char>& separator, String<Char>* out) {
    if (!out) return;
    String<Char> joined;
    for (const String<Char>& element : elements) {
        if (&element != &elements.front()) joined += separator;
        joined += element;
    }
    out->swap(joined);
}

// Removes every range that begins with the opening and ends where endOf(text, behind the opening) says; npos ends the
// work.
template <class Char, class EndOf>
void RemoveRanges(String<Char>* text, const String<Char>& opening, EndOf endOf) {
    if (!text || opening.empty()) return;
    String<Char> kept;
    size_t start = 0;
    for (size_t at = text->find(opening); at != String<Char>::npos; at = text->find(opening, start)) {
        const size_t end = endOf(*text, at + opening.size());
        if (end == String<Char>::npos) break;
        kept.append(*text, start, at - start);
        start = end;
    }
    if (start == 0) return;
    kept.append(*text, start, String<Char>::npos);
    text->swap(kept);
}

template <class Char>
void RemoveLines(String<Char>* text, const String<Char>& marker) {
    RemoveRanges(text, marker, [](const String<Char>& all, size_t from) {
        constexpr Char kLineEnds[] = {'\r', '\n'};
        return std::min(all.find_first_of(kLineEnds, from, 2), all.size());
    });
}

template <class Char>
void RemoveBlocks(String<Char>* text, const String<Char>& opening, const String<Char>& closing) {
    RemoveRanges(text, opening, [&](const String<Char>& all, size_t from) {
        const size_t at = all.find(closing, from);
        return at == String<Char>::npos ? at : at + closing.size();
    });
}

char Lower(char c) {
    return static_cast<char>(std::tolower(static_cast<unsigned char>(c)));
}

char Upper(char c) {
    return static_cast<char>(std::toupper(static_cast<unsigned char>(c)));
}

char16_t LowerWide(char16_t c) {
    return static_cast<char16_t>(std::towlower(c));
}

char16_t UpperWide(char16_t c) {
    return static_cast<char16_t>(std::towupper(c));
}

// Index of the first pair of characters whose lower cases differ, or the shorter length.
size_t FirstDifferentCharacter(const std::string& a, const std::string& b) {
    const size_t n = std::min(a.size(), b.size());
    return FirstDifferenceMapped(reinterpret_cast<const uint8*>(a.data()), reinterpret_cast<const uint8*>(b.data()), n,
                                 [](uint8 c) { return std::tolower(c); });
}

size_t FirstDifferentCharacter(const std::u16string& a, const std::u16string& b) {
    const size_t n = std::min(a.size(), b.size());
    size_t i = 0;
    while (i < n && (a[i] == b[i] || LowerWide(a[i]) == LowerWide(b[i]))) ++i;
    return i;
}

template <class Char, class Map>
int32 CompareCharacters(const String<Char>& a, const String<Char>& b, Map lower) {
    const size_t at = FirstDifferentCharacter(a, b);
    if (at < a.size() && at < b.size()) return lower(a[at]) < lower(b[at]) ? -1 : 1;
    return (a.size() > b.size()) - (a.size() < b.size());
}

MgErr FillArray(LStrArrayHandle array, const std::vector<std::string>& source) {
    for (size_t i = 0; i < source.size(); ++i) {
        if (MgErr err = ToLStrHandleNoThrow(source[i], &(*array)->element[i])) return err;
    }
    return kNoErr;
}

}  // namespace

// ---- to narrow ------------------------------------------------------------------------------------------------------

void ToNarrowString(LStrHandle source, DeallocationPolicy policy, std::string* out) {
    if (out) out->assign(TextOf(LStrView(source)));
    Release(source, policy);
}

void ToNarrowString(const LStr* source, std::string* out) {
    if (out) out->assign(TextOf(LStrView(source)));
}

void ToNarrowString(ConstPStr source, std::string* out) {
    if (out) out->assign(TextOf(source));
}

void ToNarrowString(const std::u16string& source, std::string* out) {
    if (out) platform::FromUtf16(source, *out);
}

void ToNarrowStringFromBSTR(BSTR source, DeallocationPolicy policy, std::string* out) {
    if (out) platform::FromUtf16(TextOf(source), *out);
    Release(source, policy);
}

std::string ToNarrowString(LStrHandle source, DeallocationPolicy policy) {
    return Made<std::string>([&](std::string* out) { ToNarrowString(source, policy, out); });
}

std::string ToNarrowString(const LStr* source) {
    return Made<std::string>([&](std::string* out) { ToNarrowString(source, out); });
}

std::string ToNarrowString(ConstPStr source) {
    return Made<std::string>([&](std::string* out) { ToNarrowString(source, out); });
}

std::string ToNarrowString(const std::u16string& source) {
    return Made<std::string>([&](std::string* out) { ToNarrowString(source, out); });
}

std::string ToNarrowStringFromBSTR(BSTR source, DeallocationPolicy policy) {
    return Made<std::string>([&](std::string* out) { ToNarrowStringFromBSTR(source, policy, out); });
}

MgErr ToNarrowStringNoThrow(LStrHandle source, DeallocationPolicy policy, std::string* out) {
    return NoThrow(out, [&](std::string* to) { ToNarrowString(source, policy, to); });
}

MgErr ToNarrowStringNoThrow(const LStr* source, std::string* out) {
    return NoThrow(out, [&](std::string* to) { ToNarrowString(source, to); });
}

MgErr ToNarrowStringNoThrow(ConstPStr source, std::string* out) {
    return NoThrow(out, [&](std::string* to) { ToNarrowString(source, to); });
}

MgErr ToNarrowStringNoThrow(const std::u16string& source, std::string* out) {
    return NoThrow(out, [&](std::string* to) { ToNarrowString(source, to); });
}

MgErr ToNarrowStringFromBSTRNoThrow(BSTR source, DeallocationPolicy policy, std::string* out) {
    return NoThrow(out, [&](std::string* to) { ToNarrowStringFromBSTR(source, policy, to); });
}

// ---- to wide --------------------------------------------------------------------------------------------------------

void ToWideString(const std::string& source, std::u16string* out) {
    if (out) platform::ToUtf16(source, *out);
}

void ToWideString(LStrHandle source, DeallocationPolicy policy, std::u16string* out) {
    if (out) platform::ToUtf16(TextOf(LStrView(source)), *out);
    Release(source, policy);
}

void ToWideString(const LStr* source, std::u16string* out) {
    if (out) platform::ToUtf16(TextOf(LStrView(source)), *out);
}

void ToWideString(ConstPStr source, std::u16string* out) {
    if (out) platform::ToUtf16(TextOf(source), *out);
}

void ToWideString(BSTR source, DeallocationPolicy policy, std::u16string* out) {
    if (out) out->assign(TextOf(source));
    Release(source, policy);
}

std::u16string ToWideString(const std::string& source) {
    return Made<std::u16string>([&](std::u16string* out) { ToWideString(source, out); });
}

std::u16string ToWideString(LStrHandle source, DeallocationPolicy policy) {
    return Made<std::u16string>([&](std::u16string* out) { ToWideString(source, policy, out); });
}

std::u16string ToWideString(const LStr* source) {
    return Made<std::u16string>([&](std::u16string* out) { ToWideString(source, out); });
}

std::u16string ToWideString(ConstPStr source) {
    return Made<std::u16string>([&](std::u16string* out) { ToWideString(source, out); });
}

std::u16string ToWideString(BSTR source, DeallocationPolicy policy) {
    return Made<std::u16string>([&](std::u16string* out) { ToWideString(source, policy, out); });
}

MgErr ToWideStringNoThrow(const std::string& source, std::u16string* out) {
    return NoThrow(out, [&](std::u16string* to) { ToWideString(source, to); });
}

MgErr ToWideStringNoThrow(LStrHandle source, DeallocationPolicy policy, std::u16string* out) {
    return NoThrow(out, [&](std::u16string* to) { ToWideString(source, policy, to); });
}

MgErr ToWideStringNoThrow(const LStr* source, std::u16string* out) {
    return NoThrow(out, [&](std::u16string* to) { ToWideString(source, to); });
}

MgErr ToWideStringNoThrow(ConstPStr source, std::u16string* out) {
    return NoThrow(out, [&](std::u16string* to) { ToWideString(source, to); });
}

MgErr ToWideStringNoThrow(BSTR source, DeallocationPolicy policy, std::u16string* out) {
    return NoThrow(out, [&](std::u16string* to) { ToWideString(source, policy, to); });
}

// ---- to UTF-8 -------------------------------------------------------------------------------------------------------

std::string ToUTF8String(const std::u16string& source) {
    return Made<std::string>([&](std::string* out) { ConvertToUtf8(source, out); });
}

std::string ToUTF8String(const std::string& source) {
    return Made<std::string>([&](std::string* out) { platform::ToUtf8(source, *out); });
}

MgErr ToUTF8StringNoThrow(const std::u16string& source, std::string* out) {
    return NoThrow(out, [&](std::string* to) { ConvertToUtf8(source, to); });
}

MgErr ToUTF8StringNoThrow(const std::string& source, std::string* out) {
    return NoThrow(out, [&](std::string* to) { platform::ToUtf8(source, *to); });
}

// ---- to the counted forms -------------------------------------------------------------------------------------------

PStr ToPStr(const std::string& source, PStr buffer) {
    if (!buffer) return nullptr;
    buffer[0] = static_cast<uint8>(std::min(source.size(), kMaxPStr));
    std::memcpy(buffer + 1, source.data(), buffer[0]);
    return buffer;
}

PStr ToPStr(const std::u16string& source, PStr buffer) {
    return buffer ? ToPStr(ToNarrowString(source), buffer) : nullptr;
}

MgErr ToPStrNoThrow(const std::string& source, PStr buffer) {
    return ToPStr(source, buffer) ? kNoErr : kArgErr;
}

MgErr ToPStrNoThrow(const std::u16string& source, PStr buffer) {
    return NoThrow(buffer, [&](PStr to) { ToPStr(source, to); });
}

LStrHandle ToLStrHandle(const std::string& source) {
    LStrHandle handle = nullptr;
    return ToLStrHandle(source, &handle);
}

LStrHandle ToLStrHandle(const std::string& source, LStrHandle* handle) {
    if (!handle) return ToLStrHandle(source);
    ThrowIf(ToLStrHandleNoThrow(source, handle));
    return *handle;
}

MgErr ToLStrHandleNoThrow(const std::string& source, LStrHandle* handle) {
    if (!handle) return kArgErr;
    const MgErr err = MakeLStr(handle, source.size());
    if (!err) std::memcpy((**handle)->bytes, source.data(), source.size());
    return err;
}

MgErr ToLStrArrayHandleNoThrow(const std::vector<std::string>& source, LStrArrayHandle* array) {
    if (!array) return kArgErr;
    if (source.size() > INT32_MAX) return kMemFullErr;
    LStrArrayHandle made = nullptr;
    MgErr err = ReallocLStrArrayHandle(&made, static_cast<int32>(source.size()));
    if (!err) err = FillArray(made, source);
    ReallocLStrArrayHandle(err ? &made : array, 0);
    if (!err) *array = made;
    return err;
}

BSTR ToBSTR(const std::string& source) {
    return ToBSTR(ToWideString(source));
}

BSTR ToBSTR(const std::u16string& source) {
    BSTR made = nullptr;
    ThrowIf(ToBSTRNoThrow(source, &made));
    return made;
}

MgErr ToBSTRNoThrow(const std::string& source, BSTR* out) {
    return NoThrow(out, [&](BSTR* to) { *to = ToBSTR(source); });
}

MgErr ToBSTRNoThrow(const std::u16string& source, BSTR* out) {
    if (!out) return kArgErr;
    BSTR made = source.size() > UINT32_MAX ? nullptr : BSTRAlloc(source.data(), static_cast<uint32>(source.size()));
    if (!made) return kMemFullErr;
    *out = made;
    return kNoErr;
}

// ---- assigning and appending ----------------------------------------------------------------------------------------

MgErr AssignNoThrow(std::string* dst, const std::string& source) {
    return NoThrow(dst, [&](std::string* to) { to->assign(source); });
}

MgErr AssignNoThrow(std::string* dst, CStr source) {
    return NoThrow(dst, [&](std::string* to) { to->assign(source ? source : ""); });
}

MgErr AssignNoThrow(std::string* dst, ConstPStr source) {
    return NoThrow(dst, [&](std::string* to) { to->assign(TextOf(source)); });
}

MgErr AssignNoThrow(std::u16string* dst, const std::u16string& source) {
    return NoThrow(dst, [&](std::u16string* to) { to->assign(source); });
}

MgErr AssignNoThrow(std::u16string* dst, const char16_t* source) {
    return NoThrow(dst, [&](std::u16string* to) { to->assign(source ? source : u""); });
}

MgErr AppendNoThrow(std::string* dst, const std::string& source) {
    return NoThrow(dst, [&](std::string* to) { to->append(source); });
}

MgErr AppendNoThrow(std::string* dst, CStr source) {
    return NoThrow(dst, [&](std::string* to) { to->append(source ? source : ""); });
}

MgErr AppendNoThrow(std::string* dst, ConstPStr source) {
    return NoThrow(dst, [&](std::string* to) { to->append(TextOf(source)); });
}

MgErr AppendNoThrow(std::u16string* dst, const std::u16string& source) {
    return NoThrow(dst, [&](std::u16string* to) { to->append(source); });
}

MgErr AppendNoThrow(std::u16string* dst, const char16_t* source) {
    return NoThrow(dst, [&](std::u16string* to) { to->append(source ? source : u""); });
}

// ---- parts ----------------------------------------------------------------------------------------------------------

std::string Left(const std::string& text, uint32 n) {
    return LeftPart(text, n);
}

std::u16string Left(const std::u16string& text, uint32 n) {
    return LeftPart(text, n);
}

std::string Right(const std::string& text, uint32 n) {
    return RightPart(text, n);
}

std::u16string Right(const std::u16string& text, uint32 n) {
    return RightPart(text, n);
}

bool StartsWith(const std::string& text, char c) {
    return !text.empty() && text.front() == c;
}

bool StartsWith(const std::string& text, const std::string& start) {
    return text.compare(0, start.size(), start) == 0;
}

bool StartsWith(const std::u16string& text, char16_t c) {
    return !text.empty() && text.front() == c;
}

bool StartsWith(const std::u16string& text, const std::u16string& start) {
    return text.compare(0, start.size(), start) == 0;
}

bool EndsWith(const std::string& text, char c) {
    return !text.empty() && text.back() == c;
}

bool EndsWith(const std::string& text, const std::string& end) {
    return HasSuffix(text, end);
}

bool EndsWith(const std::u16string& text, char16_t c) {
    return !text.empty() && text.back() == c;
}

bool EndsWith(const std::u16string& text, const std::u16string& end) {
    return HasSuffix(text, end);
}

bool IsSurroundedByQuotes(const std::string& text) {
    return Quoted(text);
}

bool IsSurroundedByQuotes(const std::u16string& text) {
    return Quoted(text);
}

// ---- editing in place -----------------------------------------------------------------------------------------------

void SearchAndReplace(std::string* text, const std::string& find, const std::string& replacement) {
    ReplaceEvery(text, find, replacement);
}

void SearchAndReplace(std::u16string* text, const std::u16string& find, const std::u16string& replacement) {
    ReplaceEvery(text, find, replacement);
}

void ToUpperCase(std::string* text) {
    MapEvery(text, Upper);
}

void ToUpperCase(std::u16string* text) {
    MapEvery(text, UpperWide);
}

void ToLowerCase(std::string* text) {
    MapEvery(text, Lower);
}

void ToLowerCase(std::u16string* text) {
    MapEvery(text, LowerWide);
}

void Trim(std::string* text, StringTrimmingPolicy policy) {
    TrimEnds(text, policy);
}

void Trim(std::u16string* text, StringTrimmingPolicy policy) {
    TrimEnds(text, policy);
}

void Join(const std::vector<std::string>& elements, const std::string& separator, std::string* out) {
    JoinAll(elements, separator, out);
}

void Join(const std::vector<std::u16string>& elements, const std::u16string& separator, std::u16string* out) {
    JoinAll(elements, separator, out);
}

void RemoveLineComments(std::string* text, const std::string& marker) {
    RemoveLines(text, marker);
}

void RemoveLineComments(std::u16string* text, const std::u16string& marker) {
    RemoveLines(text, marker);
}

void RemoveBlockComments(std::string* text, const std::string& opening, const std::string& closing) {
    RemoveBlocks(text, opening, closing);
}

void RemoveBlockComments(std::u16string* text, const std::u16string& opening, const std::u16string& closing) {
    RemoveBlocks(text, opening, closing);
}

// ---- comparing and hashing ------------------------------------------------------------------------------------------

bool CaseInsensitiveEqual(const std::string& a, const std::string& b) {
    return a.size() == b.size() && FirstDifferentCharacter(a, b) == a.size();
}

bool CaseInsensitiveEqual(const std::u16string& a, const std::u16string& b) {
    return a.size() == b.size() && FirstDifferentCharacter(a, b) == a.size();
}

int32 CaseInsensitiveCompare(const std::string& a, const std::string& b) {
    return CompareCharacters(a, b, [](char c) { return static_cast<int8>(Lower(c)); });
}

int32 CaseInsensitiveCompare(const std::u16string& a, const std::u16string& b) {
    return CompareCharacters(a, b, LowerWide);
}

int32 Hash(const std::string& text, bool caseInsensitive) {
    uint32 hash = 0;
    for (const char c : text) {
        if (c == 0) break;
        hash = ElfHashStep(hash, static_cast<int8>(caseInsensitive ? Upper(c) : c));
    }
    return ElfHashResult(hash);
}

const std::string& EmptyNarrowString() {
    static const std::string empty;
    return empty;
}

const std::u16string& EmptyWideString() {
    static const std::u16string empty;
    return empty;
}

}  // namespace StringUtils
}  // namespace tessel
