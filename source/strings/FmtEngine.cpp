// Goes over a format and renders what its specifiers ask for.
#include "strings/FmtEngine.h"

#include "base/Compiler.h"
#include "diagnostics/Guarded.h"
#include "numerics/NumericAccess.h"
#include "platform/CodePage.h"
#include "strings/DecimalPoint.h"
#include "strings/FmtOutput.h"
#include "strings/FmtRenderer.h"
#include <tessel/diagnostics/DebugStream.h>
#include <tessel/strings/StringFmtScan.h>

#include <bit>

namespace tessel {
namespace {

constexpr char kCarriageReturn = 13;
constexpr uint8 kLineFeed = 10;

// Whether one of the eight bytes is "%" or a backslash: the lowest bit set stands in the first of them.
uint64 SpecialBytes(uint64 word) {
    constexpr uint64 kOnes = 0x0101010101010101u;
    constexpr uint64 kHighs = 0x8080808080808080u;
    const uint64 percent = word ^ (kOnes * '%');
    const uint64 backslash = word ^ (kOnes * '\\');
    return (((percent - kOnes) & ~percent) | ((backslash - kOnes) & ~backslash)) & kHighs;
}

bool IsSpecial(char c) {
    return c == '%' || c == '\\';
}

// The first "%" or backslash, or end.
const char* FindSpecial(const char* p, const char* end) {
    for (; static_cast<size_t>(end - p) >= sizeof(uint64); p += sizeof(uint64)) {
        uint64 word;
        std::memcpy(&word, p, sizeof word);
        if (const uint64 special = SpecialBytes(word)) return p + std::countr_zero(special) / 8;
    }
    while (p < end && !IsSpecial(*p)) ++p;
    return p;
}

// The same in a page whose characters may hold such bytes.
const char* FindSpecialByCharacters(const char* p, const char* end) {
    while (p < end && !IsSpecial(*p)) p += platform::CharLength(p, end);
    return p;
}

// One formatting call.
class Formatter {
public:
    Formatter(FmtOutput output, const char* format, size_t length, FmtArgumentList& args)
        : output_(output), arguments_(args), start_(format), end_(format + length) {
        const platform::CodePageTables& page = platform::ActiveCodePage();
        byCharacters_ = page.multiByte && !page.utf8;
    }

    // The bytes that were, or would be, written, and whether the format was good.
    Formatted Run() {
        bool good = Pass();
        if (good && mode_ == Mode::kPositional) {
            if (!arguments_.Fetch()) return {0, false};
            recording_ = false;
            output_.Restart();
            good = Pass();
        }
        return {static_cast<int32>(output_.Used()), good};
    }

private:
    enum class Mode : uint8 { kUndecided, kOrdinary, kPositional };

    bool Pass();
    bool PlainConversion(const char* p, FmtOutput& output);
    void Escape();
    bool MayBeDecimalPoint() const {
        return *cursor_ == ';' || *cursor_ == '\\' || (end_ - cursor_ > 1 && cursor_[1] == ';');
    }
    bool Specifier();
    bool ChooseMode(const FmtSpec& spec);
    bool Convert(FmtSpec& spec);
    bool Unknown();

