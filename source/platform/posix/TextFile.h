// Small files of the host, read and written whole. `native`: the host's own name, seen from `folder` where there is
// one.
#ifndef TESSEL_PLATFORM_POSIX_TEXTFILE_H
#define TESSEL_PLATFORM_POSIX_TEXTFILE_H

#include <cstddef>
#include <fcntl.h>
#include <string>

namespace tessel::platform {

// At most `most` bytes. False with errno when it cannot be opened or read.
bool ReadTextFile(const char* native, std::string& text, std::size_t most = static_cast<std::size_t>(-1),
                  int folder = AT_FDCWD);

// Writes a new file for this user alone, and puts it onto the device; EEXIST when there is one. Nothing is left behind
// after a failure. False with errno.
bool CreateTextFile(const std::string& native, const std::string& data);

}  // namespace tessel::platform

#endif
