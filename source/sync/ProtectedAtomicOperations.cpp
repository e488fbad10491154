#include "sync/ProtectedAtomicOperations.h"

#include "sync/Service.h"
#include <tessel/sync/ThAtomic.h>
#include <tessel/system/CPUInformation.h>

#include <atomic>
#include <cstring>

namespace tessel {
namespace {

std::atomic<bool> inHardware{false};

// 8 bytes at any address: the processor's compare-and-exchange does not mind.
typedef uint64 __attribute__((aligned(1))) UnalignedUInt64;

// Tells the compiler that the address is aligned, which its check of atomics wants.
uint64 CompareExchange(void* address, uint64 expected, uint64 value) {
    return __sync_val_compare_and_swap(static_cast<UnalignedUInt64*>(address), expected, value);
}

void CopyInHardware(void* own, void* shared, bool write) {
    if (!write) {
        const uint64 value = CompareExchange(shared, 0, 0);
        std::memcpy(own, &value, sizeof value);
        return;
    }
    uint64 value, seen = 0, observed;
    std::memcpy(&value, own, sizeof value);
    while ((observed = CompareExchange(shared, seen, value)) != seen) seen = observed;
}

void CopyUnderMutex(void* own, void* shared, bool write, ThMutex mutex) {
    ThMutexHolder hold(mutex);
    if (write)
        std::memcpy(shared, own, sizeof(uint64));
    else
        std::memcpy(own, shared, sizeof(uint64));
}

}  // namespace

void SetAtomicsInHardware(bool on) {
    inHardware.store(on, std::memory_order_relaxed);
}

bool AtomicsInHardware() {
    return inHardware.load(std::memory_order_relaxed);
}

MgErr ProtectedAtomicOperationsStart() {
    CPUInformation* info = CPUInfo();
    const CPUFeatures* features = info ? info->GetFeatures(kCPUFeatureSelector) : nullptr;
    SetAtomicsInHardware(features && (features->GetFlags() & CPUFeatures::kCompareExchange8) != 0);
    return kNoErr;
}

MgErr ProtectedAtomicOperationsStop() {
    return kNoErr;
}

}  // namespace tessel

void Th8ByteAtomicWrtRd(void* own, void* shared, int32 direction, ThMutex mutex) {
    const bool write = direction != 0;
    if (tessel::AtomicsInHardware())
        tessel::CopyInHardware(own, shared, write);
    else
        tessel::CopyUnderMutex(own, shared, write, mutex);
}
