#include "paths/PathTextFormat.h"

#include "paths/PathItemList.h"
#include "paths/PathRefAccess.h"
#include "paths/PathSteps.h"

namespace tessel {

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

}  // namespace tessel
