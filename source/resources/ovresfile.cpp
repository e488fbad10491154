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
int32 nextUniqueID = kFirstUniqueID;

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
    resource_ = resource;
    type_ = type;
    position_ = position;
}

FoundEntry ResCache::Find(const OVResource* resource, const ResourceMap& map) const {
    if (position_ == kNothing || resource_ != resource) return {};
    ResourceEntry* entry = map.EntryAt(position_);
    if (entry->loaded == 0)
        ReportUnlocked([] {
            TESSEL_REPORT(kDebugError, 0x7A90C35Eu) << "ResCache::FindRL, Error in cache logic. Hit on stale entry.";
        });
    return {type_, entry};
}

// ---- opening and closing --------------------------------------------------------------------------------------------

OVResFile::~OVResFile() {
    ResFileLock lock;
    const bool lost = open_ && io_ && io_->CanWrite() && (map_.Head()->fileAttrs & kRFileChanged);
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
    if (open_) return kGenericErr;
    io_ = std::move(source);
    if (const MgErr err = Guarded([&] { return OpenSource(sorts); })) {
        Dispose();
        return err;
    }
    open_ = true;
    if (type) *type = map_.Head()->header.type;
    if (creator) *creator = map_.Head()->header.creator;
    return kNoErr;
}

MgErr OVResFile::OpenSource(bool sorts) {
    if (const MgErr err = io_->Prepare()) return err;
    RsrcHeader header;
    if (const MgErr err = ReadRsrcHeader(*io_, &header, &base_)) return err;
    if (const MgErr err = ReadMap(header, base_)) return err;
    RsrcMap* head = map_.Head();
    head->fileAttrs = io_->IsReadOnly() ? kRFileReadOnly : 0;
    if (head->header.version == kOldestRsrcVersion) std::memcpy(head->header.eol, kRsrcEol, sizeof kRsrcEol);
    if (sorts) map_.Sort();
    head->header.version = kRsrcVersion;
    return kNoErr;
}

MgErr OVResFile::ReadMap(const RsrcHeader& header, uint64 base) {
    if (header.mapLength <= kHeaderSize) return map_.MakeEmpty(header);
    // A length that the source does not have must not cost the memory for it.
    uint64 size = 0;
    if (const MgErr err = io_->Size(&size)) return err;
    const uint64 start = base + header.mapOffset;
    if (start > size || header.mapLength > size - start) return kEOFErr;
    UHandle bytes = DSNewHandle(header.mapLength);
    if (!bytes) return kMemFullErr;
    if (const MgErr err = io_->Read(start, *bytes, header.mapLength)) {
        DSDisposeHandle(bytes);
        return err;
    }
    return map_.FromDisk(bytes, header);
}

MgErr OVResFile::CreateInMemory(_FMFileType type, _FMFileCreator creator) {
    ResFileLock lock;
    if (const MgErr err = map_.MakeEmpty(EmptyHeader(type, creator))) return err;
    open_ = true;
    return kNoErr;
}

MgErr OVResFile::RCloseFile() {
    ResFileLock lock;
    if (!open_) return kNotResFileErr;
    if (const MgErr err = RUpdateFile()) return err;
    Dispose();
    return kNoErr;
}

void OVResFile::Dispose() {
    OVResChain::Forget(this);
    for (OVResource* resource : loaded_) delete resource;
    loaded_.clear();
    freeSlots_.clear();
    cache_.Empty();
    map_.Dispose();
    io_.reset();
    open_ = false;
}

// ---- loading --------------------------------------------------------------------------------------------------------

// The length word of an entry, which must lie in the data section with all it counts. What the file does not have any
// more is not taken from what was read ahead; `size` is what it has.
MgErr OVResFile::DataLengthAt(const ResourceEntry& entry, uint32* length, uint64* size) {
    const uint64 dataLength = map_.Head()->header.dataLength;
    const uint64 start = entry.data;
    if (start + 4 > dataLength || !io_) return kEOFErr;
    if (const MgErr err = io_->Size(size)) return err;
    if (DataStart() + start + 4 > *size) return kNotResFileErr;
    uint32 word = 0;
    if (const MgErr err = io_->Read(DataStart() + start, &word, 4)) return err == kEOFErr ? kNotResFileErr : err;
    *length = ToBig32(word);
    return start + 4 + *length > dataLength ? kEOFErr : kNoErr;
}

