#include "platform/posix/Utf8.h"

#include "platform/CodePage.h"

namespace tessel::platform {

void AppendUtf8(std::string& text, char32_t character) {
    if (character < 0x80) {
        text += static_cast<char>(character);
        return;
    }
    int followers = character < 0x800 ? 1 : character < 0x10000 ? 2 : 3;
    unsigned lead = 0xFF00u >> (followers + 1);
    text += static_cast<char>(lead | character >> (6 * followers));
    while (followers-- > 0) text += static_cast<char>(0x80 | (character >> (6 * followers) & 0x3F));
}

namespace {

// Calls take(character) for each character of UTF-8. True when all were valid.
template <typename Taker>
bool ForEachUtf8(std::string_view utf8, Taker take) {
    bool valid = true;
    const char* end = utf8.data() + utf8.size();
    for (const char* at = utf8.data(); at < end;) {
        char32_t character;
        std::size_t length = DecodeUtf8(at, end, character);
        take(length ? character : kReplacementCharacter);
        if (length == 0) valid = false;
        at += length ? length : 1;
    }
    return valid;
}

}  // namespace

bool CopyUtf8(std::string_view from, std::string& to) {
    to.clear();
    to.reserve(from.size());
    return ForEachUtf8(from, [&](char32_t c) { AppendUtf8(to, c); });
}

bool Utf8ToUtf16(std::string_view utf8, std::u16string& utf16) {
    utf16.clear();
    utf16.reserve(utf8.size());
    return ForEachUtf8(utf8, [&](char32_t c) {
        if (c >= 0x10000) utf16 += static_cast<char16_t>(0xD7C0 + (c >> 10));
        utf16 += static_cast<char16_t>(c >= 0x10000 ? 0xDC00 | (c & 0x3FF) : c);
    });
}

bool Utf16ToUtf8(std::u16string_view utf16, std::string& utf8) {
    bool valid = true;
    utf8.clear();
    utf8.reserve(utf16.size());
    for (std::size_t i = 0; i < utf16.size(); ++i) {
        char32_t c = utf16[i];
        const bool high = c >= 0xD800 && c < 0xDC00;
        if (high && i + 1 < utf16.size() && utf16[i + 1] >= 0xDC00 && utf16[i + 1] < 0xE000) {
            c = ((c - 0xD7C0) << 10) | (utf16[++i] & 0x3FFu);
        } else if (c >= 0xD800 && c < 0xE000) {
            c = kReplacementCharacter;
            valid = false;
        }
        AppendUtf8(utf8, c);
    }
    return valid;
}

}  // namespace tessel::platform
