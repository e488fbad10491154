/* The formatting engine, for callers that need to know whether the format was good. */
#ifndef TESSEL_STRINGS_FMTENGINE_H
#define TESSEL_STRINGS_FMTENGINE_H

#include <tessel/base/Types.h>

#include <cstdarg>

namespace tessel {

constexpr int32 kFmtNoLimit = -1;

struct Formatted {
    int32 length;
    bool good; /* false: stopped, and reported, at what is wrong with the format */
};

/* As SPrintfv. */
Formatted FormatText(char* dst, int32 size, const char* format, int32 formatLength, va_list args);

}  // namespace tessel

#endif
