// Output buffers: room for the next n bytes, in a block of the caller's, in a growing handle, or nowhere at all.
//
// The first error stays with the buffer: every later request yields null and that error. A buffer is used by one thread
// at a time.
#ifndef TESSEL_STREAMS_OUTPUTBUF_H
#define TESSEL_STREAMS_OUTPUTBUF_H

#include <tessel/base/MgErr.h>
#include <tessel/base/StringTypes.h>

#ifdef __cplusplus
#    include <tessel/memory/TrackedMallocFree.h>

namespace tessel {

// Where bytes are written to, in order.
class TESSEL_API OutputBuf : public TrackedObject {
public:
    virtual ~OutputBuf();

    // A pointer to room for n more bytes, which the caller fills before the next request. Stores the buffer's error.
    // Null for n = 0, after an error, and always from a PreflightOutputBuf (which only counts).
    virtual void* GetDataPointer(uint32 n, MgErr& err) = 0;

    // Bytes that were given room so far.
    virtual uint32 GetBytesWritten() const = 0;

    OutputBuf(const OutputBuf&) = delete;
    OutputBuf& operator=(const OutputBuf&) = delete;

protected:
    OutputBuf() = default;
};

// Counts what would be written. Never fails.
class TESSEL_API PreflightOutputBuf final : public OutputBuf {
public:
    PreflightOutputBuf() = default;
    ~PreflightOutputBuf() override;
    void* GetDataPointer(uint32 n, MgErr& err) override;
    uint32 GetBytesWritten() const override;

private:
    uint32 count_ = 0;
};

// Writes into a block of the caller's. Error 74 when it is full.
class TESSEL_API StaticOutputBuf final : public OutputBuf {
public:
    // Over the caller's block.
    StaticOutputBuf(void* data, uint32 capacity);
    ~StaticOutputBuf() override;
    void* GetDataPointer(uint32 n, MgErr& err) override;
    uint32 GetBytesWritten() const override;

private:
    MgErr error_ = kNoErr;
    uint8* data_;
    uint32 capacity_;
    uint32 written_ = 0;
};

// Writes into a handle of its own that grows as needed. Error 2 when there is no memory for it, else what the resizing
// of the handle gives.
class TESSEL_API HandleOutputBuf final : public OutputBuf {
public:
    // With room for 4096 bytes at first.
    HandleOutputBuf();
    // With room for so many bytes at first.
    explicit HandleOutputBuf(uint32 initialSize);
    ~HandleOutputBuf() override;
    void* GetDataPointer(uint32 n, MgErr& err) override;
    uint32 GetBytesWritten() const override;

    // The handle, cut to the bytes written. With release not 0 it is the caller's from now on. Null after an error;
    // a handle already released is error 1.
    UHandle GetHandle(int32 release);

private:
    MgErr error_ = kNoErr;
    UHandle handle_;
    uint32 capacity_;
    uint32 written_ = 0;
};

// The same with a string handle. Capacities leave out the four bytes of the count.
class TESSEL_API LStrOutputBuf final : public OutputBuf {
public:
    // With room for 4096 bytes at first.
    LStrOutputBuf();
    // With room for so many bytes at first.
    explicit LStrOutputBuf(uint32 initialCapacity);

    // Takes over the given handle, of `capacity` bytes or, when 0, of the size it has. Null: a new handle of `capacity`
    // bytes (4096 when 0).
    LStrOutputBuf(LStrHandle text, uint32 capacity);
    ~LStrOutputBuf() override;
    void* GetDataPointer(uint32 n, MgErr& err) override;
    uint32 GetBytesWritten() const override;

    // As HandleOutputBuf::GetHandle; the count of the string is set.
    LStrHandle GetHandle(int32 release);

private:
    MgErr error_ = kNoErr;
    LStrHandle text_;
    uint32 capacity_;
    uint32 written_ = 0;
};

// A new buffer, or null when memory is short. The caller deletes it.
TESSEL_API PreflightOutputBuf* CreatePreflightOutputBuf();
// The same over a block of the caller's.
TESSEL_API StaticOutputBuf* CreateStaticOutputBuf(void* data, uint32 capacity);
// The same with a string handle of its own.
TESSEL_API LStrOutputBuf* CreateLStrOutputBuf(uint32 initialCapacity);

}  // namespace tessel
#endif

#endif
