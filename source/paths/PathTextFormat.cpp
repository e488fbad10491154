// Paths as text: the formats, and the writers.
#include "diagnostics/Guarded.h"
#include "paths/PathRefAccess.h"
#include "paths/PathSteps.h"
#include "paths/PathTextWriters.h"
#include <tessel/base/OVExcept.h>
#include <tessel/paths/PathCachedItem.h>

#include <cstring>
#include <new>

namespace tessel {
namespace {

constexpr uint32 kForever = 2147483647;  // the longest lifetime, in milliseconds

enum class Writer { kWindows, kUnix, kPlatformIndependent };

struct TextFormat {
    const char* name;
    const char* cacheKey;  // of the finished text
    Writer writer;
};
constexpr TextFormat kDisplay = {"pathref_display", "internal_display", Writer::kWindows};
constexpr TextFormat kCommandLine = {"pathref_commandline", "internal_commandline", Writer::kWindows};
constexpr TextFormat kDOS = {"pathref_dos", "internal_dos", Writer::kWindows};
constexpr TextFormat kUnix = {"pathref_unix", "internal_unix", Writer::kUnix};
constexpr TextFormat kIndependent = {"pathref_platformindependent", "internal_platformindependent",
                                     Writer::kPlatformIndependent};
constexpr TextFormat kAgnostic = {"pathref_platformagnostic", "internal_platformindependent",
                                  Writer::kPlatformIndependent};

const TextFormat* FindFormat(const char* name) {
    for (const TextFormat* format : {&kDisplay, &kCommandLine, &kDOS, &kUnix, &kIndependent, &kAgnostic})
        if (std::strcmp(format->name, name) == 0) return format;
    return nullptr;
}

bool ReadCachedText(const PathRef& path, const TextFormat& format, std::string& text) {
    const SharedCachedItem item =
        PathRefAccess::CachedItem(path, format.cacheKey, PathRef::CachedPathString::ClassName(), PathRef::kSearchHere);
    if (item) text = static_cast<const PathRef::CachedPathString*>(item.get())->Get();
    return item != nullptr;
}

void CacheText(const PathRef& path, const TextFormat& format, const std::string& text) {
    path.Cache(format.cacheKey, new PathRef::CachedPathString(kForever, PathRef::CachedItem::kIndependent, text));
}

MgErr WriteWith(Writer writer, const PathRef& path, std::string& text) {
    switch (writer) {
        case Writer::kWindows: {
            PathTextFormatWin format;
            return WritePathText(path, format, 0, text);
        }
        case Writer::kUnix: {
            PathTextFormatUNIX format;
            return WritePathText(path, format, 0, text);
        }
        case Writer::kPlatformIndependent:
            break;
    }
    PathTextFormatPlatformIndependent format;
    return WritePathText(path, format, 0, text);
}

}  // namespace

// ---- the base writer ------------------------------------------------------------------------------------------------

void PathTextFormat::BeginUNC(std::string& text, std::string&, int32) {
    text.clear();
    unc_ = true;
}

void PathTextFormat::AppendName(std::string& text, const std::string& name, int32) {
    text += name;
}

void PathTextFormat::AppendEllipsis(std::string& text) {
    text += "...";
}

void PathTextFormat::AppendUpDir(std::string& text) {
    text += "..";
}

void PathTextFormat::Finish(std::string& text, int32 count) {
    if (absolute_ && count == 1) AppendSeparator(text);
}

// ---- Windows: C:\dir\file -------------------------------------------------------------------------------------------

void PathTextFormatWin::BeginAbsolute(std::string& text, int32) {
    text.clear();
    absolute_ = true;
}

void PathTextFormatWin::BeginRelative(std::string& text, int32 count) {
    text = count == 0 ? "." : "";
}

void PathTextFormatWin::BeginUNC(std::string& text, std::string&, int32) {
    text.clear();
}

void PathTextFormatWin::AppendName(std::string& text, const std::string& name, int32 index) {
    text += name;
    if (absolute_ && index == 0) text += ':';
}

void PathTextFormatWin::AppendSeparator(std::string& text) {
    text += '\\';
}

// ---- UNIX: /C/dir/file ----------------------------------------------------------------------------------------------

void PathTextFormatUNIX::BeginAbsolute(std::string& text, int32) {
    text = "/";
    absolute_ = true;
}

void PathTextFormatUNIX::BeginRelative(std::string& text, int32 count) {
    text = count == 0 ? "." : "";
}

void PathTextFormatUNIX::AppendSeparator(std::string& text) {
    text += '/';
}

void PathTextFormatUNIX::Finish(std::string&, int32) {
}

// ---- platform independent: /C/dir/file, //server/share/file ---------------------------------------------------------

void PathTextFormatPlatformIndependent::BeginAbsolute(std::string& text, int32 count) {
    text = count == 0 ? "" : "/";
    absolute_ = true;
}

void PathTextFormatPlatformIndependent::BeginRelative(std::string& text, int32) {
    text.clear();
}

void PathTextFormatPlatformIndependent::AppendName(std::string& text, const std::string& name, int32 index) {
    const size_t start = text.size();
    text += name;
    if (!unc_ || index != 0) return;
    for (size_t i = start; i < text.size(); i = NextCharacter(text, i))
        if (text[i] == '\\') text[i] = '/';
}

// ---- writing --------------------------------------------------------------------------------------------------------

namespace {

// Begins the text according to the base. False for a path that has no text of its own.
bool BeginText(const PathRef& path, PathTextFormat& format, int32 count, std::string& text) {
    std::string scratch;
    if (path.StartsWith(PathRef::kAbsolute))
        format.BeginAbsolute(text, count);
    else if (path.StartsWith(PathRef::kRelative))
        format.BeginRelative(text, count);
    else if (path.StartsWith(PathRef::kUNC))
        format.BeginUNC(text, scratch, count);
    else
        return false;
    return true;
}

}  // namespace

MgErr WritePathText(const PathRef& path, PathTextFormat& format, int32 elided, std::string& text) {
    const PathItemList names(PathRefAccess::Element(path));
    if (!BeginText(path, format, names.Count(), text)) {
        text = PathRef::GetNotAPathString();
        return PathRefAccess::Element(path) ? kArgErr : kNoErr;
    }
    if (elided > 0) {
        format.AppendEllipsis(text);
        format.AppendSeparator(text);
    }
    for (int32 i = elided; i < names.Count(); ++i) {
        if (names[i].IsUpDir())
            format.AppendUpDir(text);
        else
            format.AppendName(text, names[i].Name(), i);
        if (i + 1 < names.Count())
            format.AppendSeparator(text);
        else
            format.Finish(text, names.Count());
    }
    return kNoErr;
}

const char* PathRef::StringDisplay() {
    return kDisplay.name;
}
const char* PathRef::StringCommandLine() {
    return kCommandLine.name;
}
const char* PathRef::StringDOS() {
    return kDOS.name;
}
const char* PathRef::StringUnix() {
    return kUnix.name;
}
const char* PathRef::StringPlatformIndependent() {
    return kIndependent.name;
}
const char* PathRef::StringPlatformAgnostic() {
    return kAgnostic.name;
}

MgErr PathRef::ConvertToString(StringType* out, const char* formatName) const {
    if (!out || !formatName) return kArgErr;
    const TextFormat* format = FindFormat(formatName);
    if (!format) return kUnsupportedErr;
    if (format == &kCommandLine && (ItemCount() == 0 || !IsValid())) return kArgErr;
    return Guarded([&]() -> MgErr {
        if (ReadCachedText(*this, *format, *out)) return kNoErr;
        const MgErr err = WriteWith(format->writer, *this, *out);
        if (!err && mPathElement) CacheText(*this, *format, *out);
        return err;
    });
}

const PathRef::StringType& PathRef::ToString(const char* format) {
    StringType& text = TextCache();
    const MgErr err = ConvertToString(&text, format);
    if (err) TESSEL_THROW(err, "PathRef ToString");
    return text;
}

}  // namespace tessel
