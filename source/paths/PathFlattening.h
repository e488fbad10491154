// The flattened form of paths.
#ifndef TESSEL_SOURCE_PATHS_PATHFLATTENING_H
#define TESSEL_SOURCE_PATHS_PATHFLATTENING_H

#include <tessel/base/MgErr.h>
#include <tessel/base/Types.h>

namespace tessel {

class Endianizer;
class OutputBuf;

// Writes a path, which may be null, in the format that it needs. *size receives the bytes. A null buffer only measures.
MgErr FlattenPath(Path path, OutputBuf* buffer, const Endianizer* endianizer, uint32* size);

}  // namespace tessel

#endif
