// From errno to the numbers of the seam.
#ifndef TESSEL_PLATFORM_POSIX_ERRORS_H
#define TESSEL_PLATFORM_POSIX_ERRORS_H

#include "platform/LastError.h"

namespace tessel::platform {

ErrorNumber ErrorOfErrno(int error) noexcept;

// Both set LastError and return false, for `return Fail(...)`.
bool FailWith(ErrorNumber number) noexcept;
bool FailErrno() noexcept;

}  // namespace tessel::platform

#endif
