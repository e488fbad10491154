// Settings: typed values under a key, kept as text in the host's section of a preference file.
//
//     int32 depth = 8;                                                 // stays 8 when the file has no such key
//     CfgGetDefault(kConfigI32, (ConstPStr) "\5depth", &depth);
//     CfgWrite(kConfigI32, (ConstPStr) "\5depth", &depth);             // is in the file when it returns
//
// The types, and what the pointer to a value of each is, are in config/ConfigCoreTypes.h.
//
// The main preference file is the one that SetPrefsPath names, else the one behind "-pref" on the host's command line,
// else PreferenceBaseName() + ".ini" of the application interface, in the application's folder. The text is that of
// this library (C:\dir\name.ini) or of the host system (/dir/name.ini; a relative one starts at the current directory);
// one that names no file is reported, and the third holds. The section in it: PreferenceBaseName() in a built
// application, else ApplicationAltName() + "RT" in a run-time engine, + "FFRT" in the full-feature one, else
// ApplicationName(). Without an application interface all of these are empty: then there are no settings, and to write
// one is kArgErr.
//
// A manager has a second store, in memory, whose entries shadow those of the file. Its keys compare exactly; those of
// the file without regard to case. Both live as long as the manager.
//
// Any thread between start and stop of the configuration; a manager that is held lives on after it, without types.
#ifndef TESSEL_CONFIG_CONFIGMANAGER_H
#define TESSEL_CONFIG_CONFIGMANAGER_H

#include <tessel/base/MgErr.h>
#include <tessel/base/StringTypes.h>

TESSEL_BEGIN_C

// ---- the main preference file ---------------------------------------------------------------------------------------
// All return kGenericErr when there is no main manager. Keys are PStrs; null is empty.

// Reads the value of a key; it stays as it is on failure. kConfigKeyErr: there is none, kArgErr: the key is empty or
// there is no output, kConfigTypeErr: no such type, kConfigTextErr: the text is none of the type, kConfigMemErr; else
// why the file could not be read.
TESSEL_API MgErr CfgGetDefault(int32 type, ConstPStr key, void* value);

// Writes the value, to the file. The change is saved when it returns: see config/ConfigOperations.h.
TESSEL_API MgErr CfgWrite(int32 type, ConstPStr key, const void* value);

// Removes the key from the file. One that is not there is no error.
TESSEL_API MgErr CfgRemove(int32 type, ConstPStr key);

// The path of the file, and the name of the section: made when they are null, the caller's.
TESSEL_API MgErr CfgGetPrefFilePath(Path* path);
// The name of the section in it, made when it is null; the caller's.
TESSEL_API MgErr CfgGetHostPrefsSection(LStrHandle* section);

// As CfgGetDefault, from the host's section of another preference file. kArgErr: the path is none of a file.
TESSEL_API MgErr CfgGetDefaultFrom(Path file, int32 type, ConstPStr key, void* value);

// ---- names of preference files --------------------------------------------------------------------------------------

// The text up to its last "." (unless it begins with that one), and ".ini". The buffer may hold the text itself, and
// must take 5 bytes more; `size` is not looked at. kArgErr for null.
TESSEL_API MgErr GetConfigPath(CStr text, char* buffer, int32 size);

// The name of a file of another version of a product: the string "Path" of the registry key
// SOFTWARE\BRENMOOR\<product>\<version> below the local machine, followed by the file name, changed by GetConfigPath.
// The buffer takes 260 bytes and is empty on failure. kRegistryErr: there is no such key; the system's error, 2 for a
// key without "Path"; kRegistryTypeErr: it is no string; kArgErr: null, or the name does not fit.
TESSEL_API MgErr CfgGetPathToPreviousVersion(CStr product, CStr version, CStr fileName, char* buffer);

TESSEL_END_C

#ifdef __cplusplus
#    include <tessel/config/ConfigOperations.h>
#    include <tessel/memory/TrackedMallocFree.h>
#    include <tessel/paths/PathRef.h>

#    include <atomic>
#    include <string>

