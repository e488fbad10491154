// Open resource files: opening, finding and loading, adding and removing.
#include "resources/OVResFile.h"

#include "diagnostics/Guarded.h"
#include "resources/OVResChain.h"
#include "resources/Refnums.h"
#include "resources/ResFileLock.h"
#include <tessel/base/MGAppInterface.h>
#include <tessel/diagnostics/DebugStream.h>
#include <tessel/files/FileManager.h>
#include <tessel/memory/MemoryManager.h>
#include <tessel/paths/PathManager.h>
#include <tessel/resources/ovresfile.h>

#include <cstring>
#include <new>

namespace tessel {

namespace {

// IDs that RUniqueID gives out.
constexpr int32 kFirstUniqueID = 128;
constexpr int32 kLastUniqueID = 0x7FFFFFF;
int32 gNextUniqueID = kFirstUniqueID;

void CopyName(ConstPStr from, PStr to) {
    std::memcpy(to, from, from[0] + 1u);
}

bool IsValidHeader(const RsrcHeader& header) {
    if (header.magic != kRsrcMagic) return false;
    if (header.version == kOldestRsrcVersion) return true;
    return header.version >= kRsrcVersion && std::memcmp(header.eol, kRsrcEol, sizeof kRsrcEol) == 0;
}

MgErr ReadHeaderAt(OVResfileIO& io, uint64 base, RsrcHeader* header) {
    if (io.Read(base, header, kHeaderSize)) return kEOFErr;
    SwapHeader(header);
    return IsValidHeader(*header) ? kNoErr : kNotResFileErr;
}

// Where the last 4 bytes of the source say that the resource file starts.
MgErr ReadTrailer(OVResfileIO& io, uint64* base) {
    uint64 size = 0;
    uint32 trailer = 0;
    if (io.Size(&size) || size < kTrailerSize) return kNotResFileErr;
    if (io.Read(size - kTrailerSize, &trailer, kTrailerSize)) return kNotResFileErr;
    *base = ToBig32(trailer);
    return *base > size ? kNotResFileErr : kNoErr;
}

}  // namespace

MgErr ReadRsrcHeader(OVResfileIO& io, RsrcHeader* header, uint64* base) {
    *base = 0;
    MgErr err = ReadHeaderAt(io, 0, header);
    if (err == kNotResFileErr && io.IsReadOnly()) {
        err = ReadTrailer(io, base);
        if (!err) err = ReadHeaderAt(io, *base, header);
    }
    if (!err && header->version > kRsrcVersion) err = kVersionErr;
    return err;
}

// ---- the lookup cache -----------------------------------------------------------------------------------------------

void ResCache::Set(const OVResource* resource, ResType type, uint32 position) {
    fResource = resource;
    fType = type;
    fPosition = position;
}

bool ResCache::FindRL(const OVResource* resource, const ResourceMap& map, ResType* type, RsrcList** entry) const {
    if (!type || !entry) {
        ReportUnlocked(
            [] { TESSEL_REPORT(kDebugError, 0x4D2B86F1u) << "ResCache::FindRL, outType or outRLEntry are NULL"; });
        return false;
    }
    if (fPosition == kNothing || fResource != resource) return false;
    *type = fType;
    *entry = map.EntryAt(fPosition);
    if ((*entry)->loaded == 0)
        ReportUnlocked([] {
            TESSEL_REPORT(kDebugError, 0x7A90C35Eu) << "ResCache::FindRL, Error in cache logic. Hit on stale entry.";
        });
    return true;
}

// ---- opening and closing --------------------------------------------------------------------------------------------

OVResFile::~OVResFile() {
    ResFileLock lock;
    const bool lost = fOpen && fIO && fIO->CanWrite() && (fMap.Head()->fileAttrs & kRFileChanged);
    if (lost) {
        ReportUnlocked([] {
            TESSEL_REPORT(kDebugError, 0x3D94B7E6u) << "A resource file goes with changes that are not written!";
        });
    }
    Dispose();
}

MgErr OVResFile::Open(OVResfileIO* io, _FMFileType* type, _FMFileCreator* creator) {
    const bool sorts = !MGGetIsRunTime(nullptr);  // asks the host, so without the lock
    ResFileLock lock;
    if (!io) {
        ReportUnlocked([] { TESSEL_REPORT(kDebugError, 0x15E8B64Cu) << "fileIO object is NULL"; });
        return kArgErr;
    }
    std::unique_ptr<OVResfileIO> source(io);
    if (fOpen) return kGenericErr;
    fIO = std::move(source);
    if (const MgErr err = Guarded([&] { return OpenSource(sorts); })) {
        Dispose();
        return err;
    }
    fOpen = true;
    if (type) *type = fMap.Head()->header.type;
    if (creator) *creator = fMap.Head()->header.creator;
    return kNoErr;
}

MgErr OVResFile::OpenSource(bool sorts) {
    if (const MgErr err = fIO->Prepare()) return err;
    RsrcHeader header;
    if (const MgErr err = ReadRsrcHeader(*fIO, &header, &fBase)) return err;
    if (const MgErr err = ReadMap(header, fBase)) return err;
    RsrcMap* head = fMap.Head();
    head->fileAttrs = fIO->IsReadOnly() ? kRFileReadOnly : 0;
    if (head->header.version == kOldestRsrcVersion) std::memcpy(head->header.eol, kRsrcEol, sizeof kRsrcEol);
    if (sorts) fMap.Sort();
    head->header.version = kRsrcVersion;
    return kNoErr;
}

MgErr OVResFile::ReadMap(const RsrcHeader& header, uint64 base) {
    if (header.mapLength <= kHeaderSize) return fMap.MakeEmpty(header);
    // A length that the source does not have must not cost the memory for it.
    uint64 size = 0;
    if (const MgErr err = fIO->Size(&size)) return err;
    const uint64 start = base + header.mapOffset;
    if (start > size || header.mapLength > size - start) return kEOFErr;
    UHandle bytes = DSNewHandle(header.mapLength);
    if (!bytes) return kMemFullErr;
    if (const MgErr err = fIO->Read(start, *bytes, header.mapLength)) {
        DSDisposeHandle(bytes);
        return err;
    }
    return fMap.FromDisk(bytes, header);
}

MgErr OVResFile::CreateInMemory(_FMFileType type, _FMFileCreator creator) {
    ResFileLock lock;
    if (const MgErr err = fMap.MakeEmpty(EmptyHeader(type, creator))) return err;
    fOpen = true;
    return kNoErr;
}

MgErr OVResFile::RCloseFile() {
    ResFileLock lock;
    if (!fOpen) return kNotResFileErr;
    if (const MgErr err = RUpdateFile()) return err;
    Dispose();
    return kNoErr;
}

void OVResFile::Dispose() {
    OVResChain::Forget(this);
    for (OVResource* resource : fLoaded) delete resource;
    fLoaded.clear();
    fFreeSlots.clear();
    fCache.Empty();
    fMap.Dispose();
    fIO.reset();
    fOpen = false;
}

// ---- loading --------------------------------------------------------------------------------------------------------

// The length word of an entry, which must lie in the data section with all it counts.
MgErr OVResFile::DataLengthAt(const RsrcList& entry, uint32* length) {
    const uint64 dataLength = fMap.Head()->header.dataLength;
    const uint64 start = entry.data;
    if (start + 4 > dataLength || !fIO) return kEOFErr;
    uint32 word = 0;
    if (fIO->Read(DataStart() + start, &word, 4)) return kNotResFileErr;
    *length = ToBig32(word);
    return start + 4 + *length > dataLength ? kEOFErr : kNoErr;
}

MgErr OVResFile::LoadData(const RsrcList& entry, std::unique_ptr<ResourceData>* data) {
    uint32 length = 0;
    if (const MgErr err = DataLengthAt(entry, &length)) return err;
    // Nor may a data section that the source does not have.
    const uint64 start = DataStart() + entry.data + 4;
    uint64 size = 0;
    if (const MgErr err = fIO->Size(&size)) return err;
    if (start > size || length > size - start) return kEOFErr;

    if (const uint8* place = fIO->InPlace(start)) {
        *data = std::make_unique<MappedResource>(place, length);
        return kNoErr;
    }
    auto loaded = std::make_unique<DSHandleResource>();
    UHandle handle = DSNewHandle(length);
    if (!handle) return kMemFullErr;
    if (const MgErr err = loaded->Adopt(handle)) {
        DSDisposeHandle(handle);
        return err;
    }
    *data = std::move(loaded);
    return fIO->Read(start, *handle, length);
}

OVResource* OVResFile::LoadedAt(const RsrcList& entry) const {
    return entry.loaded ? fLoaded[entry.loaded - 1] : nullptr;
}

bool OVResFile::IsChanged(const RsrcList& entry) const {
    const OVResource* loaded = LoadedAt(entry);
    return (entry.attrs & kRChangedAttr) || (loaded && loaded->fUnwritten);
}

MgErr OVResFile::Load(ResType type, RsrcList* entry, OVResource** resource) {
    OVResource* loaded = LoadedAt(*entry);
    if (!loaded || !loaded->fData) {
        std::unique_ptr<ResourceData> data;
        if (const MgErr err = LoadData(*entry, &data)) return err;
        if (loaded) {
            loaded->fData = std::move(data);
        } else {
            auto made = std::make_unique<OVResource>(this, std::move(data));
            if (const MgErr err = Attach(made.get())) return err;
            loaded = made.release();
            entry->loaded = loaded->fSlot;
        }
    }
    fCache.Set(loaded, type, fMap.PositionOf(entry));
    *resource = loaded;
    return kNoErr;
}

MgErr OVResFile::Attach(OVResource* resource) {
    if (!fFreeSlots.empty()) {
        resource->fSlot = fFreeSlots.back();
        fFreeSlots.pop_back();
        fLoaded[resource->fSlot - 1] = resource;
        return kNoErr;
    }
    // Room for every slot to be given back, so that giving one back cannot fail.
    fFreeSlots.reserve(fLoaded.size() + 1);
    fLoaded.push_back(resource);
    resource->fSlot = static_cast<uint32>(fLoaded.size());
    return kNoErr;
}

void OVResFile::Forget(OVResource* resource) {
    fLoaded[resource->fSlot - 1] = nullptr;
    fFreeSlots.push_back(resource->fSlot);
    resource->fSlot = 0;
    resource->fFile = nullptr;
    fCache.Empty();
}

MgErr OVResFile::FindRL(const OVResource* resource, ResType* type, RsrcList** entry) {
    if (fCache.FindRL(resource, fMap, type, entry)) return kNoErr;
    for (int32 i = 0, types = fMap.TypeCount(); i < types; ++i) {
        RsrcList* entries = fMap.Entries(fMap.TypeAt(i));
        for (int32 k = 0, count = ResourceMap::CountOf(fMap.TypeAt(i)); k < count; ++k) {
            if (entries[k].loaded != resource->fSlot) continue;
            *type = fMap.TypeAt(i)->type;
            *entry = &entries[k];
            fCache.Set(resource, *type, fMap.PositionOf(*entry));
            return kNoErr;
        }
    }
    return kResNotFoundErr;
}

// ---- reading --------------------------------------------------------------------------------------------------------

MgErr OVResFile::RGet(ResType type, int32 id, Resource** resource) {
    ResFileLock lock;
    if (!resource) return kArgErr;
    *resource = nullptr;
    if (!fOpen) return kNotResFileErr;
    RsrcList* entry = fMap.FindEntry(type, id);
    if (!entry) return kResNotFoundErr;
    return Guarded([&] {
        OVResource* loaded = nullptr;
        const MgErr err = Load(type, entry, &loaded);
        *resource = loaded;
        return err;
    });
}

MgErr OVResFile::RExists(ResType type, int32 id, int32* exists) {
    ResFileLock lock;
    if (!exists) return kArgErr;
    *exists = 0;
    if (!fOpen) return kNotResFileErr;
    if (!fMap.FindEntry(type, id)) return kResNotFoundErr;
    *exists = 1;
    return kNoErr;
}

MgErr OVResFile::RGetNamed(ResType type, ConstPStr name, Resource** resource) {
    ResFileLock lock;
    if (!resource || !name) return kArgErr;
    *resource = nullptr;
    if (!fOpen) return kNotResFileErr;
    const TypeList* list = fMap.FindType(type);
    if (!list) return kResNotFoundErr;
    RsrcList* entries = fMap.Entries(list);
    for (int32 i = 0, count = ResourceMap::CountOf(list); i < count; ++i) {
        if (entries[i].name == kNoName || !FileNameEqual(fMap.NameOf(&entries[i]), name)) continue;
        return Guarded([&] {
            OVResource* loaded = nullptr;
            const MgErr err = Load(type, &entries[i], &loaded);
            *resource = loaded;
            return err;
        });
    }
    return kResNotFoundErr;
}

MgErr OVResFile::RIsLoaded(ResType type, int32 id, bool* loaded) {
    ResFileLock lock;
    if (!loaded) return kArgErr;
    *loaded = false;
    if (!fOpen) return kNotResFileErr;
    const RsrcList* entry = fMap.FindEntry(type, id);
    if (!entry) return kResNotFoundErr;
    const OVResource* resource = LoadedAt(*entry);
    *loaded = resource && resource->fData;
    return kNoErr;
}

MgErr OVResFile::RGetIndStringPtr(ConstPStr* string, int32 id, int32 index, ResType type) {
    ResFileLock lock;
    if (!string) return kArgErr;
    *string = nullptr;
    Resource* resource = nullptr;
    if (const MgErr err = RGet(type, id, &resource)) return err;
    const uint8* data = resource->GetData();
    const uint32 size = resource->GetSize();
    if (size < 2) return kEOFErr;
    if (index < 1 || index > (data[0] << 8 | data[1])) return kResNotFoundErr;
    uint32 at = 2;
    for (int32 k = 1; at < size; ++k) {
        const uint32 next = at + 1 + data[at];
        if (next > size) return kEOFErr;
        if (k == index) {
            *string = data + at;
            return kNoErr;
        }
        at = next;
    }
    return kEOFErr;
}

Resource* OVResFile::GetResourceForHandle(UHandle data) {
    ResFileLock lock;
    for (OVResource* resource : fLoaded) {
        if (resource && resource->fData && resource->fData->ContainsHandle(data)) return resource;
    }
    return nullptr;
}

MgErr OVResFile::RCount(ResType type, int32* count) {
    ResFileLock lock;
    if (!count) return kArgErr;
    *count = 0;
    if (!fOpen) return kNotResFileErr;
    if (const TypeList* list = fMap.FindType(type)) *count = ResourceMap::CountOf(list);
    return kNoErr;
}

MgErr OVResFile::RCountTypes(int32* count) {
    ResFileLock lock;
    if (!count) return kArgErr;
    *count = 0;
    if (!fOpen) return kNotResFileErr;
    *count = fMap.TypeCount();
    return kNoErr;
}

MgErr OVResFile::RGetInd(ResType type, int32 index, Resource** resource) {
    ResFileLock lock;
    if (!resource) return kArgErr;
    *resource = nullptr;
    if (!fOpen) return kNotResFileErr;
    const TypeList* list = fMap.FindType(type);
    if (!list || index < 1 || index > ResourceMap::CountOf(list)) return kResNotFoundErr;
    return Guarded([&] {
        OVResource* loaded = nullptr;
        const MgErr err = Load(type, fMap.Entries(list) + (index - 1), &loaded);
        *resource = loaded;
        return err;
    });
}

MgErr OVResFile::RGetIndType(ResType* type, int32 index) {
    ResFileLock lock;
    if (!type) return kArgErr;
    *type = 0;
    if (!fOpen) return kNotResFileErr;
    if (index < 1 || index > fMap.TypeCount()) return kResNotFoundErr;
    *type = fMap.TypeAt(index - 1)->type;
    return kNoErr;
}

int32 OVResFile::RUniqueID(ResType type) {
    ResFileLock lock;
    if (!fOpen) return kNotResFileErr;
    if (fMap.IsEmpty()) return kFirstUniqueID;
    int32 id = gNextUniqueID;
    if (fMap.FindType(type)) {
        while (id <= kLastUniqueID && fMap.FindEntry(type, id)) ++id;
        if (id > kLastUniqueID) return 0;
    }
    const auto next = static_cast<int32>(static_cast<uint32>(gNextUniqueID) + 1);
    gNextUniqueID = next <= kFirstUniqueID ? kFirstUniqueID : next;
    return id;
}

MgErr OVResFile::RGetModDate(Path path, uint32* date, int32* readOnly) {
    ResFileLock lock;
    if (!date) {
        ReportUnlocked([] { TESSEL_REPORT(kDebugError, 0x39F7D01Au) << "OVResFile::RGetModDate modDate is NULL"; });
        return kArgErr;
    }
    if (!fOpen) return kNotResFileErr;
    return FMGetModDate(path, fIO ? fIO->File() : nullptr, date, readOnly);
}

MgErr OVResFile::RGetFileAttrs(uint32* attrs) {
    ResFileLock lock;
    if (!attrs) return kArgErr;
    if (!fOpen) return kNotResFileErr;
    *attrs = fMap.Head()->fileAttrs;
    return kNoErr;
}

// ---- changing -------------------------------------------------------------------------------------------------------

MgErr OVResFile::RSetFileAttrs(uint32 attrs) {
    ResFileLock lock;
    if (!fOpen) return kNotResFileErr;
    if (IsReadOnly()) {
        ReportUnlocked(
            [] { TESSEL_REPORT(kDebugWarning, 0x0B74E9A2u) << "Tried to call RSetFileAttrs on a readonly file"; });
        return kPermissionErr;
    }
    fMap.Head()->fileAttrs = attrs;
    return kNoErr;
}

// The handle stays the caller's on failure.
MgErr OVResFile::AddHandle(UHandle data, ResType type, int32 id, ConstPStr name) {
    auto holder = std::make_unique<DSHandleResource>();
    DSHandleResource* held = holder.get();
    auto resource = std::make_unique<OVResource>(this, std::move(holder));
    if (const MgErr err = Attach(resource.get())) return err;
    uint32 position = 0;
    MgErr err = held->Adopt(data);
    if (!err) err = fMap.Insert(type, id, name, &position);
    if (err) {
        held->DetachHandle();
        Forget(resource.get());
        return err;
    }
    resource->fUnwritten = true;
    fMap.EntryAt(position)->loaded = resource->fSlot;
    fCache.Set(resource.release(), type, position);
    Touch();
    return kNoErr;
}

MgErr OVResFile::RAdd(UHandle data, ResType type, int32 id, ConstPStr name) {
    ResFileLock lock;
    if (!fOpen) return kNotResFileErr;
    if (!data) return kResIDExistsErr;
    if (const MgErr err = DSCheckHandle(data)) {
        ReportUnlocked([] { TESSEL_REPORT(kDebugError, 0x56A3C7D8u) << "RAdd of non-DS Handle"; });
        return err;
    }
    if (IsReadOnly()) return kPermissionErr;
    return Guarded([&] { return AddHandle(data, type, id, name); });
}

MgErr OVResFile::RAddPtr(const void* data, uint32 size, ResType type, int32 id, ConstPStr name) {
    ResFileLock lock;
    if (!fOpen) return kNotResFileErr;
    if (!data) return kResIDExistsErr;
    UHandle copy = nullptr;
    if (const MgErr err = DSPtrToHand(data, &copy, size)) return err;
    const MgErr err = RAdd(copy, type, id, name);
    if (err) DSDisposeHandle(copy);
    return err;
}

// What the entry's resource held is replaced by a copy. The handle of loaded data stays the same.
MgErr OVResFile::ReplaceWith(const void* bytes, uint32 size, ResType type, RsrcList* entry) {
    auto data = std::make_unique<DSHandleResource>();
    UHandle copy = nullptr;
    if (const MgErr err = DSPtrToHand(bytes, &copy, size)) return err;
    if (const MgErr err = data->Adopt(copy)) {
        DSDisposeHandle(copy);
        return err;
    }
    OVResource* loaded = LoadedAt(*entry);
    if (!loaded) {
        auto resource = std::make_unique<OVResource>(this, std::move(data));
        if (const MgErr err = Attach(resource.get())) return err;
        entry->loaded = resource->fSlot;
        loaded = resource.release();
    } else if (UHandle own = loaded->fData ? loaded->fData->GetSharedDSHandle() : nullptr) {
        if (const MgErr err = DSSwapHandles(own, copy)) return err;
    } else {
        loaded->fData = std::move(data);
    }
    fCache.Set(loaded, type, fMap.PositionOf(entry));
    return MarkChanged(loaded);
}

MgErr OVResFile::RReplacePtr(const void* data, uint32 size, ResType type, int32 id) {
    ResFileLock lock;
    if (!fOpen) return kNotResFileErr;
    if (IsReadOnly()) return kPermissionErr;
    RsrcList* entry = fMap.FindEntry(type, id);
    if (!data || !entry) return kResIDExistsErr;
    return Guarded([&] { return ReplaceWith(data, size, type, entry); }) ? kResIDExistsErr : kNoErr;
}

MgErr OVResFile::RReplaceDSHandle(UHandle data, ResType type, int32 id) {
    if (!data || DSCheckHandle(data)) return RReplacePtr(nullptr, 0, type, id);
    return RReplacePtr(*data, DSGetHandleSize(data), type, id);
}

MgErr OVResFile::RRemove(Resource* resource) {
    ResFileLock lock;
    if (!fOpen) return kNotResFileErr;
    if (IsReadOnly()) return kPermissionErr;
    OVResource* own = OwnResource(resource);
    ResType type = 0;
    RsrcList* entry = nullptr;
    if (!own) return kResNotFoundErr;
    if (const MgErr err = FindRL(own, &type, &entry)) return err;
    if (entry->attrs & kRProtectedAttr) return kResNotFoundErr;
    const uint32 position = fMap.PositionOf(entry);
    Forget(own);
    delete own;
    fMap.Remove(type, position);
    Touch();
    return kNoErr;
}

// `resource` if it is loaded in this file, else null.
OVResource* OVResFile::OwnResource(Resource* resource) const {
    for (OVResource* loaded : fLoaded) {
        if (loaded && loaded == resource) return loaded;
    }
    return nullptr;
}

// ---- sources --------------------------------------------------------------------------------------------------------

MgErr OVResFile::RPreAllocFile(uint32 size) {
    ResFileLock lock;
    if (!fOpen) return kNotResFileErr;
    if (IsReadOnly()) {
        ReportUnlocked(
            [] { TESSEL_REPORT(kDebugWarning, 0x6F14B02Du) << "Tried to call RPreAllocFile on a readonly file"; });
        return kPermissionErr;
    }
    return fIO ? fIO->Extend(size) : kPermissionErr;
}

MgErr OVResFile::RGetUHandleOwnership(UHandle* handle) {
    ResFileLock lock;
    if (!handle) return kArgErr;
    *handle = nullptr;
    if (!fOpen) return kNotResFileErr;
    *handle = fIO ? fIO->ReleaseHandle() : nullptr;
    return *handle ? kNoErr : kGenericErr;
}

// ---- what the resources ask their file ------------------------------------------------------------------------------

MgErr OVResFile::Release(OVResource* resource) {
    ResType type = 0;
    RsrcList* entry = nullptr;
    if (const MgErr err = FindRL(resource, &type, &entry)) return err;
    if (IsChanged(*entry)) {
        ReportUnlocked([] { TESSEL_REPORT(kDebugWarning, 0x28D5E16Au) << "!!! Tried to release a changed resource"; });
        return kArgErr;
    }
    entry->loaded = 0;
    Forget(resource);
    delete resource;
    return kNoErr;
}

MgErr OVResFile::MarkChanged(OVResource* resource) {
    ResType type = 0;
    RsrcList* entry = nullptr;
    if (IsReadOnly()) return kPermissionErr;
    if (const MgErr err = FindRL(resource, &type, &entry)) return err;
    entry->attrs |= kRChangedAttr;
    resource->fUnwritten = true;
    Touch();
    return kNoErr;
}

MgErr OVResFile::Detach(OVResource* resource) {
    ResType type = 0;
    RsrcList* entry = nullptr;
    if (const MgErr err = FindRL(resource, &type, &entry)) return err;
    if (IsChanged(*entry)) {
        ReportUnlocked([] { TESSEL_REPORT(kDebugWarning, 0x43BC97F0u) << "!!! Tried to detach a changed resource"; });
        return kResNotFoundErr;
    }
    entry->loaded = 0;
    Forget(resource);
    return kNoErr;
}

MgErr OVResFile::SetAttrs(const OVResource* resource, uint32 attrs) {
    ResType type = 0;
    RsrcList* entry = nullptr;
    if (IsReadOnly()) return kPermissionErr;
    if (const MgErr err = FindRL(resource, &type, &entry)) return err;
    entry->attrs = attrs;
    Touch();
    return kNoErr;
}

MgErr OVResFile::GetInfo(const OVResource* resource, int32* id, ResType* type, PStr name) {
    ResType ownType = 0;
    RsrcList* entry = nullptr;
    if (const MgErr err = FindRL(resource, &ownType, &entry)) return err;
    if (id) *id = entry->id;
    if (type) *type = ownType;
    if (name) CopyName(fMap.NameOf(entry), name);
    return kNoErr;
}

MgErr OVResFile::GetAttrs(const OVResource* resource, uint32* attrs) {
    ResType type = 0;
    RsrcList* entry = nullptr;
    if (const MgErr err = FindRL(resource, &type, &entry)) return err;
    *attrs = entry->attrs;
    return kNoErr;
}

// ---- resources ------------------------------------------------------------------------------------------------------

OVResource::~OVResource() {
    ResFileLock lock;
    EmptyHandleCache();
    fData.reset();
}

MgErr OVResource::RRelease() {
    ResFileLock lock;
    return fFile ? fFile->Release(this) : kResNotFoundErr;
}

MgErr OVResource::RChanged() {
    ResFileLock lock;
    return fFile ? fFile->MarkChanged(this) : kResNotFoundErr;
}

MgErr OVResource::DetachResource() {
    ResFileLock lock;
    return fFile ? fFile->Detach(this) : kResNotFoundErr;
}

MgErr OVResource::RSetAttrs(uint32 attrs) {
    ResFileLock lock;
    return fFile ? fFile->SetAttrs(this, attrs) : kResNotFoundErr;
}

MgErr OVResource::RSize(uint32* size) {
    if (!size) return kArgErr;
    *size = GetSize();
    return kNoErr;
}

MgErr OVResource::RGetInfo(int32* id, ResType* type, PStr name) {
    ResFileLock lock;
    return fFile ? fFile->GetInfo(this, id, type, name) : kResNotFoundErr;
}

MgErr OVResource::RGetAttrs(uint32* attrs) {
    ResFileLock lock;
    if (!attrs) return kArgErr;
    return fFile ? fFile->GetAttrs(this, attrs) : kResNotFoundErr;
}

UHandle OVResource::GetSharedDSHandle() {
    ResFileLock lock;
    return fData ? fData->GetSharedDSHandle() : nullptr;
}

MgErr OVResource::DetachHandle(UHandle* data) {
    ResFileLock lock;
    if (!data) return kArgErr;
    *data = GetSharedDSHandle();
    if (!*data) return fData ? kMemFullErr : kResNotFoundErr;
    fData->DetachHandle();
    fData.reset();
    EmptyHandleCache();
    if (fFile) fFile->fCache.Empty();
    return kNoErr;
}

uint32 OVResource::GetSize() {
    ResFileLock lock;
    return fData ? fData->GetSize() : 0;
}

const uint8* OVResource::GetData() {
    ResFileLock lock;
    return fData ? fData->GetData() : nullptr;
}

bool OVResource::ContainsHandle(UHandle data) {
    ResFileLock lock;
    return fData && fData->ContainsHandle(data);
}

}  // namespace tessel
