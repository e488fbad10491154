// The second names: each does what the operation of the same ending does. Those that create do not call it, so that
// leak reports begin with their own caller.
#include "memory/Handles.h"

using namespace tessel;

UHandle AZNewHandle(uint32 size) {
    return CreateHandle(size, false, TESSEL_THIS_FRAME);
}
UHandle AZNewHClr(uint32 size) {
    return CreateHandle(size, true, TESSEL_THIS_FRAME);
}
UPtr AZNewPtr(uint32 size) {
    return CreatePtr(size, false, TESSEL_THIS_FRAME);
}
UPtr AZNewPClr(uint32 size) {
    return CreatePtr(size, true, TESSEL_THIS_FRAME);
}
MgErr AZDisposeHandle(UHandle h) {
    return DSDisposeHandle(h);
}
MgErr AZDisposePtr(void* p) {
    return DSDisposePtr(p);
}
uint32 AZGetHandleSize(UHandle h) {
    return DSGetHandleSize(h);
}
MgErr AZSetHandleSize(UHandle h, uint32 size) {
    return DSSetHandleSize(h, size);
}
MgErr AZSetHSzClr(UHandle h, uint32 size) {
    return DSSetHSzClr(h, size);
}
MgErr AZCopyHandle(UHandle* destination, UHandle source) {
    return CopyHandle(destination, source, TESSEL_THIS_FRAME);
}
MgErr AZHandToHand(UHandle* h) {
    return HandToHand(h, TESSEL_THIS_FRAME);
}
MgErr AZPtrToHand(const void* p, UHandle* h, uint32 size) {
    return PtrToHand(p, h, size, TESSEL_THIS_FRAME);
}
MgErr AZPtrToXHand(const void* p, UHandle h, uint32 size) {
    return DSPtrToXHand(p, h, size);
}
MgErr AZSetHandleFromPtr(UHandle* h, const void* p, uint32 size) {
    return SetHandleFromPtr(h, p, size, TESSEL_THIS_FRAME);
}
MgErr AZPtrAndHand(const void* p, UHandle h, uint32 size) {
    return DSPtrAndHand(p, h, size);
}
MgErr AZHandAndHand(UHandle source, UHandle destination) {
    return DSHandAndHand(source, destination);
}
UHandle AZRecoverHandle(const void* data) {
    return DSRecoverHandle(data);
}
MgErr AZCheckHandle(UHandle h) {
    return DSCheckHandle(h);
}
MgErr AZCheckPtr(const void* p) {
    return DSCheckPtr(p);
}
MgErr AZHeapCheck(int32 report) {
    return DSHeapCheck(report);
}
MgErr AZMemStats(MemStatRec* stats) {
    return DSMemStats(stats);
}
int32 AZMaxMem(void) {
    return DSMaxMem();
}
