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
    BinDataWriter(OutputBuf* buffer, const Endianizer* endianizer);

    virtual MgErr GetError();
    virtual OutputBuf* GetBuffer() const;
    virtual OutputBuf* SetBuffer(OutputBuf* buffer);  // returns the previous buffer

    virtual uint32 Align(uint32 n);  // zero bytes up to the next multiple of n of the bytes written
    virtual uint32 WriteI8(int8 value);
    virtual uint32 WriteU8(uint8 value);
    virtual uint32 WriteI16(int16 value);
    virtual uint32 WriteU16(uint16 value);
    virtual uint32 WriteI32(int32 value);
    virtual uint32 WriteU32(uint32 value);
    virtual uint32 WriteI64(int64 value);
    virtual uint32 WriteU64(uint64 value);
    virtual uint32 Write4Char(int32 value);  // four bytes as they lie in memory
    virtual uint32 WriteF32(float value);
    virtual uint32 WriteF64(double value);
    virtual uint32 WriteFX(const floatExt& value);
    virtual uint32 WriteBool(uint8 value);
    virtual uint32 WritePath(Path path);  // the flattened path; null is the null path

    // The length byte, the bytes, and zero bytes up to a multiple of `align` (0 or 1: none). A null PStr writes
    // nothing; a narrow string is cut at 255 bytes.
    virtual uint32 WritePStr(ConstPStr text, uint32 align);
    virtual uint32 WritePStrFromNarrow(const std::string& text, uint32 align);

    // The count (32 bits) and the bytes. A null LStr is the empty string.
    virtual uint32 WriteLStrFromNarrow(const std::string& text);
    virtual uint32 WriteLStr(const LStr* text);
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
