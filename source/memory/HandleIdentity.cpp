// What is done to handles without touching their data: swapping, recovering one from its data, lock and purge states.
#include "memory/Handles.h"
#include <tessel/diagnostics/DebugStream.h>

using namespace tessel;

MgErr DSSwapHandles(UHandle a, UHandle b) {
    if (!IsGoodHandle(a, kChangeProves) || !IsGoodHandle(b, kChangeProves)) {
        TESSEL_REPORT(kDebugFatal, 0x64D2907Fu);
        return kHandleErr;
    }
    if (a == b) TESSEL_REPORT(kDebugFatal, 0x0E8C53B6u);
    HandleGate gate(ThreadMemory::Mine());  // a walk meets each block once
    const uintptr_t first = SlotContent(a), second = SlotContent(b);
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
