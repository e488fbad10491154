// Every member comes in three precisions; the tables below give, a line each, the function that all three compute.
#include "numerics/ComplexFunctions.h"
#include <tessel/numerics/ComplexMath.h>

namespace tessel {
namespace {

using std::complex;

// An operand in its own precision, for what is exact or rounds once anyway.
float Native(float x) {
    return x;
}
double Native(double x) {
    return x;
}
Extended Native(const floatExt& x) {
    return ToExtended(x);
}
complex<float> Native(const cmplx64& z) {
    return {z.re, z.im};
}
complex<double> Native(const cmplx128& z) {
    return {z.re, z.im};
}
complex<Extended> Native(const cmplxExt& z) {
    return {ToExtended(z.re), ToExtended(z.im)};
}

// An operand in the precision to compute in.
template <class Real>
auto Wide(const Real& x) {
    return real::InWider(Native(x));
}
complex<double> Wide(const cmplx64& z) {
    return {z.re, z.im};
}
complex<Extended> Wide(const cmplx128& z) {
    return {z.re, z.im};
}
complex<Extended> Wide(const cmplxExt& z) {
    return Native(z);
}

// A null result is not stored.
template <class W>
void Store(W x, float* result) {
    if (result != nullptr) *result = static_cast<float>(x);
}
template <class W>
void Store(W x, double* result) {
    if (result != nullptr) *result = static_cast<double>(x);
}
void Store(Extended x, floatExt* result) {
    if (result != nullptr) *result = FromExtended(x);
}
template <class W, class Z>
void StoreComplex(const complex<W>& z, Z* result) {
    if (result == nullptr) return;
    Store(z.real(), &result->re);
    Store(z.imag(), &result->im);
}

template <class Z, class R>
void Scale(const Z& x, const R& n, Z* result) {
    const auto z = Native(x);
    const auto power = Native(n);
    StoreComplex(complex(real::Scale(z.real(), power), real::Scale(z.imag(), power)), result);
}

template <class Z, class R>
void Polar(const Z& x, R* magnitude, R* angle) {
    const auto z = Wide(x);
    Store(cmplx::Magnitude(z), magnitude);
    Store(cmplx::Angle(z), angle);
}

template <class R, class Z>
void FromPolar(const R& magnitude, const R& angle, Z* result) {
    StoreComplex(cmplx::ToRectangular(complex(Wide(magnitude), Wide(angle))), result);
}

template <class Z>
void SinCos(const Z& x, Z* sine, Z* cosine) {
    const auto z = Wide(x);
    if (sine != nullptr) StoreComplex(std::sin(z), sine);
    if (cosine != nullptr) StoreComplex(std::cos(z), cosine);
}

}  // namespace
}  // namespace tessel

using namespace tessel;

#define ALL_PRECISIONS(MEMBER, ...)          \
    MEMBER(S, float, cmplx64, __VA_ARGS__)   \
    MEMBER(D, double, cmplx128, __VA_ARGS__) \
    MEMBER(X, floatExt, cmplxExt, __VA_ARGS__)

// A function of one value or two, computed in the wider precision.
#define UNARY_MEMBER(P, REAL, COMPLEX, NAME, FUNCTION) \
    void NAME##P(const COMPLEX* x, COMPLEX* result) {  \
        StoreComplex(FUNCTION(Wide(*x)), result);      \
    }
#define BINARY_MEMBER(P, REAL, COMPLEX, NAME, FUNCTION)                 \
    void NAME##P(const COMPLEX* x, const COMPLEX* y, COMPLEX* result) { \
        StoreComplex(FUNCTION(Wide(*x), Wide(*y)), result);             \
    }
#define COMPLEX_UNARY(NAME, FUNCTION) ALL_PRECISIONS(UNARY_MEMBER, NAME, FUNCTION)
#define COMPLEX_BINARY(NAME, FUNCTION) ALL_PRECISIONS(BINARY_MEMBER, NAME, FUNCTION)

