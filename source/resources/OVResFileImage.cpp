// The image of a whole resource file in memory.
#include "diagnostics/Guarded.h"
#include "resources/OVResFile.h"
#include "resources/ResFileLock.h"
#include <tessel/memory/MemoryManager.h>

#include <cstring>
#include <limits>

namespace tessel {

namespace {

constexpr uint64 kLongestFile = std::numeric_limits<uint32>::max();

// The parts of a data entry, end to end. Returns what follows it.
uint8* PutEntry(uint8* to, const uint8* data, uint32 size) {
    const uint32 length = ToBig32(size);
    const uint64 diskSize = DiskSize(size);
    std::memcpy(to, &length, 4);
    if (size) std::memcpy(to + 4, data, size);
    std::memset(to + 4 + size, 0, static_cast<size_t>(diskSize - 4 - size));
    return to + diskSize;
}

}  // namespace

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
