// Times pairs of loops, ours and what a user would take instead, in turns within one run, and prints their medians
// beside each other with the ratio.
//
//     Table table("memory");
//     table.Compare("create + dispose", Ours(loop), Peer("malloc + free", loop), 2.5);
//
// A loop takes a number of operations and does them. The goal is the largest ratio wanted.
#ifndef TESSEL_BENCH_SUPPORT_COMPARE_H
#define TESSEL_BENCH_SUPPORT_COMPARE_H

#include <algorithm>
#include <chrono>
#include <cstdint>
#include <cstdio>
#include <functional>
#include <string>
#include <vector>

namespace bench {

using Loop = std::function<void(std::uint64_t operations)>;

// Keeps a value, and what it was computed from, from being optimised away.
template <class T>
inline void Keep(T const& value) {
    asm volatile("" : : "r,m"(value) : "memory");
}

inline double Seconds(const Loop& loop, std::uint64_t operations) {
    auto start = std::chrono::steady_clock::now();
    loop(operations);
    return std::chrono::duration<double>(std::chrono::steady_clock::now() - start).count();
}

// How many operations take about 20 ms.
inline std::uint64_t Calibrate(const Loop& loop) {
    std::uint64_t operations = 1;
    for (;;) {
        double taken = Seconds(loop, operations);
        if (taken > 0.01 || operations > (std::uint64_t{1} << 40)) {
            return std::max<std::uint64_t>(1,
                                           static_cast<std::uint64_t>(static_cast<double>(operations) * 0.02 / taken));
        }
        operations *= taken < 0.001 ? 10 : 2;
    }
}

inline double Median(std::vector<double> values) {
    std::sort(values.begin(), values.end());
    return values[values.size() / 2];
}

class Table {
public:
    explicit Table(const char* title) {
        std::printf("%s: median of %d turns, time of one operation\n\n", title, kTurns);
        std::printf("| %-54s | %10s | %-30s | %10s | %6s | %6s |\n", "what", "ours", "beside", "theirs", "ratio",
                    "goal");
        std::printf("|%.56s|%.12s|%.32s|%.12s|%.8s|%.8s|\n", kRule, kRule, kRule, kRule, kRule, kRule);
    }
    ~Table() { std::printf("\n%d of %d goals met\n", met_, rows_); }
    Table(const Table&) = delete;
    Table& operator=(const Table&) = delete;

    // The ratio of our time to theirs, at most `goal`.
    void Compare(const std::string& what, const Loop& ours, const std::string& beside, const Loop& theirs,
                 double goal) {
        std::uint64_t ourCount = Calibrate(ours), theirCount = Calibrate(theirs);
        std::vector<double> ourTimes, theirTimes;
        for (int turn = 0; turn < kTurns; ++turn) {
            ourTimes.push_back(Seconds(ours, ourCount) / static_cast<double>(ourCount));
            theirTimes.push_back(Seconds(theirs, theirCount) / static_cast<double>(theirCount));
        }
        Row(what, Median(ourTimes), beside, Median(theirTimes), goal);
    }

    // One operation that is large in itself, such as sorting an array that must first be filled: `ours` and `theirs`
    // do it once and give the seconds that it took.
    void CompareTimed(const std::string& what, const std::function<double()>& ours, const std::string& beside,
                      const std::function<double()>& theirs, double goal) {
        std::vector<double> ourTimes, theirTimes;
        for (int turn = 0; turn < kTurns; ++turn) {
            ourTimes.push_back(ours());
            theirTimes.push_back(theirs());
        }
        Row(what, Median(ourTimes), beside, Median(theirTimes), goal);
    }

    // Any two figures whose ratio, first to second, should be at most `goal`. In seconds.
    void Row(const std::string& what, double ours, const std::string& beside, double theirs, double goal) {
        double ratio = ours / theirs;
        bool met = ratio <= goal;
        ++rows_;
        met_ += met ? 1 : 0;
        std::printf("| %-54s | %10s | %-30s | %10s | %6.2f | %5.2f%c |\n", what.c_str(), Time(ours).c_str(),
                    beside.c_str(), Time(theirs).c_str(), ratio, goal, met ? ' ' : '!');
        std::fflush(stdout);
    }

    // A count, at most `goal`.
    void Count(const std::string& what, double ours, const std::string& unit, double goal) {
        bool met = ours <= goal;
        ++rows_;
        met_ += met ? 1 : 0;
        char text[32];
        std::snprintf(text, sizeof text, "%.1f", ours);
        std::printf("| %-54s | %10s | %-30s | %10s | %6s | %5.0f%c |\n", what.c_str(), text, unit.c_str(), "", "", goal,
                    met ? ' ' : '!');
        std::fflush(stdout);
    }

private:
    static constexpr int kTurns = 15;
    static constexpr const char* kRule =
        "--------------------------------------------------------------------------------";

    static std::string Time(double seconds) {
        char text[32];
        double nanoseconds = seconds * 1e9;
        if (nanoseconds < 1e4) {
            std::snprintf(text, sizeof text, "%.2f ns", nanoseconds);
        } else if (nanoseconds < 1e7) {
            std::snprintf(text, sizeof text, "%.2f us", nanoseconds / 1e3);
        } else {
            std::snprintf(text, sizeof text, "%.2f ms", nanoseconds / 1e6);
        }
        return text;
    }

    int rows_ = 0;
    int met_ = 0;
};

}  // namespace bench

#endif
