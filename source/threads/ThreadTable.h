// The table of thread records, and what goes with it.
#ifndef TESSEL_SOURCE_THREADS_THREADTABLE_H
#define TESSEL_SOURCE_THREADS_THREADTABLE_H

#include "platform/Thread.h"
#include "sync/LibraryMutex.h"
#include "threads/Service.h"
#include <tessel/threads/ThThread.h>

namespace tessel {

// Guards the thread table, and the change of a thread's priority. Memory may be taken and threads started inside;
// nothing of the host's runs inside. There is none while the service is stopped.
extern LibraryMutex gCreateThread;

inline bool IsThread(ThThread thread) {
    return thread && thread->verifier == kThThreadVerifier;
}

inline platform::ThreadHandle HandleOf(ThThread thread) {
    return static_cast<platform::ThreadHandle>(thread->platformThread);
}

// How many threads that had this place in the table are gone.
uint32 ThreadEndings(int32 index);

// Sets the priorities of the levels, from the defaults and what is configured, and reports them.
void BuildPriorityTable(ThreadPriorityReader configured);

}  // namespace tessel

#endif
