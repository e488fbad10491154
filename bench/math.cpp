// The flat members of the math family beside the libm calls under them, and the sums.
#include <tessel/tessel.h>

#include <cmath>
#include <vector>

#include "support/Compare.h"

namespace {

using bench::Keep;
using bench::Loop;

constexpr int kValues = 1024;

struct Member {
    const char* name;
    void (*ours)(const double*, double*);
    double (*libm)(double);
    double low, high;
};

// The call of libm behind one indirect call, which a flat function in a shared library costs anybody.
struct Indirect {
    double (*libm)(double);
};
[[gnu::noinline]] void Forward(const Indirect* to, const double* x, double* result) {
    *result = to->libm(*x);
}

void CompareMembers(bench::Table& table) {
    static const Member members[] = {
        {"RTfSqrtD", RTfSqrtD, std::sqrt, 0, 1e6},   {"RTfExpD", RTfExpD, std::exp, -20, 20},
        {"RTfLognD", RTfLognD, std::log, 0.01, 1e6}, {"RTfLog10D", RTfLog10D, std::log10, 0.01, 1e6},
        {"RTfSinD", RTfSinD, std::sin, -10, 10},     {"RTfCosD", RTfCosD, std::cos, -10, 10},
        {"RTfTanD", RTfTanD, std::tan, -10, 10},     {"RTfAtanD", RTfAtanD, std::atan, -10, 10},
        {"RTfSinhD", RTfSinhD, std::sinh, -10, 10},  {"RTfTanhD", RTfTanhD, std::tanh, -10, 10},
    };
    for (const Member& member : members) {
        std::vector<double> values(kValues);
        for (int i = 0; i < kValues; ++i) values[i] = member.low + (member.high - member.low) * (i + 0.5) / kValues;
        Indirect to{member.libm};
        auto ours = [&](std::uint64_t operations) {
            double result = 0, sum = 0;
            for (std::uint64_t i = 0; i < operations; ++i) {
                member.ours(&values[i % kValues], &result);
                sum += result;
            }
            Keep(sum);
        };
        auto theirs = [&](std::uint64_t operations) {
            void (*volatile forward)(const Indirect*, const double*, double*) = Forward;
            double result = 0, sum = 0;
            for (std::uint64_t i = 0; i < operations; ++i) {
                forward(&to, &values[i % kValues], &result);
                sum += result;
            }
            Keep(sum);
        };
        table.Compare(member.name, ours, "libm + one indirect call", theirs, 1.1);
    }
}

void CompareSums(bench::Table& table) {
    static std::vector<double> values(10000);
    for (size_t i = 0; i < values.size(); ++i) values[i] = 1.0 / static_cast<double>(i + 1);
    table.Compare(
        "Sum1DDoubleArray, 10,000 elements",
        [](std::uint64_t operations) {
            double sum = 0;
            for (std::uint64_t i = 0; i < operations; ++i) {
                Sum1DDoubleArray(values.data(), sizeof(double), static_cast<int32>(values.size()), &sum);
                Keep(sum);
            }
        },
        "a plain loop",
        [](std::uint64_t operations) {
            for (std::uint64_t i = 0; i < operations; ++i) {
                double sum = 0;
                for (double value : values) sum += value;
                Keep(sum);
            }
        },
        1.5);
}

}  // namespace

int main() {
    if (InitTesselBase() != kNoErr) return 1;
    {
        bench::Table table("math");
        CompareMembers(table);
        CompareSums(table);
    }
    return UninitTesselBase();
}
