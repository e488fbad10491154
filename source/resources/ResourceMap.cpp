#include "resources/ResourceMap.h"

#include "resources/UncheckedMap.h"
#include <tessel/memory/MemoryManager.h>
#include <tessel/resources/ResourceManager.h>

#include <algorithm>
#include <cstring>
#include <limits>

namespace tessel {

namespace {

uint32 NameSize(ConstPStr name) {
    return name && name[0] ? name[0] + 1u : 0;
}

ResourceEntry NewEntry(int32 id, int32 name) {
    return {id, name, kRChangedAttr, 0, 0};
}

bool LessID(const ResourceEntry& a, const ResourceEntry& b) {
    return a.id < b.id;
}

}  // namespace

void ResourceMap::Dispose() {
    if (handle_) DSDisposeHandle(handle_);
    handle_ = nullptr;
    size_ = 0;
}

// ---- coming and going -----------------------------------------------------------------------------------------------

MgErr ResourceMap::MakeEmpty(const RsrcHeader& header) {
    handle_ = DSNewHClr(kEmptyMapSize);
    if (!handle_) return kMemFullErr;
    size_ = kEmptyMapSize;
    Head()->header = header;
    MakeBlank();
    return kNoErr;
}

// Keeps what is not about resources.
void ResourceMap::MakeBlank() {
    RsrcMap* head = Head();
    head->header.mapOffset = kHeaderSize;
    head->header.mapLength = 0;
    head->header.dataOffset = kHeaderSize;
    head->header.dataLength = 0;
    head->typeList = kEmptyMapSize;
    head->nameList = 0;
}

MgErr ResourceMap::FromDisk(UHandle bytes, const RsrcHeader& header) {
    handle_ = bytes;
    size_ = DSGetHandleSize(bytes);
    const uint32 mapLength = size_;
    if (size_ < kEmptyMapSize) {
        if (const MgErr err = DSSetHSzClr(bytes, kEmptyMapSize)) return err;
        size_ = kEmptyMapSize;
    }
    const MgErr err = StandardizeAndSanityChkRsrcMap(*bytes, size_, MapDirection::kFromDisk, header);
    if (err) return err;
    Head()->header = header;
    if (mapLength <= kEmptyMapSize || TypeCount() == 0) {
        MakeBlank();
        Shrink(kEmptyMapSize);
        return kNoErr;
    }
    for (int32 i = 0; i < TypeCount(); ++i) {
        ResourceEntry* entries = Entries(TypeAt(i));
        for (int32 k = 0; k < CountOf(TypeAt(i)); ++k) entries[k].loaded = 0;
    }
    return kNoErr;
}

MgErr ResourceMap::CopyOf(const ResourceMap& other) {
    size_ = other.size_;
    return DSPtrToHand(*other.handle_, &handle_, size_);
}

void ResourceMap::SetLayout(uint32 dataLength) {
    RsrcHeader& header = Head()->header;
    const bool empty = IsEmpty();
    header.dataOffset = kHeaderSize;
    header.dataLength = dataLength;
    header.mapOffset = kHeaderSize + dataLength;
    header.mapLength = empty ? 0 : size_;
}

void ResourceMap::ToDisk(uint8* bytes) const {
    std::memcpy(bytes, *handle_, size_);
    const uint8* start = *handle_;
    for (int32 i = 0, types = TypeCount(); i < types; ++i) {
        const ResourceEntry* entries = Entries(TypeAt(i));
        auto* copies = reinterpret_cast<ResourceEntry*>(bytes + (reinterpret_cast<const uint8*>(entries) - start));
        for (int32 k = 0, count = CountOf(TypeAt(i)); k < count; ++k) copies[k].loaded = 0;
    }
    StandardizeAndSanityChkRsrcMap(bytes, size_, MapDirection::kToDisk, Head()->header);
}

void ResourceMap::Sort() {
    for (int32 i = 0, types = TypeCount(); i < types; ++i) {
        ResourceEntry* first = Entries(TypeAt(i));
        ResourceEntry* last = first + CountOf(TypeAt(i));
        if (!std::is_sorted(first, last, LessID)) std::stable_sort(first, last, LessID);
    }
}

// ---- finding --------------------------------------------------------------------------------------------------------

int32 ResourceMap::TypeCount() const {
    return size_ <= kEmptyMapSize ? 0 : Types()->lastIndex + 1;
}

TypeEntry* ResourceMap::FindType(ResType type) const {
    for (int32 i = 0, types = TypeCount(); i < types; ++i) {
        if (TypeAt(i)->type == type) return TypeAt(i);
    }
    return nullptr;
}

int64 ResourceMap::ReferenceCount() const {
    int64 sum = 0;
    for (int32 i = 0, types = TypeCount(); i < types; ++i) sum += CountOf(TypeAt(i));
    return sum;
}

ResourceEntry* ResourceMap::Entries(const TypeEntry* type) const {
    return reinterpret_cast<ResourceEntry*>(reinterpret_cast<uint8*>(Types()) + type->list);
}

ResourceEntry* ResourceMap::FindEntry(ResType type, int32 id) const {
    const TypeEntry* list = FindType(type);
    if (!list) return nullptr;
    ResourceEntry* first = Entries(list);
    ResourceEntry* last = first + CountOf(list);
    ResourceEntry* found =
        std::lower_bound(first, last, id, [](const ResourceEntry& entry, int32 key) { return entry.id < key; });
    return found != last && found->id == id ? found : nullptr;
}

uint32 ResourceMap::PositionOf(const ResourceEntry* entry) const {
    return static_cast<uint32>(reinterpret_cast<const uint8*>(entry) - *handle_);
}

void ResourceMap::CollectEntries(Positions* positions) const {
    for (int32 i = 0, types = TypeCount(); i < types; ++i) {
        const uint64 begin = uint64{Head()->typeList} + TypeAt(i)->list;
        for (int32 k = 0, count = CountOf(TypeAt(i)); k < count; ++k) {
            const uint64 at = begin + static_cast<uint64>(k) * kRefEntrySize;
            if (at + kRefEntrySize > size_) break;
            positions->push_back(static_cast<uint32>(at));
        }
    }
}

ConstPStr ResourceMap::NameOf(const ResourceEntry* entry) const {
    static constexpr uint8 kEmptyName[1] = {0};
    if (entry->name == kNoName) return kEmptyName;
    return *handle_ + Head()->nameList + static_cast<uint32>(entry->name);
}

// ---- changing -------------------------------------------------------------------------------------------------------

MgErr ResourceMap::Resize(uint64 size) {
    if (size > static_cast<uint64>(std::numeric_limits<int32>::max())) return kMemFullErr;
    if (const MgErr err = DSSetHandleSize(handle_, static_cast<uint32>(size))) return err;
    size_ = static_cast<uint32>(size);
    return kNoErr;
}

// A handle that stays too large does no harm.
void ResourceMap::Shrink(uint32 size) {
    size_ = size;
    DSSetHandleSize(handle_, size);
}

// Moves what lies from `at` to the end of the first `used` bytes up. The room for it is there already.
void ResourceMap::OpenGap(uint32 at, uint32 size, uint32 used) {
    uint8* map = *handle_;
    std::memmove(map + at + size, map + at, used - at);
}

void ResourceMap::CloseGap(uint32 at, uint32 size) {
    uint8* map = *handle_;
    std::memmove(map + at, map + at + size, size_ - at - size);
    size_ -= size;
}

// Moves the lists that begin at `fromOffset` (from the type list start) or later.
void ResourceMap::ShiftLists(uint32 fromOffset, int32 by) {
    for (int32 i = 0, types = TypeCount(); i < types; ++i) {
        TypeEntry* type = TypeAt(i);
        if (type->list >= fromOffset) type->list += static_cast<uint32>(by);
    }
}

uint32 ResourceMap::TypesEnd() const {
    return Head()->typeList + kTypeCountSize + static_cast<uint32>(TypeCount()) * kTypeEntrySize;
}

// Stores a name at `end`, the end of the map as it was with everything else in place. Returns its offset.
int32 ResourceMap::AppendName(ConstPStr name, uint32 end) {
    if (!NameSize(name)) return kNoName;
    RsrcMap* head = Head();
    if (head->nameList == 0) head->nameList = end;
    std::memcpy(*handle_ + end, name, NameSize(name));
    return static_cast<int32>(end - head->nameList);
}

MgErr ResourceMap::Insert(ResType type, int32 id, ConstPStr name, uint32* position) {
    if (IsEmpty()) return InsertFirst(type, id, name, position);
    if (FindEntry(type, id)) return kResIDExistsErr;
    TypeEntry* list = FindType(type);
    const MgErr err = list ? InsertEntry(list, id, name, position) : InsertType(type, id, name, position);
    if (!err) Head()->header.mapLength = size_;
    return err;
}

MgErr ResourceMap::InsertFirst(ResType type, int32 id, ConstPStr name, uint32* position) {
    constexpr uint32 kListOffset = kTypeCountSize + kTypeEntrySize;
    constexpr uint32 kEnd = kEmptyMapSize + kListOffset + kRefEntrySize;
    if (const MgErr err = Resize(kEnd + NameSize(name))) return err;
    Types()->lastIndex = 0;
    *TypeAt(0) = {type, 0, kListOffset};
    *position = kEmptyMapSize + kListOffset;
    *EntryAt(*position) = NewEntry(id, AppendName(name, kEnd));
    Head()->header.mapLength = size_;
    return kNoErr;
}

MgErr ResourceMap::InsertEntry(TypeEntry* type, int32 id, ConstPStr name, uint32* position) {
    const uint32 oldSize = size_;
    const auto typePosition = static_cast<uint32>(reinterpret_cast<uint8*>(type) - *handle_);
    ResourceEntry* first = Entries(type);
    const ResourceEntry* after = std::upper_bound(first, first + CountOf(type), NewEntry(id, kNoName), LessID);
    *position = PositionOf(after);

    if (const MgErr err = Resize(uint64{oldSize} + kRefEntrySize + NameSize(name))) return err;
    type = reinterpret_cast<TypeEntry*>(*handle_ + typePosition);
    OpenGap(*position, kRefEntrySize, oldSize);
    ShiftLists(type->list + 1, kRefEntrySize);
    ++type->lastIndex;
    if (Head()->nameList != 0) Head()->nameList += kRefEntrySize;
    *EntryAt(*position) = NewEntry(id, AppendName(name, oldSize + kRefEntrySize));
    return kNoErr;
}

MgErr ResourceMap::InsertType(ResType type, int32 id, ConstPStr name, uint32* position) {
    const uint32 oldSize = size_;
    const uint32 listsEnd = Head()->nameList != 0 ? Head()->nameList : oldSize;
    constexpr uint32 kGrowth = kTypeEntrySize + kRefEntrySize;
    if (const MgErr err = Resize(uint64{oldSize} + kGrowth + NameSize(name))) return err;

    const uint32 typePosition = TypesEnd();
    OpenGap(listsEnd, kRefEntrySize, oldSize);
    OpenGap(typePosition, kTypeEntrySize, oldSize + kRefEntrySize);
    ShiftLists(0, kTypeEntrySize);
    *position = listsEnd + kTypeEntrySize;
    *reinterpret_cast<TypeEntry*>(*handle_ + typePosition) = {type, 0, *position - Head()->typeList};
    ++Types()->lastIndex;
    if (Head()->nameList != 0) Head()->nameList += kGrowth;
    *EntryAt(*position) = NewEntry(id, AppendName(name, oldSize + kGrowth));
    return kNoErr;
}

MgErr ResourceMap::Remove(ResType type, uint32 position) {
    TypeEntry* list = FindType(type);
    if (CountOf(list) == 1 && TypeCount() == 1) {
        MakeBlank();
        Shrink(kEmptyMapSize);
        return kNoErr;
    }
    const int32 name = EntryAt(position)->name;
    const uint32 listOffset = list->list;
    if (name != kNoName) RemoveName(static_cast<uint32>(name));

    CloseGap(position, kRefEntrySize);
    ShiftLists(listOffset + 1, -static_cast<int32>(kRefEntrySize));
    uint32 removed = kRefEntrySize;
    if (CountOf(list) == 1) {
        CloseGap(static_cast<uint32>(reinterpret_cast<uint8*>(list) - *handle_), kTypeEntrySize);
        --Types()->lastIndex;
        ShiftLists(0, -static_cast<int32>(kTypeEntrySize));
        removed += kTypeEntrySize;
    } else {
        --list->lastIndex;
    }
    if (Head()->nameList != 0) Head()->nameList -= removed;
    Head()->header.mapLength = size_;
    Shrink(size_);
    return kNoErr;
}

void ResourceMap::RemoveName(uint32 nameOffset) {
    const uint32 at = Head()->nameList + nameOffset;
    const uint32 size = (*handle_)[at] + 1u;
    CloseGap(at, size);
    for (int32 i = 0, types = TypeCount(); i < types; ++i) {
        ResourceEntry* entries = Entries(TypeAt(i));
        for (int32 k = 0, count = CountOf(TypeAt(i)); k < count; ++k) {
            if (entries[k].name > static_cast<int32>(nameOffset)) entries[k].name -= static_cast<int32>(size);
        }
    }
}

}  // namespace tessel
