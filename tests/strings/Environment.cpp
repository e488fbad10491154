// The subsystems that the strings stand on run for all tests of this folder.
#include "support/StartedMemory.h"

#include <gtest/gtest.h>
#include <optional>

namespace {

class Foundations : public testing::Environment {
    void SetUp() override { memory_.emplace(); }
    void TearDown() override { memory_.reset(); }
    std::optional<tessel::test::StartedMemory> memory_;
};

const auto* g_environment = testing::AddGlobalTestEnvironment(new Foundations);

}  // namespace
