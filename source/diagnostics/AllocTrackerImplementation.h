// What an AllocTracker is made of.
#ifndef TESSEL_SOURCE_DIAGNOSTICS_ALLOCTRACKERIMPLEMENTATION_H
#define TESSEL_SOURCE_DIAGNOSTICS_ALLOCTRACKERIMPLEMENTATION_H

#include "diagnostics/AllocRecords.h"
#include "diagnostics/CallSites.h"
#include "diagnostics/TrackerHeap.h"
#include <tessel/diagnostics/AllocTracker.h>

namespace tessel {

class AllocTracker::Implementation {
public:
    static Implementation* Create(int32 skip) noexcept;  // null when memory runs out
    void Destroy() noexcept;

    void SetSkip(int32 skip);
    void Add(uintptr_t address, uint32 size, const char* file, int32 line, const StackFrame* frame);
    void Remove(uintptr_t address);
    AllocRecords::Counts Count() { return deactivated_ ? AllocRecords::Counts{} : records_.Count(); }
    AllocRecords::Amount Most() { return records_.Most(); }
    void DumpAll(AllocDumper& dumper);
    void DumpOne(uintptr_t address, AllocDumper& dumper);
    bool IsTracked(uintptr_t address);
    int32 GetSites(Site* sites, int32 capacity);
    void MarkAllReported() { records_.MarkAllReported(); }

private:
    explicit Implementation(int32 skip) : sites_(heap_, skip), records_(heap_) {}

    bool IsIdle() const { return deactivated_.load(std::memory_order_relaxed) || sites_.IsReporting(); }
    void ReportDuplicate(const AllocRecord& earlier);
    void Deactivate(TrackerFailure failure);
    template <class Work>
    void WithRecords(AllocRecords::Which which, Work work);
    void WriteAll(AllocDumper& dumper, AllocRecord* records, size_t count);
    static int32 CountSites(AllocRecord* records, size_t count, Site* sites, int32 capacity);
    void WriteRecord(AllocDumper& dumper, const AllocRecord& record);

    TrackerHeap heap_;
    CallSites sites_;
    AllocRecords records_;
    std::atomic<bool> deactivated_{false};
    std::atomic<int32> recordsWritten_{0};  // by all dumps
};

}  // namespace tessel

#endif
