#include "support/FailingPlatform.h"

#include "platform/posix/SystemCalls.h"

#include <atomic>
#include <cerrno>
#include <csignal>
#include <cstring>
#include <stdexcept>
#include <tuple>
#include <type_traits>

namespace tessel::test {

using platform::SystemCalls;
using platform::systemCalls;

namespace {

SystemCalls original;
std::atomic<int> calls;
int first, last, failure;

bool IsDue() {
    int number = ++calls;
    return number >= first && number <= last;
}

// Stands in for the member `kCall` of the table.
template <auto kCall>
struct Stand;

template <typename Result, typename... Arguments, Result (*SystemCalls::*kCall)(Arguments...)>
struct Stand<kCall> {
    static Result Call(Arguments... arguments) {
        if (!IsDue()) return (original.*kCall)(arguments...);
        if (failure == FailingPlatform::kKill) std::raise(SIGKILL);
        if (failure != 0) {
            errno = failure;
            if constexpr (std::is_pointer_v<Result> && !std::is_void_v<std::remove_pointer_t<Result>>) return nullptr;
            return (Result)-1;  // also of mmap: MAP_FAILED
        }
        if constexpr (std::is_same_v<Result, ssize_t> && sizeof...(Arguments) == 3) {
            std::tuple<Arguments...> shortened(arguments...);
            if constexpr (std::is_same_v<std::tuple_element_t<2, std::tuple<Arguments...>>, std::size_t>) {
                std::get<2>(shortened) = 1;
                return std::apply(original.*kCall, shortened);
            }
        }
        return (original.*kCall)(arguments...);
    }
};

}  // namespace

FailingPlatform::FailingPlatform(const char* call, int n, int error, int times) {
    original = systemCalls;
    calls = 0;
    first = n;
    last = n + times - 1;
    failure = error;
    bool known = false;
#define TESSEL_STAND_IN(result, name, parameters)                       \
    if (std::strcmp(call, #name) == 0 || std::strcmp(call, "*") == 0) { \
        systemCalls.name = Stand<&SystemCalls::name>::Call;             \
        known = true;                                                   \
    }
    TESSEL_SYSTEM_CALLS(TESSEL_STAND_IN)
#undef TESSEL_STAND_IN
    if (!known) throw std::invalid_argument(call);
}

FailingPlatform::~FailingPlatform() {
    systemCalls = original;
}

int FailingPlatform::Calls() const {
    return calls;
}

}  // namespace tessel::test
