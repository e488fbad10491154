// A floating-point unit with a stack of registers, one for each thread.
#include "base/Compiler.h"
#include "numerics/DecimalConversion.h"
#include "numerics/Registers.h"
#include <tessel/numerics/FloatingPointRegisters.h>
#include <tessel/numerics/NumericSupport.h>

#include <bit>
#include <cfenv>
#include <cmath>
#include <limits>
#include <type_traits>

namespace tessel {
namespace {

constexpr uint32 kRegisters = 8;
constexpr int kTopShift = 11;
constexpr uint64 kQuietBit = uint64{1} << 62;
constexpr RoundedExtended kNaN = {~uint64{0}, kExtendedExponentMask, 0};
constexpr RoundedExtended kInfinity = {kExtendedIntegerBit, kExtendedExponentMask, 0};

// A register holds a value's bits, so that what only passes through costs no floating-point instruction.
using Register = RoundedExtended;

// Registers are used from the last to the first, as a ring; `depth` of them are in use from `top` on.
struct FloatingPointUnit {
    Register registers[kRegisters];
    uint32 top;
    uint32 depth;
    uint16 status;
};

TESSEL_FAST_THREAD_LOCAL FloatingPointUnit threadUnit{};

// The one save area of the process.
struct SaveArea {
    FloatingPointUnit unit;
    std::fenv_t environment;
};
SaveArea saveArea{};

// The exceptions of the host's unit, as bits of the status word.
uint16 HostExceptions() {
    const int raised = std::fetestexcept(FE_ALL_EXCEPT);
    uint16 status = 0;
    if ((raised & FE_INVALID) != 0) status |= kFPStatInvalid;
    if ((raised & FE_DIVBYZERO) != 0) status |= kFPStatZeroDivide;
    if ((raised & FE_OVERFLOW) != 0) status |= kFPStatOverflow;
    if ((raised & FE_UNDERFLOW) != 0) status |= kFPStatUnderflow;
    if ((raised & FE_INEXACT) != 0) status |= kFPStatInexact;
    return status;
}

void Push(Register value) {
    FloatingPointUnit& unit = threadUnit;
    unit.top = (unit.top + kRegisters - 1) % kRegisters;
    if (unit.depth == kRegisters) {
        unit.status |= kFPStatInvalid | kFPStatStackFault | kFPStatStackOverflow;
        unit.registers[unit.top] = kNaN;
        return;
    }
    ++unit.depth;
    unit.registers[unit.top] = value;
}

Register Pop() {
    FloatingPointUnit& unit = threadUnit;
    if (unit.depth == 0) {
        unit.status = static_cast<uint16>((unit.status | kFPStatInvalid | kFPStatStackFault) & ~kFPStatStackOverflow);
        return kNaN;
    }
    const Register top = unit.registers[unit.top];
    unit.top = (unit.top + 1) % kRegisters;
    --unit.depth;
    return top;
}

// The denormal bit, when a value that is loaded or stored is one.
void NoteDenormal(bool isDenormal) {
    if (isDenormal) threadUnit.status |= kFPStatDenormal;
}

bool IsDenormal(const floatExt& x) {
    return (x.signExponent & kExtendedExponentMask) == 0 && x.mantissa != 0;
}

// A double's bits as those of an extended real.
Register RegisterOf(double x) {
    constexpr int32 kSpecial = 0x7FF;
    constexpr int32 kRebias = kExtendedBias - 1023;
    const auto bits = std::bit_cast<uint64>(x);
    const auto exponent = static_cast<int32>(bits >> 52 & kSpecial);
    if (exponent == 0 || exponent == kSpecial) {
        NoteDenormal(std::fpclassify(x) == FP_SUBNORMAL);
        return Unpack(FromExtended(x));
    }
    const auto sign = static_cast<uint32>(bits >> 48) & kExtendedSign;
    return {kExtendedIntegerBit | bits << 11, sign | static_cast<uint32>(exponent + kRebias), 0};
}

bool IsSignaling(const Register& x) {
    return (x.signExponent & kExtendedExponentMask) == kExtendedExponentMask && (x.mantissa & kQuietBit) == 0 &&
           x.mantissa << 1 != 0;
}

// How a narrower real is put together.
template <class Real>
struct NarrowFormat {
    using Bits = std::conditional_t<sizeof(Real) == 4, uint32, uint64>;
    static constexpr int32 kDropped = 64 - std::numeric_limits<Real>::digits;  // bits of the mantissa
    static constexpr int32 kRebias = kExtendedBias - (std::numeric_limits<Real>::max_exponent - 1);
    static constexpr int32 kLargestExponent = 2 * std::numeric_limits<Real>::max_exponent - 2;
    static constexpr int32 kFractionBits = std::numeric_limits<Real>::digits - 1;
    static constexpr int32 kSignBit = 8 * sizeof(Real) - 1;
    static constexpr uint64 kSmallestNormal = uint64{1} << kFractionBits;
    static constexpr uint64 kInfinity = static_cast<uint64>(kLargestExponent + 1) << kFractionBits;
};

// A magnitude cut down to a narrower real's bits, and how what was cut off compares with half a unit of them.
enum class Cut { kNothing, kBelowHalf, kHalf, kAboveHalf };
struct CutMagnitude {
    uint64 bits;
    Cut cut;
};

template <class Real>
CutMagnitude CutDown(const Register& from) {
    using Format = NarrowFormat<Real>;
    const int32 exponent = (from.signExponent & kExtendedExponentMask) - Format::kRebias;
    if (exponent > Format::kLargestExponent) return {Format::kInfinity - 1, Cut::kAboveHalf};
    const int32 outward = (from.signExponent & kExtendedSign) != 0 ? -from.rest : from.rest;
    const int32 dropped = Format::kDropped + (exponent < 1 ? 1 - exponent : 0);
    if (dropped > 64) return {0, from.mantissa == 0 && outward == 0 ? Cut::kNothing : Cut::kBelowHalf};
    const uint64 half = uint64{1} << (dropped - 1);
    const uint64 tail = from.mantissa & (half | (half - 1));
    const uint64 kept = dropped == 64 ? 0 : from.mantissa >> dropped;
    // The integer bit adds one to the exponent.
    const uint64 bits = (static_cast<uint64>(exponent < 1 ? 0 : exponent - 1) << Format::kFractionBits) + kept;
    if (tail == 0) {
        if (outward < 0) return {bits - 1, Cut::kAboveHalf};
        return {bits, outward > 0 ? Cut::kBelowHalf : Cut::kNothing};
    }
    if (tail != half) return {bits, tail > half ? Cut::kAboveHalf : Cut::kBelowHalf};
    return {bits, outward == 0 ? Cut::kHalf : outward > 0 ? Cut::kAboveHalf : Cut::kBelowHalf};
}

// Whether a magnitude of which something was cut off is rounded up, in the direction in force.
bool RoundsOutward(const CutMagnitude& x, bool negative) {
    switch (std::fegetround()) {
        case FE_TONEAREST:
            return x.cut == Cut::kAboveHalf || (x.cut == Cut::kHalf && (x.bits & 1) != 0);
        case FE_UPWARD:
            return !negative;
        case FE_DOWNWARD:
            return negative;
        default:
            return false;
    }
}

// Rounds once, whatever rounding made the register's value: its rest takes part.
template <class Real>
Real Narrow(const Register& from) {
    using Format = NarrowFormat<Real>;
    const uint32 exponent = from.signExponent & kExtendedExponentMask;
    if (exponent == kExtendedExponentMask || (exponent != 0 && from.mantissa >> 63 == 0)) {
        return static_cast<Real>(ToExtended(Pack(from)));
    }
    const bool negative = (from.signExponent & kExtendedSign) != 0;
    const CutMagnitude magnitude = CutDown<Real>(from);
    uint64 bits = magnitude.bits;
    uint16 status = 0;
    if (magnitude.cut != Cut::kNothing) {
        bits += RoundsOutward(magnitude, negative) ? 1 : 0;
        status = kFPStatInexact;
        if (bits < Format::kSmallestNormal) status |= kFPStatUnderflow;
        if (bits == Format::kInfinity || static_cast<int32>(exponent) > Format::kRebias + Format::kLargestExponent) {
            status |= kFPStatOverflow;
        }
    }
    if (bits != 0 && bits < Format::kSmallestNormal) status |= kFPStatDenormal;
    threadUnit.status |= status;
    const uint64 sign = static_cast<uint64>(negative) << Format::kSignBit;
    return std::bit_cast<Real>(static_cast<typename Format::Bits>(sign | bits));
}

template <class Real>
Real PopNarrow() {
    const Register top = Pop();
    if (IsSignaling(top)) threadUnit.status |= kFPStatInvalid;
    return Narrow<Real>(top);
}

void PopInto(int16 type, void* value) {
    switch (type) {
        case kNumSingle:
            return WriteAs(value, PopNarrow<float>());
        case kNumDouble:
            return WriteAs(value, PopNarrow<double>());
        case kNumComplexSingle: {
            const auto re = PopNarrow<float>();
            return WriteAs(value, cmplx64{re, PopNarrow<float>()});
        }
        case kNumComplexDouble: {
            const auto re = PopNarrow<double>();
            return WriteAs(value, cmplx128{re, PopNarrow<double>()});
        }
        case kNumComplexExtended:
            return WriteNumber(type, PopComplex(), value);
        default:
            return WriteNumber(type, {PopRegister(), 0}, value);
    }
}

// A part of a value of `type`, as it was read.
void LoadPart(int16 type, Extended part) {
    switch (type) {
        case kNumSingle:
        case kNumComplexSingle:
            NoteDenormal(std::fpclassify(static_cast<float>(part)) == FP_SUBNORMAL);
            break;
        case kNumDouble:
        case kNumComplexDouble:
            NoteDenormal(std::fpclassify(static_cast<double>(part)) == FP_SUBNORMAL);
            break;
        default:
            NoteDenormal(IsDenormal(FromExtended(part)));
    }
    PushRegister(part);
}

void StoreDecimal(const RealParts& x, int32 digits, PackedDecimal& record) {
    record = {};
    record.sign = x.negative ? kPackedDecimalNegativeSign : 0;
    if (x.kind == RealKind::kNaN) {
        record.exponent = kPackedDecimalNaNExponent;
    } else if (x.kind == RealKind::kInfinite) {
        record.exponent = kPackedDecimalInfExponent;
    } else {
        const DecimalDigits decimal = RoundToDecimal(x, digits);
        PackDigits(decimal.digits, record);
        record.exponent = static_cast<int16>(decimal.exponent);
        record.mdigits = static_cast<int16>(decimal.count - 1);
    }
}

}  // namespace

void PushRegister(Extended value) {
    Push(Unpack(FromExtended(value)));
}

Extended PopRegister() {
    return ToExtended(Pack(Pop()));
}

void PushComplex(const ExtendedComplex& value) {
    PushRegister(value.im);
    PushRegister(value.re);
}

ExtendedComplex PopComplex() {
    const Extended re = PopRegister();
    const Extended im = PopRegister();
    return {re, im};
}

}  // namespace tessel

