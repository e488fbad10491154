// A loaded resource of a file.
#ifndef TESSEL_SOURCE_RESOURCES_OVRESOURCE_H
#define TESSEL_SOURCE_RESOURCES_OVRESOURCE_H

#include "resources/ResourceData.h"
#include <tessel/memory/TrackedMallocFree.h>
#include <tessel/resources/ovresfile.h>

#include <memory>

namespace tessel {

class OVResFile;

// A loaded resource. Belongs to its file until it is detached; without a file its map side fails with kResNotFoundErr.
class OVResource final : public Resource, public TrackedObject {
public:
    OVResource(OVResFile* file, std::unique_ptr<ResourceData> data) : file_(file), data_(std::move(data)) {}
    ~OVResource() override;
    OVResource(const OVResource&) = delete;
    OVResource& operator=(const OVResource&) = delete;

    MgErr RRelease() override;
    MgErr RChanged() override;
    MgErr DetachResource() override;
    MgErr RSetAttrs(uint32 attrs) override;
    MgErr RSize(uint32* size) override;
    MgErr RGetInfo(int32* id, ResType* type, PStr name) override;
    MgErr RGetAttrs(uint32* attrs) override;
    UHandle GetSharedDSHandle() override;
    MgErr DetachHandle(UHandle* data) override;
    uint32 GetSize() override;
    const uint8* GetData() override;
    bool ContainsHandle(UHandle data) override;

private:
    friend class OVResFile;

    OVResFile* file_;
    std::unique_ptr<ResourceData> data_;
    uint32 slot_ = 0;         // in the file's table of loaded resources, plus one
    bool unwritten_ = false;  // the data are only here, whatever the attributes say
};

}  // namespace tessel

#endif
