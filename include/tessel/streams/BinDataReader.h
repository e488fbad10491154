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
    BinDataReader(InputBuf* buffer, const Endianizer* endianizer);

    virtual void Align(uint32 n);  // moves on to the next multiple of n bytes from the start of the buffer
    virtual InputBuf* GetBuffer() const;
    virtual MgErr GetError();

    virtual int8 ReadI8();
    virtual uint8 ReadU8();
    virtual int16 ReadI16();
    virtual uint16 ReadU16();
    virtual int32 ReadI32();
    virtual uint32 ReadU32();
    virtual int64 ReadI64();
    virtual uint64 ReadU64();
    virtual int32 Read4Char();  // four bytes as they are, never converted
    virtual float ReadF32();
    virtual double ReadF64();
    virtual floatExt ReadFX();
    virtual uint8 ReadBool();

    // A flattened path. The caller destroys the path. Null for the null path and after an error.
    virtual Path ReadPath();

    // A PStr padded to a multiple of `align` bytes (0 or 1: none). `out` holds 256 bytes.
    virtual void ReadPStr(PStr out, uint32 align);
    virtual void ReadPStrAsNarrow(std::string& out, uint32 align);

    // An LStr. Error 116 when its count is negative, or both above 2 MiB and more than the buffer holds.
    // The caller disposes of the handle; null stands for the empty string.
    virtual void ReadLStrAsNarrow(std::string& out);
    virtual LStrHandle ReadLStr();

    // n bytes; all zero after an error. A null destination skips them.
    virtual void ReadBytes(void* destination, uint32 n);
    virtual void Skip(uint32 n);

    virtual ~BinDataReader();

    void SetError(MgErr err);  // unless there is one already

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