using namespace tessel;

// ---- state ----------------------------------------------------------------------------------------------------------

void FPInit(void) {
    threadUnit = FloatingPointUnit{};
    std::fesetenv(FE_DFL_ENV);
}

void FPSave(void) {
    saveArea.unit = threadUnit;
    std::fegetenv(&saveArea.environment);
}

int32 FPCheck(void) {
    FPSave();
    return saveArea.unit.depth == 0 ? 1 : 0;
}

uint16 CheckFPStat(void) {
    return static_cast<uint16>(threadUnit.status | HostExceptions() | threadUnit.top << kTopShift);
}

// ---- loads ----------------------------------------------------------------------------------------------------------

#define FP_LOAD_INTEGER(NAME, TYPE)                  \
    void FPLoad##NAME(const TYPE* value) {           \
        PushRegister(static_cast<Extended>(*value)); \
    }

FP_LOAD_INTEGER(Int8, int8)
FP_LOAD_INTEGER(Int16, int16)
FP_LOAD_INTEGER(Int32, int32)
FP_LOAD_INTEGER(Int64, int64)
FP_LOAD_INTEGER(UInt8, uint8)
FP_LOAD_INTEGER(UInt16, uint16)
FP_LOAD_INTEGER(UInt32, uint32)
FP_LOAD_INTEGER(UInt64, uint64)

