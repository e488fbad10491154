// An open resource file, and the cache of the last one found.
#ifndef TESSEL_SOURCE_RESOURCES_OVRESFILE_H
#define TESSEL_SOURCE_RESOURCES_OVRESFILE_H

#include "resources/OVResfileIO.h"
#include "resources/OVResource.h"
#include "resources/ResourceMap.h"
#include <tessel/memory/TrackedMallocFree.h>
#include <tessel/resources/ovresfile.h>

#include <memory>
#include <vector>

namespace tessel {

// Where a resource stands in the map, and under which type. Without an entry it was not found.
struct FoundEntry {
    ResType type = 0;
    ResourceEntry* entry = nullptr;
};

// The last resource found in a file, where its entry stands, and its type.
class ResCache {
public:
    void Set(const OVResource* resource, ResType type, uint32 position);
    void Empty() { position_ = kNothing; }
    // Answers when `resource` is the cached one.
    FoundEntry Find(const OVResource* resource, const ResourceMap& map) const;

private:
    static constexpr uint32 kNothing = ~uint32{0};

    const OVResource* resource_ = nullptr;
    ResType type_ = 0;
    uint32 position_ = kNothing;
};

class OVResFile final : public ResFile, public TrackedObject {
public:
    OVResFile() = default;
    ~OVResFile() override;
    OVResFile(const OVResFile&) = delete;
    OVResFile& operator=(const OVResFile&) = delete;

    MgErr RCloseFile() override;
    MgErr RGet(ResType type, int32 id, Resource** resource) override;
    MgErr RExists(ResType type, int32 id, int32* exists) override;
    MgErr RGetNamed(ResType type, ConstPStr name, Resource** resource) override;
    MgErr RIsLoaded(ResType type, int32 id, bool* loaded) override;
    MgErr RGetIndStringPtr(ConstPStr* string, int32 id, int32 index, ResType type) override;
    Resource* GetResourceForHandle(UHandle data) override;
    MgErr RUpdateFile() override;
    MgErr RAddPtr(const void* data, uint32 size, ResType type, int32 id, ConstPStr name) override;
    MgErr RAdd(UHandle data, ResType type, int32 id, ConstPStr name) override;
    MgErr RReplacePtr(const void* data, uint32 size, ResType type, int32 id) override;
    MgErr RReplaceDSHandle(UHandle data, ResType type, int32 id) override;
    MgErr RRemove(Resource* resource) override;
    MgErr RCount(ResType type, int32* count) override;
    MgErr RCountTypes(int32* count) override;
    MgErr RGetInd(ResType type, int32 index, Resource** resource) override;
    MgErr RGetIndType(ResType* type, int32 index) override;
    int32 RUniqueID(ResType type) override;
    MgErr RGetModDate(Path path, uint32* date, int32* readOnly) override;
    MgErr RGetFileAttrs(uint32* attrs) override;
    MgErr RSetFileAttrs(uint32 attrs) override;
    MgErr RPreAllocFile(uint32 size) override;
    MgErr RGetUHandleOwnership(UHandle* handle) override;
    MgErr RGetMemFileHandle(UHandle* handle) override;
    MgErr Open(OVResfileIO* io, _FMFileType* type, _FMFileCreator* creator) override;

    // A new empty file that is only in memory.
    MgErr CreateInMemory(_FMFileType type, _FMFileCreator creator);

private:
    friend class OVResource;
    using Positions = ResourceMap::Positions;
    struct Entry;    // an entry on its way through an update
    class Updating;  // an update

    // opening and closing
    MgErr OpenSource(bool sorts);
    MgErr ReadMap(const RsrcHeader& header, uint64 base);
    void Dispose();

    // loading
    uint64 DataStart() const { return base_ + map_.Head()->header.dataOffset; }
    MgErr DataLengthAt(const ResourceEntry& entry, uint32* length, uint64* size);
    MgErr LoadData(const ResourceEntry& entry, std::unique_ptr<ResourceData>* data);
    MgErr Load(ResType type, ResourceEntry* entry, OVResource** resource);
    OVResource* LoadedAt(const ResourceEntry& entry) const;
    MgErr Attach(OVResource* resource);  // gives it a slot
    void Forget(OVResource* resource);   // takes the slot back

    // the entry of a resource
    FoundEntry FindEntry(const OVResource* resource);
    bool IsChanged(const ResourceEntry& entry) const;
    void Touch() { map_.Head()->fileAttrs |= kRFileChanged; }
    bool IsReadOnly() const { return (map_.Head()->fileAttrs & kRFileReadOnly) != 0; }

    MgErr AddHandle(UHandle data, ResType type, int32 id, ConstPStr name);
    MgErr ReplaceWith(const void* bytes, uint32 size, ResType type, ResourceEntry* entry);
    OVResource* OwnResource(Resource* resource) const;

    // what the resources ask their file
    MgErr Release(OVResource* resource);
    MgErr MarkChanged(OVResource* resource);
    MgErr Detach(OVResource* resource);
    MgErr SetAttrs(const OVResource* resource, uint32 attrs);
    MgErr GetInfo(const OVResource* resource, int32* id, ResType* type, PStr name);
    MgErr GetAttrs(const OVResource* resource, uint32* attrs);

    // writing (OVResFileUpdate.cpp)
    MgErr RebaseData();

    // the whole file in memory (OVResFileImage.cpp)
    MgErr BuildImage(UHandle* image);
    MgErr MeasureLoaded(const Positions& positions, uint64* dataLength) const;
    void LayOut(ResourceMap* map, const Positions& positions, uint32 dataLength, uint8* image) const;

    std::unique_ptr<OVResfileIO> io_;  // null for a file made in memory
    ResourceMap map_;
    uint64 base_ = 0;  // where the resource file starts in its source
    std::vector<OVResource*, TrackedAllocator<OVResource*>> loaded_;
    std::vector<uint32, TrackedAllocator<uint32>> freeSlots_;
    ResCache cache_;
    bool open_ = false;
};

// Reads the header at the start of the source or, in a read-only one, behind a trailer; in host order, its offsets from
// `base`.
MgErr ReadRsrcHeader(OVResfileIO& io, RsrcHeader* header, uint64* base);

}  // namespace tessel

#endif
