// Readers and writers, and the strings and paths that resources hold.
#include "diagnostics/Guarded.h"
#include "resources/Refnums.h"
#include "resources/ResFileLock.h"
#include <tessel/diagnostics/DebugStream.h>
#include <tessel/memory/MemoryManager.h>
#include <tessel/paths/PathManager.h>
#include <tessel/resources/RFReadWrite.h>

#include <cstring>
#include <new>

namespace tessel {

namespace {

constexpr ResType kStringType = TESSEL_FOURCC('S', 'T', 'R', ' ');
constexpr ResType kStringListType = TESSEL_FOURCC('S', 'T', 'R', '#');
constexpr ResType kPathListType = TESSEL_FOURCC('P', 'T', 'H', '#');
constexpr uint8 kPathTag[4] = {'P', 'T', 'H', '0'};

uint32 Big32(const uint8* bytes) {
    return uint32{bytes[0]} << 24 | uint32{bytes[1]} << 16 | uint32{bytes[2]} << 8 | uint32{bytes[3]};
}

uint64 RoundUp4(uint64 size) {
    return (size + 3) & ~uint64{3};
}

// Bytes of a resource that are read in order, and never beyond their end.
struct Bytes {
    const uint8* data;
    uint64 size;

    bool Skip(uint64 count) {
        if (count > size) return false;
        data += count;
        size -= count;
        return true;
    }
};

// The count at the head of a list whose entries are numbered from 1.
MgErr EnterList(Bytes* list, int32 index) {
    if (list->size < 4) return kEOFErr;
    if (index < 1 || static_cast<uint32>(index) > Big32(list->data)) return kResNotFoundErr;
    list->Skip(4);
    return kNoErr;
}

// The text of a "STR " resource: as long as the resource says, in one byte.
Bytes StringText(const uint8* data, uint32 size) {
    if (size == 0) return {data, 0};
    return {data + 1, (size - 1) & 0xFF};
}

MgErr FindLongString(Bytes* list, int32 index) {
    if (const MgErr err = EnterList(list, index)) return err;
    for (int32 k = 1;; ++k) {
        if (list->size < 4) return kEOFErr;
        const uint32 length = Big32(list->data);
        list->Skip(4);
        if (length > list->size) return kEOFErr;
        if (k == index) {
            list->size = length;
            return kNoErr;
        }
        if (!list->Skip(RoundUp4(length))) return kEOFErr;
    }
}

// Leaves the flattened form of an entry.
MgErr FindPath(Bytes* list, int32 index) {
    if (const MgErr err = EnterList(list, index)) return err;
    for (int32 k = 1;; ++k) {
        if (list->size < 8) return kEOFErr;
        if (std::memcmp(list->data, kPathTag, sizeof kPathTag) != 0) {
            ReportUnlocked([] { TESSEL_REPORT(kDebugWarning, 0x4981AE5Cu) << "This doesn't contain a path resource"; });
            return kResNotFoundErr;
        }
        const uint64 length = uint64{8} + Big32(list->data + 4);
        if (length > list->size) return kEOFErr;
        if (k == index) {
            list->size = length;
            return kNoErr;
        }
        if (!list->Skip(RoundUp4(length))) return kEOFErr;
    }
}

MgErr ReadPath(const Bytes& flattened, Path* path) {
    if (flattened.size > INT32_MAX) return kCorruptErr;
    const auto length = static_cast<int32>(flattened.size);
    return FUnFlattenPath2(flattened.data, path, length) > length ? kCorruptErr : kNoErr;
}

// All bytes of a resource.
MgErr FindBytes(RFReader& reader, ResType type, int32 id, Bytes* bytes) {
    uint32 size = 0;
    const MgErr err = reader.PtrToResDataInternal(type, id, &bytes->data, &size);
    bytes->size = size;
    return err;
}

MgErr AssignText(const Bytes& text, std::string* out) {
    out->assign(reinterpret_cast<const char*>(text.data), static_cast<size_t>(text.size));
    return kNoErr;
}

// The data of a resource in place. `find` looks for the resource.
template <class Find>
MgErr PointToData(const uint8** data, uint32* size, Find find) {
    if (!data) return kArgErr;
    *data = nullptr;
    if (size) *size = 0;
    ResFileLock lock;
    Resource* resource = nullptr;
    if (const MgErr err = find(&resource)) return err;
    *data = resource->GetData();
    if (size) *size = resource->GetSize();
    return kNoErr;
}

// Hands the data of a resource over to the caller and ends the resource. With changes that are not written it stays.
MgErr TakeData(Resource* resource, UHandle* data) {
    if (!resource->GetSharedDSHandle()) return kMemFullErr;
    if (const MgErr err = resource->DetachResource()) return err;
    const MgErr err = resource->DetachHandle(data);
    delete resource;
    return err;
}

template <class Find>
MgErr TakeFoundData(UHandle* data, Find find) {
    if (!data) return kArgErr;
    *data = nullptr;
    ResFileLock lock;
    Resource* resource = nullptr;
    if (const MgErr err = find(&resource)) return err;
    return TakeData(resource, data);
}

}  // namespace

// ---- the reader -----------------------------------------------------------------------------------------------------

RFReader::RFReader(ResChain* chain) : chain_(chain) {
}

RFReader::RFReader(RsrcFile refnum) : chain_(RsrcFileToRMapResChain(refnum)) {
}

RFReader::~RFReader() {
    ReleaseRsrcFileRefnum();
    if (!ownsChain_ || !chain_) return;
    ResFileLock lock;
    chain_->RCloseFile();
    ForgetRefnumsOf(chain_);
    delete chain_;
}

// Takes over a chain in the place of the one before.
MgErr RFReader::Adopt(ResChain* chain) {
    if (ownsChain_ && chain_) {
        if (const MgErr err = Close()) {
            chain->RCloseFile();
            delete chain;
            return err;
        }
    }
    ReleaseRsrcFileRefnum();
    chain_ = chain;
    ownsChain_ = true;
    return kNoErr;
}

MgErr RFReader::OpenPath(Path path, int32 mode, _FMFileType* type, _FMFileCreator* creator) {
    ResFile* file = nullptr;
    if (const MgErr err = ResFileFactory::ROpenPath(path, mode, &file, type, creator)) return err;
    return Adopt(file);
}

MgErr RFReader::Close() {
    if (!chain_) return kNotFoundErr;
    ResFileLock lock;
    if (const MgErr err = chain_->RCloseFile()) return err;
    ForgetRefnumsOf(chain_);
    delete chain_;
    chain_ = nullptr;
    refnum_ = 0;
    ownsChain_ = false;
    return kNoErr;
}

MgErr RFReader::PtrToResDataInternal(ResType type, int32 id, const uint8** data, uint32* size) {
    return PointToData(data, size, [&](Resource** resource) -> MgErr {
        return chain_ ? chain_->RGet(type, id, resource) : kResNotFoundErr;
    });
}

MgErr RFReader::PtrToResDataByNameInternal(ResType type, ConstPStr name, const uint8** data, uint32* size) {
    return PointToData(data, size, [&](Resource** resource) -> MgErr {
        return chain_ ? chain_->RGetNamed(type, name, resource) : kResNotFoundErr;
    });
}

MgErr RFReader::AllocDSHandle(ResType type, int32 id, UHandle* data) {
    return TakeFoundData(data, [&](Resource** resource) -> MgErr {
        return chain_ ? chain_->RGet(type, id, resource) : kResNotFoundErr;
    });
}

MgErr RFReader::AllocDSHandleByName(ResType type, ConstPStr name, UHandle* data) {
    return TakeFoundData(data, [&](Resource** resource) -> MgErr {
        return chain_ ? chain_->RGetNamed(type, name, resource) : kResNotFoundErr;
    });
}

MgErr RFReader::GetString(int32 id, UHandle* data) {
    if (!data) return kArgErr;
    *data = nullptr;
    if (!chain_) return kResNotFoundErr;
    ResFileLock lock;
    Resource* resource = nullptr;
    if (const MgErr err = chain_->RGet(kStringType, id, &resource)) return err;
    *data = resource->GetSharedDSHandle();
    return *data ? kNoErr : kMemFullErr;
}

MgErr RFReader::GetPStr(int32 id, PStr string) {
    if (!string) return kArgErr;
    string[0] = 0;
    ResFileLock lock;
    const uint8* data = nullptr;
    uint32 size = 0;
    if (const MgErr err = PtrToResDataInternal(kStringType, id, &data, &size)) return err;
    const Bytes text = StringText(data, size);
    string[0] = static_cast<uint8>(text.size);
    if (text.size) std::memcpy(string + 1, text.data, static_cast<size_t>(text.size));
    return kNoErr;
}

MgErr RFReader::GetIndString(PStr string, int32 id, int32 index) {
    if (!string) return kArgErr;
    string[0] = 0;
    if (!chain_) return kResNotFoundErr;
    ResFileLock lock;
    ConstPStr found = nullptr;
    if (const MgErr err = chain_->RGetIndStringPtr(&found, id, index, kStringListType)) return err;
    std::memcpy(string, found, found[0] + 1u);
    return kNoErr;
}

MgErr RFReader::GetIndLString(LStrHandle* string, int32 id, int32 index, ResType type) {
    if (!string) return kArgErr;
    *string = nullptr;
    ResFileLock lock;
    const uint8* data = nullptr;
    uint32 size = 0;
    if (const MgErr err = PtrToResDataInternal(type, id, &data, &size)) return err;
    Bytes list = {data, size};
    if (const MgErr err = FindLongString(&list, index)) return err;
    if (list.size > INT32_MAX - sizeof(LStr)) return kMemFullErr;
    UHandle made = DSNewHandle(LStrSize(list.size));
    if (!made) return kMemFullErr;
    *string = reinterpret_cast<LStrHandle>(made);
    (**string)->count = static_cast<int32>(list.size);
    if (list.size) std::memcpy((**string)->bytes, list.data, static_cast<size_t>(list.size));
    return kNoErr;
}

MgErr RFReader::GetPath(ResType type, int32 id, Path* path) {
    if (!path) return kArgErr;
    ResFileLock lock;
    const uint8* data = nullptr;
    uint32 size = 0;
    if (const MgErr err = PtrToResDataInternal(type, id, &data, &size)) return err;
    return ReadPath({data, size}, path);
}

MgErr RFReader::GetIndPath(Path* path, int32 id, int32 index) {
    if (!path) return kArgErr;
    ResFileLock lock;
    const uint8* data = nullptr;
    uint32 size = 0;
    if (const MgErr err = PtrToResDataInternal(kPathListType, id, &data, &size)) return err;
    Bytes list = {data, size};
    if (const MgErr err = FindPath(&list, index)) return err;
    return ReadPath(list, path);
}

RsrcFile RFReader::MapToObsoleteRsrcFile() {
    if (!refnum_ && chain_) refnum_ = RMapResBaseToRsrcFile(chain_);
    return refnum_;
}

MgErr RFReader::ReleaseRsrcFileRefnum() {
    if (!refnum_) return kNoErr;
    const MgErr err = RReleaseRsrcFileRefnum(refnum_);
    refnum_ = 0;
    return err;
}

ResChain* RFReader::LowLevelResChain() {
    if (!chain_) TESSEL_REPORT(kDebugWarning, 0x0FA6C2B7u) << "Uninitialized RFReader";
    return chain_;
}

// ---- the writer -----------------------------------------------------------------------------------------------------

RFReadWrite::RFReadWrite(ResFile* file) : RFReader(file) {
}

RFReadWrite::RFReadWrite(RsrcFile refnum) : RFReader(RsrcFileToRMapResFile(refnum)) {
}

MgErr RFReadWrite::CreateResourceFile(Path path, int32 replace, _FMFileCreator creator, _FMFileType type,
                                      int32 unused) {
    return ResFileFactory::RCreateFile(path, replace, creator, type, unused);
}

MgErr RFReadWrite::CreateMemoryResourceFile(_FMFileCreator creator, _FMFileType type) {
    ResFile* file = nullptr;
    if (const MgErr err = ResFileFactory::RCreateMemFile(&file, creator, type)) return err;
    return Adopt(file);
}

MgErr RFReadWrite::AddFromHandle(UHandle data, int32 mode, ResType type, int32 id, ConstPStr name) {
    if (!data) {
        TESSEL_REPORT(kDebugWarning, 0x65B03D9Fu) << "Do not pass NULL to RFReadWrite::AddFromHandle";
        return kGenericErr;
    }
    if (!chain_) return kResNotFoundErr;
    if (mode) return File()->RAdd(data, type, id, name);
    return File()->RAddPtr(*data, DSGetHandleSize(data), type, id, name);
}

MgErr RFReadWrite::AddFromPtr(const void* data, uint32 size, ResType type, int32 id, ConstPStr name) {
    return chain_ ? File()->RAddPtr(data, size, type, id, name) : kResNotFoundErr;
}

MgErr RFReadWrite::Remove(ResType type, int32 id) {
    if (!chain_) return kResNotFoundErr;
    ResFileLock lock;
    Resource* resource = nullptr;
    MgErr err = chain_->RGet(type, id, &resource);
    if (err == kResNotFoundErr) return kNoErr;
    if (!err) err = File()->RRemove(resource);
    return err;
}

MgErr RFReadWrite::ReplaceFromHandle(UHandle data, int32 mode, ResType type, int32 id, ConstPStr name) {
    if (!chain_) return kResNotFoundErr;
    ResFileLock lock;
    if (const MgErr err = Remove(type, id)) return err;
    return AddFromHandle(data, mode, type, id, name);
}

MgErr RFReadWrite::UpdateFile() {
    return chain_ ? File()->RUpdateFile() : kResNotFoundErr;
}

RsrcFile RFReadWrite::MapToObsoleteRsrcFile() {
    if (!refnum_ && chain_) refnum_ = RMapResFileToRsrcFile(File());
    return refnum_;
}

ResFile* RFReadWrite::LowLevelResFile() {
    if (!chain_) TESSEL_REPORT(kDebugWarning, 0x37CE18A4u) << "Uninitialized RFReadWrite";
    return File();
}

RFReader* CreateRFReader(RsrcFile refnum) {
    return new (std::nothrow) RFReader(refnum);
}

RFReadWrite* CreateRFReadWrite() {
    return new (std::nothrow) RFReadWrite();
}

// ---- the same as std::string ----------------------------------------------------------------------------------------

MgErr RGetStringStd(RsrcFile refnum, std::string* text, int32 id) {
    if (!text) return kArgErr;
    return ReadLocked(refnum, [&](RFReader& reader) {
        Str255 string;
        if (const MgErr err = reader.GetPStr(id, string)) return err;
        return AssignText({string + 1, string[0]}, text);
    });
}

MgErr RGetIndexStringStd(RsrcFile refnum, std::string* text, int32 id, int32 index) {
    if (!text) return kArgErr;
    return ReadLocked(refnum, [&](RFReader& reader) {
        Str255 string;
        if (const MgErr err = reader.GetIndString(string, id, index)) return err;
        return AssignText({string + 1, string[0]}, text);
    });
}

MgErr RGetIndexLongStringStd(RsrcFile refnum, std::string* text, int32 id, int32 index, ResType type) {
    if (!text) return kArgErr;
    return ReadLocked(refnum, [&](RFReader& reader) {
        Bytes list;
        if (const MgErr err = FindBytes(reader, type, id, &list)) return err;
        if (const MgErr err = FindLongString(&list, index)) return err;
        return AssignText(list, text);
    });
}

MgErr RGetLongStringStd(RsrcFile refnum, std::string* text, int32 id) {
    if (!text) return kArgErr;
    return ReadLocked(refnum, [&](RFReader& reader) {
        Bytes data;
        if (const MgErr err = FindBytes(reader, kStringType, id, &data)) return err;
        int32 count = 0;
        if (data.size < sizeof count) return kEOFErr;
        std::memcpy(&count, data.data, sizeof count);
        data.Skip(sizeof count);
        if (count < 0 || static_cast<uint64>(count) > data.size) return kEOFErr;
        return AssignText({data.data, static_cast<uint64>(count)}, text);
    });
}

}  // namespace tessel