// The real and imaginary part of the result, from z = x + yi in its own precision.
#define PARTS_MEMBER(P, REAL, COMPLEX, NAME, REAL_PART, IMAGINARY_PART) \
    void NAME##P(const COMPLEX* operand, COMPLEX* result) {             \
        const auto z = Native(*operand);                                \
        const auto x = z.real();                                        \
        const auto y = z.imag();                                        \
        StoreComplex(std::complex(REAL_PART, IMAGINARY_PART), result);  \
    }
#define COMPLEX_PARTS(NAME, REAL_PART, IMAGINARY_PART) ALL_PRECISIONS(PARTS_MEMBER, NAME, REAL_PART, IMAGINARY_PART)

// A condition on x + yi.
#define TEST_MEMBER(P, REAL, COMPLEX, NAME, CONDITION) \
    int32 NAME##P(const COMPLEX* operand) {            \
        const auto z = Native(*operand);               \
        const auto x = z.real();                       \
        const auto y = z.imag();                       \
        return CONDITION ? 1 : 0;                      \
    }
#define COMPARISON_MEMBER(P, REAL, COMPLEX, NAME, OPERATOR) \
    int32 NAME##P(const COMPLEX* x, const COMPLEX* y) {     \
        return Native(*x) OPERATOR Native(*y) ? 1 : 0;      \
    }
#define COMPLEX_TEST(NAME, CONDITION) ALL_PRECISIONS(TEST_MEMBER, NAME, CONDITION)
#define COMPLEX_COMPARISON(NAME, OPERATOR) ALL_PRECISIONS(COMPARISON_MEMBER, NAME, OPERATOR)

// ---- arithmetic and rounding ----------------------------------------------------------------------------------------

#define OPERATOR_MEMBER(P, REAL, COMPLEX, NAME, OPERATOR)               \
    void NAME##P(const COMPLEX* x, const COMPLEX* y, COMPLEX* result) { \
        StoreComplex(Native(*x) OPERATOR Native(*y), result);           \
    }
ALL_PRECISIONS(OPERATOR_MEMBER, RTcAdd, +)
ALL_PRECISIONS(OPERATOR_MEMBER, RTcSub, -)
COMPLEX_BINARY(RTcMul, cmplx::Multiply)
COMPLEX_BINARY(RTcDiv, cmplx::Divide)
COMPLEX_UNARY(RTcRecip, cmplx::Recip)
COMPLEX_PARTS(RTcNeg, -x, -y)
COMPLEX_PARTS(RTcConj, x, -y)
COMPLEX_PARTS(RTcInc, x + 1, y)
COMPLEX_PARTS(RTcDec, x - 1, y)
COMPLEX_UNARY(RTcSqrt, std::sqrt)
COMPLEX_UNARY(RTcSign, cmplx::Sign)
COMPLEX_PARTS(RTcRound, real::Round(x), real::Round(y))
COMPLEX_PARTS(RTcCeil, std::ceil(x), std::ceil(y))
COMPLEX_PARTS(RTcFloor, std::floor(x), std::floor(y))

#define SCALE_MEMBER(P, REAL, COMPLEX, NAME)                         \
    void NAME##P(const COMPLEX* x, const REAL* n, COMPLEX* result) { \
        Scale(*x, *n, result);                                       \
    }
ALL_PRECISIONS(SCALE_MEMBER, RTciScale)

// ---- forms ----------------------------------------------------------------------------------------------------------

#define MAGNITUDE_MEMBER(P, REAL, COMPLEX, NAME)   \
    void NAME##P(const COMPLEX* x, REAL* result) { \
        Store(cmplx::Magnitude(Wide(*x)), result); \
    }
#define TO_POLAR_MEMBER(P, REAL, COMPLEX, NAME)                    \
    void NAME##P(const COMPLEX* x, REAL* magnitude, REAL* angle) { \
        Polar(*x, magnitude, angle);                               \
    }
#define FROM_POLAR_MEMBER(P, REAL, COMPLEX, NAME)                             \
    void NAME##P(const REAL* magnitude, const REAL* angle, COMPLEX* result) { \
        FromPolar(*magnitude, *angle, result);                                \
    }
