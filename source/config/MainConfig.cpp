// The manager of the main preference file, and the flat functions on it.
#include "config/ConfigText.h"
#include "config/PreferenceFile.h"
#include "config/Service.h"
#include "config/SettingsTable.h"
#include "diagnostics/Guarded.h"
#include <tessel/config/ConfigManager.h>
#include <tessel/config/ConfigTypeRegistry.h>

namespace tessel {
namespace {

// Set once by the start.
std::atomic<ConfigManager*> mainManager{nullptr};

// What `use` makes of the main manager.
template <class Use>
MgErr WithMain(Use use) {
    ConfigManager* manager = mainManager.load();
    return manager ? use(*manager) : kGenericErr;
}

void StopTables() {
    CfgSettingsTableStop();
    UninitConfigTypeRegistry();
}

}  // namespace

MgErr ConfigManagerStart() {
    if (mainManager.load()) return kGenericErr;
    if (MgErr err = InitConfigTypeRegistry()) return err;
    MgErr err = CfgSettingsTableStart();
    if (!err) {
        err = Guarded([] {
            mainManager.store(new ConfigManager(MainPreferenceFile()));
            return kNoErr;
        });
    }
    if (err) StopTables();
    return err;
}

MgErr ConfigManagerStop() {
    if (ConfigManager* manager = mainManager.exchange(nullptr)) manager->RemoveRef();
    StopTables();
    return kNoErr;
}

ConfigManager* GetMainCfgAccess() {
    return mainManager.load();
}

}  // namespace tessel

using namespace tessel;

MgErr CfgGetDefault(int32 type, ConstPStr key, void* value) {
    return WithMain([&](ConfigManager& manager) { return manager.GetDefault(type, key, value); });
}

MgErr CfgWrite(int32 type, ConstPStr key, const void* value) {
    return WithMain([&](ConfigManager& manager) { return manager.Write(type, key, value, false); });
}

MgErr CfgRemove(int32 type, ConstPStr key) {
    return WithMain([&](ConfigManager& manager) { return manager.Remove(type, key, false); });
}

MgErr CfgGetPrefFilePath(Path* path) {
    return WithMain([&](ConfigManager& manager) { return manager.GetPrefFilePath(path); });
}

MgErr CfgGetHostPrefsSection(LStrHandle* section) {
    return WithMain([&](ConfigManager& manager) { return manager.GetHostPrefsSection(section); });
}

MgErr CfgGetDefaultFrom(Path file, int32 type, ConstPStr key, void* value) {
    return WithMain([&](ConfigManager&) {
        ConfigManager* other = nullptr;
        if (MgErr err = ConstructCfgAccess(file, &other)) return err;
        MgErr err = other->GetDefault(type, key, value);
        other->RemoveRef();
        return err;
    });
}
