// The widths and plain types that the whole interface is written in.
//
// A refnum, a size or a count has the width its name says on every host. Whatever holds an address, or is handed
// through to a callback, is as wide as a pointer.
#ifndef TESSEL_BASE_TYPES_H
#define TESSEL_BASE_TYPES_H

#include <tessel/base/Export.h>

#include <stdbool.h>
#include <stddef.h>
#include <stdint.h>

typedef int8_t int8;
typedef int16_t int16;
typedef int32_t int32;
typedef int64_t int64;
typedef uint8_t uint8;
typedef uint16_t uint16;
typedef uint32_t uint32;
typedef uint64_t uint64;

// Zero-terminated text in the active code page.
typedef const char* CStr;

// A pointer block, and a handle: a pointer to a master pointer, which points to data that may move
// (memory/MemoryManager.h).
typedef uint8* UPtr;
typedef UPtr* UHandle;

// Four bytes that spell a code, as they lie in memory: 'S','T','R','#' is 0x23525453 on a little-endian host.
typedef uint32 FourCC;
#define TESSEL_FOURCC(a, b, c, d) \
    ((FourCC)(uint8)(a) | ((FourCC)(uint8)(b) << 8) | ((FourCC)(uint8)(c) << 16) | ((FourCC)(uint8)(d) << 24))

typedef uint32 ResType;         // type of a resource, a four-character code
typedef uint32 _FMFileType;     // type of a file, a four-character code
typedef uint32 _FMFileCreator;  // creator of a file, a four-character code

// A path is a pointer to a heap-allocated PathRef (paths/PathRef.h). Null means no path.
#ifdef __cplusplus
namespace tessel {
class PathRef;
}
typedef tessel::PathRef* Path;
#else
typedef struct tessel_PathRef* Path;
#endif

// An open file is a File_t* (files/FileManager.h). Null means no file.
typedef struct File_t File_t;

// An open resource file or a chain of them (resources/ResourceManager.h). 0 is never one.
typedef uint32 RsrcFile;

#if defined(__BYTE_ORDER__) && __BYTE_ORDER__ != __ORDER_LITTLE_ENDIAN__
#    error "TESSEL_FOURCC is written for little-endian hosts"
#endif

#endif
