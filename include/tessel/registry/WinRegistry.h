// The settings registry: keys that hold keys and values, under seven roots.
//
//   root->OpenSubKey("SOFTWARE\\Maker\\Product", key.Out())      then      key->GetStringValue("Path")
//
// Names ignore case. An operation that returns an MgErr returns kNoErr, kArgErr (a missing argument), kMemFullErr or
// kRegistryErr (the registry refused); why it failed is the platform's number in GetLastError (87, 14, 2 not found, 5
// access denied, 6 closed ...), which is 0 after success. Where it is said, an operation raises an OVExcept.
//
// Text and data that a key returns lie in the key's value buffer: valid until the next read on that key. Null stands
// for no value. A null or empty value name is the key's unnamed value. The uint8 forms take the same names and texts as
// bytes.
//
// Every change is atomic and durable: whenever the process is killed or the power fails, a key or a value is there as
// it was or as it was to be, and what was reported done is on the device; one that failed changed nothing. Changes of
// all programs wait for each other, for ten seconds at most (1460). A store that has vanished is an error (1018), not
// one without values.
//
// TESSEL_REGISTRY names the folder that holds all, by an absolute name. With a relative one there is no registry: it is
// reported once, when a root is first asked for, and every operation fails with 6.
//
// A key is for one thread at a time, and may be released before what was made from it. The roots may be used by any
// thread to open and create keys.
#ifndef TESSEL_REGISTRY_WINREGISTRY_H
#define TESSEL_REGISTRY_WINREGISTRY_H

#include <tessel/base/MgErr.h>
#include <tessel/base/Types.h>

// Views of the registry: two stores beside each other.
#define kRegistryViewDefault ((uint32)0)
#define kRegistryViewOf64Bit ((uint32)0x100)

// Types of values, as the registry defines them.
enum {
    kRegistryTypeNone = 0,
    kRegistryTypeString = 1,
    kRegistryTypeExpandString = 2,  // with references to environment variables, %NAME%
    kRegistryTypeBinary = 3,
    kRegistryTypeInt32 = 4,
    kRegistryTypeInt32BigEndian = 5,
    kRegistryTypeLink = 6,
    kRegistryTypeMultiString = 7,  // zero-terminated texts, and an empty one behind the last
    kRegistryTypeInt64 = 11
};

#ifdef __cplusplus

namespace tessel {

// A value as it was when it was read. The texts and the data live as long as the object.
class TESSEL_API IWinRegistryValue {
public:
    virtual ~IWinRegistryValue() = default;
    // The value's name; empty for the unnamed one.
    virtual CStr GetName() = 0;
    // The data; null when the value could not be read.
    virtual const void* GetData() = 0;
    // Bytes of data.
    virtual uint32 GetSize() = 0;
    // The type (kRegistryType...).
    virtual uint32 GetType() = 0;
    // The system's error of the read; 0: none.
    virtual uint32 GetLastError() = 0;
    // The text of type 1; of type 2 with the references to environment variables expanded, once; null for other types.
    // Raises kRegistryErr or kGenericErr when it cannot be expanded.
    virtual CStr GetString() = 0;
    // Destroys it. Only for the owner: the current value of an enumeration belongs to the enumeration.
    virtual void Release() = 0;
};

class IWinRegistryKey;

// Walks over the subkeys of a key. Stands before the first one at first.
class TESSEL_API IWinRegistryKeyEnumeration {
public:
    virtual ~IWinRegistryKeyEnumeration() = default;
    // The system's error of the last step; 0: none.
    virtual uint32 GetLastError() = 0;
    // The current subkey, open for reading; null before the first and behind the last. Valid until MoveNext or
    // Release.
    virtual IWinRegistryKey* GetCurrent() = 0;
    // False behind the last (then GetLastError is 259) and on an error.
    virtual bool MoveNext() = 0;
    // Destroys the enumeration and its current subkey.
    virtual void Release() = 0;
};

// Walks over the values of a key. Stands before the first one at first.
class TESSEL_API IWinRegistryValueEnumeration {
public:
    virtual ~IWinRegistryValueEnumeration() = default;
    // The system's error of the last step; 0: none.
    virtual uint32 GetLastError() = 0;
    // The current value; null before the first and behind the last. Valid until MoveNext or Release.
    virtual IWinRegistryValue* GetCurrent() = 0;
    // False behind the last (then GetLastError is 259) and on an error.
    virtual bool MoveNext() = 0;
    // Destroys the enumeration and its current value.
    virtual void Release() = 0;
};

// A key of the registry: subkeys and values under names.
class TESSEL_API IWinRegistryKey {
public:
    virtual ~IWinRegistryKey() = default;

