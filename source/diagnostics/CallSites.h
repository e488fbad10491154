// Where the objects of an allocation tracker were made: source line and call stack, each different one stored once.
//
// A thread remembers the stacks it recorded last. To recognise one again it only compares the frames with what they
// held then; each is where the remembered one says or the comparison fails, so that the loads do not wait for each
// other.
#ifndef TESSEL_SOURCE_DIAGNOSTICS_CALLSITES_H
#define TESSEL_SOURCE_DIAGNOSTICS_CALLSITES_H

#include "base/ReadMostlyTable.h"
#include "diagnostics/CallStackWalk.h"
#include "diagnostics/TrackerHeap.h"
#include <tessel/base/OVExcept.h>

#include <atomic>

namespace tessel {

// Lives as long as its table, and so does the copy of the file name.
struct CallSite {
    uint64 hash;
    const char* fileKey;  // the file name as given, compared by address
    const char* file;
    int32 line;
    int32 count;
    const void* addresses[CallStack::kCapacity];  // `count` of them; no more are allocated
};

struct RememberedWalk;

class CallSites {
public:
    // `skip` calls are left out of every stack.
    CallSites(TrackerHeap& heap, int32 skip);
    CallSites(const CallSites&) = delete;
    CallSites& operator=(const CallSites&) = delete;

    void SetSkip(int32 skip);

    // Where the calling thread makes a new object; its innermost frame is given. Null while the thread reports for this
    // tracker, and, with `failure` set, when memory runs out. No lock, unless the site is new. Any thread.
    //
    // The calls of a host without frame pointers are lost behind its innermost one: what stands in their place is
    // mostly told by its not being code, and kMostStacks bounds what is not. Beyond that many, new sites hold the
    // innermost call only, and there are no more of these than there are calls in the code.
    const CallSite* Enter(const char* file, int32 line, const StackFrame* frame, TrackerFailure& failure);
    static constexpr uint32 kMostStacks = 1 << 16;
    uint32 Count() const;

    // The tracker that the calling thread is reporting for: whatever it makes meanwhile is not tracked.
    class Reporting {
    public:
        explicit Reporting(const CallSites& sites);
        ~Reporting();
        Reporting(const Reporting&) = delete;
        Reporting& operator=(const Reporting&) = delete;

    private:
        const CallSites* const outer_;
    };
    bool IsReporting() const;

private:
    struct Key;
    struct SiteKeys {
        static constexpr uint32 kFirstSlots = 64;
        static constexpr uint32 kSlotsPerUsed = 2;
        static constexpr uint32 kMostHashes = 1;
        static constexpr bool kRemoves = false;

        static uint32 Hashes(const CallSite*) { return 1; }
        static uint32 Hash(const CallSite* site, uint32) { return HashOf(site->hash); }
        static uint32 HashOf(uint64 hash) { return static_cast<uint32>(hash >> 32); }
    };

    const CallSite* Walk(const char* file, int32 line, const StackFrame* frame, RememberedWalk* remembered,
                         TrackerFailure& failure);
    const CallSite* Find(const Key& key) const;
    const CallSite* Add(const Key& key, TrackerFailure& failure);
    void* AllocateSmall(size_t size, TrackerFailure& failure) TESSEL_REQUIRES(mutex_);
    const char* CopyText(const char* text, TrackerFailure& failure) TESSEL_REQUIRES(mutex_);

    TrackerHeap& heap_;
    const uint64 serial_;  // unlike that of any other table there ever was, for what threads remember
    std::atomic<int32> skip_;
    ReadMostlyTable<const CallSite, SiteKeys> sites_;

    mutable platform::Mutex mutex_;  // guards changes of the sites too
    uint32 count_ TESSEL_GUARDED_BY(mutex_) = 0;
    char* small_ TESSEL_GUARDED_BY(mutex_) = nullptr;  // the unused rest of the newest chunk
    size_t smallLeft_ TESSEL_GUARDED_BY(mutex_) = 0;
};

}  // namespace tessel

#endif
