// The registry: keys that hold keys and typed values.
//
// A folder a key, a file a value, under TESSEL_REGISTRY (not set: $XDG_CONFIG_HOME/tessel/registry). Names ignore case.
//
// Every change is atomic and durable: a reader, in whatever process, sees what was there before or what is there now,
// whole, also after the process was killed or the power failed, and once a change has returned 0 it stays. One that
// fails leaves what was there before. Changes wait for each other; 1460 when another program does not come to its end
// in 10 seconds (it was stopped), 5 and others when the store's lock cannot be opened. Where the file system has no
// locks, nobody waits.
//
// Functions return an error number, 0 for success, and do not touch LastError. What is done to a key returns 1018 once
// somebody has deleted it, or the store has vanished. They may throw std::bad_alloc. A key is for one thread at a time;
// different keys for any.
#ifndef TESSEL_PLATFORM_REGISTRY_H
#define TESSEL_PLATFORM_REGISTRY_H

#include "platform/LastError.h"

#include <cstddef>
#include <cstdint>
#include <string>

namespace tessel::platform {

enum class RegistryRoot {
    kClassesRoot,
    kCurrentConfig,
    kCurrentUser,
    kDynData,
    kLocalMachine,
    kPerformanceData,
    kUsers
};

// The two views of the registry are two stores.
constexpr std::uint32_t kRegistryDefaultView = 0;
constexpr std::uint32_t kRegistryView64 = 0x100;

struct RegistryKey;

// Opens a root, which is always there. 123 where TESSEL_REGISTRY is no absolute name. Close it like any other.
ErrorNumber RegistryOpenRoot(RegistryRoot root, std::uint32_t view, RegistryKey*& key);

// `path` is relative to `parent`: names with `\` between them; empty opens the parent again. 2 when it is missing, 5
// when it may not be written and `write` asks for it.
ErrorNumber RegistryOpen(const RegistryKey* parent, const char* path, bool write, RegistryKey*& key);

// Opens with write access, and makes what is missing, one key after the other. After a failure a key that was made may
// be there.
ErrorNumber RegistryCreate(const RegistryKey* parent, const char* path, RegistryKey*& key);

ErrorNumber RegistryClose(RegistryKey* key);

// Deletes the key at `path`, with its values and all below, at once.
ErrorNumber RegistryDelete(const RegistryKey* parent, const char* path);

ErrorNumber RegistryCounts(const RegistryKey* key, std::uint32_t& subKeys, std::uint32_t& values);

// Name of the subkey, or the value, at an index of their sorted order. 259 behind the last.
ErrorNumber RegistryEnumerateKey(const RegistryKey* key, std::uint32_t index, std::string& name);
ErrorNumber RegistryEnumerateValue(const RegistryKey* key, std::uint32_t index, std::string& name);

// A null or empty name is the key's unnamed value. 2 when there is none, 1015 when what is stored is none. `data` is
// the raw bytes. Setting: 87 for more bytes than a value may have.
constexpr std::size_t kLargestRegistryValue = 64 * 1024 * 1024;
ErrorNumber RegistryQueryValue(const RegistryKey* key, const char* name, std::uint32_t& type, std::string& data);
ErrorNumber RegistrySetValue(const RegistryKey* key, const char* name, std::uint32_t type, const void* data,
                             std::size_t size);  // 5 without write access
ErrorNumber RegistryDeleteValue(const RegistryKey* key, const char* name);

// Puts the key onto the device, with what others have put into it.
ErrorNumber RegistryFlush(const RegistryKey* key);

}  // namespace tessel::platform

#endif
