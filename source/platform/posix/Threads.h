// What this backend's files know of threads among themselves.
#ifndef TESSEL_PLATFORM_POSIX_THREADS_H
#define TESSEL_PLATFORM_POSIX_THREADS_H

#include "platform/Thread.h"

namespace tessel::platform {

// Whether a thread of that number runs in this process.
bool IsThreadOfProcess(ThreadId thread) noexcept;

// Drops the message event of a thread that was ended by force.
void ForgetMessageEvent(ThreadId thread) noexcept;

}  // namespace tessel::platform

#endif
