// Copying handles and pointer blocks into handles, and appending them.
#include "memory/Handles.h"
#include <tessel/diagnostics/DebugStream.h>

#include <cstring>

using namespace tessel;

namespace {

constexpr char kResizeOrNew[] = "DSSetHandleSizeOrNewHandle";

// Enlarges a handle by `size` bytes; *end = where they begin. What no handle can hold fails as any resize does.
MgErr Append(UHandle h, uint32 size, uint32* end) {
    *end = IsGoodHandle(h, kChangeProves) ? DSGetHandleSize(h) : 0;
    return DSSetHandleSize(h, size > UINT32_MAX - *end ? UINT32_MAX : *end + size);
}

bool IsNoData(const void* p, uint32 size) {
    return !p && size != 0;
}

void Copy(const void* from, UHandle to, uint32 at, uint32 size) {
    if (size != 0) std::memmove(*to + at, from, size);
}

}  // namespace

namespace tessel {

MgErr CopyHandle(UHandle* destination, UHandle source, const void* frame) {
    if (!destination) return kArgErr;
    if (!source) return DSDisposeHandleAndNull(destination);
    if (source == *destination) {
        TESSEL_REPORT(kDebugWarning, 0x40B1A5E7u) << "Should call DSHandToHand. This is a no-op";
        return kNoErr;
    }
    if (!IsGoodHandle(source, kChangeProves)) return kHandleErr;
    const uint32 size = DSGetHandleSize(source);
    const MgErr err = ResizeOrCreate(destination, size, false, kResizeOrNew, frame);
    if (err == kNoErr) Copy(*source, *destination, 0, size);
    return err;
}

MgErr HandToHand(UHandle* h, const void* frame) {
    if (!h) return kArgErr;
    if (!IsGoodHandle(*h, kChangeProves)) return kHandleErr;
    const uint32 size = DSGetHandleSize(*h);
    UHandle copy = CreateHandle(size, false, frame);
    if (!copy) return kMemFullErr;
    Copy(**h, copy, 0, size);
    *h = copy;
    return kNoErr;
}

MgErr PtrToHand(const void* p, UHandle* h, uint32 size, const void* frame) {
    if (!h) return kArgErr;
    *h = nullptr;
    if (IsNoData(p, size)) return kArgErr;
    *h = CreateHandle(size, false, frame);
    if (!*h) return kMemFullErr;
    Copy(p, *h, 0, size);
    return kNoErr;
}

MgErr SetHandleFromPtr(UHandle* h, const void* p, uint32 size, const void* frame) {
    if (IsNoData(p, size)) return kArgErr;
    const MgErr err = ResizeOrCreate(h, size, false, kResizeOrNew, frame);
    if (err == kNoErr) Copy(p, *h, 0, size);
    return err;
}

}  // namespace tessel

MgErr DSCopyHandle(UHandle* destination, UHandle source) {
    return CopyHandle(destination, source, TESSEL_THIS_FRAME);
}

MgErr DSHandToHand(UHandle* h) {
    return HandToHand(h, TESSEL_THIS_FRAME);
}

MgErr DSPtrToHand(const void* p, UHandle* h, uint32 size) {
    return PtrToHand(p, h, size, TESSEL_THIS_FRAME);
}

MgErr DSPtrToXHand(const void* p, UHandle h, uint32 size) {
    if (IsNoData(p, size)) return kArgErr;
    const MgErr err = DSSetHandleSize(h, size);
    if (err == kNoErr) Copy(p, h, 0, size);
    return err;
}

MgErr DSSetHandleFromPtr(UHandle* h, const void* p, uint32 size) {
    return SetHandleFromPtr(h, p, size, TESSEL_THIS_FRAME);
}

MgErr DSSetHandleFromPtrNULLMeansEmpty(UHandle* h, const void* p, uint32 size) {
    return size == 0 ? DSDisposeHandleAndNull(h) : SetHandleFromPtr(h, p, size, TESSEL_THIS_FRAME);
}

MgErr DSPtrAndHand(const void* p, UHandle h, uint32 size) {
    if (IsNoData(p, size)) return kArgErr;
    uint32 end;
    const MgErr err = Append(h, size, &end);
    if (err == kNoErr) Copy(p, h, end, size);
    return err;
}

MgErr DSHandAndHand(UHandle source, UHandle destination) {
    if (!IsGoodHandle(source, kChangeProves)) return kHandleErr;
    uint32 end, size = DSGetHandleSize(source);
    const MgErr err = Append(destination, size, &end);
    if (err == kNoErr) Copy(*source, destination, end, size);
    return err;
}
