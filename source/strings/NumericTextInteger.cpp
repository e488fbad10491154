// Integers as text, in radix 2, 8, 10 and 16.
#include "numerics/NumericAccess.h"
#include "strings/NumericTextParts.h"
#include <tessel/diagnostics/DebugStream.h>
#include <tessel/numerics/NumericSupport.h>
#include <tessel/strings/NumericText.h>

namespace tessel {
namespace {

constexpr char kDigitTable[] = "0123456789ABCDEF";
constexpr int32 kMostDigits = 64;  // of 64 bits in radix 2

bool IsRadix(int32 radix) {
    return radix == 2 || radix == 8 || radix == 10 || radix == 16;
}

void ReportCut(bool digitsCut, bool signLost, int32 radix) {
    if (digitsCut) {
        TESSEL_REPORT(kDebugWarning, 0x91B3C60Du) << "Incomplete conversion in NumToStr: buffer provided was not large "
                                                     "enough to represent the number in base "
                                                  << radix << ".";
    }
    if (signLost) TESSEL_REPORT(kDebugWarning, 0x27F40E98u) << "Unable to include sign in NumToStr: buffer too small.";
}

// The low-order digits that fit, and the sign if there is still room.
int32 WriteLowDigits(uint64 magnitude, bool negative, int32 radix, char* buffer, int32 size) {
    char work[kMostDigits + 1];
    char* const end = work + sizeof work;
    char* const limit = end - std::min<int32>(size - 1, sizeof work);
    char* at = end;
    do {
        *--at = kDigitTable[magnitude % static_cast<uint32>(radix)];
        magnitude /= static_cast<uint32>(radix);
    } while (magnitude != 0 && at > limit);
    const bool digitsCut = magnitude != 0;
    const bool signLost = negative && at == limit;
    if (negative && !signLost) *--at = '-';
    const auto length = static_cast<int32>(end - at);
    std::memcpy(buffer, at, static_cast<size_t>(length));
    buffer[length] = 0;
    ReportCut(digitsCut, signLost, radix);
    return length;
}

}  // namespace

int32 RenderDigits(uint64 magnitude, bool negative, int32 radix, char* buffer, int32 size) {
    if (size < 2) {
        TESSEL_REPORT(kDebugWarning, 0xD40A5E72u) << "NumToStr requires at least 2 bytes in the input buffer.";
        if (size == 1) buffer[0] = 0;
        return 0;
    }
    if (!IsRadix(radix)) {
        buffer[0] = 0;
        return 0;
    }
    return WriteLowDigits(magnitude, negative, radix, buffer, size);
}

int32 WriteExponent(int32 exponent, char* out) {
    const auto magnitude = static_cast<uint32>(exponent < 0 ? -exponent : exponent);
    out[0] = 'E';
    out[1] = exponent < 0 ? '-' : '+';
    return static_cast<int32>(WriteDecimal(out + 2, magnitude, false) - out);
}

}  // namespace tessel

using namespace tessel;

int32 NumToIntString(const void* value, char* buffer, int32 size, int32 radix, bool isSigned, int16 typeCode) {
    if (buffer == nullptr) return 0;
    int16 type = TypeOfCode(typeCode);
    uint32 converted = 0;
    if (value == nullptr || !IsIntegerType(type)) {
        const int16 integerType = isSigned ? kNumInt32 : kNumUInt32;
        if (value != nullptr && NumClass(type) != kNumClassNone) ConvertNum(type, value, integerType, &converted);
        value = &converted;
        type = integerType;
    }
    const uint64 bits = ReadInteger(type, value);
    const int32 width = IntegerBits(type);
    if (isSigned && radix == 10) {
        const int64 number = width == 64 ? static_cast<int64>(bits) : static_cast<int32>(bits);
        return NumToStr(Magnitude(number), number < 0, 10, buffer, size);
    }
    return NumToStr(bits & (~uint64{0} >> (64 - width)), false, radix, buffer, size);
}
