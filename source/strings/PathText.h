// What "%z" prints. Paths stand above the strings: they define it, in paths/PathPrinting.cpp.
#ifndef TESSEL_STRINGS_PATHTEXT_H
#define TESSEL_STRINGS_PATHTEXT_H

#include <tessel/base/StringTypes.h>

namespace tessel {

// Display text, "NULL" for null, the text for paths that are too long for texts of 253 bytes and more, nothing for a
// path that has no text.
void PathTextForPrinting(Path path, PStr text);

}  // namespace tessel

#endif