MgErr OVResFile::LoadData(const ResourceEntry& entry, std::unique_ptr<ResourceData>* data) {
    uint32 length = 0;
    uint64 size = 0;
    if (const MgErr err = DataLengthAt(entry, &length, &size)) return err;
    // Nor may a data section that the source does not have.
    const uint64 start = DataStart() + entry.data + 4;
    if (start > size || length > size - start) return kEOFErr;

    if (const uint8* place = io_->InPlace(start)) {
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
    return io_->Read(start, *handle, length);
}

OVResource* OVResFile::LoadedAt(const ResourceEntry& entry) const {
    return entry.loaded ? loaded_[entry.loaded - 1] : nullptr;
}

bool OVResFile::IsChanged(const ResourceEntry& entry) const {
    const OVResource* loaded = LoadedAt(entry);
    return (entry.attrs & kRChangedAttr) || (loaded && loaded->unwritten_);
}

MgErr OVResFile::Load(ResType type, ResourceEntry* entry, OVResource** resource) {
    OVResource* loaded = LoadedAt(*entry);
    if (!loaded || !loaded->data_) {
        std::unique_ptr<ResourceData> data;
        if (const MgErr err = LoadData(*entry, &data)) return err;
        if (loaded) {
            loaded->data_ = std::move(data);
        } else {
            auto made = std::make_unique<OVResource>(this, std::move(data));
            if (const MgErr err = Attach(made.get())) return err;
            loaded = made.release();
            entry->loaded = loaded->slot_;
        }
    }
    cache_.Set(loaded, type, map_.PositionOf(entry));
    *resource = loaded;
    return kNoErr;
}

MgErr OVResFile::Attach(OVResource* resource) {
    if (!freeSlots_.empty()) {
        resource->slot_ = freeSlots_.back();
        freeSlots_.pop_back();
        loaded_[resource->slot_ - 1] = resource;
        return kNoErr;
    }
    // Room for every slot to be given back, so that giving one back cannot fail.
    freeSlots_.reserve(loaded_.size() + 1);
    loaded_.push_back(resource);
    resource->slot_ = static_cast<uint32>(loaded_.size());
    return kNoErr;
}

void OVResFile::Forget(OVResource* resource) {
    loaded_[resource->slot_ - 1] = nullptr;
    freeSlots_.push_back(resource->slot_);
    resource->slot_ = 0;
    resource->file_ = nullptr;
    cache_.Empty();
}

FoundEntry OVResFile::FindEntry(const OVResource* resource) {
    if (const FoundEntry cached = cache_.Find(resource, map_); cached.entry) return cached;
    for (int32 i = 0, types = map_.TypeCount(); i < types; ++i) {
        const TypeEntry* type = map_.TypeAt(i);
        ResourceEntry* entries = map_.Entries(type);
        for (int32 k = 0, count = ResourceMap::CountOf(type); k < count; ++k) {
            if (entries[k].loaded != resource->slot_) continue;
            cache_.Set(resource, type->type, map_.PositionOf(&entries[k]));
            return {type->type, &entries[k]};
        }
    }
    return {};
}

// ---- reading --------------------------------------------------------------------------------------------------------

MgErr OVResFile::RGet(ResType type, int32 id, Resource** resource) {
    ResFileLock lock;
    if (!resource) return kArgErr;
    *resource = nullptr;
    if (!open_) return kNotResFileErr;
    ResourceEntry* entry = map_.FindEntry(type, id);
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
    if (!open_) return kNotResFileErr;
    if (!map_.FindEntry(type, id)) return kResNotFoundErr;
    *exists = 1;
    return kNoErr;
}

MgErr OVResFile::RGetNamed(ResType type, ConstPStr name, Resource** resource) {
    ResFileLock lock;
    if (!resource || !name) return kArgErr;
    *resource = nullptr;
    if (!open_) return kNotResFileErr;
    const TypeEntry* list = map_.FindType(type);
    if (!list) return kResNotFoundErr;
    ResourceEntry* entries = map_.Entries(list);
    for (int32 i = 0, count = ResourceMap::CountOf(list); i < count; ++i) {
        if (entries[i].name == kNoName || !FileNameEqual(map_.NameOf(&entries[i]), name)) continue;
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
    if (!open_) return kNotResFileErr;
    const ResourceEntry* entry = map_.FindEntry(type, id);
    if (!entry) return kResNotFoundErr;
    const OVResource* resource = LoadedAt(*entry);
    *loaded = resource && resource->data_;
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
    for (OVResource* resource : loaded_) {
        if (resource && resource->data_ && resource->data_->ContainsHandle(data)) return resource;
    }
    return nullptr;
}

MgErr OVResFile::RCount(ResType type, int32* count) {
    ResFileLock lock;
    if (!count) return kArgErr;
    *count = 0;
    if (!open_) return kNotResFileErr;
    if (const TypeEntry* list = map_.FindType(type)) *count = ResourceMap::CountOf(list);
    return kNoErr;
}

MgErr OVResFile::RCountTypes(int32* count) {
    ResFileLock lock;
    if (!count) return kArgErr;
    *count = 0;
    if (!open_) return kNotResFileErr;
    *count = map_.TypeCount();
    return kNoErr;
}

MgErr OVResFile::RGetInd(ResType type, int32 index, Resource** resource) {
    ResFileLock lock;
    if (!resource) return kArgErr;
    *resource = nullptr;
    if (!open_) return kNotResFileErr;
    const TypeEntry* list = map_.FindType(type);
    if (!list || index < 1 || index > ResourceMap::CountOf(list)) return kResNotFoundErr;
    return Guarded([&] {
        OVResource* loaded = nullptr;
        const MgErr err = Load(type, map_.Entries(list) + (index - 1), &loaded);
        *resource = loaded;
        return err;
    });
}

MgErr OVResFile::RGetIndType(ResType* type, int32 index) {
    ResFileLock lock;
    if (!type) return kArgErr;
    *type = 0;
    if (!open_) return kNotResFileErr;
    if (index < 1 || index > map_.TypeCount()) return kResNotFoundErr;
    *type = map_.TypeAt(index - 1)->type;
    return kNoErr;
}

int32 OVResFile::RUniqueID(ResType type) {
    ResFileLock lock;
    if (!open_) return kNotResFileErr;
    if (map_.IsEmpty()) return kFirstUniqueID;
    int32 id = nextUniqueID;
    if (map_.FindType(type)) {
        while (id <= kLastUniqueID && map_.FindEntry(type, id)) ++id;
        if (id > kLastUniqueID) return 0;
    }
    const auto next = static_cast<int32>(static_cast<uint32>(nextUniqueID) + 1);
    nextUniqueID = next <= kFirstUniqueID ? kFirstUniqueID : next;
    return id;
}

MgErr OVResFile::RGetModDate(Path path, uint32* date, int32* readOnly) {
    ResFileLock lock;
    if (!date) {
        ReportUnlocked([] { TESSEL_REPORT(kDebugError, 0x39F7D01Au) << "OVResFile::RGetModDate modDate is NULL"; });
        return kArgErr;
    }
    if (!open_) return kNotResFileErr;
    return FMGetModDate(path, io_ ? io_->File() : nullptr, date, readOnly);
}

MgErr OVResFile::RGetFileAttrs(uint32* attrs) {
    ResFileLock lock;
    if (!attrs) return kArgErr;
    if (!open_) return kNotResFileErr;
    *attrs = map_.Head()->fileAttrs;
    return kNoErr;
}

// ---- changing -------------------------------------------------------------------------------------------------------

MgErr OVResFile::RSetFileAttrs(uint32 attrs) {
    ResFileLock lock;
    if (!open_) return kNotResFileErr;
    if (IsReadOnly()) {
        ReportUnlocked(
            [] { TESSEL_REPORT(kDebugWarning, 0x0B74E9A2u) << "Tried to call RSetFileAttrs on a readonly file"; });
        return kPermissionErr;
    }
    map_.Head()->fileAttrs = attrs;
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
    if (!err) err = map_.Insert(type, id, name, &position);
    if (err) {
        held->DetachHandle();
        Forget(resource.get());
        return err;
    }
    resource->unwritten_ = true;
    map_.EntryAt(position)->loaded = resource->slot_;
    cache_.Set(resource.release(), type, position);
    Touch();
    return kNoErr;
}

MgErr OVResFile::RAdd(UHandle data, ResType type, int32 id, ConstPStr name) {
    ResFileLock lock;
    if (!open_) return kNotResFileErr;
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
    if (!open_) return kNotResFileErr;
    if (!data) return kResIDExistsErr;
    UHandle copy = nullptr;
    if (const MgErr err = DSPtrToHand(data, &copy, size)) return err;
    const MgErr err = RAdd(copy, type, id, name);
    if (err) DSDisposeHandle(copy);
    return err;
}

// What the entry's resource held is replaced by a copy. The handle of loaded data stays the same.
MgErr OVResFile::ReplaceWith(const void* bytes, uint32 size, ResType type, ResourceEntry* entry) {
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
        entry->loaded = resource->slot_;
        loaded = resource.release();
    } else if (UHandle own = loaded->data_ ? loaded->data_->GetSharedDSHandle() : nullptr) {
        if (const MgErr err = DSSwapHandles(own, copy)) return err;
    } else {
        loaded->data_ = std::move(data);
    }
    cache_.Set(loaded, type, map_.PositionOf(entry));
    return MarkChanged(loaded);
}

MgErr OVResFile::RReplacePtr(const void* data, uint32 size, ResType type, int32 id) {
    ResFileLock lock;
    if (!open_) return kNotResFileErr;
    if (IsReadOnly()) return kPermissionErr;
    ResourceEntry* entry = map_.FindEntry(type, id);
    if (!data || !entry) return kResIDExistsErr;
    return Guarded([&] { return ReplaceWith(data, size, type, entry); }) ? kResIDExistsErr : kNoErr;
}

MgErr OVResFile::RReplaceDSHandle(UHandle data, ResType type, int32 id) {
    if (!data || DSCheckHandle(data)) return RReplacePtr(nullptr, 0, type, id);
    return RReplacePtr(*data, DSGetHandleSize(data), type, id);
}

MgErr OVResFile::RRemove(Resource* resource) {
    ResFileLock lock;
    if (!open_) return kNotResFileErr;
    if (IsReadOnly()) return kPermissionErr;
    OVResource* own = OwnResource(resource);
    if (!own) return kResNotFoundErr;
    const FoundEntry found = FindEntry(own);
    if (!found.entry) return kResNotFoundErr;
    if (found.entry->attrs & kRProtectedAttr) return kResNotFoundErr;
    const uint32 position = map_.PositionOf(found.entry);
    Forget(own);
    delete own;
    map_.Remove(found.type, position);
    Touch();
    return kNoErr;
}

// `resource` if it is loaded in this file, else null.
OVResource* OVResFile::OwnResource(Resource* resource) const {
    for (OVResource* loaded : loaded_) {
        if (loaded && loaded == resource) return loaded;
    }
    return nullptr;
}

// ---- sources --------------------------------------------------------------------------------------------------------

MgErr OVResFile::RPreAllocFile(uint32 size) {
    ResFileLock lock;
    if (!open_) return kNotResFileErr;
    if (IsReadOnly()) {
        ReportUnlocked(
            [] { TESSEL_REPORT(kDebugWarning, 0x6F14B02Du) << "Tried to call RPreAllocFile on a readonly file"; });
        return kPermissionErr;
    }
    return io_ ? io_->Extend(size) : kPermissionErr;
}

MgErr OVResFile::RGetUHandleOwnership(UHandle* handle) {
    ResFileLock lock;
    if (!handle) return kArgErr;
    *handle = nullptr;
    if (!open_) return kNotResFileErr;
    *handle = io_ ? io_->ReleaseHandle() : nullptr;
    return *handle ? kNoErr : kGenericErr;
}

// ---- what the resources ask their file ------------------------------------------------------------------------------

MgErr OVResFile::Release(OVResource* resource) {
    const FoundEntry found = FindEntry(resource);
    if (!found.entry) return kResNotFoundErr;
    if (IsChanged(*found.entry)) {
        ReportUnlocked([] { TESSEL_REPORT(kDebugWarning, 0x28D5E16Au) << "!!! Tried to release a changed resource"; });
        return kArgErr;
    }
    found.entry->loaded = 0;
    Forget(resource);
    delete resource;
    return kNoErr;
}

MgErr OVResFile::MarkChanged(OVResource* resource) {
    if (IsReadOnly()) return kPermissionErr;
    const FoundEntry found = FindEntry(resource);
    if (!found.entry) return kResNotFoundErr;
    found.entry->attrs |= kRChangedAttr;
    resource->unwritten_ = true;
    Touch();
    return kNoErr;
}

MgErr OVResFile::Detach(OVResource* resource) {
    const FoundEntry found = FindEntry(resource);
    if (!found.entry) return kResNotFoundErr;
    if (IsChanged(*found.entry)) {
        ReportUnlocked([] { TESSEL_REPORT(kDebugWarning, 0x43BC97F0u) << "!!! Tried to detach a changed resource"; });
        return kResNotFoundErr;
    }
    found.entry->loaded = 0;
    Forget(resource);
    return kNoErr;
}

MgErr OVResFile::SetAttrs(const OVResource* resource, uint32 attrs) {
    if (IsReadOnly()) return kPermissionErr;
    const FoundEntry found = FindEntry(resource);
    if (!found.entry) return kResNotFoundErr;
    found.entry->attrs = attrs;
    Touch();
    return kNoErr;
}

MgErr OVResFile::GetInfo(const OVResource* resource, int32* id, ResType* type, PStr name) {
    const FoundEntry found = FindEntry(resource);
    if (!found.entry) return kResNotFoundErr;
    if (id) *id = found.entry->id;
    if (type) *type = found.type;
    if (name) CopyName(map_.NameOf(found.entry), name);
    return kNoErr;
}

MgErr OVResFile::GetAttrs(const OVResource* resource, uint32* attrs) {
    const FoundEntry found = FindEntry(resource);
    if (!found.entry) return kResNotFoundErr;
    *attrs = found.entry->attrs;
    return kNoErr;
}

}  // namespace tessel
