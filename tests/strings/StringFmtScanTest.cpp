#include "strings/Support.h"
#include "support/Test.h"
#include <tessel/strings/StringCStr.h>
#include <tessel/strings/StringFmtScan.h>

#include <tuple>

namespace {

// The byte of an escape, and how much it took.
std::pair<int32, int> Escape(std::string_view text) {
    CStr cursor = text.data();
    const int32 byte = ScanForBackslash(&cursor, text.data() + text.size());
    return {byte, static_cast<int>(cursor - text.data())};
}

TEST(StringFmtScan, ReadsEscapes) {
    const std::tuple<std::string_view, int32, int> cases[] = {
        {"x\\", 'x', 1},  {"\\", '\\', 1},    {"\\41", 0x41, 3},  {"\\4G", 4, 2},     {"\\4", 4, 2},
        {"\\4f", 4, 2},   {"\\FF7", 0xFF, 3}, {"\\a", 'a', 2},    {"\\\\n", '\\', 2}, {"\\b", 8, 2},
        {"\\f", 12, 2},   {"\\n", 10, 2},     {"\\r", 13, 2},     {"\\s", ' ', 2},    {"\\t", 9, 2},
        {"\\B", 0x0B, 2}, {"\\%", '%', 2},    {"\\0A5", 0x0A, 3}, {"\\z", 'z', 2},    {"", 0, 0}};
    for (const auto& [text, byte, consumed] : cases) EXPECT_EQ(std::pair(byte, consumed), Escape(text)) << text;
}

// How much a specifier of the decimal point takes, none: 0, and the point.
std::pair<int, char> Point(std::string_view text) {
    CStr cursor = text.data();
    uint8 point = '?';
    const bool found = ScanForFormatDecPoint(&cursor, text.data() + text.size(), &point);
    EXPECT_EQ(found, cursor != text.data());
    return {static_cast<int>(cursor - text.data()), static_cast<char>(point)};
}

TEST(StringFmtScan, ReadsDecimalPointSpecifiers) {
    const std::tuple<std::string_view, int, char> cases[] = {
        {";", 1, '.'},  {",;x", 2, ','}, {"\\2C;", 4, ','}, {"\\,;", 3, ','}, {"-;", 2, '-'},
        {";;", 1, '.'}, {"[;", 0, '?'},  {"%;", 0, '?'},    {"a;", 0, '?'},   {",", 0, '?'},
        {",d", 0, '?'}, {"", 0, '?'},    {"\\41;", 0, '?'}};
    for (const auto& [text, consumed, point] : cases) EXPECT_EQ(std::pair(consumed, point), Point(text)) << text;
    EXPECT_EACH(StrSetDecimalPoint(',') == ',', Point(";").second == ',');
    StrSetDecimalPoint('.');
}

}  // namespace
