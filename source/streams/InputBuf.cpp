// Input from a block of memory and from a text handle.
#include <tessel/diagnostics/DebugStream.h>
#include <tessel/memory/MemoryManager.h>
#include <tessel/streams/InputBuf.h>

#include <algorithm>
#include <new>

namespace tessel {
namespace {

// The rules of GetDataPointer, once for both kinds of buffer. `data` holds `size` bytes, which may be null when 0.
const void* NextBytes(const uint8* data, uint32 size, uint32& position, MgErr& error, uint32 n, MgErr& err,
                      uint32* available, int32 peek) {
    err = error;
    if (available) *available = 0;
    if (error || n == 0) return nullptr;
    const uint32 remaining = size - position;
    if (n > remaining && !available) {
        err = error = kCorruptErr;
        return nullptr;
    }
    const uint32 count = std::min(n, remaining);
    if (available) *available = count;
    const uint8* bytes = count ? data + position : nullptr;
    if (!peek) position += count;
    return bytes;
}

// Bytes of text that the handle really holds, whatever its count says.
uint32 TextSize(LStrHandle text) {
    const uint32 handleSize = DSGetHandleSize(reinterpret_cast<UHandle>(text));
    if (handleSize < LStrSize(0) || (*text)->count < 0) return 0;
    return std::min(static_cast<uint32>((*text)->count), handleSize - LStrSize(0));
}

}  // namespace

InputBuf::~InputBuf() = default;

// ---- MemInputBuf ----------------------------------------------------------------------------------------------------

MemInputBuf::MemInputBuf(const void* data, uint32 size)
    : data_(size ? static_cast<const uint8*>(data) : nullptr), size_(data ? size : 0) {
}

MemInputBuf::~MemInputBuf() {
    if (error_) TESSEL_REPORT(kDebugInfo, 0x5D21C0A7u) << "MemInputBuf finished with " << error_ << " error";
}

const void* MemInputBuf::GetDataPointer(uint32 n, MgErr& err, uint32* available, int32 peek) {
    return NextBytes(data_, size_, position_, error_, n, err, available, peek);
}

uint32 MemInputBuf::GetBytesRead() const {
    return position_;
}

uint32 MemInputBuf::GetSize() const {
    return error_ ? 0 : size_;
}

// ---- LStrInputBuf ---------------------------------------------------------------------------------------------------

LStrInputBuf::LStrInputBuf(LStrHandle& text)
    : text_(text), error_(text ? kNoErr : kArgErr), size_(text ? TextSize(text) : 0) {
    text = nullptr;
}

LStrInputBuf::~LStrInputBuf() {
    if (error_) TESSEL_REPORT(kDebugInfo, 0x8F3E6612u) << "LStrInputBuf finished with " << error_ << " error";
    if (text_) DSDisposeHandle(reinterpret_cast<UHandle>(text_));
}

const void* LStrInputBuf::GetDataPointer(uint32 n, MgErr& err, uint32* available, int32 peek) {
    return NextBytes(text_ ? (*text_)->bytes : nullptr, size_, position_, error_, n, err, available, peek);
}

uint32 LStrInputBuf::GetBytesRead() const {
    return position_;
}

uint32 LStrInputBuf::GetSize() const {
    return error_ ? 0 : size_;
}

LStrHandle LStrInputBuf::ReleaseOwnership() {
    LStrHandle text = text_;
    text_ = nullptr;
    if (!error_) error_ = kArgErr;
    return text;
}

// ---- making them ----------------------------------------------------------------------------------------------------

MemInputBuf* CreateMemInputBuf(const void* data, uint32 size) {
    return new (std::nothrow) MemInputBuf(data, size);
}

LStrInputBuf* CreateLStrInputBuf(LStrHandle& text) {
    return new (std::nothrow) LStrInputBuf(text);
}

}  // namespace tessel
