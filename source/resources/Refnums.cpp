#include "resources/Refnums.h"

#include "resources/NullObjects.h"
#include "resources/OVResChain.h"
#include "resources/Service.h"
#include <tessel/base/OVExcept.h>
#include <tessel/diagnostics/DebugStream.h>
#include <tessel/memory/CookieManager.h>
#include <tessel/resources/ResourceManager.h>

#include <memory>

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
        if (jar_.Init()) TESSEL_THROW(kMemFullErr, "ResFileMap");
    }
    ~ResFileMap() {
        int32 left = 0;
        if (jar_.GetNumCookies(&left))
            TESSEL_REPORT(kDebugError, 0x61D7A04Bu) << "ResFileMap::~ResFileMap. Bad Cookie Jar()";
        else if (left)
            TESSEL_REPORT(kDebugWarning, 0x18F3BC26u) << "The Resource Manager is being shut down with open files!";
        ForEach([](RsrcFile, ResClassStorage* storage) {
            delete storage;
            return false;
        });
        jar_.Uninit();
    }
    ResFileMap(const ResFileMap&) = delete;
    ResFileMap& operator=(const ResFileMap&) = delete;

    RsrcFile Add(Kind kind, ResChain* chain) {
        auto storage = std::make_unique<ResClassStorage>(kind, chain);
        const RsrcFile refnum = jar_.NewCookie(storage.get());
        if (refnum) static_cast<void>(storage.release());
        return refnum;
    }
    ResClassStorage* Find(RsrcFile refnum) {
        ResClassStorage* storage = nullptr;
        return jar_.GetCookieInfo(refnum, &storage) ? nullptr : storage;
    }
    MgErr Remove(RsrcFile refnum) {
        ResClassStorage* storage = nullptr;
        if (jar_.DisposeCookie(refnum, &storage)) return kNotResFileErr;
        delete storage;
        return kNoErr;
    }
    // Until `visit`, given a refnum and what it stands for, returns true.
    template <class Visit>
    void ForEach(Visit visit) {
        CookieList list;
        if (jar_.GetCookieList(&list)) return;
        for (int32 i = 0; i < list.GetCount(); ++i) {
            ResClassStorage* storage = Find(list.GetCookie(i));
            if (storage && visit(list.GetCookie(i), storage)) return;
        }
    }

private:
    CookieJar<ResClassStorage*> jar_;
};

ResFileMap* resFileMap = nullptr;

// The last pairs of a data handle and its resource that were handed out, most recent first.
class HandleCache {
public:
    void Put(UHandle handle, Resource* resource) {
        if (pairs_[0].handle == handle) return;
        pairs_[1] = pairs_[0];
        pairs_[0] = {handle, resource};
    }
    Resource* Find(UHandle handle) const {
        for (const Pair& pair : pairs_) {
            if (pair.handle && pair.handle == handle) return pair.resource;
        }
        return nullptr;
    }
    void Empty() { pairs_[0] = pairs_[1] = {}; }

private:
    struct Pair {
        UHandle handle;
        Resource* resource;
    };
    Pair pairs_[2] = {};
};

HandleCache handleCache;

RsrcFile NewRefnum(Kind kind, ResChain* chain) {
    if (!resFileMap || !chain) return 0;
    return GuardedOr<RsrcFile>(0, [&] { return resFileMap->Add(kind, chain); });
}

}  // namespace

// ---- start and stop -------------------------------------------------------------------------------------------------

MgErr ResourceManagerStart() {
    resFileMap = new ResFileMap();
    const MgErr err = ResFileFactory::InitResourceMgr();
    if (err) {
        delete resFileMap;
        resFileMap = nullptr;
    }
    return err;
}

MgErr ResourceManagerStop() {
    delete resFileMap;
    resFileMap = nullptr;
    handleCache.Empty();
    return ResFileFactory::UninitResourceMgr();
}

// ---- handles --------------------------------------------------------------------------------------------------------

void EmptyHandleCache() {
    handleCache.Empty();
}

Resource* ResourceOf(UHandle handle) {
    if (!handle || !resFileMap) return NULLResource();
    if (Resource* cached = handleCache.Find(handle)) return cached;
    Resource* found = nullptr;
    resFileMap->ForEach([&](RsrcFile, ResClassStorage* storage) {
        found = storage->chain->GetResourceForHandle(handle);
        return found != nullptr;
    });
    if (!found) return NULLResource();
    handleCache.Put(handle, found);
    return found;
}

MgErr ShareHandle(Resource* resource, UHandle* data) {
    *data = resource->GetSharedDSHandle();
    if (!*data) return kMemFullErr;
    handleCache.Put(*data, resource);
    return kNoErr;
}

// ---- refnums --------------------------------------------------------------------------------------------------------

void ForgetRefnumsOf(const ResChain* chain) {
    OVResChain::Forget(chain);
    if (!resFileMap) return;
    resFileMap->ForEach([&](RsrcFile refnum, const ResClassStorage* storage) {
        if (storage->chain == chain) resFileMap->Remove(refnum);
        return false;
    });
}

MgErr ForgetRefnum(RsrcFile refnum) {
    handleCache.Empty();
    return resFileMap ? resFileMap->Remove(refnum) : kNotResFileErr;
}

ResChain* MadeChain(RsrcFile refnum) {
    const ResClassStorage* storage = resFileMap ? resFileMap->Find(refnum) : nullptr;
    return storage && storage->kind == Kind::kChain ? storage->chain : nullptr;
}

RsrcFile RMapResFileToRsrcFile(ResFile* file) {
    return NewRefnum(Kind::kFile, file);
}

RsrcFile RMapResBaseToRsrcFile(ResChain* chain) {
    return NewRefnum(Kind::kChain, chain);
}

ResChain* RsrcFileToRMapResChain(RsrcFile refnum) {
    const ResClassStorage* storage = resFileMap ? resFileMap->Find(refnum) : nullptr;
    return storage ? storage->chain : NULLResFile();
}

ResFile* RsrcFileToRMapResFile(RsrcFile refnum) {
    const ResClassStorage* storage = resFileMap ? resFileMap->Find(refnum) : nullptr;
    return storage && storage->kind == Kind::kFile ? static_cast<ResFile*>(storage->chain) : NULLResFile();
}

}  // namespace tessel
