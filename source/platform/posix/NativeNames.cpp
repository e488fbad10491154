#include "platform/posix/NativeNames.h"

#include "platform/CodePage.h"
#include "platform/posix/Interrupted.h"
#include "platform/posix/Utf8.h"

#include <algorithm>
#include <cstdlib>
#include <locale.h>
#include <memory>
#include <unistd.h>
#include <wctype.h>

namespace tessel::platform {

// ---- the text of names ----------------------------------------------------------------------------------------------

std::string NativeParent(std::string_view native) {
    std::size_t separator = native.rfind('/');
    if (separator == std::string_view::npos) return ".";
    return separator == 0 ? "/" : std::string(native.substr(0, separator));
}

std::string_view NativeLast(std::string_view native) {
    return native.substr(native.rfind('/') + 1);
}

std::string NativeCurrentFolder() {
    std::unique_ptr<char, decltype(&std::free)> folder(systemCalls.getcwd(nullptr, 0), std::free);
    return folder ? folder.get() : "/";
}

std::string NameFromDisk(std::string_view diskName) {
    std::string plain(diskName);
    std::replace(plain.begin(), plain.end(), '\\', '?');
    if (ActiveCodePage().utf8) return plain;
    std::string name;
    FromUtf8(plain, name);
    return name;
}

// ---- equal but for case ---------------------------------------------------------------------------------------------

namespace {

// Upper case as every language maps it. The C library's own tables, whatever locale the process has.
char32_t UpperOf(char32_t character) {
    if (character < 0x80) return character >= 'a' && character <= 'z' ? character - 32 : character;
    static const locale_t locale = newlocale(LC_CTYPE_MASK, "C.UTF-8", nullptr);
    return locale ? static_cast<char32_t>(towupper_l(character, locale)) : character;
}

}  // namespace

// One character of UTF-8, or one byte that is none, marked so that it equals only itself.
char32_t TakeUpper(std::string_view& text) noexcept {
    char32_t character = 0;
    std::size_t length = DecodeUtf8(text.data(), text.data() + text.size(), character);
    if (length == 0) character = 0x80000000u | static_cast<unsigned char>(text[0]);
    text.remove_prefix(length ? length : 1);
    return length ? UpperOf(character) : character;
}

bool EqualNames(std::string_view a, std::string_view b) noexcept {
    while (!a.empty() && !b.empty()) {
        if (TakeUpper(a) != TakeUpper(b)) return false;
    }
    return a.empty() && b.empty();
}

// ---- matching on the disk -------------------------------------------------------------------------------------------

// The entry of `folder` that is `name`, exactly or in another case. The first in byte order where several are, so that
// the answer does not hang on the order of the listing.
static bool FindInFolder(const std::string& folder, std::string_view name, std::string& found) {
    found.clear();
    return VisitFolder(folder, [&](DIR*, const dirent& entry) {
        const bool exact = name == entry.d_name;
        if (exact || (EqualNames(name, entry.d_name) && (found.empty() || found > entry.d_name))) found = entry.d_name;
        return !exact;
    });
}

Match MatchOnDisk(std::string& native) {
    if (Exists(native)) return Match::kAll;
    if (!IsAbsence(errno)) return Match::kFailed;
    std::string parent = NativeParent(native);
    std::string last(NativeLast(native));
    if (last.empty() || parent == native) return Match::kParentMissing;
    Match above = MatchOnDisk(parent);
    if (above == Match::kFailed) return above;
    std::string found;
    if (above == Match::kAll && !FindInFolder(parent, last, found)) {
        if (!IsAbsence(errno)) return Match::kFailed;
        above = Match::kParentMissing;  // a file, or gone meanwhile
    }
    bool hasFolder = native.find('/') != std::string::npos;
    native = !hasFolder ? "" : parent == "/" ? parent : parent + "/";
    native += found.empty() ? last : found;
    if (!found.empty()) return Match::kAll;
    return above == Match::kAll ? Match::kLastMissing : Match::kParentMissing;
}

bool FailMatch(Match match) noexcept {
    if (match == Match::kFailed) return FailErrno();
    return FailWith(match == Match::kLastMissing ? kErrorFileNotFound : kErrorPathNotFound);
}

bool NameToAbsoluteText(std::string_view name, std::string& native) {
    if (!NameToNativeText(name, native)) return false;
    if (native[0] == '/') return true;
    std::string current = NativeCurrentFolder();
    native.insert(0, current == "/" ? current : current + "/");
    return true;
}

bool NameToAbsoluteNative(const char* name, std::string& native) {
    if (!NameToAbsoluteText(name, native)) return false;
    Match match = MatchOnDisk(native);
    return match == Match::kAll || FailMatch(match);
}

}  // namespace tessel::platform
