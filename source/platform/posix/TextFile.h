// Small files of the host, read whole.
#ifndef TESSEL_PLATFORM_POSIX_TEXTFILE_H
#define TESSEL_PLATFORM_POSIX_TEXTFILE_H

#include <cstddef>
#include <string>

namespace tessel::platform {

// At most `most` bytes. False with errno when it cannot be opened or read. `native`: the host's own name.
bool ReadTextFile(const char* native, std::string& text, std::size_t most = static_cast<std::size_t>(-1));

// Writes a new file; EEXIST when there is one. Nothing is left behind after a failure. False with errno.
bool CreateTextFile(const std::string& native, const std::string& data);

// Writes all, through a new file that takes the name when it is complete. False with errno.
bool ReplaceFile(const std::string& native, const std::string& data);

}  // namespace tessel::platform

#endif
