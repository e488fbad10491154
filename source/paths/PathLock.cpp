#include "paths/PathLock.h"

namespace tessel {
namespace {

ThMutex gPathMutex = nullptr;
thread_local uint32 tPathLockDepth = 0;

}  // namespace

void PathLock::Acquire() {
    if (tPathLockDepth++ == 0) ThMutexAcquire(gPathMutex);
}

void PathLock::Release() {
    if (--tPathLockDepth == 0) ThMutexRelease(gPathMutex);
}

MgErr PathLock::CreateMutex() {
    return ThMutexCreate(&gPathMutex, "PathMutex");
}

void PathLock::DestroyMutex() {
    ThMutexDestroy(gPathMutex);
    gPathMutex = nullptr;
}

ThMutex PathLock::Mutex() {
    return gPathMutex;
}

}  // namespace tessel
