#include "resources/OVResource.h"

#include "resources/OVResFile.h"
#include "resources/Refnums.h"
#include "resources/ResFileLock.h"

namespace tessel {

OVResource::~OVResource() {
    ResFileLock lock;
    EmptyHandleCache();
    data_.reset();
}

MgErr OVResource::RRelease() {
    ResFileLock lock;
    return file_ ? file_->Release(this) : kResNotFoundErr;
}

MgErr OVResource::RChanged() {
    ResFileLock lock;
    return file_ ? file_->MarkChanged(this) : kResNotFoundErr;
}

MgErr OVResource::DetachResource() {
    ResFileLock lock;
    return file_ ? file_->Detach(this) : kResNotFoundErr;
}

MgErr OVResource::RSetAttrs(uint32 attrs) {
    ResFileLock lock;
    return file_ ? file_->SetAttrs(this, attrs) : kResNotFoundErr;
}

MgErr OVResource::RSize(uint32* size) {
    if (!size) return kArgErr;
    *size = GetSize();
    return kNoErr;
}

MgErr OVResource::RGetInfo(int32* id, ResType* type, PStr name) {
    ResFileLock lock;
    return file_ ? file_->GetInfo(this, id, type, name) : kResNotFoundErr;
}

MgErr OVResource::RGetAttrs(uint32* attrs) {
    ResFileLock lock;
    if (!attrs) return kArgErr;
    return file_ ? file_->GetAttrs(this, attrs) : kResNotFoundErr;
}

UHandle OVResource::GetSharedDSHandle() {
    ResFileLock lock;
    return data_ ? data_->GetSharedDSHandle() : nullptr;
}

MgErr OVResource::DetachHandle(UHandle* data) {
    ResFileLock lock;
    if (!data) return kArgErr;
    *data = GetSharedDSHandle();
    if (!*data) return data_ ? kMemFullErr : kResNotFoundErr;
    data_->DetachHandle();
    data_.reset();
    EmptyHandleCache();
    if (file_) file_->cache_.Empty();
    return kNoErr;
}

uint32 OVResource::GetSize() {
    ResFileLock lock;
    return data_ ? data_->GetSize() : 0;
}

const uint8* OVResource::GetData() {
    ResFileLock lock;
    return data_ ? data_->GetData() : nullptr;
}

bool OVResource::ContainsHandle(UHandle data) {
    ResFileLock lock;
    return data_ && data_->ContainsHandle(data);
}

}  // namespace tessel
