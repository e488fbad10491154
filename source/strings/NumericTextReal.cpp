// Decimal records and reals, exponential and fixed.
#include "strings/NumericTextParts.h"
#include <tessel/diagnostics/DebugStream.h>
#include <tessel/strings/NumericText.h>

#include <atomic>

namespace tessel {
namespace {

std::atomic<CStr> nanText{"NaN"};
std::atomic<CStr> infText{"Inf"};

constexpr int32 kMostDecimals = 63;
constexpr int32 kFirstLeadNotFixed = 308;
constexpr int32 kLeastLead = -4915;  // what is smaller is rendered as zero
constexpr int32 kFixedRoom = 4;      // what a fixed text may need beside its digits
constexpr int32 kExponentRoom = 8;   // what an exponential text may need beside its digits

CStr SpecialText(RealKind kind) {
    return (kind == RealKind::kNaN ? nanText : infText).load(std::memory_order_relaxed);
}

// ---- digits to text -------------------------------------------------------------------------------------------------

void PutExponential(const RealText& text, int32 k, char decimalPoint, TextOut& out) {
    if (text.lead < kLeastLead) {
        out.Put('0');
        if (k > 1) out.Put(decimalPoint);
        out.Fill('0', k - 1);
    } else {
        out.Put(*text.digits.First());
        if (k > 1) {
            out.Put(decimalPoint);
            out.PutDigits(text.digits, 1, k - 1);
        }
    }
    char exponent[kExponentTextSize];
    out.Put(exponent, WriteExponent(text.lead < kLeastLead ? 0 : text.lead, exponent));
}

void PutFixed(const RealText& text, int32 decimals, char decimalPoint, TextOut& out) {
    const int32 whole = std::max(text.lead + 1, int32{0});
    if (whole == 0) {
        out.Put('0');
    } else {
        out.PutDigits(text.digits, 0, whole);
    }
    if (decimals == 0) return;
    out.Put(decimalPoint);
    const int32 zeros = std::min(std::max(-text.lead - 1, int32{0}), decimals);
    out.Fill('0', zeros);
    out.PutDigits(text.digits, whole, decimals - zeros);
}

RealText RoundToText(RealParts parts, int32 k) {
    RealText text;
    text.kind = parts.kind;
    text.negative = parts.negative;
    if (parts.kind != RealKind::kFinite) return text;
    const DecimalDigits decimal = RoundToDecimal(parts, k);
    text.lead = decimal.exponent + decimal.count - 1;
    text.digits.Set(decimal.digits, decimal.count);
    return text;
}

// ---- integers -------------------------------------------------------------------------------------------------------

// The digits cut to k of them, the last one rounded half up; a carry out of the first raises the exponent.
RealText CutInteger(uint64 magnitude, int32 k) {
    RealText text;
    auto count = static_cast<int32>(CountDecimalDigits(magnitude));
    text.lead = count - 1;
    if (count > k) {
        const uint64 unit = PowerOfTen64(count - k);
        const bool up = magnitude % unit >= unit / 2;
        magnitude = magnitude / unit + (up ? 1 : 0);
        count = k;
        if (magnitude == PowerOfTen64(k)) {
            magnitude /= 10;
            ++text.lead;
        }
    }
    text.digits.Set(magnitude, count);
    return text;
}

int32 RenderInteger(const RealSource& source, int32 k, char* buffer, int32 size, char decimalPoint) {
    TextOut out(buffer, size);
    if (source.parts.negative) out.Put('-');
    if (k > 0) {
        PutExponential(CutInteger(source.magnitude, k), k, decimalPoint, out);
        return out.Length();
    }
    DigitText digits;
    digits.Set(source.magnitude, static_cast<int32>(CountDecimalDigits(source.magnitude)));
    out.PutDigits(digits, 0, digits.count);
    if (k < 0) out.Put(decimalPoint);
    out.Fill('0', std::min(-k, kMostDecimals));
    return out.Length();
}

// ---- records --------------------------------------------------------------------------------------------------------

uint8 Nibble(const PackedDecimal& record, int32 index) {
    return (record.mantissa[index / 2] >> (index % 2 == 0 ? 0 : 4)) & 15;
}

RealKind KindOf(const PackedDecimal& record) {
    switch (record.exponent) {
        case kPackedDecimalNaNExponent:
            return RealKind::kNaN;
        case kPackedDecimalInfExponent:
            return RealKind::kInfinite;
        default:
            return RealKind::kFinite;
    }
}

// False when a digit is none. Leading zeros are left out.
bool ReadRecord(const PackedDecimal& record, RealText& text) {
    text.kind = KindOf(record);
    text.negative = record.sign != 0;
    if (text.kind != RealKind::kFinite) return true;
    bool good = true;
    uint64 digits = 0;
    int32 count = 0;
    for (int32 i = std::min<int32>(record.mdigits, kPackedDecimalDigits - 1); i >= 0; --i) {
        const uint8 digit = Nibble(record, i);
        good = good && digit <= 9;
        digits = 10 * digits + digit;
        if (digits != 0) ++count;
    }
    text.digits.Set(digits, std::max(count, int32{1}));
    text.lead = digits == 0 ? 0 : record.exponent + count - 1;
    return good;
}

// The code that is used: what fixed notation does not show well becomes exponential.
int32 CodeInUse(const RealText& text, int32 k, int32 size) {
    k = std::max(k, -kMostDecimals);
    if (k <= 0 && (text.lead - k > size - kFixedRoom || text.lead >= kFirstLeadNotFixed)) k = 1 - k;
    return std::min(k, std::max(size - kExponentRoom, int32{0}));
}

void ReportBadRecord(const PackedDecimal& record, bool exponential) {
    {
        DebugReport dump(__FILE__, __LINE__, __func__, kDebugInfo, 0x4E7719C2u);
        dump << "sign " << int32{record.sign} << ", exp " << record.exponent << ", mdigits " << record.mdigits << ", m";
        for (const uint8 byte : record.mantissa) dump << DbgFmtType<unsigned>(byte, "0x%02x");
    }
    TESSEL_REPORT(kDebugFatal, 0xA2065B1Fu) << (exponential ? "bad pdr, exp fmt" : "bad pdr, dec fmt");
}

}  // namespace

int32 FormatReal(const RealText& text, int32 k, char* buffer, int32 size, char decimalPoint) {
    TextOut out(buffer, size);
    if (text.negative && text.kind != RealKind::kNaN) out.Put('-');
    if (text.kind != RealKind::kFinite) {
        out.Put(SpecialText(text.kind));
        return out.Length();
    }
    k = CodeInUse(text, k, size);
    if (k >= 1) {
        PutExponential(text, k, decimalPoint, out);
    } else {
        PutFixed(text, -k, decimalPoint, out);
    }
    return out.Length();
}

int32 RenderReal(const RealSource& source, int32 k, char* buffer, int32 size, char decimalPoint) {
    if (source.isInteger) return RenderInteger(source, k, buffer, size, decimalPoint);
    return FormatReal(RoundToText(source.parts, std::max(k, -kMostDecimals)), k, buffer, size, decimalPoint);
}

}  // namespace tessel

using namespace tessel;

int32 PackedToString(const PackedDecimal* record, int16 formatCode, char* buffer, int32 size, uint8 decimalPoint) {
    if (record == nullptr || buffer == nullptr || size <= 0) return 0;
    RealText text;
    if (!ReadRecord(*record, text)) {
        ReportBadRecord(*record, CodeInUse(text, formatCode, size) > 0);
        return 0;
    }
    return FormatReal(text, formatCode, buffer, size, static_cast<char>(decimalPoint));
}

CStr NumSetNaNText(CStr text) {
    return nanText.exchange(text != nullptr ? text : "NaN");
}

CStr NumSetInfText(CStr text) {
    return infText.exchange(text != nullptr ? text : "Inf");
}
