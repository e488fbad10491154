// Escapes and decimal-point specifiers: the scanners stay inside the text, and printing decodes as they do.
#include <tessel/diagnostics/DebugOutput.h>
#include <tessel/strings/StringCStr.h>
#include <tessel/strings/StringFmtPrint.h>
#include <tessel/strings/StringFmtScan.h>

#include <algorithm>
#include <cstdlib>
#include <string>

namespace {

std::string Decoded(const std::string& text) {
    std::string decoded;
    CStr cursor = text.data();
    CStr end = cursor + text.size();
    while (cursor < end) {
        CStr before = cursor;
        const uint8 byte = ScanForBackslash(&cursor, end);
        if (cursor <= before || cursor > end || cursor > before + 3) std::abort();
        if (byte == '\n' && *before == '\\') decoded += '\r';
        decoded += static_cast<char>(byte);
    }
    return decoded;
}

void CheckDecimalPoints(const std::string& text) {
    CStr end = text.data() + text.size();
    for (CStr start = text.data(); start <= end; ++start) {
        CStr cursor = start;
        uint8 decimalPoint = 0;
        if (ScanForFormatDecPoint(&cursor, end, &decimalPoint)) {
            if (cursor > end || cursor[-1] != ';' || !IsPunct(decimalPoint)) std::abort();
        } else if (cursor != start || decimalPoint != 0) {
            std::abort();
        }
    }
}

int32 Print(char* dst, int32 size, const char* format, int32 length, ...) {
    va_list none;
    va_start(none, length);
    const int32 written = SPrintfv(dst, size, format, length, none);
    va_end(none);
    return written;
}

}  // namespace

extern "C" int LLVMFuzzerTestOneInput(const uint8* data, size_t length) {
    std::string text(reinterpret_cast<const char*>(data), length);
    CheckDecimalPoints(text);
    std::replace(text.begin(), text.end(), '%', '/');
    const std::string expected = Decoded(text);
    std::string printed(expected.size() + 1, '\0');
    const int32 written =
        Print(printed.data(), static_cast<int32>(printed.size()), text.data(), static_cast<int32>(text.size()));
    printed.resize(static_cast<size_t>(written));
    if (printed != expected) std::abort();
    return 0;
}
