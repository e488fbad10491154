// Counted texts, in buffers and in handles.
#include "platform/CodePage.h"
#include "strings/ByteOps.h"
#include "strings/HandleOps.h"
#include "strings/LStrView.h"
#include <tessel/diagnostics/DebugStream.h>
#include <tessel/strings/StringLStr.h>

#include <algorithm>

using namespace tessel;

namespace {

int32 Compare(LStrView a, LStrView b) {
    if (a.bytes == b.bytes) return static_cast<int32>(a.length) - static_cast<int32>(b.length);
    return CompareBytes(a.bytes, a.length, b.bytes, b.length);
}

int32 CompareNoCase(LStrView a, LStrView b) {
    if (a.bytes == b.bytes) return static_cast<int32>(a.length) - static_cast<int32>(b.length);
    return CompareBytesNoCase(a.bytes, a.length, b.bytes, b.length);
}

bool Equal(LStrView a, LStrView b) {
    return a.length == b.length && (a.length == 0 || std::memcmp(a.bytes, b.bytes, a.length) == 0);
}

// The order of two texts of which one is null: it is below every text that is not empty.
int32 CompareNull(LStrView a, LStrView b) {
    return (a.length != 0) - (b.length != 0);
}

int32 Store(const void* bytes, size_t length, LStrPtr dst) {
    if (!dst) return 0;
    if (length != 0) std::memmove(dst->bytes, bytes, length);
    return dst->count = static_cast<int32>(length);
}

// Copies as much as `size` takes with its terminator.
size_t CopyTerminated(LStrView src, char* dst, uint32 size) {
    if (size == 0 || !dst) return 0;
    const size_t length = std::min<size_t>(src.length, size - 1);
    if (length != 0) std::memmove(dst, src.bytes, length);
    dst[length] = 0;
    return length;
}

// Where bytes lie in the handle's own block, which may move when it is resized; false for bytes outside it.
bool OffsetInBlock(LStrHandle handle, const void* bytes, size_t* offset) {
    *offset = reinterpret_cast<uintptr_t>(bytes) - reinterpret_cast<uintptr_t>(*handle);
    return *offset < LStrSize(LStrView(*handle).length);
}

// Appends bytes, which may lie in the handle's own block.
MgErr Append(LStrHandle dst, const uint8* bytes, size_t n, bool exact) {
    const size_t count = LStrView(*dst).length;
    size_t offset = 0;
    const bool own = OffsetInBlock(dst, bytes, &offset);
    if (MgErr err = ResizeLStr(dst, count + n, exact)) return err;
    if (n != 0) std::memcpy((*dst)->bytes + count, own ? reinterpret_cast<const uint8*>(*dst) + offset : bytes, n);
    return kNoErr;
}

MgErr AppendOrCreate(LStrHandle* dst, const void* bytes, size_t n) {
    if (!dst) return kArgErr;
    if (*dst) return Append(*dst, static_cast<const uint8*>(bytes), n, true);
    const MgErr err = MakeLStr(dst, n);
    if (!err && n != 0) std::memcpy((**dst)->bytes, bytes, n);
    return err;
}

}  // namespace

// ---- comparison -----------------------------------------------------------------------------------------------------

int32 LStrCmp(const LStr* a, const LStr* b) {
    return a && b ? Compare(a, b) : CompareNull(a, b);
}

int32 LStrCaseCmp(const LStr* a, const LStr* b) {
    return a && b ? CompareNoCase(a, b) : CompareNull(a, b);
}

bool LStrEqual(const LStr* a, const LStr* b) {
    return a == b || Equal(a, b);
}

int32 LHStrCmp(LStrHandle a, LStrHandle b) {
    return Compare(a, b);
}

int32 LHStrCaseCmp(LStrHandle a, LStrHandle b) {
    return CompareNoCase(a, b);
}

bool LHStrEqual(LStrHandle a, LStrHandle b) {
    return a == b || Equal(a, b);
}

int32 PtrLenStrCmp(const void* a, int32 aLength, const void* b, int32 bLength) {
    const LStrView first(a, aLength), second(b, bLength);
    return a && b ? Compare(first, second) : CompareNull(first, second);
}

int32 PtrLenStrCaseCmp(const void* a, int32 aLength, const void* b, int32 bLength) {
    const LStrView first(a, aLength), second(b, bLength);
    return a && b ? CompareNoCase(first, second) : CompareNull(first, second);
}

int32 PLStrCmp(ConstPStr a, const LStr* b) {
    return Compare(a, b);
}

int32 PLStrCaseCmp(ConstPStr a, const LStr* b) {
    return CompareNoCase(a, b);
}

// ---- into and out of the caller's buffers ---------------------------------------------------------------------------

int32 CToLStr(CStr src, LStrPtr dst) {
    return Store(src, src ? std::strlen(src) : 0, dst);
}

int32 PToLStr(ConstPStr src, LStrPtr dst) {
    return src ? Store(src + 1, src[0], dst) : Store(nullptr, 0, dst);
}

int32 LToCStr(const LStr* src, char* dst) {
    return static_cast<int32>(CopyTerminated(src, dst, UINT32_MAX));
}

int32 LToCStrN(const LStr* src, char* dst, uint32 size) {
    return static_cast<int32>(CopyTerminated(src, dst, size));
}

