// From the failures of the system to result codes.
#include "files/FileSupport.h"
#include "platform/LastError.h"

namespace tessel {

namespace {

struct Row {
    platform::ErrorNumber number;
    MgErr ofFiles;   // of everything but
    MgErr ofRights;  // setting permissions
};

// What is not listed has no closer code.
constexpr Row kRows[] = {
    {platform::kErrorSuccess, kIOErr, kNoErr},
    {platform::kErrorFileNotFound, kNotFoundErr, kNotFoundErr},
    {platform::kErrorPathNotFound, kNotFoundErr, kNotFoundErr},
    {platform::kErrorNotReady, kNotFoundErr, kIOErr},
    {platform::kErrorNetworkPathNotFound, kNotFoundErr, kIOErr},
    {platform::kErrorNotAFolder, kNotFoundErr, kIOErr},
    {platform::kErrorAccessDenied, kPermissionErr, kPermissionErr},
    {platform::kErrorLockViolation, kPermissionErr, kIOErr},
    {platform::kErrorNotEnoughMemory, kMemFullErr, kMemFullErr},
    {platform::kErrorSharingViolation, kFileInUseErr, kIOErr},
    {platform::kErrorHandleDiskFull, kDiskFullErr, kIOErr},
    {platform::kErrorDiskFull, kDiskFullErr, kDiskFullErr},
    {platform::kErrorFileExists, kExistsErr, kExistsErr},
    {platform::kErrorAlreadyExists, kExistsErr, kExistsErr},
    {platform::kErrorInvalidParameter, kArgErr, kArgErr},
    {platform::kErrorInvalidName, kArgErr, kArgErr},
    {platform::kErrorNotLocked, kArgErr, kIOErr},
    {platform::kErrorInvalidHandle, kIOErr, kArgErr},
    {platform::kErrorTooManyOpenFiles, kIOErr, kTooManyOpenErr},
    {platform::kErrorSeek, kIOErr, kEOFErr},
    {platform::kErrorNegativeSeek, kIOErr, kEOFErr},
};

Row RowOfLastError() {
    const platform::ErrorNumber number = platform::LastError();
    for (const Row& row : kRows) {
        if (row.number == number) return row;
    }
    return {number, kIOErr, kIOErr};
}

}  // namespace

MgErr AccessRightsErr() {
    return RowOfLastError().ofRights;
}

}  // namespace tessel

using namespace tessel;

MgErr Win32ToOVFileErr() {
    return RowOfLastError().ofFiles;
}

CStr FErrorText(MgErr err) {
    const Row row = RowOfLastError();
    const bool isOfSystem = err != kNoErr && row.number != platform::kErrorSuccess && row.ofFiles == err;
    return isOfSystem ? platform::ErrorText(row.number) : MgErrMeaning(err);
}