void FPLoadFlt32(const float* value) {
    NoteDenormal(std::fpclassify(*value) == FP_SUBNORMAL);
    PushRegister(*value);
}

void FPLoadFlt64(const double* value) {
    Push(RegisterOf(*value));
}

void FPLoadExt(const floatExt* value) {
    NoteDenormal(IsDenormal(*value));
    Push(Unpack(*value));
}

void FPLoadPDR(const PackedDecimal* record) {
    Register value = kNaN;
    if (record->exponent == kPackedDecimalInfExponent) {
        value = kInfinity;
    } else if (record->exponent != kPackedDecimalNaNExponent) {
        value = FromDecimal(UnpackDigits(*record), record->exponent);
    }
    if (record->sign != 0) {
        value.signExponent |= kExtendedSign;
        value.rest = -value.rest;
    }
    Push(value);
}

void NumToFPR(int16 code, const void* value) {
    const int16 type = TypeOfCode(code);
    const int32 numberClass = NumClass(type);
    if (numberClass == kNumClassNone) return;
    const ExtendedComplex number = ReadNumber(type, value);
    if (numberClass == kNumClassComplex) LoadPart(type, number.im);
    LoadPart(type, number.re);
}

void FPPush(void) {
    const bool wasEmpty = threadUnit.depth == 0;
    const Register top = Pop();
    if (!wasEmpty) Push(top);
    Push(top);
}

