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

void ExpectAnswers(MGAppInterfacePtr app, uint32 base) {
    EXPECT_EACH(base + 3 == MGGetAppAPIVersion(app), base + 4 == MGGetAppEditorVersion(app),
                static_cast<int32>(base) + 11 == MGGetIsTopLevel(app),
                static_cast<int32>(base) + 12 == MGGetIsBoundApp(app),
                static_cast<int32>(base) + 13 == MGGetIsRunTime(app),
                static_cast<int32>(base) + 14 == MGGetIsFullFeatureRunTime(app));
}

TEST(MGAppInterface, TheGivenObjectElseTheInstalledOneElseZero) {
    EXPECT_EACH(MGApp() == nullptr, MGGetIsRunTime(nullptr) == 0);
    NumberedApp installed(100), given(200);
    ExpectAnswers(&given, 200);
    MGAppInterfaceSet(&installed);
    EXPECT_EQ(&installed, MGApp());
    ExpectAnswers(nullptr, 100);
    ExpectAnswers(&given, 200);
    MGAppInterfaceSet(nullptr);
    EXPECT_EQ(0u, MGGetAppAPIVersion(nullptr));
}

// The library calls by slot, and a host built elsewhere counts on it.
TEST(MGAppInterface, SlotsKeepTheirNumbers) {
    NumberedApp app(100);
    using Slot = int32 (*)(tessel::MGAppInterface*);
    const auto* slots = *reinterpret_cast<Slot**>(&app);
    for (int slot : {3, 4, 11, 12, 13, 14}) EXPECT_EQ(100 + slot, slots[slot](&app)) << slot;
}

}  // namespace
