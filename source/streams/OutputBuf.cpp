// Output into a block, into growing handles, and into nothing but a count.
#include <tessel/diagnostics/DebugStream.h>
#include <tessel/memory/MemoryManager.h>
#include <tessel/streams/OutputBuf.h>

#include <algorithm>
#include <new>

namespace tessel {
namespace {

constexpr uint32 kDefaultCapacity = 4096;
constexpr uint32 kLeastGrowth = 256;
constexpr uint32 kMostGrowth = 4096;
constexpr uint32 kTextOffset = LStrSize(0);  // the count of an LStr

UHandle AsHandle(LStrHandle text) {
    return reinterpret_cast<UHandle>(text);
}

// A new handle of `capacity` bytes and `header` more at its start.
UHandle NewHandle(uint32 header, uint32 capacity, MgErr& error) {
    UHandle handle = capacity <= UINT32_MAX - header ? DSNewHandle(capacity + header) : nullptr;
    if (!handle) error = kMemFullErr;
    return handle;
}

// Sees to it that n more bytes fit behind those written, in a handle with `header` bytes at its start.
MgErr Grow(UHandle handle, uint32 header, uint32 written, uint32 n, uint32& capacity) {
    const uint64 needed = uint64{written} + n;
    if (needed <= capacity) return kNoErr;
    const uint64 wanted = needed + std::clamp<uint64>(needed / 4, kLeastGrowth, kMostGrowth);
    if (wanted > UINT32_MAX - header) return kMemFullErr;
    const MgErr err = DSSetHandleSize(handle, static_cast<uint32>(wanted) + header);
    if (!err) capacity = static_cast<uint32>(wanted);
    return err;
}

}  // namespace

OutputBuf::~OutputBuf() = default;

// ---- PreflightOutputBuf ---------------------------------------------------------------------------------------------

PreflightOutputBuf::~PreflightOutputBuf() = default;

void* PreflightOutputBuf::GetDataPointer(uint32 n, MgErr& err) {
    err = kNoErr;
    count_ += n;
    return nullptr;
}

uint32 PreflightOutputBuf::GetBytesWritten() const {
    return count_;
}

// ---- StaticOutputBuf ------------------------------------------------------------------------------------------------

StaticOutputBuf::StaticOutputBuf(void* data, uint32 capacity)
    : data_(static_cast<uint8*>(data)), capacity_(data ? capacity : 0) {
}

StaticOutputBuf::~StaticOutputBuf() {
    if (error_) TESSEL_REPORT(kDebugInfo, 0x2B90D5F4u) << "StaticOutputBuf finished with " << error_ << " error";
}

void* StaticOutputBuf::GetDataPointer(uint32 n, MgErr& err) {
    if (!error_ && n > capacity_ - written_) error_ = kCorruptErr;
    err = error_;
    if (error_ || n == 0) return nullptr;
    uint8* room = data_ + written_;
    written_ += n;
    return room;
}

uint32 StaticOutputBuf::GetBytesWritten() const {
    return written_;
}

// ---- HandleOutputBuf ------------------------------------------------------------------------------------------------

HandleOutputBuf::HandleOutputBuf() : HandleOutputBuf(kDefaultCapacity) {
}

HandleOutputBuf::HandleOutputBuf(uint32 initialSize)
    : handle_(NewHandle(0, initialSize, error_)), capacity_(handle_ ? initialSize : 0) {
}

HandleOutputBuf::~HandleOutputBuf() {
    if (error_) TESSEL_REPORT(kDebugInfo, 0xC7146E3Bu) << "HandleOutputBuf finished with " << error_ << " error";
    if (handle_) DSDisposeHandle(handle_);
}

void* HandleOutputBuf::GetDataPointer(uint32 n, MgErr& err) {
    if (!error_ && !handle_) error_ = kArgErr;
    if (!error_) error_ = Grow(handle_, 0, written_, n, capacity_);
    err = error_;
    if (error_ || n == 0) return nullptr;
    uint8* room = *handle_ + written_;
    written_ += n;
    return room;
}

uint32 HandleOutputBuf::GetBytesWritten() const {
    return written_;
}

UHandle HandleOutputBuf::GetHandle(int32 release) {
    if (!error_ && !handle_) error_ = kArgErr;
    if (!error_) error_ = DSSetHandleSize(handle_, written_);
    if (error_) return nullptr;
    capacity_ = written_;
    UHandle handle = handle_;
    if (release) handle_ = nullptr;
    return handle;
}

// ---- LStrOutputBuf --------------------------------------------------------------------------------------------------

LStrOutputBuf::LStrOutputBuf() : LStrOutputBuf(kDefaultCapacity) {
}

LStrOutputBuf::LStrOutputBuf(uint32 initialCapacity)
    : text_(reinterpret_cast<LStrHandle>(NewHandle(kTextOffset, initialCapacity, error_))),
      capacity_(text_ ? initialCapacity : 0) {
}

LStrOutputBuf::LStrOutputBuf(LStrHandle text, uint32 capacity) : text_(text), capacity_(capacity) {
    if (!text_) {
        if (capacity_ == 0) capacity_ = kDefaultCapacity;
        text_ = reinterpret_cast<LStrHandle>(NewHandle(kTextOffset, capacity_, error_));
    } else if (capacity_ == 0) {
        capacity_ = std::max(DSGetHandleSize(AsHandle(text_)), kTextOffset) - kTextOffset;
    } else if (capacity_ > UINT32_MAX - kTextOffset) {
        error_ = kMemFullErr;
    } else {
        error_ = DSSetHandleSize(AsHandle(text_), capacity_ + kTextOffset);
    }
}

LStrOutputBuf::~LStrOutputBuf() {
    if (error_) TESSEL_REPORT(kDebugInfo, 0x61F2A98Du) << "LStrOutputBuf finished with " << error_ << " error";
    if (text_) DSDisposeHandle(AsHandle(text_));
}

void* LStrOutputBuf::GetDataPointer(uint32 n, MgErr& err) {
    if (!error_ && !text_) error_ = kArgErr;
    if (!error_) error_ = Grow(AsHandle(text_), kTextOffset, written_, n, capacity_);
    err = error_;
    if (error_ || n == 0) return nullptr;
    uint8* room = (*text_)->bytes + written_;
    written_ += n;
    return room;
}

uint32 LStrOutputBuf::GetBytesWritten() const {
    return written_;
}

LStrHandle LStrOutputBuf::GetHandle(int32 release) {
    if (!error_ && !text_) error_ = kArgErr;
    if (!error_) error_ = DSSetHandleSize(AsHandle(text_), written_ + kTextOffset);
    if (error_) return nullptr;
    (*text_)->count = static_cast<int32>(written_);
    capacity_ = written_;
    LStrHandle text = text_;
    if (release) text_ = nullptr;
    return text;
}

// ---- making them ----------------------------------------------------------------------------------------------------

PreflightOutputBuf* CreatePreflightOutputBuf() {
    return new (std::nothrow) PreflightOutputBuf;
}

StaticOutputBuf* CreateStaticOutputBuf(void* data, uint32 capacity) {
    return new (std::nothrow) StaticOutputBuf(data, capacity);
}

LStrOutputBuf* CreateLStrOutputBuf(uint32 initialCapacity) {
    return new (std::nothrow) LStrOutputBuf(initialCapacity);
}

}  // namespace tessel
