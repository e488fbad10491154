#include "support/Test.h"
#include <tessel/base/MGAppInterface.h>

namespace {

// Answers each query with the number of its slot.
class NumberedApp : public tessel::MGAppInterface {
public:
    explicit NumberedApp(uint32 base) : base_(base) {}
    uint32 AppAPIVersion() override { return base_ + 3; }
    uint32 AppEditorVersion() override { return base_ + 4; }
    int32 IsTopLevel() override { return static_cast<int32>(base_) + 11; }
    int32 IsBoundApp() override { return static_cast<int32>(base_) + 12; }
    int32 IsRunTime() override { return static_cast<int32>(base_) + 13; }
    int32 IsFullFeatureRunTime() override { return static_cast<int32>(base_) + 14; }

private:
    uint32 base_;
};

std::vector<uint32> Answers(MGAppInterfacePtr app) {
    const int32 flags[] = {MGGetIsTopLevel(app), MGGetIsBoundApp(app), MGGetIsRunTime(app),
                           MGGetIsFullFeatureRunTime(app)};
    std::vector<uint32> answers{MGGetAppAPIVersion(app), MGGetAppEditorVersion(app)};
    answers.insert(answers.end(), std::begin(flags), std::end(flags));
    return answers;
}

TEST(MGAppInterface, TheGivenObjectElseTheInstalledOneElseZero) {
    EXPECT_EACH(MGApp() == nullptr, Answers(nullptr) == std::vector<uint32>(6, 0));
    NumberedApp installed(100), given(200);
    const std::vector<uint32> of200{203, 204, 211, 212, 213, 214}, of100{103, 104, 111, 112, 113, 114};
    EXPECT_EQ(of200, Answers(&given));
    MGAppInterfaceSet(&installed);
    EXPECT_EACH(MGApp() == &installed, Answers(nullptr) == of100, Answers(&given) == of200);
    MGAppInterfaceSet(nullptr);
}

// The library calls by slot, and a host built elsewhere counts on it.
TEST(MGAppInterface, SlotsKeepTheirNumbers) {
    NumberedApp app(100);
    using Slot = int32 (*)(tessel::MGAppInterface*);
    const auto* slots = *reinterpret_cast<Slot**>(&app);
    for (int slot : {3, 4, 11, 12, 13, 14}) EXPECT_EQ(100 + slot, slots[slot](&app)) << slot;
}

}  // namespace
