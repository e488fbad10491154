// The map of an open resource file: which resources there are, what they are called and where their data lie.
#ifndef TESSEL_SOURCE_RESOURCES_RESOURCEMAP_H
#define TESSEL_SOURCE_RESOURCES_RESOURCEMAP_H

#include "resources/RsrcFormat.h"
#include <tessel/base/MgErr.h>
#include <tessel/base/StringTypes.h>
#include <tessel/memory/TrackedMallocFree.h>

#include <vector>

namespace tessel {

// Keeps the map in one handle, in the layout it has on disk, with numbers in host order.
//
// Once FromDisk has accepted a map, the counts, lists and names in it lie inside it and do not overlap: the header, the
// type list, the reference lists (in any order, possibly with gaps), the names; no type is there twice. Every change
// keeps it so. A map without types is always the 52 bytes of an empty one.
//
// Positions are offsets from the map start; pointers are good until the next change.
class ResourceMap {
public:
    using Positions = std::vector<uint32, TrackedAllocator<uint32>>;

    ResourceMap() = default;
    ~ResourceMap() { Dispose(); }
    ResourceMap(const ResourceMap&) = delete;
    ResourceMap& operator=(const ResourceMap&) = delete;

    void Dispose();

    MgErr MakeEmpty(const RsrcHeader& header);

    // Takes over a handle with the bytes of a map as they are in the file. kIOErr: they do not agree with the header,
    // or with themselves.
    MgErr FromDisk(UHandle bytes, const RsrcHeader& header);

    MgErr CopyOf(const ResourceMap& other);

    // Says that the header is followed by so many bytes of data and the map.
    void SetLayout(uint32 dataLength);

    // Writes the map as it goes into a file, Size() bytes. Slots of loaded resources become 0.
    void ToDisk(uint8* bytes) const;

    // Sorts every list that is not in the order of ascending IDs.
    void Sort();

    bool Exists() const { return handle_ != nullptr; }
    bool IsEmpty() const { return Head()->header.mapLength <= kHeaderSize; }
    uint32 Size() const { return size_; }
    RsrcMap* Head() const { return reinterpret_cast<RsrcMap*>(*handle_); }
    UHandle Handle() const { return handle_; }

    int32 TypeCount() const;
    TypeEntry* TypeAt(int32 index) const { return &Types()->types[index]; }
    TypeEntry* FindType(ResType type) const;
    static int32 CountOf(const TypeEntry* type) { return type->lastIndex + 1; }
    int64 ReferenceCount() const;

    ResourceEntry* Entries(const TypeEntry* type) const;
    ResourceEntry* FindEntry(ResType type, int32 id) const;
    ResourceEntry* EntryAt(uint32 position) const { return reinterpret_cast<ResourceEntry*>(*handle_ + position); }
    uint32 PositionOf(const ResourceEntry* entry) const;
    // Every reference entry, type by type. Fewer than ReferenceCount says when the lists do not fit the map any more.
    void CollectEntries(Positions* positions) const;

    // The name of an entry, or the empty one.
    ConstPStr NameOf(const ResourceEntry* entry) const;

    // Adds an entry that is marked changed; *position is where it stands. kResIDExistsErr: the ID is taken.
    MgErr Insert(ResType type, int32 id, ConstPStr name, uint32* position);
    MgErr Remove(ResType type, uint32 position);

private:
    TypeMap* Types() const { return reinterpret_cast<TypeMap*>(*handle_ + Head()->typeList); }
    uint32 TypesEnd() const;
    MgErr Resize(uint64 size);
    void Shrink(uint32 size);
    void OpenGap(uint32 at, uint32 size, uint32 used);
    void CloseGap(uint32 at, uint32 size);
    void ShiftLists(uint32 fromOffset, int32 by);
    int32 AppendName(ConstPStr name, uint32 end);
    MgErr InsertFirst(ResType type, int32 id, ConstPStr name, uint32* position);
    MgErr InsertEntry(TypeEntry* type, int32 id, ConstPStr name, uint32* position);
    MgErr InsertType(ResType type, int32 id, ConstPStr name, uint32* position);
    void RemoveName(uint32 nameOffset);
    void MakeBlank();

    UHandle handle_ = nullptr;
    uint32 size_ = 0;
};

}  // namespace tessel

#endif
