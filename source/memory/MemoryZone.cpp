// The second names: each calls the operation of the same ending.
#include <tessel/memory/MemoryManager.h>

UHandle AZNewHandle(uint32 size) {
    return DSNewHandle(size);
}
UHandle AZNewHClr(uint32 size) {
    return DSNewHClr(size);
}
UPtr AZNewPtr(uint32 size) {
    return DSNewPtr(size);
}
UPtr AZNewPClr(uint32 size) {
    return DSNewPClr(size);
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
    return DSCopyHandle(destination, source);
}
MgErr AZHandToHand(UHandle* h) {
    return DSHandToHand(h);
}
MgErr AZPtrToHand(const void* p, UHandle* h, uint32 size) {
    return DSPtrToHand(p, h, size);
}
MgErr AZPtrToXHand(const void* p, UHandle h, uint32 size) {
    return DSPtrToXHand(p, h, size);
}
MgErr AZSetHandleFromPtr(UHandle* h, const void* p, uint32 size) {
    return DSSetHandleFromPtr(h, p, size);
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
