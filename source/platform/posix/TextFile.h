/* Small files of the host, read whole. */
#ifndef TESSEL_PLATFORM_POSIX_TEXTFILE_H
#define TESSEL_PLATFORM_POSIX_TEXTFILE_H

#include <string>

namespace tessel::platform {

/* False with errno when it cannot be opened or read to its end. `native`: the host's own name. */
bool ReadTextFile(const char* native, std::string& text);

/* Writes all, through a new file that takes the name when it is complete. False with errno. */
bool ReplaceFile(const std::string& native, const std::string& data);

}  // namespace tessel::platform

#endif
