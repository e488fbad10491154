#include <tessel/config/ConfigOperations.h>

namespace tessel {

ConfigOperationsInterface::~ConfigOperationsInterface() = default;

MgErr ConfigOperationsInterface::GetValue(const std::string& key, std::string* value) {
    return GetValue(GetSectionName(), key, value);
}

MgErr ConfigOperationsInterface::SetValue(const std::string& key, const std::string& value) {
    return SetValue(GetSectionName(), key, value);
}

MgErr ConfigOperationsInterface::RemoveKey(const std::string& key) {
    return RemoveKey(GetSectionName(), key);
}

bool ConfigOperationsInterface::HasKey(const std::string& key) {
    return HasKey(GetSectionName(), key);
}

MgErr ConfigOperationsInterface::GetKeyNames(std::vector<std::string>* names) {
    return GetKeyNames(GetSectionName(), names);
}

}  // namespace tessel
