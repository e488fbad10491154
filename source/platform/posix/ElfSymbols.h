// The functions that a module's file names, also those that the dynamic linker does not know: a program's own, and
// what a library hides.
#ifndef TESSEL_PLATFORM_POSIX_ELFSYMBOLS_H
#define TESSEL_PLATFORM_POSIX_ELFSYMBOLS_H

#include <cstdint>
#include <string>

namespace tessel::platform {

// The function at `offset` from where the module is loaded, and where it starts. False when the file names none there.
// The names of each file are read once, at the first question, and kept. Any thread.
bool FindElfSymbol(const std::string& native, std::uintptr_t offset, std::string& name, std::uintptr_t& start);

}  // namespace tessel::platform

#endif