    // Whether the key is open.
    virtual bool IsOpen() = 0;
    // The last element of its path.
    virtual CStr GetName() = 0;
    // The whole path, from the root's name on, with backslashes.
    virtual CStr GetFullName() = 0;
    // How many subkeys there are; -1 on failure.
    virtual int32 GetSubKeyCount() = 0;
    // How many values there are; -1 on failure.
    virtual int32 GetValueCount() = 0;
    // The system's error of the last operation on this key.
    virtual uint32 GetLastError() = 0;

    // Opens a key below this one, `name` being one name or several with backslashes between them: for reading and
    // writing when writeAccess is positive, else for reading. The caller releases *key; null on failure.
    virtual MgErr OpenSubKey(const uint8* name, int32 writeAccess, IWinRegistryKey** key) = 0;
    // The same for a CStr.
    virtual MgErr OpenSubKey(CStr name, int32 writeAccess, IWinRegistryKey** key) = 0;
    // Opens a key below this one for reading.
    virtual MgErr OpenSubKey(const uint8* name, IWinRegistryKey** key) = 0;
    // The same for a CStr.
    virtual MgErr OpenSubKey(CStr name, IWinRegistryKey** key) = 0;

    // Whether there is a key below this one of that name.
    virtual bool SubKeyExists(const uint8* name) = 0;
    // The same for a CStr.
    virtual bool SubKeyExists(CStr name) = 0;

    // Opens a key below this one for reading and writing, and makes what is missing. The caller releases *key.
    virtual MgErr CreateSubKey(const uint8* name, IWinRegistryKey** key) = 0;
    // The same for a CStr.
    virtual MgErr CreateSubKey(CStr name, IWinRegistryKey** key) = 0;

    // The caller releases *enumeration.
    // Begins a walk over the subkeys. The caller releases *enumeration.
    virtual MgErr EnumerateSubKeys(IWinRegistryKeyEnumeration** enumeration) = 0;
    // Begins a walk over the values. The caller releases *enumeration.
    virtual MgErr EnumerateValues(IWinRegistryValueEnumeration** enumeration) = 0;

    // The text of a string value; one of type 2 with the references to environment variables expanded. Null when there
    // is no such value. Raises kRegistryTypeErr for a value of another type, kRegistryErr when it cannot be read or
    // expanded, kGenericErr when the expanded text is longer than 1 MiB.
    virtual CStr GetStringValue(const uint8* name) = 0;
    // The same for a CStr.
    virtual CStr GetStringValue(CStr name) = 0;
    // The text of the unnamed value; null when there is none.
    virtual CStr GetDefaultStringValue() = 0;

    // The raw data, its type and size (each output may be null). Null and zeros when there is no such value. Raises
    // kRegistryErr when it cannot be read. A value of size 0 is not null.
    virtual const void* QueryValue(const uint8* name, uint32* type, uint32* size) = 0;
    // The same for a CStr.
    virtual const void* QueryValue(CStr name, uint32* type, uint32* size) = 0;

    // Stores a string (type 1) with its terminating zero.
    virtual MgErr SetStringValue(const uint8* name, const uint8* text) = 0;
    // The same for a CStr text.
    virtual MgErr SetStringValue(const uint8* name, CStr text) = 0;
    // The same for a CStr name.
    virtual MgErr SetStringValue(CStr name, const uint8* text) = 0;
    // The same for CStrs.
    virtual MgErr SetStringValue(CStr name, CStr text) = 0;
    // Stores the unnamed string.
    virtual MgErr SetDefaultStringValue(const uint8* text) = 0;
    // The same for a CStr.
    virtual MgErr SetDefaultStringValue(CStr text) = 0;

