#include "platform/MessageEvent.h"

#include "platform/Mutex.h"
#include "platform/posix/Errors.h"
#include "platform/posix/Interrupted.h"
#include "platform/posix/Threads.h"

#include <cstdio>
#include <cstdlib>
#include <cstring>
#include <new>
#include <unistd.h>

namespace tessel::platform {

namespace {

struct Source {
    ThreadId thread;
    std::uint64_t start;  // of the thread: its number may be given to another
    Source* next;
    Event event;
};

// When the thread began, in the host's ticks; 0 when it does not tell.
std::uint64_t StartOf(ThreadId thread) {
    char name[48], text[512];
    std::snprintf(name, sizeof name, "/proc/self/task/%u/stat", static_cast<unsigned>(thread));
    int file = OpenRetrying(name, O_RDONLY);
    if (file < 0) return 0;
    const ssize_t got = Retry([&] { return systemCalls.read(file, text, sizeof text - 1); });
    systemCalls.close(file);
    if (got <= 0) return 0;
    text[got] = 0;
    constexpr int kStateField = 3, kStartField = 22;  // the name before them, in brackets, may hold anything
    const char* at = std::strrchr(text, ')');
    for (int field = kStateField - 1; at && field < kStartField; ++field) at = std::strchr(at + 1, ' ');
    return at ? std::strtoull(at, nullptr, 10) : 0;
}

constinit Mutex sourcesMutex;  // nothing is taken inside but what an event takes
constinit Source* sources TESSEL_GUARDED_BY(sourcesMutex) = nullptr;

// The link that holds the thread's source, or the one at the end.
Source** Find(ThreadId thread) TESSEL_REQUIRES(sourcesMutex) {
    Source** link = &sources;
    while (*link && (*link)->thread != thread) link = &(*link)->next;
    return link;
}

// An earlier thread of that number may have left one that was signaled and never asked for.
Source* FindOrMake(ThreadId thread) TESSEL_REQUIRES(sourcesMutex) {
    Source** link = Find(thread);
    std::uint64_t start = StartOf(thread);
    if (!*link) *link = new (std::nothrow) Source{thread, start, nullptr, Event()};
    if (*link && (*link)->start != start) {
        (*link)->event.Renew(false);
        (*link)->start = start;
    }
    return *link;
}

// Takes the calling thread's source out when the thread ends.
struct Owner {
    Source* source = nullptr;
    ~Owner() {
        if (source) ForgetMessageEvent(source->thread);
    }
};

thread_local Owner own;

}  // namespace

void ForgetMessageEvent(ThreadId thread) noexcept {
    MutexHolder holder(sourcesMutex);
    Source** link = Find(thread);
    if (Source* source = *link) {
        *link = source->next;
        delete source;
    }
}

Event* OwnMessageEvent() noexcept {
    if (!own.source) {
        MutexHolder holder(sourcesMutex);
        own.source = FindOrMake(CurrentThreadId());
    }
    return own.source ? &own.source->event : nullptr;
}

bool SignalMessageEvent(ThreadId thread) noexcept {
    if (!IsThreadOfProcess(thread)) return FailWith(kErrorInvalidParameter);
    MutexHolder holder(sourcesMutex);
    Source* source = FindOrMake(thread);
    if (!source) return FailWith(kErrorNotEnoughMemory);
    source->event.Set();
    return true;
}

}  // namespace tessel::platform
