// Which names a file can have.
#ifndef TESSEL_SOURCE_PATHS_FILENAMES_H
#define TESSEL_SOURCE_PATHS_FILENAMES_H

#include <tessel/base/Types.h>

#include <string>
#include <string_view>

namespace tessel {

// What is wrong with a name that is not empty: 0, or kFileName... flags. Offending characters are appended to `bad`,
// which may be null.
int32 CheckFileName(std::string_view name, std::string* bad);

}  // namespace tessel

#endif
