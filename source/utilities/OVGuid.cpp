// Class identifiers: made, written and read.
#include "platform/System.h"
#include <tessel/utilities/OVGuid.h>
#include <tessel/utilities/RandomGen.h>

#include <cstring>

static_assert(sizeof(OVGuidType) == 16 && offsetof(OVGuidType, data4) == 8);

namespace {

constexpr OVGuidType kNull = {};

constexpr int kTextLength = kOVGuidTextSize - 1;
constexpr bool IsHyphenAt(int position) {
    return position == 8 || position == 13 || position == 18 || position == 23;
}

// The 16 bytes in the order of the text.
struct TextOrder {
    uint8 bytes[16];
};

TextOrder ToTextOrder(const OVGuidType& guid) {
    TextOrder order;
    for (int i = 0; i < 4; ++i) order.bytes[i] = static_cast<uint8>(guid.data1 >> (24 - 8 * i));
    for (int i = 0; i < 2; ++i) order.bytes[4 + i] = static_cast<uint8>(guid.data2 >> (8 - 8 * i));
    for (int i = 0; i < 2; ++i) order.bytes[6 + i] = static_cast<uint8>(guid.data3 >> (8 - 8 * i));
    std::memcpy(order.bytes + 8, guid.data4, sizeof guid.data4);
    return order;
}

OVGuidType FromTextOrder(const TextOrder& order) {
    const uint8* b = order.bytes;
    OVGuidType guid;
    guid.data1 =
        static_cast<uint32>(b[0]) << 24 | static_cast<uint32>(b[1]) << 16 | static_cast<uint32>(b[2]) << 8 | b[3];
    guid.data2 = static_cast<uint16>(b[4] << 8 | b[5]);
    guid.data3 = static_cast<uint16>(b[6] << 8 | b[7]);
    std::memcpy(guid.data4, b + 8, sizeof guid.data4);
    return guid;
}

// -1 for what is no hexadecimal digit.
int DigitValue(char c) {
    if (c >= '0' && c <= '9') return c - '0';
    if (c >= 'a' && c <= 'f') return c - 'a' + 10;
    if (c >= 'A' && c <= 'F') return c - 'A' + 10;
    return -1;
}

// Reads no further than the terminator.
bool ParseText(CStr text, TextOrder& order) {
    int digits = 0;
    for (int i = 0; i < kTextLength; ++i) {
        if (IsHyphenAt(i)) {
            if (text[i] != '-') return false;
            continue;
        }
        int value = DigitValue(text[i]);
        if (value < 0) return false;
        uint8& byte = order.bytes[digits / 2];
        byte = static_cast<uint8>(digits % 2 == 0 ? value << 4 : byte | value);
        ++digits;
    }
    return text[kTextLength] == 0;
}

}  // namespace

void OVGuidCreate(OVGuidType* out) {
    constexpr uint16 kVersion4 = 0x4000, kVersionMask = 0xF000;
    constexpr uint8 kVariant = 0x80, kVariantMask = 0xC0;
    if (!out) return;
    if (tessel::platform::RandomBytes(out, sizeof *out)) {
        out->data3 = static_cast<uint16>((out->data3 & ~kVersionMask) | kVersion4);
        out->data4[0] = static_cast<uint8>((out->data4[0] & ~kVariantMask) | kVariant);
        return;
    }
    double numbers[2];
    RandomGen(&numbers[0]);
    RandomGen(&numbers[1]);
    static_assert(sizeof numbers == sizeof *out);
    std::memcpy(out, numbers, sizeof *out);
}

MgErr OVGuidFromCStr(CStr text, OVGuidType* out) {
    TextOrder order;
    if (!text) return kArgErr;
    if (!out) return kNoErr;
    if (!ParseText(text, order)) return kGuidErr;
    *out = FromTextOrder(order);
    return kNoErr;
}

MgErr OVGuidToCStr(const OVGuidType* guid, char* out) {
    if (!out) return kNoErr;
    out[0] = 0;
    if (!guid) return kGuidErr;
    const TextOrder order = ToTextOrder(*guid);
    for (int i = 0, digits = 0; i < kTextLength; ++i) {
        if (IsHyphenAt(i)) {
            out[i] = '-';
        } else {
            out[i] = "0123456789abcdef"[(order.bytes[digits / 2] >> (digits % 2 == 0 ? 4 : 0)) & 15];
            ++digits;
        }
    }
    out[kTextLength] = 0;
    return kNoErr;
}

MgErr OVGuidCreateStr(char* out) {
    OVGuidType guid;
    OVGuidCreate(&guid);
    return OVGuidToCStr(&guid, out);
}

const OVGuidType* NullOVGuid() {
    return &kNull;
}

bool OVGuidsEqual(const OVGuidType* a, const OVGuidType* b) {
    if (!a || !b) return a == b;
    return std::memcmp(a, b, sizeof *a) == 0;
}

void tessel::ToDebugStream(DebugStream& stream, const OVGuidType& guid) {
    char text[kOVGuidTextSize];
    stream.Append(OVGuidToCStr(&guid, text) == kNoErr ? text : "<<Error printing OVGuidType>>");
}
