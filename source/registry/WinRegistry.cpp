#include "platform/CodePage.h"
#include "platform/Mutex.h"
#include "platform/Process.h"
#include "registry/WinRegistryObjects.h"
#include <tessel/base/OVExcept.h>
#include <tessel/diagnostics/DebugStream.h>
#include <tessel/registry/WinRegistry.h>

#include <atomic>
#include <cstring>
#include <new>
#include <string_view>

namespace tessel {

using platform::ErrorNumber;

namespace {

constexpr char kSeparator = '\\';
constexpr char kUnnamed[] = "";

CStr Chars(const uint8* text) {
    return reinterpret_cast<CStr>(text);
}

// Calls take(element) for what stands between the separators of a path.
template <class Taker>
void ForEachElement(std::string_view path, Taker take) {
    const char* const end = path.data() + path.size();
    for (const char *start = path.data(), *at = start; start < end; start = ++at) {
        while (at < end && *at != kSeparator) at += platform::CharLength(at, end);
        if (at > start) take(std::string_view(start, static_cast<size_t>(at - start)));
    }
}

bool IsUnavailable(ErrorNumber error) {
    return error == platform::kErrorFileNotFound || error == platform::kErrorPathNotFound ||
           error == platform::kErrorInvalidHandle;
}

}  // namespace

// ---- making and looking ---------------------------------------------------------------------------------------------

WinRegistryKey::WinRegistryKey(RegistryKeyHandle handle, CStr rootName)
    : handle_(std::move(handle)), owned_(false), name_(rootName), fullName_(rootName) {
}

WinRegistryKey::WinRegistryKey(RegistryKeyHandle handle, CStr parentName, CStr path)
    : handle_(std::move(handle)), owned_(true) {
    if (!parentName) TESSEL_THROW(kArgErr, "Registry Key Parent Name cannot be NULL");
    fullName_ = parentName;
    ForEachElement(path ? path : "", [&](std::string_view element) { (fullName_ += kSeparator) += element; });
    ForEachElement(fullName_, [&](std::string_view element) { name_ = element; });
}

MgErr WinRegistryKey::Missing() {
    lastError_ = platform::kErrorInvalidParameter;
    return kArgErr;
}

int32 WinRegistryKey::GetSubKeyCount() {
    uint32 subKeys = 0, values = 0;
    MgErr err = Call([&] { return platform::RegistryCounts(Handle(), subKeys, values); });
    return err == kNoErr ? static_cast<int32>(subKeys) : -1;
}

int32 WinRegistryKey::GetValueCount() {
    uint32 subKeys = 0, values = 0;
    MgErr err = Call([&] { return platform::RegistryCounts(Handle(), subKeys, values); });
    return err == kNoErr ? static_cast<int32>(values) : -1;
}

MgErr WinRegistryKey::Flush() {
    return Call([&] { return platform::RegistryFlush(Handle()); });
}

MgErr WinRegistryKey::Close() {
    if (!owned_ || !handle_) {
        lastError_ = platform::kErrorSuccess;
        return kNoErr;
    }
    return Call([&] { return platform::RegistryClose(handle_.release()); });
}

void WinRegistryKey::Release() {
    if (owned_) delete this;
}

// ---- subkeys --------------------------------------------------------------------------------------------------------

MgErr WinRegistryKey::OpenSubKey(CStr name, int32 writeAccess, IWinRegistryKey** key) {
    if (key) *key = nullptr;
    if (!name || !key) return Missing();
    return Call([&] {
        platform::RegistryKey* opened = nullptr;
        ErrorNumber error = platform::RegistryOpen(Handle(), name, writeAccess > 0, opened);
        RegistryKeyHandle handle(opened);
        if (error == platform::kErrorSuccess) *key = new WinRegistryKey(std::move(handle), GetFullName(), name);
        return error;
    });
}

MgErr WinRegistryKey::OpenSubKey(CStr name, IWinRegistryKey** key) {
    return OpenSubKey(name, 0, key);
}

bool WinRegistryKey::SubKeyExists(CStr name) {
    AutoRelease<IWinRegistryKey> key;
    return OpenSubKey(name, key.Out()) == kNoErr;
}

MgErr WinRegistryKey::CreateSubKey(CStr name, IWinRegistryKey** key) {
    if (key) *key = nullptr;
    if (!name || !key) return Missing();
    return Call([&] {
        platform::RegistryKey* created = nullptr;
        ErrorNumber error = platform::RegistryCreate(Handle(), name, created);
        RegistryKeyHandle handle(created);
        if (error == platform::kErrorSuccess) *key = new WinRegistryKey(std::move(handle), GetFullName(), name);
        return error;
    });
}

ErrorNumber WinRegistryKey::CollectSubKeys(std::vector<std::string>& names) const {
    std::string name;
    for (uint32 index = 0;; ++index) {
        ErrorNumber error = platform::RegistryEnumerateKey(Handle(), index, name);
        if (error == platform::kErrorNoMoreItems) return platform::kErrorSuccess;
        if (error != platform::kErrorSuccess) return error;
        names.push_back(name);
    }
}

// Opens what would be deleted with a subkey, to see that it may be.
MgErr WinRegistryKey::CheckDeletable(CStr name) {
    AutoRelease<IWinRegistryKey> key;
    if (const MgErr err = OpenSubKey(name, 1, key.Out())) return err;
    auto& subKey = static_cast<WinRegistryKey&>(*key);
    std::vector<std::string> names;
    MgErr err = subKey.Call([&] { return subKey.CollectSubKeys(names); });
    for (size_t i = 0; i < names.size() && err == kNoErr; ++i) err = subKey.CheckDeletable(names[i].c_str());
    lastError_ = subKey.lastError_.load();
    return err;
}

MgErr WinRegistryKey::DeleteSubKey(CStr name) {
    if (!name || !*name) return Missing();
    if (const MgErr err = CheckDeletable(name)) return err;
    return Call([&] { return platform::RegistryDelete(Handle(), name); });
}

// ---- reading values -------------------------------------------------------------------------------------------------

// Reads into the value buffer. False, and an empty buffer, when there is no such value.
bool WinRegistryKey::ReadValue(CStr name, uint32& type) {
    MgErr err = Call([&] { return platform::RegistryQueryValue(Handle(), name ? name : kUnnamed, type, value_); });
    if (err == kNoErr) return true;
    value_ = std::string();
    if (err == kMemFullErr) TESSEL_THROW(err, "Unable to allocate buffer for registry query");
    if (!IsUnavailable(lastError_)) TESSEL_THROW(kRegistryErr, "Error reading registry value");
    return false;
}

CStr WinRegistryKey::GetStringValue(CStr name) {
    uint32 type = kRegistryTypeNone;
    if (!ReadValue(name, type)) return nullptr;
    if (type != kRegistryTypeString && type != kRegistryTypeExpandString)
        TESSEL_THROW(kRegistryTypeErr, "Registery Value queried is not a string type");
    if (type == kRegistryTypeExpandString) value_ = ExpandRegistryText(value_);
    return value_.c_str();
}

CStr WinRegistryKey::GetDefaultStringValue() {
    return GetStringValue(kUnnamed);
}

const void* WinRegistryKey::QueryValue(CStr name, uint32* type, uint32* size) {
    uint32 found = kRegistryTypeNone;
    const bool exists = ReadValue(name, found);
    if (type) *type = exists ? found : 0;
    if (size) *size = static_cast<uint32>(value_.size());
    return exists ? value_.data() : nullptr;
}

std::string ExpandRegistryText(const std::string& text) {
    constexpr size_t kLongest = 1024 * 1024;
    std::string expanded;
    try {
        expanded = platform::EnvironmentExpand(text.c_str());  // to the terminator that is stored with it
    } catch (const std::bad_alloc&) {
        TESSEL_THROW(kRegistryErr, "Failed to expand environment variables in registry value");
    }
    if (expanded.size() > kLongest)
        TESSEL_THROW(kGenericErr, "Failed to extract expanded environment variables in registry value");
    return expanded;
}

// ---- writing values -------------------------------------------------------------------------------------------------

MgErr WinRegistryKey::SetValue(CStr name, uint32 type, const void* data, uint32 size) {
    if (!data && size != 0) return Missing();
    return Call([&] { return platform::RegistrySetValue(Handle(), name ? name : kUnnamed, type, data, size); });
}

MgErr WinRegistryKey::SetStringValue(CStr name, CStr text) {
    if (!text) return Missing();
    return SetValue(name, kRegistryTypeString, text, static_cast<uint32>(std::strlen(text) + 1));
}

MgErr WinRegistryKey::SetDefaultStringValue(CStr text) {
    return SetStringValue(kUnnamed, text);
}

MgErr WinRegistryKey::SetSubKeyDefaultValue(CStr subKey, CStr text) {
    if (!subKey || !text) return Missing();
    if (!*subKey) return SetDefaultStringValue(text);
    return Call([&] {
        platform::RegistryKey* created = nullptr;
        ErrorNumber error = platform::RegistryCreate(Handle(), subKey, created);
        RegistryKeyHandle handle(created);
        if (error != platform::kErrorSuccess) return error;
        return platform::RegistrySetValue(created, kUnnamed, kRegistryTypeString, text, std::strlen(text) + 1);
    });
}

// ---- the same with names and texts as bytes -------------------------------------------------------------------------

MgErr WinRegistryKey::OpenSubKey(const uint8* name, int32 writeAccess, IWinRegistryKey** key) {
    return OpenSubKey(Chars(name), writeAccess, key);
}
MgErr WinRegistryKey::OpenSubKey(const uint8* name, IWinRegistryKey** key) {
    return OpenSubKey(Chars(name), key);
}
bool WinRegistryKey::SubKeyExists(const uint8* name) {
    return SubKeyExists(Chars(name));
}
MgErr WinRegistryKey::CreateSubKey(const uint8* name, IWinRegistryKey** key) {
    return CreateSubKey(Chars(name), key);
}
CStr WinRegistryKey::GetStringValue(const uint8* name) {
    return GetStringValue(Chars(name));
}
const void* WinRegistryKey::QueryValue(const uint8* name, uint32* type, uint32* size) {
    return QueryValue(Chars(name), type, size);
}
MgErr WinRegistryKey::SetStringValue(const uint8* name, const uint8* text) {
    return SetStringValue(Chars(name), Chars(text));
}
MgErr WinRegistryKey::SetStringValue(const uint8* name, CStr text) {
    return SetStringValue(Chars(name), text);
}
MgErr WinRegistryKey::SetStringValue(CStr name, const uint8* text) {
    return SetStringValue(name, Chars(text));
}
MgErr WinRegistryKey::SetDefaultStringValue(const uint8* text) {
    return SetDefaultStringValue(Chars(text));
}
MgErr WinRegistryKey::SetSubKeyDefaultValue(const uint8* subKey, const uint8* text) {
    return SetSubKeyDefaultValue(Chars(subKey), Chars(text));
}
MgErr WinRegistryKey::SetSubKeyDefaultValue(const uint8* subKey, CStr text) {
    return SetSubKeyDefaultValue(Chars(subKey), text);
}
MgErr WinRegistryKey::SetSubKeyDefaultValue(CStr subKey, const uint8* text) {
    return SetSubKeyDefaultValue(subKey, Chars(text));
}
MgErr WinRegistryKey::SetValue(const uint8* name, uint32 type, const void* data, uint32 size) {
    return SetValue(Chars(name), type, data, size);
}
MgErr WinRegistryKey::DeleteSubKey(const uint8* name) {
    return DeleteSubKey(Chars(name));
}

// ---- the roots ------------------------------------------------------------------------------------------------------

namespace {

constexpr CStr kRootNames[] = {"HKEY_CLASSES_ROOT",  "HKEY_CURRENT_CONFIG",   "HKEY_CURRENT_USER", "HKEY_DYN_DATA",
                               "HKEY_LOCAL_MACHINE", "HKEY_PERFORMANCE_DATA", "HKEY_USERS"};
constexpr size_t kRoots = sizeof kRootNames / sizeof kRootNames[0];
static_assert(static_cast<size_t>(platform::RegistryRoot::kUsers) == kRoots - 1);
static_assert(kRegistryViewDefault == platform::kRegistryDefaultView);
static_assert(kRegistryViewOf64Bit == platform::kRegistryView64);

platform::Mutex rootsMutex;  // nothing is taken inside
// By root and view, for the life of the process.
IWinRegistryKey* rootKeys[kRoots][2] TESSEL_GUARDED_BY(rootsMutex) = {};

// Null when there is no memory. Without a store it has no handle, so that every key of it is missing.
IWinRegistryKey* MakeRoot(platform::RegistryRoot root, CStr name, uint32 view, ErrorNumber& error) try {
    platform::RegistryKey* opened = nullptr;
    error = platform::RegistryOpenRoot(root, view, opened);
    RegistryKeyHandle handle(opened);
    return new WinRegistryKey(std::move(handle), name);
} catch (const std::bad_alloc&) {
    return nullptr;
}

IWinRegistryKey* RootKey(platform::RegistryRoot root, uint32 view) {
    const size_t index = static_cast<size_t>(root);
    if (view != kRegistryViewDefault && view != kRegistryViewOf64Bit) {
        TESSEL_REPORT(kDebugError, 0x2E7D90B6u)
            << "Requested unknown registry view " << view << " for key " << kRootNames[index];
        return nullptr;
    }
    ErrorNumber error = platform::kErrorSuccess;
    IWinRegistryKey* key = nullptr;
    {
        platform::MutexHolder holder(rootsMutex);
        IWinRegistryKey*& known = rootKeys[index][view == kRegistryViewOf64Bit];
        if (!known) known = MakeRoot(root, kRootNames[index], view, error);
        key = known;
    }
    static std::atomic<bool> isReported{false};
    if (error != platform::kErrorSuccess && !isReported.exchange(true))
        TESSEL_REPORT(kDebugError, 0x6C41F7A3u)
            << "TESSEL_REGISTRY is not the absolute name of a folder: there is no registry";
    return key;
}

}  // namespace

IWinRegistryKey* GetClassesRootRegistryKey(uint32 view) {
    return RootKey(platform::RegistryRoot::kClassesRoot, view);
}
IWinRegistryKey* GetCurrentConfigRegistryKey(uint32 view) {
    return RootKey(platform::RegistryRoot::kCurrentConfig, view);
}
IWinRegistryKey* GetCurrentUserRegistryKey(uint32 view) {
    return RootKey(platform::RegistryRoot::kCurrentUser, view);
}
IWinRegistryKey* GetDynDataRegistryKey(uint32 view) {
    return RootKey(platform::RegistryRoot::kDynData, view);
}
IWinRegistryKey* GetLocalMachineRegistryKey(uint32 view) {
    return RootKey(platform::RegistryRoot::kLocalMachine, view);
}
IWinRegistryKey* GetPerformanceDataRegistryKey(uint32 view) {
    return RootKey(platform::RegistryRoot::kPerformanceData, view);
}
IWinRegistryKey* GetUsersRegistryKey(uint32 view) {
    return RootKey(platform::RegistryRoot::kUsers, view);
}

}  // namespace tessel
