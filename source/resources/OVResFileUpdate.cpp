// Writing resource files back: the update, which also packs them, and the image of a whole file.
#include "diagnostics/Guarded.h"
#include "resources/OVResFile.h"
#include "resources/ResFileLock.h"
#include <tessel/diagnostics/DebugStream.h>
#include <tessel/memory/MemoryManager.h>

#include <algorithm>
#include <cstring>
#include <limits>

namespace tessel {

namespace {

// Up to this size an entry is put together and written at once.
constexpr uint32 kOneWriteLimit = 4096;

constexpr uint64 kLongestFile = std::numeric_limits<uint32>::max();

uint32 Padding(uint32 size) {
    return static_cast<uint32>(DiskSize(size) - 4 - size);
}

// The parts of a data entry, end to end. Returns what follows it.
uint8* PutEntry(uint8* to, const uint8* data, uint32 size) {
    const uint32 length = ToBig32(size);
    std::memcpy(to, &length, 4);
    if (size) std::memcpy(to + 4, data, size);
    std::memset(to + 4 + size, 0, Padding(size));
    return to + DiskSize(size);
}

MgErr WriteEntry(OVResfileIO& io, uint64 position, const uint8* data, uint32 size) {
    if (DiskSize(size) <= kOneWriteLimit) {
        uint8 entry[kOneWriteLimit];
        PutEntry(entry, data, size);
        return io.Write(position, entry, static_cast<uint32>(DiskSize(size)));
    }
    static const uint8 kZeros[4] = {};
    const uint32 length = ToBig32(size);
    if (const MgErr err = io.Write(position, &length, 4)) return err;
    if (const MgErr err = io.Write(position + 4, data, size)) return err;
    return Padding(size) ? io.Write(position + 4 + size, kZeros, Padding(size)) : kNoErr;
}

// A pointer block that frees itself.
class Block {
public:
    explicit Block(uint32 size) : data_(DSNewPtr(size)) {}
    ~Block() {
        if (data_) DSDisposePtr(data_);
    }
    Block(const Block&) = delete;
    Block& operator=(const Block&) = delete;
    uint8* get() const { return data_; }

private:
    UPtr data_;
};

}  // namespace

// A reference entry on its way through an update.
struct OVResFile::Entry {
    uint32 position;  // in the map
    uint32 data;      // where its data are, from the data section start
    uint64 diskSize;  // what its data take up on disk now
    bool changed;
};

// One update. Everything that can fail without a write is done before the first write, so that a damaged entry or a
// full memory leaves the file as it was. After each entry that is written the map says where it is; what a failed write
// may have spoilt on disk is marked changed, and is written again from memory by the next update.
class OVResFile::Updating {
public:
    explicit Updating(OVResFile* file) : file_(*file), map_(file->map_), io_(*file->io_) {}
    ~Updating() { DropLoaded(); }

    MgErr Run() {
        if (const MgErr err = Collect()) return err;
        if (const MgErr err = LoadChanged()) return err;
        SkipPacked();
        if (const MgErr err = LoadEndangered()) return err;
        if (const MgErr err = ReserveLength()) return err;
        for (; next_ < entries_.size(); ++next_) {
            if (const MgErr err = Move(&entries_[next_])) return err;
        }
        return file_.UpdateMap(end_);
    }

private:
    using Entries = std::vector<Entry, TrackedAllocator<Entry>>;

    ResourceEntry* At(const Entry& entry) const { return map_.EntryAt(entry.position); }

    // Lists every entry, unchanged ones first, those by where their data are.
    MgErr Collect() {
        Positions positions;
        map_.CollectEntries(&positions);
        if (static_cast<int64>(positions.size()) != map_.ReferenceCount()) {
            ReportUnlocked([] {
                TESSEL_REPORT(kDebugError, 0x5CE02A97u)
                    << "OVResFile::RUpdateFile. Resource map rsrc count wrong. Possible memory corruption.";
            });
            return kArgErr;
        }
        entries_.reserve(positions.size());
        loadedHere_.reserve(positions.size());
        for (const uint32 position : positions) {
            const ResourceEntry* entry = map_.EntryAt(position);
            entries_.push_back({position, entry->data, 0, file_.IsChanged(*entry)});
        }
        const auto firstChanged =
            std::stable_partition(entries_.begin(), entries_.end(), [](const Entry& entry) { return !entry.changed; });
        unchanged_ = static_cast<size_t>(firstChanged - entries_.begin());
        std::sort(entries_.begin(), firstChanged, [](const Entry& a, const Entry& b) { return a.data < b.data; });
        return MeasureUnchanged();
    }

