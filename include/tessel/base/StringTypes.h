// The forms of text that cross the interface. The operations on them are in strings/. All text is bytes in the active
// code page.
#ifndef TESSEL_BASE_STRINGTYPES_H
#define TESSEL_BASE_STRINGTYPES_H

#include <tessel/base/Types.h>

// A count byte (0 to 255) and that many bytes. A buffer that takes any PStr is 256 bytes (Str255).
typedef uint8* PStr;
typedef const uint8* ConstPStr;
typedef uint8 Str255[256];

// A count and that many bytes, without a terminator. `bytes` is as long as `count` says: use LStrSize, not sizeof.
typedef struct LStr {
    int32 count;
    uint8 bytes[1];
} LStr;
typedef LStr* LStrPtr;
typedef LStrPtr* LStrHandle;  // a handle whose block holds an LStr; null is the empty string

// Bytes that an LStr of `count` bytes takes up.
#define LStrSize(count) ((uint32)offsetof(LStr, bytes) + (uint32)(count))

// A count, then that many PStrs end to end. Empty: 4 bytes.
typedef struct CPStr {
    int32 count;
    uint8 bytes[1];
} CPStr;
typedef CPStr* CPStrPtr;
typedef CPStrPtr* CPStrHandle;

// A count, then that many LStrs, each padded with zero bytes to a multiple of 4. Empty: 4 bytes.
typedef struct CLStr {
    int32 count;
    uint8 bytes[1];
} CLStr;
typedef CLStr* CLStrPtr;
typedef CLStrPtr* CLStrHandle;

// A count, then that many LStr handles, each of which may be null.
typedef struct _LStrArray {
    int32 elementCount;
    LStrHandle element[1];
} _LStrArray;
typedef _LStrArray* LStrArrayPtr;
typedef LStrArrayPtr* LStrArrayHandle;

#endif
