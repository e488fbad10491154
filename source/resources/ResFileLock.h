// The resource file lock: one, process-wide, around every operation on any resource file or resource.
#ifndef TESSEL_SOURCE_RESOURCES_RESFILELOCK_H
#define TESSEL_SOURCE_RESOURCES_RESFILELOCK_H

#include <tessel/base/MgErr.h>

namespace tessel {

// Holds the lock for a scope. A thread that holds it already may take it again, so that an operation can be made of
// others. Guards the files with their maps and lookup caches, the handle cache, and the counter of unique IDs. The
// path, memory and cookie locks may be taken inside. The host is not called inside: see ReportUnlocked.
class ResFileLock {
public:
    ResFileLock();
    ~ResFileLock();
    ResFileLock(const ResFileLock&) = delete;
    ResFileLock& operator=(const ResFileLock&) = delete;

    static MgErr Create();
    static void Destroy();
};

// Runs `report`, which makes a report: at once, or when this thread holds the lock, as soon as it has let go. What is
// reported several times until then is reported once.
void ReportUnlocked(void (*report)());

}  // namespace tessel

#endif
