// The flat interface to resource files and their resources.
#include "diagnostics/Guarded.h"
#include "resources/NullObjects.h"
#include "resources/Refnums.h"
#include "resources/ResFileLock.h"
#include <tessel/diagnostics/DebugStream.h>
#include <tessel/resources/RFReadWrite.h>
#include <tessel/resources/ResourceManager.h>
#include <tessel/resources/ovresfile.h>

#include <vector>

namespace tessel {

namespace {

// Runs `open`, which makes a file, and gives the file a refnum. The lock is not held meanwhile: the host's file system
// may take its time.
template <class Open>
MgErr OpenWithRefnum(RsrcFile* refnum, Open open) {
    if (!refnum) return kArgErr;
    *refnum = 0;
    ResFile* file = nullptr;
    if (const MgErr err = open(&file)) return err;
    *refnum = RMapResFileToRsrcFile(file);
    if (*refnum) return kNoErr;
    // A memory handle goes back to its owner.
    UHandle handle = nullptr;
    file->RGetUHandleOwnership(&handle);
    delete file;
    return kMemFullErr;
}

}  // namespace

}  // namespace tessel

using namespace tessel;

// ---- opening and closing --------------------------------------------------------------------------------------------

MgErr RCreateFile(Path path, int32 replace, _FMFileCreator creator, _FMFileType type, int32 unused) {
    return ResFileFactory::RCreateFile(path, replace, creator, type, unused);
}

MgErr ROpenFile(Path path, int32 mode, RsrcFile* refnum, _FMFileType* type, _FMFileCreator* creator) {
    return OpenWithRefnum(refnum,
                          [&](ResFile** file) { return ResFileFactory::ROpenPath(path, mode, file, type, creator); });
}

MgErr ROpenFileRefnum(File_t* fileRef, int32 mode, RsrcFile* refnum, _FMFileType* type, _FMFileCreator* creator) {
    return OpenWithRefnum(
        refnum, [&](ResFile** file) { return ResFileFactory::ROpenFileref(fileRef, mode, file, type, creator); });
}

MgErr ROpenUHandle(UHandle image, int32 mode, RsrcFile* refnum, _FMFileType* type, _FMFileCreator* creator) {
    return OpenWithRefnum(
        refnum, [&](ResFile** file) { return ResFileFactory::ROpenMemFile(image, mode, file, type, creator); });
}

MgErr ROpenUPtr(const void* image, uint32 size, RsrcFile* refnum, _FMFileType* type, _FMFileCreator* creator) {
    return OpenWithRefnum(
        refnum, [&](ResFile** file) { return ResFileFactory::ROpenMemFile(image, size, file, type, creator); });
}

MgErr ROpenAppResFile(Path path, int32 mode, RsrcFile* refnum) {
    return OpenWithRefnum(refnum, [&](ResFile** file) { return ResFileFactory::ROpenAppResFile(path, mode, file); });
}

MgErr RCreateMemFile(RsrcFile* refnum, _FMFileCreator creator, _FMFileType type) {
    return OpenWithRefnum(refnum, [&](ResFile** file) { return ResFileFactory::RCreateMemFile(file, creator, type); });
}

MgErr RCloseFile(RsrcFile refnum) {
    ResFileLock lock;
    ResFile* file = RsrcFileToRMapResFile(refnum);
    if (const MgErr err = file->RCloseFile()) return err;
    ForgetRefnumsOf(file);
    delete file;
    return kNoErr;
}

MgErr RCloseFileForce(RsrcFile refnum) {
    ResFileLock lock;
    const MgErr err = RCloseFile(refnum);
    if (!err) return kNoErr;
    uint32 attrs = 0;
    if (RGetFileAttrs(refnum, &attrs) == kNoErr && (attrs & kRFileChanged) &&
        RSetFileAttrs(refnum, attrs & ~uint32{kRFileChanged}) == kNoErr)
        RCloseFile(refnum);
    return err;
}

MgErr RUpdateFile(RsrcFile refnum) {
    ResFileLock lock;
    return RsrcFileToRMapResFile(refnum)->RUpdateFile();
}

MgErr RGetUHandleOwnership(RsrcFile refnum, UHandle* image) {
    ResFileLock lock;
    return RsrcFileToRMapResFile(refnum)->RGetUHandleOwnership(image);
}

MgErr RGetMemFileHandle(RsrcFile refnum, UHandle* image) {
    ResFileLock lock;
    return RsrcFileToRMapResFile(refnum)->RGetMemFileHandle(image);
}

