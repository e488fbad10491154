// Making resource files and chains of them.
#include "diagnostics/Guarded.h"
#include "platform/Replacement.h"
#include "resources/ImageOutput.h"
#include "resources/OVResChain.h"
#include "resources/OVResFile.h"
#include "resources/ResFileLock.h"
#include "resources/UncheckedMap.h"
#include <tessel/base/MGModule.h>
#include <tessel/diagnostics/DebugStream.h>
#include <tessel/files/FileManager.h>
#include <tessel/memory/MemoryManager.h>
#include <tessel/paths/PathManager.h>
#include <tessel/paths/PathTextFormat.h>
#include <tessel/resources/ovresfile.h>

#include <cstring>
#include <limits>
#include <memory>
#include <vector>

namespace tessel {

namespace {

constexpr int32 kLongestModuleName = 512;

MgErr CheckMode(int32 mode) {
    return mode == kROpenReadWrite || mode == kROpenReadOnly ? kNoErr : kArgErr;
}

// Opens a file over a source that is set up.
MgErr OpenOver(std::unique_ptr<OVResfileIO> io, ResFile** file, _FMFileType* type, _FMFileCreator* creator) {
    auto made = std::make_unique<OVResFile>();
    if (const MgErr err = made->Open(io.release(), type, creator)) return err;
    *file = made.release();
    return kNoErr;
}

// The header at the start of the map of an open file. In host order; nothing for a file without a map.
MgErr ReadMapHead(OVResfileIO& io, const RsrcHeader& header, uint64 base, RsrcMap* head) {
    *head = {};
    if (header.mapLength <= kHeaderSize) return kNoErr;
    const uint32 length = std::min<uint32>(header.mapLength, sizeof *head);
    if (const MgErr err = io.Read(base + header.mapOffset, head, length)) return err;
    SwapHeader(&head->header);
    head->fileAttrs = ToBig32(head->fileAttrs);
    head->typeList = ToBig32(head->typeList);
    head->nameList = ToBig32(head->nameList);
    return kNoErr;
}

// Both headers of a file that is not open, in host order, for another type. Without a map the second says nothing.
struct Headers {
    RsrcHeader file, map;
    bool hasMap() const { return file.mapLength > kHeaderSize; }
};

RsrcHeader InFileOrder(RsrcHeader header) {
    SwapHeader(&header);
    return header;
}

MgErr ReadHeaders(OVResfileIO& io, Headers* headers) {
    RsrcMap head;
    uint64 base = 0;
    if (const MgErr err = ReadRsrcHeader(io, &headers->file, &base)) return err;
    if (const MgErr err = ReadMapHead(io, headers->file, base, &head)) return err;
    headers->map = head.header;
    return headers->hasMap() && !SanityCheckRsrcMap(headers->map, headers->file) ? kIOErr : kNoErr;
}

// The map with its new header goes behind the end, with the file's header turned over to it; then to its own place.
MgErr SetTypeInPlace(OVResfileIO& io, const Headers& headers) {
    bool undone = true;
    if (!headers.hasMap()) return io.SwitchHeader(InFileOrder(headers.file), &undone);
    uint64 size = 0;
    if (const MgErr err = io.Size(&size)) return err;
    const uint64 behind = (size + 3) & ~uint64{3};
    const uint32 mapLength = headers.file.mapLength;
    if (behind + mapLength > std::numeric_limits<uint32>::max()) return kDiskFullErr;
    std::vector<uint8, TrackedAllocator<uint8>> map(mapLength);
    if (const MgErr err = io.Read(headers.file.mapOffset, map.data(), mapLength)) return err;
    Headers moved = headers;
    moved.file.mapOffset = moved.map.mapOffset = static_cast<uint32>(behind);

    const auto turnTo = [&](const Headers& to) {
        const RsrcHeader head = InFileOrder(to.map);
        std::memcpy(map.data(), &head, kHeaderSize);
        MgErr err = io.Write(to.file.mapOffset, map.data(), mapLength);
        if (!err) err = io.Flush();
        return err ? err : io.SwitchHeader(InFileOrder(to.file), &undone);
    };
    const MgErr err = turnTo(moved);
    // The type is set; if it stays at that, a longer file is left.
    const bool goesBack = err ? undone : turnTo(headers) == kNoErr;
    if (goesBack && !io.SetSize(static_cast<uint32>(size))) io.Flush();
    return err;
}

MgErr SetTypeInCopy(OVResfileIO& io, const Headers& headers, bool* inPlace) {
    platform::Replacement replacement;
    if (const MgErr err = io.BeginReplacement(&replacement, inPlace)) return err;
    OVResfileIO to;
    to.UseFile(FileOf(replacement.File()), false);
    uint64 size = 0;
    ImageOutput output;
    output.Start(&to, 0);
    MgErr err = io.Size(&size);
    if (!err) err = output.Copy(io, 0, size);
    if (!err) err = output.Drain();
    const RsrcHeader file = InFileOrder(headers.file), map = InFileOrder(headers.map);
    if (!err && headers.hasMap()) err = to.Write(headers.file.mapOffset, &map, kHeaderSize);
    if (!err) err = to.Write(0, &file, kHeaderSize);
    if (!err) err = io.FinishReplacement(&replacement, inPlace);
    *inPlace = *inPlace || err == kDiskFullErr;
    return err;
}

MgErr SetTypeIn(OVResfileIO& io, _FMFileType type, _FMFileCreator creator) {
    Headers headers;
    if (const MgErr err = ReadHeaders(io, &headers)) return err;
    headers.map.type = headers.file.type = type;
    headers.map.creator = headers.file.creator = creator;
    bool inPlace = false;
    const MgErr err = SetTypeInCopy(io, headers, &inPlace);
    return inPlace ? SetTypeInPlace(io, headers) : err;
}

// The file of the application's own module.
MgErr ApplicationModule(Path* path) {
    char name[kLongestModuleName] = {};
    const int32 length = MSWinGetModulePath(MGModuleGetInstance(), name, sizeof name);
    if (length <= 0) {
        TESSEL_REPORT(kDebugError, 0x7D05E3B9u) << "OVResFile::ROpenAppResFile, len<=0";
        return kNotFoundErr;
    }
    return FTextToPath(name, length, path);
}

}  // namespace

MgErr ResFileFactory::InitResourceMgr() {
    return ResFileLock::Create();
}

MgErr ResFileFactory::UninitResourceMgr() {
    OwnedHandles::Free();
    ResFileLock::Destroy();
    return kNoErr;
}

MgErr ResFileFactory::RCreateFile(Path path, int32 replace, _FMFileCreator creator, _FMFileType type, int32) {
    return Guarded([&] {
        OpenRequest request;
        if (const MgErr err = request.Check(path, kFOpenReadWrite, kFDenyNone)) return err;
        const RsrcHeader header = InFileOrder(EmptyHeader(type, creator));
        return WriteWholeFile(request, replace != 0, &header, kHeaderSize);
    });
}

MgErr ResFileFactory::RGetFileType(Path path, _FMFileType* type, _FMFileCreator* creator) {
    RFileHeader header;
    if (const MgErr err = RGetFileHeader(path, &header)) return err;
    if (type) *type = header.type;
    if (creator) *creator = header.creator;
    return kNoErr;
}

MgErr ResFileFactory::RSetFileType(Path path, _FMFileType type, _FMFileCreator creator) {
    OVResfileIO io;
    if (const MgErr err = io.OpenPath(path, false, kFDenyWrite)) return err;
    const MgErr err = Guarded([&] { return SetTypeIn(io, type, creator); });
    io.Close();  // what was written is flushed
    return err;
}

MgErr ResFileFactory::RGetModDate(Path path, uint32* date, int32* readOnly) {
    if (!date) {
        TESSEL_REPORT(kDebugError, 0x2B61F4C8u) << "ResFileFactory::RGetModDate, modDate==NULL.";
        return kArgErr;
    }
    return FMGetModDate(path, nullptr, date, readOnly);
}

MgErr ResFileFactory::ROpenPath(Path path, int32 mode, ResFile** file, _FMFileType* type, _FMFileCreator* creator) {
    if (!file) return kArgErr;
    *file = nullptr;
    if (const MgErr err = CheckMode(mode)) return err;
    return Guarded([&] {
        auto io = std::make_unique<OVResfileIO>();
        if (const MgErr err = io->OpenPath(path, mode == kROpenReadOnly, kFDenyWrite)) return err;
        return OpenOver(std::move(io), file, type, creator);
    });
}

MgErr ResFileFactory::ROpenFileref(File_t* fileRef, int32 mode, ResFile** file, _FMFileType* type,
                                   _FMFileCreator* creator) {
    if (!file) return kArgErr;
    *file = nullptr;
    if (!fileRef || CheckMode(mode)) return kArgErr;
    return Guarded([&] {
        auto io = std::make_unique<OVResfileIO>();
        io->UseFile(fileRef, mode == kROpenReadOnly);
        return OpenOver(std::move(io), file, type, creator);
    });
}

MgErr ResFileFactory::ROpenMemFile(UHandle image, int32 mode, ResFile** file, _FMFileType* type,
                                   _FMFileCreator* creator) {
    if (!file) return kArgErr;
    *file = nullptr;
    if (!image || CheckMode(mode)) return kArgErr;
    if (const MgErr err = DSCheckHandle(image)) return err;
    return Guarded([&] {
        auto io = std::make_unique<OVResfileIO>();
        io->UseHandle(image, mode == kROpenReadOnly);
        OVResfileIO* source = io.get();
        auto made = std::make_unique<OVResFile>();
        if (const MgErr err = made->Open(io.release(), type, creator)) return err;
        source->OwnHandle();
        *file = made.release();
        return kNoErr;
    });
}

MgErr ResFileFactory::ROpenMemFile(const void* image, uint32 size, ResFile** file, _FMFileType* type,
                                   _FMFileCreator* creator) {
    if (!file) return kArgErr;
    *file = nullptr;
    if (!image) return kArgErr;
    return Guarded([&] {
        auto io = std::make_unique<OVResfileIO>();
        io->UseMemory(image, size);
        return OpenOver(std::move(io), file, type, creator);
    });
}

MgErr ResFileFactory::RCreateMemFile(ResFile** file, _FMFileCreator creator, _FMFileType type) {
    if (!file) return kArgErr;
    *file = nullptr;
    return Guarded([&] {
        auto made = std::make_unique<OVResFile>();
        if (const MgErr err = made->CreateInMemory(type, creator)) return err;
        *file = made.release();
        return kNoErr;
    });
}

MgErr ResFileFactory::ROpenAppResFile(Path path, int32 mode, ResFile** file) {
    if (!file) return kArgErr;
    *file = nullptr;
    if (path && FDepth(path) > 0) return ROpenPath(path, mode, file, nullptr, nullptr);
    Path module = nullptr;
    if (const MgErr err = ApplicationModule(&module)) return err;
    const MgErr err = ROpenPath(module, mode, file, nullptr, nullptr);
    FDestroyPath(&module);
    return err;
}

MgErr ResFileFactory::RChain(ResChain** chain, int32 count, ResFile* const* files, bool owns) {
    if (!chain) return kArgErr;
    *chain = nullptr;
    if (count < 0 || (count && !files)) return kArgErr;
    return Guarded([&] {
        OVResChain::Files list;
        for (int32 i = 0; i < count; ++i) {
            if (files[i]) list.push_back(files[i]);
        }
        *chain = new OVResChain(std::move(list), owns);
        return kNoErr;
    });
}

}  // namespace tessel

using namespace tessel;

MgErr RGetFileHeader(Path path, RFileHeader* out) {
    if (!out) return kArgErr;
    *out = {};
    OVResfileIO io;
    if (const MgErr err = io.OpenPath(path, true, kFDenyNone)) return err;
    RsrcHeader header;
    RsrcMap head;
    uint64 base = 0;
    if (const MgErr err = ReadRsrcHeader(io, &header, &base)) return err;
    if (const MgErr err = ReadMapHead(io, header, base, &head)) return err;
    *out = {base,
            {header.eol[0], header.eol[1]},
            header.version,
            header.type,
            header.creator,
            header.mapOffset,
            header.mapLength,
            header.dataOffset,
            header.dataLength,
            head.fileAttrs,
            head.typeList,
            head.nameList};
    return kNoErr;
}
