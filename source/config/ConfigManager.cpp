// The configuration manager.
#include "config/ConfigText.h"
#include "config/PreferenceFile.h"
#include "diagnostics/Guarded.h"
#include <tessel/base/OVExcept.h>
#include <tessel/config/ConfigManager.h>
#include <tessel/config/ConfigTypeRegistry.h>
#include <tessel/diagnostics/DebugStream.h>
#include <tessel/strings/StringLStrArray.h>
#include <tessel/strings/StringUtils.h>
#include <tessel/strings/ovhandle.h>

#include <map>

namespace tessel {
namespace {

void RaiseIf(MgErr err, const char* detail) {
    if (err) TESSEL_THROW(err, detail);
}

void ReportUnknownType(int32 type) {
    TESSEL_REPORT(kDebugWarning, 0x31C8A6F4u) << "Unknown config type '" << DbgFmtQuadChar(type) << "'.";
}

// The file takes one pair of quotes off a text; the memory keeps it.
void TakeQuotesOff(std::string* text) {
    if (text->size() < 2 || text->front() != '"' || text->back() != '"') return;
    text->pop_back();
    text->erase(0, 1);
}

bool EqualTokens(const std::string& token, CStr known) {
    return known && StringUtils::CaseInsensitiveEqual(token, known);
}

// An array that is disposed of unless it is handed over.
class OwnedArray {
public:
    OwnedArray() = default;
    ~OwnedArray() { ReallocLStrArrayHandle(&array_, 0); }
    OwnedArray(const OwnedArray&) = delete;
    OwnedArray& operator=(const OwnedArray&) = delete;

