// Stores of settings: text values under a section and a key.
//
// ConfigOperationsInterface   what a store can do
// BMINIConfigOperations       sections and keys of a preference file
// MemoryMapConfigOperations   the same in memory only
//
// Names and values are bytes in the active code page. Any thread may use a store: each operation holds the store's own
// mutex from its beginning to its end, reading and writing of the file included. A store that was made needs nothing
// but the mutexes, paths and files of the library, and goes before they stop.
#ifndef TESSEL_CONFIG_CONFIGOPERATIONS_H
#define TESSEL_CONFIG_CONFIGOPERATIONS_H

#include <tessel/base/MgErr.h>
#include <tessel/memory/TrackedMallocFree.h>

#ifdef __cplusplus
#    include <memory>
#    include <string>
#    include <vector>

namespace tessel {

class PathRef;

// The slots and their order are fixed. What returns an MgErr raises nothing, unless it says so.
class TESSEL_API ConfigOperationsInterface {
public:
    virtual ~ConfigOperationsInterface();

    // The section that the forms without one use. The reference is good as long as the store.
    virtual const std::string& GetSectionName() const = 0;
    // Raises OVExcept when there is no memory.
    virtual void SetSectionName(const std::string& section) = 0;

    // The value in *value. kConfigKeyErr (20) when there is no such key; *value is left alone then, as on any failure.
    // kArgErr (1) for an empty name and a null output.
    virtual MgErr GetValue(const std::string& section, const std::string& key, std::string* value) = 0;
    // The same in the store's own section.
    virtual MgErr GetValue(const std::string& key, std::string* value);

    // Makes the key, or replaces its value. kArgErr (1) for an empty name.
    virtual MgErr SetValue(const std::string& section, const std::string& key, const std::string& value) = 0;
    // The same in the store's own section.
    virtual MgErr SetValue(const std::string& key, const std::string& value);

    // Removes the key.
    virtual MgErr RemoveKey(const std::string& section, const std::string& key) = 0;
    // The same in the store's own section.
    virtual MgErr RemoveKey(const std::string& key);

    // False for empty names too, and when the store cannot be read.
    virtual bool HasKey(const std::string& section, const std::string& key) = 0;
    // The same in the store's own section.
    virtual bool HasKey(const std::string& key);

    // The list is emptied first. kArgErr (1) for a null list.
    virtual MgErr GetSectionNames(std::vector<std::string>* names) = 0;
    // The keys of a section, as GetSectionNames.
    virtual MgErr GetKeyNames(const std::string& section, std::vector<std::string>* names) = 0;
    // The same in the store's own section.
    virtual MgErr GetKeyNames(std::vector<std::string>* names);
};

// A preference file ("INI"): "[section]" lines, each followed by its "key=value" lines. docs/formats.md has the details
// of what is read and written.
//
// The whole file is kept in memory. Every operation first sees to it that this is what the file says: at most once a
// second it looks whether the file's last write, size or identity differ from what they were, and if so reads the file
// again. A look that fails does not put off the next one.
//
// Every change is saved before the operation returns. A save is atomic (whoever reads the file, and whoever looks after
// a crash, finds the old or the new text, whole) and durable (on the device before it returns). It replaces the file:
// mode, owner and attributes stay, and of a symbolic link the file that it leads to is replaced. After a failed save
// the file is as it was, the change stays in memory, and goes out with the next save.
//
// Processes that share a file see each other's saves after a second at the latest. Of two that save at the same time,
// one overwrites what the other has changed.
//
// Names compare without regard to the case of the letters A to Z, bytes above 127 as they are, and without the white
// space around them. Values are kept without the white space around them. A value within double quotes is kept without
// them, and has them in the file.
//
// Results beside those of the interface:
//   6   the file cannot be read, or the temporary file beside it cannot be made
//   7   the file is there but cannot be opened for reading
//   8   the file cannot be written or replaced
//   9   writing failed: the disk is full, or failing
//   19  a name is nothing but white space; RemoveKey: or empty
//   22  no memory
//   42  the system cannot tell when a file was written
//   53  the file is UTF-16 or UTF-32
// A file that cannot be read is not written either.
class TESSEL_API BMINIConfigOperations final : public ConfigOperationsInterface, public TrackedObject {
public:
    // Touches no file. Raises OVExcept: the error of making a name of the path (1, when it has no names); 2.
    BMINIConfigOperations(const PathRef& file, const std::string& section);
    ~BMINIConfigOperations() override;
    BMINIConfigOperations(const BMINIConfigOperations&) = delete;
    BMINIConfigOperations& operator=(const BMINIConfigOperations&) = delete;

