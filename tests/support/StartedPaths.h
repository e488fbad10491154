// What paths and streams need, started for as long as it lives. Leaks are failures.
#pragma once

#include "memory/Service.h"
#include "paths/Service.h"
#include "support/ReportRecorder.h"
#include "sync/Service.h"

#include <gtest/gtest.h>

namespace tessel::test {

class StartedPaths {
public:
    StartedPaths() {
        for (auto start : {ThEventStart, ThMutexStart, ProtectedAtomicOperationsStart, MemoryManagerStart,
                           TrackedMallocFreeStart, PathManagerStart})
            EXPECT_EQ(kNoErr, start());
    }
    ~StartedPaths() {
        const ReportRecorder leaks;
        for (auto stop : {PathManagerStop, TrackedMallocFreeStop, MemoryManagerStop, ProtectedAtomicOperationsStop,
                          ThMutexStop, ThEventStop})
            stop();
        EXPECT_EQ(0u, leaks.CountAt(kDebugError) + leaks.CountAt(kDebugWarning));
    }
    StartedPaths(const StartedPaths&) = delete;
    StartedPaths& operator=(const StartedPaths&) = delete;
};

}  // namespace tessel::test

