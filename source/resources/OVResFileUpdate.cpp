// Writing resource files back: the update, which also packs them.
//
// After a kill or a power loss at any moment, and after any failure, the next open finds the file as it was or as it
// was to be, whole. There are three ways to that, tried in this order:
//
// A new file: the image is written beside the old one, flushed, and takes its name (platform/Replacement.h). It needs
// room for the whole image.
//
// In place, where no new file can stand in for the old one: it has several names, was opened by reference, its folder
// cannot be written or its owner not be kept; or the device has no room for an image. What has to move is written
// behind the end of the file with a map that names it there, and flushed; then the header, 32 bytes in the first
// sector, is turned over to that map. From then on the file is the new one, if not yet packed: where the old one's data
// were is room now, and everything is written to its place there and turned over once more. Whenever that ends, a
// reader finds a whole file at the places that the header gives. With less room only what changed is written behind the
// end, and the file stays unpacked until its next update.
//
// On the spot, when there is not even room for that, and the update needs no more than the file has: everything is read
// first, and put back if a write fails. A kill in this moment is the one that may leave neither file.
#include "diagnostics/Guarded.h"
#include "files/FileSupport.h"
#include "platform/Replacement.h"
#include "resources/ImageOutput.h"
#include "resources/OVResFile.h"
#include "resources/ResFileLock.h"
#include <tessel/diagnostics/DebugStream.h>
#include <tessel/memory/MemoryManager.h>

#include <algorithm>
#include <cstring>
#include <limits>

namespace tessel {

namespace {

constexpr uint64 kLongestFile = std::numeric_limits<uint32>::max();

using Bytes = std::vector<uint8, TrackedAllocator<uint8>>;

uint64 AlignedUp(uint64 offset) {
    return (offset + 3) & ~uint64{3};
}

}  // namespace

// A reference entry on its way through an update.
struct OVResFile::Entry {
    uint32 position;           // in the map
    bool changed;              // has to be written
    uint64 data;               // where its bytes are, from the data section start
    uint64 place;              // where they go
    uint32 diskLength;         // of its data, where they are
    uint32 length;             // of what is written
    const ResourceData* held;  // what is written, or null: the bytes on disk
};

class OVResFile::Updating {
public:
    explicit Updating(OVResFile* file) : file_(*file), map_(file->map_), io_(*file->io_) {}

    MgErr Run() {
        if (const MgErr err = Collect()) return err;
        PassPacked();
        Lay(packed_, packedEnd_);
        if (End() > kLongestFile) return kDiskFullErr;
        if (io_.Handle()) return InMemory();
        bool inPlace = !io_.CanBeReplaced();
        if (!inPlace) {
            const MgErr err = ReplaceFile(&inPlace);
            if (!inPlace) return err;
        }
        return map_.IsEmpty() ? EmptyInPlace() : InPlace();
    }

private:
    using Entries = std::vector<Entry, TrackedAllocator<Entry>>;

    // What stands around the data: the header, and the map without slots of loaded resources.
    struct Frame {
        RsrcHeader header;
        Bytes map;
    };

    // ---- what there is ----

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
        for (const uint32 position : positions) {
            const ResourceEntry* entry = map_.EntryAt(position);
            entries_.push_back({position, file_.IsChanged(*entry), entry->data, 0, 0, 0, nullptr});
        }
        const auto firstChanged =
            std::stable_partition(entries_.begin(), entries_.end(), [](const Entry& entry) { return !entry.changed; });
        unchanged_ = static_cast<size_t>(firstChanged - entries_.begin());
        std::sort(entries_.begin(), firstChanged, [](const Entry& a, const Entry& b) { return a.data < b.data; });
        for (Entry& entry : entries_) {
            if (const MgErr err = Measure(&entry)) return err;
        }
        return kNoErr;
    }

    // Of what is marked changed but is not in memory, what is on disk counts.
    MgErr Measure(Entry* entry) const {
        const ResourceEntry& reference = *map_.EntryAt(entry->position);
        const OVResource* loaded = file_.LoadedAt(reference);
        entry->held = loaded ? loaded->data_.get() : nullptr;
        if (entry->changed && loaded && !entry->held) return kResNotFoundErr;  // its data were taken away
        if (!entry->changed || !entry->held) {
            uint64 size = 0;
            if (const MgErr err = file_.DataLengthAt(reference, &entry->diskLength, &size)) return err;
        }
        entry->length = entry->held ? entry->held->GetSize() : entry->diskLength;
        return kNoErr;
    }

    // Passes over what is packed at the front already, which stays as it is.
    void PassPacked() {
        for (; packed_ < unchanged_ && entries_[packed_].data == packedEnd_; ++packed_) {
            packedEnd_ += DiskSize(entries_[packed_].diskLength);
        }
    }