    void Fill(const std::vector<std::string>& texts, const char* whatFailed) {
        if (!texts.empty()) RaiseIf(StringUtils::ToLStrArrayHandleNoThrow(texts, &array_), whatFailed);
    }
    // What was there before is disposed of.
    void HandOver(LStrArrayHandle* array) { std::swap(array_, *array); }

private:
    LStrArrayHandle array_ = nullptr;
};

}  // namespace

// ---- life -----------------------------------------------------------------------------------------------------------

ConfigManager::ConfigManager(const PathRef& file)
    : path_(CanBeFile(file) ? file : DefaultPreferenceFile()), file_(path_, HostSection()), memory_("") {
}

ConfigManager::~ConfigManager() = default;

int32 ConfigManager::AddRef() {
    return references_.fetch_add(1) + 1;
}

int32 ConfigManager::RemoveRef() {
    int32 left = references_.fetch_sub(1) - 1;
    if (left == 0) delete this;
    return left;
}

// ---- keys -----------------------------------------------------------------------------------------------------------

MgErr ConfigManager::SetKnownTokens(const KnownToken* tokens, int32 count) {
    if (count < 0) return kArgErr;
    if (!tokens && count) {
        TESSEL_REPORT(kDebugWarning, 0x8A4D1E63u) << "If tokens is NULL, tokenCount must be zero";
        return kArgErr;
    }
    tokens_ = tokens;
    tokenCount_ = count;
    return kNoErr;
}

bool ConfigManager::ValidateTokenName(const std::string& key) {
    if (!tokens_) return true;
    for (int32 i = 0; i < tokenCount_; ++i)
        if (EqualTokens(key, tokens_[i].name)) return true;
    TESSEL_REPORT(kDebugWarning, 0xB02F7D59u) << "Unknown INI token: " << key;
    return false;
}

// The name that the stores know the key by.
std::string ConfigManager::TokenName(const std::string& key) {
    ValidateTokenName(key);
    std::string_view name = Trimmed(key);
    if (name.empty()) TESSEL_THROW(kArgErr, "Token name empty");
    return std::string(name);
}

// ---- reading --------------------------------------------------------------------------------------------------------

MgErr ConfigManager::GetDefault(int32 type, const std::string& key, void* value) {
    if (key.empty() || !value) return kArgErr;
    return Guarded([&] {
        std::string name = TokenName(key), text;
        MgErr err = memory_.GetValue(name, &text);
        if (err == kNoErr) {
            TakeQuotesOff(&text);
        } else {
            if (err != kConfigKeyErr) TESSEL_THROW(err, "Error while reading from memory");
            if (file_.GetSectionName().empty()) return kConfigKeyErr;
            err = file_.GetValue(name, &text);
            if (err == kConfigKeyErr) return err;
            RaiseIf(err, "Error while reading from file");
        }
        err = ValueFromString(type, text, value);
        if (err == kConfigTypeErr) ReportUnknownType(type);
        RaiseIf(err, "Error while parsing value");
        return kNoErr;
    });
}

MgErr ConfigManager::GetDefault(int32 type, ConstPStr key, void* value) {
    return Guarded([&] { return GetDefault(type, std::string(TextOf(key)), value); });
}

// ---- writing --------------------------------------------------------------------------------------------------------

MgErr ConfigManager::Write(int32 type, const std::string& key, const void* value, bool inMemory) {
    if (key.empty() || !value) return kArgErr;
    return Guarded([&] {
        ValidateTokenName(key);
        std::string text;
        MgErr err = ValueToString(type, value, &text);
        if (err == kConfigTypeErr) ReportUnknownType(type);
        RaiseIf(err, "Could not parse value to write into string");
        std::string_view name = Trimmed(key);
        if (name.empty()) TESSEL_THROW(kArgErr, "Token name empty");
        WriteText(std::string(name), std::string(Trimmed(text)), inMemory);
        return kNoErr;
    });
}

void ConfigManager::WriteText(const std::string& name, const std::string& text, bool inMemory) {
    bool shadowed = memory_.HasKey(name);
    if (shadowed && !inMemory)
        TESSEL_REPORT(kDebugWarning, 0x24F1B98Du)
            << "In Memory Config Token (" << name << ") is now asked to persist in file! Not recommended.";
    if (shadowed || inMemory) RaiseIf(memory_.SetValue(name, text), "Error writing key to memory");
    if (!inMemory) RaiseIf(file_.SetValue(name, text), "Error writing key to file");
}

MgErr ConfigManager::Write(int32 type, ConstPStr key, const void* value, bool inMemory) {
    return Guarded([&] { return Write(type, std::string(TextOf(key)), value, inMemory); });
}

// ---- removing -------------------------------------------------------------------------------------------------------

MgErr ConfigManager::Remove(int32, const std::string& key, bool inMemory) {
    if (key.empty()) return kArgErr;
    return Guarded([&] {
        RemoveEverywhere(TokenName(key), inMemory);
        return kNoErr;
    });
}

void ConfigManager::RemoveEverywhere(const std::string& name, bool inMemory) {
    if (memory_.HasKey(name)) {
        if (!inMemory)
            TESSEL_REPORT(kDebugWarning, 0xE6735C12u)
                << "In Memory Config Token (" << name << ") is now asked to be removed from file! Not recommended.";
        MgErr err = memory_.RemoveKey(name);
        if (err != kConfigKeyErr) RaiseIf(err, "Error removing key from memory");  // 20: another thread was faster
    }
    // Without a section there are no keys.
    if (!inMemory && !file_.GetSectionName().empty()) RaiseIf(file_.RemoveKey(name), "Error removing key from file");
}

MgErr ConfigManager::Remove(int32 type, ConstPStr key, bool inMemory) {
    return Guarded([&] { return Remove(type, std::string(TextOf(key)), inMemory); });
}

// ---- what it works on -----------------------------------------------------------------------------------------------

MgErr ConfigManager::GetPrefFilePath(Path* path) {
    if (!path) return kArgErr;
    return Guarded([&] { return path_.ConvertToPath(path); });
}

MgErr ConfigManager::GetHostPrefsSection(LStrHandle* section) {
    if (!section) return kArgErr;
    return StoreText(file_.GetSectionName(), section);
}

MgErr ConfigManager::UpdateSectionHeader(const std::string& section) {
    return Guarded([&] {
        file_.SetSectionName(section);
        return kNoErr;
    });
}

MgErr ConfigManager::GetInMemoryConfigList(LStrArrayHandle* keys, LStrArrayHandle* values, int32* count) {
    if (!keys || !values || !count) return kArgErr;
    return Guarded([&] {
        std::vector<std::string> names, texts;
        RaiseIf(memory_.GetAllKeyNames(&names), "Error fetching key names from memory");
        for (size_t i = 0; i < names.size();) {
            std::string text;
            MgErr err = memory_.GetValue(names[i], &text);
            if (err == kConfigKeyErr) {  // removed meanwhile
                names.erase(names.begin() + static_cast<std::ptrdiff_t>(i));
                continue;
            }
            RaiseIf(err, "Error reading key from memory");
            texts.push_back(std::move(text));
            ++i;
        }
        OwnedArray keyArray, valueArray;
        keyArray.Fill(names, "Error allocating key array handle");
        valueArray.Fill(texts, "Error allocating value array handle");
        keyArray.HandOver(keys);
        valueArray.HandOver(values);
        *count = static_cast<int32>(names.size());
        return kNoErr;
    });
}

// ---- values as text -------------------------------------------------------------------------------------------------

MgErr ConfigManager::ValueFromString(int32 type, const std::string& text, void* value) {
    if (text.size() > static_cast<size_t>(std::numeric_limits<int32>::max())) return kConfigMemErr;
    return ConfigTypeFromString(type, text.data(), static_cast<int32>(text.size()), value);
}

MgErr ConfigManager::ValueToString(int32 type, const void* value, std::string* text) {
    if (!text) return kArgErr;
    return Guarded([&] {
        LStrHandle written = nullptr;
        MgErr err = ConfigTypeToString(type, value, &written);
        OVHandle owner;
        if (written) owner.AttachHandle(reinterpret_cast<UHandle>(written));
        if (!err) text->assign(TextOf(written));
        return err;
    });
}

// ---- managers of other files ----------------------------------------------------------------------------------------

void ConstructCfgAccessPathRef(const PathRef& file, ConfigManager** manager) {
    if (!manager) TESSEL_THROW(kArgErr, "No place for the Config Manager");
    *manager = nullptr;
    if (!CanBeFile(file)) TESSEL_THROW(kArgErr, "Not a Valid path to a preference file.");
    *manager = new ConfigManager(file);
}

MgErr ConstructCfgAccess(Path file, ConfigManager** manager) {
    if (!manager) return kArgErr;
    *manager = nullptr;
    if (!file) return kArgErr;
    return Guarded([&] {
        ConstructCfgAccessPathRef(*file, manager);
        return kNoErr;
    });
}

MgErr ConstructCfgAccessCStr(CStr file, ConfigManager** manager) {
    if (!manager) return kArgErr;
    *manager = nullptr;
    if (!file) return kArgErr;
    MgErr err = Guarded([&] {
        ConstructCfgAccessPathRef(PreferencePath(file), manager);
        return kNoErr;
    });
    RaiseIf(err, "Error constructing Config Manager");
    return kNoErr;
}

}  // namespace tessel
