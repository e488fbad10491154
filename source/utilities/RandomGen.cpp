// The random generator of the process, and those with a state of the caller's.
#include "sync/LibraryMutex.h"
#include <tessel/time/Millisecs.h>
#include <tessel/utilities/RandomGen.h>

namespace {

struct Seeds {
    int32 s[3];
};

tessel::LibraryMutex randomMutex;  // nothing is taken inside
Seeds currentSeeds TESSEL_GUARDED_BY(randomMutex) = {};

// 15 bits a step, from a first seed that is not 0.
Seeds SeedsFrom(int32 first) {
    constexpr int32 kStandIn = 1234, kFactor = 8191, kMask = 0x3FFF;
    if (first == 0) first = kStandIn;
    int32 second = (first * kFactor) & kMask;
    return {{first, second, (second * kFactor) & kMask}};
}

// Rounded down, without a call: the sums are small.
double Floor(double x) {
    const double whole = static_cast<int32>(x);
    return whole > x ? whole - 1 : whole;
}

// Unsigned, so that seeds from outside do not overflow: the bits are those of the 32-bit signed product.
int32 Step(int32 seed, uint32 factor, int32 modulus) {
    return static_cast<int32>(static_cast<uint32>(seed) * factor) % modulus;
}

Seeds Next(const Seeds& seeds) {
    return {{Step(seeds.s[0], 171, 30269), Step(seeds.s[1], 172, 30307), Step(seeds.s[2], 170, 30323)}};
}

double Number(const Seeds& seeds) {
    constexpr double kFirst = 1.0 / 30269, kSecond = 1.0 / 30307, kThird = 1.0 / 30323;
    double x = seeds.s[0] * kFirst + seeds.s[1] * kSecond + seeds.s[2] * kThird;
    return x - Floor(x);
}

}  // namespace

// Alone, as its counterpart: the library starts or stops.
MgErr InitRandomGen() TESSEL_LOCKS_UNPROVEN {
    constexpr uint32 kMask = 0x3FFF;
    currentSeeds = SeedsFrom(static_cast<int32>(MilliSecs() & kMask));
    return randomMutex.Create("RandomGen");
}

MgErr UninitRandomGen() TESSEL_LOCKS_UNPROVEN {
    randomMutex.Destroy();
    currentSeeds = {};
    return kNoErr;
}

void RandomGen(double* out) {
    if (!out) return;
    Seeds seeds;
    {
        tessel::LibraryMutexHolder holder(randomMutex);
        seeds = currentSeeds = Next(currentSeeds);
    }
    *out = Number(seeds);
}

void RandomGenWithState(double* out, int32 state[3]) {
    if (!out || !state) return;
    Seeds seeds = Next({{state[0], state[1], state[2]}});
    for (int i = 0; i < 3; ++i) state[i] = seeds.s[i];
    *out = Number(seeds);
}

void RandomGenInitState(int32 state[3]) {
    constexpr double kRange = 30000;
    if (!state) return;
    double number;
    RandomGen(&number);
    Seeds seeds = SeedsFrom(static_cast<int32>(number * kRange));
    for (int i = 0; i < 3; ++i) state[i] = seeds.s[i];
}
