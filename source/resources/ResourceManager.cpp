// The flat interface: refnums for files and chains, and resources found by their data handles.
#include "diagnostics/Guarded.h"
#include "resources/NullObjects.h"
#include "resources/OVResChain.h"
#include "resources/Refnums.h"
#include "resources/ResFileLock.h"
#include "resources/Service.h"
#include <tessel/base/OVExcept.h>
#include <tessel/diagnostics/DebugStream.h>
#include <tessel/memory/CookieManager.h>
#include <tessel/resources/RFReadWrite.h>
#include <tessel/resources/ResourceManager.h>
#include <tessel/resources/ovresfile.h>

#include <memory>
#include <vector>

namespace tessel {

namespace {

enum class Kind : int32 { kChain = 0, kFile = 1 };

// What a refnum stands for.
struct ResClassStorage : TrackedObject {
    ResClassStorage(Kind itsKind, ResChain* itsChain) : kind(itsKind), chain(itsChain) {}
    Kind kind;
    ResChain* chain;
};

// The table of refnums.
class ResFileMap : public TrackedObject {
public:
    // Throws kMemFullErr when there is no memory for the table.
    ResFileMap() {
        if (fJar.Init()) TESSEL_THROW(kMemFullErr, "ResFileMap");
    }
    ~ResFileMap() {
        int32 left = 0;
        if (fJar.GetNumCookies(&left))
            TESSEL_REPORT(kDebugError, 0x61D7A04Bu) << "ResFileMap::~ResFileMap. Bad Cookie Jar()";
        else if (left)
            TESSEL_REPORT(kDebugWarning, 0x18F3BC26u) << "The Resource Manager is being shut down with open files!";
        ForEach([](RsrcFile, ResClassStorage* storage) {
            delete storage;
            return false;
        });
        fJar.Uninit();
    }
    ResFileMap(const ResFileMap&) = delete;
    ResFileMap& operator=(const ResFileMap&) = delete;