    // Gives all entries from one on their places, end to end.
    void Lay(size_t from, uint64 start) {
        first_ = from;
        start_ = end_ = start;
        for (size_t i = 0; i < entries_.size(); ++i) {
            Entry& entry = entries_[i];
            entry.place = i < from ? entry.data : end_;
            if (i >= from) end_ += DiskSize(entry.length);
        }
    }

    // The file's length as laid.
    uint64 End() const { return kHeaderSize + end_ + (map_.IsEmpty() ? 0 : map_.Size()); }

    // ---- writing ----

    MgErr MakeFrame(Frame* frame) const {
        const RsrcHeader& header = map_.Head()->header;
        frame->header = EmptyHeader(header.type, header.creator);
        frame->map.clear();
        if (!map_.IsEmpty()) {
            ResourceMap copy;
            MgErr err = copy.CopyOf(map_);
            if (!err)
                err = Guarded([&] {
                    frame->map.resize(map_.Size());
                    return kNoErr;
                });
            if (err) {
                ReportUnlocked(
                    [] { TESSEL_REPORT(kDebugError, 0x174DB8E3u) << "Could not allocate temp handle storage."; });
                return err;
            }
            SetPlaces(copy);
            copy.ToDisk(frame->map.data());
            frame->header = copy.Head()->header;
        }
        SwapHeader(&frame->header);
        return kNoErr;
    }

    void SetPlaces(ResourceMap& map) const {
        for (const Entry& entry : entries_) {
            ResourceEntry* reference = map.EntryAt(entry.position);
            reference->data = static_cast<uint32>(entry.place);
            if (entry.changed) reference->attrs &= ~uint32{kRChangedAttr};
        }
        map.SetLayout(static_cast<uint32>(end_));
    }

    MgErr PutEntry(const Entry& entry) {
        const uint32 length = ToBig32(entry.length);
        MgErr err = output_.Put(&length, 4);
        if (!err && entry.held)
            err = output_.Put(entry.held->GetData(), entry.length);
        else if (!err)
            err = output_.Copy(io_, file_.DataStart() + entry.data + 4, entry.length);
        return err ? err : output_.PutZeros(static_cast<uint32>(DiskSize(entry.length) - 4 - entry.length));
    }

    // The entries as laid, and the map behind them, to where `to` stands.
    MgErr PutRest(const Frame& frame) {
        for (size_t i = first_; i < entries_.size(); ++i) {
            if (const MgErr err = PutEntry(entries_[i])) return err;
        }
        if (const MgErr err = output_.Put(frame.map.data(), static_cast<uint32>(frame.map.size()))) return err;
        return output_.Drain();
    }

    MgErr WriteImage(OVResfileIO* to) {
        Frame frame;
        MgErr err = MakeFrame(&frame);
        if (!err) err = to->Reserve(static_cast<uint32>(End()));
        output_.Start(to, 0);
        if (!err) err = output_.Put(&frame.header, kHeaderSize);
        if (!err) err = output_.Copy(io_, file_.DataStart(), packedEnd_);
        return err ? err : PutRest(frame);
    }

    // What is laid is what the file holds.
    void Accept() {
        SetPlaces(map_);
        for (Entry& entry : entries_) {
            entry.data = entry.place;
            OVResource* loaded = file_.LoadedAt(*map_.EntryAt(entry.position));
            if (loaded && entry.changed) loaded->unwritten_ = false;
        }
    }

    // ---- a new image ----

    MgErr InMemory() {
        UHandle image = DSNewHandle(0);
        if (!image) return kMemFullErr;
        OVResfileIO to;
        to.UseHandle(image, false);
        MgErr err = Guarded([&] { return WriteImage(&to); });
        if (!err) err = io_.Assign(*image, static_cast<uint32>(End()));
        DSDisposeHandle(image);
        if (!err) Accept();
        return err;
    }

    // *inPlace: a new file cannot stand in for this one, or there is no room for it; nothing of it is left.
    MgErr ReplaceFile(bool* inPlace) {
        platform::Replacement replacement;
        if (const MgErr err = io_.BeginReplacement(&replacement, inPlace)) return err;
        OVResfileIO to;
        to.UseFile(FileOf(replacement.File()), false);
        MgErr err = WriteImage(&to);
        if (!err) err = io_.FinishReplacement(&replacement, inPlace);
        if (!err || replacement.HasName()) Accept();
        *inPlace = *inPlace || err == kDiskFullErr;
        return err;
    }

    // ---- in place ----

