#include "events/AsyncArea.h"

#include <tessel/memory/MemoryManager.h>

#include <atomic>
#include <bit>

namespace tessel {
namespace {

static_assert(sizeof(OccurAsyncArea) == 8200 && sizeof(OccurAsyncSlot) == sizeof(uint64));

constexpr int kLastSlots = 10;

std::atomic<OccurAsyncArea*> area{nullptr};
std::atomic<ResetCountDownRegCallbackProc> resetCountDown{nullptr};

// How many slots InterruptSafeOccur has claimed, counted after the claim: so every post that has returned is counted,
// and below 0 for a moment when a slot is taken before it is counted. Slots that a host claimed itself are not.
std::atomic<int32> counted{0};

constexpr OccurAsyncSlot kFreeSlot{0, 0, 0};

// Flag and refnum change together, in one exchange.
OccurAsyncSlot Load(const OccurAsyncSlot& slot) {
    return std::bit_cast<OccurAsyncSlot>(__atomic_load_n(reinterpret_cast<const uint64*>(&slot), __ATOMIC_ACQUIRE));
}
bool Exchange(OccurAsyncSlot& slot, OccurAsyncSlot& expected, OccurAsyncSlot desired) {
    uint64 old = std::bit_cast<uint64>(expected);
    const bool done =
        __atomic_compare_exchange_n(reinterpret_cast<uint64*>(&slot), &old, std::bit_cast<uint64>(desired), false,
                                    __ATOMIC_ACQ_REL, __ATOMIC_ACQUIRE);
    expected = std::bit_cast<OccurAsyncSlot>(old);
    return done;
}

bool IsClaimed(const OccurAsyncSlot& slot) {
    return (slot.claimed & 1) != 0;
}

// A slot that holds the occurrence is exchanged for itself: whoever takes it later sees what the caller did before.
bool Claim(OccurAsyncSlot& slot, Occurrence occurrence) {
    OccurAsyncSlot found = Load(slot);
    for (;;) {
        const bool claimed = IsClaimed(found);
        if (claimed && found.occurrence != occurrence) return false;
        if (!Exchange(slot, found, claimed ? found : OccurAsyncSlot{1, 1, occurrence})) continue;
        if (!claimed) counted.fetch_add(1, std::memory_order_release);
        return true;
    }
}

// 0 when it is free.
Occurrence Take(OccurAsyncSlot& slot) {
    OccurAsyncSlot found = Load(slot);
    while (IsClaimed(found)) {
        if (!Exchange(slot, found, kFreeSlot)) continue;
        if (found.counted) counted.fetch_sub(1, std::memory_order_relaxed);
        if (found.occurrence) return found.occurrence;
        found = Load(slot);
    }
    return 0;
}

}  // namespace

MgErr AsyncAreaStart() {
    counted = 0;
    area = reinterpret_cast<OccurAsyncArea*>(DSNewPClr(sizeof(OccurAsyncArea)));
    return area.load() ? kNoErr : kMemFullErr;
}

void AsyncAreaStop() {
    if (OccurAsyncArea* old = area.exchange(nullptr)) DSDisposePtr(old);
}

bool AsyncAreaHasOccurrence() {
    const OccurAsyncArea* own = area.load(std::memory_order_acquire);
    return own && (counted.load(std::memory_order_acquire) > 0 || IsClaimed(Load(own->slots[0])));
}

// Where one is taken, the next post leaves a gap before others: so it walks on while any is counted, and again from the
// first slot when it took some on the way.
Occurrence AsyncAreaWalk::Next() {
    OccurAsyncArea* own = area.load(std::memory_order_acquire);
    for (;;) {
        while (slot_ < kNumOccurAsyncSlots) {
            const Occurrence noted = Take(own->slots[slot_++]);
            tookSome_ |= noted != 0;
            if (noted) return noted;
            if (counted.load(std::memory_order_acquire) <= 0) slot_ = kNumOccurAsyncSlots;
        }
        if (!tookSome_ || !AsyncAreaHasOccurrence()) return 0;
        tookSome_ = false;
        slot_ = 0;
    }
}

}  // namespace tessel

using namespace tessel;

MgErr InterruptSafeOccur(Occurrence occurrence) {
    OccurAsyncArea* own = area.load(std::memory_order_acquire);
    if (!own) return kNoErr;
    for (int i = 0; i < kNumOccurAsyncSlots; ++i) {
        if (!Claim(own->slots[i], occurrence)) continue;
        const ResetCountDownRegCallbackProc procedure = resetCountDown.load(std::memory_order_acquire);
        if (procedure && i >= kNumOccurAsyncSlots - kLastSlots) procedure();
        return kNoErr;
    }
    return kOccurrenceFullErr;
}

OccurAsyncArea* GetOccurrenceManagerAsyncArea() {
    return area.load(std::memory_order_acquire);
}

void SetResetCountDownRegCallbackProc(ResetCountDownRegCallbackProc procedure) {
    resetCountDown.store(procedure, std::memory_order_release);
}