    RsrcFile Add(Kind kind, ResChain* chain) {
        auto storage = std::make_unique<ResClassStorage>(kind, chain);
        const RsrcFile refnum = fJar.NewCookie(storage.get());
        if (refnum) static_cast<void>(storage.release());
        return refnum;
    }
    ResClassStorage* Find(RsrcFile refnum) {
        ResClassStorage* storage = nullptr;
        return fJar.GetCookieInfo(refnum, &storage) ? nullptr : storage;
    }
    MgErr Remove(RsrcFile refnum) {
        ResClassStorage* storage = nullptr;
        if (fJar.DisposeCookie(refnum, &storage)) return kNotResFileErr;
        delete storage;
        return kNoErr;
    }
    // Until `visit`, given a refnum and what it stands for, returns true.
    template <class Visit>
    void ForEach(Visit visit) {
        CookieList list;
        if (fJar.GetCookieList(&list)) return;
        for (int32 i = 0; i < list.GetCount(); ++i) {
            ResClassStorage* storage = Find(list.GetCookie(i));
            if (storage && visit(list.GetCookie(i), storage)) return;
        }
    }

private:
    CookieJar<ResClassStorage*> fJar;
};

ResFileMap* gResFileMap = nullptr;

// The last pairs of a data handle and its resource that were handed out, most recent first.
class HandleCache {
public:
    void Put(UHandle handle, Resource* resource) {
        if (fPairs[0].handle == handle) return;
        fPairs[1] = fPairs[0];
        fPairs[0] = {handle, resource};
    }
    Resource* Find(UHandle handle) const {
        for (const Pair& pair : fPairs) {
            if (pair.handle && pair.handle == handle) return pair.resource;
        }
        return nullptr;
    }
    void Empty() { fPairs[0] = fPairs[1] = {}; }

private:
    struct Pair {
        UHandle handle;
        Resource* resource;
    };
    Pair fPairs[2] = {};
};

HandleCache gHandleCache;

RsrcFile NewRefnum(Kind kind, ResChain* chain) {
    if (!gResFileMap || !chain) return 0;
    return GuardedOr<RsrcFile>(0, [&] { return gResFileMap->Add(kind, chain); });
}

// The resource of a handle that was handed out, or the null one. The lock is held.
Resource* ResourceOf(UHandle handle) {
    if (!handle || !gResFileMap) return NULLResource();
    if (Resource* cached = gHandleCache.Find(handle)) return cached;
    Resource* found = nullptr;
    gResFileMap->ForEach([&](RsrcFile, ResClassStorage* storage) {
        found = storage->chain->GetResourceForHandle(handle);
        return found != nullptr;
    });
    if (!found) return NULLResource();
    gHandleCache.Put(handle, found);
    return found;
}

// Hands out the data of a resource.
MgErr ShareHandle(Resource* resource, UHandle* data) {
    *data = resource->GetSharedDSHandle();
    if (!*data) return kMemFullErr;
    gHandleCache.Put(*data, resource);
    return kNoErr;
}

// Runs `open`, which makes a file, and gives the file a refnum. The lock is not held meanwhile: the host's file system
// may take its time.
template <class Open>
MgErr OpenWithRefnum(RsrcFile* refnum, Open open) {
    if (!refnum) return kArgErr;
    *refnum = 0;
    ResFile* file = nullptr;
    if (const MgErr err = open(&file)) return err;
    *refnum = NewRefnum(Kind::kFile, file);
    if (*refnum) return kNoErr;
    // A memory handle goes back to its owner.
    UHandle handle = nullptr;
    file->RGetUHandleOwnership(&handle);
    delete file;
    return kMemFullErr;
}

}  // namespace

MgErr ResourceManagerStart() {
    gResFileMap = new ResFileMap();
    const MgErr err = ResFileFactory::InitResourceMgr();
    if (err) {
        delete gResFileMap;
        gResFileMap = nullptr;
    }
    return err;
}

MgErr ResourceManagerStop() {
    delete gResFileMap;
    gResFileMap = nullptr;
    gHandleCache.Empty();
    return ResFileFactory::UninitResourceMgr();
}

void EmptyHandleCache() {
    gHandleCache.Empty();
}

void ForgetRefnumsOf(const ResChain* chain) {
    OVResChain::Forget(chain);
    if (!gResFileMap) return;
    gResFileMap->ForEach([&](RsrcFile refnum, const ResClassStorage* storage) {
        if (storage->chain == chain) gResFileMap->Remove(refnum);
        return false;
    });
}

RsrcFile RMapResFileToRsrcFile(ResFile* file) {
    return NewRefnum(Kind::kFile, file);
}

RsrcFile RMapResBaseToRsrcFile(ResChain* chain) {
    return NewRefnum(Kind::kChain, chain);
}

ResChain* RsrcFileToRMapResChain(RsrcFile refnum) {
    const ResClassStorage* storage = gResFileMap ? gResFileMap->Find(refnum) : nullptr;
    return storage ? storage->chain : NULLResFile();
}

ResFile* RsrcFileToRMapResFile(RsrcFile refnum) {
    const ResClassStorage* storage = gResFileMap ? gResFileMap->Find(refnum) : nullptr;
    return storage && storage->kind == Kind::kFile ? static_cast<ResFile*>(storage->chain) : NULLResFile();
}

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
        *refnum = NewRefnum(Kind::kChain, chain);
        if (!*refnum) delete chain;
        return *refnum ? kNoErr : kMemFullErr;
    });
}

MgErr RDestroyChain(RsrcFile refnum) {
    ResFileLock lock;
    const ResClassStorage* storage = gResFileMap ? gResFileMap->Find(refnum) : nullptr;
    if (!storage || storage->kind != Kind::kChain) return kNotResFileErr;
    ResChain* chain = storage->chain;
    ForgetRefnumsOf(chain);
    delete chain;
    return kNoErr;
}

MgErr RReleaseRsrcFileRefnum(RsrcFile refnum) {
    ResFileLock lock;
    gHandleCache.Empty();
    return gResFileMap ? gResFileMap->Remove(refnum) : kNotResFileErr;
}
