#include "base/Compiler.h"
#include "diagnostics/NumberText.h"
#include "platform/Debugger.h"
#include "platform/MemoryRead.h"
#include "platform/Process.h"
#include <tessel/diagnostics/DebugOutput.h>
#include <tessel/diagnostics/DebugStream.h>

#include <atomic>
#include <cstdio>
#include <cstring>

namespace tessel {
namespace {

constexpr int kMostNestedReports = 8;  // a handler whose own work is reported, and so on
constexpr int kBytesPerLine = 16;
constexpr size_t kMessageSize = 1024;

std::atomic<DebugOutputHandler> installedHandler{nullptr};
std::atomic<int32> eventCounts[kNumDebugLevels];
volatile int32 stopHereResult = 0;
TESSEL_FAST_THREAD_LOCAL int nestedReports = 0;

struct NestedReport {
    NestedReport() { ++nestedReports; }
    ~NestedReport() { --nestedReports; }
};

bool IsLevel(int32 level) {
    return level >= 0 && level < kNumDebugLevels;
}
CStr OrEmpty(CStr text) {
    return text ? text : "";
}

void DefaultHandler(CStr file, int32 line, int32 level, uint32 siteCode, CStr text) {
    DebugOutputIncrementEventCount(level);
    if (level == kDebugError || level == kDebugFatal) {
        char message[kMessageSize + 1];  // and the end of the line
        std::snprintf(message, kMessageSize, "ERR %lx: %s(%d): %s", static_cast<unsigned long>(siteCode), file, line,
                      text);
        const size_t length = std::strlen(message);
        if (message[length - 1] != '\n') std::strcpy(message + length, "\n");
        DebugOutputCoreBreak(message);
    }
    if (level == kDebugFatal) DebugOutputCoreDie();
}

// Reads the bytes of a line; those that cannot be read are left out of `readable`.
void ReadLine(const uint8* from, uint8 (&bytes)[kBytesPerLine], bool (&readable)[kBytesPerLine]) {
    if (platform::ReadMemory(from, bytes, kBytesPerLine) == kBytesPerLine) {
        for (bool& each : readable) each = true;
        return;
    }
    for (int i = 0; i < kBytesPerLine; ++i) readable[i] = platform::ReadMemory(from + i, bytes + i, 1) == 1;
}

void DumpLine(const uint8* from) {
    uint8 bytes[kBytesPerLine];
    bool readable[kBytesPerLine];
    ReadLine(from, bytes, readable);

    char address[kAddressDigits + 1];
    char* const addressEnd = address + kAddressDigits;
    *addressEnd = 0;
    char hex[3 * kBytesPerLine + 1];
    char text[kBytesPerLine + 1];
    for (int i = 0; i < kBytesPerLine; ++i) {
        char* const digits = hex + 3 * i;
        digits[0] = readable[i] ? kUpperHexDigits[bytes[i] >> 4] : '?';
        digits[1] = readable[i] ? kUpperHexDigits[bytes[i] & 15] : '?';
        digits[2] = ' ';
        text[i] = readable[i] && bytes[i] >= 32 && bytes[i] <= 126 ? static_cast<char>(bytes[i]) : '.';
    }
    hex[3 * kBytesPerLine] = text[kBytesPerLine] = 0;
    TESSEL_REPORT(kDebugTrace, 0x6E1F03B2u)
        << HexBackwards(addressEnd, reinterpret_cast<uintptr_t>(from), 8, kUpperHexDigits) << "  " << hex << "  "
        << text;
}

}  // namespace
}  // namespace tessel

using namespace tessel;

DebugOutputHandler DebugOutputSetHandler(DebugOutputHandler handler) {
    installedHandler.store(handler);
    return handler;
}

DebugOutputHandler DebugOutputGetHandler(void) {
    return installedHandler.load();
}

// A handler that reports, which calls the handler again, would never end: what is nested too deep takes the default
// behaviour, which reports nothing.
void DebugOutputCallHandler(CStr file, int32 line, CStr identifier, int32 level, uint32 siteCode, CStr text) {
    NestedReport nested;
    DebugOutputHandler handler = installedHandler.load(std::memory_order_acquire);
    if (handler && nestedReports <= kMostNestedReports)
        handler(OrEmpty(file), line, OrEmpty(identifier), level, siteCode, OrEmpty(text));
    else
        DefaultHandler(OrEmpty(file), line, level, siteCode, OrEmpty(text));
}

int32 DebugOutputGetNumEvents(int32 level) {
    return IsLevel(level) ? eventCounts[level].load() : 0;
}

void DebugOutputResetNumEvents(void) {
    for (auto& count : eventCounts) count.store(0);
}

void DebugOutputIncrementEventCount(int32 level) {
    if (IsLevel(level)) eventCounts[level].fetch_add(1, std::memory_order_relaxed);
}

void DebugOutputCoreBreak(CStr text) {
    if (text) platform::DebuggerOutput(text);
    if (platform::DebuggerAttached()) platform::DebuggerBreak();
}

void DebugOutputCoreDie(void) {
    platform::ProcessExit(1);
}

int32 StopHere(CStr text) {
    DebugOutputCoreBreak(text);
    TESSEL_REPORT(kDebugInfo, 0x2C77A9D4u) << "StopHere: " << text;
    return stopHereResult;
}

void DumpSomeMemory(const void* memory, int32 length) {
    const auto* from = static_cast<const uint8*>(memory);
    for (int32 done = 0; done < length; done += kBytesPerLine) {
        DumpLine(from + done);
        if (length - done <= kBytesPerLine) break;
    }
}

bool VerifySingleFormatSpecifier(CStr format) {
    int count = 0;
    for (CStr c = format; c && *c; ++c) {
        if (*c != '%') continue;
        if (c[1] == '%')
            ++c;
        else
            ++count;
    }
    return count == 1;
}
