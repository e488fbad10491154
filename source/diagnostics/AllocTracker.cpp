#include "diagnostics/AllocTrackerImplementation.h"
#include "diagnostics/AllocTracking.h"
#include "diagnostics/NumberText.h"
#include <tessel/diagnostics/AllocTracker.h>
#include <tessel/diagnostics/DebugStream.h>
#include <tessel/diagnostics/StackChain.h>

#include <algorithm>
#include <cstdarg>
#include <cstdio>
#include <cstdlib>
#include <cstring>
#include <memory>

namespace tessel {
namespace {

constexpr int32 kDefaultSkip = 3;
constexpr int32 kOwnFrames = 3;  // of the recorded calls, what the tracker itself counts for
constexpr int32 kMostSkip = 1 << 20;
constexpr int32 kRegisterLine = 79;
constexpr char kHeaderFile[] = "include/tessel/diagnostics/AllocTracker.h";
constexpr char kNoSizeExpression[] = " ";
constexpr char kLineOfStars[] = "****************************************\n";

int32 CallsToSkip(int32 skip) {
    return std::clamp(skip - kOwnFrames, 0, kMostSkip);
}

const char* FailureText(TrackerFailure failure) {
    switch (failure) {
        case TrackerFailure::kSamePointerTwice:
            return "memdebug deactivated. Malloc returned same pointer twice.\n";
        case TrackerFailure::kFreeError:
            return "memdebug deactivated. Internal free error.\n";
        default:
            return "memdebug deactivated. Internal out of memory.\n";
    }
}

uintptr_t Number(const void* address) {
    return reinterpret_cast<uintptr_t>(address);
}

}  // namespace

// ---- DefaultDumper --------------------------------------------------------------------------------------------------

const char* DefaultDumper::ObjBeingTrackedName() {
    return "";
}
bool DefaultDumper::GetShowStackNames() {
    return true;
}

void DefaultDumper::FormatToOutput(const char* format, ...) {
    char text[2048];
    va_list arguments;
    va_start(arguments, format);
    std::vsnprintf(text, sizeof text, format, arguments);
    va_end(arguments);
    TESSEL_REPORT(kDebugInfo, 0x7B20E4C9u) << text;
}

void DefaultDumper::DumpItemContents(const void*, uint32) {
}

// ---- AllocTracker::Implementation -----------------------------------------------------------------------------------

// From the C allocator, as everything here: the global operators may be tracked.
AllocTracker::Implementation* AllocTracker::Implementation::Create(int32 skip) noexcept {
    void* const memory = std::aligned_alloc(alignof(Implementation), sizeof(Implementation));
    return memory ? new (memory) Implementation(CallsToSkip(skip)) : nullptr;
}

void AllocTracker::Implementation::Destroy() noexcept {
    this->~Implementation();
    std::free(this);
}

void AllocTracker::Implementation::SetSkip(int32 skip) {
    sites_.SetSkip(CallsToSkip(skip));
}

void AllocTracker::Implementation::Add(uintptr_t address, uint32 size, const char* file, int32 line,
                                       const StackFrame* frame) {
    if (deactivated_.load(std::memory_order_relaxed)) return;
    TrackerFailure failure = TrackerFailure::kNone;
    if (const CallSite* site = sites_.Enter(file, line, frame, failure)) {
        AllocRecord earlier;
        if (records_.Insert(address, site, size, earlier, failure) == AllocRecords::Insertion::kDuplicate)
            ReportDuplicate(earlier);
    }
    if (failure != TrackerFailure::kNone) Deactivate(failure);
}

void AllocTracker::Implementation::ReportDuplicate(const AllocRecord& earlier) {
    CallSites::Reporting reporting(sites_);
    DefaultDumper dumper;
    dumper.FormatToOutput("Duplicate pointer first returned in this context:\n");
    WriteRecord(dumper, earlier);
}

void AllocTracker::Implementation::Remove(uintptr_t address) {
    records_.Remove(address);
}

bool AllocTracker::Implementation::IsTracked(uintptr_t address) {
    AllocRecord record;
    return records_.Find(address, record);
}

// The stacks stay until the end: other threads may be reading them.
void AllocTracker::Implementation::Deactivate(TrackerFailure failure) {
    if (deactivated_.exchange(true)) return;
    CallSites::Reporting reporting(sites_);
    DefaultDumper().FormatToOutput("%s", FailureText(failure));
    records_.Clear();
}

// Calls work(records, count) on a copy of the records, so that no lock is held while a dumper works.
template <class Work>
void AllocTracker::Implementation::WithRecords(AllocRecords::Which which, Work work) {
    if (IsIdle()) return;
    TrackerFailure failure = TrackerFailure::kNone;
    const AllocRecords::Counts counts = records_.Count();
    const size_t room = which == AllocRecords::Which::kAll ? counts.live : counts.unreported;
    auto* const records = static_cast<AllocRecord*>(heap_.Allocate(room * sizeof(AllocRecord), failure));
    if (records) {
        work(records, records_.Copy(which, records, room));
        heap_.Release(records, failure);
    }
    if (failure != TrackerFailure::kNone) Deactivate(failure);
}

void AllocTracker::Implementation::DumpAll(AllocDumper& dumper) {
    WithRecords(AllocRecords::Which::kUnreported, [&](AllocRecord* records, size_t count) {
        CallSites::Reporting reporting(sites_);
        WriteAll(dumper, records, count);
    });
}

int32 AllocTracker::Implementation::GetSites(Site* sites, int32 capacity) {
    int32 found = 0;
    WithRecords(AllocRecords::Which::kAll,
                [&](AllocRecord* records, size_t count) { found = CountSites(records, count, sites, capacity); });
    return found;
}

int32 AllocTracker::Implementation::CountSites(AllocRecord* records, size_t count, Site* sites, int32 capacity) {
    const auto order = [](const AllocRecord& a, const AllocRecord& b) {
        const int files = std::strcmp(a.site->file, b.site->file);
        return files != 0 ? files < 0 : a.site->line < b.site->line;
    };
    std::sort(records, records + count, order);
    int32 found = 0;
    for (size_t i = 0; i < count; ++found) {
        Site site{records[i].site->file, records[i].site->line, 0, 0};
        for (const AllocRecord& first = records[i]; i < count && !order(first, records[i]); ++i) {
            ++site.live;
            site.bytes += records[i].size;
        }
        if (found < capacity) sites[found] = site;
    }
    return found;
}

void AllocTracker::Implementation::WriteAll(AllocDumper& dumper, AllocRecord* records, size_t count) {
    std::sort(records, records + count,
              [](const AllocRecord& a, const AllocRecord& b) { return a.address < b.address; });
    const char* const name = dumper.ObjBeingTrackedName();
    dumper.FormatToOutput("%s", kLineOfStars);
    dumper.FormatToOutput("** List of currently allocated %-20s  **\n", name);
    dumper.FormatToOutput("%s", kLineOfStars);
    dumper.FormatToOutput(
        "                                     Size  Size Expression     Content String      Alloc Number\n");
    for (size_t i = 0; i < count; ++i) WriteRecord(dumper, records[i]);
    dumper.FormatToOutput("\n");
    dumper.FormatToOutput("Number of unfreed items: %d\n", recordsWritten_.load());
    if (const uint32 live = records_.Count().live)
        dumper.FormatToOutput("\n%lu %s\n", static_cast<unsigned long>(live), name);
}

void AllocTracker::Implementation::DumpOne(uintptr_t address, AllocDumper& dumper) {
    AllocRecord record;
    if (IsIdle() || !records_.Find(address, record) || record.reported) return;
    CallSites::Reporting reporting(sites_);
    WriteRecord(dumper, record);
}

void AllocTracker::Implementation::WriteRecord(AllocDumper& dumper, const AllocRecord& record) {
    const CallSite& site = *record.site;
    const auto* const object = reinterpret_cast<const void*>(record.address);
    recordsWritten_.fetch_add(1);
    dumper.FormatToOutput("----------------------\nFile %-15s; Line %-5lu # ", site.file,
                          static_cast<unsigned long>(static_cast<uint32>(site.line)));
    dumper.FormatToOutput("%6lu  %-20s            %6lu            0x%s", static_cast<unsigned long>(record.size),
                          kNoSizeExpression, static_cast<unsigned long>(record.number), AddressText(object).Text());
    dumper.FormatToOutput("\n");
    dumper.DumpItemContents(object, record.size);
    if (!dumper.GetShowStackNames()) return;
    for (int32 i = 0; i < site.count; ++i) {
        const FrameDecoder frame(site.addresses[i]);
        dumper.FormatToOutput("0x%s - %s + 0x%lx\n", AddressText(frame.Address()).Text(), frame.Name(),
                              static_cast<unsigned long>(frame.Offset()));
    }
}

// ---- AllocTracker ---------------------------------------------------------------------------------------------------

AllocTracker::~AllocTracker() {
    AllocTracker::Shutdown();
}

void* AllocTracker::operator new(size_t size, const std::nothrow_t&) noexcept {
    return std::malloc(size);
}
void AllocTracker::operator delete(void* memory) noexcept {
    std::free(memory);
}
void AllocTracker::operator delete(void* memory, const std::nothrow_t&) noexcept {
    std::free(memory);
}

void AllocTracker::Mark() {
    MarkAllReported();
}
int32 AllocTracker::Count() {
    return CountLive();
}
void AllocTracker::Unregister(const void* object) {
    RemoveRecord(object);
}

void AllocTracker::Register(const void* object) {
    AddRecordFrom(__builtin_frame_address(0), object, 0, kHeaderFile, kRegisterLine);
}

void AllocTracker::SetSkip(int32 skip) {
    if (implementation_)
        implementation_->SetSkip(skip);
    else
        implementation_ = Implementation::Create(skip);
}

void AllocTracker::Shutdown() {
    if (implementation_) implementation_->Destroy();
    implementation_ = nullptr;
}

void AllocTracker::AddRecord(const void* address, uint32 size, const char* file, int32 line) {
    AddRecordFrom(__builtin_frame_address(0), address, size, file, line);
}

void AllocTracker::AddRecordFrom(const void* frame, const void* address, uint32 size, const char* file, int32 line) {
    if (implementation_ && address)
        implementation_->Add(Number(address), size, file, line, static_cast<const StackFrame*>(frame));
}

void AllocTracker::RemoveRecord(const void* address) {
    if (implementation_ && address) implementation_->Remove(Number(address));
}

int32 AllocTracker::CountLive() {
    return implementation_ ? static_cast<int32>(implementation_->Count().live) : 0;
}

int32 AllocTracker::CountUnreported() {
    return implementation_ ? static_cast<int32>(implementation_->Count().unreported) : 0;
}

void AllocTracker::DumpAll(AllocDumper* dumper) {
    DefaultDumper ownDumper;
    if (implementation_) implementation_->DumpAll(dumper ? *dumper : ownDumper);
}

void AllocTracker::DumpOne(const void* address, AllocDumper* dumper) {
    DefaultDumper ownDumper;
    if (implementation_) implementation_->DumpOne(Number(address), dumper ? *dumper : ownDumper);
}

bool AllocTracker::IsTracked(const void* address) {
    return implementation_ && address && implementation_->IsTracked(Number(address));
}

void AllocTracker::MarkAllReported() {
    if (implementation_) implementation_->MarkAllReported();
}

AllocTracker::Totals AllocTracker::GetTotals() {
    if (!implementation_) return {};
    const auto counts = implementation_->Count();
    const auto most = implementation_->Most();
    return {counts.made, counts.bytesMade, counts.live, counts.bytes, most.records, most.bytes};
}

int32 AllocTracker::GetSites(Site* sites, int32 capacity) {
    return implementation_ ? implementation_->GetSites(sites, capacity) : 0;
}

}  // namespace tessel

// ---- flat functions -------------------------------------------------------------------------------------------------

using namespace tessel;

AllocTrackerPtr CreateAllocTracker(void) {
    return CreateAllocTrackerSpecifySkip(kDefaultSkip);
}

AllocTrackerPtr CreateAllocTrackerSpecifySkip(int32 skip) {
    std::unique_ptr<AllocTracker> tracker(new (std::nothrow) AllocTracker);
    if (!tracker || !IsAllocTrackingOn()) return tracker.release();
    tracker->SetSkip(skip);
    return tracker->implementation_ ? tracker.release() : nullptr;
}

void DestroyAllocTracker(AllocTrackerPtr tracker) {
    delete tracker;
}
