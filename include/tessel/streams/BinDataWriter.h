// Typed writing to an output buffer in the byte order of an Endianizer.
#ifndef TESSEL_STREAMS_BINDATAWRITER_H
#define TESSEL_STREAMS_BINDATAWRITER_H

#include <tessel/base/MgErr.h>
#include <tessel/base/StringTypes.h>
#include <tessel/streams/Endianizer.h>
#include <tessel/streams/OutputBuf.h>

#ifdef __cplusplus
#    include <string>

namespace tessel {

// Every write returns the number of bytes the item takes up, or 0 after an error; with a PreflightOutputBuf, which
// stores nothing, the sizes are the same. The first error stays: write all that belongs together and ask GetError once
// at the end.
//
// The writer owns neither the buffer nor the Endianizer; both must outlive it. One thread at a time.
class TESSEL_API BinDataWriter : public TrackedObject {
public:
    // Writes to the buffer in the byte order of the Endianizer.
    BinDataWriter(OutputBuf* buffer, const Endianizer* endianizer);

    // The first error; kNoErr without one.
    virtual MgErr GetError();
    // The buffer it writes to.
    virtual OutputBuf* GetBuffer() const;
    // Writes to another buffer from now on; returns the previous one.
    virtual OutputBuf* SetBuffer(OutputBuf* buffer);

    // Zero bytes up to the next multiple of n of the bytes written.
    virtual uint32 Align(uint32 n);
    // One byte.
    virtual uint32 WriteI8(int8 value);
    // One byte.
    virtual uint32 WriteU8(uint8 value);
    // Two bytes.
    virtual uint32 WriteI16(int16 value);
    // Two bytes.
    virtual uint32 WriteU16(uint16 value);
    // Four bytes.
    virtual uint32 WriteI32(int32 value);
    // Four bytes.
    virtual uint32 WriteU32(uint32 value);
    // Eight bytes.
    virtual uint32 WriteI64(int64 value);
    // Eight bytes.
    virtual uint32 WriteU64(uint64 value);
    // Four bytes as they lie in memory.
    virtual uint32 Write4Char(int32 value);
    // Four bytes.
    virtual uint32 WriteF32(float value);
    // Eight bytes.
    virtual uint32 WriteF64(double value);
    // As many bytes as Endianizer::StreamFXSize says.
    virtual uint32 WriteFX(const floatExt& value);
    // One byte as it is.
    virtual uint32 WriteBool(uint8 value);
    // The flattened path; null is the null path.
    virtual uint32 WritePath(Path path);

    // The length byte, the bytes, and zero bytes up to a multiple of `align` (0 or 1: none). A null PStr writes
    // nothing; a narrow string is cut at 255 bytes.
    virtual uint32 WritePStr(ConstPStr text, uint32 align);
    // The same for a narrow string.
    virtual uint32 WritePStrFromNarrow(const std::string& text, uint32 align);

    // The count (32 bits) and the bytes. A null LStr is the empty string.
    virtual uint32 WriteLStrFromNarrow(const std::string& text);
    // The same for an LStr.
    virtual uint32 WriteLStr(const LStr* text);
    // The bytes as they are.
    virtual uint32 WriteBytes(const void* bytes, uint32 n);

    virtual ~BinDataWriter();

    BinDataWriter(const BinDataWriter&) = delete;
    BinDataWriter& operator=(const BinDataWriter&) = delete;

private:
    bool Room(uint32 n, uint8*& room);
    uint32 WriteByteCounted(const void* bytes, uint32 count, uint32 align);
    uint32 WriteLongCounted(const void* bytes, uint32 count);

    const Endianizer* endianizer_;
    MgErr error_ = kNoErr;
    OutputBuf* buffer_;
};

}  // namespace tessel
#endif

#endif
