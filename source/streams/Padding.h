// The bytes between a value and the next aligned place.
#ifndef TESSEL_SOURCE_STREAMS_PADDING_H
#define TESSEL_SOURCE_STREAMS_PADDING_H

#include <tessel/base/Types.h>

namespace tessel {

// The bytes that bring `size` up to a multiple of `align`. None for an alignment of 0 or 1.
inline uint32 Padding(uint32 size, uint32 align) {
    return align > 1 && size % align != 0 ? align - size % align : 0;
}

}  // namespace tessel

#endif
