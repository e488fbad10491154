#include "config/IniFile.h"
#include "config/StoreParts.h"
#include "platform/LastError.h"
#include <tessel/config/ConfigOperations.h>
#include <tessel/diagnostics/DebugStream.h>
#include <tessel/files/FileManager.h>
#include <tessel/paths/PathRef.h>
#include <tessel/time/Millisecs.h>

#include <new>

namespace tessel {

// ---- the forms without a section ------------------------------------------------------------------------------------

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

// ---- the file and what is known of it -------------------------------------------------------------------------------

class BMINIConfigOperations::Store : public TrackedObject {
public:
    Store(const PathRef& file, const std::string& sectionName);

    // Runs body(err, missing) under the mutex, after a look at the file: `err` is why what it says is not known, and
    // `missing` whether that is because there is no file. The result is the body's.
    template <class Body>
    MgErr Run(Body&& body);

    // The folder first; an OVExcept when it cannot be made.
    MgErr SaveInFolder();
    MgErr Save();

    StoreMutex mutex;  // guards the rest; nothing else is taken inside
    CurrentSection section;
    IniDocument document;

private:
    // What is told when the mutex is given back.
    struct News {
        bool noTimes = false;
        bool unexpected = false;
        MgErr notRewritten = kNoErr;
    };
    class Operation;

    MgErr Refresh(News& news, bool& missing);
    MgErr LookAtFile(News& news, bool& missing, bool& changed) const;
    MgErr Reload(News& news, bool& missing);

    PathRef folder_;
    std::string name_;
    platform::FileVersion version_{};  // that the document was, when it was read or written
    bool loaded_ = false;              // there is such a version
    bool checked_ = false;
    uint32 checkTime_ = 0;  // of the last look that did not fail
};

// Holds the mutex, gives it back, and tells.
class BMINIConfigOperations::Store::Operation {
public:
    explicit Operation(Store& store) : mutex_(store.mutex.Get()), name_(store.name_) { ThMutexAcquire(mutex_); }
    ~Operation() {
        ThMutexRelease(mutex_);
        if (news.noTimes) {
            TESSEL_REPORT(kDebugWarning, 0x8E3B5D17u) << "Warning, function is not implemented on this platform.";
        }
        if (news.unexpected) TESSEL_REPORT(kDebugWarning, 0x41C9A06Eu) << "Warning, unexpected result.";
        if (news.notRewritten) {
            TESSEL_REPORT(kDebugWarning, 0xD72F840Bu)
                << "Cannot rewrite preference file " << name_.c_str() << ", error " << news.notRewritten;
        }
    }
    Operation(const Operation&) = delete;
    Operation& operator=(const Operation&) = delete;

