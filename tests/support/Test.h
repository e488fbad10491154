// What most tests need: GoogleTest with its matchers, the reports' recorder, and checks of several things in a row.
#pragma once

#include "support/ReportRecorder.h"

#include <algorithm>
#include <atomic>
#include <cstdlib>
#include <cstring>
#include <functional>
#include <gmock/gmock.h>
#include <memory>
#include <random>
#include <string>
#include <string_view>
#include <thread>
#include <utility>
#include <vector>

// EXPECT_EACH reads a condition as the right side of a shift.
#pragma GCC diagnostic ignored "-Wparentheses"
#ifdef __clang__
#    pragma clang diagnostic ignored "-Woverloaded-shift-op-parentheses"
#endif

namespace tessel::test {

using testing::AllOf, testing::Contains, testing::ElementsAre, testing::ElementsAreArray, testing::EndsWith,
    testing::HasSubstr, testing::IsEmpty, testing::StartsWith;
using Texts = std::vector<std::string>;

// Runs work(0) to work(count - 1), each in a thread of its own, and waits for all.
template <class Work>
void InThreads(int count, Work work) {
    std::vector<std::thread> threads;
    for (int i = 0; i < count; ++i) threads.emplace_back(work, i);
    for (std::thread& thread : threads) thread.join();
}

// How long, or how much, a test runs: the value of an environment variable, or what suits every day.
inline int Amount(const char* variable, int everyDay) {
    const char* text = std::getenv(variable);
    return text ? std::atoi(text) : everyDay;
}

// Several conditions, checked in order: EXPECT_EACH(Open() == kNoErr, name == "a.txt", !IsLocked()). A failure tells
// the condition and what its sides were. Integers of unlike signs compare as numbers, C strings by their characters
// when one side is a literal. What binds more loosely than a comparison needs parentheses.
#define EXPECT_EACH(...)                                  \
    do {                                                  \
        TESSEL_EACH_EXPAND(TESSEL_EACH_STEP(__VA_ARGS__)) \
    } while (false)
#define TESSEL_EACH_STEP(condition, ...)                                                                          \
    if (const ::tessel::test::each::Outcome outcome = ::tessel::test::each::Start() << condition; !outcome.holds) \
        ADD_FAILURE() << #condition << "\n  where " << outcome.sides;                                             \
    __VA_OPT__(TESSEL_EACH_AGAIN TESSEL_EACH_PARENS(__VA_ARGS__))
#define TESSEL_EACH_AGAIN() TESSEL_EACH_STEP
#define TESSEL_EACH_PARENS ()
#define TESSEL_EACH_EXPAND(...) TESSEL_EACH_EXPAND3(TESSEL_EACH_EXPAND3(TESSEL_EACH_EXPAND3(__VA_ARGS__)))
#define TESSEL_EACH_EXPAND3(...) TESSEL_EACH_EXPAND2(TESSEL_EACH_EXPAND2(TESSEL_EACH_EXPAND2(__VA_ARGS__)))
#define TESSEL_EACH_EXPAND2(...) TESSEL_EACH_EXPAND1(TESSEL_EACH_EXPAND1(TESSEL_EACH_EXPAND1(__VA_ARGS__)))
#define TESSEL_EACH_EXPAND1(...) __VA_ARGS__

namespace each {

template <class A, class B, class Holds>
bool Compare(const A& a, const B& b, Holds holds) {
    if constexpr (std::is_integral_v<A> && std::is_integral_v<B>) {
        if ((a < A()) != (b < B())) return holds(a < A() ? -1 : 1, 0);
        return holds(static_cast<unsigned long long>(a), static_cast<unsigned long long>(b));
    } else {
        return holds(a, b);
    }
}

template <class T>
constexpr bool kIsLiteral = false;
template <std::size_t kSize>
constexpr bool kIsLiteral<const char (&)[kSize]> = true;

template <class T>
constexpr bool kIsText = std::is_convertible_v<T, std::string_view>;

// A C string as text, null or not, and anything else as it is.
template <bool kAsText, class T>
decltype(auto) Operand(const T& value) {
    if constexpr (kAsText && std::is_array_v<T>)
        return std::string(value);
    else if constexpr (kAsText && std::is_convertible_v<T, const char*>)
        return std::string(value ? value : "(null)");
    else
        return (value);
}

struct Outcome {
    bool holds;
    std::string sides;
};

template <class A>
struct Left {
    A&& value;
    operator Outcome() const { return {static_cast<bool>(value), testing::PrintToString(value)}; }
#define TESSEL_EACH_OPERATOR(symbol)                                                               \
    template <class B>                                                                             \
    Outcome operator symbol(B&& right) const {                                                     \
        constexpr bool kText = (kIsLiteral<A&&> && kIsText<B>) || (kIsLiteral<B&&> && kIsText<A>); \
        const auto& a = Operand<kText>(value);                                                     \
        const auto& b = Operand<kText>(right);                                                     \
        return {Compare(a, b, [](const auto& x, const auto& y) -> bool { return x symbol y; }),    \
                testing::PrintToString(a) + " " #symbol " " + testing::PrintToString(b)};          \
    }
    TESSEL_EACH_OPERATOR(==)
    TESSEL_EACH_OPERATOR(!=)
    TESSEL_EACH_OPERATOR(<)
    TESSEL_EACH_OPERATOR(<=)
    TESSEL_EACH_OPERATOR(>)
    TESSEL_EACH_OPERATOR(>=)
#undef TESSEL_EACH_OPERATOR
};

struct Start {
    template <class A>
    Left<A> operator<<(A&& value) const {
        return {std::forward<A>(value)};
    }
};

}  // namespace each
}  // namespace tessel::test
