// The text of preference files: white space, and names, which compare without regard to the case of A to Z.
#ifndef TESSEL_SOURCE_CONFIG_ININAMES_H
#define TESSEL_SOURCE_CONFIG_ININAMES_H

#include <cstdint>
#include <cstring>
#include <string_view>

namespace tessel {

// What the C locale calls white space.
inline bool IsIniSpace(char c) {
    return c == ' ' || (c >= '\t' && c <= '\r');
}

inline std::string_view TrimmedIni(const char* begin, const char* end) {
    while (begin < end && IsIniSpace(*begin)) ++begin;
    while (begin < end && IsIniSpace(end[-1])) --end;
    return {begin, static_cast<std::size_t>(end - begin)};
}
inline std::string_view TrimmedIni(std::string_view text) {
    return TrimmedIni(text.data(), text.data() + text.size());
}

// Eight bytes with A to Z in lower case, all others as they are.
inline std::uint64_t FoldedWord(std::uint64_t word) {
    constexpr std::uint64_t kOnes = 0x0101010101010101u, kHigh = 0x80 * kOnes;
    const std::uint64_t low = word & ~kHigh;
    const std::uint64_t fromA = low + (0x80 - 'A') * kOnes, beyondZ = low + (0x7F - 'Z') * kOnes;
    return word | ((fromA ^ beyondZ) & ~word & kHigh) >> 2;
}

// Calls take(word) for words that together hold every byte of the text, some of them twice, until it returns false.
// Which bytes stand where depends on nothing but the length.
template <class Take>
void ForEachWord(const char* text, std::size_t length, Take take) {
    std::uint64_t word = 0;
    if (length >= 8) {
        for (std::size_t at = 0; at + 8 < length; at += 8) {
            std::memcpy(&word, text + at, 8);
            if (!take(at, word)) return;
        }
        std::memcpy(&word, text + length - 8, 8);
        take(length - 8, word);
    } else if (length >= 4) {
        std::uint32_t first, last;
        std::memcpy(&first, text, 4);
        std::memcpy(&last, text + length - 4, 4);
        take(0, std::uint64_t{first} << 32 | last);
    } else if (length > 0) {
        for (const std::size_t at : {std::size_t{0}, length / 2, length - 1}) {
            word = word << 8 | static_cast<unsigned char>(text[at]);
        }
        take(0, word);
    }
}

// Equal for names that EqualIniNames calls equal. Of trimmed names.
inline std::uint32_t IniNameHash(std::string_view name, std::uint32_t seed) {
    constexpr std::uint64_t kFactor = 0x9E3779B97F4A7C15u;
    std::uint64_t hash = (seed + 1) * kFactor ^ name.size();
    ForEachWord(name.data(), name.size(), [&](std::size_t, std::uint64_t word) {
        hash = (hash ^ FoldedWord(word)) * kFactor;
        hash ^= hash >> 32;
        return true;
    });
    hash *= kFactor;
    return static_cast<std::uint32_t>(hash >> 32);
}

inline bool EqualIniNames(std::string_view a, std::string_view b) {
    if (a.size() != b.size()) return false;
    std::uint64_t words[2] = {};
    if (a.size() < 8) {
        ForEachWord(a.data(), a.size(), [&](std::size_t, std::uint64_t word) { return words[0] = word, false; });
        ForEachWord(b.data(), b.size(), [&](std::size_t, std::uint64_t word) { return words[1] = word, false; });
        return FoldedWord(words[0]) == FoldedWord(words[1]);
    }
    bool equal = true;
    ForEachWord(a.data(), a.size(), [&](std::size_t at, std::uint64_t word) {
        std::uint64_t other;
        std::memcpy(&other, b.data() + at, 8);
        return equal = FoldedWord(word) == FoldedWord(other);
    });
    return equal;
}

// The section of the keys before the first header.
inline constexpr std::string_view kNullSection = "(null)";
inline bool IsNullSection(std::string_view trimmed) {
    return EqualIniNames(trimmed, kNullSection);
}

// Whether a value, without the white space around it, stands within double quotes, which it loses.
inline bool StripQuotes(std::string_view& value) {
    if (value.size() < 2 || value.front() != '"' || value.back() != '"') return false;
    value = value.substr(1, value.size() - 2);
    return true;
}

}  // namespace tessel

#endif
