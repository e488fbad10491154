#include "diagnostics/AllocRecords.h"

#include "platform/Thread.h"

#include <algorithm>
#include <bit>

namespace tessel {
namespace {

constexpr uint32 kFirstSlots = 16;
constexpr int kSpinsBeforeYield = 64;

class TESSEL_LOCKS(scoped_lockable) SpinLockHolder {
public:
    explicit SpinLockHolder(SpinLock& lock) TESSEL_LOCKS(acquire_capability(lock)) : lock_(lock) { lock_.Lock(); }
    ~SpinLockHolder() TESSEL_LOCKS(release_capability()) { lock_.Unlock(); }
    SpinLockHolder(const SpinLockHolder&) = delete;
    SpinLockHolder& operator=(const SpinLockHolder&) = delete;

private:
    SpinLock& lock_;
};

}  // namespace

void SpinLock::LockSlowly() {
    do {
        for (int spins = 0; held_.load(std::memory_order_relaxed); ++spins)
            spins < kSpinsBeforeYield ? platform::SpinPause() : platform::YieldThread();
    } while (held_.exchange(true, std::memory_order_acquire));
}

// Where an address belongs: the top bits of its hash choose the shard, the others the slot.
struct AllocRecords::Place {
    explicit Place(uintptr_t address_) : address(address_), hash((uint64{address_} >> 3) * 0x9E3779B97F4A7C15u) {}
    uint32 Shard() const { return static_cast<uint32>(hash >> (64 - kShardBits)); }
    uint32 Slot() const { return static_cast<uint32>(hash >> (32 - kShardBits)); }

