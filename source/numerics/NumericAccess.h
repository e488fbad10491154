/* Reading and writing values of any numeric type in memory, whatever their alignment. */
#pragma once

#include <cmath>
#include <cstring>
#include <limits>
#include <type_traits>

#include "numerics/Extended.h"

namespace tessel {

/* The nearest integer, halves to even; what lies outside the range saturates, a NaN gives the maximum. */
template <class Int, class Real>
Int SaturatedRound(Real x) {
    constexpr Int kMax = std::numeric_limits<Int>::max();
    constexpr Int kMin = std::numeric_limits<Int>::min();
    if (!(x < static_cast<Real>(kMax))) return kMax;
    if (x <= static_cast<Real>(kMin)) return kMin;
    if constexpr (std::is_same_v<Int, uint64>) {
        return static_cast<uint64>(std::nearbyint(x));
    } else {
        return static_cast<Int>(std::llrint(x));
    }
}

template <class T>
T ReadAs(const void* source) {
    T value;
    std::memcpy(&value, source, sizeof value);
    return value;
}

template <class T>
void WriteAs(void* destination, T value) {
    std::memcpy(destination, &value, sizeof value);
}

/* The low four bits of a type code select the type. */
inline int16 TypeOfCode(int16 code) {
    return static_cast<int16>(code & 15);
}

/* The bits of an integer, sign- or zero-extended; 0 for a type that is not an integer. */
uint64 ReadInteger(int16 type, const void* source);

/* Writes the low bytes. */
void WriteInteger(int16 type, uint64 value, void* destination);

/* The value of an integer or real, or one part of a complex value. */
struct ExtendedComplex {
    Extended re;
    Extended im;
};
ExtendedComplex ReadNumber(int16 type, const void* source);

/* Writes by the store rules: integers saturate, narrower reals round. Types that are not complex take the real part. */
void WriteNumber(int16 type, const ExtendedComplex& value, void* destination);

}  // namespace tessel