MgErr RPreAllocFile(RsrcFile refnum, uint32 size) {
    ResFileLock lock;
    return RsrcFileToRMapResFile(refnum)->RPreAllocFile(size);
}

MgErr RGetFileType(Path path, _FMFileType* type, _FMFileCreator* creator) {
    return ResFileFactory::RGetFileType(path, type, creator);
}

MgErr RSetFileType(Path path, _FMFileType type, _FMFileCreator creator) {
    return ResFileFactory::RSetFileType(path, type, creator);
}

MgErr RGetModDate(Path path, RsrcFile refnum, uint32* date, int32* readOnly) {
    if (!refnum) return ResFileFactory::RGetModDate(path, date, readOnly);
    ResFileLock lock;
    return RsrcFileToRMapResFile(refnum)->RGetModDate(path, date, readOnly);
}

MgErr RGetFileAttrs(RsrcFile refnum, uint32* attrs) {
    ResFileLock lock;
    return RsrcFileToRMapResFile(refnum)->RGetFileAttrs(attrs);
}

MgErr RSetFileAttrs(RsrcFile refnum, uint32 attrs) {
    ResFileLock lock;
    return RsrcFileToRMapResFile(refnum)->RSetFileAttrs(attrs);
}

// ---- resources by refnum --------------------------------------------------------------------------------------------

MgErr RGet(RsrcFile refnum, ResType type, int32 id, UHandle* data) {
    if (!data) return kArgErr;
    *data = nullptr;
    ResFileLock lock;
    Resource* resource = nullptr;
    if (const MgErr err = RsrcFileToRMapResChain(refnum)->RGet(type, id, &resource)) return err;
    return ShareHandle(resource, data);
}

MgErr RGetInd(RsrcFile refnum, ResType type, int32 index, UHandle* data) {
    if (!data) return kArgErr;
    *data = nullptr;
    ResFileLock lock;
    Resource* resource = nullptr;
    if (const MgErr err = RsrcFileToRMapResFile(refnum)->RGetInd(type, index, &resource)) return err;
    return ShareHandle(resource, data);
}

MgErr RGetNamed(RsrcFile refnum, ResType type, ConstPStr name, UHandle* data) {
    if (!data) return kArgErr;
    *data = nullptr;
    ResFileLock lock;
    Resource* resource = nullptr;
    if (const MgErr err = RsrcFileToRMapResChain(refnum)->RGetNamed(type, name, &resource)) return err;
    *data = resource->GetSharedDSHandle();
    return *data ? kNoErr : kMemFullErr;
}

MgErr RExists(RsrcFile refnum, ResType type, int32 id, int32* exists) {
    ResFileLock lock;
    return RsrcFileToRMapResChain(refnum)->RExists(type, id, exists);
}

MgErr RIsLoaded(RsrcFile refnum, ResType type, int32 id, bool* loaded) {
    ResFileLock lock;
    return RsrcFileToRMapResChain(refnum)->RIsLoaded(type, id, loaded);
}

MgErr RAdd(UHandle data, RsrcFile refnum, ResType type, int32 id, ConstPStr name) {
    ResFileLock lock;
    return RsrcFileToRMapResFile(refnum)->RAdd(data, type, id, name);
}

MgErr RRemove(UHandle data, RsrcFile refnum) {
    ResFileLock lock;
    Resource* resource = ResourceOf(data);
    uint32 attrs = 0;
    if (const MgErr err = resource->RGetAttrs(&attrs)) return err;
    ResFile* file = RsrcFileToRMapResFile(refnum);
    uint32 fileAttrs = 0;
    if (const MgErr err = file->RGetFileAttrs(&fileAttrs)) return err;
    // The handle leaves the resource only when nothing can stop the removal any more.
    if (fileAttrs & kRFileReadOnly) return kPermissionErr;
    if ((attrs & kRProtectedAttr) || file->GetResourceForHandle(data) != resource) return kResNotFoundErr;
    UHandle detached = nullptr;
    if (const MgErr err = resource->DetachHandle(&detached)) return err;
    return file->RRemove(resource);
}

MgErr RCount(RsrcFile refnum, ResType type, int32* count) {
    ResFileLock lock;
    return RsrcFileToRMapResFile(refnum)->RCount(type, count);
}

MgErr RCountTypes(RsrcFile refnum, int32* count) {
    ResFileLock lock;
    return RsrcFileToRMapResFile(refnum)->RCountTypes(count);
}

MgErr RGetIndType(RsrcFile refnum, ResType* type, int32 index) {
    ResFileLock lock;
    return RsrcFileToRMapResFile(refnum)->RGetIndType(type, index);
}

