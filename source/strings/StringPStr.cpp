// Texts of up to 255 bytes behind a count byte.
#include "platform/CodePage.h"
#include "strings/ByteOps.h"
#include "strings/LStrView.h"
#include <tessel/diagnostics/DebugStream.h>
#include <tessel/memory/MemoryManager.h>
#include <tessel/strings/StringPStr.h>

#include <algorithm>

using namespace tessel;

namespace {

constexpr uint8 kEmpty[1] = {0};

ConstPStr TextOf(ConstPStr s) {
    return s ? s : kEmpty;
}

CStr TextOf(CStr s) {
    return s ? s : "";
}

ConstPStr Pointee(const ConstPStr* s) {
    return s ? *s : nullptr;
}

char* Chars(uint8* bytes) {
    return reinterpret_cast<char*>(bytes);
}

// A PStr that is being put together.
class PStrBuilder {
public:
    bool Add(const void* bytes, size_t n) {
        if (n > kMaxPStr - text_[0]) return false;
        std::memcpy(text_ + 1 + text_[0], bytes, n);
        text_[0] = static_cast<uint8>(text_[0] + n);
        return true;
    }
    ConstPStr Text() const { return text_; }

private:
    Str255 text_ = {0};
};

// Puts src with its replacements into `result`; false when that has no room.
bool ReplaceAll(ConstPStr src, CStr find, CStr replacement, PStrBuilder& result, bool& found) {
    const size_t findLength = std::strlen(find);
    const size_t replacementLength = std::strlen(replacement);
    const uint8* p = src + 1;
    const uint8* end = p + src[0];
    while (p < end) {
        if (findLength != 0 && findLength <= static_cast<size_t>(end - p) && std::memcmp(p, find, findLength) == 0) {
            found = true;
            if (!result.Add(replacement, replacementLength)) return false;
            p += findLength;
        } else if (!result.Add(p++, 1)) {
            return false;
        }
    }
    return true;
}

}  // namespace

// ---- copying --------------------------------------------------------------------------------------------------------

PStr PStrCpy(PStr dst, ConstPStr src) {
    if (dst) std::memmove(dst, TextOf(src), TextOf(src)[0] + size_t{1});
    return dst;
}

PStr PStrNCpy(PStr dst, ConstPStr src, int32 n) {
    if (n <= 0 || !dst) return dst;
    src = TextOf(src);
    const int32 copied = std::min(n, src[0] + 1);
    std::memmove(dst, src, static_cast<size_t>(copied));
    dst[0] = static_cast<uint8>(copied - 1);
    return dst;
}

int32 PStrCat(PStr dst, ConstPStr src) {
    if (!dst) return 0;
    src = TextOf(src);
    const size_t added = std::min<size_t>(src[0], kMaxPStr - dst[0]);
    std::memmove(dst + 1 + dst[0], src + 1, added);
    dst[0] = static_cast<uint8>(dst[0] + added);
    return dst[0];
}

PStr PStrDup(ConstPStr s) {
    if (!s) return nullptr;
    const uint32 size = s[0] + 1u;
    PStr copy = DSNewPtr(size);
    if (copy) {
        std::memcpy(copy, s, size);
    } else {
        TESSEL_REPORT(kDebugInfo, 0x91C27E05u) << "PStrDup FAILED:" << DbgFmtPStr(s) << ", size " << size << ", NULL";
    }
    return copy;
}

int32 PToCStr(ConstPStr src, char* dst) {
    if (!dst) return 0;
    src = TextOf(src);
    const size_t length = src[0];
    std::memmove(dst, src + 1, length);
    dst[length] = 0;
    return static_cast<int32>(length);
}

int32 CToPStr(CStr src, PStr dst) {
    if (!dst) return 0;
    const size_t length = std::min(std::strlen(TextOf(src)), kMaxPStr);
    std::memmove(dst + 1, TextOf(src), length);
    dst[0] = static_cast<uint8>(length);
    return dst[0];
}

int32 PStrNullTerminate(PStr s) {
    if (!s) return 0;
    s[s[0] == kMaxPStr ? kMaxPStr : s[0] + size_t{1}] = 0;
    return s[0];
}

int32 PStrTerminateIfPossible(PStr s) {
    if (!s) return 0;
    if (s[0] < kMaxPStr) s[s[0] + 1] = 0;
    return s[0];
}

