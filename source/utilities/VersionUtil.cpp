// Packed version numbers as text.
#include <tessel/utilities/VersionUtil.h>

#include <cstring>

namespace {

// The text of a version while it is made.
struct Text {
    char bytes[kVersionStringSize];
    uint32 length = 0;

    void Add(char c) { bytes[length++] = c; }
    void AddDigit(int digit) { Add(static_cast<char>('0' + digit)); }
};

constexpr int kRelease = 8;

// Nothing for a release, unless everything is to be written.
void AddStage(Text& text, int stage, bool complete) {
    switch (stage) {
        case 2:
            return text.Add('d');
        case 4:
            return text.Add('a');
        case 6:
            return text.Add('b');
        case kRelease:
            if (complete) text.Add('r');
            return;
        default:
            return text.Add('?');
    }
}

Text MakeText(int32 version, uint32 level) {
    const auto nibble = [version](int shift) { return static_cast<int>(static_cast<uint32>(version) >> shift & 15); };
    Text text;
    if (nibble(28) != 0) text.AddDigit(nibble(28));
    text.AddDigit(nibble(24));
    text.Add('.');
    text.AddDigit(nibble(20));
    if (level > kVersionStringComplete) level = kVersionStringFix;
    if (level == kVersionStringMajor) return text;
    if (level != kVersionStringShort || nibble(16) != 0) {
        text.Add('.');
        text.AddDigit(nibble(16));
    }
    if (level == kVersionStringFix) return text;
    AddStage(text, nibble(12), level == kVersionStringComplete);
    if (level == kVersionStringShort && nibble(12) == kRelease) return text;
    if (nibble(8) != 0) text.AddDigit(nibble(8));
    if (nibble(8) != 0 || nibble(4) != 0) text.AddDigit(nibble(4));
    text.AddDigit(nibble(0));
    return text;
}

}  // namespace

void BuildVersStr(int32 version, PStr out) {
    if (!out) return;
    Text text = MakeText(version, kVersionStringShort);
    out[0] = static_cast<uint8>(text.length);
    std::memcpy(out + 1, text.bytes, text.length);
}

uint32 BuildVersionString(int32 version, VersionStringDetailLevel level, char* buffer, uint32 size) {
    Text text = MakeText(version, static_cast<uint32>(level));
    if (buffer && size != 0) {
        std::memset(buffer, 0, size);
        if (size > text.length) std::memcpy(buffer, text.bytes, text.length);
    }
    return text.length;
}

std::string tessel::BuildVersStdStr(int32 version, VersionStringDetailLevel level) {
    Text text = MakeText(version, static_cast<uint32>(level));
    return std::string(text.bytes, text.length);
}
