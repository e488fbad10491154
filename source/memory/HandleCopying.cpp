// Copying and appending, and the other operations that are made of the basic ones.
#include "memory/Handles.h"
#include <tessel/diagnostics/DebugStream.h>

#include <cstring>
#include <utility>

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
    uint32 size = DSGetHandleSize(source);
    MgErr err = ResizeOrCreate(destination, size, false, kResizeOrNew, frame);
    if (err == kNoErr) Copy(*source, *destination, 0, size);
    return err;
}

MgErr HandToHand(UHandle* h, const void* frame) {
    if (!h) return kArgErr;
    if (!IsGoodHandle(*h, kChangeProves)) return kHandleErr;
    uint32 size = DSGetHandleSize(*h);
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
    MgErr err = ResizeOrCreate(h, size, false, kResizeOrNew, frame);
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
    MgErr err = DSSetHandleSize(h, size);
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
    MgErr err = Append(h, size, &end);
    if (err == kNoErr) Copy(p, h, end, size);
    return err;
}

MgErr DSHandAndHand(UHandle source, UHandle destination) {
    if (!IsGoodHandle(source, kChangeProves)) return kHandleErr;
    uint32 end, size = DSGetHandleSize(source);
    MgErr err = Append(destination, size, &end);
    if (err == kNoErr) Copy(*source, destination, end, size);
    return err;
}

MgErr DSSwapHandles(UHandle a, UHandle b) {
    if (!IsGoodHandle(a, kChangeProves) || !IsGoodHandle(b, kChangeProves)) {
        TESSEL_REPORT(kDebugFatal, 0x64D2907Fu);
        return kHandleErr;
    }
    if (a == b) TESSEL_REPORT(kDebugFatal, 0x0E8C53B6u);
    HandleGate gate(ThreadMemory::Mine());  // a walk meets each block once
    uintptr_t first = SlotContent(a), second = SlotContent(b);
    SetSlotContent(a, second);
    SetSlotContent(b, first);
    return kNoErr;
}

UHandle DSRecoverHandle(const void* data) {
    // Only what is a handle's data has a handle's header to find the guards by.
    UHandle h = data ? masterPointers.Find(data) : nullptr;
    if (!h) {
        TESSEL_REPORT(kDebugFatal, 0x57F4B12Du) << "Pointer passed to BRecoverHandle not linked to master pointer!";
        return nullptr;
    }
    if (!ChecksGuards(GuardKind::kHandle) || CheckGuards(data, GuardKind::kHandle)) return h;
    TESSEL_REPORT(kDebugFatal, 0x3AE06C94u);
    return nullptr;
}

// ---- lock and purge states: there are none, only the handle is checked ----------------------------------------------

namespace {

MgErr CheckFor(UHandle h, const char* operation) {
    return ReportMemoryError(IsGoodHandle(h, kChangeProves) ? kNoErr : kHandleErr, operation);
}

}  // namespace

MgErr AZHLock(UHandle h) {
    return CheckFor(h, "AZHLock");
}

// Reports under the name of its twin.
MgErr AZHUnlock(UHandle h) {
    return CheckFor(h, "AZHLock");
}

void AZHPurge(UHandle h) {
    CheckFor(h, "AZHPurge");
}

void AZHNoPurge(UHandle h) {
    CheckFor(h, "AZHNoPurge");
}

int32 AZHGetState(UHandle h) {
    IsGoodHandle(h, kChangeProves);
    return 0;
}

void AZHSetState(UHandle h, int32) {
    CheckFor(h, "AZHSetState");
}
