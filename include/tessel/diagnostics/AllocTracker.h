// Allocation trackers: registers of living objects with the call stacks that made them, and the reports on those that
// should be gone.
//
// Tracking is on unless OV_ALLOC_TRACKER=off stands in the environment or among the arguments of the process. A tracker
// never affects what it tracks: when it runs out of memory it goes quiet. All operations may be called from any thread.
#ifndef TESSEL_DIAGNOSTICS_ALLOCTRACKER_H
#define TESSEL_DIAGNOSTICS_ALLOCTRACKER_H

#include <tessel/base/Types.h>

#ifdef __cplusplus
namespace tessel {
class AllocTracker;
}
typedef tessel::AllocTracker* AllocTrackerPtr;
#else
typedef struct tessel_AllocTracker* AllocTrackerPtr;
#endif

TESSEL_BEGIN_C

// A new tracker that leaves the 3, or the given number of, innermost calls out of every call stack (the tracker's own
// are three). The caller owns it. Null when memory runs out. When tracking is off the tracker does nothing.
TESSEL_API AllocTrackerPtr CreateAllocTracker(void);
// A new tracker that leaves so many innermost calls out of every call stack; else as CreateAllocTracker.
TESSEL_API AllocTrackerPtr CreateAllocTrackerSpecifySkip(int32 skip);

// Ends a tracker; its records are gone without a report. Null is ignored.
TESSEL_API void DestroyAllocTracker(AllocTrackerPtr tracker);

TESSEL_END_C

#ifdef __cplusplus
#    include <new>

namespace tessel {

// Where and how a report of records is written.
class TESSEL_API AllocDumper {
public:
    // What the tracked objects are called in the report.
    virtual const char* ObjBeingTrackedName() = 0;
    // Whether the call stacks are written.
    virtual bool GetShowStackNames() = 0;
    // Writes text, printf style; at most 2,047 bytes a call.
    virtual void FormatToOutput(const char* format, ...) __attribute__((format(printf, 2, 3))) = 0;
    // Writes what an object of that size holds. The object may be gone or damaged.
    virtual void DumpItemContents(const void* address, uint32 size) = 0;
    virtual ~AllocDumper() = default;
};

// Writes to level-0 reports. Without a name, and without the contents of the objects.
class TESSEL_API DefaultDumper : public AllocDumper {
public:
    const char* ObjBeingTrackedName() override;
    bool GetShowStackNames() override;
    void FormatToOutput(const char* format, ...) override __attribute__((format(printf, 2, 3)));
    void DumpItemContents(const void* address, uint32 size) override;
};

// A register of living objects.
class TESSEL_API MGGenericRegistry {
public:
    virtual ~MGGenericRegistry() = default;
    // Leaves what is registered now out of later reports.
    virtual void Mark() = 0;
    // Takes note of an object.
    virtual void Register(const void* object) = 0;
    // Forgets an object.
    virtual void Unregister(const void* object) = 0;
    // How many objects are registered.
    virtual int32 Count() = 0;
};

// Threads meet only when their objects do: each operation takes a lock for a few instructions, and none while a report
// is written. What a dumper makes while it writes is not tracked.
class TESSEL_API AllocTracker : public MGGenericRegistry {
public:
    AllocTracker() noexcept = default;
    ~AllocTracker() override;
    AllocTracker(const AllocTracker&) = delete;
    AllocTracker& operator=(const AllocTracker&) = delete;
    // Untracked memory, so that a tracker never tracks itself; null when there is none.
    static void* operator new(size_t size, const std::nothrow_t&) noexcept;
    // Frees what operator new gave. Null is fine.
    static void operator delete(void* memory) noexcept;
    // Frees what operator new gave. Null is fine.
    static void operator delete(void* memory, const std::nothrow_t&) noexcept;

    // The same as MarkAllReported.
    void Mark() override;
    // Records an object of size 0, made in this header.
    void Register(const void* object) override;
    // The same as RemoveRecord.
    void Unregister(const void* object) override;
    // The same as CountLive.
    int32 Count() override;

    // Starts the tracker, which does nothing before. `skip` innermost calls are left out of every call stack; the
    // tracker's own are three, so that with 3 or less a stack begins in the function that calls AddRecord. Once it is
    // started, sets the count for the stacks to come.
    virtual void SetSkip(int32 skip);
    // Forgets everything. The tracker does nothing afterwards. No other thread may be using it.
    virtual void Shutdown();

    // Records an object (null: does nothing) and the call stack that made it. The file name should be a constant. An
    // address that is recorded already is reported, and the earlier record stays.
    virtual void AddRecord(const void* address, uint32 size, const char* file, int32 line);
    // The same for a function that makes objects for its callers: gives its own frame, __builtin_frame_address(0),
    // which stands for that of AddRecord, so that the call stack begins where the function was called.
    void AddRecordFrom(const void* frame, const void* address, uint32 size, const char* file, int32 line);
    // Forgets an object. Nothing happens when it is not recorded.
    virtual void RemoveRecord(const void* address);

    // How many recorded objects live.
    virtual int32 CountLive();
    // Of those living, the ones that MarkAllReported has not seen.
    virtual int32 CountUnreported();

    // Writes all unreported records, in the order of their addresses. Null: a DefaultDumper.
    virtual void DumpAll(AllocDumper* dumper);
    // Writes one record if it exists and is unreported. Null: a DefaultDumper.
    virtual void DumpOne(const void* address, AllocDumper* dumper);
    // Whether the object is recorded.
    virtual bool IsTracked(const void* address);
    // Leaves every record made until now out of later counts of unreported records, and out of dumps.
    virtual void MarkAllReported();

    // Records and bytes: ever, now, and the most there were at a time.
    struct Totals {
        uint64 made;
        uint64 bytesMade;
        uint64 live;
        uint64 bytesLive;
        uint64 mostLive;
        uint64 mostBytesLive;
    };
    // The figures so far; all 0 for a tracker that was not started.
    Totals GetTotals();

    // What lives of the objects made at one line. The file name is the tracker's.
    struct Site {
        const char* file;
        int32 line;
        uint32 live;
        uint64 bytes;
    };
    // Stores the sites of what lives now, ordered by file and line, at most `capacity`; returns how many there are. 0
    // also when memory runs out.
    int32 GetSites(Site* sites, int32 capacity);

private:
    class Implementation;
    Implementation* implementation_ = nullptr;

    friend AllocTrackerPtr(::CreateAllocTrackerSpecifySkip)(int32 skip);
};

}  // namespace tessel

#endif
#endif
