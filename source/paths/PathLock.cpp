#include "paths/PathLock.h"

namespace tessel {

RecursiveMutex pathMutex;

namespace {

thread_local uint32 pathMutexHeld = 0;

}  // namespace

void PathLock::Acquire() {
    pathMutex.Acquire(pathMutexHeld);
}

void PathLock::Release() {
    pathMutex.Release(pathMutexHeld);
}

MgErr PathLock::CreateMutex() {
    return pathMutex.Create("PathMutex");
}

void PathLock::DestroyMutex() {
    pathMutex.Destroy();
}

ThMutex PathLock::Mutex() {
    return pathMutex.Get();
}

}  // namespace tessel
