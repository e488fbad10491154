// The second names: each does what the operation of the same ending does. Those that copy stand with their twins in
// HandleCopying.cpp.
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
MgErr AZPtrToXHand(const void* p, UHandle h, uint32 size) {
    return DSPtrToXHand(p, h, size);
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