void FPPop(void) {
    Pop();
}

// ---- stores ---------------------------------------------------------------------------------------------------------

#define FP_STORE_INTEGER(NAME, TYPE)                  \
    void FPStore##NAME(TYPE* value) {                 \
        *value = SaturatedRound<TYPE>(PopRegister()); \
    }

FP_STORE_INTEGER(Int8, int8)
FP_STORE_INTEGER(Int16, int16)
FP_STORE_INTEGER(Int32, int32)
FP_STORE_INTEGER(Int64, int64)
FP_STORE_INTEGER(UInt8, uint8)
FP_STORE_INTEGER(UInt16, uint16)
FP_STORE_INTEGER(UInt32, uint32)
FP_STORE_INTEGER(UInt64, uint64)

void FPStoreFlt32(float* value) {
    *value = PopNarrow<float>();
}

void FPStoreFlt64(double* value) {
    *value = PopNarrow<double>();
}

void FPStoreExt(floatExt* value) {
    *value = Pack(Pop());
    NoteDenormal(IsDenormal(*value));
}

void FPStorePDR(int32 digits, PackedDecimal* record) {
    StoreDecimal(TakeApart(Pack(Pop())), digits, *record);
}

int32 FPRToNum(int16 code, void* value) {
    const int16 type = TypeOfCode(code);
    if (NumClass(type) == kNumClassNone) return 0;
    const uint16 before = threadUnit.status;
    threadUnit.status &= static_cast<uint16>(~kFPStatInvalid);
    PopInto(type, value);
    const bool valid = (threadUnit.status & kFPStatInvalid) == 0;
    threadUnit.status |= before;
    return valid ? 1 : 0;
}

int64 FloatExtToInt64(const floatExt* value) {
    return SaturatedRound<int64>(ToExtended(*value));
}

uint64 FloatExtToUInt64(const floatExt* value) {
    return SaturatedRound<uint64>(ToExtended(*value));
}
