// Printing, numbers to text and back, strings.
#include "support/Compare.h"
#include <tessel/tessel.h>

#include <charconv>
#include <cmath>
#include <cstdio>
#include <cstdlib>
#include <cstring>
#include <fmt/format.h>
#include <random>
#include <string>
#include <strings.h>
#include <vector>

namespace {

using bench::Keep;
using bench::Loop;

constexpr int kValues = 1024;
char buffer[512];

template <class F>
Loop Each(F f) {
    return [f](std::uint64_t operations) {
        for (std::uint64_t i = 0; i < operations; ++i) f(static_cast<int>(i % kValues));
        Keep(buffer);
    };
}

// ---- printing -------------------------------------------------------------------------------------------------------

struct Formatting {
    const char* what;
    Loop ours, printf, fmt;
    double printfGoal, fmtGoal;  // 0: not compared
};

std::vector<double> RandomDoubles() {
    std::mt19937_64 random(7);
    std::uniform_real_distribution<double> mantissa(-1, 1);
    std::uniform_int_distribution<int> exponent(-6, 6);
    std::vector<double> values(kValues);
    for (double& value : values) value = mantissa(random) * std::pow(10.0, exponent(random));
    return values;
}

void ComparePrinting(bench::Table& table) {
    static const std::vector<double> reals = RandomDoubles();
    static const char name[] = "session.cpp";
    static constexpr char kLine[] =
        "%s(%d): session %d of user %s opened document %s, %d pages, %d bytes, in %d ms, result %d (%x)";
    static constexpr char kFmtLine[] =
        "{}({}): session {} of user {} opened document {}, {} pages, {} bytes, in {} ms, result {} ({:X})";
    const Formatting all[] = {
        {"\"%d\"", Each([](int i) { SNPrintf(buffer, 64, "%d", i * 7919); }),
         Each([](int i) { std::snprintf(buffer, 64, "%d", i * 7919); }),
         Each([](int i) { *fmt::format_to_n(buffer, 63, "{}", i * 7919).out = 0; }), 0.45, 1.2},
        {"\"%x\"", Each([](int i) { SNPrintf(buffer, 64, "%x", i * 7919); }),
         Each([](int i) { std::snprintf(buffer, 64, "%x", i * 7919); }),
         Each([](int i) { *fmt::format_to_n(buffer, 63, "{:X}", i * 7919).out = 0; }), 0.45, 1.2},
        {"\"%5d|%-5d|%05d\"", Each([](int i) { SNPrintf(buffer, 64, "%5d|%-5d|%05d", i, -i, i); }),
         Each([](int i) { std::snprintf(buffer, 64, "%5d|%-5d|%05d", i, -i, i); }),
         Each([](int i) { *fmt::format_to_n(buffer, 63, "{:5}|{:<5}|{:05}", i, -i, i).out = 0; }), 0.5, 1.2},
        {"\"%s=%d (%s)\"", Each([](int i) { SNPrintf(buffer, 64, "%s=%d (%s)", "width", i, "points"); }),
         Each([](int i) { std::snprintf(buffer, 64, "%s=%d (%s)", "width", i, "points"); }),
         Each([](int i) { *fmt::format_to_n(buffer, 63, "{}={} ({})", "width", i, "points").out = 0; }), 0.5, 1.2},
        {"a log line of 100 bytes",
         Each([=](int i) { SNPrintf(buffer, 256, kLine, name, i, i * 3, "anna", "report", i, i * 1000, i, 0, i); }),
         Each(
             [=](int i) { std::snprintf(buffer, 256, kLine, name, i, i * 3, "anna", "report", i, i * 1000, i, 0, i); }),
         Each([](int i) {
             *fmt::format_to_n(buffer, 255, kFmtLine, name, i, i * 3, "anna", "report", i, i * 1000, i, 0, i).out = 0;
         }),
         0.5, 1.2},
        {"\"%.6f\"", Each([](int i) { SNPrintf(buffer, 64, "%.6f", reals[i]); }),
         Each([](int i) { std::snprintf(buffer, 64, "%.6f", reals[i]); }), nullptr, 0.4, 0},
        {"\"%e\"", Each([](int i) { SNPrintf(buffer, 64, "%e", reals[i]); }),
         Each([](int i) { std::snprintf(buffer, 64, "%e", reals[i]); }), nullptr, 0.4, 0},
    };
    for (const Formatting& each : all) {
        table.Compare(std::string("SNPrintf of ") + each.what, each.ours, "snprintf", each.printf, each.printfGoal);
        if (each.fmt) table.Compare("the same", each.ours, "fmt::format_to_n", each.fmt, each.fmtGoal);
    }
}

// ---- numbers --------------------------------------------------------------------------------------------------------

void CompareNumbersToText(bench::Table& table) {
    static const std::vector<double> reals = RandomDoubles();
    auto real = [](int16 code) {
        return Each([code](int i) { NumToAnyString(&reals[i], kNumDouble, &code, buffer, 64, '.', nullptr); });
    };
    auto toChars = [](std::chars_format format, int digits) {
        return Each([=](int i) { *std::to_chars(buffer, buffer + 63, reals[i], format, digits).ptr = 0; });
    };
    table.Compare("double to text, 2 decimals", real(-2), "std::to_chars", toChars(std::chars_format::fixed, 2), 1.5);
    table.Compare("double to text, 6 decimals", real(-6), "std::to_chars", toChars(std::chars_format::fixed, 6), 1.5);
    table.Compare("double to text, 17 digits", real(17), "std::to_chars", toChars(std::chars_format::scientific, 16),
                  1.5);
    table.Compare("int32 to text", Each([](int i) {
                      int32 value = i * 2097143;
                      NumToIntString(&value, buffer, 64, 10, true, kNumInt32);
                  }),
                  "std::to_chars", Each([](int i) { *std::to_chars(buffer, buffer + 63, i * 2097143).ptr = 0; }), 1.5);
}

void CompareTextToNumbers(bench::Table& table) {
    static std::vector<std::string> integers, reals;
    for (double value : RandomDoubles()) {
        char text[64];
        reals.emplace_back(text, static_cast<size_t>(std::snprintf(text, sizeof text, "%.15g", value)));
        integers.push_back(std::to_string(static_cast<int>(value * 1000)));
    }
    table.Compare("text to int32", Each([](int i) {
                      const char* at = integers[i].data();
                      Keep(StringToNum32(&at, static_cast<int32>(integers[i].size()), kNumInt32, 10, false));
                  }),
                  "std::from_chars", Each([](int i) {
                      int value = 0;
                      std::from_chars(integers[i].data(), integers[i].data() + integers[i].size(), value);
                      Keep(value);
                  }),
                  1.5);
    table.Compare("text to double", Each([](int i) {
                      PackedDecimal record;
                      double value = 0;
                      StringToPacked(reals[i].data(), static_cast<int32>(reals[i].size()), &record, '.');
                      FPLoadPDR(&record);
                      FPStoreFlt64(&value);
                      Keep(value);
                  }),
                  "strtod", Each([](int i) { Keep(std::strtod(reals[i].c_str(), nullptr)); }), 0.5);
}

// ---- strings --------------------------------------------------------------------------------------------------------

LStrHandle NewString(const std::string& text) {
    LStrHandle handle = nullptr;
    LStrFromPtr(&handle, static_cast<int32>(text.size()), text.data());
    return handle;
}

// The classic hash of the family, as anybody writes it.
std::uint32_t ByteLoopHash(const unsigned char* text) {
    std::uint32_t h = 0;
    for (int i = 1; i <= text[0]; ++i) {
        h = (h << 4) + text[i];
        if (std::uint32_t g = h & 0xF0000000u) h = (h ^ (g >> 24)) & 0x0FFFFFFFu;
    }
    return h;
}

void CompareStrings(bench::Table& table) {
    std::string text(1024, 'a');
    for (size_t i = 0; i < text.size(); ++i) text[i] = static_cast<char>('a' + i % 26);
    std::string upper = text;
    for (char& c : upper) c = static_cast<char>(c - 'a' + 'A');
    LStrHandle a = NewString(text), b = NewString(text), c = NewString(upper);
    table.Compare("LStrCmp of equal 1 KiB strings", Each([=](int) { Keep(LStrCmp(*a, *b)); }), "memcmp", Each([=](int) {
                      asm volatile("" ::: "memory");
                      Keep(std::memcmp((*a)->bytes, (*b)->bytes, 1024));
                  }),
                  1.2);
    table.Compare(
        "LStrCaseCmp, 1 KiB that differ in case", Each([=](int) { Keep(LStrCaseCmp(*a, *c)); }), "strncasecmp",
        Each([=](int) {
            asm volatile("" ::: "memory");
            Keep(strncasecmp(reinterpret_cast<char*>((*a)->bytes), reinterpret_cast<char*>((*c)->bytes), 1024));
        }),
        1.0);
    static Str255 name;
    name[0] = 200;
    std::memcpy(name + 1, text.data(), 200);
    table.Compare("PStrHash32, 200 bytes", Each([](int) { Keep(PStrHash32(name, false)); }), "byte loop", Each([](int) {
                      asm volatile("" ::: "memory");
                      Keep(ByteLoopHash(name));
                  }),
                  1.0);

    LStrHandle piece = NewString(std::string(64, 'x'));
    auto ours = [=] {
        return bench::Seconds(
            [=](std::uint64_t) {
                LStrHandle sum = NewString("x");
                while ((*sum)->count < 1 << 20) LStrCat(sum, *piece);
                DSDisposeHandle(reinterpret_cast<UHandle>(sum));
            },
            1);
    };
    auto theirs = [] {
        return bench::Seconds(
            [](std::uint64_t) {
                std::string sum = "x";
                const std::string part(64, 'x');
                while (sum.size() < 1 << 20) sum.append(part);
                Keep(sum.data());
            },
            1);
    };
    table.CompareTimed("LStrCat of 64 bytes in a loop to 1 MiB", ours, "std::string::append", theirs, 3.0);
    for (LStrHandle handle : {a, b, c, piece}) DSDisposeHandle(reinterpret_cast<UHandle>(handle));
}

}  // namespace

int main() {
    if (InitTesselBase() != kNoErr) return 1;
    {
        bench::Table table("text");
        ComparePrinting(table);
        CompareNumbersToText(table);
        CompareTextToNumbers(table);
        CompareStrings(table);
    }
    return UninitTesselBase();
}
