// What each type of setting reads and writes.
#include "ConfigValue.h"
#include "config/ConfigNumbers.h"
#include "config/Service.h"
#include "support/FailingAllocator.h"
#include "support/StartedPaths.h"
#include "support/Test.h"

#include <cmath>
#include <limits>
#include <sstream>

namespace tessel::test {
namespace {

using tool::ConfigValue;

struct StartedTypes : StartedPaths {
    StartedTypes() { EXPECT_EACH(InitConfigTypeRegistry() == kNoErr, ConfigCoreTypesStart() == kNoErr); }
    ~StartedTypes() { EXPECT_EACH(ConfigCoreTypesStop() == kNoErr, UninitConfigTypeRegistry() == kNoErr); }
};

MgErr Read(int32 type, const std::string& text, ConfigValue& value) {
    return ConfigTypeFromString(type, text.data(), static_cast<int32>(text.size()), value.Pointer());
}

std::string Written(int32 type, ConfigValue& value) {
    LStrHandle text = nullptr;
    EXPECT_EQ(kNoErr, ConfigTypeToString(type, value.Pointer(), &text));
    if (!text) return "nothing";
    std::string result(reinterpret_cast<char*>((*text)->bytes), static_cast<size_t>((*text)->count));
    DSDisposeHandle(reinterpret_cast<UHandle>(text));
    return result;
}

std::string Long(size_t length) {
    return std::string(length, 'x');
}

// Every type with texts that it reads, each followed by what it then writes, "!" for those that it refuses.
const struct {
    int32 type, alias;
    std::string texts;
} kRows[] = {
    {kConfigPStr, 2, R"(abc|"abc"||""|)" + Long(256) + "|!"},
    {kConfigP255, 12, R"(a;b|"a;b"|)" + Long(255) + "|\"" + Long(255) + "\"|" + Long(256) + "|!"},
    {kConfigLStr, 11, R"( a"b |" a"b "|)" + Long(300) + "|\"" + Long(300) + '"'},
    {kConfigNStr, 0, std::string("a\0b|\"a\0b\"", 9)},
    {kConfigNStV, 0, R"(a;;b\;c|"a;;b\;c"||"")"},
    {kConfigENSV, 0, R"(a\;b;c|"a\;b;c"|\a\\;\|"a\\;\\")"},
    {kConfigCPSt, 8, R"(a;bc;|"a;bc;"|a;)" + Long(256) + "|!"},
    {kConfigECPS, 14, R"(a\;b;c|"a\;b;c"||""|)" + Long(256) + "|!"},
    {kConfigBool, 3, "yes|True|ON|True|true|True|No|False|off|False|FALSE|False|maybe|!|1|!||!|tru|!"},
    {kConfigI32, 4, " -12x|-12|+7|7|0x10|0|2147483648|2147483647|-x|!|-99999999999999999999|-2147483648||!"},
    {kConfigF32, 9, "-1.5e1!|-15.000000|1,5|1.000000|1e99|inf|-1e-99|-0.000000|0x1.8p1|3.000000|--1|!|e|!"},
    {kConfigI32L, 10, "1;-2 \t3;;99999999999|1;-2;3;2147483647|||1;x|!|1;2x|!"},
    {kConfigPath, 5, R"(C:\a\b.ini|C:\a\b.ini|..\x|..\x|\\s\t\..|!)"},
    {kConfigPthp, 13, R"(\\s\h\f|\\s\h\f|\\s\t\..|!)"},
    {kConfigPLst, 6, R"(C:\a;D:\b;x|"C:\a;D:\b;x"||""|C:\a;\\s\t\..|!)"},
    {kConfigPRfL, 0, R"(C:\a;D:\b|C:\a;D:\b|||C:\a;\\s\t\..|!)"},
};

std::vector<std::string> Split(const std::string& texts) {
    std::vector<std::string> parts;
    std::stringstream stream(texts + '|');
    for (std::string part; std::getline(stream, part, '|');) parts.push_back(part);
    return parts;
}

TEST(ConfigTypes, ReadAndWriteTheirTexts) {
    StartedTypes started;
    for (const auto& row : kRows) {
        const std::vector<std::string> texts = Split(row.texts);
        ConfigValue value(row.type), kept(row.type);
        ASSERT_EQ(kNoErr, Read(row.type, texts[0], kept));
        for (size_t i = 0; i < texts.size(); i += 2) {
            const bool refused = texts[i + 1] == "!";
            EXPECT_EQ(refused ? kConfigTextErr : kNoErr, Read(row.type, texts[i], refused ? kept : value)) << texts[i];
            EXPECT_TRUE(refused || texts[i + 1] == Written(row.type, value)) << Written(row.type, value);
        }
        EXPECT_EQ(texts[1], Written(row.type, kept)) << "what is refused changes nothing";
        LStrHandle text = nullptr;
        EXPECT_EQ(row.alias ? kNoErr : kConfigTypeErr, ConfigTypeToString(row.alias, kept.Pointer(), &text));
        DSDisposeHandle(reinterpret_cast<UHandle>(text));
        EXPECT_EACH(ConfigTypeFromString(row.type, "1", 1, nullptr) == kArgErr,
                    ConfigTypeToString(row.type, nullptr, &text) == kArgErr);
    }
}

// The layouts that the header of each type promises.
TEST(ConfigTypes, FillHandlesAsTheyAreLaidOut) {
    StartedTypes started;
    for (const auto& [type, text, bytes] : std::vector<std::tuple<int32, std::string, std::string>>{
             {kConfigPStr, "ab", {2, 'a', 'b'}},
             {kConfigLStr, "ab", {2, 0, 0, 0, 'a', 'b'}},
             {kConfigCPSt, "a;;bc", {3, 0, 0, 0, 1, 'a', 0, 2, 'b', 'c'}},
             {kConfigI32L, "1;258", {2, 0, 0, 0, 1, 0, 0, 0, 2, 1, 0, 0}}}) {
        ConfigValue value(type);
        ASSERT_EQ(kNoErr, Read(type, text, value));
        auto handle = static_cast<UHandle>(value.Pointer());
        EXPECT_EQ(bytes, std::string(reinterpret_cast<char*>(*handle), DSGetHandleSize(handle)));
        // A list that ends before its count does is no value.
        LStrHandle written = nullptr;
        DSSetHandleSize(handle, DSGetHandleSize(handle) - 1);
        const MgErr whole = type == kConfigPStr || type == kConfigLStr ? kNoErr : kArgErr;
        EXPECT_EQ(whole, ConfigTypeToString(type, handle, &written));
        DSDisposeHandle(reinterpret_cast<UHandle>(written));
    }
}

TEST(ConfigTypes, EscapedListsComeBackWhole) {
    StartedTypes started;
    std::minstd_rand random(1);
    for (int round = 0; round < 2000; ++round) {
        ConfigValue value(kConfigENSV), again(kConfigENSV);
        auto& texts = *static_cast<std::vector<std::string>*>(value.Pointer());
        for (unsigned i = 2 + random() % 3; i > 0; --i) {
            texts.emplace_back();
            for (unsigned n = random() % 6; n > 0; --n) texts.back() += "a\\;\" \x81"[random() % 6];
        }
        const std::string text = Written(kConfigENSV, value);
        EXPECT_EACH(Read(kConfigENSV, text.substr(1, text.size() - 2), again) == kNoErr,
                    texts == *static_cast<std::vector<std::string>*>(again.Pointer()));
    }
}

// The C library reads numbers as they are to be read, in its own locale.
TEST(ConfigTypes, NumbersAreReadAsTheCLibraryReadsThem) {
    std::minstd_rand random(2);
    const std::string pieces[] = {"0",  "1",  "9",      ".",   "e",   "E", "+",        "-",         "x", "p",
                                  "38", "45", "7fffff", "inf", "nan", " ", "00000000", "123456789", ";"};
    for (int round = 0; round < 200000; ++round) {
        std::string text;
        for (unsigned n = 1 + random() % 7; n > 0; --n) text += pieces[random() % std::size(pieces)];
        if (round % 4 == 0) text = "0x" + text;
        char* end;
        const float expected = std::strtof(text.c_str(), &end);
        float real = 42;
        const bool isReal = ParseFloat32(text, &real);
        ASSERT_EQ(end != text, isReal) << text;
        ASSERT_TRUE(!isReal || (std::isnan(expected) ? std::isnan(real) : expected == real)) << text << ' ' << real;
        const long long whole = std::strtoll(text.c_str(), &end, 10);
        using Limits = std::numeric_limits<int32>;
        int32 number = 42;
        std::string_view rest = text;
        ASSERT_EQ(end != text, ParseInt32(&rest, &number)) << text;
        ASSERT_EQ(text.c_str() + text.size() - rest.size(), rest.data() - text.data() + text.c_str());
        ASSERT_EQ(end == text ? 42 : std::clamp<long long>(whole, Limits::min(), Limits::max()), number) << text;
        char printed[64];
        std::snprintf(printed, sizeof printed, "%f", static_cast<double>(expected));
        ASSERT_TRUE(std::isnan(expected) || printed == Float32Text(expected)) << printed;
    }
}

TEST(ConfigTypes, AnAllocationThatFailsLeavesTheValue) {
    StartedTypes started;
    const ReportRecorder reports;  // of the paths
    for (const auto& row : kRows) {
        ConfigValue value(row.type);
        ASSERT_EQ(kNoErr, Read(row.type, Split(row.texts)[0], value));
        const std::string longer = row.type == kConfigBool ? "off" : "1;23;4567;89";
        const std::string before = Written(row.type, value);
        MgErr err = kConfigMemErr;
        for (int n = 1; err != kNoErr && n < 100; ++n) {
            {
                const FailingAllocator failing(n);
                err = Read(row.type, longer, value);
            }
            ASSERT_TRUE(err == kNoErr || err == kConfigMemErr) << err;
            EXPECT_TRUE(!err || before == Written(row.type, value)) << row.type;
        }
        EXPECT_EQ(kNoErr, err);
    }
}

TEST(ConfigTypes, TheTableKeepsTheFirstOfAType) {
    constexpr int32 kType = -5;
    ConfigFromTextProc one = [](const char*, int32 length, void* value) -> MgErr {
        return *static_cast<int32*>(value) = length, kNoErr;
    };
    ConfigFromTextProc other = [](const char*, int32, void*) -> MgErr { return kIOErr; };
    ConfigToTextProc toText = [](const void*, LStrHandle*) -> MgErr { return kVersionErr; };
    int32 length = 0;
    LStrHandle text = nullptr;
    EXPECT_EACH(RegisterConfigType(kType, one, toText) == kGenericErr,
                ConfigTypeFromString(kType, "", 0, &length) == kGenericErr, UninitConfigTypeRegistry() == kGenericErr);
    StartedTypes started;
    EXPECT_EACH(InitConfigTypeRegistry() == kGenericErr, ConfigTypeFromString(kType, "", 0, &length) == kConfigTypeErr,
                RegisterConfigType(kType, one, toText) == kNoErr,
                RegisterConfigType(kType, other, toText) == kGenericErr,
                ConfigTypeFromString(kType, "abc", 2, &length) == kNoErr, length == 2,
                ConfigTypeToString(kType, &length, &text) == kVersionErr, UnregisterConfigType(kType) == kNoErr,
                UnregisterConfigType(kType) == kConfigTypeErr);
}

}  // namespace
}  // namespace tessel::test
