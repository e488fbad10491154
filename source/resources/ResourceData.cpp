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
    Dispose(handle_);
}

MgErr DSHandleResource::Adopt(UHandle handle) {
    const MgErr err = OwnedHandles::Add(handle);
    if (!err) handle_ = handle;
    return err;
}

void DSHandleResource::DetachHandle() {
    if (handle_) OwnedHandles::Remove(handle_);
    handle_ = nullptr;
}

uint32 DSHandleResource::GetSize() const {
    return handle_ ? DSGetHandleSize(handle_) : 0;
}

MappedResource::~MappedResource() {
    Dispose(copy_);
}

void MappedResource::DetachHandle() {
    if (copy_) OwnedHandles::Remove(copy_);
    data_ = nullptr;
    size_ = 0;
    copy_ = nullptr;
}

UHandle MappedResource::GetSharedDSHandle() {
    if (copy_ || !data_ || DSPtrToHand(data_, &copy_, size_)) return copy_;
    if (OwnedHandles::Add(copy_)) {
        DSDisposeHandle(copy_);
        copy_ = nullptr;
    }
    return copy_;
}

}  // namespace tessel
