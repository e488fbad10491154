// The setting of how the waiting thread runs.
#include "config/Service.h"
#include "diagnostics/Guarded.h"
#include <tessel/config/CfgSettings.h>
#include <tessel/config/HardWaitBehavior.h>

namespace tessel {
namespace {

struct HardWaitData : TrackedObject {
    CfgData_T<int32, kConfigBool> timeCritical{"HardWaitTimeCritical", 0};

    void AddTo(CfgSettings& settings) { settings.Add(&timeCritical); }
};
using HardWaitSettings = CfgSettings_T<HardWaitData, DefaultCfgValidator>;

std::unique_ptr<HardWaitSettings> theSettings;

}  // namespace

// A setting that cannot be read has been reported, and is no reason not to start.
MgErr HardWaitBehaviorStart() {
    MgErr err = Guarded([] {
        theSettings = std::make_unique<HardWaitSettings>("HardWaitBehaviorSettings");
        MgErr result = CfgSettingsInit(theSettings.get(), nullptr, nullptr, nullptr);
        return CfgSettingsRegistry::Find(theSettings->Name().c_str()) == theSettings.get() ? kNoErr : result;
    });
    if (err) theSettings.reset();
    return err;
}

MgErr HardWaitBehaviorStop() {
    MgErr err = CfgSettingsUninit(theSettings.get(), kCfgSaveOrRemoveDefault, nullptr);
    theSettings.reset();
    return err;
}

}  // namespace tessel

int32 GetHardWaitTimeCritical() {
    const auto* settings = tessel::theSettings.get();
    return settings && settings->Get() ? settings->Get()->timeCritical.Get() : 0;
}