// ---- comparison -----------------------------------------------------------------------------------------------------

int32 PStrCmp(ConstPStr a, ConstPStr b) {
    a = TextOf(a);
    b = TextOf(b);
    return a == b ? 0 : CompareBytes(a + 1, a[0], b + 1, b[0]);
}

int32 PStrCaseCmp(ConstPStr a, ConstPStr b) {
    a = TextOf(a);
    b = TextOf(b);
    return a == b ? 0 : CompareBytesNoCase(a + 1, a[0], b + 1, b[0]);
}

bool PStrEqual(ConstPStr a, ConstPStr b) {
    a = TextOf(a);
    b = TextOf(b);
    return a == b || std::memcmp(a, b, a[0] == b[0] ? a[0] + size_t{1} : 1) == 0;
}

bool PStrCaseEqual(ConstPStr a, ConstPStr b) {
    a = TextOf(a);
    b = TextOf(b);
    return a[0] == b[0] && PStrCaseCmp(a, b) == 0;
}

int32 PPStrCmp(const ConstPStr* a, const ConstPStr* b) {
    return PStrCmp(Pointee(a), Pointee(b));
}

int32 PPStrCaseCmp(const ConstPStr* a, const ConstPStr* b) {
    return PStrCaseCmp(Pointee(a), Pointee(b));
}

bool PPStrEqual(const ConstPStr* a, const ConstPStr* b) {
    return PStrEqual(Pointee(a), Pointee(b));
}

bool PPStrCaseEqual(const ConstPStr* a, const ConstPStr* b) {
    return PStrCaseEqual(Pointee(a), Pointee(b));
}

// ---- searching and splitting ----------------------------------------------------------------------------------------

int32 PStrInPStr(ConstPStr s, int32 start, ConstPStr pattern) {
    if (start < 0 || !s || TextOf(pattern)[0] == 0) return -1;
    for (int32 at = start; at <= s[0] - pattern[0]; ++at) {
        if (FirstDifferenceNoCase(s + 1 + at, pattern + 1, pattern[0]) == pattern[0]) return at + pattern[0];
    }
    return -1;
}

bool PStrEndsWith(ConstPStr s, CStr suffix) {
    s = TextOf(s);
    suffix = TextOf(suffix);
    const size_t length = std::strlen(suffix);
    if (length > s[0]) return false;
    const uint8* tail = s + 1 + s[0] - length;
    return std::equal(tail, tail + length, suffix, [](uint8 textByte, char suffixByte) {
        return platform::LowerByte(textByte) == static_cast<uint8>(suffixByte);
    });
}

bool PStrSplitAtChar(ConstPStr s, uint8 c, PStr left, PStr right) {
    if (!left || !right) return false;
    s = TextOf(s);
    const size_t length = s[0];
    size_t leftLength = 0;
    size_t at = 1;
    for (uint8 previous = 0; at <= length; previous = s[at++]) {
        const uint8 byte = s[at];
        const bool escaped = byte == c && at > 1 && previous == '\\';
        if (byte == c && !escaped) break;
        if (!escaped) ++leftLength;
        left[leftLength] = byte;
    }
    const bool found = at <= length;
    const size_t rightLength = found ? length - at : 0;
    std::memmove(right + 1, s + at + 1, rightLength);
    right[0] = static_cast<uint8>(rightLength);
    left[0] = static_cast<uint8>(leftLength);
    return found;
}

bool PStrFindReplace(PStr dst, ConstPStr src, CStr find, CStr replacement) {
    if (!dst) return false;
    PStrBuilder result;
    bool found = false;
    if (!ReplaceAll(TextOf(src), TextOf(find), TextOf(replacement), result, found)) {
        dst[0] = 0;
        return false;
    }
    PStrCpy(dst, result.Text());
    return found;
}

// ---- hashing --------------------------------------------------------------------------------------------------------

int32 PStrHash32(ConstPStr s, bool caseInsensitive) {
    if (!s) return 0;
    Str255 upper;
    if (caseInsensitive) {
        PStrCpy(upper, s);
        platform::UpperText(Chars(upper + 1), upper[0]);
        s = upper;
    }
    uint32 hash = 0;
    for (size_t i = 1; i <= s[0]; ++i) hash = ElfHashStep(hash, s[i]);
    return ElfHashResult(hash);
}
