// Maps whose counts and offsets nobody has checked yet.
#ifndef TESSEL_SOURCE_RESOURCES_UNCHECKEDMAP_H
#define TESSEL_SOURCE_RESOURCES_UNCHECKEDMAP_H

#include "resources/RsrcFormat.h"
#include <tessel/base/MgErr.h>

namespace tessel {

// Converts a map in place between file and host order and, coming from disk, checks it against the header and itself.
// kIOErr: it does not pass. `header` is in host order.
enum class MapDirection { kFromDisk, kToDisk };
MgErr StandardizeAndSanityChkRsrcMap(uint8* map, uint32 size, MapDirection direction, const RsrcHeader& header);

// Whether two headers, the file's and the map's copy, belong together.
bool SanityCheckRsrcMap(const RsrcHeader& copy, const RsrcHeader& header);

}  // namespace tessel

#endif
