// The extensions of names, and the lists that say which file type has which extension.
#include "diagnostics/Guarded.h"
#include "paths/PathProcess.h"
#include "paths/PathRefAccess.h"
#include <tessel/base/OVExcept.h>
#include <tessel/memory/MemoryManager.h>
#include <tessel/strings/StringUtils.h>

#include <cstring>

namespace tessel {
namespace {

using Entry = PathRef::ExtensionEntry;

// The primary and the secondary list, searched in this order. Set during start-up.
const PathRef::ExtensionList** extensionLists[2] = {};

// Entries of a list that its handle really holds.
int32 EntryCount(const PathRef::ExtensionList** list) {
    if (!list) return 0;
    constexpr uint32 kHeader = offsetof(PathRef::ExtensionList, entries);
    const uint32 size = DSGetHandleSize(reinterpret_cast<UHandle>(const_cast<PathRef::ExtensionList**>(list)));
    const int32 room = size < kHeader ? 0 : static_cast<int32>((size - kHeader) / sizeof(Entry));
    return (*list)->count < room ? (*list)->count : room;
}

std::string ExtensionOf(const Entry& entry) {
    return std::string(entry.extension, strnlen(entry.extension, sizeof entry.extension));
}

// The first entry that fits, or null.
template <class Predicate>
const Entry* FindEntry(Predicate fits) {
    for (const PathRef::ExtensionList** list : extensionLists) {
        const int32 count = EntryCount(list);
        for (int32 i = 0; i < count; ++i)
            if (fits((*list)->entries[i])) return &(*list)->entries[i];
    }
    return nullptr;
}

void ReleaseList(const PathRef::ExtensionList**& list) {
    if (list) DSDisposeHandle(reinterpret_cast<UHandle>(const_cast<PathRef::ExtensionList**>(list)));
    list = nullptr;
}

}  // namespace

void PathRef::SetExtensionList(const ExtensionList** primary, const ExtensionList** secondary) {
    if (extensionLists[0] || extensionLists[1]) {
        TESSEL_REPORT(kDebugWarning, 0xB7C21E94u) << "The extension lists should only be set once";
        ReleaseExtensionLists();
    }
    extensionLists[0] = primary;
    extensionLists[1] = secondary;
}

void ReleaseExtensionLists() {
    for (const PathRef::ExtensionList**& list : extensionLists) ReleaseList(list);
}

// ---- names by themselves --------------------------------------------------------------------------------------------
// A dot is never part of a longer character, so that it can be searched for as a byte.

PathRef::StringType PathRef::NameGetExtension(const StringType& name) {
    const size_t dot = name.rfind('.');
    return dot == StringType::npos ? StringType() : name.substr(dot + 1);
}

void PathRef::NameRemoveExtension(StringType* name) {
    if (!name) return;
    const size_t dot = name->rfind('.');
    if (dot != StringType::npos) name->erase(dot);
}

MgErr PathRef::NameAppendExtension(StringType* name, const StringType& extension) {
    if (!name) return kArgErr;
    return Guarded([&] {
        name->reserve(name->size() + 1 + extension.size());
        name->append(1, '.').append(extension);
        return kNoErr;
    });
}

MgErr PathRef::NameAppendExtension(StringType* name, _FMFileType type) {
    const Entry* entry = FindEntry([&](const Entry& candidate) { return candidate.type == type; });
    if (!entry) return kArgErr;
    return Guarded([&] { return NameAppendExtension(name, ExtensionOf(*entry)); });
}

_FMFileType PathRef::NameGetExtensionType(const StringType& name) {
    if (name.find('.') == StringType::npos) return 0;
    const StringType extension = NameGetExtension(name);
    const Entry* entry = FindEntry(
        [&](const Entry& candidate) { return StringUtils::CaseInsensitiveEqual(ExtensionOf(candidate), extension); });
    return entry ? entry->type : 0;
}

bool PathRef::NameHasExtension(const StringType& name, _FMFileType type) {
    if (name.find('.') == StringType::npos) return false;
    const StringType extension = NameGetExtension(name);
    return FindEntry([&](const Entry& candidate) {
               return candidate.type == type && StringUtils::CaseInsensitiveEqual(ExtensionOf(candidate), extension);
           }) != nullptr;
}

// ---- the last name of a path ----------------------------------------------------------------------------------------

MgErr PathRef::CopyExtension(StringType* extension) const {
    if (!extension || ItemCount() == 0) return kArgErr;
    return Guarded([&] {
        *extension = NameGetExtension(mPathElement->Name());
        return kNoErr;
    });
}

PathRef::StringType PathRef::GetExtension() const {
    StringType extension;
    const MgErr err = CopyExtension(&extension);
    if (err) TESSEL_THROW(err, "PathRef CopyExtension");
    return extension;
}

const PathRef::StringType& PathRef::Extension() {
    StringType& text = TextCache();
    const MgErr err = CopyExtension(&text);
    if (err) TESSEL_THROW(err, "PathRef Extension");
    return text;
}

void PathRef::AppendExtension(const StringType& extension) {
    if (ItemCount() == 0) TESSEL_THROW(kArgErr, "PathRef AppendExtension");
    StringType name = mPathElement->Name();
    const MgErr err = NameAppendExtension(&name, extension);
    if (err) TESSEL_THROW(err, "PathRef AppendExtension");
    Replace(-1, name);
}

void PathRef::AppendExtension(_FMFileType type) {
    if (ItemCount() == 0) TESSEL_THROW(kArgErr, "PathRef AppendExtension");
    StringType name = mPathElement->Name();
    const MgErr err = NameAppendExtension(&name, type);
    if (err) TESSEL_THROW(err, "PathRef AppendExtension");
    Replace(-1, name);
}

void PathRef::RemoveExtension() {
    if (ItemCount() == 0) TESSEL_THROW(kArgErr, "PathRef RemoveExtension");
    StringType name = mPathElement->Name();
    NameRemoveExtension(&name);
    if (name.empty()) TESSEL_THROW(kArgErr, "PathRef RemoveExtension");
    if (name != mPathElement->Name()) Replace(-1, name);
}

}  // namespace tessel
