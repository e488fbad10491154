// The path mutex: one, process-wide.
#ifndef TESSEL_SOURCE_PATHS_PATHLOCK_H
#define TESSEL_SOURCE_PATHS_PATHLOCK_H

#include "sync/RecursiveMutex.h"

namespace tessel {

// The path mutex guards the children and the cached items of every element, and the end of elements. The storage mutex
// may be taken inside. A thread may hold it more than once, so that what is called with it held can use paths.
extern RecursiveMutex pathMutex;

// Holds it for a scope.
class TESSEL_LOCKS(scoped_lockable) PathLock {
public:
    PathLock() TESSEL_LOCKS(acquire_capability(pathMutex)) { Acquire(); }
    ~PathLock() TESSEL_LOCKS(release_capability()) { Release(); }
    PathLock(const PathLock&) = delete;
    PathLock& operator=(const PathLock&) = delete;

    static void Acquire();
    static void Release();
    static MgErr CreateMutex();
    static void DestroyMutex();
    static ThMutex Mutex();
};

}  // namespace tessel

#endif
