#include "strings/Support.h"
#include "support/Test.h"
#include <tessel/base/NumericTypes.h>
#include <tessel/numerics/NumericSupport.h>
#include <tessel/strings/NumericText.h>
#include <tessel/strings/StringCStr.h>
#include <tessel/strings/StringFmtPrint.h>

#include <cstdio>
#include <limits>

using namespace tessel;
using namespace tessel::test;

namespace {

// What a format gives without a limit; counting must agree.
std::string F(CStr format, ...) {
    char text[2000];
    const auto length = static_cast<int32>(std::strlen(format));
    va_list args;
    va_start(args, format);
    va_list again;
    va_copy(again, args);
    const int32 written = SPrintfv(text, -1, format, length, args);
    ReportRecorder quiet;  // what the first call reported
    EXPECT_EQ(written, SPrintfv(nullptr, 0, format, length, again)) << format;
    va_end(again);
    va_end(args);
    return {text, static_cast<size_t>(written)};
}

TEST(StringFmtPrint, PrintsIntegers) {
    EXPECT_EACH(F("%5d|%-5d|%05d", -42, -42, -42) == "  -42|-42  |-0042",
                F("%d %u %lld %llu", INT32_MIN, -1, static_cast<long long>(INT64_MIN), -1LL) ==
                    "-2147483648 4294967295 -9223372036854775808 18446744073709551615",
                F("%x %b %o %x %llx", 255, 5, 8, 0, -2LL) == "FF 101 10 0 FFFFFFFFFFFFFFFE",
                F("%ld %Id %i", 7, 8, 9) == "7 8 9",
                F("%a|%-12a|%2a", 255, -1, 10) == "0x000000FF|0xFFFFFFFF|0x0000000A");
    EXPECT_EQ("12 ", F("%-03.9d", 12));  // no precision for integers
    EXPECT_EQ("11111111111111111111111111111111", F("%b", -1));
    EXPECT_EQ(64u, F("%llb", -1LL).size());
}

TEST(StringFmtPrint, PrintsTexts) {
    EXPECT_EACH(F("%.3s|%6.3s|%-6.3s|%05s", "abcdef", "abcdef", "abcdef", "abc") == "abc|   abc|abc   |00abc",
                F("[%s][%2s][%.0s]", nullptr, nullptr, "x") == "[][  ][]");
    const char unterminated[] = {'a', 'b', 'c'};
    EXPECT_EACH(F("%.3s", unterminated) == "abc",
                F("%p|%4p|%.1p", static_cast<PStr>(P("ab")), static_cast<PStr>(P("ab")), static_cast<PStr>(P("ab"))) ==
                    "ab|  ab|a");
    L text("hello");
    EXPECT_EACH(F("%P|%lp|%.4H|%6H", *text, *text, *&text, *&text) == "hello|hello|hell| hello",
                F("%H|%5H", nullptr, nullptr) == "|     ");
    const FmtBytes bytes = {"a\0b", 3};
    EXPECT_EQ(std::string("a\0b..", 5), F("%h..", &bytes));
    const std::string large(1000, 'x');
    EXPECT_EACH(large + "!" == F("%s!", large.c_str()),
                F("%c  %4c %2c %5c%", 'A', 0x41424344, 0x41424142, 'A') == "A  DCBA BA A%",
                F("%4.2c", 0x41424344) == "  DC");
}

TEST(StringFmtPrint, PrintsPointsAndRectangles) {
    const int16 rectangle[] = {1, 2, 3, 4};
    EXPECT_EACH(F("%q %Q %q", 0x00020001, 0x00020001, static_cast<int32>(0xFFFF8000)) == "(2,1) hv(2,1) (-1,-32768)",
                F("%r %R", rectangle, rectangle) == "(1, 2, 3, 4) tlbr(1, 2, 3, 4)");
}

TEST(StringFmtPrint, PrintsReals) {
    EXPECT_EACH(F("%,;%.2f %;%.2f %\\3B;%.1f", 3.25, 3.25, 3.2) == "3,25 3.25 3;2",
                F("%f %.2f %.0e", 0.5, -1.5, 1000.0) == "0.500000 -1.50 1E+3");
    EXPECT_EQ("1.000000E+30", F("%f", 1e30));             // 30 is beyond the 18 of no width
    EXPECT_EQ("1.00000000000000E+30", F("%20f", 1e30));   // and beyond 19; 15 digits
    EXPECT_EQ("1000000000000000000.0", F("%.1f", 1e18));  // 18 is not
    EXPECT_EQ("1.0E-19", F("%.1f", 1e-19));
    EXPECT_EACH(F("%e %g %G", 1234.5678, 1234.5678, 1234.5678) == "1.234568E+3 1.234568E+3 1.234568E+3",
                F("%10.4E", 1234.5678).substr(1) == "1.2346E+3",
                F("%10.3e|%-10.3e", 1234.5678, 1234.5678) == "  1.235E+3|1.235E+3  ", F("%06.1F", -3.5) == "-003.5");
    const double infinity = std::numeric_limits<double>::infinity();
    EXPECT_EQ("NaN Inf -Inf", F("%f %f %e", std::numeric_limits<double>::quiet_NaN(), infinity, -infinity));
}

TEST(StringFmtPrint, PrintsNumbersOfNamedTypes) {
    const int8 small = -1;
    const uint16 word = 0x1234;
    const int64 large = INT64_MIN;
    const float single = 1.5;
    const cmplx128 complex = {1.5, -2};
    EXPECT_EACH(F("%{iB}d %{iB}x %{iB}a %{uB}u", &small, &small, &small, &small) == "-1 FF 0x000000FF 255",
                F("%{uW}x %{iQd %{iQ}d", &word, &large, &large) == "1234 -9223372036854775808 -9223372036854775808",
                F("%.2{fS}f|%5.1{fS}f", &single, &single) == "1.50|  1.5", F("%.1{cD}f", &complex) == "1.5 -2.0 i");
    EXPECT_EQ("-1 1.5", F("%{*}d %.1{*}f", kNumInt8 + 16, &small, kNumSingle, &single));  // the low four bits count
    const uint8 size = SetFxSize(16);  // the library's own values stay as large as they are
    EXPECT_EQ("1.5 1.5 -2.0 i", F("%.1{fS}f %.1{cD}f", &single, &complex));
    SetFxSize(size);
}

TEST(StringFmtPrint, TakesPositionalParameters) {
    ReportRecorder reports;
    EXPECT_EACH(F("%2$d %1$d", 1, 2) == "2 1", F("%2$3s|%1$-5s|%2$s", "a", "b") == "  b|a    |b",
                F("%3$s %1$d %2$lld %4$.1f %5$4c %6$q %1$u", 7, -1LL, "x", 0.5, 0x41424344, 0x00020001) ==
                    "x 7 -1 0.5 DCBA (2,1) 7");
    EXPECT_EQ("0.5,0,5", F("%1$.1f%,;,%1$.1f", 0.5));  // the second pass starts anew
    EXPECT_EQ("10987654321", F("%10$d%9$d%8$d%7$d%6$d%5$d%4$d%3$d%2$d%1$d", 1, 2, 3, 4, 5, 6, 7, 8, 9, 10));
    char four[4];
    EXPECT_EQ(4, SNPrintf(four, 4, "%2$d and %1$d", 1, 2));  // the first pass sees the whole format
    EXPECT_STREQ("2 a", four);
    EXPECT_EQ(0u, reports.Count());
}

// Reports of one call, as levels and texts.
using Reports = std::vector<std::pair<int32, std::string>>;

Reports ReportsOf(const ReportRecorder& recorder) {
    Reports reports;
    for (const Report& report : recorder.Reports()) reports.emplace_back(report.level, report.text);
    return reports;
}

TEST(StringFmtPrint, StopsAtWhatItDoesNotKnow) {
    const std::pair<int32, std::string> unknown(kDebugFatal, "Unknown Conversion");
    const std::pair<int32, std::string> mixed(kDebugInfo, "Can't mix ANSI and %n$ specifiers");
    struct Case {
        CStr format;
        std::string written;
        Reports reports;
    };
    std::vector<Case> cases = {{"ab%yc", "ab", {unknown}},
                               {"%d %X", "1 ", {unknown}},
                               {"%d %1$d", "1 ", {mixed, unknown}},
                               {"%1$d %d", " ", {mixed, unknown}},
                               {"%1$d %1$s", " ", {{kDebugInfo, "Parameter 1 type info [-2] redefined (was [-1])"}}},
                               {"%1$Id%1$d", "", {{kDebugInfo, "Parameter 1 type info [-1] redefined (was [3])"}}},
                               {"ab%2$d", "", {{kDebugInfo, "Not all parameters between 1 and 2 specified"}}}};
    for (CStr format :
         {"%n", "%5", "%-", "%5.l", "%{iX}d", "%{qB}d", "%{", "%0$d", "%11$d", "%-1$d", "%$d", "%1$2$d", "%1${*}d"}) {
        cases.push_back({format, "", {unknown}});
    }
    for (const Case& c : cases) {
        ReportRecorder recorder;
        EXPECT_EQ(c.written, F(c.format, 1, 2)) << c.format;
        EXPECT_EQ(c.reports, ReportsOf(recorder)) << c.format;
    }
}

TEST(StringFmtPrint, InterpretsEscapesOfTheFormat) {
    EXPECT_EACH(F("a\\n\\41\\tB\\\\ \\%") == "a\r\nA\tB\\ %", F("line\n") == "line\n", F("100%") == "100%",
                F("100%% \\") == "100% \\");
    char text[3] = {'x', 'x', 'x'};
    EXPECT_EACH(SNPrintf(text, 2, "a\\n") == 2, text == "a");
    char out[10];
    EXPECT_EACH(SPrintfp(out, P(std::string_view("a\0b%d", 5)), 7) == 4, std::memcmp("a\0b7", out, 5) == 0);
}

TEST(StringFmtPrint, CopiesDoubleByteCharactersWhole) {
    {
        const CodePage page(932);
        EXPECT_EQ("\x83\\z\x83%d1 \x83\\", F("\x83\\z\x83%d%d \\\x83\\", 1));
        EXPECT_EQ("\xB1Z\xB1", F("\xB1\\5A%s", "\xB1"));  // half-width katakana are single bytes
    }
    EXPECT_EQ("\xC3\xA4Z \xE2\x82\xAC", F("\xC3\xA4\\5A %s", "\xE2\x82\xAC"));
}

// Formats of the language that is shared with the C library, with what they take.
TEST(StringFmtPrint, AgreesWithTheCLibrary) {
    std::mt19937_64 random(3);
    const auto pick = [&](size_t n) { return static_cast<size_t>(random() % n); };
    const char* const kTexts[] = {"", "a", "some text", "text that is longer than eight bytes"};
    for (int i = 0; i < 20000; ++i) {
        const std::string before = std::string("plain, long enough text and ").substr(pick(20), pick(12));
        std::string specifier = pick(3) == 0 ? "-" : "";
        const char conversion = "duxosf"[pick(6)];
        const bool isReal = conversion == 'f';
        if (conversion != 's' && pick(3) == 0) specifier += '0';
        if (pick(2)) specifier += std::to_string((isReal ? 13 : 1) + pick(30));  // reals that fit the width stay fixed
        if (conversion == 's' && pick(2)) specifier += "." + std::to_string(pick(12));
        if (isReal && pick(2)) specifier += "." + std::to_string(pick(9));
        const bool wide = conversion != 's' && !isReal && pick(2);
        if (wide) specifier += "ll";
        const std::string ours = before + "%" + specifier + conversion + "%%|%d";
        const std::string theirs = before + "%" + specifier + (conversion == 'x' ? 'X' : conversion) + "%%|%d";

        const auto bits = static_cast<long long>(random() >> pick(64));
        const long long value = pick(2) ? bits : -bits;
        const int last = static_cast<int>(value);
        const char* text = kTexts[pick(4)];
        char expected[200], actual[200];
        const auto size = static_cast<int32>(1 + pick(120));
        const auto check = [&](auto argument) {
            const int full = std::snprintf(expected, static_cast<size_t>(size), theirs.c_str(), argument, last);
            EXPECT_EQ(std::min(full, size), SNPrintf(actual, size, ours.c_str(), argument, last)) << ours;
        };
        if (conversion == 's') {
            check(text);
        } else if (isReal) {
            check(static_cast<double>(value) / 0x1p31);
        } else if (wide) {
            check(value);
        } else {
            check(last);
        }
        ASSERT_STREQ(expected, actual) << ours;
    }
}

TEST(StringFmtPrint, WritesNothingPastItsSize) {
    const char kGuard = '\x5A';
    const std::string full = F("ab%08d|%-7s|%20.3f|\\n%x|%3s|%q", -42, "hello", 3.25, 255, "abcdef", 0x00020001);
    ASSERT_EQ("ab-0000042|hello  |               3.250|\r\nFF|abcdef|(2,1)", full);
    const auto n = static_cast<int32>(full.size());
    for (int32 size = 0; size <= n + 2; ++size) {
        std::string room(full.size() + 10, kGuard);
        const int32 length = SNPrintf(room.data(), size, "ab%08d|%-7s|%20.3f|\\n%x|%3s|%q", -42, "hello", 3.25, 255,
                                      "abcdef", 0x00020001);
        EXPECT_EQ(std::min(size, n), length);
        std::string expected = size == 0 ? "" : full.substr(0, static_cast<size_t>(size - 1)) + '\0';
        expected.resize(room.size(), kGuard);
        EXPECT_EQ(expected, room) << size;
    }
    char four[4];
    EXPECT_EACH(SNPrintf(four, 4, "%d", 123456) == 4, four == "123", SNPrintf(nullptr, 0, "%d", 123456) == 6,
                SNPrintf(four, 4, "%99999999999999d", 1) == 4, four == "   ",
                SNPrintf(nullptr, 0, "%99999999999999d and more", 1) == INT32_MAX);
}

TEST(StringFmtPrint, FillsPStrsAndHandles) {
    P p;
    EXPECT_EACH(PPrintf(p, "%s", std::string(300, 'y').c_str()) == 255, std::string(255, 'y') == p.Text(),
                PPrintfp(p, P("%03d"), 7) == 3, p.Text() == "007");
    char c[8];
    EXPECT_EACH(SPrintf(c, "%d", 42) == 2, c == "42");

    L text("x");
    EXPECT_EACH(LStrPrintf(text, "%d %s", 42, "things") == kNoErr, text.Text() == "42 things", text.Size() == 13u,
                LStrPrintf(text, "") == kNoErr, text.Size() == 4u, LStrPrintf(nullptr, "x") == kArgErr);

    const std::string long300(300, 'n');
    CStr nan = NumSetNaNText(long300.c_str());
    ReportRecorder reports;
    EXPECT_EACH(long300.substr(45) == F("%f", static_cast<double>(NAN)), reports.Has(kDebugFatal, "buffer overflow"));
    NumSetNaNText(nan);
}

std::string growing;

TEST(StringFmtPrint, PrintsATextIntoItself) {
    L text("abc");
    EXPECT_EACH(LStrPrintf(text, "<%H>", LStrHandle(text)) == kNoErr, text.Text() == "<abc>");
    EXPECT_EQ(kNoErr, LStrPrintf(text, "%-600H|%P", LStrHandle(text), *text));  // too long to be kept aside at first
    EXPECT_EQ("<abc>" + std::string(595, ' ') + "|<abc>", text.Text());

    // A text that grows between the measuring and the writing of a long one: when it is reported what is wrong in
    // between.
    growing.reserve(10);
    growing = "x";
    const auto grow = [](CStr, int32, CStr, int32, uint32, CStr) { growing += "x"; };
    const auto before = DebugOutputSetHandler(grow);
    EXPECT_EQ(kGenericErr, LStrPrintf(text, "%600d%s%y", 1, growing.c_str()));
    DebugOutputSetHandler(before);
    EXPECT_EQ(606u, text.Text().size());
}

TEST(StringFmtPrint, StartsWithTheProcessWideDecimalPoint) {
    StrSetDecimalPoint(',');
    EXPECT_EQ("0,5 0.5 0,5", F("%.1f %.;%.1f %;%.1f", 0.5, 0.5, 0.5));
    StrSetDecimalPoint('.');
}

}  // namespace
