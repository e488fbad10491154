// Paths and lists of file names in formatted text.
#include "strings/PathText.h"
#include <tessel/paths/PathManager.h>
#include <tessel/paths/PathTextFormat.h>
#include <tessel/strings/StringLStr.h>
#include <tessel/strings/StringPStr.h>

namespace tessel {
namespace {

constexpr int32 kTooLong = 253;

struct PrintedText {
    int32 count;
    uint8 bytes[kTooLong];
};

}  // namespace

void PathTextForPrinting(Path path, PStr text) {
    if (!path) {
        CToPStr("NULL", text);
        return;
    }
    PrintedText printed = {-1, {}};
    auto* display = reinterpret_cast<LStrPtr>(&printed);
    text[0] = 0;
    if (FPathToText(path, display)) return;
    if (display->count >= kTooLong) {
        FGetPathTooLongString(text);
    } else if (!FPathToText(path, display)) {
        LToPStr(display, text);
    }
}

}  // namespace tessel
