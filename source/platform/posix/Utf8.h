// The bytes of UTF-8. Strict: no overlong forms, no surrogates, nothing above U+10FFFF.
#ifndef TESSEL_PLATFORM_POSIX_UTF8_H
#define TESSEL_PLATFORM_POSIX_UTF8_H

#include <cstddef>
#include <string>

namespace tessel::platform {

constexpr char32_t kReplacementCharacter = 0xFFFD;

// Bytes of the character at `text` (text < end), or 0 when there is none.
std::size_t DecodeUtf8(const char* text, const char* end, char32_t& character) noexcept;

void AppendUtf8(std::string& text, char32_t character);

}  // namespace tessel::platform

#endif
