#include "resources/ResFileLock.h"

#include "sync/RecursiveMutex.h"

#include <algorithm>

namespace tessel {

namespace {

RecursiveMutex resFileMutex;
thread_local uint32 held = 0;  // how often this thread holds the lock

using Report = void (*)();

// More than there are places that report with the lock held.
constexpr int32 kMostReports = 16;
thread_local Report tReports[kMostReports];
thread_local int32 tReportCount = 0;

// A report may call back into the library, and so make more of them.
void MakeReports() {
    Report reports[kMostReports];
    const int32 count = tReportCount;
    std::copy_n(tReports, count, reports);
    tReportCount = 0;
    std::for_each_n(reports, count, [](Report report) { report(); });
}

}  // namespace

ResFileLock::ResFileLock() {
    resFileMutex.Acquire(held);
}

ResFileLock::~ResFileLock() {
    if (resFileMutex.Release(held) && tReportCount) MakeReports();
}

MgErr ResFileLock::Create() {
    return resFileMutex.Create("ResourceFile");
}

void ResFileLock::Destroy() {
    resFileMutex.Destroy();
}

void ReportUnlocked(Report report) {
    if (held == 0) return report();
    Report* const end = tReports + tReportCount;
    if (std::find(tReports, end, report) == end && tReportCount < kMostReports) tReports[tReportCount++] = report;
}

}  // namespace tessel
