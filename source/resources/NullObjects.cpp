#include "resources/NullObjects.h"

#include "resources/ResFileLock.h"
#include <tessel/diagnostics/DebugStream.h>

namespace tessel {

namespace {

class NullResFile final : public ResFile {
public:
    MgErr RCloseFile() override { return kNotResFileErr; }
    MgErr RGet(ResType, int32, Resource** resource) override { return Nothing(resource); }
    MgErr RExists(ResType, int32, int32* exists) override { return Nothing(exists); }
    MgErr RGetNamed(ResType, ConstPStr, Resource** resource) override { return Nothing(resource); }
    MgErr RIsLoaded(ResType, int32, bool* loaded) override {
        Nothing(loaded);
        return kResNotFoundErr;
    }
    MgErr RGetIndStringPtr(ConstPStr* string, int32, int32, ResType) override { return Nothing(string); }
    Resource* GetResourceForHandle(UHandle) override { return nullptr; }
    MgErr RUpdateFile() override { return kNotResFileErr; }
    MgErr RAddPtr(const void*, uint32, ResType, int32, ConstPStr) override { return kNotResFileErr; }
    MgErr RAdd(UHandle, ResType, int32, ConstPStr) override { return kNotResFileErr; }
    MgErr RReplacePtr(const void*, uint32, ResType, int32) override { return kNotResFileErr; }
    MgErr RReplaceDSHandle(UHandle, ResType, int32) override { return kNotResFileErr; }
    MgErr RRemove(Resource*) override { return kNotResFileErr; }
    MgErr RCount(ResType, int32* count) override { return Nothing(count); }
    MgErr RCountTypes(int32* count) override { return Nothing(count); }
    MgErr RGetInd(ResType, int32, Resource** resource) override { return Nothing(resource); }
    MgErr RGetIndType(ResType* type, int32) override { return Nothing(type); }
    int32 RUniqueID(ResType) override { return kNotResFileErr; }
    MgErr RGetModDate(Path, uint32*, int32*) override { return kNotResFileErr; }
    MgErr RGetFileAttrs(uint32* attrs) override { return Nothing(attrs); }
    MgErr RSetFileAttrs(uint32) override { return kNotResFileErr; }
    MgErr RPreAllocFile(uint32) override { return kPermissionErr; }
    MgErr RGetUHandleOwnership(UHandle* handle) override {
        Nothing(handle);
        return kPermissionErr;
    }
    MgErr RGetMemFileHandle(UHandle* handle) override {
        Nothing(handle);
        return kPermissionErr;
    }
    MgErr Open(OVResfileIO*, _FMFileType*, _FMFileCreator*) override { return kNotResFileErr; }

private:
    template <class T>
    static MgErr Nothing(T* output) {
        if (output) *output = {};
        return kNotResFileErr;
    }
};

class NullResource final : public Resource {
public:
    MgErr RRelease() override {
        ReportUnlocked([] { TESSEL_REPORT(kDebugWarning, 0x3AC86D14u) << "Releasing a non-resource"; });
        return kResNotFoundErr;
    }
    MgErr RChanged() override { return kResNotFoundErr; }
    MgErr DetachResource() override { return kResNotFoundErr; }
    MgErr RSetAttrs(uint32) override { return kResNotFoundErr; }
    MgErr RSize(uint32*) override { return kResNotFoundErr; }
    MgErr RGetInfo(int32*, ResType*, PStr) override { return kResNotFoundErr; }
    MgErr RGetAttrs(uint32*) override { return kResNotFoundErr; }
    UHandle GetSharedDSHandle() override { return nullptr; }
    MgErr DetachHandle(UHandle*) override { return kResNotFoundErr; }
    uint32 GetSize() override { return 0; }
    const uint8* GetData() override { return nullptr; }
    bool ContainsHandle(UHandle) override { return false; }
};

}  // namespace

ResFile* NULLResFile() {
    static NullResFile file;
    return &file;
}

Resource* NULLResource() {
    static NullResource resource;
    return &resource;
}

}  // namespace tessel
