// The escapes and the decimal point marks of the format language.
#include <tessel/strings/StringCStr.h>
#include <tessel/strings/StringFmtScan.h>

namespace {

constexpr int32 kNotHex = -1;

int32 HexDigit(char c) {
    if (c >= '0' && c <= '9') return c - '0';
    if (c >= 'A' && c <= 'F') return c - 'A' + 10;
    return kNotHex;
}

// What a backslash and this byte stand for when it is no hexadecimal digit.
uint8 EscapedByte(char c) {
    switch (c) {
        case 'b':
            return 8;
        case 'f':
            return 12;
        case 'n':
            return 10;
        case 'r':
            return 13;
        case 's':
            return ' ';
        case 't':
            return 9;
        default:
            return static_cast<uint8>(c);
    }
}

}  // namespace

uint8 ScanForBackslash(CStr* cursor, CStr end) {
    if (!cursor) return 0;
    CStr p = *cursor;
    if (!p || p >= end) return 0;
    const char first = *p++;
    if (first != '\\' || p == end) {
        *cursor = p;
        return static_cast<uint8>(first);
    }
    const char escaped = *p++;
    int32 value = HexDigit(escaped);
    if (value == kNotHex) {
        value = EscapedByte(escaped);
    } else if (p < end && HexDigit(*p) != kNotHex) {
        value = value * 16 + HexDigit(*p++);
    }
    *cursor = p;
    return static_cast<uint8>(value);
}

bool ScanForFormatDecPoint(CStr* cursor, CStr end, uint8* decimalPoint) {
    if (!cursor || !decimalPoint) return false;
    CStr p = *cursor;
    if (!p || p >= end || *p == '[' || *p == '%') return false;
    if (*p == ';') {
        *cursor = p + 1;
        *decimalPoint = StrGetDecimalPoint();
        return true;
    }
    const uint8 c = ScanForBackslash(&p, end);
    if (!IsPunct(c) || p >= end || *p != ';') return false;
    *cursor = p + 1;
    *decimalPoint = c;
    return true;
}
