// The bytes of UTF-8. Strict: no overlong forms, no surrogates, nothing above U+10FFFF.
#ifndef TESSEL_PLATFORM_POSIX_UTF8_H
#define TESSEL_PLATFORM_POSIX_UTF8_H

#include <array>
#include <cstddef>
#include <cstdint>
#include <string>
#include <string_view>

namespace tessel::platform {

constexpr char32_t kReplacementCharacter = 0xFFFD;

// Bytes of the character that each byte begins; 1 for those that begin none.
inline constexpr std::array<std::uint8_t, 256> kUtf8Lengths = [] {
    std::array<std::uint8_t, 256> lengths{};
    lengths.fill(1);
    for (unsigned byte = 0xC2; byte <= 0xF4; ++byte) lengths[byte] = byte < 0xE0 ? 2 : byte < 0xF0 ? 3 : 4;
    return lengths;
}();

// Bytes of the character at `text` (text < end), or 0 when there is none.
inline std::size_t DecodeUtf8(const char* text, const char* end, char32_t& character) noexcept {
    std::uint8_t lead = static_cast<std::uint8_t>(*text);
    std::size_t length = kUtf8Lengths[lead];
    if (length == 1) {
        character = lead;
        return lead < 0x80 ? 1 : 0;
    }
    if (static_cast<std::size_t>(end - text) < length) return 0;
    character = lead & (0x7Fu >> length);
    for (std::size_t i = 1; i < length; ++i) {
        std::uint8_t next = static_cast<std::uint8_t>(text[i]);
        if ((next & 0xC0) != 0x80) return 0;
        character = character << 6 | (next & 0x3Fu);
    }
    constexpr char32_t kLeast[5] = {0, 0, 0x80, 0x800, 0x10000};
    bool surrogate = character >= 0xD800 && character <= 0xDFFF;
    return character < kLeast[length] || surrogate || character > 0x10FFFF ? 0 : length;
}

void AppendUtf8(std::string& text, char32_t character);

// Copies what is valid; U+FFFD takes the place of each byte that is not, and the result is false.
bool CopyUtf8(std::string_view from, std::string& to);

// The same into UTF-16.
bool Utf8ToUtf16(std::string_view utf8, std::u16string& utf16);

}  // namespace tessel::platform

#endif
