// Patterns for names.
#include "diagnostics/Guarded.h"
#include "paths/PathSteps.h"
#include <tessel/paths/PathRef.h>
#include <tessel/paths/PathTextFormat.h>

#include <string_view>
#include <vector>

namespace tessel {
namespace {

constexpr char kSeparator = '\\';

// Which positions of the name the pattern can have come to. The name may end at any of them: they include the end.
using Positions = std::vector<uint8>;

bool SameCharacter(std::string_view a, std::string_view b) {
    if (a.size() != 1 || b.size() != 1) return a == b;
    return platform::LowerByte(static_cast<uint8>(a[0])) == platform::LowerByte(static_cast<uint8>(b[0]));
}

// "*" and "**": from a position, also all that follow it.
void MatchRun(Positions& at, std::string_view name, bool anything) {
    bool open = false;
    for (size_t i = 0; i < name.size(); i = NextCharacter(name, i)) {
        open = open || at[i];
        at[i] = open;
        if (name[i] == kSeparator && !anything) open = false;
    }
    at[name.size()] = at[name.size()] || open;
}

// Any other character of the pattern: from a position to the next, if the character of the name fits.
template <class Fits>
void MatchOne(Positions& at, std::string_view name, Fits fits) {
    bool previous = false;
    for (size_t i = 0; i < name.size();) {
        const size_t next = NextCharacter(name, i);
        const bool reached = at[i] && fits(name.substr(i, next - i));
        at[i] = previous;
        previous = reached;
        i = next;
    }
    at[name.size()] = previous;
}

void MatchDot(Positions& at, std::string_view name) {
    const bool atEnd = at[name.size()];
    MatchOne(at, name, [](std::string_view character) { return character == "."; });
    at[name.size()] = at[name.size()] || atEnd;
}

// Keeps all positions that some reading of the pattern comes to, so that the work is at most the product of the
// lengths.
bool Matches(std::string_view name, std::string_view pattern) {
    Positions at(name.size() + 1, 0);
    at[0] = 1;
    for (size_t i = 0; i < pattern.size();) {
        const size_t next = NextCharacter(pattern, i);
        const std::string_view wanted = pattern.substr(i, next - i);
        i = next;
        if (wanted == "*") {
            const bool anything = i < pattern.size() && pattern[i] == '*';
            if (anything) ++i;
            MatchRun(at, name, anything);
        } else if (wanted == "?") {
            MatchOne(at, name, [](std::string_view character) { return character[0] != kSeparator; });
        } else if (wanted == ".") {
            MatchDot(at, name);
        } else {
            MatchOne(at, name, [&](std::string_view character) { return SameCharacter(character, wanted); });
        }
    }
    return at[name.size()] != 0;
}

}  // namespace

bool PathRef::NameWildCardMatch(const StringType& name, const StringType& pattern) {
    return Matches(name, pattern);
}

}  // namespace tessel

using namespace tessel;

bool FStrFitsPat(const char* pattern, const char* name, int32 patternLength, int32 nameLength) {
    if ((!pattern && patternLength > 0) || (!name && nameLength > 0)) return false;
    const auto text = [](const char* start, int32 length) {
        return length > 0 ? std::string_view(start, static_cast<size_t>(length)) : std::string_view();
    };
    return GuardedOr(false, [&] { return Matches(text(name, nameLength), text(pattern, patternLength)); });
}

bool FMFindWildCardMatchCh(const char* text, int32* position, int32 end, char extra) {
    if (!text || !position || *position < 0) return false;
    const std::string_view view(text, static_cast<size_t>(end > 0 ? end : 0));
    size_t i = static_cast<size_t>(*position);
    while (i < view.size() && view[i] != '*' && view[i] != '?' && view[i] != extra) i = NextCharacter(view, i);
    const bool found = i < view.size();
    if (static_cast<size_t>(*position) < view.size()) *position = static_cast<int32>(i);
    return found;
}

bool FFindMatchCh(const char* text, int32* position, int32 end) {
    return FMFindWildCardMatchCh(text, position, end, '`');
}