int32 LToCStrNUnchecked(const LStr* src, char* dst, uint32 size) {
    return LToCStrN(src, dst, size);
}

MgErr LToCStrNChecked(const LStr* src, char* dst, uint32 size, int32* length) {
    if (length) *length = 0;
    if (!dst && size != 0) return kArgErr;
    const size_t copied = CopyTerminated(src, dst, size);
    if (length) *length = static_cast<int32>(copied);
    return copied != 0 && std::memchr(dst, 0, copied) ? kEmbeddedZeroErr : kNoErr;
}

int32 LToPStr(const LStr* src, PStr dst) {
    if (!dst) return 0;
    const LStrView text(src);
    if (text.length > kMaxPStr) {
        TESSEL_REPORT(kDebugWarning, 0xD04A6B39u)
            << "LStr truncated when converting to PStr. Original LStr length=" << src->count;
    }
    const size_t length = std::min(text.length, kMaxPStr);
    if (length != 0) std::memmove(dst + 1, text.bytes, length);
    return dst[0] = static_cast<uint8>(length);
}

// ---- into handles ---------------------------------------------------------------------------------------------------

MgErr LStrFromPtr(LStrHandle* handle, int32 length, const void* src) {
    if (!handle || length < 0) return kArgErr;
    if (!src || length == 0) return DSDisposeHandleAndNull(AsHandlePtr(handle));
    size_t offset = 0;
    if (*handle && OffsetInBlock(*handle, src, &offset)) {
        if (MgErr err = SizeHandle(*handle, LStrSize(length), false)) return err;
        Store(reinterpret_cast<const uint8*>(**handle) + offset, static_cast<size_t>(length), **handle);
        return SizeHandle(*handle, LStrSize(length), true);
    }
    const MgErr err = MakeLStr(handle, static_cast<size_t>(length));
    if (!err) std::memcpy((**handle)->bytes, src, static_cast<size_t>(length));
    return err;
}

MgErr PToLHStr(ConstPStr src, LStrHandle* handle) {
    const int32 length = src ? src[0] : 0;
    const MgErr err = LStrFromPtr(handle, length, src ? src + 1 : nullptr);
    if (err) {
        TESSEL_REPORT(kDebugInfo, 0x3E8F5A12u) << "PToLHStr FAILED:" << DbgFmtPStr(src) << ", size " << length << ", "
                                               << DbgFmtPtr(handle ? *handle : nullptr);
    }
    return err;
}

MgErr CToLHStr(CStr src, LStrHandle* handle) {
    const int32 length = src ? static_cast<int32>(std::strlen(src)) : 0;
    const MgErr err = LStrFromPtr(handle, length, src);
    if (err) {
        TESSEL_REPORT(kDebugInfo, 0x57B0C9E4u) << "CToLHStr FAILED:" << DbgFmtCStr(src) << ", size " << length << ", "
                                               << DbgFmtPtr(handle ? *handle : nullptr);
    }
    return err;
}

MgErr PStrToDSLStr(ConstPStr src, LStrHandle* handle) {
    return PToLHStr(src, handle);
}

// ---- editing in a handle --------------------------------------------------------------------------------------------

MgErr LStrCat(LStrHandle dst, const LStr* src) {
    const LStrView text(src);
    return dst ? Append(dst, text.bytes, text.length, true) : kArgErr;
}

MgErr LStrCatEfficient(LStrHandle dst, const LStr* src) {
    const LStrView text(src);
    return dst ? Append(dst, text.bytes, text.length, false) : kArgErr;
}

MgErr LStrAppendChar(LStrHandle dst, uint8 c) {
    return dst ? Append(dst, &c, 1, false) : kArgErr;
}

MgErr LStrAppendPStr(LStrHandle* dst, ConstPStr src) {
    return src ? AppendOrCreate(dst, src + 1, src[0]) : kNoErr;
}

MgErr LStrAppendCStr(LStrHandle* dst, CStr src) {
    return src ? AppendOrCreate(dst, src, std::strlen(src)) : kNoErr;
}

MgErr LStrPrependCStr(LStrHandle* dst, CStr src) {
    if (!dst || !*dst || !src) return kNoErr;
    const size_t added = std::strlen(src);
    const size_t count = LStrView(*dst).length;
    size_t offset = 0;
    const bool own = OffsetInBlock(*dst, src, &offset);
    if (MgErr err = ResizeLStr(*dst, count + added, false)) return err;
    LStrPtr text = **dst;
    std::memmove(text->bytes + added, text->bytes, count);
    std::memcpy(text->bytes, own ? reinterpret_cast<CStr>(text) + offset + added : src, added);
    return kNoErr;
}

MgErr LStrHNullTerminate(LStrHandle handle) {
    if (!handle) return kArgErr;
    if (MgErr err = DSSetHandleSize(AsHandle(handle), DSGetHandleSize(AsHandle(handle)) + 1)) return err;
    LStrPtr text = *handle;
    text->bytes[text->count++] = 0;
    return kNoErr;
}

void LStrToUpper(LStrHandle handle) {
    const LStrView text(handle);
    if (text.length != 0) platform::UpperText(reinterpret_cast<char*>((*handle)->bytes), text.length);
}

void LStrToLower(LStrHandle handle) {
    const LStrView text(handle);
    if (text.length != 0) platform::LowerText(reinterpret_cast<char*>((*handle)->bytes), text.length);
}