    MgErr MeasureUnchanged() {
        for (size_t i = 0; i < unchanged_; ++i) {
            uint32 length = 0;
            if (const MgErr err = file_.DataLengthAt(*At(entries_[i]), &length)) return err;
            entries_[i].diskSize = DiskSize(length);
        }
        return kNoErr;
    }

    // Marked changed but not in memory: what is on disk counts.
    MgErr LoadChanged() {
        for (size_t i = unchanged_; i < entries_.size(); ++i) {
            if (const MgErr err = EnsureLoaded(entries_[i])) return err;
        }
        return kNoErr;
    }

    // Passes over what is packed at the front already.
    void SkipPacked() {
        while (next_ < unchanged_ && entries_[next_].data == end_) end_ += entries_[next_++].diskSize;
    }

    uint64 SizeToWrite(const Entry& entry) const {
        const OVResource* loaded = file_.LoadedAt(*At(entry));
        return loaded && loaded->data_ ? DiskSize(loaded->data_->GetSize()) : entry.diskSize;
    }

    // Entries move down, so that each is read before anything is written over it. Where they overlap, or one grew in
    // memory, that does not hold, and all are loaded first.
    MgErr LoadEndangered() {
        uint64 end = end_;
        bool endangered = false;
        for (size_t i = next_; i < unchanged_; ++i) {
            endangered = endangered || end > entries_[i].data;
            end += SizeToWrite(entries_[i]);
        }
        for (size_t i = next_; endangered && i < unchanged_; ++i) {
            if (const MgErr err = EnsureLoaded(entries_[i])) return err;
        }
        return kNoErr;
    }

    MgErr ReserveLength() {
        uint64 end = kHeaderSize + end_ + map_.Size();
        for (size_t i = next_; i < entries_.size(); ++i) end += SizeToWrite(entries_[i]);
        if (end > kLongestFile) return kDiskFullErr;
        return io_.Reserve(static_cast<uint32>(end));
    }

    MgErr EnsureLoaded(const Entry& entry) {
        ResourceEntry* reference = At(entry);
        const OVResource* loaded = file_.LoadedAt(*reference);
        if (loaded && loaded->data_) return kNoErr;
        if (loaded && entry.changed) return kResNotFoundErr;  // its data were taken away
        OVResource* made = nullptr;
        if (const MgErr err = file_.Load(0, reference, &made)) return err;
        file_.cache_.Empty();
        if (!loaded) loadedHere_.push_back(entry.position);
        return kNoErr;
    }

    MgErr Move(Entry* entry) {
        if (const MgErr err = EnsureLoaded(*entry)) return err;
        ResourceEntry* reference = At(*entry);
        OVResource* resource = file_.LoadedAt(*reference);
        const ResourceData* data = resource->data_.get();
        const MgErr err = WriteEntry(io_, file_.DataStart() + end_, data->GetData(), data->GetSize());
        resource->unwritten_ = err != kNoErr;
        if (err) {
            reference->attrs |= kRChangedAttr;
            return err;
        }
        reference->data = static_cast<uint32>(end_);
        reference->attrs &= ~uint32{kRChangedAttr};
        end_ += DiskSize(data->GetSize());
        RsrcHeader& header = map_.Head()->header;
        header.dataLength = std::max(header.dataLength, static_cast<uint32>(end_));
        return kNoErr;
    }

    // What was loaded only to be moved goes again, except what a failed write left in memory alone.
    void DropLoaded() {
        for (const uint32 position : loadedHere_) {
            ResourceEntry* reference = map_.EntryAt(position);
            if (file_.IsChanged(*reference)) continue;
            OVResource* resource = file_.LoadedAt(*reference);
            reference->loaded = 0;
            file_.Forget(resource);
            delete resource;
        }
    }

