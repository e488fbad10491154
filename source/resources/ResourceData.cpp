#include "resources/ResourceData.h"

#include <tessel/memory/MemoryManager.h>

namespace tessel {

DSHandleResource::~DSHandleResource() {
    if (fHandle) DSDisposeHandle(fHandle);
}

uint32 DSHandleResource::GetSize() const {
    return fHandle ? DSGetHandleSize(fHandle) : 0;
}

MappedResource::~MappedResource() {
    if (fCopy) DSDisposeHandle(fCopy);
}

void MappedResource::DetachHandle() {
    fData = nullptr;
    fSize = 0;
    fCopy = nullptr;
}

UHandle MappedResource::GetSharedDSHandle() {
    if (!fCopy && fData) DSPtrToHand(fData, &fCopy, fSize);
    return fCopy;
}

}  // namespace tessel
