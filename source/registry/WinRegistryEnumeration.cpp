// Walks over subkeys and values, and the values they give.
#include "platform/CodePage.h"
#include "registry/WinRegistryObjects.h"
#include <tessel/base/OVExcept.h>

#include <new>

namespace tessel {

using platform::ErrorNumber;

// ---- enumerations ---------------------------------------------------------------------------------------------------

namespace {

CStr FullNameOf(WinRegistryKey* parent) {
    if (!parent) TESSEL_THROW(kArgErr, "Parent for Registry Enumeration cannot be NULL");
    return parent->GetFullName();
}

}  // namespace

template <class Interface, class Element>
WinRegistryEnumeration<Interface, Element>::WinRegistryEnumeration(WinRegistryKey* parent)
    : parentName_(FullNameOf(parent)) {
    platform::RegistryKey* opened = nullptr;
    lastError_ = platform::RegistryOpen(parent->Handle(), "", false, opened);
    parent_.reset(opened);
}

template <class Interface, class Element>
bool WinRegistryEnumeration<Interface, Element>::MoveNext() {
    current_.Reset(nullptr);
    if (!parent_) return false;
    try {
        lastError_ = Take(next_);
    } catch (const std::bad_alloc&) {
        lastError_ = platform::kErrorOutOfMemory;
    }
    if (lastError_ != platform::kErrorSuccess) return false;
    ++next_;
    return true;
}

template class WinRegistryEnumeration<IWinRegistryKeyEnumeration, IWinRegistryKey>;
template class WinRegistryEnumeration<IWinRegistryValueEnumeration, IWinRegistryValue>;

namespace {

size_t Characters(const std::string& text) {
    size_t count = 0;
    const char* const end = text.data() + text.size();
    for (const char* at = text.data(); at < end; at += platform::CharLength(at, end)) ++count;
    return count;
}

}  // namespace

ErrorNumber WinRegistryKeyEnumeration::Take(uint32 index) {
    constexpr size_t kLongestName = 255;  // characters
    std::string name;
    ErrorNumber error = platform::RegistryEnumerateKey(parent_.get(), index, name);
    if (error != platform::kErrorSuccess) return error;
    if (Characters(name) > kLongestName) return platform::kErrorMoreData;
    platform::RegistryKey* opened = nullptr;
    error = platform::RegistryOpen(parent_.get(), name.c_str(), false, opened);
    RegistryKeyHandle handle(opened);
    if (error != platform::kErrorSuccess) return error;
    current_.Reset(new WinRegistryKey(std::move(handle), parentName_.c_str(), name.c_str()));
    return error;
}

ErrorNumber WinRegistryValueEnumeration::Take(uint32 index) {
    std::string name;
    ErrorNumber error = platform::RegistryEnumerateValue(parent_.get(), index, name);
    if (error == platform::kErrorSuccess) current_.Reset(new WinRegistryValue(parent_.get(), name.c_str()));
    return error;
}

MgErr WinRegistryKey::EnumerateSubKeys(IWinRegistryKeyEnumeration** enumeration) {
    if (!enumeration) return Missing();
    *enumeration = nullptr;
    return Call([&] {
        *enumeration = new WinRegistryKeyEnumeration(this);
        return platform::kErrorSuccess;
    });
}

MgErr WinRegistryKey::EnumerateValues(IWinRegistryValueEnumeration** enumeration) {
    if (!enumeration) return Missing();
    *enumeration = nullptr;
    return Call([&] {
        *enumeration = new WinRegistryValueEnumeration(this);
        return platform::kErrorSuccess;
    });
}

// ---- values ---------------------------------------------------------------------------------------------------------

WinRegistryValue::WinRegistryValue(const platform::RegistryKey* parent, CStr name) : name_(name ? name : "") {
    if (!parent) TESSEL_THROW(kArgErr, "Parent for Registry Value cannot be NULL");
    lastError_ = platform::RegistryQueryValue(parent, name_.c_str(), type_, data_);
    if (lastError_ != platform::kErrorSuccess) data_.clear();
}

CStr WinRegistryValue::GetString() {
    if (lastError_ != platform::kErrorSuccess) return nullptr;
    if (type_ == kRegistryTypeString) return data_.c_str();
    if (type_ != kRegistryTypeExpandString) return nullptr;
    if (!isExpanded_) expanded_ = ExpandRegistryText(data_);
    isExpanded_ = true;
    return expanded_.c_str();
}

}  // namespace tessel
