// Which file and which section the host's settings are in.
#ifndef TESSEL_SOURCE_CONFIG_PREFERENCEFILE_H
#define TESSEL_SOURCE_CONFIG_PREFERENCEFILE_H

#include <tessel/paths/PathRef.h>

namespace tessel {

// Whether the path can be that of a file: a name on a drive or on a share of a server.
bool CanBeFile(const PathRef& path);

// The path of text of this library or of the host system; not-a-path when it is none of a file.
PathRef PreferencePath(CStr text);

// The application's own preference file, and the one to use. Both raise OVExcept.
PathRef DefaultPreferenceFile();
PathRef MainPreferenceFile();

// The section that the application's edition uses.
std::string HostSection();

}  // namespace tessel

#endif
