// The subsystems that the strings stand on run for all tests of this folder.
#include "memory/Service.h"
#include "support/Test.h"
#include "sync/Service.h"

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
        EXPECT_EACH(tessel::TrackedMallocFreeStop() == kNoErr, tessel::MemoryManagerStop() == kNoErr,
                    tessel::ProtectedAtomicOperationsStop() == kNoErr, tessel::ThMutexStop() == kNoErr,
                    tessel::ThEventStop() == kNoErr);
    }
};

const auto* g_environment = testing::AddGlobalTestEnvironment(new Foundations);

}  // namespace
