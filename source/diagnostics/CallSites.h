// Where the objects of an allocation tracker were made: source line and call stack, each different one stored once.
//
// A thread remembers the stacks it recorded last. To recognise one again it only compares the frames with what they
// held then; each is where the remembered one says or the comparison fails, so that the loads do not wait for each
// other.
#ifndef TESSEL_SOURCE_DIAGNOSTICS_CALLSITES_H
#define TESSEL_SOURCE_DIAGNOSTICS_CALLSITES_H

#include <tessel/base/OVExcept.h>

#include <atomic>

#include "diagnostics/CallStackWalk.h"
#include "diagnostics/TrackerHeap.h"

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
struct NumberRange;

class CallSites {
public:
    // `skip` calls are left out of every stack.
    CallSites(TrackerHeap& heap, int32 skip);
    CallSites(const CallSites&) = delete;
    CallSites& operator=(const CallSites&) = delete;

    void SetSkip(int32 skip);

    // For a new object: where the calling thread makes it (its innermost frame is given), and the next of the tracker's
    // numbers, from 1. Null while the thread reports for this tracker, and, with `failure` set, when memory runs out.
    // No lock, unless the site is new. Any thread.
    //
    // A thread that takes many numbers takes several at a time, so that threads do not hold each other up: numbers are
    // unique, and rise within a thread.
    const CallSite* Enter(const char* file, int32 line, const StackFrame* frame, uint64& number,
                          TrackerFailure& failure);

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
    struct Table {
        uint32 mask;  // slots - 1
        std::atomic<const CallSite*> slots[1];
    };
    struct Key;

    void TakeNumbers(NumberRange& range);
    const CallSite* Walk(const char* file, int32 line, const StackFrame* frame, RememberedWalk* remembered,
                         TrackerFailure& failure);
    const CallSite* Find(const Key& key) const;
    const CallSite* Add(const Key& key, TrackerFailure& failure);
    bool MakeRoom(TrackerFailure& failure);
    void* AllocateSmall(size_t size, TrackerFailure& failure);
    const char* CopyText(const char* text, TrackerFailure& failure);

    TrackerHeap& heap_;
    const uint64 serial_;  // unlike that of any other table there ever was, for what threads remember
    std::atomic<int32> skip_;
    std::atomic<Table*> table_{nullptr};

    platform::Mutex mutex_;  // guards what follows, and changes of the table
    uint32 count_ = 0;
    char* small_ = nullptr;  // the unused rest of the newest chunk
    size_t smallLeft_ = 0;

    alignas(64) std::atomic<uint64> numbers_{1};
};

}  // namespace tessel

#endif
