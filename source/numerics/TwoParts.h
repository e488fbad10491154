// Values in two parts: the sum of both counts, with about twice the digits of one.
#pragma once

#include <tessel/base/Types.h>

#include <limits>

namespace tessel {

template <class W>
struct TwoParts {
    W high;
    W low;
};

// The sum a + b and what rounding took from it.
template <class W>
TwoParts<W> ExactSum(W a, W b) {
    const W sum = a + b;
    const W shifted = sum - a;
    return {sum, (a - (sum - shifted)) + (b - shifted)};
}

// The same where |a| >= |b|, or a is 0.
template <class W>
TwoParts<W> ExactSumOrdered(W a, W b) {
    const W sum = a + b;
    return {sum, b - (sum - a)};
}

// The product a * b and what rounding took from it; the factors must not be near the largest value.
template <class W>
TwoParts<W> ExactProduct(W a, W b) {
    constexpr W kSplitter = static_cast<W>((uint64{1} << (std::numeric_limits<W>::digits + 1) / 2) + 1);
    const auto upperHalf = [](W x) {
        const W scaled = kSplitter * x;
        return scaled - (scaled - x);
    };
    const W product = a * b;
    const W aHigh = upperHalf(a);
    const W bHigh = upperHalf(b);
    const W aLow = a - aHigh;
    const W bLow = b - bHigh;
    return {product, ((aHigh * bHigh - product) + aHigh * bLow + aLow * bHigh) + aLow * bLow};
}

}  // namespace tessel
