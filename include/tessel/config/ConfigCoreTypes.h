// The types of settings that the library brings along. Each has a number of four characters, most also a small one.
//
// What the pointer to a value is, in calls that take one:
//
//     type    C form of the pointer           read from                             written as
//     PStr    UHandle, resized: a PStr         at most 255 bytes                     in double quotes
//     P255    uint8*, a Str255                 at most 255 bytes                     in double quotes
//     LStr    LStrHandle, resized              any text                              in double quotes
//     NStr    std::string*                     any text                              in double quotes
//     NStV    std::vector<std::string>*        split at ";"                          joined with ";", in double quotes
//     ENSV    std::vector<std::string>*        split at ";"; a backslash takes the   the same with "\" before each ";"
//                                              next character as it is               and "\"
//     CPSt    CPStrHandle, resized             as NStV, each at most 255 bytes       as NStV
//     ECPS    CPStrHandle, resized             as ENSV, each at most 255 bytes       as ENSV
//     Bool    int32*                           true, yes, on; false, no, off         True or False
//     I32     int32*                           a decimal number                      decimal
//     F32     float*                           a decimal number                      six digits after the point
//     I32L    ConfigInt32ListHandle, resized   numbers between ";" and blanks        joined with ";"
//     Path    Path                             display text                          display text
//     Pthp    Path*, made when it is null      display text                          display text
//     PLst    ConfigPathListHandle, resized    display texts between ";"             joined with ";", in double quotes
//     PRfL    std::list<PathRef>*              display texts between ";"             joined with ";"
//
// Handles go by value: the pointer is the handle, which must not be null. An empty text is an empty list, one of no
// element. Paths that are replaced in a list are destroyed; those in it belong to the list's owner. A list of texts
// with a ";" in one comes back whole from ENSV and ECPS only, one of paths from none.
//
// Text is read without regard to case where there is a choice of words. Numbers end where they end, and what follows
// them is not looked at; in a list it makes the text wrong. I32 saturates, F32 becomes infinite; "." is the decimal
// point in every locale. kConfigTextErr: the text is none of the type; kConfigMemErr: no memory; kArgErr: null. The
// value is then as it was.
#ifndef TESSEL_CONFIG_CONFIGCORETYPES_H
#define TESSEL_CONFIG_CONFIGCORETYPES_H

#include <tessel/base/StringTypes.h>
#include <tessel/base/Types.h>

// The types: four characters as they lie in memory, and their small numbers (7 is none).
enum {
    kConfigPStr = 0x72745350,
    kConfigP255 = 0x35353250,
    kConfigLStr = 0x7274534C,
    kConfigNStr = 0x7274534E,
    kConfigNStV = 0x5674534E,
    kConfigENSV = 0x56534E45,
    kConfigCPSt = 0x74535043,
    kConfigECPS = 0x53504345,
    kConfigBool = 0x6C6F6F42,
    kConfigI32 = 0x20323349,
    kConfigF32 = 0x20323346,
    kConfigI32L = 0x4C323349,
    kConfigPath = 0x68746150,
    kConfigPthp = 0x70687450,
    kConfigPLst = 0x74734C50,
    kConfigPRfL = 0x4C665250,

    kConfigAliasPStr = 2,
    kConfigAliasBool = 3,
    kConfigAliasI32 = 4,
    kConfigAliasPath = 5,
    kConfigAliasPLst = 6,
    kConfigAliasCPSt = 8,
    kConfigAliasF32 = 9,
    kConfigAliasI32L = 10,
    kConfigAliasLStr = 11,
    kConfigAliasP255 = 12,
    kConfigAliasPthp = 13,
    kConfigAliasECPS = 14
};

// A list of numbers, in a handle. A handle of no bytes is an empty list too.
typedef struct ConfigInt32List {
    int32 count;
    int32 values[1];
} ConfigInt32List;
typedef ConfigInt32List** ConfigInt32ListHandle;

// A list of paths, in a handle. A handle of no bytes is an empty list too.
typedef struct ConfigPathList {
    int32 count;
    Path paths[1];
} ConfigPathList;
typedef ConfigPathList** ConfigPathListHandle;

#endif
