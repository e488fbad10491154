// Stepping through text by characters of the active code page.
#ifndef TESSEL_SOURCE_PATHS_PATHSTEPS_H
#define TESSEL_SOURCE_PATHS_PATHSTEPS_H

#include "paths/PathProcess.h"
#include "platform/CodePage.h"

#include <string_view>

namespace tessel {

// What FindCharacter gives when there is none, which is passed on to the members of strings.
constexpr size_t kSeparatorNotFound = std::string_view::npos;

// The position after the character at `position`, which is inside the text. Byte by byte while paths are not started.
inline size_t NextCharacter(std::string_view text, size_t position) {
    if (!StepsByCharacters()) return position + 1;
    return position + platform::CharLength(text.data() + position, text.data() + text.size());
}

// The first occurrence of a single-byte character at `position` or later, or npos.
inline size_t FindCharacter(std::string_view text, char wanted, size_t position = 0) {
    while (position < text.size() && text[position] != wanted) position = NextCharacter(text, position);
    return position < text.size() ? position : kSeparatorNotFound;
}

}  // namespace tessel

#endif
