// The user's own folders, by the host's names.
#ifndef TESSEL_PLATFORM_POSIX_FOLDERS_H
#define TESSEL_PLATFORM_POSIX_FOLDERS_H

#include <string>

namespace tessel::platform {

// $HOME, else what the account says, else "/". No separator at the end, but for "/".
std::string HomeFolder();

// What an XDG variable names if it is absolute, else `underHome` in the home folder.
std::string XdgFolder(const char* variable, const char* underHome);

// Makes the folder and what is missing above it, and puts that onto the device. True when it is there. False with
// errno.
bool MakeFolders(const std::string& native, unsigned mode = 0777);

// Puts what was made, renamed and deleted in a folder, open for reading, onto the device. False with errno.
bool FlushFolder(int folder);
bool FlushFolder(const std::string& native);

}  // namespace tessel::platform

#endif
