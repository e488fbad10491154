#include "config/StoreParts.h"
#include "diagnostics/Guarded.h"
#include <tessel/config/ConfigOperations.h>

#include <map>
#include <string_view>
#include <utility>

namespace tessel {

class MemoryMapConfigOperations::Store : public TrackedObject {
public:
    explicit Store(const std::string& name) : section(name) {}

    StoreMutex mutex;  // guards the rest; nothing else is taken inside
    CurrentSection section;
    std::map<std::string, std::string, std::less<>, TrackedAllocator<std::pair<const std::string, std::string>>> values;
};

namespace {

std::string Composed(const std::string& section, const std::string& key) {
    return section.empty() ? key : section + "." + key;
}

}  // namespace

MemoryMapConfigOperations::MemoryMapConfigOperations(const std::string& section)
    : store_(RaisingMemFull([&] { return std::make_unique<Store>(section); })) {
}

MemoryMapConfigOperations::~MemoryMapConfigOperations() = default;

const std::string& MemoryMapConfigOperations::GetSectionName() const {
    return store_->section.Get();
}

void MemoryMapConfigOperations::SetSectionName(const std::string& section) {
    const ThMutexHolder lock(store_->mutex.Get());
    RaisingMemFull([&] { store_->section.Set(section); });
}

MgErr MemoryMapConfigOperations::GetValue(const std::string& section, const std::string& key, std::string* value) {
    if (key.empty() || !value) return kArgErr;
    return Guarded([&] {
        const ThMutexHolder lock(store_->mutex.Get());
        const auto found = store_->values.find(Composed(section, key));
        if (found == store_->values.end()) return kConfigKeyErr;
        *value = found->second;
        return kNoErr;
    });
}

MgErr MemoryMapConfigOperations::SetValue(const std::string& section, const std::string& key,
                                          const std::string& value) {
    if (key.empty()) return kArgErr;
    return Guarded([&] {
        const ThMutexHolder lock(store_->mutex.Get());
        store_->values.insert_or_assign(Composed(section, key), value);
        return kNoErr;
    });
}

MgErr MemoryMapConfigOperations::RemoveKey(const std::string& section, const std::string& key) {
    return Guarded([&] {
        const ThMutexHolder lock(store_->mutex.Get());
        return store_->values.erase(Composed(section, key)) ? kNoErr : kConfigKeyErr;
    });
}

bool MemoryMapConfigOperations::HasKey(const std::string& section, const std::string& key) {
    if (key.empty()) return false;
    const ThMutexHolder lock(store_->mutex.Get());
    return RaisingMemFull([&] { return store_->values.count(Composed(section, key)) != 0; });
}

MgErr MemoryMapConfigOperations::GetSectionNames(std::vector<std::string>* names) {
    if (!names) return kArgErr;
    names->clear();
    return Guarded([&] {
        const ThMutexHolder lock(store_->mutex.Get());
        for (const auto& entry : store_->values) {
            const size_t dot = entry.first.find('.');
            if (dot != std::string::npos) names->push_back(entry.first.substr(0, dot));
        }
        return kNoErr;
    });
}

MgErr MemoryMapConfigOperations::GetKeyNames(const std::string& section, std::vector<std::string>* names) {
    if (!names) return kArgErr;
    names->clear();
    return Guarded([&] {
        const ThMutexHolder lock(store_->mutex.Get());
        for (const auto& entry : store_->values) {
            const std::string_view name = entry.first;
            const size_t dot = name.find('.');
            const bool sectionless = dot == std::string_view::npos;
            if (section.empty() ? !sectionless : sectionless || name.substr(0, dot) != section) continue;
            names->emplace_back(sectionless ? name : name.substr(dot + 1));
        }
        return kNoErr;
    });
}

MgErr MemoryMapConfigOperations::GetAllKeyNames(std::vector<std::string>* names) {
    if (!names) return kArgErr;
    names->clear();
    return Guarded([&] {
        const ThMutexHolder lock(store_->mutex.Get());
        for (const auto& entry : store_->values) names->push_back(entry.first);
        return kNoErr;
    });
}

}  // namespace tessel