namespace tessel {

// The settings of one preference file. Made with new, with one reference; the last RemoveRef destroys it.
//
// Keys are given without the white space around them, and an empty one is kArgErr. What an operation returns when it
// could not do its work is the code of the cause; it raises nothing.
class TESSEL_API ConfigManager : public TrackedObject {
public:
    // A key that the application knows. Reading, writing and removing others is reported, and done.
    struct KnownToken {
        CStr name;
    };

    // For a path that is none of a file, the default preference file. Raises OVExcept. The functions below refuse such
    // a path.
    explicit ConfigManager(const PathRef& file);
    ConfigManager(const ConfigManager&) = delete;
    ConfigManager& operator=(const ConfigManager&) = delete;

    // The slots and their order are fixed.
    virtual ~ConfigManager();
    // One reference more; how many there are.
    virtual int32 AddRef();
    // One reference less; how many are left.
    virtual int32 RemoveRef();

    // From memory, else from the file. As CfgGetDefault.
    virtual MgErr GetDefault(int32 type, const std::string& key, void* value);
    // The same for a PStr key.
    virtual MgErr GetDefault(int32 type, ConstPStr key, void* value);

    // With `inMemory` into memory only; else into the file, and into memory too where the key is there, which is
    // reported.
    virtual MgErr Write(int32 type, const std::string& key, const void* value, bool inMemory);
    // The same for a PStr key.
    virtual MgErr Write(int32 type, ConstPStr key, const void* value, bool inMemory);

    // With `inMemory` from memory only; else from the file, and from memory too, which is reported. A key that is not
    // there is no error.
    virtual MgErr Remove(int32 type, const std::string& key, bool inMemory);
    // The same for a PStr key.
    virtual MgErr Remove(int32 type, ConstPStr key, bool inMemory);

    // Made when they are null; the caller's.
    virtual MgErr GetPrefFilePath(Path* path);
    // The name of the section, made when it is null; the caller's.
    virtual MgErr GetHostPrefsSection(LStrHandle* section);

    // The section that is used from now on. Not while another thread uses the manager.
    virtual MgErr UpdateSectionHeader(const std::string& section);

    // All keys of the memory store and their texts, in the order of their bytes: as many elements in both arrays, which
    // replace those given and are the caller's; null when there are none.
    virtual MgErr GetInMemoryConfigList(LStrArrayHandle* keys, LStrArrayHandle* values, int32* count);

    // As ConfigTypeFromString and ConfigTypeToString. One pair of double quotes belongs to the text here.
    virtual MgErr ValueFromString(int32 type, const std::string& text, void* value);
    // The text of a value, as ConfigTypeToString.
    virtual MgErr ValueToString(int32 type, const void* value, std::string* text);

    // Whether the key is known. One that is not is reported.
    virtual bool ValidateTokenName(const std::string& key);

    // Installs the table of known keys, which the caller keeps; without one all are known. kArgErr for a count without
    // a table. Before other threads use the manager.
    MgErr SetKnownTokens(const KnownToken* tokens, int32 count);

private:
    std::string TokenName(const std::string& key);
    void RemoveEverywhere(const std::string& name, bool inMemory);
    void WriteText(const std::string& name, const std::string& text, bool inMemory);

    PathRef path_;
    const KnownToken* tokens_ = nullptr;
    int32 tokenCount_ = 0;
    std::atomic<int32> references_{1};
    BMINIConfigOperations file_;
    MemoryMapConfigOperations memory_;
};

// The manager of the main preference file; null outside start and stop. To keep it, AddRef.
TESSEL_API ConfigManager* GetMainCfgAccess();

// A new manager for another preference file. The caller lets it go with RemoveRef; *manager is null on failure. The
// first raises OVExcept kArgErr, "Not a Valid path to a preference file.", for a path that is none of a file.
TESSEL_API void ConstructCfgAccessPathRef(const PathRef& file, ConfigManager** manager);
// The same without raising; kArgErr for a null, relative or nameless path and for null.
TESSEL_API MgErr ConstructCfgAccess(Path file, ConfigManager** manager);
// The same for text, of this library or of the host system. kArgErr for null; raises OVExcept with the code of any
// other failure, "Error constructing Config Manager".
TESSEL_API MgErr ConstructCfgAccessCStr(CStr file, ConfigManager** manager);

}  // namespace tessel
#endif

#endif
