// The printing functions over the formatting engine.
#include "strings/FmtEngine.h"
#include "strings/HandleOps.h"
#include "strings/LStrView.h"
#include <tessel/diagnostics/DebugStream.h>
#include <tessel/strings/StringFmtPrint.h>

using namespace tessel;

namespace {

size_t LengthOf(CStr format) {
    return format ? std::strlen(format) : 0;
}

size_t LengthOf(ConstPStr format) {
    return format ? format[0] : 0;
}

size_t Format(char* dst, int32 size, const char* format, size_t length, FmtArgumentList& args) {
    return static_cast<size_t>(FormatText(dst, size, format, length, args).length);
}

int32 FormatTerminated(char* dst, const char* format, size_t length, FmtArgumentList& args) {
    const size_t written = Format(dst, kFmtNoLimit, format, length, args);
    if (dst) dst[written] = 0;
    return static_cast<int32>(written);
}

int32 FormatPStr(PStr dst, const char* format, size_t length, FmtArgumentList& args) {
    if (!dst) return 0;
    const size_t written = Format(reinterpret_cast<char*>(dst + 1), kMaxPStr, format, length, args);
    dst[0] = static_cast<uint8>(written);
    return dst[0];
}

const char* Chars(ConstPStr text) {
    return text ? reinterpret_cast<const char*>(text + 1) : nullptr;
}

}  // namespace

int32 SPrintfv(char* dst, int32 size, const char* format, int32 formatLength, va_list args) {
    return FormatText(dst, size, format, formatLength, args).length;
}

int32 SPrintf(char* dst, CStr format, ...) {
    FmtArgumentList args;
    va_start(args.list, format);
    const int32 written = FormatTerminated(dst, format, LengthOf(format), args);
    va_end(args.list);
    return written;
}

int32 SPrintfp(char* dst, ConstPStr format, ...) {
    FmtArgumentList args;
    va_start(args.list, format);
    const int32 written = FormatTerminated(dst, Chars(format), LengthOf(format), args);
    va_end(args.list);
    return written;
}

int32 SNPrintf(char* dst, int32 size, CStr format, ...) {
    if (dst && size <= 0) return 0;
    FmtArgumentList args;
    va_start(args.list, format);
    const auto written = static_cast<int32>(Format(dst, size, format, LengthOf(format), args));
    va_end(args.list);
    if (dst) dst[std::min(written, size - 1)] = 0;
    return written;
}

int32 PPrintf(PStr dst, CStr format, ...) {
    FmtArgumentList args;
    va_start(args.list, format);
    const int32 written = FormatPStr(dst, format, LengthOf(format), args);
    va_end(args.list);
    return written;
}

int32 PPrintfp(PStr dst, ConstPStr format, ...) {
    FmtArgumentList args;
    va_start(args.list, format);
    const int32 written = FormatPStr(dst, Chars(format), LengthOf(format), args);
    va_end(args.list);
    return written;
}

MgErr LStrPrintf(LStrHandle dst, CStr format, ...) {
    if (!dst || !format) return kArgErr;
    FormattedText text;
    va_list args;
    va_start(args, format);
    MgErr err = text.Format(format, LengthOf(format), args);
    va_end(args);
    if (err == kGenericErr) TESSEL_REPORT(kDebugFatal, 0x48A3D5F1u);
    if (!err) err = DSSetHandleSize(AsHandle(dst), LStrSize(text.Length()));
    if (err) return err;
    std::memcpy((*dst)->bytes, text.Bytes(), text.Length());
    (*dst)->count = static_cast<int32>(text.Length());
    return kNoErr;
}
