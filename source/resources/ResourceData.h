// The data of one loaded resource.
#ifndef TESSEL_SOURCE_RESOURCES_RESOURCEDATA_H
#define TESSEL_SOURCE_RESOURCES_RESOURCEDATA_H

#include <tessel/base/Types.h>
#include <tessel/memory/TrackedMallocFree.h>

namespace tessel {

class ResourceData : public TrackedObject {
public:
    ResourceData() = default;
    virtual ~ResourceData() = default;
    ResourceData(const ResourceData&) = delete;
    ResourceData& operator=(const ResourceData&) = delete;

    // Forgets the data: whoever had the handle owns it from then on.
    virtual void DetachHandle() = 0;
    virtual uint32 GetSize() const = 0;
    virtual const uint8* GetData() const = 0;
    // The data as a handle, which stays ours. Null when memory is full.
    virtual UHandle GetSharedDSHandle() = 0;
    virtual bool ContainsHandle(UHandle handle) const = 0;
};

// The handles that are the data of resources, so that none becomes the data of two. The lock is held.
class OwnedHandles {
public:
    // kArgErr: it is one already. kMemFullErr.
    static MgErr Add(UHandle handle);
    static void Remove(UHandle handle);
    static void Free();
};

// Owns a handle, once it has adopted one.
class DSHandleResource final : public ResourceData {
public:
    ~DSHandleResource() override;

    // On failure the handle stays the caller's.
    MgErr Adopt(UHandle handle);
    void DetachHandle() override;
    uint32 GetSize() const override;
    const uint8* GetData() const override { return handle_ ? *handle_ : nullptr; }
    UHandle GetSharedDSHandle() override { return handle_; }
    bool ContainsHandle(UHandle handle) const override { return handle && handle == handle_; }

private:
    UHandle handle_ = nullptr;
};

// Points into memory of its file, and copies it into a handle when one is asked for.
class MappedResource final : public ResourceData {
public:
    MappedResource(const uint8* data, uint32 size) : data_(data), size_(size) {}
    ~MappedResource() override;

    void DetachHandle() override;
    uint32 GetSize() const override { return size_; }
    const uint8* GetData() const override { return data_; }
    UHandle GetSharedDSHandle() override;
    bool ContainsHandle(UHandle handle) const override { return handle && handle == copy_; }

private:
    const uint8* data_;
    uint32 size_;
    UHandle copy_ = nullptr;
};

}  // namespace tessel

#endif