#define TO_PARTS_MEMBER(P, REAL, COMPLEX, NAME)          \
    void NAME##P(const COMPLEX* x, REAL* re, REAL* im) { \
        const COMPLEX z = *x;                            \
        if (re != nullptr) *re = z.re;                   \
        if (im != nullptr) *im = z.im;                   \
    }
#define FROM_PARTS_MEMBER(P, REAL, COMPLEX, NAME)                   \
    void NAME##P(const REAL* re, const REAL* im, COMPLEX* result) { \
        *result = COMPLEX{*re, *im};                                \
    }
ALL_PRECISIONS(MAGNITUDE_MEMBER, RTcAbs)
COMPLEX_UNARY(RTcRToP, cmplx::ToPolar)
COMPLEX_UNARY(RTcPToR, cmplx::ToRectangular)
ALL_PRECISIONS(TO_POLAR_MEMBER, RTcfCToRTh)
ALL_PRECISIONS(FROM_POLAR_MEMBER, RTfcRThToC)
ALL_PRECISIONS(TO_PARTS_MEMBER, RTcfCToReIm)
ALL_PRECISIONS(FROM_PARTS_MEMBER, RTfcReImToC)

// ---- logarithms and powers ------------------------------------------------------------------------------------------

COMPLEX_UNARY(RTcLogn, cmplx::Logn)
COMPLEX_UNARY(RTcLog10, cmplx::Log10)
COMPLEX_UNARY(RTcLog2, cmplx::Log2)
COMPLEX_UNARY(RTcLognp1, cmplx::Lognp1)
COMPLEX_BINARY(RTcLogx, cmplx::Logx)
COMPLEX_UNARY(RTcExp, std::exp)
COMPLEX_UNARY(RTcExpm1, cmplx::Expm1)
COMPLEX_UNARY(RTcPow10, cmplx::Pow10)
COMPLEX_UNARY(RTcPow2, cmplx::Pow2)
COMPLEX_BINARY(RTcPowx, cmplx::Powx)

// ---- trigonometry ---------------------------------------------------------------------------------------------------

#define SINCOS_MEMBER(P, REAL, COMPLEX, NAME)                        \
    void NAME##P(const COMPLEX* x, COMPLEX* sine, COMPLEX* cosine) { \
        SinCos(*x, sine, cosine);                                    \
    }
COMPLEX_UNARY(RTcSin, std::sin)
COMPLEX_UNARY(RTcCos, std::cos)
COMPLEX_UNARY(RTcTan, std::tan)
ALL_PRECISIONS(SINCOS_MEMBER, RTcSinCos)
COMPLEX_UNARY(RTcSec, cmplx::Sec)
COMPLEX_UNARY(RTcCsc, cmplx::Csc)
COMPLEX_UNARY(RTcCot, cmplx::Cot)
COMPLEX_UNARY(RTcSinc, cmplx::Sinc)
COMPLEX_UNARY(RTcAsin, std::asin)
COMPLEX_UNARY(RTcAcos, std::acos)
COMPLEX_UNARY(RTcAtan, std::atan)
COMPLEX_BINARY(RTcAtan2, cmplx::Atan2)
COMPLEX_UNARY(RTcSinh, std::sinh)
COMPLEX_UNARY(RTcCosh, std::cosh)
COMPLEX_UNARY(RTcTanh, std::tanh)
COMPLEX_UNARY(RTcAsinh, std::asinh)
COMPLEX_UNARY(RTcAcosh, std::acosh)
COMPLEX_UNARY(RTcAtanh, std::atanh)

// ---- predicates -----------------------------------------------------------------------------------------------------

COMPLEX_TEST(RTcIsNan, std::isnan(x) || std::isnan(y))
COMPLEX_TEST(RTcEQ0, x == 0 && y == 0)
COMPLEX_TEST(RTcNE0, x != 0 || y != 0)
COMPLEX_COMPARISON(RTcEQ, ==)
COMPLEX_COMPARISON(RTcNE, !=)
