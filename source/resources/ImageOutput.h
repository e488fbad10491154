// Bytes on their way into a file, one after the other.
#ifndef TESSEL_SOURCE_RESOURCES_IMAGEOUTPUT_H
#define TESSEL_SOURCE_RESOURCES_IMAGEOUTPUT_H

#include "resources/OVResfileIO.h"

#include <vector>

namespace tessel {

// Gathers small pieces, so that they cost few writes. Its memory is there once it is made: what follows allocates none.
class ImageOutput {
public:
    ImageOutput() : gathered_(kGather) {}
    ImageOutput(const ImageOutput&) = delete;
    ImageOutput& operator=(const ImageOutput&) = delete;

    // Where the next bytes go.
    void Start(OVResfileIO* to, uint64 position);

    MgErr Put(const void* data, uint32 size);
    MgErr PutZeros(uint32 count);  // 3 at most
    // From another source, or from a part of the same one that is not being written.
    MgErr Copy(OVResfileIO& from, uint64 position, uint64 size);
    // Writes what is still gathered.
    MgErr Drain();

private:
    static constexpr uint32 kGather = 32 * 1024;

    OVResfileIO* to_ = nullptr;
    uint64 position_ = 0;  // of the first gathered byte
    uint32 used_ = 0;
    std::vector<uint8, TrackedAllocator<uint8>> gathered_;
};

}  // namespace tessel

#endif
