#include "platform/MessageEvent.h"

#include <new>

#include "platform/Mutex.h"
#include "platform/posix/Errors.h"
#include "platform/posix/Threads.h"

namespace tessel::platform {

namespace {

struct Source {
    ThreadId thread;
    Source* next;
    Event event;
};

constinit Mutex sourcesMutex; /* guards the list; nothing is taken inside but what an event takes */
constinit Source* sources = nullptr;

/* The link that holds the thread's source, or the one at the end; under the mutex. */
Source** Find(ThreadId thread) {
    Source** link = &sources;
    while (*link && (*link)->thread != thread) link = &(*link)->next;
    return link;
}

Source* FindOrMake(ThreadId thread) {
    Source** link = Find(thread);
    if (!*link) *link = new (std::nothrow) Source{thread, nullptr, Event()};
    return *link;
}

/* Takes the calling thread's source out when the thread ends. That of one that is ended by force stays, for the next
   thread of that number. */
struct Owner {
    Source* source = nullptr;
    ~Owner() {
        if (!source) return;
        MutexHolder holder(sourcesMutex);
        Source** link = Find(source->thread);
        *link = source->next;
        delete source;
    }
};

thread_local Owner own;

}  // namespace

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
