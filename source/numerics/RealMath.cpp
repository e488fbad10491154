// Every member comes in three precisions; the tables below give, a line each, the function that all three compute.
#include "numerics/RealFunctions.h"
#include <tessel/diagnostics/DebugStream.h>
#include <tessel/numerics/RealMath.h>

namespace tessel {
namespace {

template <class T>
void StoreIfWanted(T* destination, T value) {
    if (destination != nullptr) *destination = value;
}

void StoreIfWanted(floatExt* destination, Extended value) {
    if (destination != nullptr) *destination = FromExtended(value);
}

}  // namespace
}  // namespace tessel

using namespace tessel;

#define REAL_UNARY(NAME, FUNCTION)                        \
    void NAME##S(const float* x, float* result) {         \
        *result = FUNCTION(*x);                           \
    }                                                     \
    void NAME##D(const double* x, double* result) {       \
        *result = FUNCTION(*x);                           \
    }                                                     \
    void NAME##X(const floatExt* x, floatExt* result) {   \
        *result = FromExtended(FUNCTION(ToExtended(*x))); \
    }

#define REAL_BINARY_SD(NAME, FUNCTION)                               \
    void NAME##S(const float* x, const float* y, float* result) {    \
        *result = FUNCTION(*x, *y);                                  \
    }                                                                \
    void NAME##D(const double* x, const double* y, double* result) { \
        *result = FUNCTION(*x, *y);                                  \
    }

#define REAL_BINARY(NAME, FUNCTION)                                        \
    REAL_BINARY_SD(NAME, FUNCTION)                                         \
    void NAME##X(const floatExt* x, const floatExt* y, floatExt* result) { \
        *result = FromExtended(FUNCTION(ToExtended(*x), ToExtended(*y)));  \
    }

#define REAL_OPERATOR(NAME, OPERATOR)                                      \
    void NAME##S(const float* x, const float* y, float* result) {          \
        *result = *x OPERATOR(*y);                                         \
    }                                                                      \
    void NAME##D(const double* x, const double* y, double* result) {       \
        *result = *x OPERATOR(*y);                                         \
    }                                                                      \
    void NAME##X(const floatExt* x, const floatExt* y, floatExt* result) { \
        *result = FromExtended(ToExtended(*x) OPERATOR ToExtended(*y));    \
    }

// Two operands, two results: the members FIRST and SECOND of what FUNCTION returns.
#define REAL_BINARY_TWO(NAME, FUNCTION, FIRST, SECOND)                                      \
    void NAME##S(const float* x, const float* y, float* first, float* second) {             \
        const auto both = FUNCTION(*x, *y);                                                 \
        StoreIfWanted(first, both.FIRST);                                                   \
        StoreIfWanted(second, both.SECOND);                                                 \
    }                                                                                       \
    void NAME##D(const double* x, const double* y, double* first, double* second) {         \
        const auto both = FUNCTION(*x, *y);                                                 \
        StoreIfWanted(first, both.FIRST);                                                   \
        StoreIfWanted(second, both.SECOND);                                                 \
    }                                                                                       \
    void NAME##X(const floatExt* x, const floatExt* y, floatExt* first, floatExt* second) { \
        const auto both = FUNCTION(ToExtended(*x), ToExtended(*y));                         \
        StoreIfWanted(first, both.FIRST);                                                   \
        StoreIfWanted(second, both.SECOND);                                                 \
    }

#define REAL_TEST(NAME, CONDITION)               \
    int32 NAME##S(const float* operand) {        \
        const float x = *operand;                \
        return CONDITION ? 1 : 0;                \
    }                                            \
    int32 NAME##D(const double* operand) {       \
        const double x = *operand;               \
        return CONDITION ? 1 : 0;                \
    }                                            \
    int32 NAME##X(const floatExt* operand) {     \
        const Extended x = ToExtended(*operand); \
        return CONDITION ? 1 : 0;                \
    }

#define REAL_COMPARISON(NAME, OPERATOR)                        \
    int32 NAME##S(const float* x, const float* y) {            \
        return *x OPERATOR(*y) ? 1 : 0;                        \
    }                                                          \
    int32 NAME##D(const double* x, const double* y) {          \
        return *x OPERATOR(*y) ? 1 : 0;                        \
    }                                                          \
    int32 NAME##X(const floatExt* x, const floatExt* y) {      \
        return ToExtended(*x) OPERATOR ToExtended(*y) ? 1 : 0; \
    }

// ---- arithmetic and rounding ----------------------------------------------------------------------------------------

