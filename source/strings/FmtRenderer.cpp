// Renders one conversion: numbers, texts, points, rectangles and paths.
#include "strings/FmtRenderer.h"

#include "numerics/NumericAccess.h"
#include "strings/NumericTextParts.h"
#include "strings/PathText.h"
#include <tessel/numerics/NumericSupport.h>
#include <tessel/strings/NumericText.h>
#include <tessel/strings/StringCStr.h>
#include <tessel/strings/StringFmtPrint.h>

#include <cmath>

namespace tessel {
namespace {

constexpr int32 kScratchSize = 256;  // no rendered number is longer
constexpr int32 kAddressDigits = 8;

constexpr int32 kMaxSignificantDigits = 17;
constexpr int32 kDefaultSignificantDigits = 7;
constexpr int32 kExponentWidth = 5;  // sign, point and exponent of the exponential form, left out of a given width
constexpr int32 kDefaultDecimals = 6;
constexpr int32 kMaxDecimals = 63;
constexpr int32 kDefaultFixedLimit = 18;  // powers of ten that the fixed form shows when no width is given
constexpr int32 kSpecialTextLength = 3;   // "NaN", "Inf"

LStrView TextOf(FmtItem item, const void* argument) {
    switch (item) {
        case FmtItem::kPString:
            return LStrView(static_cast<ConstPStr>(argument));
        case FmtItem::kLString:
            return LStrView(static_cast<const LStr*>(argument));
        case FmtItem::kLHandle:
            return LStrView(static_cast<LStrHandle>(const_cast<void*>(argument)));
        default: {
            const auto* range = static_cast<const FmtBytes*>(argument);
            return range ? LStrView(range->bytes, range->length) : LStrView(nullptr, 0);
        }
    }
}

int32 IntegerCode(FmtItem item) {
    switch (item) {
        case FmtItem::kSigned:
            return kFormatDecimal;
        case FmtItem::kUnsigned:
            return kFormatUnsigned;
        case FmtItem::kOctal:
            return kFormatOctal;
        case FmtItem::kBinary:
            return kFormatBinary;
        default:
            return kFormatHex;
    }
}

int32 ExponentialCode(const FmtSpec& spec) {
    int32 digits = kDefaultSignificantDigits;
    if (spec.precision >= 0) {
        digits = std::min(spec.precision, kMaxSignificantDigits) + 1;
    } else if (spec.width > kExponentWidth + 1) {
        digits = spec.width - kExponentWidth;
    }
    return std::min(digits, kMaxSignificantDigits);
}

// |trunc(log10 |x|)| is at most `limit`. Mostly the power of two tells; x is finite and not 0.
bool PowerFits(RealParts x, int32 limit) {
    constexpr double kLog10Of2 = 0.301029995663981195;
    const auto fits = [limit](auto power) { return std::abs(static_cast<int32>(power)) <= limit; };
    const double below = kLog10Of2 * (x.exponent + 63);
    const bool fitsBelow = fits(below);
    if (fitsBelow == fits(below + kLog10Of2)) return fitsBelow;
    return fits(std::log10(std::ldexp(static_cast<Extended>(x.mantissa), x.exponent)));
}

// Whether the fixed form of a real shows it without more digits than are sensible.
bool FixedFits(RealParts x, int32 limit) {
    if (x.kind != RealKind::kFinite) return limit >= kSpecialTextLength;
    if (x.mantissa == 0) return limit >= 1;
    return PowerFits(x, limit - (x.negative ? 1 : 0));
}

bool FixedFits(const void* value, int16 type, int32 limit) {
    if (!value) return limit >= 1;  // a zero
    const ExtendedComplex parts = ReadNumber(type, value);
    const auto fits = [limit](Extended part) { return FixedFits(TakeApart(FromExtended(part)), limit); };
    return fits(parts.re) && (type < kNumComplexSingle || fits(parts.im));
}

int32 FixedLimit(const FmtSpec& spec) {
    return spec.width != 0 ? spec.width - 1 : kDefaultFixedLimit;
}

int32 FixedCode(const FmtSpec& spec) {
    return -std::min(spec.precision < 0 ? kDefaultDecimals : spec.precision, kMaxDecimals);
}

}  // namespace

void FmtRenderer::RenderOther(FmtItem item, const FmtSpec& spec, FmtValue value) {
    const auto word = static_cast<int32>(value.integer);
    switch (item) {
        case FmtItem::kCharacter:
            return RenderCharacter(spec, word);
        case FmtItem::kNamedPoint:
            PutWord("hv");
            [[fallthrough]];
        case FmtItem::kPoint:
            return RenderPoint(static_cast<uint32>(word));
        case FmtItem::kNamedRectangle:
            PutWord("tlbr");
            [[fallthrough]];
        case FmtItem::kRectangle:
            return RenderRectangle(static_cast<const int16*>(value.pointer));
        case FmtItem::kPath:
            return RenderPath(static_cast<Path>(const_cast<void*>(value.pointer)));
        default:
            return IsNumber(item) ? RenderNumber(item, spec, value) : RenderText(spec, TextOf(item, value.pointer));
    }
}

// ---- numbers --------------------------------------------------------------------------------------------------------

void FmtRenderer::RenderNumber(FmtItem item, const FmtSpec& spec, FmtValue value) {
    FmtSpec shape = spec;
    if (item == FmtItem::kAddress) {
        PutWord("0x");
        shape.left = false;
        shape.pad = '0';
        shape.width = kAddressDigits;
    }
    if (spec.type != kFmtNoType) return RenderTyped(item, shape, value.pointer, spec.type);
    if (item >= FmtItem::kExponential) return RenderReal(item, shape, value.real);
    RenderInteger(item, shape, value.integer);
}

// Everything but signed decimal: the bit pattern.
void FmtRenderer::RenderInteger(FmtItem item, const FmtSpec& spec, int64 value) {
    const bool wide = spec.size == FmtSize::kInt64 && item != FmtItem::kAddress;
    uint64 bits = wide ? static_cast<uint64>(value) : static_cast<uint32>(value);
    if (item == FmtItem::kUnsigned) return RenderDecimal(spec, bits, false);

    const int shift = item == FmtItem::kBinary ? 1 : item == FmtItem::kOctal ? 3 : 4;
    char digits[64];
    char* end = digits + sizeof digits;
    char* p = end;
    do {
        *--p = HexChar(static_cast<int32>(bits & ((1u << shift) - 1)));
        bits >>= shift;
    } while (bits != 0);
    PutNumber(spec, p, static_cast<size_t>(end - p));
}

// For an output that has no room for all of it, or only counts.
void FmtRenderer::RenderDecimalInPieces(const FmtSpec& spec, uint64 magnitude, bool negative) {
    char text[kMaxDecimalDigits + 1];
    PutNumber(spec, text, static_cast<size_t>(WriteDecimal(text, magnitude, negative) - text));
}

void FmtRenderer::RenderReal(FmtItem item, const FmtSpec& spec, double value) {
    const RealParts parts = TakeApart(value);
    const bool fixed = item == FmtItem::kFixed && FixedFits(parts, FixedLimit(spec));
    const int32 code = fixed ? FixedCode(spec) : ExponentialCode(spec);
    char text[kScratchSize];
    const int32 length =
        tessel::RenderReal({parts, false, 0}, code, text, kScratchSize, static_cast<char>(decimalPoint_));
    PutNumber(spec, text, static_cast<size_t>(Terminate(text, kScratchSize, length)));
}

// Numbers of a type that the format names.
void FmtRenderer::RenderTyped(FmtItem item, const FmtSpec& spec, const void* value, int16 type) {
    int32 code = IntegerCode(item);
    if (item == FmtItem::kExponential) code = ExponentialCode(spec);
    if (item == FmtItem::kFixed) {
        code = FixedFits(value, type, FixedLimit(spec)) ? FixedCode(spec) : ExponentialCode(spec);
    }
    const auto formatCode = static_cast<int16>(code);
    char text[kScratchSize];
    const int32 length = NumToAnyString(value, type, &formatCode, text, kScratchSize, decimalPoint_, nullptr);
    PutNumber(spec, text, static_cast<size_t>(std::max(length, 0)));
}

void FmtRenderer::PutNumber(const FmtSpec& spec, const char* text, size_t length) {
    const size_t pad = Padding(spec, length);
    if (pad != 0 && !spec.left && spec.pad == '0' && text[0] == '-') {
        output_.Put('-');
        output_.Fill('0', pad);
        output_.Put(text + 1, length - 1);
    } else {
        PutPadded(spec, text, length);
    }
}

// ---- characters, texts, points and rectangles -----------------------------------------------------------------------

void FmtRenderer::RenderCharacter(const FmtSpec& spec, int32 value) {
    if (spec.width == 2 || spec.width == 4) {
        RenderText(spec, LStrView(&value, spec.width));
    } else {
        output_.Put(static_cast<char>(value));
    }
}

void FmtRenderer::RenderText(const FmtSpec& spec, LStrView text) {
    const size_t length = spec.precision < 0 ? text.length : std::min(text.length, static_cast<size_t>(spec.precision));
    PutPadded(spec, reinterpret_cast<const char*>(text.bytes), length);
}

void FmtRenderer::RenderPath(Path path) {
    Str255 text;
    PathTextForPrinting(path, text);
    output_.Put(text + 1, text[0]);
}

void FmtRenderer::RenderPoint(uint32 point) {
    output_.Put('(');
    PutShort(static_cast<int16>(point >> 16));
    output_.Put(',');
    PutShort(static_cast<int16>(point & 0xFFFF));
    output_.Put(')');
}

void FmtRenderer::RenderRectangle(const int16* rectangle) {
    for (int i = 0; rectangle && i < 4; ++i) {
        PutWord(i == 0 ? "(" : ", ");
        PutShort(rectangle[i]);
    }
    if (rectangle) output_.Put(')');
}

}  // namespace tessel
