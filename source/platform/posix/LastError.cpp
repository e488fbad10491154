#include "platform/LastError.h"

#include "platform/posix/Errors.h"

#include <errno.h>

namespace tessel::platform {

namespace {

constinit thread_local ErrorNumber lastError = kErrorSuccess;

struct ErrnoRow {
    int error;
    ErrorNumber number;
};

// The one table. Codes that are equal on some hosts (EAGAIN, EWOULDBLOCK) stand once; the first row wins.
constexpr ErrnoRow kErrnoRows[] = {
    {0, kErrorSuccess},
    {ENOENT, kErrorFileNotFound},
    {EACCES, kErrorAccessDenied},
    {EPERM, kErrorAccessDenied},
    {EROFS, kErrorAccessDenied},
    {EISDIR, kErrorAccessDenied},
    {EEXIST, kErrorAlreadyExists},
    {ENOTDIR, kErrorNotAFolder},
    {ENOTEMPTY, kErrorFolderNotEmpty},
    {ENOSPC, kErrorDiskFull},
    {EDQUOT, kErrorDiskFull},
    {ETXTBSY, kErrorSharingViolation},
    {EBUSY, kErrorSharingViolation},
    {EAGAIN, kErrorLockViolation},
    {ENOMEM, kErrorNotEnoughMemory},
    {EMFILE, kErrorTooManyOpenFiles},
    {ENFILE, kErrorTooManyOpenFiles},
    {EBADF, kErrorInvalidHandle},
    {EINVAL, kErrorInvalidParameter},
    {ESRCH, kErrorInvalidParameter},
    {ENAMETOOLONG, kErrorInvalidName},
    {EXDEV, kErrorNotSameDevice},
    {ESPIPE, kErrorSeek},
    {EFBIG, kErrorFileTooLarge},
    {EPIPE, kErrorBrokenPipe},
    {EIO, kErrorIODevice},
    {ENXIO, kErrorNotReady},
    {ENODEV, kErrorNotReady},
    {ENOMEDIUM, kErrorNotReady},
    {EFAULT, kErrorNoAccess},
    {EOVERFLOW, kErrorArithmeticOverflow},
    {EILSEQ, kErrorNoUnicodeTranslation},
    {EDEADLK, kErrorDeadlock},
    {EMLINK, kErrorTooManyLinks},
    {ELOOP, kErrorCannotResolveName},
    {ETIMEDOUT, kErrorTimedOut},
    {EINTR, kErrorOperationAborted},
    {ECANCELED, kErrorOperationAborted},
    {ENOSYS, kErrorCallNotImplemented},
    {EOPNOTSUPP, kErrorNotSupported},
    {ENOTTY, kErrorInvalidFunction},
    {ENETUNREACH, kErrorNetworkPathNotFound},
    {EHOSTUNREACH, kErrorNetworkPathNotFound},
    {EHOSTDOWN, kErrorNetworkPathNotFound},
    {ESTALE, kErrorNetworkPathNotFound},
};

}  // namespace

const char* ErrorText(ErrorNumber number) noexcept {
    switch (number) {
#define TESSEL_ERROR_TEXT(name, value, text) \
    case value:                              \
        return text;
        TESSEL_ERROR_NUMBERS(TESSEL_ERROR_TEXT)
#undef TESSEL_ERROR_TEXT
        default:
            return "unknown error";
    }
}

ErrorNumber LastError() noexcept {
    return lastError;
}

void SetLastError(ErrorNumber number) noexcept {
    lastError = number;
}

ErrorNumber ErrorOfErrno(int error) noexcept {
    for (const ErrnoRow& row : kErrnoRows) {
        if (row.error == error) return row.number;
    }
    return kErrorGeneralFailure;
}

bool FailWith(ErrorNumber number) noexcept {
    lastError = number;
    return false;
}

bool FailErrno() noexcept {
    return FailWith(ErrorOfErrno(errno));
}

}  // namespace tessel::platform
