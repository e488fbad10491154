// Rounding to integers and to multiples.
#include "numerics/NumericAccess.h"
#include <tessel/numerics/RoundingUtil.h>

using namespace tessel;

int32 RndToInc(int32 x, int32 increment) {
    const int64 half = increment / 2;
    return static_cast<int32>((x >= 0 ? x + half : x - half) / increment * increment);
}

int32 RndToNearest(double x) {
    return SaturatedRound<int32>(x);
}

int64 RndToNearestI64(double x) {
    return SaturatedRound<int64>(x);
}

uint32 RndToNearestU32(double x) {
    return SaturatedRound<uint32>(x);
}

uint64 RndToNearestU64(double x) {
    return SaturatedRound<uint64>(x);
}

double UInt64ToFloat64(uint64 value) {
    return static_cast<double>(value);
}

int8 Float64ToInt8(double x) {
    return SaturatedRound<int8>(x);
}

int16 Float64ToInt16(double x) {
    return SaturatedRound<int16>(x);
}

int32 Float64ToInt32(double x) {
    return SaturatedRound<int32>(x);
}

int64 Float64ToInt64(double x) {
    return SaturatedRound<int64>(x);
}

uint8 Float64ToUInt8(double x) {
    return SaturatedRound<uint8>(x);
}

uint16 Float64ToUInt16(double x) {
    return SaturatedRound<uint16>(x);
}

uint32 Float64ToUInt32(double x) {
    return SaturatedRound<uint32>(x);
}

uint64 Float64ToUInt64(double x) {
    return SaturatedRound<uint64>(x);
}
