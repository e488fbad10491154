#include "platform/Thread.h"
#include <tessel/sync/ThLocalStorage.h>

using namespace tessel;

static_assert(kThNoLocalStorageKey == platform::kNoLocalKey);

uint32 ThLocalStorageAllocateKey(void) {
    return platform::LocalKeyAllocate();
}

void ThLocalStorageSetValue(uint32 key, void* value) {
    platform::LocalSet(key, value);
}

void* ThLocalStorageGetValue(uint32 key) {
    return platform::LocalGet(key);
}

void ThLocalStorageFreeKey(uint32 key) {
    platform::LocalKeyFree(key);
}
