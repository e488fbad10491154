// Start and stop of the occurrences, for the service object.
#ifndef TESSEL_SOURCE_EVENTS_SERVICE_H
#define TESSEL_SOURCE_EVENTS_SERVICE_H

#include <tessel/base/MgErr.h>

namespace tessel {

// The occurrence thread runs at level 3 ("very high") when the host's hard waits are time critical, else at level 4.
// Stop reports what is left, waits for the thread, and frees everything.
MgErr OccurrenceManagerStart(bool hardWaitTimeCritical = false);
MgErr OccurrenceManagerStop();

}  // namespace tessel

#endif
