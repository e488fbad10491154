// The objects behind the registry's interfaces.
#ifndef TESSEL_SOURCE_REGISTRY_WINREGISTRYOBJECTS_H
#define TESSEL_SOURCE_REGISTRY_WINREGISTRYOBJECTS_H

#include "platform/LastError.h"
#include "platform/Registry.h"
#include <tessel/registry/WinRegistry.h>

#include <atomic>
#include <memory>
#include <new>
#include <string>
#include <vector>

namespace tessel {

struct RegistryKeyCloser {
    void operator()(platform::RegistryKey* key) const { platform::RegistryClose(key); }
};
using RegistryKeyHandle = std::unique_ptr<platform::RegistryKey, RegistryKeyCloser>;

class WinRegistryKey final : public IWinRegistryKey {
public:
    // A root.
    WinRegistryKey(RegistryKeyHandle handle, CStr rootName);
    // A key below one whose full name is given. Raises kArgErr without one.
    WinRegistryKey(RegistryKeyHandle handle, CStr parentName, CStr path);

    bool IsOpen() override { return handle_ != nullptr; }
    CStr GetName() override { return name_.c_str(); }
    CStr GetFullName() override { return fullName_.c_str(); }
    int32 GetSubKeyCount() override;
    int32 GetValueCount() override;
    uint32 GetLastError() override { return lastError_; }

    MgErr OpenSubKey(const uint8* name, int32 writeAccess, IWinRegistryKey** key) override;
    MgErr OpenSubKey(CStr name, int32 writeAccess, IWinRegistryKey** key) override;
    MgErr OpenSubKey(const uint8* name, IWinRegistryKey** key) override;
    MgErr OpenSubKey(CStr name, IWinRegistryKey** key) override;
    bool SubKeyExists(const uint8* name) override;
    bool SubKeyExists(CStr name) override;
    MgErr CreateSubKey(const uint8* name, IWinRegistryKey** key) override;
    MgErr CreateSubKey(CStr name, IWinRegistryKey** key) override;
    MgErr EnumerateSubKeys(IWinRegistryKeyEnumeration** enumeration) override;
    MgErr EnumerateValues(IWinRegistryValueEnumeration** enumeration) override;

    CStr GetStringValue(const uint8* name) override;
    CStr GetStringValue(CStr name) override;
    CStr GetDefaultStringValue() override;
    const void* QueryValue(const uint8* name, uint32* type, uint32* size) override;
    const void* QueryValue(CStr name, uint32* type, uint32* size) override;

    MgErr SetStringValue(const uint8* name, const uint8* text) override;
    MgErr SetStringValue(const uint8* name, CStr text) override;
    MgErr SetStringValue(CStr name, const uint8* text) override;
    MgErr SetStringValue(CStr name, CStr text) override;
    MgErr SetDefaultStringValue(const uint8* text) override;
    MgErr SetDefaultStringValue(CStr text) override;
    MgErr SetSubKeyDefaultValue(const uint8* subKey, const uint8* text) override;
    MgErr SetSubKeyDefaultValue(const uint8* subKey, CStr text) override;
    MgErr SetSubKeyDefaultValue(CStr subKey, const uint8* text) override;
    MgErr SetSubKeyDefaultValue(CStr subKey, CStr text) override;
    MgErr SetValue(const uint8* name, uint32 type, const void* data, uint32 size) override;
    MgErr SetValue(CStr name, uint32 type, const void* data, uint32 size) override;

    MgErr DeleteSubKey(const uint8* name) override;
    MgErr DeleteSubKey(CStr name) override;
    MgErr Flush() override;
    MgErr Close() override;
    void Release() override;

    const platform::RegistryKey* Handle() const { return handle_.get(); }

private:
    // Runs a call of the platform, which returns its error number, and keeps that number.
    template <class Body>
    MgErr Call(Body&& body) {
        platform::ErrorNumber error = platform::kErrorInvalidHandle;
        try {
            if (handle_) error = body();
        } catch (const std::bad_alloc&) {
            lastError_ = platform::kErrorOutOfMemory;
            return kMemFullErr;
        }
        lastError_ = error;
        return error == platform::kErrorSuccess ? kNoErr : kRegistryErr;
    }
    MgErr Missing();

    bool ReadValue(CStr name, uint32& type);
    MgErr CheckDeletable(CStr name);
    platform::ErrorNumber CollectSubKeys(std::vector<std::string>& names) const;

    RegistryKeyHandle handle_;
    const bool owned_;  // false for a root, which is never closed
    std::string name_;
    std::string fullName_;
    std::string value_;                 // what the last read gave
    std::atomic<uint32> lastError_{0};  // threads share the roots
};

class WinRegistryValue final : public IWinRegistryValue {
public:
    // Reads the value. Raises kArgErr without a parent.
    WinRegistryValue(const platform::RegistryKey* parent, CStr name);

    CStr GetName() override { return name_.c_str(); }
    const void* GetData() override { return lastError_ == platform::kErrorSuccess ? data_.data() : nullptr; }
    uint32 GetSize() override { return static_cast<uint32>(data_.size()); }
    uint32 GetType() override { return type_; }
    uint32 GetLastError() override { return lastError_; }
    CStr GetString() override;
    void Release() override { delete this; }

private:
    std::string name_;
    std::string data_;
    uint32 type_ = kRegistryTypeNone;
    std::string expanded_;
    bool isExpanded_ = false;
    uint32 lastError_;
};

// Walks over what stands in a key. `Interface` is what it is, `Element` what it gives out.
template <class Interface, class Element>
class WinRegistryEnumeration : public Interface {
public:
    // Raises kArgErr without a parent.
    explicit WinRegistryEnumeration(WinRegistryKey* parent);

    uint32 GetLastError() override { return lastError_; }
    Element* GetCurrent() override { return current_.Get(); }
    bool MoveNext() override;
    void Release() override { delete this; }

protected:
    // Makes the element at an index the current one.
    virtual platform::ErrorNumber Take(uint32 index) = 0;

    const std::string parentName_;
    RegistryKeyHandle parent_;  // its own: the platform keeps one walk a handle
    AutoRelease<Element> current_;

private:
    uint32 next_ = 0;
    uint32 lastError_;
};

class WinRegistryKeyEnumeration final : public WinRegistryEnumeration<IWinRegistryKeyEnumeration, IWinRegistryKey> {
public:
    using WinRegistryEnumeration::WinRegistryEnumeration;

protected:
    platform::ErrorNumber Take(uint32 index) override;
};

class WinRegistryValueEnumeration final
    : public WinRegistryEnumeration<IWinRegistryValueEnumeration, IWinRegistryValue> {
public:
    using WinRegistryEnumeration::WinRegistryEnumeration;

protected:
    platform::ErrorNumber Take(uint32 index) override;
};

// A text with its references to environment variables replaced. Raises kRegistryErr or kGenericErr.
std::string ExpandRegistryText(const std::string& text);

}  // namespace tessel

#endif
