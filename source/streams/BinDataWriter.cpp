// WritePath stands with the paths (paths/BinDataPaths.cpp).
#include "streams/Padding.h"
#include <tessel/diagnostics/DebugStream.h>
#include <tessel/streams/BinDataWriter.h>

#include <algorithm>
#include <bit>
#include <cstring>

namespace tessel {
namespace {

constexpr size_t kLongestPStr = 255;
constexpr size_t kLongestLStr = 0x7FFFFFFF - LStrSize(0);

}  // namespace

BinDataWriter::BinDataWriter(OutputBuf* buffer, const Endianizer* endianizer)
    : endianizer_(endianizer), error_(buffer && endianizer ? kNoErr : kArgErr), buffer_(buffer) {
}

BinDataWriter::~BinDataWriter() {
    if (error_) TESSEL_REPORT(kDebugInfo, 0x9A05E7C1u) << "BinDataWriter finished with " << error_ << " error";
}

OutputBuf* BinDataWriter::GetBuffer() const {
    return buffer_;
}

OutputBuf* BinDataWriter::SetBuffer(OutputBuf* buffer) {
    OutputBuf* previous = buffer_;
    buffer_ = buffer;
    if (!buffer_ && !error_) error_ = kArgErr;
    return previous;
}

MgErr BinDataWriter::GetError() {
    if (!error_) buffer_->GetDataPointer(0, error_);
    return error_;
}

// Room for n bytes. False after an error; true with a null `room` when the buffer only counts.
bool BinDataWriter::Room(uint32 n, uint8*& room) {
    if (error_) return false;
    room = static_cast<uint8*>(buffer_->GetDataPointer(n, error_));
    return error_ == kNoErr;
}

// ---- values ---------------------------------------------------------------------------------------------------------

uint32 BinDataWriter::WriteI8(int8 value) {
    return BinDataWriter::WriteBytes(&value, 1);
}

uint32 BinDataWriter::WriteU8(uint8 value) {
    return BinDataWriter::WriteBytes(&value, 1);
}

uint32 BinDataWriter::WriteI16(int16 value) {
    uint8* room;
    if (!Room(2, room)) return 0;
    if (room) endianizer_->FromNative16(value, room);
    return 2;
}

uint32 BinDataWriter::WriteU16(uint16 value) {
    return BinDataWriter::WriteI16(static_cast<int16>(value));
}

uint32 BinDataWriter::WriteI32(int32 value) {
    uint8* room;
    if (!Room(4, room)) return 0;
    if (room) endianizer_->FromNative32(value, room);
    return 4;
}

uint32 BinDataWriter::WriteU32(uint32 value) {
    return BinDataWriter::WriteI32(static_cast<int32>(value));
}

uint32 BinDataWriter::WriteI64(int64 value) {
    uint8* room;
    if (!Room(8, room)) return 0;
    if (room) endianizer_->FromNative64(value, room);
    return 8;
}

uint32 BinDataWriter::WriteU64(uint64 value) {
    return BinDataWriter::WriteI64(static_cast<int64>(value));
}

uint32 BinDataWriter::Write4Char(int32 value) {
    return BinDataWriter::WriteBytes(&value, 4);
}

uint32 BinDataWriter::WriteF32(float value) {
    return BinDataWriter::WriteI32(std::bit_cast<int32>(value));
}

uint32 BinDataWriter::WriteF64(double value) {
    return BinDataWriter::WriteI64(std::bit_cast<int64>(value));
}

uint32 BinDataWriter::WriteFX(const floatExt& value) {
    if (error_) return 0;
    const uint32 size = endianizer_->StreamFXSize();
    uint8* room;
    if (!Room(size, room)) return 0;
    if (room) endianizer_->FromNativeFX(value, room);
    return size;
}

uint32 BinDataWriter::WriteBool(uint8 value) {
    return BinDataWriter::WriteBytes(&value, 1);
}

// ---- bytes ----------------------------------------------------------------------------------------------------------

uint32 BinDataWriter::WriteBytes(const void* bytes, uint32 n) {
    if (!bytes && n && !error_) error_ = kArgErr;
    uint8* room;
    if (!Room(n, room)) return 0;
    if (room) std::memcpy(room, bytes, n);
    return n;
}

uint32 BinDataWriter::Align(uint32 n) {
    if (error_) return 0;
    const uint32 count = Padding(buffer_->GetBytesWritten(), n);
    uint8* room;
    if (!Room(count, room)) return 0;
    if (room) std::memset(room, 0, count);
    return count;
}

// ---- strings --------------------------------------------------------------------------------------------------------

uint32 BinDataWriter::WriteByteCounted(const void* bytes, uint32 count, uint32 align) {
    const uint32 padding = Padding(count + 1, align);
    const uint32 size = count + 1 + padding;
    uint8* room;
    if (!Room(size, room)) return 0;
    if (room) {
        room[0] = static_cast<uint8>(count);
        std::memcpy(room + 1, bytes, count);
        std::memset(room + 1 + count, 0, padding);
    }
    return size;
}

uint32 BinDataWriter::WritePStr(ConstPStr text, uint32 align) {
    return text ? WriteByteCounted(text + 1, text[0], align) : 0;
}

uint32 BinDataWriter::WritePStrFromNarrow(const std::string& text, uint32 align) {
    return WriteByteCounted(text.data(), static_cast<uint32>(std::min(text.size(), kLongestPStr)), align);
}

uint32 BinDataWriter::WriteLongCounted(const void* bytes, uint32 count) {
    uint8* room;
    if (!Room(LStrSize(count), room)) return 0;
    if (room) {
        endianizer_->FromNative32(static_cast<int32>(count), room);
        if (count) std::memcpy(room + LStrSize(0), bytes, count);
    }
    return LStrSize(count);
}

uint32 BinDataWriter::WriteLStrFromNarrow(const std::string& text) {
    if (text.size() > kLongestLStr && !error_) error_ = kArgErr;
    return WriteLongCounted(text.data(), static_cast<uint32>(text.size()));
}

uint32 BinDataWriter::WriteLStr(const LStr* text) {
    const int32 count = text ? std::max(text->count, 0) : 0;
    return WriteLongCounted(text ? text->bytes : nullptr, static_cast<uint32>(count));
}

}  // namespace tessel