    // Stores the unnamed string of a subkey, which is made when it is missing.
    virtual MgErr SetSubKeyDefaultValue(const uint8* subKey, const uint8* text) = 0;
    // The same for a CStr text.
    virtual MgErr SetSubKeyDefaultValue(const uint8* subKey, CStr text) = 0;
    // The same for a CStr subkey.
    virtual MgErr SetSubKeyDefaultValue(CStr subKey, const uint8* text) = 0;
    // The same for CStrs.
    virtual MgErr SetSubKeyDefaultValue(CStr subKey, CStr text) = 0;

    // Stores raw data of any type, at most 64 MiB of it (87 for more). Null data: nothing, when the size is 0.
    virtual MgErr SetValue(const uint8* name, uint32 type, const void* data, uint32 size) = 0;
    // The same for a CStr.
    virtual MgErr SetValue(CStr name, uint32 type, const void* data, uint32 size) = 0;

    // Deletes a subkey and everything below it, at once; nothing of it when one of the keys may not be deleted.
    virtual MgErr DeleteSubKey(const uint8* name) = 0;
    // The same for a CStr.
    virtual MgErr DeleteSubKey(CStr name) = 0;

    // Puts what the key holds onto the device, whoever wrote it.
    virtual MgErr Flush() = 0;
    // Later operations fail with 6. Roots stay open.
    virtual MgErr Close() = 0;
    // Closes and destroys the key. Nothing for a root.
    virtual void Release() = 0;
};

// The roots, each in the view given (0 or 0x100; any other is reported and gives null). Made on first use, once a
// process; the library's. Any thread.
TESSEL_API IWinRegistryKey* GetClassesRootRegistryKey(uint32 view);
// The root of the configuration in use.
TESSEL_API IWinRegistryKey* GetCurrentConfigRegistryKey(uint32 view);
// The root of the user's own settings.
TESSEL_API IWinRegistryKey* GetCurrentUserRegistryKey(uint32 view);
// The root of dynamic data.
TESSEL_API IWinRegistryKey* GetDynDataRegistryKey(uint32 view);
// The root of the machine's settings.
TESSEL_API IWinRegistryKey* GetLocalMachineRegistryKey(uint32 view);
// The root of performance data.
TESSEL_API IWinRegistryKey* GetPerformanceDataRegistryKey(uint32 view);
// The root of all users' settings.
TESSEL_API IWinRegistryKey* GetUsersRegistryKey(uint32 view);

// Ends an object by its own release operation.
struct ReleaseDeletor {
    // Releases the object, which must not be null.
    template <class T>
    // Releases the object.
    void operator()(T* object) const {
        object->Release();
    }
};

// Owns an object (or none) and ends it, at the end of a scope at the latest, by a deletor.
template <class T, class Deletor>
class AutoDeletor {
public:
    // Takes an object over; null owns none.
    explicit AutoDeletor(T* object = nullptr) : object_(object) {}
    ~AutoDeletor() { Reset(nullptr); }
    AutoDeletor(const AutoDeletor&) = delete;
    AutoDeletor& operator=(const AutoDeletor&) = delete;

    // The object, or null.
    T* Get() const { return object_; }
    // The object, which must not be null.
    T* operator->() const { return object_; }
    // The object, which must not be null.
    T& operator*() const { return *object_; }
    // Whether it owns an object.
    explicit operator bool() const { return object_ != nullptr; }

    // For an out-parameter. Ends what is owned first.
    T** Out() {
        Reset(nullptr);
        return &object_;
    }
    // Gives the object up to the caller.
    T* Detach() {
        T* object = object_;
        object_ = nullptr;
        return object;
    }
    // Ends what is owned, and takes another object over; null owns none.
    void Reset(T* object) {
        T* old = object_;
        object_ = object;
        if (old) Deletor()(old);
    }

private:
    T* object_;
};

// Owns an object that ends by its own release operation.
template <class T>
using AutoRelease = AutoDeletor<T, ReleaseDeletor>;

}  // namespace tessel

#endif
#endif
