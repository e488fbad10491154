#include <tessel/numerics/FloatingPointRegisters.h>

#include <algorithm>
#include <cfenv>

#include <tessel/numerics/NumericSupport.h>

#include "numerics/DecimalConversion.h"
#include "numerics/RealFunctions.h"
#include "numerics/Registers.h"

namespace tessel {
namespace {

constexpr int kRegisters = 8;
constexpr int kTopShift = 11;
constexpr uint64 kQuietBit = uint64{1} << 62;

// Registers are used from the last to the first, as a ring; `depth` of them are in use from `top` on.
struct FloatingPointUnit {
    Extended value[kRegisters];
    int8 rest[kRegisters];
    int32 top;
    int32 depth;
    uint16 status;
};

thread_local FloatingPointUnit tUnit{};

// The one save area of the process.
struct SaveArea {
    FloatingPointUnit unit;
    std::fenv_t environment;
};
SaveArea gSaveArea{};

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

struct Register {
    Extended value;
    int32 rest;
};

Register PopWithRest() {
    FloatingPointUnit& unit = tUnit;
    if (unit.depth == 0) {
        unit.status = static_cast<uint16>((unit.status | kFPStatInvalid | kFPStatStackFault) & ~kFPStatStackOverflow);
        return {real::NaN<Extended>(), 0};
    }
    const Register result{unit.value[unit.top], unit.rest[unit.top]};
    unit.top = (unit.top + 1) % kRegisters;
    --unit.depth;
    return result;
}

bool IsSignaling(Extended x) {
    return std::isnan(x) && (FromExtended(x).mantissa & kQuietBit) == 0;
}

// Stores a value into a narrower real. Where the value lies exactly between two of them, the rest decides.
template <class Real>
Real Narrow(const Register& from) {
    const auto nearest = static_cast<Real>(from.value);
    if (from.rest == 0 || !std::isfinite(nearest) || static_cast<Extended>(nearest) == from.value) return nearest;
    const Real toward = static_cast<Extended>(nearest) < from.value ? real::kInfinity<Real> : -real::kInfinity<Real>;
    const Real other = std::nextafter(nearest, toward);
    const bool between = from.value - nearest == other - from.value;
    return between && (from.rest > 0) == (toward > 0) ? other : nearest;
}

template <class Real>
Real PopNarrow() {
    const Register top = PopWithRest();
    if (IsSignaling(top.value)) tUnit.status |= kFPStatInvalid;
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

void PushRegister(Extended value, int32 rest) {
    FloatingPointUnit& unit = tUnit;
    unit.top = (unit.top + kRegisters - 1) % kRegisters;
    if (unit.depth == kRegisters) {
        unit.status |= kFPStatInvalid | kFPStatStackFault | kFPStatStackOverflow;
        value = real::NaN<Extended>();
        rest = 0;
    } else {
        ++unit.depth;
    }
    unit.value[unit.top] = value;
    unit.rest[unit.top] = static_cast<int8>(rest);
}

Extended PopRegister() {
    return PopWithRest().value;
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

// ---- state ----

void FPInit(void) {
    tUnit = FloatingPointUnit{};
    std::fesetenv(FE_DFL_ENV);
}

void FPSave(void) {
    gSaveArea.unit = tUnit;
    std::fegetenv(&gSaveArea.environment);
}

int32 FPCheck(void) {
    FPSave();
    return gSaveArea.unit.depth == 0 ? 1 : 0;
}

uint16 CheckFPStat(void) {
    return static_cast<uint16>(tUnit.status | HostExceptions() | tUnit.top << kTopShift);
}

// ---- loads ----

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
    PushRegister(*value);
}

void FPLoadFlt64(const double* value) {
    PushRegister(*value);
}

void FPLoadExt(const floatExt* value) {
    PushRegister(ToExtended(*value));
}

void FPLoadPDR(const PackedDecimal* record) {
    const bool negative = record->sign != 0;
    Extended value = 0;
    int32 rest = 0;
    if (record->exponent == kPackedDecimalNaNExponent) {
        value = real::NaN<Extended>();
    } else if (record->exponent == kPackedDecimalInfExponent) {
        value = real::kInfinity<Extended>;
    } else {
        const NearestExtended nearest = FromDecimal(UnpackDigits(*record), record->exponent);
        value = ToExtended(nearest.value);
        rest = nearest.rest;
    }
    PushRegister(negative ? -value : value, negative ? -rest : rest);
}

void NumToFPR(int16 code, const void* value) {
    const int16 type = TypeOfCode(code);
    const int32 numberClass = NumClass(type);
    if (numberClass == kNumClassNone) return;
    const ExtendedComplex number = ReadNumber(type, value);
    if (numberClass == kNumClassComplex) PushRegister(number.im);
    PushRegister(number.re);
}

void FPPush(void) {
    const bool wasEmpty = tUnit.depth == 0;
    const Register top = PopWithRest();
    if (!wasEmpty) PushRegister(top.value, top.rest);
    PushRegister(top.value, top.rest);
}

void FPPop(void) {
    PopWithRest();
}

// ---- stores ----

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
    *value = FromExtended(PopRegister());
}

void FPStorePDR(int32 digits, PackedDecimal* record) {
    StoreDecimal(TakeApart(FromExtended(PopRegister())), digits, *record);
}

int32 FPRToNum(int16 code, void* value) {
    const int16 type = TypeOfCode(code);
    if (NumClass(type) == kNumClassNone) return 0;
    const uint16 before = tUnit.status;
    tUnit.status &= static_cast<uint16>(~kFPStatInvalid);
    PopInto(type, value);
    const bool valid = (tUnit.status & kFPStatInvalid) == 0;
    tUnit.status |= before;
    return valid ? 1 : 0;
}

int64 FloatExtToInt64(const floatExt* value) {
    return SaturatedRound<int64>(ToExtended(*value));
}

uint64 FloatExtToUInt64(const floatExt* value) {
    return SaturatedRound<uint64>(ToExtended(*value));
}
