// The error number of the seam.
//
// A function of the seam that fails says so in its result and leaves the reason here, per thread, as one of the numbers
// the library was designed around. Success leaves the number alone. Each backend turns its own errors into these in one
// table.
#ifndef TESSEL_PLATFORM_LASTERROR_H
#define TESSEL_PLATFORM_LASTERROR_H

#include <cstdint>

namespace tessel::platform {

using ErrorNumber = std::uint32_t;

// X(constant, number, text for people)
#define TESSEL_ERROR_NUMBERS(X)                                          \
    X(kErrorSuccess, 0, "no error")                                      \
    X(kErrorInvalidFunction, 1, "not possible with this file")           \
    X(kErrorFileNotFound, 2, "there is no such file or folder")          \
    X(kErrorPathNotFound, 3, "there is no such folder on the way")       \
    X(kErrorTooManyOpenFiles, 4, "too many open files")                  \
    X(kErrorAccessDenied, 5, "access denied")                            \
    X(kErrorInvalidHandle, 6, "it is not open")                          \
    X(kErrorNotEnoughMemory, 8, "not enough memory")                     \
    X(kErrorOutOfMemory, 14, "out of memory")                            \
    X(kErrorNotSameDevice, 17, "it lies on another file system")         \
    X(kErrorNoMoreFiles, 18, "no more files")                            \
    X(kErrorNotReady, 21, "the device is not ready")                     \
    X(kErrorSeek, 25, "the position cannot be set")                      \
    X(kErrorGeneralFailure, 31, "the system failed")                     \
    X(kErrorSharingViolation, 32, "another program uses the file")       \
    X(kErrorLockViolation, 33, "another program has locked it")          \
    X(kErrorEndOfFile, 38, "the file ends too early")                    \
    X(kErrorHandleDiskFull, 39, "the disk is full")                      \
    X(kErrorNotSupported, 50, "not supported here")                      \
    X(kErrorNetworkPathNotFound, 53, "the server does not answer")       \
    X(kErrorFileExists, 80, "the file exists already")                   \
    X(kErrorInvalidParameter, 87, "bad argument")                        \
    X(kErrorBrokenPipe, 109, "the other end is closed")                  \
    X(kErrorDiskFull, 112, "no room on the disk")                        \
    X(kErrorCallNotImplemented, 120, "this system cannot do it")         \
    X(kErrorInvalidName, 123, "bad name, or one that is too long")       \
    X(kErrorModuleNotFound, 126, "there is no such module")              \
    X(kErrorProcedureNotFound, 127, "there is no such procedure")        \
    X(kErrorNegativeSeek, 131, "the position lies before the start")     \
    X(kErrorFolderNotEmpty, 145, "the folder is not empty")              \
    X(kErrorNotLocked, 158, "it is not locked")                          \
    X(kErrorAlreadyExists, 183, "there is an item of that name already") \
    X(kErrorFileTooLarge, 223, "the file would be too large")            \
    X(kErrorMoreData, 234, "there is more")                              \
    X(kErrorNoMoreItems, 259, "there are no more")                       \
    X(kErrorNotAFolder, 267, "it is no folder")                          \
    X(kErrorArithmeticOverflow, 534, "a number is too large")            \
    X(kErrorOperationAborted, 995, "interrupted")                        \
    X(kErrorNoAccess, 998, "bad address")                                \
    X(kErrorFileInvalid, 1006, "the content is not of the form")         \
    X(kErrorRegistryCorrupt, 1015, "the registry is damaged")            \
    X(kErrorKeyDeleted, 1018, "the key has been deleted")                \
    X(kErrorNoUnicodeTranslation, 1113, "a text cannot be converted")    \
    X(kErrorIODevice, 1117, "the device failed")                         \
    X(kErrorDeadlock, 1131, "each would wait for the other")             \
    X(kErrorTooManyLinks, 1142, "too many links")                        \
    X(kErrorTimedOut, 1460, "the wait timed out")                        \
    X(kErrorCannotResolveName, 1921, "links lead in a circle, or none may be there")

#define TESSEL_ERROR_CONSTANT(name, number, text) constexpr ErrorNumber name = number;
TESSEL_ERROR_NUMBERS(TESSEL_ERROR_CONSTANT)
#undef TESSEL_ERROR_CONSTANT

// What a number means, for people.
const char* ErrorText(ErrorNumber number) noexcept;

// The calling thread's number: why its last failing call of the seam failed. 0 at the start of a thread.
ErrorNumber LastError() noexcept;
void SetLastError(ErrorNumber number) noexcept;

}  // namespace tessel::platform

#endif
