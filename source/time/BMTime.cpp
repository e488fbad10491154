#include "platform/Clock.h"
#include <tessel/time/BMTime.h>

#include <algorithm>
#include <cstring>

namespace tessel {
namespace {

constexpr double kTwoTo32 = 4294967296.0;
constexpr double kTwoToMinus64 = 1.0 / (kTwoTo32 * kTwoTo32);
constexpr int64 kFileTimesPerSecond = 10000000;
constexpr int64 kEpochOffset = 95616288000000000;  // file time of 1904-01-01 00:00:00 UTC

uint32 High(uint64 value) {
    return static_cast<uint32>(value >> 32);
}
uint32 Low(uint64 value) {
    return static_cast<uint32>(value);
}

// The largest and the smallest value.
ATime128 Extreme(bool negative) {
    return negative ? ATime128(INT64_MIN, 0) : ATime128(INT64_MAX, UINT64_MAX);
}

// significand x 2^shift in units of 2^-64 s, truncated; the largest value when it does not fit.
ATime128 Place(uint64 significand, int shift) {
    constexpr int kSignificandBits = 53;
    if (significand == 0 || shift <= -kSignificandBits) return {};
    if (shift < 0) return ATime128(0, significand >> -shift);
    if (shift + kSignificandBits > 127) return Extreme(false);
    if (shift >= 64) return ATime128(static_cast<int64>(significand << (shift - 64)), 0);
    const uint64 seconds = shift == 0 ? 0 : significand >> (64 - shift);
    return ATime128(static_cast<int64>(seconds), significand << shift);
}

// Adds a x b, 32 bits each, to a little-endian number at a given word.
void AddProduct(uint32 (&number)[8], int word, uint32 a, uint32 b) {
    uint64 carry = static_cast<uint64>(a) * b;
    for (; carry != 0 && word < 8; ++word) {
        const uint64 sum = static_cast<uint64>(number[word]) + Low(carry);
        number[word] = Low(sum);
        carry = (carry >> 32) + (sum >> 32);
    }
}

}  // namespace

void HiResClock::SetToNow() {
    count_ = platform::HighResolutionCount();
}

double HiResClock::ToSeconds() const {
    static const double kSecondsPerCount = 1.0 / static_cast<double>(platform::HighResolutionFrequency());
    return static_cast<double>(count_) * kSecondsPerCount;
}

HiResClock HiResClock::operator+(const HiResClock& other) const {
    HiResClock sum;
    sum.count_ = count_ + other.count_;
    return sum;
}

HiResClock HiResClock::operator-(const HiResClock& other) const {
    HiResClock difference;
    difference.count_ = count_ - other.count_;
    return difference;
}

ATime128::ATime128(double seconds) {
    constexpr uint64 kHiddenBit = uint64{1} << 52;
    constexpr int kUnitExponent = 1011;  // biased exponent at which the significand counts units of 2^-64
    constexpr int kInfinityOrNaN = 2047;
    uint64 bits;
    std::memcpy(&bits, &seconds, sizeof bits);
    const bool negative = (bits >> 63) != 0;
    const int exponent = static_cast<int>((bits >> 52) & kInfinityOrNaN);
    if (exponent == kInfinityOrNaN) {
        *this = Extreme(negative);
        return;
    }
    *this = Place((bits & (kHiddenBit - 1)) | kHiddenBit, exponent - kUnitExponent);
    if (negative) *this = *this == Extreme(false) ? Extreme(true) : -*this;
}

double ATime128::ToDouble() const {
    if (seconds_ < 0 && *this != Extreme(true)) return -(-*this).ToDouble();
    const uint64 seconds = static_cast<uint64>(seconds_);  // the smallest value is its own negative: 2^63
    double value =
        Low(fraction_) * kTwoToMinus64 + High(fraction_) / kTwoTo32 + Low(seconds) + High(seconds) * kTwoTo32;
    return seconds_ < 0 ? -value : value;
}

void ATime128::Get(uint32* secondsHigh, uint32* secondsLow, uint32* fractionHigh, uint32* fractionLow) const {
    const uint64 seconds = static_cast<uint64>(seconds_);
    if (secondsHigh) *secondsHigh = High(seconds);
    if (secondsLow) *secondsLow = Low(seconds);
    if (fractionHigh) *fractionHigh = High(fraction_);
    if (fractionLow) *fractionLow = Low(fraction_);
}

void ATime128::IncrementLSB() {
    *this = *this + ATime128(0, 1);
}

double ATime128::getSeconds() const {
    return static_cast<double>(seconds_);
}

double ATime128::getFraction() const {
    // A double holds 53 bits: what would round up to 1 stays below it.
    constexpr double kBelowOne = 1.0 - 0x1p-53;
    return std::min(static_cast<double>(fraction_) * kTwoToMinus64, kBelowOne);
}

ATime128 ATime128::operator+(const ATime128& other) const {
    const uint64 fraction = fraction_ + other.fraction_;
    const uint64 carry = fraction < fraction_ ? 1 : 0;
    const uint64 seconds = static_cast<uint64>(seconds_) + static_cast<uint64>(other.seconds_) + carry;
    return ATime128(static_cast<int64>(seconds), fraction);
}

ATime128 ATime128::operator-() const {
    const uint64 seconds = ~static_cast<uint64>(seconds_) + (fraction_ == 0 ? 1 : 0);
    return ATime128(static_cast<int64>(seconds), ~fraction_ + 1);
}

ATime128 ATime128::operator-(const ATime128& other) const {
    return *this + -other;
}

ATime128 ATime128::operator*(const ATime128& other) const {
    uint32 a[4], b[4], product[8] = {};
    (seconds_ < 0 ? -*this : *this).Get(&a[3], &a[2], &a[1], &a[0]);
    (other.seconds_ < 0 ? -other : other).Get(&b[3], &b[2], &b[1], &b[0]);
    for (int i = 0; i < 4; ++i)
        for (int j = 0; j < 4; ++j) AddProduct(product, i + j, a[i], b[j]);
    // The middle 128 of the 256 bits, rounded by the bit below.
    ATime128 result(static_cast<int64>((static_cast<uint64>(product[5]) << 32) | product[4]),
                    (static_cast<uint64>(product[3]) << 32) | product[2]);
    if (product[1] & 0x80000000u) result.IncrementLSB();
    return (seconds_ < 0) != (other.seconds_ < 0) ? -result : result;
}

ATime128 ATime128FromHILOTime(const uint32& high, const uint32& low) {
    const uint64 fileTime = (static_cast<uint64>(high) << 32) | low;
    ATime128 sinceEpoch(static_cast<int64>(fileTime - static_cast<uint64>(kEpochOffset)), 0);
    return ATime128(sinceEpoch.ToDouble() / static_cast<double>(kFileTimesPerSecond));
}

ATime128 ATime128FromFILETIME(const FILETIME& fileTime) {
    return ATime128FromHILOTime(fileTime.dwHighDateTime, fileTime.dwLowDateTime);
}

FILETIME FILETIMEFromATime128(const ATime128& time) {
    ATime128 fileTime = time * ATime128(kFileTimesPerSecond, 0) + ATime128(kEpochOffset, 0);
    const uint64 count = static_cast<uint64>(fileTime.GetInt64Seconds());
    return FILETIME{Low(count), High(count)};
}

ATime128 GetCurrentATime128() {
    const uint64 now = static_cast<uint64>(platform::SystemFileTime());
    return ATime128FromHILOTime(High(now), Low(now));
}

}  // namespace tessel
