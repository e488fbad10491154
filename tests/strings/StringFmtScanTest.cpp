#include "strings/Support.h"
#include "support/Test.h"
#include <tessel/strings/StringCStr.h>
#include <tessel/strings/StringFmtScan.h>

namespace {

TEST(StringFmtScan, ReadsEscapes) {
    const struct {
        std::string_view text;
        int32 byte;
        int consumed;
    } kCases[] = {{"x\\", 'x', 1},  {"\\", '\\', 1},    {"\\41", 0x41, 3},  {"\\4G", 4, 2},     {"\\4", 4, 2},
                  {"\\4f", 4, 2},   {"\\FF7", 0xFF, 3}, {"\\a", 'a', 2},    {"\\\\n", '\\', 2}, {"\\b", 8, 2},
                  {"\\f", 12, 2},   {"\\n", 10, 2},     {"\\r", 13, 2},     {"\\s", ' ', 2},    {"\\t", 9, 2},
                  {"\\B", 0x0B, 2}, {"\\%", '%', 2},    {"\\0A5", 0x0A, 3}, {"\\z", 'z', 2},    {"", 0, 0}};
    for (const auto& c : kCases) {
        CStr cursor = c.text.data();
        EXPECT_EQ(c.byte, ScanForBackslash(&cursor, c.text.data() + c.text.size())) << c.text;
        EXPECT_EQ(c.consumed, cursor - c.text.data()) << c.text;
    }
}

TEST(StringFmtScan, ReadsDecimalPointSpecifiers) {
    const struct {
        std::string_view text;
        int consumed;  // 0: none
        char decimalPoint;
    } kCases[] = {{";", 1, '.'},  {",;x", 2, ','}, {"\\2C;", 4, ','}, {"\\,;", 3, ','}, {"-;", 2, '-'},
                  {";;", 1, '.'}, {"[;", 0, '?'},  {"%;", 0, '?'},    {"a;", 0, '?'},   {",", 0, '?'},
                  {",d", 0, '?'}, {"", 0, '?'},    {"\\41;", 0, '?'}};
    for (const auto& c : kCases) {
        CStr cursor = c.text.data();
        uint8 decimalPoint = '?';
        EXPECT_EQ(c.consumed != 0, ScanForFormatDecPoint(&cursor, c.text.data() + c.text.size(), &decimalPoint));
        EXPECT_EQ(c.consumed, cursor - c.text.data()) << c.text;
        EXPECT_EQ(c.decimalPoint, decimalPoint) << c.text;
    }
    EXPECT_EQ(',', StrSetDecimalPoint(','));
    uint8 decimalPoint = 0;
    CStr cursor = ";";
    EXPECT_EACH(ScanForFormatDecPoint(&cursor, cursor + 1, &decimalPoint), decimalPoint == ',');
    StrSetDecimalPoint('.');
}

}  // namespace
