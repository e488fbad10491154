// The library with a preference file on a scratch drive, and an application that owns it.
#ifndef TESSEL_TESTS_CONFIG_CONFIGTESTSUPPORT_H
#define TESSEL_TESTS_CONFIG_CONFIGTESTSUPPORT_H

#include "support/ScratchDrive.h"
#include "support/StartedLibrary.h"
#include "support/Test.h"
#include <tessel/tessel.h>

namespace tessel::test {

// A key as the flat functions take it; it lasts as long as the expression.
class Key {
public:
    Key(const std::string& text) { StringUtils::ToPStr(text, bytes_); }
    operator ConstPStr() const { return bytes_; }

private:
    Str255 bytes_;
};

struct TestApplication : MGAppInterface {
    TestApplication() { MGAppInterfaceSet(this); }
    ~TestApplication() { MGAppInterfaceSet(nullptr); }
    CStr ApplicationName() override { return "App"; }
    CStr ApplicationAltName() override { return "Alt"; }
    CStr PreferenceBaseName() override { return baseName.c_str(); }
    int32 IsBoundApp() override { return isBound; }
    int32 IsRunTime() override { return isRunTime; }
    int32 IsFullFeatureRunTime() override { return isFullRunTime; }
    RsrcFile AppResourceFile() override { return resources; }

    std::string baseName = "base";
    int32 isBound = 0, isRunTime = 0, isFullRunTime = 0;
    RsrcFile resources = 0;
};

// T:\prefs.ini, with this text at first.
class StartedConfig {
public:
    explicit StartedConfig(const std::string& text = "") {
        if (!text.empty()) drive.Put("prefs.ini", text);
        SetPrefsPath("T:\\prefs.ini");
        library = std::make_unique<StartedLibrary>();
        reports.Clear();
    }
    ~StartedConfig() {
        library.reset();
        SetPrefsPath(nullptr);
    }

    std::string File() const { return drive.Get("prefs.ini"); }

    ReportRecorder reports;
    ScratchDrive drive;
    TestApplication application;
    std::unique_ptr<StartedLibrary> library;
};

struct ReleaseManager {
    void operator()(ConfigManager* manager) const { manager->RemoveRef(); }
};
using OwnedManager = std::unique_ptr<ConfigManager, ReleaseManager>;

inline OwnedManager ManagerOf(CStr file) {
    ConfigManager* manager = nullptr;
    EXPECT_EQ(kNoErr, ConstructCfgAccessCStr(file, &manager));
    return OwnedManager(manager);
}

}  // namespace tessel::test

#endif
