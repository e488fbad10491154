#include "platform/CodePage.h"

#include "platform/Mutex.h"
#include "platform/posix/Errors.h"
#include "platform/posix/Utf8.h"

#include <cstdlib>
#include <cstring>
#include <errno.h>
#include <iconv.h>
#include <langinfo.h>
#include <locale.h>
#include <memory>
#include <new>
#include <strings.h>
#include <wctype.h>

namespace tessel::platform {

// ---- the tables -----------------------------------------------------------------------------------------------------

namespace {

constexpr char32_t kFirstControl = 0x80;           // of those beyond ASCII; there are 32
constexpr std::uint32_t kCodePageGb18030 = 54936;  // the only one whose second byte tells the length

constexpr void FillAscii(CodePageTables& tables) {
    for (unsigned byte = 0; byte < 256; ++byte) {
        tables.length[byte] = 1;
        tables.upper[byte] = static_cast<std::uint8_t>(byte >= 'a' && byte <= 'z' ? byte - 32 : byte);
        tables.lower[byte] = static_cast<std::uint8_t>(byte >= 'A' && byte <= 'Z' ? byte + 32 : byte);
    }
}

constexpr CodePageTables MakeUtf8Tables() {
    CodePageTables tables{kCodePageUtf8, true, true, {}, {}, {}};
    FillAscii(tables);
    for (unsigned byte = 0; byte < 256; ++byte) tables.length[byte] = kUtf8Lengths[byte];
    return tables;
}

constinit const CodePageTables utf8Tables = MakeUtf8Tables();

// A page other than UTF-8, and what the host's converter calls it. Never freed: earlier tables stay valid.
struct OtherPage : CodePageTables {
    char converterName[32];
    std::uint32_t unused = 0;  // in a single-byte page: of the bytes 80 to 9F, those that are no character
    OtherPage* next;
};

Mutex pagesMutex;
constinit OtherPage* otherPages TESSEL_GUARDED_BY(pagesMutex) = nullptr;

struct NamedPage {
    const char* name;
    std::uint32_t codePage;
};

// Pages whose name at the converter is not CP and the number. The first name of a page is the converter's.
constexpr NamedPage kNamedPages[] = {{"UTF-8", kCodePageUtf8},
                                     {"UTF8", kCodePageUtf8},
                                     {"CP932", 932},
                                     {"SHIFT_JIS", 932},
                                     {"SHIFT-JIS", 932},
                                     {"SJIS", 932},
                                     {"WINDOWS-31J", 932},
                                     {"GBK", 936},
                                     {"GB2312", 936},
                                     {"EUC-CN", 936},
                                     {"UHC", 949},
                                     {"EUC-KR", 949},
                                     {"CP950", 950},
                                     {"BIG5", 950},
                                     {"KOI8-R", 20866},
                                     {"EUC-JP", 20932},
                                     {"KOI8-U", 21866},
                                     {"ISO-8859-1", 28591},
                                     {"ISO-8859-2", 28592},
                                     {"ISO-8859-3", 28593},
                                     {"ISO-8859-4", 28594},
                                     {"ISO-8859-5", 28595},
                                     {"ISO-8859-6", 28596},
                                     {"ISO-8859-7", 28597},
                                     {"ISO-8859-8", 28598},
                                     {"ISO-8859-9", 28599},
                                     {"ISO-8859-13", 28603},
                                     {"ISO-8859-15", 28605},
                                     {"EUC-JP", 51932},
                                     {"GB18030", kCodePageGb18030}};

std::string ConverterName(std::uint32_t codePage) {
    for (const NamedPage& page : kNamedPages) {
        if (page.codePage == codePage) return page.name;
    }
    return "CP" + std::to_string(codePage);
}

// The number that a text names: digits, a name of the table, or CP, IBM or WINDOWS- and digits. 0 when it names none.
std::uint32_t CodePageNumber(const char* text) {
    for (const NamedPage& page : kNamedPages) {
        if (strcasecmp(text, page.name) == 0) return page.codePage;
    }
    for (const char* prefix : {"", "CP", "IBM", "WINDOWS-"}) {
        std::size_t length = std::strlen(prefix);
        if (strncasecmp(text, prefix, length) != 0) continue;
        char* end = nullptr;
        unsigned long number = std::strtoul(text + length, &end, 10);
        if (end != text + length && *end == 0 && number < 100000) return static_cast<std::uint32_t>(number);
    }
    return 0;
}

class Converter {
public:
    Converter(const char* to, const char* from) : handle_(iconv_open(to, from)) {}
    ~Converter() {
        if (IsOpen()) iconv_close(handle_);
    }
    Converter(const Converter&) = delete;
    Converter& operator=(const Converter&) = delete;

