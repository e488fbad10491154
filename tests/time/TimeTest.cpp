#include "support/HandClock.h"
#include "support/Test.h"
#include "time/ClockMode.h"
#include <tessel/time/BMTime.h>
#include <tessel/time/HRTime.h>
#include <tessel/time/Millisecs.h>

#include <cmath>
#include <limits>

namespace tessel::test {
namespace {

constexpr uint64 kEpoch = 95616288000000000;

TEST(Millisecs, CompareAcrossTheWrap) {
    EXPECT_EACH(MillisecCmp(5, 0xFFFFFFFB) == 10, MillisecCmp(0xFFFFFFFB, 5) == -10, MillisecCmp(7, 7) == 0);
    test::HandClock clock((int64{1} << 32) - 3);
    EXPECT_EQ(0xFFFFFFFDu, MilliSecs());
    clock.Advance(8);
    EXPECT_EQ(5u, MilliSecs());
}

TEST(HRTime, CountsInTwoWords) {
    _HRTime t, one{0, 1}, carry{1, 0}, most{0, 0xFFFFFFFF}, large{0x80000000, 0}, five{0, 5};
    HRTimeSubtract(&carry, &one, &t);
    EXPECT_EQ(0, HRTimeCompare(&most, &t));
    HRTimeAdd(&t, &one, &t);
    EXPECT_EACH(HRTimeCompare(&carry, &t) == 0, HRTimeCompare(&large, &five) == 1, HRTimeCompare(&five, &most) == -1);
    HRTimeZero(&t);
    HRTimeSubtract(&t, &one, &t);
    EXPECT_EQ(0xFFFFFFFFu, t.high & t.low);
}

TEST(HRTime, DependsOnTheMode) {
    EXPECT_EACH(SecondsOf({0, 10000000}, ClockMode::kProcessTime) == 1.0, SecondsOf({0, 1000}, ClockMode::kTick) == 1.0,
                SecondsOf({1, 0}, ClockMode::kTick) == 4294967.296);
    const auto count = [](double seconds, ClockMode mode) {
        const _HRTime t = TimeOf(seconds, mode);
        return uint64{t.high} << 32 | t.low;
    };
    EXPECT_EACH(count(1.5, ClockMode::kProcessTime) == 15000000u, count(1.5, ClockMode::kTick) == 1500u,
                count(1e6, ClockMode::kProcessTime) == 10000000000000u, count(-0.001, ClockMode::kTick) == 0xFFFFFFFFu,
                (count(1e300, ClockMode::kTick) >> 32) == 0u, CurrentClockMode() == ClockMode::kTick);
    _HRTime before = ReadClock(ClockMode::kProcessTime);
    for (volatile int work = 0; work < 1000000;) work = work + 1;
    _HRTime after = ReadClock(ClockMode::kProcessTime);
    EXPECT_EACH(HRTimeCompare(&after, &before) >= 0, SecondsOf(after, ClockMode::kProcessTime) < 1e6);
}

TEST(HRTime, CountsTheWrapsOfTheTick) {
    std::atomic<uint32> state{0};
    for (uint32 wrap = 0; wrap < 600; ++wrap)
        for (uint32 tick : {0u, 77u, 0x80000000u, 0xFFFFFF00u}) {
            _HRTime t = ExtendTick(state, tick);
            ASSERT_EQ(wrap % 256, t.high);
            ASSERT_EQ(tick, t.low);
        }
    test::HandClock clock(1234567);
    _HRTime start, end;
    HRWallClockTime(&start);  // the tick, on this host
    clock.Advance(1500);
    HRWallClockTime(&end);
    HRTimeSubtract(&end, &start, &end);
    EXPECT_EQ(1.5, HRTimeToSeconds(&end));
    SecondsToHRTime(1.5, &start);
    EXPECT_EQ(0, HRTimeCompare(&start, &end));
}

TEST(HiResClock, MeasuresInSeconds) {
    test::HandClock hands(10000);
    HiResClock before, after;
    before.SetToNow();
    hands.Advance(2500);
    after.SetToNow();
    EXPECT_DOUBLE_EQ(2.5, (after - before).ToSeconds());
    EXPECT_DOUBLE_EQ(12.5, (before + (after - before)).ToSeconds());
    EXPECT_GT((before - after).ToSeconds(), 1e9);  // an unsigned difference
}

FILETIME FileTimeOf(uint64 count) {
    return {static_cast<uint32>(count), static_cast<uint32>(count >> 32)};
}
uint64 CountOf(const FILETIME& t) {
    return static_cast<uint64>(t.dwHighDateTime) << 32 | t.dwLowDateTime;
}

TEST(ATime128, HoldsSecondsAndFraction) {
    ATime128 t(5, UINT64_MAX);
    t.IncrementLSB();
    EXPECT_EQ(ATime128(6, 0), t);
    ATime128 half(-1, uint64{1} << 63);
    EXPECT_EACH(half.getSeconds() == -1.0, half.getFraction() == 0.5, half.ToDouble() == -0.5,
                ATime128(0, UINT64_MAX).getFraction() < 1.0, ATime128(0, 1).getFraction() == 0x1p-64);
    t.SetInt64Seconds(0x0102030405060708);
    t.SetUInt64Fraction(0x1112131415161718);
    uint32 words[4];
    t.Get(&words[0], &words[1], &words[2], &words[3]);
    t.Get(nullptr, nullptr, nullptr, nullptr);
    EXPECT_THAT(words, ElementsAre(0x01020304u, 0x05060708u, 0x11121314u, 0x15161718u));
}

TEST(ATime128, ConvertsDoublesExactly) {
    std::mt19937_64 random(3);
    for (int i = 0; i < 20000; ++i) {
        double value = std::ldexp(static_cast<double>(random() >> 11), static_cast<int>(random() % 100) - 90);
        if (random() % 2) value = -value;
        ATime128 t(value);
        // The integer and the fraction in units of 2^-64, which lose nothing above that.
        double whole = std::trunc(value), fraction = std::trunc(std::ldexp(std::fabs(value - whole), 64));
        ATime128 expected(static_cast<int64>(std::fabs(whole)), static_cast<uint64>(fraction));
        ASSERT_EQ(value < 0 ? -expected : expected, t) << value;
        double kept = whole + std::copysign(std::ldexp(fraction, -64), value);
        ASSERT_EQ(kept, t.ToDouble()) << value;
    }
    constexpr double kInfinity = std::numeric_limits<double>::infinity();
    const ATime128 largest(INT64_MAX, UINT64_MAX), smallest(INT64_MIN, 0);
    for (double huge : {kInfinity, 1e300, 9.3e18, std::nan("")}) EXPECT_EQ(largest, ATime128(huge));
    for (double huge : {-kInfinity, -1e300, -9.3e18, std::copysign(std::nan(""), -1.0)})
        EXPECT_EQ(smallest, ATime128(huge));
    EXPECT_EACH(smallest == ATime128(-9223372036854775808.0), smallest.ToDouble() == -9223372036854775808.0,
                ATime128() == ATime128(5e-324));
}

TEST(ATime128, MultipliesAndRounds) {
    // 2.75 x -3.5 by hand, and a product that rounds: 2^-33 x 3 x 2^-32 = 1.5 x 2^-64, half up.
    EXPECT_EACH(ATime128(-9.625) == ATime128(2.75) * ATime128(-3.5),
                ATime128(0, 2) == ATime128(0, uint64{1} << 31) * ATime128(0, uint64{3} << 32),
                -ATime128(0, 2) == ATime128(0, uint64{1} << 31) * -ATime128(0, uint64{3} << 32));
}

#ifdef __SIZEOF_INT128__
__extension__ typedef unsigned __int128 UInt128;  // modulo 2^128, as ATime128

UInt128 Exact(const ATime128& t) {
    return (UInt128{static_cast<uint64>(t.GetInt64Seconds())} << 64) + t.GetUInt64Fraction();
}

// Bits 64 to 191 of the product of magnitudes, rounded by bit 63, with the sign: by halves of 64 bits.
UInt128 ExactProduct(const ATime128& a, const ATime128& b) {
    constexpr UInt128 kLow = UINT64_MAX;
    const bool negative = (a.GetInt64Seconds() < 0) != (b.GetInt64Seconds() < 0);
    const UInt128 x = a.GetInt64Seconds() < 0 ? -Exact(a) : Exact(a),
                  y = b.GetInt64Seconds() < 0 ? -Exact(b) : Exact(b);
    const UInt128 low = (x & kLow) * (y & kLow), first = (x & kLow) * (y >> 64), second = (x >> 64) * (y & kLow);
    const UInt128 middle = (low >> 64) + (first & kLow) + (second & kLow);
    const UInt128 high = (x >> 64) * (y >> 64) + (first >> 64) + (second >> 64) + (middle >> 64);
    const UInt128 product = (high << 64) + (middle & kLow) + ((low >> 63) & 1);
    return negative ? -product : product;
}

TEST(ATime128, CalculatesAsExactIntegers) {
    std::mt19937_64 random(5);
    // Of every size, so that all carries and the rounding are met, not only those of the largest numbers.
    auto any = [&] {
        const UInt128 bits = ((UInt128{random()} << 64) + random()) >> (random() % 127);
        const ATime128 t(static_cast<int64>(bits >> 64), static_cast<uint64>(bits));
        return random() % 2 ? -t : t;
    };
    int64 wrong = 0;
    for (int i = 0; i < 1000000; ++i) {
        const ATime128 a = any(), b = any();
        ATime128 next = a;
        next.IncrementLSB();
        const double value = a.ToDouble();
        wrong += Exact(a) + Exact(b) != Exact(a + b) || Exact(a) - Exact(b) != Exact(a - b) || -Exact(a) != Exact(-a) ||
                 Exact(a) + 1 != Exact(next) || ExactProduct(a, b) != Exact(a * b);
        // A double keeps 53 bits: what it stands for is at most one bit of those away, and goes back unchanged.
        const UInt128 size = a.GetInt64Seconds() < 0 ? -Exact(a) : Exact(a), kept = Exact(ATime128(std::fabs(value)));
        wrong += (kept > size ? kept - size : size - kept) > size >> 52 || ATime128(value).ToDouble() != value;
    }
    EXPECT_EQ(0, wrong);
}
#endif

TEST(ATime128, ConvertsFileTimes) {
    EXPECT_EACH(CountOf(FILETIMEFromATime128(ATime128())) == kEpoch,
                ATime128() == ATime128FromFILETIME(FileTimeOf(kEpoch)));
    EXPECT_EQ(kEpoch - 1, CountOf(FILETIMEFromATime128(-ATime128(0, 1))));  // rounded down
    // 2000-01-01 00:00:00 UTC lies 125911584000000000 x 100 ns after 1601, 3029529600 s after 1904.
    EXPECT_EQ(ATime128(3029529600, 0), ATime128FromFILETIME(FileTimeOf(125911584000000000)));
    EXPECT_EQ(125911584000000000u, CountOf(FILETIMEFromATime128(ATime128(3029529600, 0))));
    std::mt19937_64 random(9);
    for (int i = 0; i < 10000; ++i) {
        uint64 count = random() % (uint64{1} << 58);
        ATime128 t = ATime128FromHILOTime(static_cast<uint32>(count >> 32), static_cast<uint32>(count));
        double seconds = (static_cast<double>(count) - static_cast<double>(kEpoch)) / 1e7;
        ASSERT_NEAR(seconds, t.ToDouble(), 8e-6);
        uint64 back = CountOf(FILETIMEFromATime128(t));
        ASSERT_LE(back > count ? back - count : count - back, 64u) << count;
    }
    test::HandClock clock(1000);  // 1970-01-01 00:00:01 UTC
    EXPECT_EQ(ATime128(2082844801, 0), GetCurrentATime128());
}

}  // namespace
}  // namespace tessel::test