REAL_OPERATOR(RTfAdd, +)
REAL_OPERATOR(RTfSub, -)
REAL_OPERATOR(RTfMul, *)
REAL_OPERATOR(RTfDiv, /)
REAL_BINARY(RTfMod, real::Mod)
REAL_BINARY_SD(RTfRem, std::fmod)
REAL_BINARY_TWO(RTfQRem, real::QRem, quotient, remainder)
REAL_BINARY_TWO(RTfMaxMin, real::MaxMin, max, min)
REAL_UNARY(RTfAbs, std::fabs)
REAL_UNARY(RTfNeg, real::Neg)
REAL_UNARY(RTfInc, real::Inc)
REAL_UNARY(RTfDec, real::Dec)
REAL_UNARY(RTfRecip, real::Recip)
REAL_UNARY(RTfSqrt, std::sqrt)
REAL_UNARY(RTfSign, real::Sign)
REAL_UNARY(RTfRound, real::Round)
REAL_UNARY(RTfCeil, std::ceil)
REAL_UNARY(RTfFloor, std::floor)
REAL_BINARY(RTfiScale, real::Scale)

void RTfRemX(const floatExt*, const floatExt*, floatExt* result) {
    TESSEL_REPORT(kDebugFatal, 0x58E2D07Bu) << "RTfRemX not implemented on this platform";
    *result = FromExtended(real::NaN<Extended>());
}

// ---- logarithms -----------------------------------------------------------------------------------------------------

REAL_UNARY(RTfLogn, real::Logn)
REAL_UNARY(RTfLog10, real::Log10)
REAL_UNARY(RTfLog2, real::Log2)
REAL_UNARY(RTfLognp1, real::Lognp1)
REAL_BINARY(RTfLogx, real::Logx)

// ---- powers ---------------------------------------------------------------------------------------------------------

REAL_UNARY(RTfExp, std::exp)
REAL_UNARY(RTfExpm1, std::expm1)
REAL_UNARY(RTfPow10, real::Pow10)
REAL_UNARY(RTfPow2, std::exp2)
REAL_BINARY(RTfPowx, std::pow)

// ---- trigonometry ---------------------------------------------------------------------------------------------------

REAL_UNARY(RTfSin, real::Sin)
REAL_UNARY(RTfCos, real::Cos)
REAL_UNARY(RTfTan, real::Tan)
REAL_UNARY(RTfSec, real::Sec)
REAL_UNARY(RTfCsc, real::Csc)
REAL_UNARY(RTfCot, real::Cot)
REAL_UNARY(RTfSinc, real::Sinc)
REAL_UNARY(RTfAsin, std::asin)
REAL_UNARY(RTfAcos, std::acos)
REAL_UNARY(RTfAtan, std::atan)
REAL_BINARY(RTfAtan2, real::Atan2)
REAL_UNARY(RTfSinh, real::Sinh)
REAL_UNARY(RTfCosh, real::Cosh)
REAL_UNARY(RTfTanh, real::Tanh)
REAL_UNARY(RTfAsinh, real::Asinh)
REAL_UNARY(RTfAcosh, real::Acosh)
REAL_UNARY(RTfAtanh, real::Atanh)

// ---- one operand, two results ---------------------------------------------------------------------------------------

void RTfGetMantExpS(const float* x, float* mantissa, float* exponent) {
    const auto both = real::GetMantExp(*x);
    StoreIfWanted(mantissa, both.mantissa);
    StoreIfWanted(exponent, both.exponent);
}
void RTfGetMantExpD(const double* x, double* mantissa, double* exponent) {
    const auto both = real::GetMantExp(*x);
    StoreIfWanted(mantissa, both.mantissa);
    StoreIfWanted(exponent, both.exponent);
}
void RTfGetMantExpX(const floatExt* x, floatExt* mantissa, floatExt* exponent) {
    const auto both = real::GetMantExp(ToExtended(*x));
    StoreIfWanted(mantissa, both.mantissa);
    StoreIfWanted(exponent, both.exponent);
}

void RTfSinCosS(const float* x, float* sine, float* cosine) {
    const float angle = *x;
    if (sine != nullptr) *sine = real::Sin(angle);
    if (cosine != nullptr) *cosine = real::Cos(angle);
}
void RTfSinCosD(const double* x, double* sine, double* cosine) {
    const double angle = *x;
    if (sine != nullptr) *sine = real::Sin(angle);
    if (cosine != nullptr) *cosine = real::Cos(angle);
}
void RTfSinCosX(const floatExt* x, floatExt* sine, floatExt* cosine) {
    const Extended angle = ToExtended(*x);
    if (sine != nullptr) *sine = FromExtended(std::sin(angle));
    if (cosine != nullptr) *cosine = FromExtended(std::cos(angle));
}

// ---- predicates -----------------------------------------------------------------------------------------------------

REAL_TEST(RTfIsNan, std::isnan(x))
REAL_TEST(RTfEQ0, x == 0)
REAL_TEST(RTfNE0, x != 0)
REAL_TEST(RTfGE0, x >= 0)
REAL_TEST(RTfLE0, x <= 0)
REAL_TEST(RTfGT0, x > 0)
REAL_TEST(RTfLT0, x < 0)
REAL_COMPARISON(RTfEQ, ==)
REAL_COMPARISON(RTfNE, !=)
REAL_COMPARISON(RTfGE, >=)
REAL_COMPARISON(RTfLE, <=)
REAL_COMPARISON(RTfGT, >)
REAL_COMPARISON(RTfLT, <)
