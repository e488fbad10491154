// Creates and disposes a 64-byte block at the call depth given, under LeakSanitizer, and prints the nanoseconds of one
// pair, the median of 15 turns.
#include <algorithm>
#include <chrono>
#include <cstdio>
#include <cstdlib>

namespace {

constexpr int kPairs = 200000;

[[gnu::noinline]] double AtDepth(int depth) {
    if (depth > 0) {
        volatile double result = AtDepth(depth - 1);
        return result;
    }
    auto start = std::chrono::steady_clock::now();
    for (int i = 0; i < kPairs; ++i) {
        void* volatile block = std::malloc(64);
        std::free(block);
    }
    return std::chrono::duration<double>(std::chrono::steady_clock::now() - start).count() / kPairs;
}

}  // namespace

int main(int count, char** arguments) {
    int depth = count > 1 ? std::atoi(arguments[1]) : 16;
    double turns[15];
    for (double& turn : turns) turn = AtDepth(depth);
    std::sort(turns, turns + 15);
    std::printf("pair %.3f\n", turns[7] * 1e9);
}