    News news;

private:
    ThMutex mutex_;
    const std::string& name_;
};

BMINIConfigOperations::Store::Store(const PathRef& file, const std::string& sectionName)
    : section(sectionName), folder_(file.GetParentDirectory()) {
    if (const MgErr err = file.ConvertToString(&name_, PathRef::StringCommandLine())) {
        TESSEL_THROW(err, "name of a preference file");
    }
}

template <class Body>
MgErr BMINIConfigOperations::Store::Run(Body&& body) {
    Operation operation(*this);
    try {
        bool missing = false;
        const MgErr err = Refresh(operation.news, missing);
        return body(err, missing);
    } catch (const std::bad_alloc&) {
        return kConfigMemErr;
    }
}

// Another version than the one that is known has to be read. What the system cannot say counts as no change.
MgErr BMINIConfigOperations::Store::LookAtFile(News& news, bool& missing, bool& changed) const {
    platform::FileVersion version{};
    const bool known = platform::ItemGetVersion(name_.c_str(), version);
    changed = !loaded_ || (known && version != version_);
    if (known) return kNoErr;
    switch (platform::LastError()) {
        case platform::kErrorFileNotFound:
        case platform::kErrorPathNotFound:
            missing = true;
            return kNotFoundErr;
        case platform::kErrorInvalidFunction:
        case platform::kErrorNotSupported:
        case platform::kErrorCallNotImplemented:
            news.noTimes = true;
            return kGenericErr;
        case platform::kErrorNotEnoughMemory:
            return kConfigMemErr;
        default:
            news.unexpected = true;
            return kNoErr;
    }
}

// A file of nothing but keys without a section is one of before there were sections: its keys are those of ours.
MgErr BMINIConfigOperations::Store::Reload(News& news, bool& missing) {
    if (const MgErr err = LoadIni(name_, document, version_, missing)) return err;
    loaded_ = false;
    const bool named = document.NameOnlySection(section.Get());
    loaded_ = true;
    if (named) news.notRewritten = Save();
    return kNoErr;
}

MgErr BMINIConfigOperations::Store::Refresh(News& news, bool& missing) {
    constexpr uint32 kMillisecondsBetweenLooks = 1000;
    const uint32 now = MilliSecs();
    if (checked_ && now - checkTime_ < kMillisecondsBetweenLooks) return kNoErr;
    bool changed = false;
    if (const MgErr err = LookAtFile(news, missing, changed)) return err;
    if (changed) {
        if (const MgErr err = Reload(news, missing)) return err;
    }
    checked_ = true;
    checkTime_ = now;
    return kNoErr;
}

MgErr BMINIConfigOperations::Store::Save() {
    const MgErr err = SaveIni(name_, document, version_);
    if (!err) loaded_ = true;
    return err;
}

MgErr BMINIConfigOperations::Store::SaveInFolder() {
    if (const MgErr err = FNewDirHier(&folder_)) TESSEL_THROW(err, "folder of a preference file");
    return Save();
}

// ---- the operations -------------------------------------------------------------------------------------------------

BMINIConfigOperations::BMINIConfigOperations(const PathRef& file, const std::string& section)
    : store_(RaisingMemFull([&] { return std::make_unique<Store>(file, section); })) {
}

BMINIConfigOperations::~BMINIConfigOperations() = default;

const std::string& BMINIConfigOperations::GetSectionName() const {
    return store_->section.Get();
}

void BMINIConfigOperations::SetSectionName(const std::string& section) {
    const ThMutexHolder lock(store_->mutex.Get());
    RaisingMemFull([&] { store_->section.Set(section); });
}

MgErr BMINIConfigOperations::GetValue(const std::string& section, const std::string& key, std::string* value) {
    if (section.empty() || key.empty() || !value) return kArgErr;
    return store_->Run([&](MgErr err, bool missing) -> MgErr {
        if (err) return missing ? kConfigKeyErr : err;
        const std::string_view* const found = store_->document.Find(section, key);
        if (!found) return kConfigKeyErr;
        value->assign(*found);
        return kNoErr;
    });
}

MgErr BMINIConfigOperations::SetValue(const std::string& section, const std::string& key, const std::string& value) {
    if (section.empty() || key.empty()) return kArgErr;
    return store_->Run([&](MgErr err, bool missing) -> MgErr {
        if (err && !missing) return err;
        if (const MgErr refused = store_->document.Set(section, key, value)) return refused;
        return store_->SaveInFolder();
    });
}

MgErr BMINIConfigOperations::RemoveKey(const std::string& section, const std::string& key) {
    return store_->Run([&](MgErr err, bool missing) -> MgErr {
        if (err && !missing) return err;
        bool removed = false;
        if (const MgErr refused = store_->document.Remove(section, key, removed)) return refused;
        return removed && !missing ? store_->Save() : kNoErr;
    });
}

bool BMINIConfigOperations::HasKey(const std::string& section, const std::string& key) {
    return store_->Run([&](MgErr err, bool) -> MgErr {
        return err || !store_->document.Find(section, key) ? kConfigKeyErr : kNoErr;
    }) == kNoErr;
}

MgErr BMINIConfigOperations::GetSectionNames(std::vector<std::string>* names) {
    if (!names) return kArgErr;
    names->clear();
    return store_->Run([&](MgErr err, bool missing) -> MgErr {
        if (err) return missing ? kNoErr : err;
        store_->document.ListSections(*names);
        return kNoErr;
    });
}

MgErr BMINIConfigOperations::GetKeyNames(const std::string& section, std::vector<std::string>* names) {
    if (!names) return kArgErr;
    names->clear();
    return store_->Run([&](MgErr err, bool missing) -> MgErr {
        if (err) return missing ? kNoErr : err;
        store_->document.ListKeys(section, *names);
        return kNoErr;
    });
}

}  // namespace tessel
