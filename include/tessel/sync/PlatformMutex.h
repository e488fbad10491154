// The plain mutex of the host, for what must not use ThMutex. Not recursive.
#ifndef TESSEL_SYNC_PLATFORMMUTEX_H
#define TESSEL_SYNC_PLATFORMMUTEX_H

#include <tessel/base/MgErr.h>

#ifdef __cplusplus

namespace tessel {

// Every operation returns 0.
class TESSEL_API PlatformMutex {
public:
    virtual ~PlatformMutex();
    virtual int32 Lock() = 0;
    virtual int32 Unlock() = 0;
    virtual MgErr Init() = 0;
    virtual MgErr Uninit() = 0;
};

// A new mutex of this host, or null. Destroy: null is fine.
TESSEL_API PlatformMutex* CreatePlatformMutex();
TESSEL_API MgErr DestroyPlatformMutex(PlatformMutex* mutex);

}  // namespace tessel

#endif
#endif
