// Walking the calls of this thread by their frame pointers.
#ifndef TESSEL_SOURCE_DIAGNOSTICS_CALLSTACKWALK_H
#define TESSEL_SOURCE_DIAGNOSTICS_CALLSTACKWALK_H

#include <tessel/base/Types.h>

namespace tessel {

// What a frame pointer points to.
struct StackFrame {
    const StackFrame* caller;
    const void* returnAddress;
};

// Whether `frame` can be a frame that called one at `above`: higher up in the stack, which ends at `high`, and aligned.
// Code compiled without frame pointers leaves anything in the register, so that every step is checked.
inline bool IsCallerOf(uintptr_t above, uintptr_t frame, uintptr_t high) {
    return frame > above && frame < high && high - frame >= sizeof(StackFrame) && frame % alignof(StackFrame) == 0;
}

// Stores the return address of the frame at `framePointer`, one of this thread's, and those of its callers, leaving out
// the first `skip`; returns how many. No system call, no allocation, and no fault whatever the frames hold.
int32 WalkCallStack(const void** addresses, int32 capacity, const void* framePointer, const void* returnAddress,
                    int32 skip) noexcept;

}  // namespace tessel

#endif
