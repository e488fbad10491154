// Reading, checking and saving one setting.
#include "diagnostics/Guarded.h"
#include <tessel/config/CfgData.h>
#include <tessel/diagnostics/DebugStream.h>
#include <tessel/files/FileManager.h>
#include <tessel/paths/PathManager.h>

namespace tessel {
namespace {

constexpr uint32 kKindBits = 0x7FFFFFFF;

ConfigManager* OrMain(ConfigManager* manager) {
    return manager ? manager : GetMainCfgAccess();
}

// Empty for a setting without a name.
std::string NameOf(const CfgData& data) {
    CStr name = data.Name();
    return name ? name : "";
}

MgErr ReadData(CfgData& data, ConfigManager* manager, int32 policy) {
    if (policy == cfgAlwaysUseDefaultValuePolicy) {
        if (data.HasDefault()) return kConfigKeyErr;
        TESSEL_REPORT(kDebugWarning, 0x4B9F02D7u)
            << "cfgAlwaysUseDefaultValuePolicy cannot be used without providing a default value!";
        return kArgErr;
    }
    std::string name = NameOf(data);
    if (name.empty()) return kNoErr;
    manager = OrMain(manager);
    return manager ? manager->GetDefault(data.Type(), name, data.Value()) : kGenericErr;
}

bool IsChecked(int32 policy, MgErr readResult, MgErr result) {
    switch (policy) {
        case cfgCheckIfNotReadPolicy:
            return result != kNoErr;
        case cfgAlwaysCheckPolicy:
        case cfgAlwaysUseDefaultValuePolicy:
            return true;
        case cfgCheckIfReadPolicy:
            return readResult == kNoErr;
        default:
            return false;
    }
}

// The path that a value of a path type is; null for other types.
Path PathIn(int32 type, void* value) {
    switch (type) {
        case kConfigPath:
        case kConfigAliasPath:
            return static_cast<Path>(value);
        case kConfigPthp:
        case kConfigAliasPthp:
            return value ? *static_cast<Path*>(value) : nullptr;
        default:
            return nullptr;
    }
}

MgErr CheckPath(Path path, uint32 kind) {
    if (!path || (kind > kCfgPathFolder && kind != kCfgPathAnything)) return kArgErr;
    auto there = static_cast<uint32>(FExists(path));
    if (kind == kCfgPathAnything || kind == there) return kNoErr;
    FNotAPath(path);
    return there == kCfgPathMissing ? kNotFoundErr : kExistsErr;
}

}  // namespace

struct CfgDataAccess {
    static void SetDefaulted(CfgData& data, bool isDefaulted) { data.isDefaulted_ = isDefaulted; }
};

namespace {

// The result, once a setting that could not be read has its default.
MgErr TakeDefault(CfgData& data, MgErr result) {
    MgErr reset = data.ResetToDefault();
    CfgDataAccess::SetDefaulted(data, reset == kNoErr);
    if (result == kConfigKeyErr) return reset;
    if (data.IsDefaulted())
        TESSEL_REPORT(kDebugWarning, 0xD3186EA5u) << "The setting \"" << NameOf(data) << "\" cannot be read ("
                                                  << MgErrMeaning(result) << "); its default holds.";
    return result;
}

}  // namespace

CfgData::~CfgData() = default;
CfgDataValidator::~CfgDataValidator() = default;

CfgDataValidationPolicy DefaultCfgValidator::Policy(void*) {
    return cfgNeverCheckPolicy;
}
MgErr DefaultCfgValidator::Check(CfgData&, MgErr, uint32, void*, CfgSettings*) {
    return kNoErr;
}

CfgDataValidationPolicy CfgPathValidator::Policy(void*) {
    return cfgAlwaysCheckPolicy;
}
MgErr CfgPathValidator::Check(CfgData& data, MgErr, uint32 flags, void*, CfgSettings*) {
    MgErr err = CheckPath(PathIn(data.Type(), data.Value()), flags & kKindBits);
    if (!(flags & kCfgPathCheckDefaultToo) || !data.HasDefault()) return err;
    MgErr defaultErr = CheckPath(PathIn(data.Type(), data.DefaultValue()), flags & kKindBits);
    return err ? err : defaultErr;
}

MgErr CfgDataInit(CfgData* data, ConfigManager* manager, CfgDataValidator* validator, uint32 flags, void* context,
                  CfgSettings* settings) {
    if (!data) return kArgErr;
    DefaultCfgValidator acceptsAll;
    if (!validator) validator = &acceptsAll;
    return Guarded([&] {
        int32 policy = validator->Policy(context);
        CfgDataAccess::SetDefaulted(*data, false);
        MgErr readResult = ReadData(*data, manager, policy);
        MgErr result = readResult && data->HasDefault() ? TakeDefault(*data, readResult) : readResult;
        if (!IsChecked(policy, readResult, result)) return result;
        MgErr checked = validator->Check(*data, readResult, flags, context, settings);
        return checked && data->HasDefault() ? data->ResetToDefault() : checked;
    });
}

MgErr CfgDataSave(CfgData* data, CfgSavePolicy policy, ConfigManager* manager) {
    if (!data) return kArgErr;
    return Guarded([&] {
        std::string name = NameOf(*data);
        if (name.empty()) return kNoErr;
        bool removes = policy == kCfgRemoveAlways;
        switch (static_cast<int32>(policy)) {
            case kCfgSaveNever:
                return kNoErr;
            case kCfgSaveOrRemoveDefault:
                removes = data->EqualsDefault();
                break;
            case kCfgSaveOrRemoveIfHasDefault:
                if (!data->HasDefault()) return kNoErr;
                removes = data->EqualsDefault();
                break;
            case kCfgSaveAlways:
            case kCfgRemoveAlways:
                break;
            default:
                return kArgErr;
        }
        manager = OrMain(manager);
        if (!manager) return kGenericErr;
        if (removes) return manager->Remove(data->Type(), name, false);
        return manager->Write(data->Type(), name, data->Value(), false);
    });
}

}  // namespace tessel
