// Time stamps of high resolution: the performance counter (HiResClock), and absolute time (ATime128) with its
// conversion from and to file times. Any thread; values are plain.
#ifndef TESSEL_TIME_BMTIME_H
#define TESSEL_TIME_BMTIME_H

#include <tessel/base/Types.h>

// 100 ns since 1601-01-01 00:00:00 UTC, as two words.
typedef struct FILETIME {
    uint32 dwLowDateTime;
    uint32 dwHighDateTime;
} FILETIME;

#ifdef __cplusplus

namespace tessel {

// A count of the performance counter, or a difference of two.
class TESSEL_API HiResClock {
public:
    HiResClock() = default;
    // Reads the performance counter.
    void SetToNow();
    // The count, as an unsigned number, in seconds.
    double ToSeconds() const;
    // The sum of the counts.
    HiResClock operator+(const HiResClock& other) const;
    // The difference of the counts.
    HiResClock operator-(const HiResClock& other) const;

private:
    uint64 count_ = 0;
};

// Seconds since 1904-01-01 00:00:00 UTC as one signed number with 64 fraction bits: a time before the epoch has
// negative seconds and a fraction that is not negative (-0.5 s is seconds -1, fraction 2^63).
class TESSEL_API ATime128 {
public:
    ATime128() = default;
    // Whole seconds, and a fraction in units of 2^-64 s.
    ATime128(int64 seconds, uint64 fraction) : fraction_(fraction), seconds_(seconds) {}
    // Exact, truncating toward zero below 2^-64 s. Infinities, NaNs and what is too large give the largest or, with the
    // sign bit set, the smallest value.
    explicit ATime128(double seconds);
    // The time in seconds, rounded.
    double ToDouble() const;

    // Null outputs are skipped.
    void Get(uint32* secondsHigh, uint32* secondsLow, uint32* fractionHigh, uint32* fractionLow) const;
    // The whole seconds.
    int64 GetInt64Seconds() const { return seconds_; }
    // The fraction in units of 2^-64 s.
    uint64 GetUInt64Fraction() const { return fraction_; }
    // Sets the whole seconds; the fraction stays.
    void SetInt64Seconds(const int64& seconds) { seconds_ = seconds; }
    // Sets the fraction; the seconds stay.
    void SetUInt64Fraction(const uint64& fraction) { fraction_ = fraction; }

    // Adds 2^-64 s.
    void IncrementLSB();

    // Each half alone; the fraction lies in [0, 1).
    double getSeconds() const;
    // The fraction alone, in [0, 1).
    double getFraction() const;

    // Modulo 2^128. The product is rounded half away from zero.
    ATime128 operator+(const ATime128& other) const;
    // The difference, modulo 2^128.
    ATime128 operator-(const ATime128& other) const;
    // The time with its sign changed, modulo 2^128.
    ATime128 operator-() const;
    // The product, modulo 2^128, rounded half away from zero.
    ATime128 operator*(const ATime128& other) const;
    // Whether the times are the same.
    bool operator==(const ATime128& other) const { return seconds_ == other.seconds_ && fraction_ == other.fraction_; }
    // Whether the times differ.
    bool operator!=(const ATime128& other) const { return !(*this == other); }

private:
    uint64 fraction_ = 0;
    int64 seconds_ = 0;
};

// From a count of 100 ns since 1601; to double precision, about half a microsecond these days.
TESSEL_API ATime128 ATime128FromHILOTime(const uint32& high, const uint32& low);
// From a FILETIME, to double precision.
TESSEL_API ATime128 ATime128FromFILETIME(const FILETIME& fileTime);

// Rounded down to 100 ns.
TESSEL_API FILETIME FILETIMEFromATime128(const ATime128& time);

// The time of the system's clock.
TESSEL_API ATime128 GetCurrentATime128();

}  // namespace tessel

#endif
#endif