    OVResFile& file_;
    ResourceMap& map_;
    OVResfileIO& io_;
    Entries entries_;
    size_t unchanged_ = 0;  // how many entries come before the changed ones
    size_t next_ = 0;       // the first entry that is not at its place
    uint64 end_ = 0;        // where the next entry goes, from the data section start
    Positions loadedHere_;
};

MgErr OVResFile::RUpdateFile() {
    ResFileLock lock;
    if (!open_) return kNotResFileErr;
    if (!(map_.Head()->fileAttrs & kRFileChanged)) return kNoErr;
    if (!io_ || !io_->CanWrite()) return kNoErr;
    const MgErr err = Guarded([&] {
        if (map_.IsEmpty()) return WriteEmpty();
        if (const MgErr rebaseErr = RebaseData()) return rebaseErr;
        return Updating(this).Run();
    });
    if (!err) map_.Head()->fileAttrs &= ~uint32{kRFileChanged};
    return err;
}

MgErr OVResFile::WriteEmpty() {
    RsrcHeader header = map_.Head()->header;
    SwapHeader(&header);
    if (const MgErr err = io_->Write(0, &header, kHeaderSize)) return err;
    if (const MgErr err = io_->SetSize(kHeaderSize)) return err;
    return io_->Flush();
}

// Counts data offsets from where an update puts the data section. The data stay where they are.
MgErr OVResFile::RebaseData() {
    RsrcHeader& header = map_.Head()->header;
    if (header.dataOffset == kHeaderSize) return kNoErr;
    if (header.dataOffset < kHeaderSize) return kIOErr;
    const uint64 by = header.dataOffset - kHeaderSize;
    if (by + header.dataLength > kLongestFile) return kEOFErr;
    Positions positions;
    map_.CollectEntries(&positions);
    for (const uint32 position : positions) {
        ResourceEntry* entry = map_.EntryAt(position);
        // An entry outside the data section stays outside.
        entry->data = static_cast<uint32>(std::min(entry->data + by, kLongestFile));
    }
    header.dataOffset = kHeaderSize;
    header.dataLength += static_cast<uint32>(by);
    return kNoErr;
}

MgErr OVResFile::UpdateMap(uint64 dataLength) {
    // The map is converted in a copy: the one in memory keeps its numbers and its loaded resources.
    Block bytes(map_.Size());
    if (!bytes.get()) {
        ReportUnlocked([] { TESSEL_REPORT(kDebugError, 0x174DB8E3u) << "Could not allocate temp handle storage."; });
        return kMemFullErr;
    }
    map_.SetLayout(static_cast<uint32>(dataLength));
    map_.ToDisk(bytes.get());
    const RsrcHeader& header = map_.Head()->header;
    if (const MgErr err = io_->Write(header.mapOffset, bytes.get(), header.mapLength)) return err;
    if (const MgErr err = io_->SetSize(header.mapOffset + header.mapLength)) return err;
    if (const MgErr err = io_->Write(0, bytes.get(), kHeaderSize)) return err;
    return io_->Flush();
}

// ---- the image of a whole file --------------------------------------------------------------------------------------

MgErr OVResFile::RGetMemFileHandle(UHandle* image) {
    ResFileLock lock;
    if (!image) return kArgErr;
    *image = nullptr;
    if (!open_) return kNotResFileErr;
    if (io_ && io_->Handle()) {
        if (const MgErr err = RUpdateFile()) return err;
        return RGetUHandleOwnership(image);
    }
    return Guarded([&] { return BuildImage(image); });
}

// What all data take up, which must be loaded.
MgErr OVResFile::MeasureLoaded(const Positions& positions, uint64* dataLength) const {
    *dataLength = 0;
    for (const uint32 position : positions) {
        const OVResource* loaded = LoadedAt(*map_.EntryAt(position));
        if (!loaded || !loaded->data_) return kArgErr;
        *dataLength += DiskSize(loaded->data_->GetSize());
    }
    return kNoErr;
}

// A file made in memory takes on the places that its data have in the image, but its resources stay unwritten: there is
// nothing to load them from. A file that has a source keeps its own map.
MgErr OVResFile::BuildImage(UHandle* image) {
    Positions positions;
    map_.CollectEntries(&positions);
    uint64 dataLength = 0;
    if (const MgErr err = MeasureLoaded(positions, &dataLength)) return err;
    const uint64 size = kHeaderSize + dataLength + (map_.IsEmpty() ? 0 : map_.Size());
    if (size > kLongestFile) return kMemFullErr;

    ResourceMap copy;
    if (io_) {
        if (const MgErr err = copy.CopyOf(map_)) return err;
    }
    *image = DSNewHandle(static_cast<uint32>(size));
    if (!*image) return kMemFullErr;
    LayOut(io_ ? &copy : &map_, positions, static_cast<uint32>(dataLength), **image);
    return kNoErr;
}

// Writes header, data in the order of the map, and map.
void OVResFile::LayOut(ResourceMap* map, const Positions& positions, uint32 dataLength, uint8* image) const {
    uint8* const start = image + kHeaderSize;
    uint8* to = start;
    for (const uint32 position : positions) {
        ResourceEntry* entry = map->EntryAt(position);
        const ResourceData* data = LoadedAt(*entry)->data_.get();
        entry->data = static_cast<uint32>(to - start);
        entry->attrs &= ~uint32{kRChangedAttr};
        to = PutEntry(to, data->GetData(), data->GetSize());
    }
    map->SetLayout(dataLength);
    if (!map->IsEmpty()) map->ToDisk(to);
    RsrcHeader header = map->Head()->header;
    SwapHeader(&header);
    std::memcpy(image, &header, kHeaderSize);
}

}  // namespace tessel
