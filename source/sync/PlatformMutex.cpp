#include "platform/Mutex.h"
#include "sync/PlainAllocation.h"
#include <tessel/sync/PlatformMutex.h>

namespace tessel {
namespace {

// Taken and given back by calls of the host's.
class HostMutex final : public PlatformMutex, public PlainAllocation {
public:
    int32 Lock() override TESSEL_LOCKS_UNPROVEN {
        mutex_.Lock();
        return 0;
    }
    int32 Unlock() override TESSEL_LOCKS_UNPROVEN {
        mutex_.Unlock();
        return 0;
    }
    MgErr Init() override { return kNoErr; }
    MgErr Uninit() override { return kNoErr; }

private:
    platform::Mutex mutex_;
};

}  // namespace

PlatformMutex::~PlatformMutex() = default;

PlatformMutex* CreatePlatformMutex() {
    PlatformMutex* mutex = new (std::nothrow) HostMutex;
    if (mutex) mutex->Init();
    return mutex;
}

MgErr DestroyPlatformMutex(PlatformMutex* mutex) {
    if (!mutex) return kNoErr;
    const MgErr err = mutex->Uninit();
    delete mutex;
    return err;
}

}  // namespace tessel
