// Version numbers packed into 32 bits, and their texts.
//
// Nibbles from the top: tens of the major version, its units, minor version, fix version, stage (2 development, 4
// alpha, 6 beta, 8 release), and hundreds, tens and units of the build. 0x08526012 is 8.5.2b12. Any thread.
#ifndef TESSEL_UTILITIES_VERSIONUTIL_H
#define TESSEL_UTILITIES_VERSIONUTIL_H

#include <tessel/base/StringTypes.h>
#include <tessel/base/Types.h>

// How much of a version is written; of 0x13008000 each gives the text shown.
typedef enum VersionStringDetailLevel {
    kVersionStringShort = 0,                // "13.0": the fix version unless 0; stage and build unless it is a release
    kVersionStringMajor = 1,                // "13.0": major and minor version only
    kVersionStringFix = 2,                  // "13.0.0": and the fix version
    kVersionStringComplete = 3,             // "13.0.0r0": everything
    kVersionStringLevelLimit = 0x7FFFFFFF,  // any larger level counts as kVersionStringFix
} VersionStringDetailLevel;

#define kVersionStringSize 12  // takes every text and its terminator

TESSEL_BEGIN_C

// The short text. `out` takes kVersionStringSize bytes; null is left alone.
TESSEL_API void BuildVersStr(int32 version, PStr out);

// Returns the length of the text. A buffer (null or of size 0: none) is zeroed, and filled when it is longer than the
// text.
TESSEL_API uint32 BuildVersionString(int32 version, VersionStringDetailLevel level, char* buffer, uint32 size);

TESSEL_END_C

#ifdef __cplusplus
#    include <string>

namespace tessel {

// The text at a level, as a std::string.
TESSEL_API std::string BuildVersStdStr(int32 version, VersionStringDetailLevel level);

}  // namespace tessel

#endif
#endif
