// One typed setting: a name in the preference file, a type, a value, and most often a default. How it is checked when
// it is read, and what is saved of it.
//
//     CfgData_T<int32, kConfigBool> showGrid("ShowGrid", 1);
//     CfgDataInit(&showGrid, nullptr, nullptr, 0, nullptr, nullptr);
//     showGrid.Set(0);
//     CfgDataSave(&showGrid, kCfgSaveOrRemoveDefault, nullptr);
//
// A setting is for one thread at a time.
#ifndef TESSEL_CONFIG_CFGDATA_H
#define TESSEL_CONFIG_CFGDATA_H

#include <tessel/base/MgErr.h>
#include <tessel/config/ConfigCoreTypes.h>

#ifdef __cplusplus
#    include <tessel/config/ConfigManager.h>
#    include <tessel/memory/TrackedMallocFree.h>
#    include <tessel/paths/PathRef.h>

#    include <algorithm>
#    include <list>
#    include <type_traits>
#    include <utility>

namespace tessel {

class CfgSettings;

// ---- settings -------------------------------------------------------------------------------------------------------

// One setting: a value of a configuration type under a key.
class TESSEL_API CfgData : public TrackedObject {
public:
    CfgData() = default;
    virtual ~CfgData();
    CfgData(const CfgData&) = delete;
    CfgData& operator=(const CfgData&) = delete;

    // The key; null for a setting that is not kept.
    virtual CStr Name() const = 0;
    // Its configuration type.
    virtual int32 Type() const = 0;
    // The value as the type's procedures take it.
    virtual void* Value() = 0;
    // The default in the same form; null when there is none.
    virtual void* DefaultValue() = 0;
    // Whether it has a default.
    virtual bool HasDefault() const = 0;
    // Whether the value is the default; false without one.
    virtual bool EqualsDefault() const = 0;
    // Takes the default. kArgErr without one.
    virtual MgErr ResetToDefault() = 0;

    // Whether CfgDataInit has taken the default, as there was nothing to read or it could not be read.
    bool IsDefaulted() const { return isDefaulted_; }

private:
    friend struct CfgDataAccess;

    bool isDefaulted_ = false;
};

template <class T>
bool CfgValuesEqual(const T& a, const T& b) {
    return a == b;
}
inline bool CfgValuesEqual(const PathRef& a, const PathRef& b) {
    return a.Equals(b, PathRef::kExact);
}
inline bool CfgValuesEqual(const std::list<PathRef>& a, const std::list<PathRef>& b) {
    return std::equal(a.begin(), a.end(), b.begin(), b.end(),
                      [](const PathRef& x, const PathRef& y) { return CfgValuesEqual(x, y); });
}

// A setting without a default. The address of a value must be what the procedures of the type take: int32 for "Bool"
// and "I32 ", float, std::string for "NStr", std::vector<std::string>, PathRef for "Path", std::list<PathRef>. The name
// is not copied; null for a setting that is not kept.
template <class ValueType, int32 kType>
class CfgDataNoDefault_T : public CfgData {
    static_assert(!std::is_pointer_v<ValueType>, "a setting owns its value");

public:
    // A setting of that name and value.
    explicit CfgDataNoDefault_T(CStr name, ValueType value = ValueType()) : name_(name), value_(std::move(value)) {}

    // The value.
    const ValueType& Get() const { return value_; }
    // Gives it another value.
    void Set(ValueType value) { value_ = std::move(value); }

    CStr Name() const override { return name_; }
    int32 Type() const override { return kType; }
    void* Value() override { return &value_; }
    void* DefaultValue() override { return nullptr; }
    bool HasDefault() const override { return false; }
    bool EqualsDefault() const override { return false; }
    MgErr ResetToDefault() override { return kArgErr; }

private:
    CStr name_;
    ValueType value_;
};

// A setting with a default, which is its value at first.
template <class ValueType, int32 kType>
class CfgData_T : public CfgDataNoDefault_T<ValueType, kType> {
public:
    // A setting of that name, whose value is its default.
    CfgData_T(CStr name, ValueType defaultValue)
        : CfgDataNoDefault_T<ValueType, kType>(name, defaultValue), default_(std::move(defaultValue)) {}

