// Operations of the register layer: on the stack, and from memory to memory.
#include "numerics/ComplexFunctions.h"
#include "numerics/RealFunctions.h"
#include "numerics/Registers.h"
#include <tessel/numerics/FloatingPointRegisters.h>

#include <cstddef>

namespace tessel {
namespace {

using Complex = cmplx::Complex<Extended>;

Complex PopValue() {
    const ExtendedComplex top = PopComplex();
    return {top.re, top.im};
}

void PushValue(const Complex& z) {
    PushComplex({z.real(), z.imag()});
}

Extended Compare(Extended a, Extended b) {
    if (std::isnan(a) || std::isnan(b)) return real::NaN<Extended>();
    return a < b ? -1 : a > b ? 1 : 0;
}

Extended IsInteger(Extended x) {
    return std::isfinite(x) && std::trunc(x) == x ? 1 : 0;
}

Extended ReadElement(const uint8* at, const float*) {
    return ReadAs<float>(at);
}
Extended ReadElement(const uint8* at, const double*) {
    return ReadAs<double>(at);
}
Extended ReadElement(const uint8* at, const floatExt*) {
    return ToExtended(ReadAs<floatExt>(at));
}

// Elements that lie `stride` bytes apart, one after the other.
template <class T>
Extended Sum(const T* first, int32 stride, int32 count) {
    const auto* at = reinterpret_cast<const uint8*>(first);
    Extended sum = 0;
    for (; count > 0; --count, at += stride) sum += ReadElement(at, first);
    return sum;
}

Complex Load(const cmplx64& z) {
    return {z.re, z.im};
}
Complex Load(const cmplx128& z) {
    return {z.re, z.im};
}
Complex Load(const cmplxExt& z) {
    return {ToExtended(z.re), ToExtended(z.im)};
}

}  // namespace
}  // namespace tessel

using namespace tessel;

// ---- on the stack ---------------------------------------------------------------------------------------------------

#define EXTENDED_UNARY(NAME, FUNCTION)         \
    void NAME(void) {                          \
        PushRegister(FUNCTION(PopRegister())); \
    }

// The second operand lies on top of the first.
#define EXTENDED_BINARY(NAME, FUNCTION)        \
    void NAME(void) {                          \
        const Extended second = PopRegister(); \
        const Extended first = PopRegister();  \
        PushRegister(FUNCTION(first, second)); \
    }

#define EXTENDED_COMPLEX_UNARY(NAME, FUNCTION) \
    void NAME(void) {                          \
        PushValue(FUNCTION(PopValue()));       \
    }

EXTENDED_BINARY(LogX, real::Logx)
EXTENDED_UNARY(Log2, real::Log2)
EXTENDED_UNARY(Log10, real::Log10)
EXTENDED_UNARY(LogN, real::Logn)
EXTENDED_UNARY(Lognp1, real::Lognp1)
EXTENDED_UNARY(ExpX, std::exp)
EXTENDED_UNARY(_F2X, std::exp2)
EXTENDED_UNARY(Pow10X, real::Pow10)
EXTENDED_UNARY(Pow2X, std::exp2)
EXTENDED_BINARY(PowerX, std::pow)
EXTENDED_BINARY(ScaleX, real::Scale)
EXTENDED_UNARY(FloorX, std::floor)
EXTENDED_UNARY(CeilX, std::ceil)
EXTENDED_UNARY(SignX, real::Sign)
EXTENDED_UNARY(SinX, std::sin)
EXTENDED_UNARY(CosX, std::cos)
EXTENDED_UNARY(TanX, std::tan)
EXTENDED_BINARY(ATanX, real::Atan2)
EXTENDED_UNARY(SincX, real::Sinc)
EXTENDED_UNARY(RecipX, real::Recip)
EXTENDED_UNARY(Sinh, std::sinh)
EXTENDED_UNARY(Cosh, std::cosh)
EXTENDED_UNARY(Tanh, std::tanh)
EXTENDED_UNARY(Asinh, std::asinh)
EXTENDED_UNARY(Acosh, std::acosh)
EXTENDED_UNARY(Atanh, std::atanh)
EXTENDED_UNARY(ASinX, std::asin)
EXTENDED_UNARY(ACosX, std::acos)
EXTENDED_UNARY(FPIsInt, IsInteger)
EXTENDED_BINARY(FPCompareExt, Compare)

// 2^x - 1, which is e^(x ln 2) - 1 where that is small.
void _F2XM1(void) {
    const Extended x = PopRegister();
    PushRegister(std::fabs(x) < 1 ? std::expm1(x * cmplx::kLn2<Extended>.high) : std::exp2(x) - 1);
}

void FMantExpX(void) {
    const auto parts = real::GetMantExp(PopRegister());
    PushRegister(parts.exponent);
    PushRegister(parts.mantissa);
}

