#include <tessel/utilities/RandomGen.h>

#include <gtest/gtest.h>

#include <algorithm>
#include <cstring>
#include <thread>
#include <vector>

#include "support/HandClock.h"

namespace {

constexpr int32 kKnownSeeds[3] = {1234, 15150, 1234};  // 1234, x 8191 & 0x3FFF, and again

/* The process-wide generator, seeded by a clock whose low 14 bits are 0. */
struct SeededGenerator {
    tessel::test::HandClock clock{3 * 0x4000};
    SeededGenerator() { EXPECT_EQ(InitRandomGen(), kNoErr); }
    ~SeededGenerator() { UninitRandomGen(); }
};

std::vector<double> Stream(const int32 seeds[3], size_t count) {
    int32 state[3] = {seeds[0], seeds[1], seeds[2]};
    std::vector<double> numbers(count);
    for (double& number : numbers) RandomGenWithState(&number, state);
    return numbers;
}

// The expected numbers were computed with exact fractions, each operation rounded to the nearest double.
TEST(RandomGen, GivesItsExactStream) {
    int32 state[3] = {1, 1, 1};
    double number = 0;
    RandomGenWithState(&number, state);
    EXPECT_EQ(number, 0x1.15655e1ad3ad5p-6);
    EXPECT_EQ(state[0], 171);
    EXPECT_EQ(state[1], 172);
    EXPECT_EQ(state[2], 170);

    const int32 ones[3] = {1, 1, 1};
    std::vector<double> numbers = Stream(ones, 1000);
    EXPECT_EQ(numbers[1], 0x1.ca5eb87cc43f0p-1);
    EXPECT_EQ(numbers[99], 0x1.bcd5d3749b954p-1);
    EXPECT_EQ(numbers[999], 0x1.e32e7fc1ca464p-1);
    uint64 checksum = 0;
    for (double each : numbers) {
        uint64 bits;
        std::memcpy(&bits, &each, sizeof bits);
        checksum = checksum * 31 + bits;
    }
    EXPECT_EQ(checksum, 0x42ee1b62771f2003u);
}

TEST(RandomGen, IsZeroUntilItIsSeeded) {
    double number = 1;
    RandomGen(&number);
    EXPECT_EQ(number, 0);
    int32 state[3];
    RandomGenInitState(state);
    EXPECT_TRUE(std::equal(state, state + 3, kKnownSeeds));
}

TEST(RandomGen, SeedsStatesFromTheProcesssNumbers) {
    SeededGenerator generator;
    int32 state[3];
    RandomGenInitState(state);
    const int32 first = static_cast<int32>(Stream(kKnownSeeds, 1)[0] * 30000);
    EXPECT_EQ(state[0], first);
    EXPECT_EQ(state[1], first * 8191 & 0x3FFF);
    EXPECT_EQ(state[2], (first * 8191 & 0x3FFF) * 8191 & 0x3FFF);
}

TEST(RandomGen, ThreadsShareOneStream) {
    constexpr size_t kThreads = 4, kEach = 5000;
    SeededGenerator generator;
    std::vector<double> drawn(kThreads * kEach);
    std::vector<std::thread> threads;
    for (size_t t = 0; t < kThreads; ++t) {
        threads.emplace_back([&drawn, t] {
            for (size_t i = 0; i < kEach; ++i) RandomGen(&drawn[t * kEach + i]);
        });
    }
    for (std::thread& thread : threads) thread.join();
    std::vector<double> expected = Stream(kKnownSeeds, drawn.size());
    std::sort(drawn.begin(), drawn.end());
    std::sort(expected.begin(), expected.end());
    EXPECT_EQ(drawn, expected);
}

}  // namespace