    // The default.
    const ValueType& GetDefault() const { return default_; }

    void* DefaultValue() override { return &default_; }
    bool HasDefault() const override { return true; }
    bool EqualsDefault() const override { return CfgValuesEqual(this->Get(), default_); }
    MgErr ResetToDefault() override {
        this->Set(default_);
        return kNoErr;
    }

private:
    ValueType default_;
};

// ---- checks ---------------------------------------------------------------------------------------------------------

// When a setting is checked. The numbers are fixed; above 4 as 4.
enum CfgDataValidationPolicy : int32 {
    cfgCheckIfNotReadPolicy = 0,  // when it could not be read, and it is not that it took its default for want of a key
    cfgAlwaysCheckPolicy = 1,
    cfgCheckIfReadPolicy = 2,
    cfgAlwaysUseDefaultValuePolicy = 3,  // not read: the default, which is checked
    cfgNeverCheckPolicy = 4
};

// Says when settings are checked, and checks them. May raise OVExcept: its code is the result then.
class TESSEL_API CfgDataValidator {
public:
    virtual ~CfgDataValidator();
    // When settings are checked; `context` is the caller's.
    virtual CfgDataValidationPolicy Policy(void* context) = 0;
    // kNoErr when the setting may stay as it is; it may be changed. `readResult` is that of reading it; flags, context
    // and settings (null for a setting alone) are the caller's.
    virtual MgErr Check(CfgData& data, MgErr readResult, uint32 flags, void* context, CfgSettings* settings) = 0;
};

// Accepts everything, and never checks.
class TESSEL_API DefaultCfgValidator : public CfgDataValidator {
public:
    CfgDataValidationPolicy Policy(void* context) override;
    MgErr Check(CfgData& data, MgErr readResult, uint32 flags, void* context, CfgSettings* settings) override;
};

// What CfgPathValidator wants of a path: the answer of FExists, in the flags without their top bit.
enum { kCfgPathMissing = 0, kCfgPathFile = 1, kCfgPathFolder = 2, kCfgPathAnything = 0x7FFFFFFF };
#    define kCfgPathCheckDefaultToo ((uint32)0x80000000)  // the top bit

// Always checks a setting of type "Path" or "Pthp" for what is on disk, and its default too when the top bit of the
// flags is set. A path that is wrong becomes not-a-path: kNotFoundErr when nothing is there, kExistsErr when something
// else is. kArgErr for other flags, a null path, and settings that are none of a path.
class TESSEL_API CfgPathValidator : public CfgDataValidator {
public:
    CfgDataValidationPolicy Policy(void* context) override;
    MgErr Check(CfgData& data, MgErr readResult, uint32 flags, void* context, CfgSettings* settings) override;
};

// ---- reading and saving ---------------------------------------------------------------------------------------------

// What is saved. The numbers are fixed.
enum CfgSavePolicy : int32 {
    kCfgSaveNever = 0,
    kCfgSaveOrRemoveDefault = 1,       // written, or the key removed when the value is the default
    kCfgSaveOrRemoveIfHasDefault = 2,  // the same, and nothing for a setting without a default
    kCfgSaveAlways = 3,
    kCfgRemoveAlways = 4
};

// Reads a setting, by its name, when it has one; null manager: the main one, null validator: the default one. A setting
// that could not be read takes its default: kNoErr when its key was not there; else the result says why, and it is
// reported. A setting that fails its check takes its default too (kNoErr), or gives the check's result when it has
// none; one that passes is kNoErr. kArgErr for null data; kGenericErr: there is no main manager.
TESSEL_API MgErr CfgDataInit(CfgData* data, ConfigManager* manager, CfgDataValidator* validator, uint32 flags,
                             void* context, CfgSettings* settings);

// Writes the setting to the file, or removes its key, as the policy says; one without a name is not saved. kArgErr for
// null data and for an unknown policy.
TESSEL_API MgErr CfgDataSave(CfgData* data, CfgSavePolicy policy, ConfigManager* manager);

}  // namespace tessel
#endif

#endif
