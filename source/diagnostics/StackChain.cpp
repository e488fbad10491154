#include "base/Compiler.h"
#include "diagnostics/CallStackWalk.h"
#include "platform/Module.h"
#include "platform/Thread.h"
#include <tessel/diagnostics/StackChain.h>

#include <algorithm>
#include <cstdio>
#include <exception>

namespace tessel {
namespace {

constexpr char kUnknown[] = "<unknown>";

const char* OrUnknown(const std::string& name) {
    return name.empty() ? kUnknown : name.c_str();
}

}  // namespace

// Reads frames that belong to other functions, which a sanitizer would take for an error.
TESSEL_NOT_INLINE TESSEL_NOT_SANITIZED int32 WalkCallStack(const void** addresses, int32 capacity,
                                                           const void* framePointer, const void* returnAddress,
                                                           int32 skip) noexcept {
    const auto [low, high] = platform::CurrentStackBounds();
    auto below = std::max(low, reinterpret_cast<uintptr_t>(__builtin_frame_address(0)));
    auto frame = reinterpret_cast<uintptr_t>(framePointer);
    int32 count = 0;
    while (returnAddress && count < capacity) {
        if (skip > 0)
            --skip;
        else
            addresses[count++] = returnAddress;
        if (!IsCallerOf(below, frame, high)) break;
        below = frame;
        frame = reinterpret_cast<uintptr_t>(reinterpret_cast<const StackFrame*>(frame)->caller);
        if (!IsCallerOf(below, frame, high)) break;
        returnAddress = reinterpret_cast<const StackFrame*>(frame)->returnAddress;
    }
    return count;
}

int32 StackChain::RecordToBuf(const void** addresses, int32 capacity, const void* framePointer,
                              const void* returnAddress, int32 skip) noexcept {
    return WalkCallStack(addresses, capacity, framePointer, returnAddress, skip);
}

FrameDecoder::FrameDecoder(const void* address) : address_(address), offset_(0) {
    const char* module = kUnknown;
    const char* symbol = kUnknown;
    platform::AddressEntry entry{};
    try {
        if (platform::DescribeAddress(address, entry)) {
            module = OrUnknown(entry.module);
            symbol = OrUnknown(entry.symbol);
            offset_ = entry.offset;
        }
    } catch (const std::exception&) {
        // no memory for the names: they stay unknown
    }
    std::snprintf(module_, sizeof module_, "%s", module);
    std::snprintf(symbol_, sizeof symbol_, "%s", symbol);
    std::snprintf(name_, sizeof name_, "%s %s", module_, symbol_);
}

}  // namespace tessel