EXTENDED_COMPLEX_UNARY(ComplexRToP, cmplx::ToPolar)
EXTENDED_COMPLEX_UNARY(ComplexPToR, cmplx::ToRectangular)
EXTENDED_COMPLEX_UNARY(ComplexRecip, cmplx::Recip)
EXTENDED_COMPLEX_UNARY(ComplexSin, std::sin)
EXTENDED_COMPLEX_UNARY(ComplexCos, std::cos)
EXTENDED_COMPLEX_UNARY(ComplexTan, std::tan)
EXTENDED_COMPLEX_UNARY(ComplexCot, cmplx::Cot)
EXTENDED_COMPLEX_UNARY(ComplexSinh, std::sinh)
EXTENDED_COMPLEX_UNARY(ComplexCosh, std::cosh)
EXTENDED_COMPLEX_UNARY(ComplexTanh, std::tanh)
EXTENDED_COMPLEX_UNARY(ComplexSinc, cmplx::Sinc)
EXTENDED_COMPLEX_UNARY(ComplexAsin, std::asin)
EXTENDED_COMPLEX_UNARY(ComplexAcos, std::acos)
EXTENDED_COMPLEX_UNARY(ComplexAsinh, std::asinh)
EXTENDED_COMPLEX_UNARY(ComplexAcosh, std::acosh)
EXTENDED_COMPLEX_UNARY(ComplexAtan, std::atan)
EXTENDED_COMPLEX_UNARY(ComplexAtanh, std::atanh)

void ComplexDivide(void) {
    const Complex divisor = PopValue();
    const Complex dividend = PopValue();
    PushValue(cmplx::Divide(dividend, divisor));
}

void ComplexSincos(void) {
    const Complex z = PopValue();
    PushValue(std::cos(z));
    PushValue(std::sin(z));
}

// ---- from memory to memory ------------------------------------------------------------------------------------------

#define TYPED_UNARY(NAME32, NAME64, NAMEEXT, FUNCTION)                      \
    void NAME32(const float* x, float* result) {                            \
        *result = static_cast<float>(FUNCTION(static_cast<Extended>(*x)));  \
    }                                                                       \
    void NAME64(const double* x, double* result) {                          \
        *result = static_cast<double>(FUNCTION(static_cast<Extended>(*x))); \
    }                                                                       \
    void NAMEEXT(const floatExt* x, floatExt* result) {                     \
        *result = FromExtended(FUNCTION(ToExtended(*x)));                   \
    }

#define TYPED_BINARY(NAME32, NAME64, NAMEEXT, FUNCTION)                                                \
    void NAME32(const float* x, const float* y, float* result) {                                       \
        *result = static_cast<float>(FUNCTION(static_cast<Extended>(*x), static_cast<Extended>(*y)));  \
    }                                                                                                  \
    void NAME64(const double* x, const double* y, double* result) {                                    \
        *result = static_cast<double>(FUNCTION(static_cast<Extended>(*x), static_cast<Extended>(*y))); \
    }                                                                                                  \
    void NAMEEXT(const floatExt* x, const floatExt* y, floatExt* result) {                             \
        *result = FromExtended(FUNCTION(ToExtended(*x), ToExtended(*y)));                              \
    }

#define TYPED_COMPLEX(NAME32, NAME64, NAMEEXT, FUNCTION)                                  \
    void NAME32(const cmplx64* z, cmplx64* result) {                                      \
        const Complex value = FUNCTION(Load(*z));                                         \
        *result = {static_cast<float>(value.real()), static_cast<float>(value.imag())};   \
    }                                                                                     \
    void NAME64(const cmplx128* z, cmplx128* result) {                                    \
        const Complex value = FUNCTION(Load(*z));                                         \
        *result = {static_cast<double>(value.real()), static_cast<double>(value.imag())}; \
    }                                                                                     \
    void NAMEEXT(const cmplxExt* z, cmplxExt* result) {                                   \
        const Complex value = FUNCTION(Load(*z));                                         \
        *result = {FromExtended(value.real()), FromExtended(value.imag())};               \
    }

TYPED_BINARY(FLogX32, FLogX64, FLogXExt, real::Logx)
TYPED_UNARY(FLog2_32, FLog2_64, FLog2_Ext, real::Log2)
TYPED_UNARY(FLog10_32, FLog10_64, FLog10_Ext, real::Log10)
TYPED_UNARY(FLogN32, FLogN64, FLogNExt, real::Logn)
TYPED_UNARY(FExpX32, FExpX64, FExpXExt, std::exp)
TYPED_UNARY(FPow10X32, FPow10X64, FPow10XExt, real::Pow10)
TYPED_UNARY(FPow2X32, FPow2X64, FPow2XExt, std::exp2)
TYPED_BINARY(FScaleX32, FScaleX64, FScaleXExt, real::Scale)
TYPED_BINARY(FATan2_32, FATan2_64, FATan2_Ext, real::Atan2)
TYPED_BINARY(FPowerX32, FPowerX64, FPowerXExt, std::pow)
TYPED_COMPLEX(FComplexRToP32, FComplexRToP64, FComplexRToPExt, cmplx::ToPolar)
TYPED_COMPLEX(FComplexPToR32, FComplexPToR64, FComplexPToRExt, cmplx::ToRectangular)

// ---- sums -----------------------------------------------------------------------------------------------------------

void Sum1DSingleArray(const float* first, int32 stride, int32 count, float* result) {
    *result = static_cast<float>(Sum(first, stride, count));
}

void Sum1DDoubleArray(const double* first, int32 stride, int32 count, double* result) {
    *result = static_cast<double>(Sum(first, stride, count));
}

void Sum1DExtendedArray(const floatExt* first, int32 stride, int32 count, floatExt* result) {
    *result = FromExtended(Sum(first, stride, count));
}
