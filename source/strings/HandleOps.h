// Typed handles as the plain handles that the memory manager takes, and edits inside a handle's block.
#ifndef TESSEL_STRINGS_HANDLEOPS_H
#define TESSEL_STRINGS_HANDLEOPS_H

#include <tessel/base/StringTypes.h>
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

constexpr size_t kMaxLStr = INT32_MAX - LStrSize(0);  // bytes of the longest text that a handle can hold

// Makes a handle, null or not, an LStr with a text of `count` bytes, and room for some that do not count behind it. New
// bytes are not set.
inline MgErr MakeLStr(LStrHandle* handle, size_t count, size_t behind = 0) {
    if (count + behind > kMaxLStr) return kMemFullErr;
    if (MgErr err = DSSetHandleSizeOrNewHandle(AsHandlePtr(handle), LStrSize(count + behind))) return err;
    (**handle)->count = static_cast<int32>(count);
    return kNoErr;
}

// Gives an LStr a text of `count` bytes, in a handle that is brought to it as SizeHandle does.
inline MgErr ResizeLStr(LStrHandle handle, size_t count, bool exact) {
    if (count > kMaxLStr) return kMemFullErr;
    if (MgErr err = SizeHandle(handle, LStrSize(count), exact)) return err;
    (*handle)->count = static_cast<int32>(count);
    return kNoErr;
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
