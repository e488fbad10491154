#include "support/StartedMemory.h"

#include "memory/Service.h"
#include "sync/Service.h"

#include <gtest/gtest.h>

namespace tessel::test {

StartedMemory::StartedMemory() {
    for (auto start :
         {ThEventStart, ThMutexStart, ProtectedAtomicOperationsStart, MemoryManagerStart, TrackedMallocFreeStart})
        EXPECT_EQ(kNoErr, start());
}

StartedMemory::~StartedMemory() {
    Stop();
}

void StartedMemory::Stop() {
    if (!started_) return;
    started_ = false;
    for (auto stop :
         {TrackedMallocFreeStop, MemoryManagerStop, ProtectedAtomicOperationsStop, ThMutexStop, ThEventStop})
        EXPECT_EQ(kNoErr, stop());
}

}  // namespace tessel::test
