// The real members of the math family beside the libm calls under them, and the sums.
#include "support/Compare.h"
#include <tessel/tessel.h>

#include <cmath>
#include <vector>

namespace {

using bench::Keep;
using bench::Loop;

constexpr int kValues = 1024;

using Unary = void (*)(const double*, double*);
using Libm = double (*)(double);

std::vector<double> Values(double low, double high) {
    std::vector<double> values(kValues);
    for (int i = 0; i < kValues; ++i) values[i] = low + (high - low) * (i * 389 % kValues + 0.5) / kValues;
    return values;
}

// One indirect call from memory to memory, as a flat function in a shared library costs anybody.
template <Libm kFunction>
[[gnu::noinline]] void Forward(const double* x, double* result) {
    *result = kFunction(*x);
}

Loop OnEach(const std::vector<double>& values, Unary function) {
    return [values, function](std::uint64_t operations) {
        const Unary volatile through = function;
        double result = 0;
        double sum = 0;
        for (std::uint64_t i = 0; i < operations; ++i) {
            through(&values[i % kValues], &result);
            sum += result;
        }
        Keep(sum);
    };
}

double Pow10(double x) {
    return std::pow(10.0, x);
}
double Sec(double x) {
    return 1 / std::cos(x);
}
double Csc(double x) {
    return 1 / std::sin(x);
}
double Cot(double x) {
    return 1 / std::tan(x);
}
double Sinc(double x) {
    return std::sin(x) / x;
}

void CompareMembers(bench::Table& table) {
    const struct {
        const char* name;
        Unary ours;
        Unary libm;
        double low, high;
    } members[] = {
        {"RTfSqrtD", RTfSqrtD, Forward<std::sqrt>, 0, 1e6},
        {"RTfRoundD", RTfRoundD, Forward<std::nearbyint>, -20, 20},
        {"RTfFloorD", RTfFloorD, Forward<std::floor>, -20, 20},
        {"RTfLognD", RTfLognD, Forward<std::log>, 0.01, 20},
        {"RTfLog10D", RTfLog10D, Forward<std::log10>, 0.01, 20},
        {"RTfLog2D", RTfLog2D, Forward<std::log2>, 0.01, 20},
        {"RTfLognp1D", RTfLognp1D, Forward<std::log1p>, 0.01, 20},
        {"RTfExpD", RTfExpD, Forward<std::exp>, -20, 20},
        {"RTfExpm1D", RTfExpm1D, Forward<std::expm1>, -20, 20},
        {"RTfPow2D", RTfPow2D, Forward<std::exp2>, -20, 20},
        {"RTfPow10D", RTfPow10D, Forward<Pow10>, -20, 20},
        {"RTfSinD", RTfSinD, Forward<std::sin>, -20, 20},
        {"RTfCosD", RTfCosD, Forward<std::cos>, -20, 20},
        {"RTfTanD", RTfTanD, Forward<std::tan>, -20, 20},
        {"RTfSecD", RTfSecD, Forward<Sec>, -20, 20},
        {"RTfCscD", RTfCscD, Forward<Csc>, -20, 20},
        {"RTfCotD", RTfCotD, Forward<Cot>, -20, 20},
        {"RTfSincD", RTfSincD, Forward<Sinc>, -20, 20},
        {"RTfAsinD", RTfAsinD, Forward<std::asin>, -1, 1},
        {"RTfAcosD", RTfAcosD, Forward<std::acos>, -1, 1},
        {"RTfAtanD", RTfAtanD, Forward<std::atan>, -20, 20},
        {"RTfSinhD", RTfSinhD, Forward<std::sinh>, -20, 20},
        {"RTfCoshD", RTfCoshD, Forward<std::cosh>, -20, 20},
        {"RTfTanhD", RTfTanhD, Forward<std::tanh>, -20, 20},
        {"RTfAsinhD", RTfAsinhD, Forward<std::asinh>, -20, 20},
        {"RTfAcoshD", RTfAcoshD, Forward<std::acosh>, 1, 20},
        {"RTfAtanhD", RTfAtanhD, Forward<std::atanh>, -1, 1},
    };
    for (const auto& member : members) {
        const std::vector<double> values = Values(member.low, member.high);
        table.Compare(member.name, OnEach(values, member.ours), "libm + one indirect call", OnEach(values, member.libm),
                      1.1);
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
