// OVHandle, a handle that belongs to an object.
#include "strings/HandleOps.h"
#include <tessel/diagnostics/DebugStream.h>
#include <tessel/strings/ovhandle.h>

#include <utility>

namespace tessel {

OVHandle& OVHandle::operator=(OVHandle&& other) noexcept {
    std::swap(handle_, other.handle_);
    return *this;
}

OVHandle::~OVHandle() {
    DSDisposeHandle(handle_);
}

uint32 OVHandle::Size() const {
    return handle_ ? DSGetHandleSize(handle_) : 0;
}

MgErr OVHandle::Resize(uint32 n) {
    return n == 0 ? DSDisposeHandleAndNull(&handle_) : DSSetHandleSizeOrNewHandle(&handle_, n);
}

MgErr OVHandle::ResizeField(uint8*& field, uint32 oldSize, uint32 newSize) {
    if (oldSize == newSize) return kNoErr;
    const uint32 size = Size();
    const uintptr_t offset =
        handle_ ? reinterpret_cast<uintptr_t>(field) - reinterpret_cast<uintptr_t>(*handle_) : size;
    if (!handle_ || offset > size || oldSize > size - offset) return kArgErr;
    const MgErr err = ResizeRange(handle_, {size, static_cast<uint32>(offset), oldSize}, newSize, true);
    if (!err) field = *handle_ + offset;
    return err;
}

void OVHandle::AttachHandle(UHandle handle) {
    if (handle_) TESSEL_REPORT(kDebugFatal, 0xB47C9E13u) << "Can't attach to non null OVHandle.";
    handle_ = handle;
}

UHandle OVHandle::DetachHandle() {
    return std::exchange(handle_, nullptr);
}

}  // namespace tessel
