// Collections of settings, read and saved together, and the registry that knows those that were read.
//
//     struct GridData {
//         CfgData_T<int32, kConfigBool> show{"ShowGrid", 1};
//         CfgData_T<int32, kConfigI32> step{"GridStep", 8};
//         void AddTo(CfgSettings& settings) { settings.Add(&show); settings.Add(&step); }
//     };
//     CfgSettings_T<GridData> grid("GridSettings");
//     CfgSettingsInit(&grid, nullptr, nullptr, nullptr);
//     grid->step.Set(16);
//     CfgSettingsUninit(&grid, kCfgSaveOrRemoveDefault, nullptr);
//
// A collection is for one thread at a time; the registry for any.
#ifndef TESSEL_CONFIG_CFGSETTINGS_H
#define TESSEL_CONFIG_CFGSETTINGS_H

#include <tessel/config/CfgData.h>

#ifdef __cplusplus
#    include <memory>
#    include <string>
#    include <vector>

namespace tessel {

// Settings in an order, under a name.
class TESSEL_API CfgSettings : public TrackedObject {
public:
    // Without a name it is "<unnamed settings N>", N counting from 0. The qualifier (null: none) follows after a blank.
    explicit CfgSettings(CStr name = nullptr, CStr qualifier = nullptr);
    virtual ~CfgSettings();  // leaves the registry
    CfgSettings(const CfgSettings&) = delete;
    CfgSettings& operator=(const CfgSettings&) = delete;

    // The name, with the qualifier.
    const std::string& Name() const { return name_; }
    // How many settings it holds.
    int32 Count() const { return static_cast<int32>(entries_.size()); }
    // A setting by its index from 0; null for an index out of range.
    CfgData* At(int32 index) const;
    // The flags of a setting for its check; 0 for an index out of range.
    uint32 FlagsAt(int32 index) const;

    // At the end. The setting stays the caller's, and lives until it is released or the collection is destroyed.
    void Add(CfgData* data, uint32 flags = 0);
    // Forgets the last setting.
    void ReleaseLast();

    // Called before the settings are read: makes those that are not there yet. And after the last was released.
    virtual MgErr CreateData() { return kNoErr; }
    // Destroys what CreateData made, after the last setting was released.
    virtual void DestroyData() {}
    // What checks them; null is the default one.
    virtual CfgDataValidator* Validator() { return nullptr; }

private:
    struct Entry {
        CfgData* data;
        uint32 flags;
    };
    std::string name_;
    std::vector<Entry> entries_;
};

// A collection that makes its settings when it is first read, and destroys them when they are released. `Data` has the
// settings as members, and a function `void AddTo(CfgSettings& settings)` that adds them.
template <class Data, class ValidatorType = DefaultCfgValidator>
class CfgSettings_T : public CfgSettings {
public:
    using CfgSettings::CfgSettings;

    // The settings; null before they are made.
    Data* operator->() const { return data_.get(); }
    // The settings; null before they are made.
    Data* Get() const { return data_.get(); }

    MgErr CreateData() override {
        if (data_) return kNoErr;
        std::unique_ptr<Data> data(new Data());
        data->AddTo(*this);
        data_ = std::move(data);
        return kNoErr;
    }
    void DestroyData() override { data_.reset(); }
    CfgDataValidator* Validator() override { return &validator_; }

private:
    std::unique_ptr<Data> data_;
    ValidatorType validator_;
};

// The collections that were read and are not released, by name. Empty outside start and stop of the configuration.
class TESSEL_API CfgSettingsRegistry {
public:
    static constexpr char kName[] = "CfgSettings";

    // The collection stays its owner's. kExistsErr: another one has its name; kGenericErr: there is no registry;
    // kMemFullErr; kArgErr for null. One that is registered already stays.
    static MgErr Register(CfgSettings* settings);
    // Takes the collection out. Nothing for one that is not registered.
    static void Unregister(const CfgSettings* settings);
    // The collection of that name; null when there is none.
    static CfgSettings* Find(CStr name);
    // The names, in the order of their bytes.
    static std::vector<std::string> Names();
};

// Null manager: the main one. Null validator: the collection's own. All give kArgErr for null settings.

// Reads every setting in order, and returns the first failure; a check's -1 ends it at once. The collection is
// registered when every setting has been read or has its default.
TESSEL_API MgErr CfgSettingsInit(CfgSettings* settings, ConfigManager* manager, CfgDataValidator* validator,
                                 void* context);

// Saves every setting, or one (kArgErr for an index out of range). The first failure.
TESSEL_API MgErr CfgSettingsSave(CfgSettings* settings, ConfigManager* manager, CfgSavePolicy policy);
// Saves one setting. kArgErr for an index out of range.
TESSEL_API MgErr CfgSettingsSaveOneSetting(CfgSettings* settings, int32 index, ConfigManager* manager,
                                           CfgSavePolicy policy);

// Takes the collection out of the registry, saves the settings from the last to the first, and releases them. The first
// failure.
TESSEL_API MgErr CfgSettingsUninit(CfgSettings* settings, CfgSavePolicy policy, ConfigManager* manager);

}  // namespace tessel
#endif

#endif
