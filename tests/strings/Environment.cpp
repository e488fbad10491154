// The subsystems that the strings stand on run for all tests of this folder.
#include "memory/Service.h"
#include "sync/Service.h"

#include <gtest/gtest.h>

namespace {

class Foundations : public testing::Environment {
    void SetUp() override {
        ASSERT_EQ(kNoErr, tessel::ThEventStart());
        ASSERT_EQ(kNoErr, tessel::ThMutexStart());
        ASSERT_EQ(kNoErr, tessel::ProtectedAtomicOperationsStart());
        ASSERT_EQ(kNoErr, tessel::MemoryManagerStart());
        ASSERT_EQ(kNoErr, tessel::TrackedMallocFreeStart());
    }
    void TearDown() override {
        EXPECT_EQ(kNoErr, tessel::TrackedMallocFreeStop());
        EXPECT_EQ(kNoErr, tessel::MemoryManagerStop());
        EXPECT_EQ(kNoErr, tessel::ProtectedAtomicOperationsStop());
        EXPECT_EQ(kNoErr, tessel::ThMutexStop());
        EXPECT_EQ(kNoErr, tessel::ThEventStop());
    }
};

const auto* g_environment = testing::AddGlobalTestEnvironment(new Foundations);

}  // namespace
