// Quotients and remainders of integers.
#include <tessel/numerics/IntegerMath.h>

#include <limits>

namespace tessel {
namespace {

template <class T>
void Divide(T x, T y, T* quotient, T* remainder) {
    T q = 0;
    T r = x;
    if (std::numeric_limits<T>::is_signed && x == std::numeric_limits<T>::min() && y == static_cast<T>(-1)) {
        q = x;  // the one quotient that does not fit
        r = 0;
    } else if (y != 0) {
        q = x / y;
        r = x % y;
    }
    if (quotient != nullptr) *quotient = q;
    if (remainder != nullptr) *remainder = r;
}

}  // namespace
}  // namespace tessel

int32 RTiMul(int32 x, int32 y) {
    return static_cast<int32>(static_cast<uint32>(x) * static_cast<uint32>(y));
}

uint32 RTuMul(uint32 x, uint32 y) {
    return x * y;
}

int32 RTiDiv(int32 x, int32 y) {
    return static_cast<int32>(int64{x} / y);
}

uint32 RTuDiv(uint32 x, uint32 y) {
    return x / y;
}

void RTQRemiQ(int64 x, int64 y, int64* quotient, int64* remainder) {
    tessel::Divide(x, y, quotient, remainder);
}

void RTQRemuQ(uint64 x, uint64 y, uint64* quotient, uint64* remainder) {
    tessel::Divide(x, y, quotient, remainder);
}
