// Start and stop of the threads, for the service object, and what other services ask of them.
#ifndef TESSEL_SOURCE_THREADS_SERVICE_H
#define TESSEL_SOURCE_THREADS_SERVICE_H

#include <tessel/base/MgErr.h>
#include <tessel/threads/ThThread.h>

namespace tessel {

// Reads an int32 of the configuration; false, and the value as it was, when there is none.
using ThreadPriorityReader = bool (*)(CStr key, int32& value);

// `configured` (null: nothing is configured) is asked for "thpri_bgrnd", "thpri_normal", "thpri_high", "thpri_vhigh"
// and "thpri_tcrit", the platform priorities of the five levels. Stop reports the threads that are left.
MgErr ThThreadStart(ThreadPriorityReader configured = nullptr);
MgErr ThThreadStop();

// For the library's own threads, above normal: sets the level, or the highest below it that the process may give, as
// most users' processes may give none. That is worth an information, where ThThreadSetPriority reports an error.
void RaiseThreadPriority(ThThread thread, int32 level);

}  // namespace tessel

#endif
