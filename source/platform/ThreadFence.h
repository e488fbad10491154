// A memory fence that one thread executes for all.
//
// Between two threads of which one hurries often and the other asks rarely: the first only keeps the compiler from
// reordering, the second calls FenceEveryThread, which has the effect of a full fence in every thread of the process.
#ifndef TESSEL_PLATFORM_THREADFENCE_H
#define TESSEL_PLATFORM_THREADFENCE_H

namespace tessel::platform {

// Prepares the host. False when it has no such fence; then both sides need fences of their own.
bool FenceEveryThreadAvailable() noexcept;

void FenceEveryThread() noexcept;

}  // namespace tessel::platform

#endif
