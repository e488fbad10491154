// Sizes, classes and conversions of the numeric types.
#include "numerics/NumericAccess.h"
#include <tessel/diagnostics/DebugStream.h>
#include <tessel/numerics/NumericSupport.h>

#include <algorithm>

namespace tessel {
namespace {

constexpr int kTypes = 16;

// By type code. The sizes of the extended types can be set.
int32 numSizes[kTypes] = {0, 1, 2, 4, 8, 1, 2, 4, 8, 4, 8, 10, 8, 16, 20, 0};

constexpr uint8 kNumClasses[kTypes] = {
    kNumClassNone,     kNumClassSigned,   kNumClassSigned,   kNumClassSigned, kNumClassSigned, kNumClassUnsigned,
    kNumClassUnsigned, kNumClassUnsigned, kNumClassUnsigned, kNumClassReal,   kNumClassReal,   kNumClassReal,
    kNumClassComplex,  kNumClassComplex,  kNumClassComplex,  kNumClassNone,
};

constexpr int16 kFirstCode = 1;
constexpr int16 kLastCode = 30;

bool IsNumericCode(int16 code) {
    return code >= kFirstCode && code <= kLastCode && kNumClasses[TypeOfCode(code)] != kNumClassNone;
}

const void* ImaginaryExtended(const void* value) {
    return static_cast<const uint8*>(value) + numSizes[kNumExtended];
}

}  // namespace

void WriteInteger(int16 type, uint64 value, void* destination) {
    switch (type) {
        case kNumInt8:
        case kNumUInt8:
            return WriteAs(destination, static_cast<uint8>(value));
        case kNumInt16:
        case kNumUInt16:
            return WriteAs(destination, static_cast<uint16>(value));
        case kNumInt32:
        case kNumUInt32:
            return WriteAs(destination, static_cast<uint32>(value));
        case kNumInt64:
        case kNumUInt64:
            return WriteAs(destination, value);
        default:
            return;
    }
}

ExtendedComplex ReadNumber(int16 type, const void* source) {
    switch (type) {
        case kNumInt8:
        case kNumInt16:
        case kNumInt32:
        case kNumInt64:
            return {static_cast<Extended>(static_cast<int64>(ReadInteger(type, source))), 0};
        case kNumUInt8:
        case kNumUInt16:
        case kNumUInt32:
        case kNumUInt64:
            return {static_cast<Extended>(ReadInteger(type, source)), 0};
        case kNumSingle:
            return {ReadAs<float>(source), 0};
        case kNumDouble:
            return {ReadAs<double>(source), 0};
        case kNumExtended:
            return {ToExtended(ReadAs<floatExt>(source)), 0};
        case kNumComplexSingle: {
            const auto z = ReadAs<cmplx64>(source);
            return {z.re, z.im};
        }
        case kNumComplexDouble: {
            const auto z = ReadAs<cmplx128>(source);
            return {z.re, z.im};
        }
        case kNumComplexExtended:
            return {ToExtended(ReadAs<floatExt>(source)), ToExtended(ReadAs<floatExt>(ImaginaryExtended(source)))};
        default:
            return {0, 0};
    }
}

void WriteNumber(int16 type, const ExtendedComplex& value, void* destination) {
    switch (type) {
        case kNumInt8:
            return WriteAs(destination, SaturatedRound<int8>(value.re));
        case kNumInt16:
            return WriteAs(destination, SaturatedRound<int16>(value.re));
        case kNumInt32:
            return WriteAs(destination, SaturatedRound<int32>(value.re));
        case kNumInt64:
            return WriteAs(destination, SaturatedRound<int64>(value.re));
        case kNumUInt8:
            return WriteAs(destination, SaturatedRound<uint8>(value.re));
        case kNumUInt16:
            return WriteAs(destination, SaturatedRound<uint16>(value.re));
        case kNumUInt32:
            return WriteAs(destination, SaturatedRound<uint32>(value.re));
        case kNumUInt64:
            return WriteAs(destination, SaturatedRound<uint64>(value.re));
        case kNumSingle:
            return WriteAs(destination, static_cast<float>(value.re));
        case kNumDouble:
            return WriteAs(destination, static_cast<double>(value.re));
        case kNumExtended:
            return WriteAs(destination, FromExtended(value.re));
        case kNumComplexSingle:
            return WriteAs(destination, cmplx64{static_cast<float>(value.re), static_cast<float>(value.im)});
        case kNumComplexDouble:
            return WriteAs(destination, cmplx128{static_cast<double>(value.re), static_cast<double>(value.im)});
        case kNumComplexExtended:
            WriteAs(destination, FromExtended(value.re));
            return WriteAs(static_cast<uint8*>(destination) + numSizes[kNumExtended], FromExtended(value.im));
        default:
            return;
    }
}

}  // namespace tessel

using namespace tessel;

int32 NumSize(int16 code) {
    return numSizes[TypeOfCode(code)];
}

int32 NumClass(int16 code) {
    return kNumClasses[TypeOfCode(code)];
}

uint8 SetFxSize(uint8 size) {
    const auto previous = static_cast<uint8>(numSizes[kNumExtended]);
    numSizes[kNumExtended] = size;
    numSizes[kNumComplexExtended] = 2 * size;
    return previous;
}

void ConvertNum(int16 sourceCode, const void* source, int16 destinationCode, void* destination) {
    if (!IsNumericCode(sourceCode) || !IsNumericCode(destinationCode)) {
        TESSEL_REPORT(kDebugFatal, 0x6C1F29A3u) << "ConvertNum called with non-numeric";
        return;
    }
    if (source == nullptr || destination == nullptr) {
        TESSEL_REPORT(kDebugFatal, 0x3B8D7415u) << "ConvertNum called with Empty Data";
        return;
    }
    const int16 from = TypeOfCode(sourceCode);
    const int16 to = TypeOfCode(destinationCode);
    if (IsIntegerType(from) && IsIntegerType(to)) {
        WriteInteger(to, ReadInteger(from, source), destination);
    } else {
        WriteNumber(to, ReadNumber(from, source), destination);
    }
}

int32 Min(int32 a, int32 b) {
    return std::min(a, b);
}

int32 Max(int32 a, int32 b) {
    return std::max(a, b);
}

int32 Abs(int32 a) {
    return a < 0 ? static_cast<int32>(0u - static_cast<uint32>(a)) : a;
}

int32 Mod(int32 a, int32 b) {
    const int64 remainder = int64{a} % b;
    return static_cast<int32>(remainder < 0 ? remainder + std::abs(int64{b}) : remainder);
}

int32 Pin(int32 x, int32 low, int32 high) {
    return high <= low || x < low ? low : std::min(x, high);
}