    using ConfigOperationsInterface::GetKeyNames;
    using ConfigOperationsInterface::GetValue;
    using ConfigOperationsInterface::HasKey;
    using ConfigOperationsInterface::RemoveKey;
    using ConfigOperationsInterface::SetValue;

    const std::string& GetSectionName() const override;
    void SetSectionName(const std::string& section) override;
    // A file that is not there has no keys: 20.
    MgErr GetValue(const std::string& section, const std::string& key, std::string* value) override;
    // Makes the file, and the folders on the way to it, when they are missing. Raises OVExcept when a folder cannot be
    // made, with the file manager's error; the change stays in memory.
    MgErr SetValue(const std::string& section, const std::string& key, const std::string& value) override;
    // kNoErr also when there is no such key or file. The comment lines before the key stay.
    MgErr RemoveKey(const std::string& section, const std::string& key) override;
    bool HasKey(const std::string& section, const std::string& key) override;
    // In the order of the file. None, and kNoErr, when there is no such section or file.
    MgErr GetSectionNames(std::vector<std::string>* names) override;
    MgErr GetKeyNames(const std::string& section, std::vector<std::string>* names) override;

private:
    class Store;
    std::unique_ptr<Store> store_;
};

// Values in memory, under section + "." + key, or the key alone when the section is empty. A section may be empty, a
// key may not. Names compare exactly, and are listed in the order of their bytes; values are kept exactly as given.
class TESSEL_API MemoryMapConfigOperations final : public ConfigOperationsInterface, public TrackedObject {
public:
    // Raises OVExcept when there is no memory.
    explicit MemoryMapConfigOperations(const std::string& section);
    ~MemoryMapConfigOperations() override;
    MemoryMapConfigOperations(const MemoryMapConfigOperations&) = delete;
    MemoryMapConfigOperations& operator=(const MemoryMapConfigOperations&) = delete;

    using ConfigOperationsInterface::GetKeyNames;
    using ConfigOperationsInterface::GetValue;
    using ConfigOperationsInterface::HasKey;
    using ConfigOperationsInterface::RemoveKey;
    using ConfigOperationsInterface::SetValue;

    // All return kMemFullErr (2) when there is no memory; HasKey raises it.
    const std::string& GetSectionName() const override;
    void SetSectionName(const std::string& section) override;
    MgErr GetValue(const std::string& section, const std::string& key, std::string* value) override;
    MgErr SetValue(const std::string& section, const std::string& key, const std::string& value) override;
    // kConfigKeyErr (20) when there is no such key.
    MgErr RemoveKey(const std::string& section, const std::string& key) override;
    bool HasKey(const std::string& section, const std::string& key) override;
    // The text before the first "." of every entry that has one: a section once for each of its keys.
    MgErr GetSectionNames(std::vector<std::string>* names) override;
    // The text after the first "." of every entry whose text before it is the section; with an empty section, the
    // entries without a ".".
    MgErr GetKeyNames(const std::string& section, std::vector<std::string>* names) override;

    // Every entry as it is kept: section + "." + key, or the key alone.
    MgErr GetAllKeyNames(std::vector<std::string>* names);

private:
    class Store;
    std::unique_ptr<Store> store_;
};

}  // namespace tessel
#endif

#endif
