#include "resources/UncheckedMap.h"

#include <tessel/memory/TrackedMallocFree.h>

#include <algorithm>
#include <cstddef>
#include <cstring>
#include <vector>

namespace tessel {

namespace {

void SwapWord(uint8* word) {
    uint32 value;
    std::memcpy(&value, word, sizeof value);
    value = ToBig32(value);
    std::memcpy(word, &value, sizeof value);
}

uint32 HostWord(const uint8* word) {
    uint32 value;
    std::memcpy(&value, word, sizeof value);
    return value;
}

// A part of a map, as offsets from its start.
struct Extent {
    uint64 begin;
    uint64 end;
};
using Extents = std::vector<Extent, TrackedAllocator<Extent>>;

bool Overlap(Extents* extents) {
    std::sort(extents->begin(), extents->end(), [](const Extent& a, const Extent& b) { return a.begin < b.begin; });
    for (size_t i = 1; i < extents->size(); ++i) {
        if ((*extents)[i].begin < (*extents)[i - 1].end) return true;
    }
    return false;
}

// A walk over the lists of a map whose counts and offsets nobody has checked yet. Nothing outside `size` is touched.
class UncheckedMap {
public:
    UncheckedMap(uint8* map, uint32 size) : map_(map), size_(size) {}

    MgErr Standardize(MapDirection direction) {
        RsrcMap* head = reinterpret_cast<RsrcMap*>(map_);
        const bool fromDisk = direction == MapDirection::kFromDisk;
        if (!fromDisk) ReadHead(*head);
        SwapHeader(&head->header);
        for (size_t at = offsetof(RsrcMap, fileAttrs); at < sizeof(RsrcMap); at += 4) SwapWord(map_ + at);
        if (fromDisk) ReadHead(*head);
        if (size_ <= kEmptyMapSize) return kNoErr;
        if (!Fits(typeList_, kTypeCountSize) || typeList_ < kEmptyMapSize) return kIOErr;
        return StandardizeTypes(fromDisk);
    }

    // Whether names and lists lie apart and names end inside the map. Host order.
    MgErr CheckExtents() {
        if (Overlap(&lists_) || TypeTwice()) return kIOErr;
        const uint64 listsEnd = lists_.empty() ? typeList_ : lists_.back().end;
        if (nameList_ != 0 && (nameList_ < listsEnd || nameList_ > size_)) return kIOErr;
        if (!CollectNames()) return kIOErr;
        return Overlap(&names_) ? kIOErr : kNoErr;
    }

private:
    bool Fits(uint64 at, uint64 length) const { return at <= size_ && length <= size_ - at; }

    void ReadHead(const RsrcMap& head) {
        typeList_ = head.typeList;
        nameList_ = head.nameList;
    }

    // The count of a list in host order, which is stored as one less.
    int64 TakeCount(uint8* word, bool fromDisk) {
        if (fromDisk) SwapWord(word);
        const auto lastIndex = static_cast<int32>(HostWord(word));
        if (!fromDisk) SwapWord(word);
        return int64{lastIndex} + 1;
    }

    MgErr StandardizeTypes(bool fromDisk) {
        const int64 count = TakeCount(map_ + typeList_, fromDisk);
        const uint64 first = typeList_ + kTypeCountSize;
        if (count < 0 || !Fits(first, static_cast<uint64>(count) * kTypeEntrySize)) return kIOErr;
        typesEnd_ = first + static_cast<uint64>(count) * kTypeEntrySize;
        if (fromDisk) lists_.reserve(static_cast<size_t>(count));
        for (uint64 at = first; at < typesEnd_; at += kTypeEntrySize) {
            if (const MgErr err = StandardizeList(map_ + at, fromDisk)) return err;
        }
        return kNoErr;
    }

    MgErr StandardizeList(uint8* typeEntry, bool fromDisk) {
        const int64 count = TakeCount(typeEntry + offsetof(TypeEntry, lastIndex), fromDisk);
        uint8* offsetWord = typeEntry + offsetof(TypeEntry, list);
        if (fromDisk) SwapWord(offsetWord);
        const uint64 begin = typeList_ + uint64{HostWord(offsetWord)};
        if (!fromDisk) SwapWord(offsetWord);
        const uint64 length = static_cast<uint64>(count) * kRefEntrySize;
        if (count < 1 || begin < typesEnd_ || !Fits(begin, length)) return kIOErr;
        // Lists that overlap must not cost more than the map is long; Overlap refuses them later.
        listBytes_ += length;
        if (listBytes_ > size_) return kIOErr;
        if (fromDisk) lists_.push_back({begin, begin + length});
        for (uint64 at = begin; at < begin + length; at += kRefEntrySize) {
            for (uint64 word = 0; word < offsetof(ResourceEntry, loaded); word += 4) SwapWord(map_ + at + word);
        }
        return kNoErr;
    }

    bool TypeTwice() const {
        std::vector<ResType, TrackedAllocator<ResType>> types;
        for (uint64 at = typeList_ + kTypeCountSize; at < typesEnd_; at += kTypeEntrySize)
            types.push_back(HostWord(map_ + at));
        std::sort(types.begin(), types.end());
        return std::adjacent_find(types.begin(), types.end()) != types.end();
    }

    bool CollectNames() {
        for (const Extent& list : lists_) {
            for (uint64 at = list.begin; at < list.end; at += kRefEntrySize) {
                const auto name = static_cast<int32>(HostWord(map_ + at + offsetof(ResourceEntry, name)));
                if (name == kNoName) continue;
                const uint64 begin = nameList_ + uint64{static_cast<uint32>(name)};
                if (nameList_ == 0 || name < 0 || !Fits(begin, 1)) return false;
                const uint64 length = 1u + map_[begin];
                if (!Fits(begin, length)) return false;
                names_.push_back({begin, begin + length});
            }
        }
        return true;
    }

    uint8* map_;
    uint64 size_;
    uint64 typeList_ = 0;
    uint64 nameList_ = 0;
    uint64 typesEnd_ = 0;
    uint64 listBytes_ = 0;
    Extents lists_;
    Extents names_;
};

}  // namespace

bool SanityCheckRsrcMap(const RsrcHeader& copy, const RsrcHeader& header) {
    return copy.magic == header.magic && std::memcmp(copy.eol, header.eol, sizeof copy.eol) == 0 &&
           copy.version == header.version && copy.type == header.type && copy.creator == header.creator;
}

MgErr StandardizeAndSanityChkRsrcMap(uint8* map, uint32 size, MapDirection direction, const RsrcHeader& header) {
    UncheckedMap unchecked(map, size);
    if (const MgErr err = unchecked.Standardize(direction)) return err;
    if (direction == MapDirection::kToDisk) return kNoErr;
    const RsrcMap* head = reinterpret_cast<const RsrcMap*>(map);
    if (!SanityCheckRsrcMap(head->header, header)) return kIOErr;
    const auto length = static_cast<int32>(size);
    if (static_cast<int32>(head->typeList) > length || static_cast<int32>(head->nameList) > length) return kIOErr;
    return unchecked.CheckExtents();
}

}  // namespace tessel
