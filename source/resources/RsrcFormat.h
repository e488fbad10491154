// The bytes of a resource file: header, map, type list, reference lists, names. In a file every number is big-endian,
// except four-character codes, which are four bytes in file order; in memory numbers are in host order.
#ifndef TESSEL_SOURCE_RESOURCES_RSRCFORMAT_H
#define TESSEL_SOURCE_RESOURCES_RSRCFORMAT_H

#include <tessel/base/Types.h>

namespace tessel {

// Packed, because nothing in a foreign map says that its lists are aligned.
struct [[gnu::packed]] RsrcHeader {
    FourCC magic;
    uint8 eol[2];
    uint16 version;
    _FMFileType type;
    _FMFileCreator creator;
    uint32 mapOffset;
    uint32 mapLength;
    uint32 dataOffset;
    uint32 dataLength;
};
static_assert(sizeof(RsrcHeader) == 32);

struct [[gnu::packed]] RsrcMap {
    RsrcHeader header;
    uint32 reserved[2];
    uint32 fileAttrs;
    uint32 typeList;  // from the map start
    uint32 nameList;  // from the map start; 0 without names
};
static_assert(sizeof(RsrcMap) == 52);

struct [[gnu::packed]] TypeEntry {
    ResType type;
    int32 lastIndex;  // number of resources minus one
    uint32 list;      // of its reference entries, from the type list start
};
static_assert(sizeof(TypeEntry) == 12);

struct [[gnu::packed]] TypeMap {
    int32 lastIndex;  // number of types minus one
    TypeEntry types[1];
};

struct [[gnu::packed]] ResourceEntry {
    int32 id;
    int32 name;  // offset from the name list start; kNoName
    uint32 attrs;
    uint32 data;    // offset from the data section start
    uint32 loaded;  // 0 on disk; in memory the slot of the loaded resource plus one
};
static_assert(sizeof(ResourceEntry) == 20);

constexpr FourCC kRsrcMagic = TESSEL_FOURCC('R', 'S', 'R', 'C');
constexpr uint16 kRsrcVersion = 3;
constexpr uint16 kOldestRsrcVersion = 2;
constexpr uint8 kRsrcEol[2] = {0x0D, 0x0A};
constexpr int32 kNoName = -1;

constexpr uint32 kHeaderSize = sizeof(RsrcHeader);
constexpr uint32 kEmptyMapSize = sizeof(RsrcMap);
constexpr uint32 kTypeCountSize = 4;
constexpr uint32 kTypeEntrySize = sizeof(TypeEntry);
constexpr uint32 kRefEntrySize = sizeof(ResourceEntry);
constexpr uint32 kTrailerSize = 4;

// What a data entry with n bytes takes up: the length word, the bytes, zeros up to a multiple of 4.
constexpr uint64 DiskSize(uint64 n) {
    return (n + 7) & ~uint64{3};
}

inline uint16 ToBig16(uint16 value) {
    return __builtin_bswap16(value);
}
inline uint32 ToBig32(uint32 value) {
    return __builtin_bswap32(value);
}

// Between file and host order, either way.
inline void SwapHeader(RsrcHeader* header) {
    header->version = ToBig16(header->version);
    header->mapOffset = ToBig32(header->mapOffset);
    header->mapLength = ToBig32(header->mapLength);
    header->dataOffset = ToBig32(header->dataOffset);
    header->dataLength = ToBig32(header->dataLength);
}

// The header of a file without resources.
inline RsrcHeader EmptyHeader(_FMFileType type, _FMFileCreator creator) {
    return {kRsrcMagic, {kRsrcEol[0], kRsrcEol[1]}, kRsrcVersion, type, creator, kHeaderSize, 0, kHeaderSize, 0};
}

}  // namespace tessel

#endif
