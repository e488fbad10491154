// The living objects of an allocation tracker: a hash table in shards by address, each with a lock of its own, so that
// threads meet only when their objects do. Sorted when dumped.
#ifndef TESSEL_SOURCE_DIAGNOSTICS_ALLOCRECORDS_H
#define TESSEL_SOURCE_DIAGNOSTICS_ALLOCRECORDS_H

#include "diagnostics/CallSites.h"
#include "diagnostics/TrackerHeap.h"
#include <tessel/base/Types.h>

#include <atomic>

namespace tessel {

struct AllocRecord {
    uintptr_t address;     // 0: no record
    const CallSite* site;  // where it was made, the stack of its creation included
    uint64 number;         // the how-manieth object of its tracker it is, from 1
    uint32 size;
    uint32 reported;
};

// Held for a few instructions; a shard that grows is the exception.
class TESSEL_LOCKS(capability("mutex")) SpinLock {
public:
    void Lock() TESSEL_LOCKS(acquire_capability()) {
        if (held_.exchange(true, std::memory_order_acquire)) LockSlowly();
    }
    void Unlock() TESSEL_LOCKS(release_capability()) { held_.store(false, std::memory_order_release); }

private:
    void LockSlowly();
    std::atomic<bool> held_{false};
};

class AllocRecords {
public:
    explicit AllocRecords(TrackerHeap& heap) : heap_(heap) {}

    enum class Insertion { kDone, kDuplicate, kFailed };
    // Of a duplicate the earlier record is copied into `earlier`; with kFailed the new one is not kept. `failure` may
    // be set in any case.
    Insertion Insert(uintptr_t address, const CallSite* site, uint32 size, AllocRecord& earlier,
                     TrackerFailure& failure);
    bool Remove(uintptr_t address);
    bool Find(uintptr_t address, AllocRecord& record);

    struct Counts {
        uint64 made;  // ever, the dead included; of all shards together
        uint64 bytesMade;
        uint64 bytes;
        uint32 live;
        uint32 unreported;
    };
    Counts Count();  // of the shards one after the other

    struct Amount {
        uint64 records = 0;
        uint64 bytes = 0;
        bool Take(uint32 size);  // one record of that size; false, and nothing is taken, when it is more than there is
    };
    Amount Most();  // that ever lived at a time
    void MarkAllReported();
    void Clear();

    // Copies records, all or the unreported, at most `capacity`; returns how many.
    enum class Which { kAll, kUnreported };
    size_t Copy(Which which, AllocRecord* records, size_t capacity);

private:
    static constexpr int kShardBits = 6;  // a bit for each shard fits into a word

    struct alignas(64) Shard {
        SpinLock lock;
        uint32 mask TESSEL_GUARDED_BY(lock) = 0;  // slots - 1
        AllocRecord* slots TESSEL_GUARDED_BY(lock) = nullptr;
        Counts counts TESSEL_GUARDED_BY(lock){};
        // What can be added before there is more than ever: what was removed from it. So a thread that makes and
        // releases in turn raises no total that others share, and still no peak is missed.
        Amount room TESSEL_GUARDED_BY(lock);
    };
    struct Place;

    static AllocRecord* Look(const Shard& shard, Place place) TESSEL_REQUIRES(shard.lock);
    bool Grow(Shard& shard, TrackerFailure& failure) TESSEL_REQUIRES(shard.lock);
    Shard& ShardOf(Place place);
    Insertion InsertInto(Shard& shard, Place place, AllocRecord record, AllocRecord& earlier, bool& isMore,
                         TrackerFailure& failure);
    void GiveRoom(Shard& shard, uint32 size) TESSEL_REQUIRES(shard.lock);
    void TakeRoom(uint32 size);

    TrackerHeap& heap_;
    Shard shards_[1 << kShardBits];
    std::atomic<uint64> withRoom_{0};  // a bit for each shard that has room

    alignas(64) std::atomic<uint64> made_{0};
    alignas(64) SpinLock mostLock_;  // locks of shards are taken inside
    Amount most_ TESSEL_GUARDED_BY(mostLock_);
    Amount room_ TESSEL_GUARDED_BY(mostLock_);  // that of no shard
};

}  // namespace tessel

#endif