int32 RUniqueID(RsrcFile refnum, ResType type) {
    ResFileLock lock;
    return RsrcFileToRMapResFile(refnum)->RUniqueID(type);
}

// ---- resources by handle --------------------------------------------------------------------------------------------

MgErr RRelease(UHandle data) {
    ResFileLock lock;
    Resource* resource = ResourceOf(data);
    return resource->RRelease();
}

MgErr RDetach(UHandle data) {
    ResFileLock lock;
    Resource* resource = ResourceOf(data);
    if (const MgErr err = resource->DetachResource()) return err;
    UHandle detached = nullptr;
    const MgErr err = resource->DetachHandle(&detached);
    delete resource;
    return err;
}

MgErr RChanged(UHandle data) {
    ResFileLock lock;
    return ResourceOf(data)->RChanged();
}

MgErr RGetInfo(UHandle data, int32* id, ResType* type, PStr name) {
    ResFileLock lock;
    return ResourceOf(data)->RGetInfo(id, type, name);
}

MgErr RGetAttrs(UHandle data, uint32* attrs) {
    ResFileLock lock;
    return ResourceOf(data)->RGetAttrs(attrs);
}

MgErr RSetAttrs(UHandle data, uint32 attrs) {
    ResFileLock lock;
    return ResourceOf(data)->RSetAttrs(attrs);
}

MgErr RSize(UHandle data, uint32* size) {
    ResFileLock lock;
    return ResourceOf(data)->RSize(size);
}

// ---- strings and paths ----------------------------------------------------------------------------------------------

MgErr RGetString(RsrcFile refnum, int32 id, UHandle* data) {
    return ReadLocked(refnum, [&](RFReader& reader) { return reader.GetString(id, data); });
}

MgErr RGetPStr(RsrcFile refnum, int32 id, PStr string) {
    return ReadLocked(refnum, [&](RFReader& reader) { return reader.GetPStr(id, string); });
}

MgErr RGetIndString(RsrcFile refnum, PStr string, int32 id, int32 index) {
    return ReadLocked(refnum, [&](RFReader& reader) { return reader.GetIndString(string, id, index); });
}

MgErr RGetIndStringPtr(RsrcFile refnum, ConstPStr* string, int32 id, int32 index, ResType type) {
    ResFileLock lock;
    return RsrcFileToRMapResChain(refnum)->RGetIndStringPtr(string, id, index, type);
}

MgErr RGetIndLString(RsrcFile refnum, LStrHandle* string, int32 id, int32 index, ResType type) {
    return ReadLocked(refnum, [&](RFReader& reader) { return reader.GetIndLString(string, id, index, type); });
}

MgErr RGetPath(RsrcFile refnum, ResType type, int32 id, Path* path) {
    return ReadLocked(refnum, [&](RFReader& reader) { return reader.GetPath(type, id, path); });
}

MgErr RGetIndPath(RsrcFile refnum, Path* path, int32 id, int32 index) {
    return ReadLocked(refnum, [&](RFReader& reader) { return reader.GetIndPath(path, id, index); });
}

// ---- chains ---------------------------------------------------------------------------------------------------------

MgErr RChain(RsrcFile* refnum, int32 count, const RsrcFile* files) {
    if (!refnum) return kArgErr;
    *refnum = 0;
    if (count < 0 || (count && !files)) return kArgErr;
    return Guarded([&] {
        ResFileLock lock;
        std::vector<ResFile*, TrackedAllocator<ResFile*>> open;
        for (int32 i = 0; i < count; ++i) {
            ResFile* file = RsrcFileToRMapResFile(files[i]);
            if (file == NULLResFile()) {
                ReportUnlocked([] {
                    TESSEL_REPORT(kDebugWarning, 0x52E9D7C4u) << "RChain called with RsrcFile that is not in map.";
                });
                return kNotResFileErr;
            }
            open.push_back(file);
        }
        ResChain* chain = nullptr;
        if (const MgErr err = ResFileFactory::RChain(&chain, count, open.data(), false)) return err;
        *refnum = RMapResBaseToRsrcFile(chain);
        if (!*refnum) delete chain;
        return *refnum ? kNoErr : kMemFullErr;
    });
}

MgErr RDestroyChain(RsrcFile refnum) {
    ResFileLock lock;
    ResChain* chain = MadeChain(refnum);
    if (!chain) return kNotResFileErr;
    ForgetRefnumsOf(chain);
    delete chain;
    return kNoErr;
}

MgErr RReleaseRsrcFileRefnum(RsrcFile refnum) {
    ResFileLock lock;
    return ForgetRefnum(refnum);
}
