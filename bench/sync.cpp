// Mutexes, events and the clock.
#include "support/Compare.h"
#include <tessel/tessel.h>

#include <atomic>
#include <chrono>
#include <condition_variable>
#include <mutex>
#include <semaphore.h>
#include <semaphore>
#include <thread>
#include <time.h>

namespace {

using bench::Keep;
using bench::Loop;

// Operations of each of two threads that run the loop at once, as a loop of their sum.
Loop OnTwoThreads(const Loop& loop) {
    return [loop](std::uint64_t operations) {
        std::thread second([&] { loop(operations / 2); });
        loop(operations - operations / 2);
        second.join();
    };
}

Loop WithThMutex(ThMutex mutex, std::uint64_t* shared) {
    return [=](std::uint64_t operations) {
        for (std::uint64_t i = 0; i < operations; ++i) {
            ThMutexAcquire(mutex);
            ++*shared;
            ThMutexRelease(mutex);
        }
    };
}

Loop WithStdMutex(std::mutex* mutex, std::uint64_t* shared) {
    return [=](std::uint64_t operations) {
        for (std::uint64_t i = 0; i < operations; ++i) {
            mutex->lock();
            ++*shared;
            mutex->unlock();
        }
    };
}

// Round trips between two threads: each `there` is answered by a `back`.
template <class Signal, class Wait>
Loop PingPong(Signal signal, Wait wait) {
    return [=](std::uint64_t operations) {
        std::thread other([&] {
            for (std::uint64_t i = 0; i < operations; ++i) {
                wait(0);
                signal(1);
            }
        });
        for (std::uint64_t i = 0; i < operations; ++i) {
            signal(0);
            wait(1);
        }
        other.join();
    };
}

// A flag under a mutex with a condition variable.
struct Flag {
    std::mutex mutex;
    std::condition_variable changed;
    bool set = false;

    void Signal() {
        {
            std::lock_guard<std::mutex> hold(mutex);
            set = true;
        }
        changed.notify_one();
    }
    void Wait() {
        std::unique_lock<std::mutex> hold(mutex);
        changed.wait(hold, [this] { return set; });
        set = false;
    }
};

void CompareMutexes(bench::Table& table) {
    ThMutex ours = nullptr;
    std::mutex theirs;
    std::uint64_t shared = 0;
    ThMutexCreate(&ours, "bench");
    table.Compare("ThMutex acquire + release, uncontended", WithThMutex(ours, &shared), "std::mutex",
                  WithStdMutex(&theirs, &shared), 0.95);
    table.Compare("the same, 2 threads hammering", OnTwoThreads(WithThMutex(ours, &shared)), "std::mutex",
                  OnTwoThreads(WithStdMutex(&theirs, &shared)), 1.0);
    ThMutexDestroy(ours);
}

// Processor time of the calling thread, in seconds.
double ProcessorTime() {
    timespec used;
    clock_gettime(CLOCK_THREAD_CPUTIME_ID, &used);
    return static_cast<double>(used.tv_sec) + static_cast<double>(used.tv_nsec) * 1e-9;
}

// What a wait for nothing costs: it must not burn a processor. The event was in heavy use just before.
void CompareIdleWaits(bench::Table& table, ThEvent event) {
    auto used = [](auto wait) {
        return [wait] {
            double before = ProcessorTime();
            wait();
            return ProcessorTime() - before;
        };
    };
    std::binary_semaphore semaphore(0);
    table.CompareTimed("processor time of a wait of 20 ms for nothing",
                       used([=] { ThEventWaitWithTimeout(event, 20); }), "std::binary_semaphore",
                       used([&] { (void)semaphore.try_acquire_for(std::chrono::milliseconds(20)); }), 1.0);
}

void CompareEvents(bench::Table& table) {
    ThEvent events[2];
    for (ThEvent& event : events) ThEventCreate(&event, 0, false);
    ThEvent event = events[0];

    std::atomic<std::uint32_t> word{0};
    table.Compare(
        "ThEventSignal without a waiter",
        [=](std::uint64_t operations) {
            for (std::uint64_t i = 0; i < operations; ++i) ThEventSignal(event);
        },
        "one atomic read-modify-write",
        [&](std::uint64_t operations) {
            for (std::uint64_t i = 0; i < operations; ++i) word.fetch_or(1, std::memory_order_seq_cst);
        },
        1.5);

    sem_t semaphore;
    sem_init(&semaphore, 0, 0);
    table.Compare(
        "ThEventSignal + ThEventWait in one thread",
        [=](std::uint64_t operations) {
            for (std::uint64_t i = 0; i < operations; ++i) {
                ThEventSignal(event);
                ThEventWait(event);
            }
        },
        "sem_post + sem_wait",
        [&](std::uint64_t operations) {
            for (std::uint64_t i = 0; i < operations; ++i) {
                sem_post(&semaphore);
                sem_wait(&semaphore);
            }
        },
        1.0);
    sem_destroy(&semaphore);

    std::binary_semaphore semaphores[2] = {std::binary_semaphore(0), std::binary_semaphore(0)};
    Loop ours = PingPong([&](int i) { ThEventSignal(events[i]); }, [&](int i) { ThEventWait(events[i]); });
    table.Compare("event ping-pong between two threads, round trip", ours, "std::binary_semaphore",
                  PingPong([&](int i) { semaphores[i].release(); }, [&](int i) { semaphores[i].acquire(); }), 1.0);
    Flag flags[2];
    table.Compare("the same", ours, "condition variable",
                  PingPong([&](int i) { flags[i].Signal(); }, [&](int i) { flags[i].Wait(); }), 1.0);
    CompareIdleWaits(table, event);
    for (ThEvent each : events) ThEventDestroy(each);
}

void CompareClock(bench::Table& table) {
    table.Compare(
        "MilliSecs",
        [](std::uint64_t operations) {
            for (std::uint64_t i = 0; i < operations; ++i) Keep(MilliSecs());
        },
        "clock_gettime(CLOCK_MONOTONIC)",
        [](std::uint64_t operations) {
            for (std::uint64_t i = 0; i < operations; ++i) {
                timespec now;
                clock_gettime(CLOCK_MONOTONIC, &now);
                Keep(now.tv_nsec);
            }
        },
        1.05);
}

}  // namespace

int main() {
    if (InitTesselBase() != kNoErr) return 1;
    std::binary_semaphore end(0);
    std::thread second([&] { end.acquire(); });  // so that nobody takes a single-threaded short cut
    {
        bench::Table table("sync");
        CompareMutexes(table);
        CompareEvents(table);
        CompareClock(table);
    }
    end.release();
    second.join();
    return UninitTesselBase();
}
