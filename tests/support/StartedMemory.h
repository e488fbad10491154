// Events, mutexes and the memory manager, started while the object lives. Reports are recorded, those of the stop too.
#pragma once

#include "memory/Service.h"
#include "support/ReportRecorder.h"
#include "sync/Service.h"

#include <gtest/gtest.h>

namespace tessel::test {

class StartedMemory {
public:
    StartedMemory() {
        for (auto start :
             {ThEventStart, ThMutexStart, ProtectedAtomicOperationsStart, MemoryManagerStart, TrackedMallocFreeStart})
            EXPECT_EQ(kNoErr, start());
    }
    ~StartedMemory() { Stop(); }
    StartedMemory(const StartedMemory&) = delete;
    StartedMemory& operator=(const StartedMemory&) = delete;

    // Stops before the end, to look at the reports of the stop.
    void Stop() {
        if (!started_) return;
        started_ = false;
        for (auto stop :
             {TrackedMallocFreeStop, MemoryManagerStop, ProtectedAtomicOperationsStop, ThMutexStop, ThEventStop})
            EXPECT_EQ(kNoErr, stop());
    }

    ReportRecorder reports;

private:
    bool started_ = true;
};

}  // namespace tessel::test
