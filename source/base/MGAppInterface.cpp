#include <tessel/base/MGAppInterface.h>

#include <atomic>

using tessel::MGAppInterface;

namespace {

std::atomic<MGAppInterface*> installedApp{nullptr};

// Asks the object, or for null the installed one.
template <class Result>
Result Ask(MGAppInterface* app, Result (MGAppInterface::*query)()) {
    if (!app) app = installedApp;
    return app ? (app->*query)() : Result{0};
}

}  // namespace

void MGAppInterfaceSet(MGAppInterfacePtr app) {
    installedApp = app;
}
MGAppInterfacePtr MGApp(void) {
    return installedApp;
}

uint32 MGGetAppAPIVersion(MGAppInterfacePtr app) {
    return Ask(app, &MGAppInterface::AppAPIVersion);
}
uint32 MGGetAppEditorVersion(MGAppInterfacePtr app) {
    return Ask(app, &MGAppInterface::AppEditorVersion);
}
int32 MGGetIsTopLevel(MGAppInterfacePtr app) {
    return Ask(app, &MGAppInterface::IsTopLevel);
}
int32 MGGetIsBoundApp(MGAppInterfacePtr app) {
    return Ask(app, &MGAppInterface::IsBoundApp);
}
int32 MGGetIsRunTime(MGAppInterfacePtr app) {
    return Ask(app, &MGAppInterface::IsRunTime);
}
int32 MGGetIsFullFeatureRunTime(MGAppInterfacePtr app) {
    return Ask(app, &MGAppInterface::IsFullFeatureRunTime);
}
