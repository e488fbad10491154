// Typed handles as the plain handles that the memory manager takes, and edits inside a handle's block.
#ifndef TESSEL_STRINGS_HANDLEOPS_H
#define TESSEL_STRINGS_HANDLEOPS_H

#include <tessel/memory/MemoryManager.h>

namespace tessel {

template <class T>
UHandle AsHandle(T** handle) {
    return reinterpret_cast<UHandle>(handle);
}

template <class T>
UHandle* AsHandlePtr(T*** handle) {
    return reinterpret_cast<UHandle*>(handle);
}

// Brings a handle to `needed` bytes: exactly, or only when it is smaller. Where memory is too short to shrink it, it
// stays as large as it is, so that only growing fails for want of memory.
template <class T>
MgErr SizeHandle(T** handle, uint32 needed, bool exact) {
    const uint32 size = DSGetHandleSize(AsHandle(handle));
    if (size >= needed && (!exact || size == needed)) return kNoErr;
    const MgErr err = DSSetHandleSize(AsHandle(handle), needed);
    return err == kMemFullErr && size > needed ? MgErr{kNoErr} : err;
}

// Where a range stands in the content of a handle's block.
struct HandleRange {
    uint32 contentSize;  // bytes of the block that are in use
    uint32 offset;
    uint32 size;
};

// Gives the range another size, moving what is behind it; new bytes are not set. The block grows before the move and
// shrinks (when `exact`) after it, so that a failure to grow changes nothing.
MgErr ResizeRange(UHandle handle, HandleRange range, uint32 newSize, bool exact);

}  // namespace tessel

#endif
