// The groups of threads, and the running of the handlers that were fired for them.
#ifndef TESSEL_SOURCE_EVENTS_THREADGROUPS_H
#define TESSEL_SOURCE_EVENTS_THREADGROUPS_H

#include "events/OccurrenceLocks.h"
#include "events/OccurrenceRecords.h"
#include <tessel/events/OccurrenceManager.h>

namespace tessel {

// Stands for the threads that set occurrences: the handlers on its list are run by whoever fires them.
constexpr int32 kThreadSafeGroup = kNumOccThreadGroups;

// A group's fired handlers, and who is told of them.
struct ThreadGroup {
    HandlerList fired;
    OccThreadGroupProc notify = nullptr;
    void* argument = nullptr;
};

// The last is kThreadSafeGroup.
extern ThreadGroup threadGroups[kNumOccThreadGroups + 1];

// Every thread is in a group of its own, and nobody is told.
void ResetThreadGroups();

// The group of the calling thread.
int32 OwnThreadGroup();

// Sets what the interrupt-safe area holds, then runs the fired handlers of the group, one after the other.
void RunThreadGroup(int32 group);
inline void RunThreadSafeHandlers() {
    RunThreadGroup(kThreadSafeGroup);
}

}  // namespace tessel

#endif
