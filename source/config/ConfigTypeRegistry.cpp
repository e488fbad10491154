// The table of the types of settings.
#include "diagnostics/Guarded.h"
#include <tessel/config/ConfigTypeRegistry.h>
#include <tessel/memory/TrackedMallocFree.h>
#include <tessel/sync/ThMutex.h>

#include <functional>
#include <map>
#include <memory>

namespace tessel {
namespace {

struct Converters {
    ConfigFromTextProc fromText = nullptr;
    ConfigToTextProc toText = nullptr;
};

struct TypeTable : TrackedObject {
    ~TypeTable() { ThMutexDestroy(mutex); }

    ThMutex mutex = nullptr;  // guards the types
    std::map<int32, Converters, std::less<int32>, TrackedAllocator<std::pair<const int32, Converters>>> types;
};

// Made and destroyed by start and stop, when no other thread looks.
TypeTable* theTable = nullptr;

MgErr Find(int32 type, Converters* found) {
    if (!theTable) return kGenericErr;
    ThMutexHolder holder(theTable->mutex);
    auto entry = theTable->types.find(type);
    if (entry == theTable->types.end()) return kConfigTypeErr;
    *found = entry->second;
    return kNoErr;
}

}  // namespace
}  // namespace tessel

using namespace tessel;

MgErr InitConfigTypeRegistry() {
    if (theTable) return kGenericErr;
    return Guarded([] {
        auto table = std::make_unique<TypeTable>();
        if (MgErr err = ThMutexCreate(&table->mutex, "ConfigTypeRegistryMutex")) return err;
        theTable = table.release();
        return kNoErr;
    });
}

MgErr UninitConfigTypeRegistry() {
    if (!theTable) return kGenericErr;
    delete std::exchange(theTable, nullptr);
    return kNoErr;
}

MgErr RegisterConfigType(int32 type, ConfigFromTextProc fromText, ConfigToTextProc toText) {
    if (!theTable) return kGenericErr;
    if (!fromText || !toText) return kArgErr;
    return Guarded([&] {
        ThMutexHolder holder(theTable->mutex);
        return theTable->types.try_emplace(type, Converters{fromText, toText}).second ? kNoErr : kGenericErr;
    });
}

MgErr UnregisterConfigType(int32 type) {
    if (!theTable) return kGenericErr;
    ThMutexHolder holder(theTable->mutex);
    return theTable->types.erase(type) ? kNoErr : kConfigTypeErr;
}

MgErr ConfigTypeFromString(int32 type, const char* text, int32 length, void* value) {
    if (length < 0 || (!text && length)) return kArgErr;
    Converters converters;
    if (MgErr err = Find(type, &converters)) return err;
    return converters.fromText(text ? text : "", length, value);
}

MgErr ConfigTypeToString(int32 type, const void* value, LStrHandle* text) {
    if (!text) return kArgErr;
    Converters converters;
    if (MgErr err = Find(type, &converters)) return err;
    return converters.toText(value, text);
}
