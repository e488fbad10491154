// OVHandle: the owner of one handle.
#ifndef TESSEL_STRINGS_OVHANDLE_H
#define TESSEL_STRINGS_OVHANDLE_H

#include <tessel/base/MgErr.h>
#include <tessel/base/Types.h>

#ifdef __cplusplus
namespace tessel {

// Owns one handle, null when empty, and disposes of it. Sizes are bytes. Used by one thread at a time.
class TESSEL_API OVHandle {
public:
    OVHandle() = default;
    // Takes the handle over; the other is empty then.
    OVHandle(OVHandle&& other) noexcept : handle_(other.DetachHandle()) {}
    // Disposes of the handle held, and takes the other's over.
    OVHandle& operator=(OVHandle&& other) noexcept;
    ~OVHandle();

    // The handle, which stays the holder's; null when empty.
    UHandle Handle() const { return handle_; }
    // Bytes of the handle; 0 when empty.
    uint32 Size() const;

    // Resizes the handle, creating it when there is none; n of 0 disposes of it. kMemFullErr when it cannot be created,
    // else the handle manager's error.
    MgErr Resize(uint32 n);

    // Grows or shrinks the field at `field`, which lies in the handle's block, moving everything after it; `field` then
    // points at it in the block, which may have moved. New bytes are not set. kArgErr when the field does not lie in
    // the block. On failure nothing has changed. Where memory is too short to shrink the block, it keeps its size.
    MgErr ResizeField(uint8*& field, uint32 oldSize, uint32 newSize);

    // Takes the handle over. One that is still held is reported (fatal) and replaced; it is not disposed of.
    void AttachHandle(UHandle handle);

    // Gives the handle to the caller; the holder is then empty.
    UHandle DetachHandle();

private:
    friend class OVSubString;  // edits the text of an OVString in its handle

    UHandle handle_ = nullptr;
};

}  // namespace tessel
#endif

#endif
