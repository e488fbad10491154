// Input buffers: bytes to read, handed out as pointers to the next n of them.
//
// The first error stays with the buffer: every later request yields null and that error. A buffer is used by one thread
// at a time.
#ifndef TESSEL_STREAMS_INPUTBUF_H
#define TESSEL_STREAMS_INPUTBUF_H

#include <tessel/base/MgErr.h>
#include <tessel/base/StringTypes.h>

#ifdef __cplusplus
#    include <tessel/memory/TrackedMallocFree.h>

namespace tessel {

// Where bytes are read from, in order.
class TESSEL_API InputBuf : public TrackedObject {
public:
    // A pointer to the next n bytes, which stays good as long as the buffer; the read position moves past them unless
    // peek is not 0. Stores the buffer's error. Null for n = 0 and after an error.
    //
    // When fewer than n bytes remain: with `available` null, error 74 and null; otherwise a pointer to what remains
    // (null at the end), its length in `available` and no error. When n bytes remain, `available` is n.
    virtual const void* GetDataPointer(uint32 n, MgErr& err, uint32* available = nullptr, int32 peek = 0) = 0;

    // The read position.
    virtual uint32 GetBytesRead() const = 0;
    // Bytes in all; 0 after an error.
    virtual uint32 GetSize() const = 0;

    virtual ~InputBuf();

    InputBuf(const InputBuf&) = delete;
    InputBuf& operator=(const InputBuf&) = delete;

protected:
    InputBuf() = default;
};

// Reads a block of the caller's, which must stay where it is. A null pointer is an empty block.
class TESSEL_API MemInputBuf final : public InputBuf {
public:
    // Over the caller's block.
    MemInputBuf(const void* data, uint32 size);
    const void* GetDataPointer(uint32 n, MgErr& err, uint32* available = nullptr, int32 peek = 0) override;
    uint32 GetBytesRead() const override;
    uint32 GetSize() const override;
    ~MemInputBuf() override;

private:
    MgErr error_ = kNoErr;
    const uint8* data_;
    uint32 size_;
    uint32 position_ = 0;
};

// Reads the text of a string handle, which it takes from the caller's variable (set to null) and disposes of.
// A null handle puts the buffer in error 1.
class TESSEL_API LStrInputBuf final : public InputBuf {
public:
    // Takes the handle over; `text` becomes null.
    explicit LStrInputBuf(LStrHandle& text);
    const void* GetDataPointer(uint32 n, MgErr& err, uint32* available = nullptr, int32 peek = 0) override;
    uint32 GetBytesRead() const override;
    uint32 GetSize() const override;
    ~LStrInputBuf() override;

    // Hands the string handle back to the caller, who owns it then; the buffer is in error 1 from now on.
    LStrHandle ReleaseOwnership();

private:
    LStrHandle text_;
    MgErr error_;
    uint32 size_;
    uint32 position_ = 0;
};

// A new buffer, or null when memory is short (the string handle then stays with the caller). The caller deletes it.
TESSEL_API MemInputBuf* CreateMemInputBuf(const void* data, uint32 size);
// The same over a string handle, which it takes over: `text` becomes null.
TESSEL_API LStrInputBuf* CreateLStrInputBuf(LStrHandle& text);

}  // namespace tessel
#endif

#endif
