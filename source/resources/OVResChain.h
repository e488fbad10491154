// Resource files searched in order.
#ifndef TESSEL_SOURCE_RESOURCES_OVRESCHAIN_H
#define TESSEL_SOURCE_RESOURCES_OVRESCHAIN_H

#include "resources/ResFileLock.h"
#include <tessel/memory/TrackedMallocFree.h>
#include <tessel/resources/ovresfile.h>

#include <utility>
#include <vector>

namespace tessel {

// The first result that is not kResNotFoundErr counts. The files are the chain's only if it `owns` them. A file that is
// closed leaves every chain.
class OVResChain final : public ResChain, public TrackedObject {
public:
    using Files = std::vector<ResFile*, TrackedAllocator<ResFile*>>;

    OVResChain(Files files, bool owns);
    ~OVResChain() override;
    OVResChain(const OVResChain&) = delete;
    OVResChain& operator=(const OVResChain&) = delete;

    // Takes a file out of all chains. The lock is held.
    static void Forget(const ResChain* file);

    MgErr RCloseFile() override {
        ResFileLock lock;
        Files files;
        files.swap(files_);
        for (ResFile* file : files) {
            if (!owns_) break;
            file->RCloseFile();
            delete file;
        }
        return kNoErr;
    }
    MgErr RGet(ResType type, int32 id, Resource** resource) override {
        return Search(resource, [&](ResFile* file) { return file->RGet(type, id, resource); });
    }
    MgErr RExists(ResType type, int32 id, int32* exists) override {
        return Search(exists, [&](ResFile* file) { return file->RExists(type, id, exists); });
    }
    MgErr RGetNamed(ResType type, ConstPStr name, Resource** resource) override {
        return Search(resource, [&](ResFile* file) { return file->RGetNamed(type, name, resource); });
    }
    MgErr RIsLoaded(ResType type, int32 id, bool* loaded) override {
        return Search(loaded, [&](ResFile* file) { return file->RIsLoaded(type, id, loaded); });
    }
    MgErr RGetIndStringPtr(ConstPStr* string, int32 id, int32 index, ResType type) override {
        return Search(string, [&](ResFile* file) { return file->RGetIndStringPtr(string, id, index, type); });
    }
    Resource* GetResourceForHandle(UHandle data) override {
        ResFileLock lock;
        for (ResFile* file : files_) {
            if (Resource* resource = file->GetResourceForHandle(data)) return resource;
        }
        return nullptr;
    }

private:
    template <class Output, class Operation>
    MgErr Search(Output* output, Operation operation) {
        ResFileLock lock;
        if (!output) return kArgErr;
        *output = {};
        for (ResFile* file : files_) {
            const MgErr err = operation(file);
            if (err != kResNotFoundErr) return err;
        }
        return kResNotFoundErr;
    }

    static OVResChain* first_;  // of all chains
    OVResChain* next_;
    Files files_;
    bool owns_;
};

}  // namespace tessel

#endif
