#include "resources/ResFileLock.h"

#include <tessel/sync/ThMutex.h>

namespace tessel {

namespace {

ThMutex gResFileMutex = nullptr;
thread_local int32 tHeld = 0;  // how often this thread holds the lock

}  // namespace

ResFileLock::ResFileLock() {
    if (tHeld++ == 0) ThMutexAcquire(gResFileMutex);
}

ResFileLock::~ResFileLock() {
    if (--tHeld == 0) ThMutexRelease(gResFileMutex);
}

MgErr ResFileLock::Create() {
    if (gResFileMutex) return kNoErr;
    return ThMutexCreate(&gResFileMutex, "ResourceFile");
}

void ResFileLock::Destroy() {
    ThMutexDestroy(gResFileMutex);
    gResFileMutex = nullptr;
}

}  // namespace tessel
