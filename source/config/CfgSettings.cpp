// Collections of settings, and their registry.
#include "config/SettingsTable.h"
#include "diagnostics/Guarded.h"
#include <tessel/config/CfgSettings.h>
#include <tessel/sync/ThMutex.h>

#include <atomic>
#include <functional>
#include <map>

namespace tessel {
namespace {

constexpr MgErr kStopReading = -1;

std::atomic<int32> unnamedCount{0};

std::string CollectionName(CStr name, CStr qualifier) {
    std::string text = name && *name ? name : "<unnamed settings " + std::to_string(unnamedCount.fetch_add(1)) + ">";
    if (qualifier && *qualifier) text.append(1, ' ').append(qualifier);
    return text;
}

struct SettingsTable : TrackedObject {
    ~SettingsTable() { ThMutexDestroy(mutex); }

    ThMutex mutex = nullptr;  // guards the collections
    std::map<std::string, CfgSettings*, std::less<>> collections;
};

// Made and destroyed by start and stop, when no other thread looks.
SettingsTable* theTable = nullptr;

}  // namespace

// ---- the registry ---------------------------------------------------------------------------------------------------

MgErr CfgSettingsTableStart() {
    return Guarded([] {
        auto table = std::make_unique<SettingsTable>();
        if (MgErr err = ThMutexCreate(&table->mutex, CfgSettingsRegistry::kName)) return err;
        theTable = table.release();
        return kNoErr;
    });
}

void CfgSettingsTableStop() {
    delete std::exchange(theTable, nullptr);
}

MgErr CfgSettingsRegistry::Register(CfgSettings* settings) {
    if (!settings) return kArgErr;
    if (!theTable) return kGenericErr;
    return Guarded([&] {
        ThMutexHolder holder(theTable->mutex);
        auto [entry, isNew] = theTable->collections.try_emplace(settings->Name(), settings);
        return isNew || entry->second == settings ? kNoErr : kExistsErr;
    });
}

void CfgSettingsRegistry::Unregister(const CfgSettings* settings) {
    if (!theTable || !settings) return;
    ThMutexHolder holder(theTable->mutex);
    auto entry = theTable->collections.find(settings->Name());
    if (entry != theTable->collections.end() && entry->second == settings) theTable->collections.erase(entry);
}

CfgSettings* CfgSettingsRegistry::Find(CStr name) {
    if (!theTable || !name) return nullptr;
    ThMutexHolder holder(theTable->mutex);
    auto entry = theTable->collections.find(std::string_view(name));
    return entry == theTable->collections.end() ? nullptr : entry->second;
}

std::vector<std::string> CfgSettingsRegistry::Names() {
    std::vector<std::string> names;
    if (!theTable) return names;
    ThMutexHolder holder(theTable->mutex);
    for (const auto& [name, settings] : theTable->collections) names.push_back(name);
    return names;
}

// ---- collections ----------------------------------------------------------------------------------------------------

CfgSettings::CfgSettings(CStr name, CStr qualifier) : name_(CollectionName(name, qualifier)) {
}

CfgSettings::~CfgSettings() {
    CfgSettingsRegistry::Unregister(this);
}

CfgData* CfgSettings::At(int32 index) const {
    return index < 0 || index >= Count() ? nullptr : entries_[static_cast<size_t>(index)].data;
}

uint32 CfgSettings::FlagsAt(int32 index) const {
    return index < 0 || index >= Count() ? 0 : entries_[static_cast<size_t>(index)].flags;
}

void CfgSettings::Add(CfgData* data, uint32 flags) {
    if (data) entries_.push_back({data, flags});
}

void CfgSettings::ReleaseLast() {
    if (!entries_.empty()) entries_.pop_back();
}

MgErr CfgSettingsInit(CfgSettings* settings, ConfigManager* manager, CfgDataValidator* validator, void* context) {
    if (!settings) return kArgErr;
    return Guarded([&] {
        MgErr first = settings->CreateData();
        if (first) return first;
        if (!validator) validator = settings->Validator();
        bool complete = true;
        for (int32 i = 0; i < settings->Count(); ++i) {
            CfgData* data = settings->At(i);
            MgErr err = CfgDataInit(data, manager, validator, settings->FlagsAt(i), context, settings);
            if (err == kStopReading) return err;
            if (err && !data->IsDefaulted()) complete = false;
            if (!first) first = err;
        }
        MgErr err = complete ? CfgSettingsRegistry::Register(settings) : kNoErr;
        return first ? first : err;
    });
}

MgErr CfgSettingsSave(CfgSettings* settings, ConfigManager* manager, CfgSavePolicy policy) {
    if (!settings) return kArgErr;
    MgErr first = kNoErr;
    for (int32 i = 0; i < settings->Count(); ++i) {
        MgErr err = CfgDataSave(settings->At(i), policy, manager);
        if (!first) first = err;
    }
    return first;
}

MgErr CfgSettingsSaveOneSetting(CfgSettings* settings, int32 index, ConfigManager* manager, CfgSavePolicy policy) {
    if (!settings) return kArgErr;
    return CfgDataSave(settings->At(index), policy, manager);
}

MgErr CfgSettingsUninit(CfgSettings* settings, CfgSavePolicy policy, ConfigManager* manager) {
    if (!settings) return kArgErr;
    CfgSettingsRegistry::Unregister(settings);
    MgErr first = kNoErr;
    while (settings->Count() > 0) {
        MgErr err = CfgDataSave(settings->At(settings->Count() - 1), policy, manager);
        if (!first) first = err;
        settings->ReleaseLast();
    }
    settings->DestroyData();
    return first;
}

}  // namespace tessel
