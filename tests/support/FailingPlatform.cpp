#include "support/FailingPlatform.h"

#include "platform/posix/SystemCalls.h"

#include <algorithm>
#include <atomic>
#include <cerrno>
#include <climits>
#include <cstring>
#include <iterator>
#include <stdexcept>
#include <tuple>
#include <type_traits>
#include <unistd.h>

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

// Not of files, or without a way to fail.
bool IsOfFiles(const char* call) {
    static constexpr const char* kOthers[] = {
        "clock_gettime", "clock_nanosleep", "futex", "membarrier", "getrandom", "process_vm_readv",
        "uname",         "getcwd",          "chdir", "pipe2",      "statfs"};
    return std::none_of(std::begin(kOthers), std::end(kOthers),
                        [&](const char* other) { return std::strcmp(call, other) == 0; });
}

template <auto kCall, auto kOther>
constexpr bool Is() {
    if constexpr (std::is_same_v<decltype(kCall), decltype(kOther)>) return kCall == kOther;
    return false;
}

// Stands in for the member `kCall` of the table.
template <auto kCall>
struct Stand;

template <typename Result, typename... Arguments, Result (*SystemCalls::*kCall)(Arguments...)>
struct Stand<kCall> {
    static Result Call(Arguments... arguments) {
        if (!IsDue()) return (original.*kCall)(arguments...);
        if (failure == FailingPlatform::kKill) _exit(99);
        if (failure != 0) {
            // A file is closed whatever the host says.
            if constexpr (Is<kCall, &SystemCalls::close>() || Is<kCall, &SystemCalls::closedir>())
                (original.*kCall)(arguments...);
            errno = failure;
            if constexpr (std::is_pointer_v<Result> && !std::is_void_v<std::remove_pointer_t<Result>>) return nullptr;
            return (Result)-1;  // also of mmap: MAP_FAILED
        }
        if constexpr (Is<kCall, &SystemCalls::read>() || Is<kCall, &SystemCalls::write>()) {
            std::tuple<Arguments...> shortened(arguments...);
            std::get<2>(shortened) = 1;
            return std::apply(original.*kCall, shortened);
        }
        return (original.*kCall)(arguments...);
    }
};

}  // namespace

FailingPlatform::FailingPlatform(const char* call, int n, int error, int times) {
    original = systemCalls;
    calls = 0;
    first = n;
    last = times >= kForever ? INT_MAX : n + times - 1;
    failure = error;
    bool known = false;
#define TESSEL_STAND_IN(result, name, parameters)                                             \
    if (std::strcmp(call, #name) == 0 || (std::strcmp(call, "*") == 0 && IsOfFiles(#name))) { \
        systemCalls.name = Stand<&SystemCalls::name>::Call;                                   \
        known = true;                                                                         \
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
