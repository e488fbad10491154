#include "memory/GuardBytes.h"

#include "memory/HandleBlock.h"
#include <tessel/diagnostics/DebugStream.h>
#include <tessel/memory/MemoryManager.h>

#include <cstring>

namespace tessel {

std::atomic<uint32> guardOptions[kGuardKinds];

namespace {

enum Failure { kUnderrun = 0, kOverrun = 1, kMisuse = 2 };
constexpr int kDigits = 3;  // of the pattern's version
constexpr int kTail = 5;

void ReportFailure(const void* data, int32 kind, const char* version) {
    constexpr char kDetected[] = "Memory corruption detected:  buffer ";
    switch (kind) {
        case kUnderrun:
            TESSEL_REPORT(kDebugError, 0x4F1C82ABu) << kDetected << "underrun at pointer " << DbgFmtPtr(data);
            break;
        case kOverrun:
            TESSEL_REPORT(kDebugError, 0x35D7E960u) << kDetected << "overrun at pointer " << DbgFmtPtr(data);
            break;
        case kMisuse:
            TESSEL_REPORT(kDebugError, 0x7E02B5C4u) << "Memory misuse detected:  buffer at " << DbgFmtPtr(data)
                                                    << " was passed from Orvane version " << version;
            break;
        default:
            TESSEL_REPORT(kDebugError, 0x18A96F3Du) << "Unknown guard byte violation";
    }
}

std::atomic<GuardByteCheckFailedProc> failedProc{ReportFailure};

bool Fail(const void* data, Failure failure, const char* version) {
    if (GuardByteCheckFailedProc proc = failedProc.load())
        proc(data, failure, version);
    else
        TESSEL_REPORT(kDebugError, 0x6A3308F1u) << "No guard byte check failed reporting proc installed!";
    return false;
}

}  // namespace

bool IsGuard(const char* guard) {
    return std::memcmp(guard, kGuardPattern, kDigits) == 0 &&
           std::memcmp(guard + kTail, kGuardPattern + kTail, kGuardSize - kTail) == 0;
}

void WriteGuards(void* data, size_t size) {
    std::memcpy(static_cast<char*>(data) - kGuardSize, kGuardPattern, kGuardSize);
    std::memcpy(static_cast<char*>(data) + size, kGuardPattern, kGuardSize);
}

bool CheckGuards(const void* data, GuardKind kind) {
    if (!data) {
        TESSEL_REPORT(kDebugError, 0x2DC5417Eu) << "NULL ptr passed to CheckGuards";
        return false;
    }
    const char* leading = static_cast<const char*>(data) - kGuardSize;
    if (!IsGuard(leading)) return Fail(data, kUnderrun, nullptr);
    const uint32 size = kind == GuardKind::kHandle ? HandleLayout().SizeOf(data) : *GuardedPtrSize(data);
    const char* trailing = static_cast<const char*>(data) + size;
    if (!IsGuard(trailing)) return Fail(data, kOverrun, nullptr);
    char version[kTail - kDigits + 1] = {leading[kDigits], leading[kDigits + 1], 0};
    if (std::memcmp(version, trailing + kDigits, kTail - kDigits) != 0) return Fail(data, kUnderrun, nullptr);
    if (std::memcmp(version, kGuardPattern + kDigits, kTail - kDigits) != 0) return Fail(data, kMisuse, version);
    return true;
}

}  // namespace tessel

GuardByteCheckFailedProc SetGuardByteCheckFailedProc(GuardByteCheckFailedProc proc) {
    return tessel::failedProc.exchange(proc);
}
