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

constexpr ErrorNumber kErrorSuccess = 0;
constexpr ErrorNumber kErrorInvalidFunction = 1;
constexpr ErrorNumber kErrorFileNotFound = 2;
constexpr ErrorNumber kErrorPathNotFound = 3;
constexpr ErrorNumber kErrorTooManyOpenFiles = 4;
constexpr ErrorNumber kErrorAccessDenied = 5;
constexpr ErrorNumber kErrorInvalidHandle = 6;
constexpr ErrorNumber kErrorNotEnoughMemory = 8;
constexpr ErrorNumber kErrorOutOfMemory = 14;
constexpr ErrorNumber kErrorNotSameDevice = 17;
constexpr ErrorNumber kErrorNoMoreFiles = 18;
constexpr ErrorNumber kErrorNotReady = 21;
constexpr ErrorNumber kErrorSeek = 25;
constexpr ErrorNumber kErrorGeneralFailure = 31;
constexpr ErrorNumber kErrorSharingViolation = 32;
constexpr ErrorNumber kErrorLockViolation = 33;
constexpr ErrorNumber kErrorEndOfFile = 38;
constexpr ErrorNumber kErrorHandleDiskFull = 39;
constexpr ErrorNumber kErrorNotSupported = 50;
constexpr ErrorNumber kErrorNetworkPathNotFound = 53;
constexpr ErrorNumber kErrorFileExists = 80;
constexpr ErrorNumber kErrorInvalidParameter = 87;
constexpr ErrorNumber kErrorBrokenPipe = 109;
constexpr ErrorNumber kErrorDiskFull = 112;
constexpr ErrorNumber kErrorCallNotImplemented = 120;
constexpr ErrorNumber kErrorInvalidName = 123;
constexpr ErrorNumber kErrorModuleNotFound = 126;
constexpr ErrorNumber kErrorProcedureNotFound = 127;
constexpr ErrorNumber kErrorNegativeSeek = 131;
constexpr ErrorNumber kErrorFolderNotEmpty = 145;
constexpr ErrorNumber kErrorNotLocked = 158;
constexpr ErrorNumber kErrorAlreadyExists = 183;
constexpr ErrorNumber kErrorNameTooLong = 206;
constexpr ErrorNumber kErrorFileTooLarge = 223;
constexpr ErrorNumber kErrorMoreData = 234;
constexpr ErrorNumber kErrorNoMoreItems = 259;
constexpr ErrorNumber kErrorNotAFolder = 267;
constexpr ErrorNumber kErrorArithmeticOverflow = 534;
constexpr ErrorNumber kErrorOperationAborted = 995;
constexpr ErrorNumber kErrorNoAccess = 998;
constexpr ErrorNumber kErrorFileInvalid = 1006;
constexpr ErrorNumber kErrorRegistryCorrupt = 1015;
constexpr ErrorNumber kErrorKeyDeleted = 1018;
constexpr ErrorNumber kErrorNoUnicodeTranslation = 1113;
constexpr ErrorNumber kErrorIODevice = 1117;
constexpr ErrorNumber kErrorDeadlock = 1131;
constexpr ErrorNumber kErrorTooManyLinks = 1142;
constexpr ErrorNumber kErrorTimedOut = 1460;
constexpr ErrorNumber kErrorCannotResolveName = 1921;

// The calling thread's number: why its last failing call of the seam failed. 0 at the start of a thread.
ErrorNumber LastError() noexcept;
void SetLastError(ErrorNumber number) noexcept;

}  // namespace tessel::platform

#endif
