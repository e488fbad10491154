#include "resources/ResourceData.h"

#include "diagnostics/Guarded.h"
#include <tessel/memory/MemoryManager.h>

#include <functional>
#include <unordered_set>

namespace tessel {

namespace {

using HandleSet = std::unordered_set<UHandle, std::hash<UHandle>, std::equal_to<UHandle>, TrackedAllocator<UHandle>>;

HandleSet& Handles() {
    static HandleSet handles;
    return handles;
}

void Dispose(UHandle handle) {
    if (!handle) return;
    OwnedHandles::Remove(handle);
    DSDisposeHandle(handle);
}

}  // namespace

MgErr OwnedHandles::Add(UHandle handle) {
    return Guarded([&] { return Handles().insert(handle).second ? kNoErr : kArgErr; });
}

void OwnedHandles::Remove(UHandle handle) {
    Handles().erase(handle);
}

void OwnedHandles::Free() {
    HandleSet().swap(Handles());
}

DSHandleResource::~DSHandleResource() {
    Dispose(fHandle);
}

MgErr DSHandleResource::Adopt(UHandle handle) {
    const MgErr err = OwnedHandles::Add(handle);
    if (!err) fHandle = handle;
    return err;
}

void DSHandleResource::DetachHandle() {
    if (fHandle) OwnedHandles::Remove(fHandle);
    fHandle = nullptr;
}

uint32 DSHandleResource::GetSize() const {
    return fHandle ? DSGetHandleSize(fHandle) : 0;
}

MappedResource::~MappedResource() {
    Dispose(fCopy);
}

void MappedResource::DetachHandle() {
    if (fCopy) OwnedHandles::Remove(fCopy);
    fData = nullptr;
    fSize = 0;
    fCopy = nullptr;
}

UHandle MappedResource::GetSharedDSHandle() {
    if (fCopy || !fData || DSPtrToHand(fData, &fCopy, fSize)) return fCopy;
    if (OwnedHandles::Add(fCopy)) {
        DSDisposeHandle(fCopy);
        fCopy = nullptr;
    }
    return fCopy;
}

}  // namespace tessel
