// Shortening paths that are too long to be shown.
#include "diagnostics/Guarded.h"
#include "paths/PathRefAccess.h"
#include "paths/PathSteps.h"
#include "paths/PathTextFormat.h"
#include <tessel/base/OVExcept.h>
#include <tessel/paths/PathAbbreviation.h>
#include <tessel/strings/StringUtils.h>

#include <set>

namespace tessel {
namespace {

constexpr char kEllipsis[] = "...";

const std::string& LastNameOf(const PathRef& path) {
    return path.ItemCount() > 0 ? path.ItemAt(-1) : StringUtils::EmptyNarrowString();
}

bool TwoShareALastName(const std::list<PathRef>& paths) {
    const auto before = [](const std::string* a, const std::string* b) {
        return PathRef::NameCompare(*a, *b, PathRef::kIgnoreCase) < 0;
    };
    std::set<const std::string*, decltype(before)> seen(before);
    for (const PathRef& path : paths)
        if (path.ItemCount() > 0 && !seen.insert(&path.ItemAt(-1)).second) return true;
    return false;
}

// The last name, or as much of its end as can be shown behind an ellipsis.
std::string ShortForm(const PathRef& path, const PathRef::MeasurementStyle& measure) {
    const std::string& name = LastNameOf(path);
    if (!measure.StringIsTooLong(name)) return name;
    for (size_t i = 0; i < name.size(); i = NextCharacter(name, i)) {
        std::string text = kEllipsis + name.substr(i);
        if (!measure.StringIsTooLong(text)) return text;
    }
    return std::string();
}

// The whole path, or as much of it as can be shown, but at least its last name.
std::string FullForm(const PathRef& path, const PathRef::MeasurementStyle& measure) {
    const int32 names = path.ItemCount();
    for (int32 elided = 0; elided == 0 || elided < names; ++elided) {
        PathTextFormatWin format;
        std::string text;
        const MgErr err = WritePathText(path, format, elided, text);
        if (err) TESSEL_THROW(err, "TrimFromFrontAbbreviationStyle::PerformAbbreviation");
        if (!measure.StringIsTooLong(text)) return text;
    }
    return ShortForm(path, measure);
}

}  // namespace

PathRef::MeasurementStyle::~MeasurementStyle() = default;

PathRef::CharCountMeasurementStyle::CharCountMeasurementStyle(uint32 maximum) : maximum_(maximum) {
}

PathRef::CharCountMeasurementStyle::~CharCountMeasurementStyle() = default;

bool PathRef::CharCountMeasurementStyle::StringIsTooLong(const StringType& text) const {
    uint32 count = 0;
    for (size_t i = 0; i < text.size(); i = NextCharacter(text, i)) ++count;
    return count > maximum_;
}

PathRef::AbbreviationStyle::AbbreviationStyle() = default;

PathRef::AbbreviationStyle::~AbbreviationStyle() = default;

bool PathRef::AbbreviationStyle::GetForceFullPathStrings() const {
    return forceFullPathStrings_;
}

void PathRef::AbbreviationStyle::SetForceFullPathStrings(bool force) {
    forceFullPathStrings_ = force;
}

PathRef::TrimFromFrontAbbreviationStyle::TrimFromFrontAbbreviationStyle() = default;

PathRef::TrimFromFrontAbbreviationStyle::~TrimFromFrontAbbreviationStyle() = default;

MgErr PathRef::TrimFromFrontAbbreviationStyle::PerformAbbreviation(const std::list<PathRef>& paths,
                                                                   std::vector<StringType>* out,
                                                                   const MeasurementStyle& measure) const {
    if (!out) return kArgErr;
    const bool full = GetForceFullPathStrings() || TwoShareALastName(paths);
    std::vector<StringType> texts;
    texts.reserve(paths.size());
    for (const PathRef& path : paths) texts.push_back(full ? FullForm(path, measure) : ShortForm(path, measure));
    out->swap(texts);
    return kNoErr;
}

MgErr PathRef::ToAbbreviatedDisplayStrings(const std::list<PathRef>& paths, std::vector<StringType>* out,
                                           const AbbreviationStyle& style, const MeasurementStyle& measure) {
    return Guarded([&] { return style.PerformAbbreviation(paths, out, measure); });
}

}  // namespace tessel
