// The formats of text by their names: what reads and what writes each, and where its finished text is cached.
#include "diagnostics/Guarded.h"
#include "paths/PathFormatReader.h"
#include "paths/PathRefAccess.h"
#include "paths/PathTextFormat.h"
#include <tessel/base/OVExcept.h>
#include <tessel/paths/PathCachedItem.h>

#include <cstring>

namespace tessel {
namespace {

using namespace WidePathFormat;

constexpr uint32 kForever = 2147483647;  // the longest lifetime, in milliseconds

template <class Reader>
PathRef ReadWith(std::string_view text) {
    return Reader(text).Read();
}

template <class Writer>
MgErr WriteWith(const PathRef& path, std::string& text) {
    Writer writer;
    return WritePathText(path, writer, 0, text);
}

struct TextFormat {
    const char* name;
    const char* cacheKey;  // of the finished text
    PathRef (*read)(std::string_view text);
    MgErr (*write)(const PathRef& path, std::string& text);
};
constexpr TextFormat kDisplay = {"pathref_display", "internal_display", ReadWith<PathFormatReaderWin>,
                                 WriteWith<PathTextFormatWin>};
constexpr TextFormat kCommandLine = {"pathref_commandline", "internal_commandline", ReadWith<PathFormatReaderWin>,
                                     WriteWith<PathTextFormatWin>};
constexpr TextFormat kDOS = {"pathref_dos", "internal_dos", ReadWith<PathFormatReaderWin>,
                             WriteWith<PathTextFormatWin>};
constexpr TextFormat kUnix = {"pathref_unix", "internal_unix", ReadWith<PathFormatReaderUnix>,
                              WriteWith<PathTextFormatUNIX>};
constexpr TextFormat kIndependent = {"pathref_platformindependent", "internal_platformindependent",
                                     ReadWith<PathFormatReaderPlatformIndependent>,
                                     WriteWith<PathTextFormatPlatformIndependent>};
constexpr TextFormat kAgnostic = {"pathref_platformagnostic", "internal_platformindependent", ReadByGuessing,
                                  WriteWith<PathTextFormatPlatformIndependent>};

const TextFormat* FindFormat(const char* name) {
    for (const TextFormat* format : {&kDisplay, &kCommandLine, &kDOS, &kUnix, &kIndependent, &kAgnostic})
        if (std::strcmp(format->name, name) == 0) return format;
    return nullptr;
}

PathRef ReadText(const std::string& text, const char* formatName) {
    const TextFormat* format = FindFormat(formatName);
    if (!format) {
        const std::string detail = "PathRef from string constructor: unknown format \"" +
                                   std::string(formatName, strnlen(formatName, 64)) + "\"";
        throw OVExcept(kUnsupportedErr, detail.c_str(), __FILE__, __LINE__);
    }
    if (format == &kCommandLine && text.empty())
        TESSEL_THROW(kArgErr, "Empty command line strings cannot be converted to Path");
    return format->read(text);
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

}  // namespace

PathRef::PathRef(const StringType& text, const char* format) {
    if (!format) TESSEL_THROW(kArgErr, "PathRef from string constructor");
    *this = ReadText(text, format);
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
    return Guarded([&] {
        if (ReadCachedText(*this, *format, *out)) return kNoErr;
        const MgErr err = format->write(*this, *out);
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
