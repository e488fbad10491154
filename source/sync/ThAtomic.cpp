#include <tessel/sync/ThAtomic.h>

int32 _ThAtomicInc(int32* address) {
    return __atomic_add_fetch(address, 1, __ATOMIC_SEQ_CST);
}

int32 _ThAtomicDec(int32* address) {
    return __atomic_sub_fetch(address, 1, __ATOMIC_SEQ_CST);
}

int32 ThAtomicSwap(int32* address, int32 value) {
    return __atomic_exchange_n(address, value, __ATOMIC_SEQ_CST);
}

void* ThAtomicSwapPtr(void** address, void* value) {
    return __atomic_exchange_n(address, value, __ATOMIC_SEQ_CST);
}

int32 ThSwapIfSame(int32* address, int32 value, int32 expected) {
    return __atomic_compare_exchange_n(address, &expected, value, false, __ATOMIC_SEQ_CST, __ATOMIC_SEQ_CST) ? 1 : 0;
}

int32 ThSwapIfSamePtr(void** address, void* value, void* expected) {
    return __atomic_compare_exchange_n(address, &expected, value, false, __ATOMIC_SEQ_CST, __ATOMIC_SEQ_CST) ? 1 : 0;
}
