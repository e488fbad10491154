// Settings of a program: typed values in a preference file, with defaults.
#include <tessel/tessel.h>

#include <cstdio>
#include <filesystem>

using namespace tessel;

namespace {

// Where the settings are: the section is the name of the application.
struct Application : MGAppInterface {
    CStr ApplicationName() override { return "Painter"; }
};

struct ViewData {
    CfgData_T<float, kConfigF32> zoom{"Zoom", 1.0F};
    CfgData_T<std::string, kConfigNStr> title{"Title", "untitled"};
    void AddTo(CfgSettings& settings) {
        settings.Add(&zoom);
        settings.Add(&title);
    }
};

// One run of the program: reads its settings, changes one, saves what is not the default.
void Run(float zoom) {
    InitTesselBase();
    InitTesselAppSupport();
    CfgSettings_T<ViewData> view("View");
    CfgSettingsInit(&view, nullptr, nullptr, nullptr);
    std::printf("zoom %g, title \"%s\"\n", static_cast<double>(view->zoom.Get()), view->title.Get().c_str());
    view->zoom.Set(zoom);
    CfgSettingsUninit(&view, kCfgSaveOrRemoveDefault, nullptr);
    UninitTesselAppSupport();
    UninitTesselBase();
}

}  // namespace

int main() {
    const std::string file = (std::filesystem::temp_directory_path() / "painter-example.ini").string();
    Application application;
    MGAppInterfaceSet(&application);
    SetPrefsPath(file.c_str());  // as `-pref FILE` on a command line given to InitUserCommandLine
    Run(2.5F);
    Run(1.0F);
    Run(1.0F);
    SetPrefsPath(nullptr);
    MGAppInterfaceSet(nullptr);
    std::filesystem::remove(file);
}