    bool IsOpen() const { return handle_ != reinterpret_cast<iconv_t>(-1); }
    void Restart() { iconv(handle_, nullptr, nullptr, nullptr, nullptr); }

    // 0, or the errno that stopped it: EILSEQ (no such character), EINVAL (cut short), E2BIG (no room).
    int Run(const char*& in, std::size_t& inCount, char*& out, std::size_t& outCount) {
        char* input = const_cast<char*>(in);
        std::size_t result = iconv(handle_, &input, &inCount, &out, &outCount);
        in = input;
        return result == static_cast<std::size_t>(-1) ? errno : 0;
    }

private:
    iconv_t handle_;
};

// One character alone: 0 and the character, EINVAL when it is only begun, EILSEQ when it is none.
int DecodeOne(Converter& toWide, const char* bytes, std::size_t count, char32_t& character) {
    toWide.Restart();
    char32_t wide[4] = {};
    char* out = reinterpret_cast<char*>(wide);
    std::size_t room = sizeof wide;
    int error = toWide.Run(bytes, count, out, room);
    character = wide[0];
    return error != 0 || room == sizeof wide - sizeof(char32_t) ? error : EILSEQ;
}

// How many bytes a character has that begins with the first of `bytes`; `known` of them are set.
std::uint8_t ProbeLength(Converter& toWide, char* bytes, std::size_t known) {
    if (known == 4) return 1;
    bool begun = false;
    char pending[4] = {};
    for (unsigned next = 0x21; next <= 0xFF; ++next) {
        bytes[known] = static_cast<char>(next);
        char32_t character = 0;
        int error = DecodeOne(toWide, bytes, known + 1, character);
        if (error == 0) return static_cast<std::uint8_t>(known + 1);
        if (error == EINVAL && !begun) {
            begun = true;
            std::memcpy(pending, bytes, known + 1);
        }
    }
    return begun ? ProbeLength(toWide, pending, known + 1) : 1;
}

// The lead bytes as documented for these four, which converters see differently at the edges.
bool DocumentedLeadByte(std::uint32_t codePage, unsigned byte) {
    if (codePage == 932) return (byte >= 0x81 && byte <= 0x9F) || (byte >= 0xE0 && byte <= 0xFC);
    return byte >= 0x81 && byte <= 0xFE;
}

void FillLengths(CodePageTables& tables, Converter& toWide) {
    std::uint32_t page = tables.codePage;
    bool documented = page == 932 || page == 936 || page == 949 || page == 950;
    for (unsigned byte = 0x80; byte < 256; ++byte) {
        if (documented) {
            tables.length[byte] = DocumentedLeadByte(page, byte) ? 2 : 1;
        } else {
            char bytes[4] = {static_cast<char>(byte)};
            char32_t character = 0;
            if (DecodeOne(toWide, bytes, 1, character) == EINVAL) tables.length[byte] = ProbeLength(toWide, bytes, 1);
        }
        if (tables.length[byte] > 1) tables.multiByte = true;
    }
}

// A character's byte in a single-byte page, or `otherwise`.
std::uint8_t ByteOf(const char32_t (&characters)[256], char32_t character, unsigned otherwise) {
    for (unsigned byte = 0; byte < 256; ++byte) {
        if (characters[byte] == character) return static_cast<std::uint8_t>(byte);
    }
    return static_cast<std::uint8_t>(otherwise);
}

void FillCaseMaps(CodePageTables& tables, Converter& toWide) {
    locale_t locale = newlocale(LC_CTYPE_MASK, "C.UTF-8", nullptr);
    if (!locale) return;
    char32_t characters[256];
    for (unsigned byte = 0; byte < 256; ++byte) {
        char text = static_cast<char>(byte);
        if (DecodeOne(toWide, &text, 1, characters[byte]) != 0) characters[byte] = kReplacementCharacter;
    }
    for (unsigned byte = 0x80; byte < 256; ++byte) {
        if (characters[byte] == kReplacementCharacter) continue;
        tables.upper[byte] = ByteOf(characters, towupper_l(characters[byte], locale), byte);
        tables.lower[byte] = ByteOf(characters, towlower_l(characters[byte], locale), byte);
    }
    freelocale(locale);
}

// The bytes 80 to 9F that the converter knows no character for.
std::uint32_t UnusedControls(Converter& toWide) {
    std::uint32_t unused = 0;
    for (unsigned i = 0; i < 32; ++i) {
        char text = static_cast<char>(kFirstControl + i);
        char32_t character = 0;
        if (DecodeOne(toWide, &text, 1, character) != 0) unused |= 1u << i;
    }
    return unused;
}

// A page for texts keeps ASCII where it is (some put a currency sign at the backslash, and a line over the tilde).
bool KeepsAscii(Converter& toWide) {
    for (unsigned byte = 0x20; byte < 0x7F; ++byte) {
        char text = static_cast<char>(byte);
        char32_t character = 0;
        if (byte == '\\' || byte == '~') continue;
        if (DecodeOne(toWide, &text, 1, character) != 0 || character != byte) return false;
    }
    return true;
}

std::unique_ptr<OtherPage> MakePage(std::uint32_t codePage) {
    std::string name = ConverterName(codePage);
    Converter toWide("UCS-4LE", name.c_str());
    if (name.size() >= sizeof OtherPage::converterName || !toWide.IsOpen() || !KeepsAscii(toWide)) return nullptr;
    auto page = std::make_unique<OtherPage>();
    page->codePage = codePage;
    std::memcpy(page->converterName, name.c_str(), name.size() + 1);
    FillAscii(*page);
    FillLengths(*page, toWide);
    if (!page->multiByte) {
        FillCaseMaps(*page, toWide);
        page->unused = UnusedControls(toWide);
    }
    return page;
}

// Null when the host does not know it.
const CodePageTables* FindPage(std::uint32_t codePage) TESSEL_REQUIRES(pagesMutex) {
    if (codePage == kCodePageUtf8) return &utf8Tables;
    for (OtherPage* page = otherPages; page; page = page->next) {
        if (page->codePage == codePage) return page;
    }
    std::unique_ptr<OtherPage> page = MakePage(codePage);
    if (!page) return nullptr;
    page->next = otherPages;
    otherPages = page.release();
    return otherPages;
}

std::uint32_t LocaleCodePage() {
    locale_t locale = newlocale(LC_CTYPE_MASK, "", nullptr);
    if (!locale) return 0;
    std::uint32_t number = CodePageNumber(nl_langinfo_l(CODESET, locale));
    freelocale(locale);
    return number;
}

const CodePageTables* ConfiguredPage() TESSEL_REQUIRES(pagesMutex) {
    const char* setting = std::getenv("TESSEL_CODEPAGE");
    std::uint32_t number = setting && *setting ? CodePageNumber(setting) : LocaleCodePage();
    const CodePageTables* tables = number ? FindPage(number) : nullptr;
    return tables ? tables : &utf8Tables;
}

}  // namespace

namespace detail {

constinit std::atomic<const CodePageTables*> activeCodePage{nullptr};

const CodePageTables& LoadCodePage() noexcept {
    MutexHolder holder(pagesMutex);
    const CodePageTables* tables = activeCodePage.load(std::memory_order_acquire);
    if (tables) return *tables;
    try {
        tables = ConfiguredPage();
    } catch (const std::bad_alloc&) {
        tables = &utf8Tables;
    }
    activeCodePage.store(tables, std::memory_order_release);
    return *tables;
}

}  // namespace detail

bool IsCodePageSetting(const char* value) {
    const std::uint32_t number = CodePageNumber(value);
    MutexHolder holder(pagesMutex);
    return number && FindPage(number);
}

bool SetCodePage(std::uint32_t codePage) {
    MutexHolder holder(pagesMutex);
    const CodePageTables* tables = FindPage(codePage);
    if (!tables) return FailWith(kErrorInvalidParameter);
    detail::activeCodePage.store(tables, std::memory_order_release);
    return true;
}

// ---- characters -----------------------------------------------------------------------------------------------------

std::size_t CharLengthMultiByte(const char* text, const char* end, const CodePageTables& tables) noexcept {
    if (tables.utf8) {
        char32_t character;
        std::size_t length = DecodeUtf8(text, end, character);
        return length ? length : 1;
    }
    std::size_t length = tables.length[static_cast<std::uint8_t>(*text)];
    std::size_t present = static_cast<std::size_t>(end - text);
    if (tables.codePage == kCodePageGb18030 && present > 1 && text[1] >= '0' && text[1] <= '9') length = 4;
    if (present < length) return 1;
    for (std::size_t i = 1; i < length; ++i) {
        if (text[i] == 0) return 1;
    }
    return length;
}

const char* NextChar(const char* text) noexcept {
    if (*text == 0) return text;
    const CodePageTables& tables = ActiveCodePage();
    std::size_t length = tables.length[static_cast<std::uint8_t>(*text)];
    if (tables.codePage == kCodePageGb18030 && length > 1) length = 4;
    if (length == 1) return text + 1;
    return text + CharLengthMultiByte(text, text + strnlen(text, length), tables);
}

namespace {

const char* PrevUtf8(const char* start, const char* text) {
    for (const char* from = text - 1; from >= start && text - from <= 4; --from) {
        if ((static_cast<std::uint8_t>(*from) & 0xC0) == 0x80) continue;
        char32_t character;
        return DecodeUtf8(from, text, character) == static_cast<std::size_t>(text - from) ? from : text - 1;
    }
    return text - 1;
}

// Where a byte may be a lead or a trail, only the way from a known start tells. Every byte below the lead bytes ends a
// character, so the way begins behind the last such byte.
const char* PrevByScanning(const char* start, const char* text, const CodePageTables& tables) {
    const char* from = text - 1;
    while (from > start && tables.length[static_cast<std::uint8_t>(from[-1])] > 1) --from;
    if (tables.codePage == kCodePageGb18030 || tables.codePage == 20932 || tables.codePage == 51932) from = start;
    const char* previous = from;
    while (from < text) {
        previous = from;
        from += CharLength(from, text);
    }
    return previous;
}

}  // namespace

const char* PrevChar(const char* start, const char* text) noexcept {
    if (text <= start) return start;
    const CodePageTables& tables = ActiveCodePage();
    if (!tables.multiByte) return text - 1;
    return tables.utf8 ? PrevUtf8(start, text) : PrevByScanning(start, text, tables);
}

namespace {

void MapText(char* text, std::size_t count, const CodePageTables& tables, const std::uint8_t* map) {
    const char* end = text + count;
    while (text < end) {
        std::uint8_t byte = static_cast<std::uint8_t>(*text);
        if (tables.length[byte] == 1) {
            *text++ = static_cast<char>(map[byte]);
        } else {
            text += CharLengthMultiByte(text, end, tables);
        }
    }
}

}  // namespace

void UpperText(char* text, std::size_t count) noexcept {
    const CodePageTables& tables = ActiveCodePage();
    MapText(text, count, tables, tables.upper);
}

void LowerText(char* text, std::size_t count) noexcept {
    const CodePageTables& tables = ActiveCodePage();
    MapText(text, count, tables, tables.lower);
}

// ---- conversions ----------------------------------------------------------------------------------------------------

namespace {

// Converters are for one thread and dear to open: each thread keeps its last one in each direction.
struct ThreadConverters {
    const CodePageTables* page = nullptr;
    std::unique_ptr<Converter> toUtf8, fromUtf8;
};

ThreadConverters& Converters(const CodePageTables& page) {
    thread_local ThreadConverters converters;
    if (converters.page != &page) {
        const char* name = static_cast<const OtherPage&>(page).converterName;
        converters.page = nullptr;
        converters.toUtf8 = std::make_unique<Converter>("UTF-8", name);
        converters.fromUtf8 = std::make_unique<Converter>(name, "UTF-8");
        converters.page = &page;
    }
    return converters;
}

// What takes the place of a character at which the converter stopped.
struct Substitute {
    std::size_t skipped;  // bytes
    bool same;            // it is the same character
};

// Runs the converter over `in`. Where it stops at a character, substitute(rest, out) appends what takes its place. True
// when no character was lost.
template <typename Substituter>
bool Convert(Converter& converter, std::string_view in, std::string& out, Substituter substitute) {
    bool complete = converter.IsOpen();
    if (!complete) out.assign(in);
    const char* input = in.data();
    std::size_t inCount = complete ? in.size() : 0;
    if (complete) converter.Restart();
    while (inCount > 0) {
        char buffer[512];
        char* output = buffer;
        std::size_t room = sizeof buffer;
        int error = converter.Run(input, inCount, output, room);
        out.append(buffer, sizeof buffer - room);
        if (error == 0 || error == E2BIG) continue;
        Substitute substituted = substitute(std::string_view(input, inCount), out);
        input += substituted.skipped;
        inCount -= substituted.skipped;
        if (!substituted.same) complete = false;
    }
    return complete;
}

// The bytes from 80 to 9F that a single-byte page leaves unused are the controls of these numbers, both ways: on the
// hosts that the pages come from they are, so that no text changes on its way to Unicode and back.
bool IsControl(const CodePageTables& page, char32_t character) {
    if (character < kFirstControl || character >= kFirstControl + 32) return false;
    return (static_cast<const OtherPage&>(page).unused >> (character - kFirstControl) & 1) != 0;
}

bool Converted(bool complete) {
    return complete || FailWith(kErrorNoUnicodeTranslation);
}

}  // namespace

bool ToUtf8(std::string_view text, std::string& utf8) {
    const CodePageTables& page = ActiveCodePage();
    if (page.utf8) return Converted(CopyUtf8(text, utf8));
    utf8.clear();
    utf8.reserve(text.size());
    return Converted(Convert(*Converters(page).toUtf8, text, utf8, [&](std::string_view rest, std::string& out) {
        std::uint8_t byte = static_cast<std::uint8_t>(rest[0]);
        bool control = IsControl(page, byte);
        AppendUtf8(out, control ? byte : kReplacementCharacter);
        return Substitute{CharLength(rest.data(), rest.data() + rest.size()), control};
    }));
}

bool FromUtf8(std::string_view utf8, std::string& text) {
    const CodePageTables& page = ActiveCodePage();
    if (page.utf8) return Converted(CopyUtf8(utf8, text));
    text.clear();
    text.reserve(utf8.size());
    return Converted(Convert(*Converters(page).fromUtf8, utf8, text, [&](std::string_view rest, std::string& out) {
        char32_t character = 0;
        std::size_t length = DecodeUtf8(rest.data(), rest.data() + rest.size(), character);
        bool control = length != 0 && IsControl(page, character);
        out += control ? static_cast<char>(character) : '?';
        return Substitute{length ? length : 1, control};
    }));
}

bool ToUtf16(std::string_view text, std::u16string& utf16) {
    std::string utf8;
    const bool complete = ToUtf8(text, utf8);
    Utf8ToUtf16(utf8, utf16);
    return complete;
}

bool FromUtf16(std::u16string_view utf16, std::string& text) {
    std::string utf8;
    const bool valid = Utf16ToUtf8(utf16, utf8);
    return FromUtf8(utf8, text) && Converted(valid);
}

}  // namespace tessel::platform