    uintptr_t address;
    uint64 hash;
};

AllocRecords::Shard& AllocRecords::ShardOf(Place place) {
    return shards_[place.Shard()];
}

// The slot of the address, or the free one where it would go. There is always a free one.
AllocRecord* AllocRecords::Look(const Shard& shard, Place place) {
    uint32 slot = place.Slot() & shard.mask;
    while (shard.slots[slot].address != 0 && shard.slots[slot].address != place.address) slot = (slot + 1) & shard.mask;
    return &shard.slots[slot];
}

bool AllocRecords::Grow(Shard& shard, TrackerFailure& failure) {
    AllocRecord* const old = shard.slots;
    const uint32 oldCount = old ? shard.mask + 1 : 0;
    const uint32 count = old ? 2 * oldCount : kFirstSlots;
    auto* slots = static_cast<AllocRecord*>(heap_.Allocate(size_t{count} * sizeof(AllocRecord), failure));
    if (!slots) return false;
    shard.slots = slots;
    shard.mask = count - 1;
    for (uint32 i = 0; i < oldCount; ++i)
        if (old[i].address) *Look(shard, Place(old[i].address)) = old[i];
    heap_.Release(old, failure);
    return true;
}

AllocRecords::Insertion AllocRecords::Insert(uintptr_t address, const CallSite* site, uint32 size, AllocRecord& earlier,
                                             TrackerFailure& failure) {
    const Place place(address);
    bool isMore = false;
    const Insertion result = InsertInto(ShardOf(place), place, {address, site, 0, size, 0}, earlier, isMore, failure);
    if (isMore) TakeRoom(size);
    return result;
}

// `isMore`: it does not fit into the room of the shard.
AllocRecords::Insertion AllocRecords::InsertInto(Shard& shard, Place place, AllocRecord record, AllocRecord& earlier,
                                                 bool& isMore, TrackerFailure& failure) {
    SpinLockHolder hold(shard.lock);
    // At most three quarters are taken.
    if ((!shard.slots || 4 * uint64{shard.counts.live + 1} > 3 * (uint64{shard.mask} + 1)) && !Grow(shard, failure))
        return Insertion::kFailed;
    AllocRecord* const slot = Look(shard, place);
    if (slot->address) {
        earlier = *slot;
        return Insertion::kDuplicate;
    }
    // Only what is kept has a number, so that there are no gaps; the one word that all threads share costs less than
    // numbers in another order would.
    record.number = made_.fetch_add(1, std::memory_order_relaxed) + 1;
    *slot = record;
    shard.counts.bytesMade += record.size;
    shard.counts.bytes += record.size;
    ++shard.counts.live;
    ++shard.counts.unreported;
    isMore = !shard.room.Take(record.size);
    return Insertion::kDone;
}

bool AllocRecords::Amount::Take(uint32 size) {
    if (records == 0 || bytes < size) return false;
    --records;
    bytes -= size;
    return true;
}

void AllocRecords::GiveRoom(Shard& shard, uint32 size) {
    ++shard.room.records;
    shard.room.bytes += size;
    const uint64 bit = uint64{1} << (&shard - shards_);
    if (!(withRoom_.load(std::memory_order_relaxed) & bit)) withRoom_.fetch_or(bit, std::memory_order_relaxed);
}

// From all shards; what they do not have there has never been.
void AllocRecords::TakeRoom(uint32 size) {
    SpinLockHolder hold(mostLock_);
    if (room_.Take(size)) return;
    for (uint64 bits = withRoom_.exchange(0, std::memory_order_relaxed); bits != 0; bits &= bits - 1) {
        Shard& shard = shards_[std::countr_zero(bits)];
        SpinLockHolder holdShard(shard.lock);
        room_.records += shard.room.records;
        room_.bytes += shard.room.bytes;
        shard.room = {};
    }
    const uint64 records = std::min<uint64>(room_.records, 1), bytes = std::min<uint64>(room_.bytes, size);
    room_.records -= records;
    room_.bytes -= bytes;
    most_.records += 1 - records;
    most_.bytes += size - bytes;
}

bool AllocRecords::Remove(uintptr_t address) {
    const Place place(address);
    Shard& shard = ShardOf(place);
    SpinLockHolder hold(shard.lock);
    if (!shard.slots) return false;
    AllocRecord* const found = Look(shard, place);
    if (!found->address) return false;
    --shard.counts.live;
    shard.counts.unreported -= !found->reported;
    shard.counts.bytes -= found->size;
    GiveRoom(shard, found->size);
    // Those behind it move up where their place allows it, so that no search is cut short.
    auto hole = static_cast<uint32>(found - shard.slots);
    for (uint32 next = hole;;) {
        next = (next + 1) & shard.mask;
        const uintptr_t moved = shard.slots[next].address;
        if (!moved) break;
        const uint32 home = Place(moved).Slot() & shard.mask;
        if (((next - home) & shard.mask) < ((next - hole) & shard.mask)) continue;
        shard.slots[hole] = shard.slots[next];
        hole = next;
    }
    shard.slots[hole].address = 0;
    return true;
}

bool AllocRecords::Find(uintptr_t address, AllocRecord& record) {
    const Place place(address);
    Shard& shard = ShardOf(place);
    SpinLockHolder hold(shard.lock);
    if (!shard.slots) return false;
    record = *Look(shard, place);
    return record.address != 0;
}

AllocRecords::Counts AllocRecords::Count() {
    Counts counts{};
    for (Shard& shard : shards_) {
        SpinLockHolder hold(shard.lock);
        counts.bytesMade += shard.counts.bytesMade;
        counts.bytes += shard.counts.bytes;
        counts.live += shard.counts.live;
        counts.unreported += shard.counts.unreported;
    }
    counts.made = made_.load(std::memory_order_relaxed);
    return counts;
}

AllocRecords::Amount AllocRecords::Most() {
    SpinLockHolder hold(mostLock_);
    return most_;
}

void AllocRecords::MarkAllReported() {
    for (Shard& shard : shards_) {
        SpinLockHolder hold(shard.lock);
        for (uint32 i = 0; shard.slots && i <= shard.mask; ++i) shard.slots[i].reported = 1;
        shard.counts.unreported = 0;
    }
}

void AllocRecords::Clear() {
    TrackerFailure ignored = TrackerFailure::kNone;
    for (Shard& shard : shards_) {
        SpinLockHolder hold(shard.lock);
        heap_.Release(shard.slots, ignored);
        shard.slots = nullptr;
        shard.counts = {};
    }
}

size_t AllocRecords::Copy(Which which, AllocRecord* records, size_t capacity) {
    size_t count = 0;
    for (Shard& shard : shards_) {
        SpinLockHolder hold(shard.lock);
        for (uint32 i = 0; shard.slots && i <= shard.mask && count < capacity; ++i)
            if (shard.slots[i].address && (which == Which::kAll || !shard.slots[i].reported))
                records[count++] = shard.slots[i];
    }
    return count;
}

}  // namespace tessel
