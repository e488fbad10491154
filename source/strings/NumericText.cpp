// Any number in any format: the format codes, engineering and SI notation, complex values.
#include "base/Compiler.h"
#include "numerics/NumericAccess.h"
#include "strings/NumericTextParts.h"
#include <tessel/diagnostics/DebugStream.h>
#include <tessel/numerics/NumericSupport.h>
#include <tessel/strings/NumericText.h>

namespace tessel {
namespace {

// ---- format codes ---------------------------------------------------------------------------------------------------

enum class FormatClass { kInteger, kPolar, kExponential, kSI, kEngineering, kOther, kFixed, kUnknown };

constexpr int32 kPolarOffset = 100;
constexpr int32 kLastPolar = -65;
constexpr int32 kLastExponential = 63;
constexpr int32 kLastSI = 130;
constexpr int32 kLastEngineering = 162;
constexpr int32 kFirstOther = 200;
constexpr int32 kLastOther = 299;
constexpr int32 kFirstWideOther = 512;
constexpr int32 kLastWideOther = 16895;
constexpr int32 kComplexOther = -6;  // how a complex value is rendered with one of these

FormatClass Classify(int32 code) {
    if (code >= kFormatDecimal && code <= kFormatBinary) return FormatClass::kInteger;
    if (code <= kLastPolar) return FormatClass::kPolar;
    if (code >= 1 && code <= kLastExponential) return FormatClass::kExponential;
    if (code >= kFormatSI && code <= kLastSI) return FormatClass::kSI;
    if (code >= kFormatEngineering && code <= kLastEngineering) return FormatClass::kEngineering;
    if (code >= kFirstOther && code <= kLastOther) return FormatClass::kOther;
    if (code >= kFirstWideOther && code <= kLastWideOther) return FormatClass::kOther;
    if (code >= -kLastExponential && code <= 0) return FormatClass::kFixed;
    return FormatClass::kUnknown;
}

int32 RadixOf(int32 code) {
    switch (code) {
        case kFormatHex:
            return 16;
        case kFormatOctal:
            return 8;
        case kFormatBinary:
            return 2;
        default:
            return 10;
    }
}

// A complex value in a format of its own is re-coded; no such format is known.
int32 SetFormat(int32 code) {
    if (code <= kLastOther) {
        TESSEL_REPORT(kDebugWarning, 0x1D9C4F36u) << "Wrong k-code in SetFormat function " << code;
    } else {
        TESSEL_REPORT(kDebugWarning, 0xE85A2071u) << "Wrong output k-code in SetFormat function:" << code;
    }
    return kComplexOther;
}

// ---- integer formats ------------------------------------------------------------------------------------------------

// A number in an integer format: how its bits are to be read, and in which width.
struct IntegerImage {
    uint64 bits;
    int32 width;
};

template <class Int>
IntegerImage ConvertTo(const ExtendedComplex& value) {
    return {static_cast<uint64>(SaturatedRound<Int>(value.re)), static_cast<int32>(8 * sizeof(Int))};
}

// Reals and complex values in an integer format.
TESSEL_NOT_INLINE IntegerImage ImageOfReal(int16 type, const void* value, int32 code) {
    const ExtendedComplex number = ReadNumber(type, value);
    if (code == kFormatDecimal) return ConvertTo<int32>(number);
    if (code == kFormatUnsigned) return ConvertTo<uint32>(number);
    if (NumClass(type) == kNumClassComplex) {
        TESSEL_REPORT(kDebugError, 0x70B3D8E4u) << "Complex number can't be shown in bin/hex/oct";
        return ConvertTo<uint32>(number);
    }
    return number.re < 0 ? ConvertTo<int64>(number) : ConvertTo<uint64>(number);
}

int32 RenderIntegerFormat(const void* value, int16 type, int32 code, char* buffer, int32 size) {
    const bool isInteger = IsIntegerType(type);
    const IntegerImage image =
        isInteger ? IntegerImage{ReadInteger(type, value), IntegerBits(type)} : ImageOfReal(type, value, code);
    if (code == kFormatDecimal && (!isInteger || IsSignedType(type))) {
        const auto number = static_cast<int64>(image.bits);
        return NumToStr(Magnitude(number), number < 0, 10, buffer, size);
    }
    return NumToStr(image.bits & (~uint64{0} >> (64 - image.width)), false, RadixOf(code), buffer, size);
}

// ---- engineering and SI notation ------------------------------------------------------------------------------------

constexpr int32 kLargestPrefix = 24;
constexpr char kPrefixes[] = "yzafpnum kMGTPEZY";  // of 10^-24, 10^-21, ... 10^24; 10^0 has none
constexpr int32 kMostDigits = 63;
constexpr int32 kScratchSize = 96;

int32 ModuloThree(int32 x) {
    return (x % 3 + 3) % 3;
}

// An exponential rendering taken apart again. Without an exponent (a NaN, an infinity) `digits` is 0.
struct Mantissa {
    char text[kScratchSize];  // the whole rendering
    int32 length;
    bool negative;
    char digit[kScratchSize];  // the digits, without sign and decimal point
    int32 digits;
    int32 exponent;
};

Mantissa RenderMantissa(const RealSource& source, int32 significant) {
    Mantissa m;
    m.length = RenderReal(source, significant, m.text, kScratchSize, '.');
    m.negative = m.length > 0 && m.text[0] == '-';
    m.digits = 0;
    m.exponent = 0;
    const char* const end = m.text + m.length;
    if (source.parts.kind != RealKind::kFinite) return m;
    const char* const letter = std::find(static_cast<const char*>(m.text), end, 'E');
    for (const char* at = m.text; at < letter; ++at) {
        if (*at >= '0' && *at <= '9') m.digit[m.digits++] = *at;
    }
    const char* at = letter + 2;
    for (; at < end; ++at) m.exponent = 10 * m.exponent + (*at - '0');
    if (letter[1] == '-') m.exponent = -m.exponent;
    return m;
}

// The mantissa with its point moved `shift` places to the right.
void PutShifted(const Mantissa& m, int32 shift, int32 decimals, char decimalPoint, TextOut& out) {
    if (m.negative) out.Put('-');
    if (m.digits == 0) TESSEL_REPORT(kDebugFatal, 0x0F62B9A8u) << "Bad result from NumToText recursion 1.";
    const int32 whole = std::min(m.digits, shift + 1);
    out.Put(m.digit, whole);
    out.Fill('0', shift + 1 - whole);
    if (decimals == 0) return;
    out.Put(decimalPoint);
    const int32 known = std::min(m.digits - whole, decimals);
    out.Put(m.digit + whole, known);
    if (known < decimals) TESSEL_REPORT(kDebugFatal, 0xB4E1703Cu) << "Bad result from NumToText recursion 2.";
}

void PutSuffix(const char* suffix, int32 length, TextOut& out) {
    if (static_cast<size_t>(length) > out.Room()) {
        TESSEL_REPORT(kDebugFatal, 0x5AD8F623u) << "buffer overflow imminent";
        return;
    }
    out.Put(suffix, length);
}

// Mantissa and output exponent of engineering notation.
struct Scaled {
    Mantissa mantissa;
    int32 shift;
    int32 exponent;
};

Scaled ScaleToThousands(const RealSource& source, int32 decimals, int32 sharedExponent) {
    Mantissa mantissa = RenderMantissa(source, std::min(decimals + 3, kMostDigits));
    if (mantissa.digits == 0) return {mantissa, 0, 0};
    const int32 first = mantissa.exponent;
    int32 shift = ModuloThree(first + sharedExponent);
    if (shift != 2) {
        mantissa = RenderMantissa(source, decimals + 1 + shift);
        if (mantissa.exponent != first) {  // rounded up to the next power of ten: a one and zeros
            shift = ModuloThree(mantissa.exponent + sharedExponent);
            const int32 needed = decimals + 1 + shift;
            std::fill(mantissa.digit + mantissa.digits, mantissa.digit + std::max(needed, mantissa.digits), '0');
            mantissa.digits = std::max(needed, mantissa.digits);
        }
    }
    return {mantissa, shift, mantissa.exponent + sharedExponent - shift};
}

int32 RenderScaled(const RealSource& source, bool isSI, int32 decimals, char* buffer, int32 size, char decimalPoint,
                   int32* slot) {
    const bool shared = slot != nullptr && *slot != kNoSharedExponent;
    if (slot != nullptr && !shared) isSI = false;
    const Scaled scaled = ScaleToThousands(source, decimals, shared ? *slot : 0);
    TextOut out(buffer, size);
    if (scaled.mantissa.digits == 0) {
        out.Put(scaled.mantissa.text, scaled.mantissa.length);
        return out.Length();
    }
    PutShifted(scaled.mantissa, scaled.shift, decimals, decimalPoint, out);

    const int32 exponent = scaled.exponent;
    const bool near = exponent >= -kLargestPrefix && exponent <= kLargestPrefix;
    if (shared) {
        *slot = near ? exponent : 0;
        if (near) return out.Length();
    }
    if (isSI && near) {
        if (exponent != 0) PutSuffix(&kPrefixes[(exponent + kLargestPrefix) / 3], 1, out);
        return out.Length();
    }
    char suffix[kExponentTextSize];
    PutSuffix(suffix, WriteExponent(exponent, suffix), out);
    return out.Length();
}

// ---- reals and complex values ---------------------------------------------------------------------------------------

int32 RenderPart(const RealSource& source, int32 code, char* buffer, int32 size, char decimalPoint, int32* slot) {
    switch (Classify(code)) {
        case FormatClass::kSI:
            return RenderScaled(source, true, code - kFormatSI, buffer, size, decimalPoint, slot);
        case FormatClass::kEngineering:
            return RenderScaled(source, false, code - kFormatEngineering, buffer, size, decimalPoint, slot);
        case FormatClass::kOther:
            return 0;
        default:
            return RenderReal(source, code, buffer, size, decimalPoint);
    }
}

RealSource SourceOf(int16 type, const void* value) {
    switch (type) {
        case kNumInt64: {
            const auto number = ReadAs<int64>(value);
            return {{0, 0, RealKind::kFinite, number < 0}, true, Magnitude(number)};
        }
        case kNumUInt64:
            return {{0, 0, RealKind::kFinite, false}, true, ReadAs<uint64>(value)};
        case kNumDouble:
            return {TakeApart(ReadAs<double>(value)), false, 0};
        case kNumExtended:
            return {TakeApart(ReadAs<floatExt>(value)), false, 0};
        default:
            return {TakeApart(static_cast<double>(ReadNumber(type, value).re)), false, 0};
    }
}

RealSource SourceOf(Extended x) {
    return {TakeApart(FromExtended(x)), false, 0};
}

int32 RenderComplex(const ExtendedComplex& value, int32 code, char* buffer, int32 size, char decimalPoint,
                    int32* slot) {
    const bool isPolar = Classify(code) == FormatClass::kPolar;
    ExtendedComplex parts = value;
    if (isPolar) {
        const bool isZero = value.re == 0 && value.im == 0;  // whose parts' signs make no angle
        parts = {std::hypot(value.re, value.im), isZero ? value.im : std::atan2(value.im, value.re)};
        code += kPolarOffset;
    }
    TextOut out(buffer, size);
    const int32 unit = slot != nullptr ? *slot : 0;
    out.Skip(RenderPart(SourceOf(parts.re), code, buffer, size / 2, decimalPoint, slot));
    const int32 realExponent = slot != nullptr ? *slot : 0;
    out.Put(isPolar ? " arg " : " ");
    if (!isPolar && (!std::signbit(parts.im) || std::isnan(parts.im))) out.Put('+');
    const RealSource imaginary = SourceOf(parts.im);
    const auto room = static_cast<int32>(out.Room());
    int32 exponent = unit;
    int32 length = RenderPart(imaginary, code, out.At(), room, decimalPoint, slot != nullptr ? &exponent : nullptr);
    if (slot != nullptr && exponent != realExponent) {
        length = RenderPart(imaginary, code, out.At(), room, decimalPoint, nullptr);
    }
    out.Skip(length);
    if (!isPolar && out.Room() > 2) out.Put(" i");
    return out.Length();
}

TESSEL_NOT_INLINE int32 RenderNull(int16 type, char* buffer, int32 size) {
    TextOut out(buffer, size);
    out.Put(NumClass(type) == kNumClassComplex ? "0 + 0i" : "0");
    return Terminate(buffer, size, out.Length());
}

TESSEL_NOT_INLINE int32 RenderNumber(const void* value, int16 type, int32 code, char* buffer, int32 size,
                                     char decimalPoint, int32* slot) {
    const FormatClass format = Classify(code);
    if (format == FormatClass::kUnknown) TESSEL_REPORT(kDebugWarning, 0x83C7E15Au) << "Bad k_code: " << code;
    int32 length = 0;
    if (NumClass(type) == kNumClassComplex) {
        if (format == FormatClass::kOther) code = SetFormat(code);
        length = RenderComplex(ReadNumber(type, value), code, buffer, size, decimalPoint, slot);
    } else {
        if (format == FormatClass::kPolar) code += kPolarOffset;
        length = RenderPart(SourceOf(type, value), code, buffer, size, decimalPoint, slot);
    }
    return Terminate(buffer, size, length);
}

}  // namespace

int32 Terminate(char* buffer, int32 size, int32 length) {
    if (length >= size) {
        TESSEL_REPORT(kDebugFatal, 0xC95F3B60u) << "buffer overflow";
        length = size - 1;
    }
    buffer[length] = 0;
    return length;
}

}  // namespace tessel

using namespace tessel;

int32 NumToAnyString(const void* value, int16 typeCode, const int16* formatCode, char* buffer, int32 size,
                     uint8 decimalPoint, int32* sharedExponent) {
    if (buffer == nullptr || size <= 0) return 0;
    if (formatCode == nullptr) {
        buffer[0] = 0;
        return 0;
    }
    const int16 type = TypeOfCode(typeCode);
    const int32 code = *formatCode;
    if (value == nullptr) return RenderNull(type, buffer, size);
    if (code >= kFormatDecimal && code <= kFormatBinary) return RenderIntegerFormat(value, type, code, buffer, size);
    return RenderNumber(value, type, code, buffer, size, static_cast<char>(decimalPoint), sharedExponent);
}
