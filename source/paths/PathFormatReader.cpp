#include "paths/PathFormatReader.h"

#include "diagnostics/Guarded.h"
#include "paths/PathSteps.h"
#include "platform/FileSystem.h"
#include <tessel/base/OVExcept.h>

#include <algorithm>

namespace tessel {
namespace WidePathFormat {

namespace {

PathRef::PathBase WindowsBase(std::string_view text) {
    const size_t slash = FindCharacter(text, '\\');
    if (text.size() >= 3 && slash == 0 && text[1] == '\\') return PathRef::kUNC;
    if (text.empty() || slash == 0) return PathRef::kAbsolute;
    // A drive: a colon before the first backslash.
    return FindCharacter(text.substr(0, slash), ':') != std::string_view::npos ? PathRef::kAbsolute
                                                                               : PathRef::kRelative;
}

std::string CurrentDrive() {
    std::string folder;
    if (!platform::CurrentFolder(folder) || folder.empty())
        TESSEL_THROW(kNotFoundErr, "PathRef from string constructor");
    return folder.substr(0, 1);
}

// A drive, its colon and a backslash.
bool LooksLikeWindows(std::string_view text) {
    const size_t colon = FindCharacter(text, ':');
    return colon != std::string_view::npos && colon + 1 == FindCharacter(text, '\\') &&
           FindCharacter(text.substr(0, colon), '/') == std::string_view::npos;
}

}  // namespace

// ---- the base reader ------------------------------------------------------------------------------------------------

bool PathFormatReader::IsSeparator(size_t position) const {
    return position < text_.size() && text_[position] == separator_;
}

size_t PathFormatReader::NextPosition(size_t position) const {
    return NextCharacter(text_, position);
}

size_t PathFormatReader::FirstName() const {
    return 0;
}

size_t PathFormatReader::NextSeparator(size_t position) const {
    while (position < text_.size() && !IsSeparator(position)) position = NextPosition(position);
    return std::min(position, text_.size());
}

Token PathFormatReader::FirstToken() const {
    const size_t begin = FirstName();
    return {begin, NextSeparator(begin)};
}

Token PathFormatReader::NextToken(const Token& token) const {
    const size_t begin = token.end + 1;
    return {begin, NextSeparator(begin)};
}

bool PathFormatReader::IsValid(const Token& token) const {
    return token.begin < text_.size();
}

std::string PathFormatReader::TokenText(const Token& token) const {
    return std::string(text_.substr(token.begin, token.end - token.begin));
}

PathRef PathFormatReader::Read() const {
    PathRef path(Base());
    for (Token token = FirstToken(); IsValid(token); token = NextToken(token)) path.Append(TokenText(token));
    if (!path.IsValid()) TESSEL_THROW(kArgErr, "PathRef from string constructor");
    return path;
}

// ---- dotted ---------------------------------------------------------------------------------------------------------

Token PathFormatReaderDotted::SkipUnnamed(Token token) const {
    while (IsValid(token)) {
        const std::string_view name = text_.substr(token.begin, token.end - token.begin);
        if (!name.empty() && name != ".") break;
        token = PathFormatReader::NextToken(token);
    }
    return token;
}

Token PathFormatReaderDotted::FirstToken() const {
    return SkipUnnamed(PathFormatReader::FirstToken());
}

Token PathFormatReaderDotted::NextToken(const Token& token) const {
    return SkipUnnamed(PathFormatReader::NextToken(token));
}

// ---- Unix -----------------------------------------------------------------------------------------------------------

PathRef::PathBase PathFormatReaderUnix::Base() const {
    return text_.empty() || text_.front() == '/' ? PathRef::kAbsolute : PathRef::kRelative;
}

size_t PathFormatReaderUnix::NextPosition(size_t position) const {
    return position + 1;
}

// ---- platform independent -------------------------------------------------------------------------------------------

PathRef::PathBase PathFormatReaderPlatformIndependent::Base() const {
    constexpr size_t kShortestUNC = 5;  // "//s/x"
    if (text_.size() >= kShortestUNC && text_.substr(0, 2) == "//") {
        size_t third = NextSeparator(2);
        if (third == 2) third = NextSeparator(3);
        if (third < text_.size()) return PathRef::kUNC;
    }
    if (text_ == "/") return PathRef::kRelative;
    return text_.empty() || text_.front() == '/' ? PathRef::kAbsolute : PathRef::kRelative;
}

// The first name of a UNC path: two separators, the server, and, when there is one, a separator and the share.
Token PathFormatReaderPlatformIndependent::ServerAndShare() const {
    const size_t serverEnd = NextSeparator(2);
    return {0, serverEnd < text_.size() ? NextSeparator(serverEnd + 1) : serverEnd};
}

Token PathFormatReaderPlatformIndependent::FirstToken() const {
    return Base() == PathRef::kUNC ? ServerAndShare() : PathFormatReaderDotted::FirstToken();
}

std::string PathFormatReaderPlatformIndependent::TokenText(const Token& token) const {
    std::string name = PathFormatReader::TokenText(token);
    if (token.begin != 0 || Base() != PathRef::kUNC) return name;
    name[0] = name[1] = '\\';
    const size_t serverEnd = NextSeparator(2);
    if (serverEnd < token.end)
        name[serverEnd] = '\\';
    else
        name += '\\';
    return name;
}

// ---- Windows --------------------------------------------------------------------------------------------------------

PathFormatReaderWin::PathFormatReaderWin(std::string_view text)
    : PathFormatReaderPlatformIndependent(text, '\\'), base_(WindowsBase(text)) {
}

// An absolute text begins with its drive, up to the first ":". When it begins with a backslash the drive is empty.
bool PathFormatReaderWin::IsDrive(const Token& token) const {
    return base_ == PathRef::kAbsolute && token.begin == 0;
}

Token PathFormatReaderWin::FirstToken() const {
    if (base_ != PathRef::kAbsolute) return PathFormatReaderPlatformIndependent::FirstToken();
    if (IsSeparator(0)) return {0, 0};
    return {0, std::min(FindCharacter(text_, ':'), text_.size())};
}

Token PathFormatReaderWin::NextToken(const Token& token) const {
    if (!IsDrive(token)) return PathFormatReaderDotted::NextToken(token);
    size_t begin = token.end;
    while (begin < text_.size() && text_[begin] == ':') ++begin;
    return SkipUnnamed({begin, NextSeparator(begin)});
}

std::string PathFormatReaderWin::TokenText(const Token& token) const {
    if (!IsDrive(token)) return PathFormatReaderPlatformIndependent::TokenText(token);
    // The drive as it stands. NOLINTNEXTLINE(bugprone-parent-virtual-call)
    if (token.end > 0) return PathFormatReader::TokenText(token);
    if (!IsSeparator(0)) TESSEL_THROW(kArgErr, "PathRef from string constructor");  // a colon without a drive
    return CurrentDrive();
}

// ---- Mac ------------------------------------------------------------------------------------------------------------

PathRef::PathBase PathFormatReaderMac::Base() const {
    if (text_.empty()) return PathRef::kAbsolute;
    return IsSeparator(0) || NextSeparator(0) == text_.size() ? PathRef::kRelative : PathRef::kAbsolute;
}

size_t PathFormatReaderMac::FirstName() const {
    return IsSeparator(0) ? 1 : 0;
}

// ---- guessing -------------------------------------------------------------------------------------------------------

PathRef ReadByGuessing(std::string_view text) {
    const PathFormatReaderWin windows(text);
    const PathFormatReaderMac mac(text);
    const PathFormatReaderUnix unixReader(text);
    if (!text.empty() && text.front() == '/') return unixReader.Read();
    if (LooksLikeWindows(text)) return windows.Read();

    PathRef best;
    int32 mostNames = -1;
    MgErr firstErr = kNoErr;
    for (const PathFormatReader* reader :
         {static_cast<const PathFormatReader*>(&windows), static_cast<const PathFormatReader*>(&mac),
          static_cast<const PathFormatReader*>(&unixReader)}) {
        const MgErr err = Guarded([&] {
            PathRef path = reader->Read();
            if (path.ItemCount() > mostNames) {
                mostNames = path.ItemCount();
                best = std::move(path);
            }
            return kNoErr;
        });
        if (!firstErr) firstErr = err;
    }
    if (mostNames < 0) TESSEL_THROW(firstErr ? firstErr : MgErr{kGenericErr}, "PathRef from string constructor");
    return best;
}

}  // namespace WidePathFormat
}  // namespace tessel
