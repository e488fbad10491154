// Edits inside a handle's block.
#include "strings/HandleOps.h"

#include <cstring>

namespace tessel {

MgErr ResizeRange(UHandle handle, HandleRange range, uint32 newSize, bool exact) {
    const uint32 rest = range.contentSize - range.offset - range.size;
    const uint64 needed = uint64{range.offset} + newSize + rest;
    if (needed > INT32_MAX) return kMemFullErr;
    if (newSize > range.size) {
        if (MgErr err = SizeHandle(handle, static_cast<uint32>(needed), exact)) return err;
    }
    uint8* place = *handle + range.offset;
    std::memmove(place + newSize, place + range.size, rest);
    return SizeHandle(handle, static_cast<uint32>(needed), exact);
}

}  // namespace tessel
