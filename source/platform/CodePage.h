// The active code page: what the bytes of a text mean.
//
// It is TESSEL_CODEPAGE (a number, or a name such as `Shift_JIS`), else the locale's, else UTF-8 (65001). UTF-8, the
// single-byte pages (1252, 28591 ...), the double-byte pages 932, 936, 949 and 950, and whatever else the host's
// converter knows, up to four bytes a character.
//
// The tables are made once, at the first use or by SetCodePage. Lookups take no lock. Any thread.
#ifndef TESSEL_PLATFORM_CODEPAGE_H
#define TESSEL_PLATFORM_CODEPAGE_H

#include <atomic>
#include <cstddef>
#include <cstdint>
#include <string>
#include <string_view>

namespace tessel::platform {

// Whether TESSEL_CODEPAGE may have this value: the number or the name of a code page that the host knows. Throws
// std::bad_alloc.
bool IsCodePageSetting(const char* value);

constexpr std::uint32_t kCodePageUtf8 = 65001;

// One code page. `length` is how many bytes a character takes that begins with this byte (1 for a byte that begins
// none). Case maps cover single-byte characters only; in multi-byte pages those of ASCII.
struct CodePageTables {
    std::uint32_t codePage;
    bool multiByte;
    bool utf8;
    std::uint8_t length[256];
    std::uint8_t upper[256];
    std::uint8_t lower[256];
};

namespace detail {
extern std::atomic<const CodePageTables*> activeCodePage;
const CodePageTables& LoadCodePage() noexcept;
}  // namespace detail

inline const CodePageTables& ActiveCodePage() noexcept {
    const CodePageTables* tables = detail::activeCodePage.load(std::memory_order_acquire);
    return tables ? *tables : detail::LoadCodePage();
}

// Makes a page the active one. False with 87 when the host does not know it. Earlier tables stay valid. Not while
// another thread works on text.
bool SetCodePage(std::uint32_t codePage);

inline bool IsLeadByte(std::uint8_t byte) noexcept {
    return ActiveCodePage().length[byte] > 1;
}
inline std::uint8_t UpperByte(std::uint8_t byte) noexcept {
    return ActiveCodePage().upper[byte];
}
inline std::uint8_t LowerByte(std::uint8_t byte) noexcept {
    return ActiveCodePage().lower[byte];
}

// Bytes of the whole character at `text`, at least 1 and at most end - text; text < end. A byte that begins no
// character, or whose followers are missing or wrong, counts alone.
std::size_t CharLengthMultiByte(const char* text, const char* end, const CodePageTables& tables) noexcept;

inline std::size_t CharLength(const char* text, const char* end) noexcept {
    const CodePageTables& tables = ActiveCodePage();
    return tables.length[static_cast<std::uint8_t>(*text)] == 1 ? 1 : CharLengthMultiByte(text, end, tables);
}

// The character after the one at `text`, in text that ends with a zero byte; at that byte it stays.
const char* NextChar(const char* text) noexcept;

// The start of the character before `text`; `start` when there is none. `start` begins a character.
const char* PrevChar(const char* start, const char* text) noexcept;

// Case mapping in place. Bytes of longer characters are not touched.
void UpperText(char* text, std::size_t count) noexcept;
void LowerText(char* text, std::size_t count) noexcept;

// Conversions to and from the active page. What cannot be converted becomes U+FFFD one way and `?` the other, and the
// result is false (LastError 1113); the text is made in any case. May throw std::bad_alloc.
bool ToUtf8(std::string_view text, std::string& utf8);
bool FromUtf8(std::string_view utf8, std::string& text);
bool ToUtf16(std::string_view text, std::u16string& utf16);
bool FromUtf16(std::u16string_view utf16, std::string& text);

// Whatever the active page. A surrogate that stands alone becomes U+FFFD, and the result is false. May throw
// std::bad_alloc.
bool Utf16ToUtf8(std::u16string_view utf16, std::string& utf8);

}  // namespace tessel::platform

#endif
