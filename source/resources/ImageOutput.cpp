#include "resources/ImageOutput.h"

#include <algorithm>
#include <cstring>

namespace tessel {

void ImageOutput::Start(OVResfileIO* to, uint64 position) {
    to_ = to;
    position_ = position;
    used_ = 0;
}

MgErr ImageOutput::Drain() {
    const uint32 count = used_;
    used_ = 0;
    if (!count) return kNoErr;
    const MgErr err = to_->Write(position_, gathered_.data(), count);
    position_ += count;
    return err;
}

MgErr ImageOutput::Put(const void* data, uint32 size) {
    if (size > kGather - used_) {
        if (const MgErr err = Drain()) return err;
    }
    if (size >= kGather) {
        const MgErr err = to_->Write(position_, data, size);
        position_ += size;
        return err;
    }
    if (size) std::memcpy(gathered_.data() + used_, data, size);
    used_ += size;
    return kNoErr;
}

MgErr ImageOutput::PutZeros(uint32 count) {
    static const uint8 kZeros[4] = {};
    return Put(kZeros, count);
}

MgErr ImageOutput::Copy(OVResfileIO& from, uint64 position, uint64 size) {
    while (size) {
        if (used_ == kGather) {
            if (const MgErr err = Drain()) return err;
        }
        const auto part = static_cast<uint32>(std::min<uint64>(size, kGather - used_));
        if (const MgErr err = from.Read(position, gathered_.data() + used_, part)) return err;
        used_ += part;
        position += part;
        size -= part;
    }
    return kNoErr;
}

}  // namespace tessel
