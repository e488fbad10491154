// The result of almost every operation: 0 is success.
//
// Name, code and meaning stand in one list, from which the constants and MgErrMeaning are made.
#ifndef TESSEL_BASE_MGERR_H
#define TESSEL_BASE_MGERR_H

#include <tessel/base/Types.h>

// A result code: one of the constants below.
typedef int32 MgErr;

// X(constant, code, meaning)
#define TESSEL_MGERR_LIST(X)                                                                   \
    X(kNoErr, 0, "success")                                                                    \
    X(kArgErr, 1, "bad argument")                                                              \
    X(kMemFullErr, 2, "memory full")                                                           \
    X(kHandleErr, 3, "invalid handle or pointer, or its guard bytes are damaged")              \
    X(kEOFErr, 4, "end of file")                                                               \
    X(kFileInUseErr, 5, "file in use")                                                         \
    X(kIOErr, 6, "input/output error")                                                         \
    X(kNotFoundErr, 7, "not found")                                                            \
    X(kPermissionErr, 8, "permission denied, or file open read-only")                          \
    X(kDiskFullErr, 9, "disk full")                                                            \
    X(kExistsErr, 10, "already exists")                                                        \
    X(kTooManyOpenErr, 11, "too many open files")                                              \
    X(kNotResFileErr, 13, "not a resource file, or resource file not open")                    \
    X(kResIDExistsErr, 14, "resource ID already exists")                                       \
    X(kResNotFoundErr, 15, "resource or type not found")                                       \
    X(kConfigTypeErr, 19, "unknown configuration type")                                        \
    X(kConfigKeyErr, 20, "configuration key not found")                                        \
    X(kConfigTextErr, 21, "text cannot be converted to the configuration type")                \
    X(kConfigMemErr, 22, "memory full inside configuration conversion or the INI engine")      \
    X(kGenericErr, 42, "operation not allowed in the current state")                           \
    X(kUnsupportedErr, 53, "unsupported format or operation")                                  \
    X(kEventQueueErr, 67, "event queue not running or not accepting events")                   \
    X(kOccurrenceGoneErr, 69, "handler armed on an occurrence that no longer exists")          \
    X(kOccurrenceFullErr, 70, "interrupt-safe occurrence area full")                           \
    X(kCorruptErr, 74, "corrupt data")                                                         \
    X(kFormatErr, 85, "bad format string")                                                     \
    X(kLengthErr, 116, "a length field in a stream cannot be satisfied")                       \
    X(kGuidErr, 121, "a class identifier could not be converted to or from text")              \
    X(kVersionErr, 122, "resource file format version newer than this library reads")          \
    X(kTimeOutErr, 123, "wait timed out")                                                      \
    X(kEmbeddedZeroErr, 124, "a string converted to a terminated string contains a zero byte") \
    X(kRegistryErr, 4000, "a registry call failed")                                            \
    X(kRegistryTypeErr, 4011, "registry value is not of a string type")

// The constants have the type of a result in C++, so that what returns one needs no result type of its own; C, which
// has no typed constants, gets an enumeration.
#ifdef __cplusplus
#    define TESSEL_MGERR_CONSTANT(name, code, meaning) inline constexpr MgErr name = code;
TESSEL_MGERR_LIST(TESSEL_MGERR_CONSTANT)
#else
#    define TESSEL_MGERR_CONSTANT(name, code, meaning) name = code,
enum { TESSEL_MGERR_LIST(TESSEL_MGERR_CONSTANT) };
#endif
#undef TESSEL_MGERR_CONSTANT

TESSEL_BEGIN_C

// The meaning of a code in a few words, for people. "unknown error" for a code that is not in the list.
// The text is constant. Any thread.
TESSEL_API const char* MgErrMeaning(MgErr err);

TESSEL_END_C

#endif