    FmtOutput output_;
    FmtRenderer renderer_{output_};
    FmtArguments arguments_;
    const char* start_;
    const char* end_;
    const char* cursor_ = nullptr;
    uint8 decimalPoint_ = 0;
    bool byCharacters_;
    bool recording_ = false;  // the first pass over a format with positional parameters
    Mode mode_ = Mode::kUndecided;
};

// Goes over the format once. While recording, the text between the specifiers is written and then overwritten. Cursor
// and output are kept in registers for what is most frequent: plain text and specifiers of one letter.
bool Formatter::Pass() {
    const char* p = start_;
    FmtOutput output = output_.Twin();
    decimalPoint_ = systemDecimalPoint;
    while (p < end_ && (output.HasRoom() || recording_)) {
        const char* special = byCharacters_ ? FindSpecialByCharacters(p, end_) : FindSpecial(p, end_);
        output.Put(p, static_cast<size_t>(special - p));
        p = special;
        if (p == end_ || !(output.HasRoom() || recording_)) break;
        if (PlainConversion(p, output)) {
            p += 2;
            continue;
        }
        cursor_ = p;
        output_.Resume(output);
        if (*p == '\\') {
            Escape();
        } else if (!Specifier()) {
            return false;
        }
        p = cursor_;
        output.Resume(output_);
    }
    output_.Resume(output);
    return true;
}

// Does what is most frequent; false for everything else. Inlined, so that the output stays in registers.
TESSEL_ALWAYS_INLINE bool Formatter::PlainConversion(const char* p, FmtOutput& output) {
    if (*p != '%' || end_ - p < 2 || mode_ == Mode::kPositional) return false;
    if (p[1] == 'd' || p[1] == 'u') {
        const int64 value = arguments_.Next(FmtArgType::kInt).integer;
        const bool negative = p[1] == 'd' && value < 0;
        output.PutDecimal(negative ? Magnitude(value) : static_cast<uint32>(value), negative);
    } else if (p[1] == 's') {
        const auto* text = static_cast<CStr>(arguments_.Next(FmtArgType::kPointer).pointer);
        if (text) output.Put(text, std::strlen(text));
    } else if (p[1] == 'x') {
        output.PutHex(static_cast<uint32>(arguments_.Next(FmtArgType::kInt).integer));
    } else {
        return false;
    }
    mode_ = Mode::kOrdinary;
    return true;
}

void Formatter::Escape() {
    const char* next = cursor_ + 1;
    if (byCharacters_ && next < end_ && platform::CharLength(next, end_) > 1) {
        cursor_ = next;  // an escaped character of several bytes is itself, whole
        return;
    }
    const uint8 byte = ScanForBackslash(&cursor_, end_);
    if (byte == kLineFeed) output_.Put(kCarriageReturn);
    output_.Put(static_cast<char>(byte));
}

bool Formatter::Specifier() {
    ++cursor_;
    if (cursor_ == end_ || *cursor_ == '%') {
        output_.Put('%');
        if (cursor_ < end_) ++cursor_;
        return true;
    }
    if (MayBeDecimalPoint() && ScanForFormatDecPoint(&cursor_, end_, &decimalPoint_)) return true;

    FmtSpec spec;
    FmtSpecReader reader(cursor_, end_);
    if (!reader.Read(spec)) return Unknown();
    cursor_ = reader.Cursor();
    return ChooseMode(spec) && Convert(spec);
}

// All specifiers are ordinary or all are positional.
bool Formatter::ChooseMode(const FmtSpec& spec) {
    const Mode mode = spec.position ? Mode::kPositional : Mode::kOrdinary;
    if (mode_ == mode) return true;
    if (mode_ != Mode::kUndecided) {
        TESSEL_REPORT(kDebugInfo, 0x5F80B2D7u) << "Can't mix ANSI and %n$ specifiers";
        return Unknown();
    }
    mode_ = mode;
    recording_ = mode == Mode::kPositional;
    if (recording_) arguments_.ClearTable();
    return true;
}

bool Formatter::Convert(FmtSpec& spec) {
    const FmtItem item = FmtItemOf(spec);
    if (item == FmtItem::kUnknown) return Unknown();
    if (spec.type == kFmtTypeFromArgument) {
        if (spec.position) return Unknown();
        spec.type = TypeOfCode(static_cast<int16>(arguments_.Next(FmtArgType::kInt).integer));
        if (spec.type < kNumInt8 || spec.type > kNumComplexExtended) return Unknown();
    }
    const FmtArgType type = FmtArgTypeOf(item, spec);
    if (recording_) return arguments_.Record(spec.position, type);
    renderer_.SetDecimalPoint(decimalPoint_);
    renderer_.Render(item, spec, spec.position ? arguments_.At(spec.position) : arguments_.Next(type));
    return true;
}

bool Formatter::Unknown() {
    TESSEL_REPORT(kDebugFatal, 0xE2947A06u) << "Unknown Conversion";
    return false;
}

}  // namespace

Formatted FormatText(char* dst, int32 size, const char* format, size_t length, FmtArgumentList& args) {
    if (!format) length = 0;
    const int32 limit = !dst || size == kFmtNoLimit ? INT32_MAX : std::max(size, 0);
    return Formatter(FmtOutput(dst, static_cast<size_t>(limit)), format, length, args).Run();
}

Formatted FormatText(char* dst, int32 size, const char* format, int32 formatLength, va_list args) {
    FmtArgumentList copy;
    va_copy(copy.list, args);
    const Formatted result = FormatText(dst, size, format, static_cast<size_t>(std::max(formatLength, 0)), copy);
    va_end(copy.list);
    return result;
}

MgErr FormattedText::Format(const char* format, size_t length, va_list args) {
    const auto run = [&](char* dst, size_t size) {
        FmtArgumentList copy;
        va_copy(copy.list, args);
        const Formatted result = FormatText(dst, static_cast<int32>(size), format, length, copy);
        va_end(copy.list);
        good_ = result.good;
        return static_cast<size_t>(result.length);
    };
    length_ = run(short_, sizeof short_);
    if (length_ < sizeof short_) return kNoErr;
    return Guarded([&] {
        const size_t needed = run(nullptr, 0);
        if (needed > INT32_MAX - LStrSize(1)) return kMemFullErr;
        long_.resize(needed + 1);  // one more, which shows that the text has grown
        length_ = run(long_.data(), needed + 1);
        return length_ == needed ? kNoErr : kGenericErr;
    });
}

}  // namespace tessel
