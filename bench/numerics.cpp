// Numbers to text and back, the real members of the math family, sums.
#include <tessel/tessel.h>

#include <array>
#include <charconv>
#include <cmath>
#include <cstdio>
#include <cstdlib>
#include <cstring>
#include <random>
#include <string>
#include <vector>

#include "support/Compare.h"

namespace {

using bench::Keep;
using bench::Loop;

constexpr std::size_t kValues = 1024;  // a power of two

std::vector<double> Uniform(double low, double high) {
    std::mt19937_64 random(1);
    std::uniform_real_distribution<double> distribution(low, high);
    std::vector<double> values(kValues);
    for (double& value : values) value = distribution(random);
    return values;
}

// Does a thing to one value after the other.
template <class T, class Function>
Loop OnEach(const std::vector<T>& values, Function function) {
    return [&values, function](std::uint64_t operations) {
        for (std::uint64_t i = 0; i < operations; ++i) function(values[i & (kValues - 1)]);
    };
}

// ---- text -----------------------------------------------------------------------------------------------------------

template <class T>
auto ToText(int16 type, int16 format) {
    return [=](const T& value) {
        char buffer[64];
        Keep(NumToAnyString(&value, type, &format, buffer, sizeof buffer, '.', nullptr));
        Keep(buffer);
    };
}

void CompareRendering(bench::Table& table) {
    const std::vector<double> values = Uniform(-1e6, 1e6);
    const struct {
        const char* name;
        int16 format;
        std::chars_format peer;
        int precision;
    } cases[] = {{"double to text, 2 decimals", -2, std::chars_format::fixed, 2},
                 {"double to text, 6 decimals", -6, std::chars_format::fixed, 6},
                 {"double to text, 17 digits", 17, std::chars_format::scientific, 16}};
    for (const auto& c : cases) {
        table.Compare(c.name, OnEach(values, ToText<double>(kNumDouble, c.format)), "std::to_chars",
                      OnEach(values,
                             [c](double value) {
                                 char buffer[64];
                                 Keep(std::to_chars(buffer, buffer + sizeof buffer, value, c.peer, c.precision).ptr);
                                 Keep(buffer);
                             }),
                      1.5);
    }
    for (const char* const format : {"%.6f", "%e"}) {
        table.Compare(std::string("SNPrintf(\"") + format + "\")",
                      OnEach(values,
                             [format](double value) {
                                 char buffer[64];
                                 Keep(SNPrintf(buffer, 64, format, value));
                                 Keep(buffer);
                             }),
                      "snprintf",
                      OnEach(values,
                             [format](double value) {
                                 char buffer[64];
#pragma GCC diagnostic push
#pragma GCC diagnostic ignored "-Wformat-nonliteral"
                                 Keep(std::snprintf(buffer, 64, format, value));
#pragma GCC diagnostic pop
                                 Keep(buffer);
                             }),
                      0.4);
    }
    std::mt19937_64 random(2);
    std::vector<int32> integers(kValues);
    for (int32& value : integers) value = static_cast<int32>(random()) >> (random() % 31);
    table.Compare("int32 to text", OnEach(integers, ToText<int32>(kNumInt32, kFormatDecimal)), "std::to_chars",
                  OnEach(integers,
                         [](int32 value) {
                             char buffer[64];
                             Keep(std::to_chars(buffer, buffer + sizeof buffer, value).ptr);
                             Keep(buffer);
                         }),
                  1.5);
}

void CompareParsing(bench::Table& table) {
    for (const char* const format : {"%.2f", "%.17g"}) {
        std::vector<std::string> texts;
        for (const double value : Uniform(-1e6, 1e6)) {
            char buffer[64];
#pragma GCC diagnostic push
#pragma GCC diagnostic ignored "-Wformat-nonliteral"
            std::snprintf(buffer, sizeof buffer, format, value);
#pragma GCC diagnostic pop
            texts.emplace_back(buffer);
        }
        table.Compare(std::string("text to double, ") + format,
                      OnEach(texts,
                             [](const std::string& text) {
                                 PackedDecimal record;
                                 double value = 0;
                                 StringToPacked(text.data(), static_cast<int32>(text.size()), &record, '.');
                                 FPLoadPDR(&record);
                                 FPStoreFlt64(&value);
                                 Keep(value);
                             }),
                      "strtod",
                      OnEach(texts, [](const std::string& text) { Keep(std::strtod(text.c_str(), nullptr)); }), 0.5);
    }
    std::mt19937_64 random(3);
    std::vector<std::string> integers(kValues);
    for (std::string& text : integers) text = std::to_string(static_cast<int32>(random()) >> (random() % 31));
    table.Compare("text to int32",
                  OnEach(integers,
                         [](const std::string& text) {
                             const char* cursor = text.data();
                             Keep(StringToNum32(&cursor, static_cast<int32>(text.size()), kNumInt32, 10, false));
                         }),
                  "std::from_chars",
                  OnEach(integers,
                         [](const std::string& text) {
                             int32 value = 0;
                             std::from_chars(text.data(), text.data() + text.size(), value);
                             Keep(value);
                         }),
                  1.5);
}

// ---- mathematics ----------------------------------------------------------------------------------------------------

using Unary = void (*)(const double*, double*);
using Libm = double (*)(double);

Loop ThroughPointer(const std::vector<double>& values, Unary function) {
    return OnEach(values, [function](const double& value) {
        double result;
        function(&value, &result);
        Keep(result);
    });
}

// The library's function, reached as ours is: through a pointer, from memory to memory.
Loop ThroughPointer(const std::vector<double>& values, Libm function) {
    return OnEach(values, [function](const double& value) {
        double result = function(value);
        Keep(&result);
        Keep(result);
    });
}

void CompareMath(bench::Table& table) {
    const std::vector<double> unit = Uniform(0.01, 0.99);
    const std::vector<double> small = Uniform(0.1, 20);
    const std::vector<double> above = Uniform(1, 20);
    const struct {
        const char* name;
        Unary ours;
        Libm theirs;
        const std::vector<double>& values;
    } cases[] = {
        {"RTfSqrtD", RTfSqrtD, std::sqrt, small},
        {"RTfRoundD", RTfRoundD, std::nearbyint, small},
        {"RTfFloorD", RTfFloorD, std::floor, small},
        {"RTfLognD", RTfLognD, std::log, small},
        {"RTfLog10D", RTfLog10D, std::log10, small},
        {"RTfLog2D", RTfLog2D, std::log2, small},
        {"RTfLognp1D", RTfLognp1D, std::log1p, small},
        {"RTfExpD", RTfExpD, std::exp, small},
        {"RTfExpm1D", RTfExpm1D, std::expm1, small},
        {"RTfPow2D", RTfPow2D, std::exp2, small},
        {"RTfPow10D", RTfPow10D, [](double x) { return std::pow(10.0, x); }, small},
        {"RTfSinD", RTfSinD, std::sin, small},
        {"RTfCosD", RTfCosD, std::cos, small},
        {"RTfTanD", RTfTanD, std::tan, small},
        {"RTfAsinD", RTfAsinD, std::asin, unit},
        {"RTfSecD", RTfSecD, [](double x) { return 1 / std::cos(x); }, small},
        {"RTfCotD", RTfCotD, [](double x) { return 1 / std::tan(x); }, small},
        {"RTfSincD", RTfSincD, [](double x) { return std::sin(x) / x; }, small},
        {"RTfAcosD", RTfAcosD, std::acos, unit},
        {"RTfAtanD", RTfAtanD, std::atan, small},
        {"RTfSinhD", RTfSinhD, std::sinh, small},
        {"RTfCoshD", RTfCoshD, std::cosh, small},
        {"RTfTanhD", RTfTanhD, std::tanh, small},
        {"RTfAsinhD", RTfAsinhD, std::asinh, small},
        {"RTfAcoshD", RTfAcoshD, std::acosh, above},
        {"RTfAtanhD", RTfAtanhD, std::atanh, unit},
    };
    for (const auto& c : cases) {
        table.Compare(c.name, ThroughPointer(c.values, c.ours), "the C library's", ThroughPointer(c.values, c.theirs),
                      1.1);
    }
}

void CompareSums(bench::Table& table) {
    static std::array<double, 10000> numbers;
    std::mt19937_64 random(4);
    for (double& number : numbers) number = static_cast<double>(random());
    table.Compare(
        "Sum1DDoubleArray of 10,000",
        [](std::uint64_t operations) {
            for (std::uint64_t i = 0; i < operations; ++i) {
                double sum;
                Sum1DDoubleArray(numbers.data(), sizeof(double), static_cast<int32>(numbers.size()), &sum);
                Keep(sum);
            }
        },
        "a loop",
        [](std::uint64_t operations) {
            for (std::uint64_t i = 0; i < operations; ++i) {
                double sum = 0;
                for (const double number : numbers) sum += number;
                Keep(sum);
            }
        },
        1.5);
}

}  // namespace

int main() {
    if (InitTesselBase() != kNoErr) return 1;
    {
        bench::Table table("numerics");
        CompareRendering(table);
        CompareParsing(table);
        CompareMath(table);
        CompareSums(table);
    }
    return UninitTesselBase();
}
