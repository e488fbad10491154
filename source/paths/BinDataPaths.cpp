// Paths in binary streams.
#include "diagnostics/Guarded.h"
#include "paths/PathFlattening.h"
#include <tessel/paths/PathManager.h>
#include <tessel/streams/BinDataReader.h>
#include <tessel/streams/BinDataWriter.h>

namespace tessel {

Path BinDataReader::ReadPath() {
    Path path = nullptr;
    if (!error_) error_ = FUnFlattenPath2(buffer_, &path, endianizer_);
    return path;
}

uint32 BinDataWriter::WritePath(Path path) {
    uint32 size = 0;
    if (!error_) error_ = Guarded([&] { return FlattenPath(path, buffer_, endianizer_, &size); });
    return size;
}

}  // namespace tessel
