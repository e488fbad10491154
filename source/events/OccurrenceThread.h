// The schedule of the occurrences, and the thread that serves it and the time-outs of handlers.
#ifndef TESSEL_SOURCE_EVENTS_OCCURRENCETHREAD_H
#define TESSEL_SOURCE_EVENTS_OCCURRENCETHREAD_H

#include "events/OccurrenceLocks.h"
#include "events/OccurrenceRecords.h"
#include <tessel/base/MgErr.h>

namespace tessel {

// The occurrences with a schedule.
extern TimeList schedule TESSEL_GUARDED_BY(gTimerOccMutex);

// Lets the thread wake for what is due next. After a time was added in front; one that went away costs it a look.
void UpdateWakeUp() TESSEL_REQUIRES(gTimerOccMutex);

// Takes the occurrence off the schedule.
void Unschedule(Occ& occurrence) TESSEL_REQUIRES(gTimerOccMutex);

// Empties the schedule and the list of time-outs, for the stop.
void ForgetTimes();

// kMemFullErr when the thread cannot be made.
MgErr OccurrenceThreadStart(bool hardWaitTimeCritical);

// Waits until the thread has ended; what it runs, ends first.
void OccurrenceThreadStop();

}  // namespace tessel

#endif
