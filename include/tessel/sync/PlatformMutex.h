// The plain mutex of the host, for what must not use ThMutex. Not recursive.
#ifndef TESSEL_SYNC_PLATFORMMUTEX_H
#define TESSEL_SYNC_PLATFORMMUTEX_H

#include <tessel/base/MgErr.h>

#ifdef __cplusplus

namespace tessel {

// Every operation returns 0.
// The operations of a mutex. Every one returns 0.
class TESSEL_API PlatformMutex {
public:
    virtual ~PlatformMutex();
    // Waits until the mutex is free, and holds it.
    virtual int32 Lock() = 0;
    // Lets it go. Only for the thread that holds it.
    virtual int32 Unlock() = 0;
    // Before first use.
    virtual MgErr Init() = 0;
    // After the last use.
    virtual MgErr Uninit() = 0;
};

// A new mutex of this host, or null. Destroy: null is fine.
TESSEL_API PlatformMutex* CreatePlatformMutex();
// Ends a mutex, which nobody holds. Null is fine.
TESSEL_API MgErr DestroyPlatformMutex(PlatformMutex* mutex);

}  // namespace tessel

#endif
#endif
