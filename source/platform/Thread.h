// Threads of the host, their priorities, and thread-local slots.
//
// Functions that can fail return false (or null) and set LastError. None throws. Any thread.
#ifndef TESSEL_PLATFORM_THREAD_H
#define TESSEL_PLATFORM_THREAD_H

#include <cstddef>
#include <cstdint>

namespace tessel::platform {

using ThreadId = std::uint32_t;

// A handle holds what is known of a thread, also after its end, until ThreadClose.
struct ThreadRecord;
using ThreadHandle = ThreadRecord*;

using ThreadProcedure = std::int32_t (*)(void* argument);

// Starts a thread on `procedure` with the host's usual stack, and the priority that the process was started with
// (its maker's, where that is lower and the host does not let it be raised). Its result is the exit code.
ThreadHandle ThreadStart(ThreadProcedure procedure, void* argument, ThreadId& id) noexcept;

// A handle for the calling thread, whoever started it.
ThreadHandle ThreadOpenCurrent() noexcept;

// Gives the handle up. The thread goes on.
bool ThreadClose(ThreadHandle thread) noexcept;

ThreadId CurrentThreadId() noexcept;

// 6 for a null handle. `running` of a thread that this seam did not start tells what the host says of its id.
bool ThreadRunning(ThreadHandle thread, bool& running) noexcept;

// True when the thread has ended; false with 1460 after so many milliseconds (negative: waits for ever).
bool ThreadJoin(ThreadHandle thread, std::int32_t milliseconds) noexcept;

// The procedure's result, or what ThreadEnd set; 0 of one that left through the host (pthread_exit). 259 while it
// runs.
bool ThreadExitCode(ThreadHandle thread, std::int32_t& code) noexcept;

// Ends a thread by force, wherever it is: nothing of it is cleaned up, locks it holds stay held, its stack and its
// thread-local values stay in memory. Only for a thread that this seam started, and not the calling one (5 otherwise;
// 50 where the host cannot). Returns when it has ended; 1460 when it did not within a second, because it refuses.
bool ThreadEnd(ThreadHandle thread, std::int32_t code) noexcept;

// Priorities on the scale of the host that the library was designed for: -15 idle, -2 to 2, 15 time critical. Where the
// process may not raise a priority the number is refused (5), and the priority stays. 6 for a thread that has ended.
bool ThreadSetPriority(ThreadHandle thread, std::int32_t priority) noexcept;
bool ThreadGetPriority(ThreadHandle thread, std::int32_t& priority) noexcept;

// Lowest and highest address of the calling thread's stack. One look a thread, then no system call. Both 0 when the
// host does not tell.
struct StackBounds {
    std::uintptr_t low, high;
};
StackBounds CurrentStackBounds() noexcept;

std::uint32_t NumberOfProcessors() noexcept;

// Gives the processor to another thread.
void YieldThread() noexcept;

// From now on the calling thread's waits end as soon after their time as the host can: for who serves time-outs.
void WakeOnTime() noexcept;

// The processor's hint that this is a spin loop.
inline void SpinPause() noexcept {
#if defined(__x86_64__) || defined(__i386__)
    __builtin_ia32_pause();
#elif defined(__aarch64__) || defined(__arm__)
    asm volatile("yield");
#endif
}

// Thread-local slots: one pointer a thread and key, null at first.
using LocalKey = std::uint32_t;
constexpr LocalKey kNoLocalKey = 0xFFFFFFFFu;
LocalKey LocalKeyAllocate() noexcept;  // kNoLocalKey when there is none left
bool LocalKeyFree(LocalKey key) noexcept;
bool LocalSet(LocalKey key, void* value) noexcept;
void* LocalGet(LocalKey key) noexcept;

}  // namespace tessel::platform

#endif
