// Printing into an OVString and into a view of one.
#include "strings/FmtEngine.h"
#include <tessel/diagnostics/DebugStream.h>
#include <tessel/strings/ovstring.h>

#include <cstring>

namespace tessel {

MgErr OVSubStringPrintf(OVSubString* string, bool append, CStr format, va_list args) {
    if (!string) {
        TESSEL_REPORT(kDebugError, 0x83E51D29u) << "Bad string ptr";
        return kArgErr;
    }
    FormattedText text;
    MgErr err = text.Format(format, format ? std::strlen(format) : 0, args);
    if (err == kGenericErr) {
        TESSEL_REPORT(kDebugError, 0x2CB470E8u) << "OVSubStringPrintf error";
        return kArgErr;
    }
    const int32 start = append ? string->length_ : 0;
    const auto added = static_cast<int32>(text.Length());
    if (added > INT32_MAX - start) return kArgErr;
    if (!err) err = string->Resize(start + added);
    if (!err && added != 0) std::memcpy(string->bytes_ + start, text.Bytes(), text.Length());
    return err;
}

// What every variadic member does with its view: va_start has to stand in the member itself.
#define PRINT_INTO(view, append, format)                                                     \
    va_list args;                                                                            \
    va_start(args, format);                                                                  \
    const MgErr err = OVSubStringPrintf(view, append, reinterpret_cast<CStr>(format), args); \
    va_end(args);                                                                            \
    return err

MgErr OVString::Printf(CStr format, ...) {
    OVSubString view(this);
    PRINT_INTO(&view, false, format);
}

MgErr OVString::Printf(const unsigned char* format, ...) {
    OVSubString view(this);
    PRINT_INTO(&view, false, format);
}

MgErr OVString::AppendPrintf(CStr format, ...) {
    OVSubString view(this);
    PRINT_INTO(&view, true, format);
}

MgErr OVString::AppendPrintf(const unsigned char* format, ...) {
    OVSubString view(this);
    PRINT_INTO(&view, true, format);
}

MgErr OVSubString::Printf(CStr format, ...) {
    PRINT_INTO(this, false, format);
}

MgErr OVSubString::Printf(const unsigned char* format, ...) {
    PRINT_INTO(this, false, format);
}

MgErr OVSubString::AppendPrintf(CStr format, ...) {
    PRINT_INTO(this, true, format);
}

MgErr OVSubString::AppendPrintf(const unsigned char* format, ...) {
    PRINT_INTO(this, true, format);
}

#undef PRINT_INTO

}  // namespace tessel
