#include "base/Compiler.h"
#include "diagnostics/NumberText.h"
#include "diagnostics/Service.h"
#include "platform/Thread.h"
#include <tessel/diagnostics/DebugStream.h>

#include <algorithm>
#include <atomic>
#include <charconv>
#include <cstdlib>

namespace tessel {
namespace {

constexpr int kPoolSlots = 16;
constexpr size_t kTextSize = 256;

struct Slot {
    uint32 inUse;
    char text[kTextSize];
};
static_assert(sizeof(Slot) == 260);

Slot pool[kPoolSlots];
std::atomic<bool> poolIsReady{false};
std::atomic<int32> failedCheckouts{0};

// For a thread that can get no memory, so it is there from the start. One stream of the thread has it, the others go
// without text.
TESSEL_FAST_THREAD_LOCAL Slot lastResort;
char noText[1];

bool Claim(Slot& slot) {
    std::atomic_ref<uint32> inUse(slot.inUse);
    uint32 expected = 0;
    return inUse.load(std::memory_order_relaxed) == 0 &&
           inUse.compare_exchange_strong(expected, 1, std::memory_order_acquire, std::memory_order_relaxed);
}

Slot* ClaimFromPool() {
    if (!poolIsReady.load(std::memory_order_acquire)) return nullptr;
    for (Slot& slot : pool)
        if (Claim(slot)) return &slot;
    failedCheckouts.fetch_add(1, std::memory_order_relaxed);
    return nullptr;
}

void AppendUnsigned(DebugStream& stream, uint64 value) {
    char text[kMaxIntegerText];
    char* const end = text + sizeof text;
    stream.Append(DecimalBackwards(end, value), end);
}

void AppendSigned(DebugStream& stream, int64 value) {
    char text[kMaxIntegerText];
    char* const end = text + sizeof text;
    const auto magnitude = static_cast<uint64>(value);
    char* begin = DecimalBackwards(end, value < 0 ? 0 - magnitude : magnitude);
    if (value < 0) *--begin = '-';
    stream.Append(begin, end);
}

void AppendHex(DebugStream& stream, uint64 value, int minDigits) {
    char text[16];
    char* const end = text + sizeof text;
    stream.Append("0x");
    stream.Append(HexBackwards(end, value, minDigits, kLowerHexDigits), end);
}

template <class Complex>
void AppendComplex(DebugStream& stream, const Complex& value) {
    stream.Append('(');
    ToDebugStream(stream, value.re);
    stream.Append(", ");
    ToDebugStream(stream, value.im);
    stream.Append(')');
}

}  // namespace

MgErr DebugStreamStart() {
    for (Slot& slot : pool) std::atomic_ref<uint32>(slot.inUse).store(0);
    failedCheckouts = 0;
    poolIsReady = true;
    return kNoErr;
}

MgErr DebugStreamStop() {
    poolIsReady = false;
    const int32 failed = failedCheckouts;
    if (failed != 0)
        TESSEL_REPORT(kDebugWarning, 0x51D2E80Fu)
            << "DebugStream_Service: " << failed << " failed checkouts forced a private buffer.";
    return kNoErr;
}

DebugStream::DebugStream(CStr file, int32 line, CStr identifier, _DebugOutputLevel level) noexcept
    : file_(file), line_(line), identifier_(identifier), level_(level), inUse_(nullptr) {
    if (Slot* slot = ClaimFromPool()) {
        text_ = slot->text;
        inUse_ = &slot->inUse;
    } else if (void* buffer = std::malloc(kTextSize)) {
        text_ = static_cast<char*>(buffer);
    } else if (Claim(lastResort)) {
        text_ = lastResort.text;
        inUse_ = &lastResort.inUse;
    } else {
        text_ = write_ = last_ = noText;
        return;
    }
    write_ = text_;
    last_ = text_ + kTextSize - 1;
    *write_ = 0;
}

void DebugStream::Append(const char* begin, const char* end) noexcept {
    if (begin >= end || write_ == last_) return;
    const auto count = std::min(end - begin, last_ - write_);
    std::memcpy(write_, begin, static_cast<size_t>(count));
    write_ += count;
    *write_ = 0;
}

void DebugStream::Append(CStr text) noexcept {
    if (text) Append(text, text + strnlen(text, kTextSize));
}

void DebugStream::Process() {
    DebugOutputCallHandler(file_, line_, identifier_, level_, siteCode_, Text());
    GiveBack();
}

void DebugStream::GiveBack() noexcept {
    if (inUse_)
        std::atomic_ref<uint32>(*inUse_).store(0, std::memory_order_release);
    else if (text_ != noText)
        std::free(text_);
    inUse_ = nullptr;
    text_ = write_ = last_ = noText;
}

DebugReport::DebugReport(CStr file, int32 line, CStr identifier, _DebugOutputLevel level, uint32 siteCode)
    : stream_(file, line, identifier, level) {
    stream_.SetSiteCode(siteCode);
}

DebugReport::~DebugReport() {
    stream_.Process();
}

void ToDebugStream(DebugStream& stream, char byte) {
    stream.Append(byte);
}
void ToDebugStream(DebugStream& stream, CStr text) {
    stream.Append(text);
}
void ToDebugStream(DebugStream& stream, std::string_view text) {
    stream.Append(text.data(), text.data() + text.size());
}

void ToDebugStream(DebugStream& stream, const LStr* text) {
    if (!text || text->count <= 0) return;
    const auto* bytes = reinterpret_cast<const char*>(text->bytes);
    stream.Append(bytes, bytes + text->count);
}
void ToDebugStream(DebugStream& stream, LStrHandle text) {
    if (text) ToDebugStream(stream, static_cast<const LStr*>(*text));
}
void ToDebugStream(DebugStream& stream, const LStrHandle* text) {
    if (text) ToDebugStream(stream, *text);
}

void ToDebugStream(DebugStream& stream, short value) {
    AppendSigned(stream, value);
}
void ToDebugStream(DebugStream& stream, int value) {
    AppendSigned(stream, value);
}
void ToDebugStream(DebugStream& stream, long value) {
    AppendSigned(stream, value);
}
void ToDebugStream(DebugStream& stream, long long value) {
    AppendSigned(stream, value);
}
void ToDebugStream(DebugStream& stream, unsigned char value) {
    AppendUnsigned(stream, value);
}
void ToDebugStream(DebugStream& stream, unsigned short value) {
    AppendUnsigned(stream, value);
}
void ToDebugStream(DebugStream& stream, unsigned int value) {
    AppendUnsigned(stream, value);
}
void ToDebugStream(DebugStream& stream, unsigned long value) {
    AppendUnsigned(stream, value);
}
void ToDebugStream(DebugStream& stream, unsigned long long value) {
    AppendUnsigned(stream, value);
}

void ToDebugStream(DebugStream& stream, float value) {
    ToDebugStream(stream, static_cast<double>(value));
}
void ToDebugStream(DebugStream& stream, double value) {
    char text[352];  // the largest double has 309 digits before the point
    stream.Append(text, std::to_chars(text, text + sizeof text, value, std::chars_format::fixed, 6).ptr);
}

void ToDebugStream(DebugStream& stream, const cmplx64& value) {
    AppendComplex(stream, value);
}
void ToDebugStream(DebugStream& stream, const cmplx128& value) {
    AppendComplex(stream, value);
}

void ToDebugStream(DebugStream& stream, void (*function)()) {
    stream.Append(AddressText(reinterpret_cast<const void*>(function)).Text());
}

void DbgFmtCStr::ToDebugStream(DebugStream& stream) const {
    stream.Append(text_);
}

void DbgFmtPStr::ToDebugStream(DebugStream& stream) const {
    if (!text_) return;
    const auto* bytes = reinterpret_cast<const char*>(text_ + 1);
    stream.Append(bytes, bytes + text_[0]);
}

void DbgFmtPtr::ToDebugStream(DebugStream& stream) const {
    AppendHex(stream, value_, 8);
}
void DbgFmtHex::ToDebugStream(DebugStream& stream) const {
    AppendHex(stream, value_, 8);
}

void DbgFmtQuadChar::ToDebugStream(DebugStream& stream) const {
    char bytes[sizeof value_];
    std::memcpy(bytes, &value_, sizeof bytes);
    for (char byte : bytes) {
        const auto code = static_cast<unsigned char>(byte);
        stream.Append(code < 32 || code == 127 ? ' ' : byte);
    }
}

DbgFmtSysThreadID::DbgFmtSysThreadID() : threadID_(platform::CurrentThreadId()) {
}
void DbgFmtSysThreadID::ToDebugStream(DebugStream& stream) const {
    AppendHex(stream, threadID_, 1);
}

DbgFmtNum::DbgFmtNum(CStr text) noexcept {
    std::snprintf(text_, sizeof text_, "%s", text ? text : "");
}
void DbgFmtNum::ToDebugStream(DebugStream& stream) const {
    stream.Append(text_);
}

}  // namespace tessel
