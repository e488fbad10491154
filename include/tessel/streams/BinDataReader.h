// Typed reading from an input buffer in the byte order of an Endianizer.
#ifndef TESSEL_STREAMS_BINDATAREADER_H
#define TESSEL_STREAMS_BINDATAREADER_H

#include <tessel/base/MgErr.h>
#include <tessel/base/StringTypes.h>
#include <tessel/streams/Endianizer.h>
#include <tessel/streams/InputBuf.h>

#ifdef __cplusplus
#    include <string>

namespace tessel {

// Every read returns the value, or 0, null or empty text after an error. The first error stays: read all that belongs
// together and ask GetError once at the end. Reading past the end is error 74.
//
// The reader owns neither the buffer nor the Endianizer; both must outlive it. One thread at a time.
class TESSEL_API BinDataReader : public TrackedObject {
public:
    // Reads from the buffer in the byte order of the Endianizer.
    BinDataReader(InputBuf* buffer, const Endianizer* endianizer);

    // Moves on to the next multiple of n bytes from the start of the buffer.
    virtual void Align(uint32 n);
    // The buffer it reads from.
    virtual InputBuf* GetBuffer() const;
    // The first error; kNoErr without one.
    virtual MgErr GetError();

    // One byte.
    virtual int8 ReadI8();
    // One byte.
    virtual uint8 ReadU8();
    // Two bytes.
    virtual int16 ReadI16();
    // Two bytes.
    virtual uint16 ReadU16();
    // Four bytes.
    virtual int32 ReadI32();
    // Four bytes.
    virtual uint32 ReadU32();
    // Eight bytes.
    virtual int64 ReadI64();
    // Eight bytes.
    virtual uint64 ReadU64();
    // Four bytes as they are, never converted.
    virtual int32 Read4Char();
    // Four bytes.
    virtual float ReadF32();
    // Eight bytes.
    virtual double ReadF64();
    // As many bytes as Endianizer::StreamFXSize says.
    virtual floatExt ReadFX();
    // One byte as it stands.
    virtual uint8 ReadBool();

    // A flattened path. The caller destroys the path. Null for the null path and after an error.
    virtual Path ReadPath();

    // A PStr padded to a multiple of `align` bytes (0 or 1: none). `out` holds 256 bytes.
    virtual void ReadPStr(PStr out, uint32 align);
    // The same as a narrow string.
    virtual void ReadPStrAsNarrow(std::string& out, uint32 align);

    // An LStr. Error 116 when its count is negative, or both above 2 MiB and more than the buffer holds.
    // The caller disposes of the handle; null stands for the empty string.
    virtual void ReadLStrAsNarrow(std::string& out);
    // The same as a handle.
    virtual LStrHandle ReadLStr();

    // n bytes; all zero after an error. A null destination skips them.
    virtual void ReadBytes(void* destination, uint32 n);
    // Moves on by n bytes.
    virtual void Skip(uint32 n);

    virtual ~BinDataReader();

    // Sets the error, unless there is one already.
    void SetError(MgErr err);

    BinDataReader(const BinDataReader&) = delete;
    BinDataReader& operator=(const BinDataReader&) = delete;

private:
    const uint8* Take(uint32 n);
    bool TakeLStrCount(uint32& count);
    void Store(std::string& out, const uint8* bytes, uint32 count);

    const Endianizer* endianizer_;
    MgErr error_ = kNoErr;
    InputBuf* buffer_;
};

}  // namespace tessel
#endif

#endif