    // The header alone says that there is nothing.
    MgErr EmptyInPlace() {
        Frame frame;
        if (const MgErr err = MakeFrame(&frame)) return err;
        bool undone = true;
        if (const MgErr err = io_.SwitchHeader(frame.header, &undone)) return err;
        Accept();
        if (!io_.SetSize(kHeaderSize)) io_.Flush();
        return kNoErr;
    }

    MgErr InPlace() {
        uint64 size = 0;
        if (const MgErr err = io_.Size(&size)) return err;
        const uint64 end = End();
        const uint64 behind = AlignedUp(std::max<uint64>(size, kHeaderSize)) - kHeaderSize;
        MgErr err = WriteBehind(packed_, std::max(behind, AlignedUp(end) - kHeaderSize), size);
        if (!err) {
            Pack();
            return kNoErr;
        }
        if (err == kDiskFullErr) err = WriteBehind(unchanged_, behind, size);
        if (err != kDiskFullErr || end > size) return err;
        Lay(packed_, packedEnd_);
        return OnTheSpot(size);
    }

    // Everything from an entry on, and the map, behind the end, and the header turned over to it.
    MgErr WriteBehind(size_t from, uint64 start, uint64 oldSize) {
        Lay(from, start);
        if (End() > kLongestFile) return kDiskFullErr;
        Frame frame;
        if (const MgErr err = MakeFrame(&frame)) return err;
        MgErr err = io_.Reserve(static_cast<uint32>(End()));
        if (err) return err;
        bool undone = true;
        err = WriteAndSwitch(frame, &undone);
        if (!err) Accept();
        if (err && undone) io_.SetSize(static_cast<uint32>(oldSize));
        return err;
    }

    MgErr WriteAndSwitch(const Frame& frame, bool* undone) {
        output_.Start(&io_, kHeaderSize + start_);
        MgErr err = PutRest(frame);
        if (!err) err = io_.Flush();
        return err ? err : io_.SwitchHeader(frame.header, undone);
    }

    // The update is done; a failure here leaves the file whole and unpacked.
    void Pack() {
        Lay(packed_, packedEnd_);
        Frame frame;
        bool undone = true;
        if (MakeFrame(&frame) || WriteAndSwitch(frame, &undone)) return;
        Accept();
        if (!io_.SetSize(static_cast<uint32>(End()))) io_.Flush();
    }

    // ---- on the spot ----

    MgErr OnTheSpot(uint64 size) {
        Frame frame;
        if (const MgErr err = MakeFrame(&frame)) return err;
        const uint64 from = kHeaderSize + packedEnd_;
        const auto count = static_cast<uint32>(End() - from);
        Bytes old(count);
        if (const MgErr err = io_.Read(from, old.data(), count)) return err;
        UHandle fresh = DSNewHandle(count);
        if (!fresh) return kMemFullErr;
        OVResfileIO to;
        to.UseHandle(fresh, false);
        output_.Start(&to, 0);
        MgErr err = PutRest(frame);
        if (!err) err = OverwriteWith(*fresh, old, from, frame.header);
        DSDisposeHandle(fresh);
        if (err) return err;
        Accept();
        if (End() < size && !io_.SetSize(static_cast<uint32>(End()))) io_.Flush();
        return kNoErr;
    }

    MgErr OverwriteWith(const uint8* fresh, const Bytes& old, uint64 from, const RsrcHeader& header) {
        const auto count = static_cast<uint32>(old.size());
        bool undone = true;
        MgErr err = io_.Write(from, fresh, count);
        if (!err) err = io_.Flush();
        if (!err) err = io_.SwitchHeader(header, &undone);
        if (err && !io_.Write(from, old.data(), count)) io_.Flush();
        return err;
    }

    OVResFile& file_;
    ResourceMap& map_;
    OVResfileIO& io_;
    ImageOutput output_;
    Entries entries_;
    size_t unchanged_ = 0;  // how many entries come before the changed ones
    size_t packed_ = 0;     // how many of those are at their places
    uint64 packedEnd_ = 0;  // and where they end, from the data section start
    size_t first_ = 0;      // the first entry that is laid anew,
    uint64 start_ = 0;      // from here on
    uint64 end_ = 0;        // and where the last one ends
};

MgErr OVResFile::RUpdateFile() {
    ResFileLock lock;
    if (!open_) return kNotResFileErr;
    if (!(map_.Head()->fileAttrs & kRFileChanged)) return kNoErr;
    if (!io_ || !io_->CanWrite()) return kNoErr;
    const MgErr err = Guarded([&] {
        if (const MgErr rebaseErr = RebaseData()) return rebaseErr;
        return Updating(this).Run();
    });
    if (!err) map_.Head()->fileAttrs &= ~uint32{kRFileChanged};
    return err;
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

}  // namespace tessel
