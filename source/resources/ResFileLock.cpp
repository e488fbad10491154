#include "resources/ResFileLock.h"

#include <tessel/sync/ThMutex.h>

#include <algorithm>

namespace tessel {

namespace {

ThMutex gResFileMutex = nullptr;
thread_local int32 tHeld = 0;  // how often this thread holds the lock

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
    if (tHeld++ == 0) ThMutexAcquire(gResFileMutex);
}

ResFileLock::~ResFileLock() {
    if (--tHeld != 0) return;
    ThMutexRelease(gResFileMutex);
    if (tReportCount) MakeReports();
}

MgErr ResFileLock::Create() {
    if (gResFileMutex) return kNoErr;
    return ThMutexCreate(&gResFileMutex, "ResourceFile");
}

void ResFileLock::Destroy() {
    ThMutexDestroy(gResFileMutex);
    gResFileMutex = nullptr;
}

void ReportUnlocked(Report report) {
    if (tHeld == 0) return report();
    Report* const end = tReports + tReportCount;
    if (std::find(tReports, end, report) == end && tReportCount < kMostReports) tReports[tReportCount++] = report;
}

}  // namespace tessel
