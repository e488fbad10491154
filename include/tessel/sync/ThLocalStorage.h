// Thread-local storage: one pointer per thread and key, null at first. Any thread.
#ifndef TESSEL_SYNC_THLOCALSTORAGE_H
#define TESSEL_SYNC_THLOCALSTORAGE_H

#include <tessel/base/Types.h>

// What ThLocalStorageAllocateKey returns when there is no key left.
#define kThNoLocalStorageKey ((uint32)0xFFFFFFFF)

TESSEL_BEGIN_C

// A new key, null in every thread; kThNoLocalStorageKey when there is none left.
TESSEL_API uint32 ThLocalStorageAllocateKey(void);
// Stores the calling thread's value. Nothing for what is no key.
TESSEL_API void ThLocalStorageSetValue(uint32 key, void* value);
// The calling thread's value; null when it set none, and for what is no key.
TESSEL_API void* ThLocalStorageGetValue(uint32 key);

// The values are the callers'.
TESSEL_API void ThLocalStorageFreeKey(uint32 key);

TESSEL_END_C

#endif
