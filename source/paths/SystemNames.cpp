// Names for the system, and which names a file can have.
#include "diagnostics/Guarded.h"
#include "paths/PathItemList.h"
#include "paths/PathRefAccess.h"
#include "paths/PathSteps.h"
#include "paths/ShortcutResolver.h"
#include <tessel/paths/PathManager.h>
#include <tessel/paths/PathTextFormat.h>

#include <algorithm>
#include <cstring>
#include <string>
#include <string_view>

namespace tessel {
namespace {

constexpr std::string_view kBadCharacters = "\"*/:<>?\\|";
constexpr std::string_view kReservedNames[] = {"AUX", "CLOCK$", "CON", "NUL", "PRN"};
constexpr std::string_view kReservedPorts[] = {"COM", "LPT"};  // with a digit
constexpr std::string_view kShortcutSuffix = ".LNK";

char UpperAscii(char c) {
    return c >= 'a' && c <= 'z' ? static_cast<char>(c - 'a' + 'A') : c;
}

bool IsAsciiLetter(char c) {
    return UpperAscii(c) >= 'A' && UpperAscii(c) <= 'Z';
}

bool EqualIgnoringCase(std::string_view text, std::string_view upperText) {
    if (text.size() != upperText.size()) return false;
    for (size_t i = 0; i < text.size(); ++i)
        if (UpperAscii(text[i]) != upperText[i]) return false;
    return true;
}

bool IsReserved(std::string_view name) {
    for (std::string_view reserved : kReservedNames)
        if (EqualIgnoringCase(name, reserved)) return true;
    if (name.size() != 4 || name[3] < '0' || name[3] > '9') return false;
    for (std::string_view port : kReservedPorts)
        if (EqualIgnoringCase(name.substr(0, 3), port)) return true;
    return false;
}

bool IsShortcutName(std::string_view name) {
    return name.size() >= kShortcutSuffix.size() &&
           EqualIgnoringCase(name.substr(name.size() - kShortcutSuffix.size()), kShortcutSuffix);
}

// What is wrong with a name that is not empty: 0, or kFileName... flags. Offending characters are appended to `bad`,
// which may be null.
int32 CheckFileName(std::string_view name, std::string* bad) {
    int32 flags = IsReserved(name) ? kFileNameReserved : 0;
    for (size_t i = 0; i < name.size();) {
        const size_t next = NextCharacter(name, i);
        if (next == i + 1 && kBadCharacters.find(name[i]) != std::string_view::npos) {
            flags |= kFileNameBadChar;
            if (bad) bad->push_back(name[i]);
        }
        i = next;
    }
    if (!name.empty() && name.back() == '.') flags |= kFileNameEndsInDot;
    return flags;
}

// Whether the name is two backslashes, a server and a share, which may be empty. Without them, or with steps up in
// their place, the text would name an item of this machine.
bool IsServerAndShare(std::string_view name) {
    if (name.substr(0, 2) != "\\\\") return false;
    for (size_t begin = 2, end; begin < name.size(); begin = end + 1) {
        end = std::min(FindCharacter(name, '\\', begin), name.size());
        const std::string_view part = name.substr(begin, end - begin);
        const bool onlyDots = part.find_first_not_of('.') == std::string_view::npos;
        if (onlyDots || (CheckFileName(part, nullptr) & kFileNameBadChar)) return false;
    }
    return name.size() > 2;
}

// The drive with its colon, or the server and share. False when there can be no such volume.
bool AppendVolume(std::string& text, const PathRef& path, const std::string& name) {
    text = name;
    if (!path.StartsWith(PathRef::kAbsolute)) return IsServerAndShare(name);
    text += ':';
    return name.size() == 1 && IsAsciiLetter(name[0]);
}

// The name of the file in `text`. Whether there is a shortcut on the way in `shortcut`.
MgErr MakeName(const PathRef& path, std::string& text, bool& shortcut) {
    const PathItemList names(PathRefAccess::Element(path));
    if (names.Count() == 0 || !AppendVolume(text, path, names[0].Name())) return kArgErr;
    if (names.Count() == 1) text += '\\';
    for (int32 i = 1; i < names.Count(); ++i) {
        const std::string& name = names[i].Name();
        if (name.empty() || CheckFileName(name, nullptr) != 0) return kArgErr;
        text.append(1, '\\').append(name);
        if (text.size() >= kMaxDOSPathName) return kArgErr;
        shortcut = shortcut || IsShortcutName(name);
    }
    // Behind a zero the system would not look, and take another item for the one that is meant.
    if (text.find('\0') != std::string::npos) return kArgErr;
    return text.size() < kMaxDOSPathName ? kNoErr : kArgErr;
}

}  // namespace

}  // namespace tessel

using namespace tessel;

MgErr MakeDOSPathName(Path path, char* name, int32 resolve) {
    if (!name) return kArgErr;
    name[0] = 0;
    if (!FIsAbsPath(path)) return kArgErr;
    return Guarded([&] {
        std::string text;
        bool shortcut = false;
        const MgErr err = MakeName(*path, text, shortcut);
        if (err) return err;
        std::memcpy(name, text.c_str(), text.size() + 1);
        if (resolve && shortcut) ResolveShortcutsInName(name);
        return kNoErr;
    });
}

int32 FileNameChk(ConstPStr name, int32, int32 skip, char* bad) {
    if (bad) *bad = 0;
    if (!name || name[0] == 0) return kFileNameEmpty;
    if (skip) return 0;
    return GuardedOr<int32>(kFileNameBadChar, [&] {
        std::string badCharacters;
        const int32 flags = CheckFileName({reinterpret_cast<const char*>(name + 1), name[0]}, &badCharacters);
        if (bad) std::memcpy(bad, badCharacters.c_str(), badCharacters.size() + 1);
        return flags;
    });
}
