// The bytes of a text, whatever holds it.
#ifndef TESSEL_STRINGS_LSTRVIEW_H
#define TESSEL_STRINGS_LSTRVIEW_H

#include <tessel/base/StringTypes.h>

namespace tessel {

constexpr size_t kMaxPStr = 255;  // bytes of the longest PStr

// Null and a length below 0 are the empty text. Not to be kept while a handle is resized.
struct LStrView {
    LStrView(ConstPStr text) : LStrView(text ? text + 1 : nullptr, text ? text[0] : 0) {}
    LStrView(const LStr* text) : LStrView(text ? text->bytes : nullptr, text ? text->count : 0) {}
    LStrView(LStrHandle handle) : LStrView(handle ? *handle : nullptr) {}
    LStrView(const void* start, int32 count)
        : bytes(static_cast<const uint8*>(start)), length(start && count > 0 ? static_cast<size_t>(count) : 0) {}

    const uint8* bytes;
    size_t length;
};

}  // namespace tessel

#endif
