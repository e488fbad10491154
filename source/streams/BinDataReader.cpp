// ReadPath stands with the paths (paths/BinDataPaths.cpp).
#include "diagnostics/Guarded.h"
#include "streams/Padding.h"
#include "strings/HandleOps.h"
#include <tessel/streams/BinDataReader.h>

#include <cstring>

namespace tessel {
namespace {

// A string of at most so many bytes is believed without a look at how many the buffer holds.
constexpr uint32 kPlausibleTextSize = 0x200000;

}  // namespace

BinDataReader::BinDataReader(InputBuf* buffer, const Endianizer* endianizer)
    : endianizer_(endianizer), error_(buffer && endianizer ? kNoErr : kArgErr), buffer_(buffer) {
}

BinDataReader::~BinDataReader() = default;

InputBuf* BinDataReader::GetBuffer() const {
    return buffer_;
}

void BinDataReader::SetError(MgErr err) {
    if (!error_) error_ = err;
}

MgErr BinDataReader::GetError() {
    if (!error_) buffer_->GetDataPointer(0, error_);
    return error_;
}

// The next n bytes. Null for none, and after an error.
const uint8* BinDataReader::Take(uint32 n) {
    return error_ ? nullptr : static_cast<const uint8*>(buffer_->GetDataPointer(n, error_));
}

// ---- values ---------------------------------------------------------------------------------------------------------

int8 BinDataReader::ReadI8() {
    return static_cast<int8>(BinDataReader::ReadU8());
}

uint8 BinDataReader::ReadU8() {
    const uint8* bytes = Take(1);
    return bytes ? *bytes : uint8{0};
}

int16 BinDataReader::ReadI16() {
    const uint8* bytes = Take(2);
    return bytes ? endianizer_->ToNative16(bytes) : int16{0};
}

uint16 BinDataReader::ReadU16() {
    return static_cast<uint16>(BinDataReader::ReadI16());
}

int32 BinDataReader::ReadI32() {
    const uint8* bytes = Take(4);
    return bytes ? endianizer_->ToNative32(bytes) : 0;
}

uint32 BinDataReader::ReadU32() {
    return static_cast<uint32>(BinDataReader::ReadI32());
}

int64 BinDataReader::ReadI64() {
    int64 value = 0;
    if (const uint8* bytes = Take(8)) endianizer_->CopyToNative64(bytes, &value);
    return value;
}

uint64 BinDataReader::ReadU64() {
    return static_cast<uint64>(BinDataReader::ReadI64());
}

int32 BinDataReader::Read4Char() {
    int32 value = 0;
    if (const uint8* bytes = Take(4)) std::memcpy(&value, bytes, sizeof value);
    return value;
}

float BinDataReader::ReadF32() {
    float value = 0;
    if (const uint8* bytes = Take(4)) endianizer_->CopyToNative32(bytes, &value);
    return value;
}

double BinDataReader::ReadF64() {
    double value = 0;
    if (const uint8* bytes = Take(8)) endianizer_->CopyToNative64(bytes, &value);
    return value;
}

floatExt BinDataReader::ReadFX() {
    const uint8* bytes = error_ ? nullptr : Take(endianizer_->StreamFXSize());
    return bytes ? endianizer_->ToNativeFX(bytes) : floatExt{};
}

uint8 BinDataReader::ReadBool() {
    return BinDataReader::ReadU8();
}

// ---- bytes ----------------------------------------------------------------------------------------------------------

void BinDataReader::ReadBytes(void* destination, uint32 n) {
    const uint8* bytes = Take(n);
    if (!destination || n == 0) return;
    if (bytes)
        std::memcpy(destination, bytes, n);
    else
        std::memset(destination, 0, n);
}

void BinDataReader::Skip(uint32 n) {
    Take(n);
}

void BinDataReader::Align(uint32 n) {
    if (!error_) Take(Padding(buffer_->GetBytesRead(), n));
}

// ---- strings --------------------------------------------------------------------------------------------------------

void BinDataReader::ReadPStr(PStr out, uint32 align) {
    const uint8 length = BinDataReader::ReadU8();
    const uint8* bytes = Take(length);
    out[0] = bytes ? length : uint8{0};
    if (bytes) std::memcpy(out + 1, bytes, length);
    Take(Padding(length + 1u, align));
}

void BinDataReader::ReadPStrAsNarrow(std::string& out, uint32 align) {
    Str255 text;
    BinDataReader::ReadPStr(text, align);
    Store(out, text + 1, text[0]);
}

// Readers throw nothing: memory that is short becomes their error.
void BinDataReader::Store(std::string& out, const uint8* bytes, uint32 count) {
    out.clear();
    if (!bytes) return;
    SetError(Guarded([&] {
        out.assign(reinterpret_cast<const char*>(bytes), count);
        return kNoErr;
    }));
}

// Reads the count of an LStr and checks that it can be true. False for an empty string, and on an error.
bool BinDataReader::TakeLStrCount(uint32& count) {
    const int32 stored = BinDataReader::ReadI32();
    count = static_cast<uint32>(stored);
    if (error_ || stored == 0) return false;
    const bool plausible =
        stored > 0 && (count <= kPlausibleTextSize || count <= buffer_->GetSize() - buffer_->GetBytesRead());
    if (!plausible) SetError(kLengthErr);
    return plausible;
}

LStrHandle BinDataReader::ReadLStr() {
    uint32 count;
    if (!TakeLStrCount(count)) return nullptr;
    const uint8* bytes = Take(count);
    if (!bytes) return nullptr;
    LStrHandle text = nullptr;
    if (const MgErr err = MakeLStr(&text, count)) {
        SetError(err);
        return nullptr;
    }
    std::memcpy((*text)->bytes, bytes, count);
    return text;
}

void BinDataReader::ReadLStrAsNarrow(std::string& out) {
    uint32 count;
    const uint8* bytes = TakeLStrCount(count) ? Take(count) : nullptr;
    Store(out, bytes, count);
}

}  // namespace tessel
