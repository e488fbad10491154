#include "diagnostics/Service.h"
#include "support/Test.h"
#include <tessel/diagnostics/DebugStream.h>

#include <limits>

namespace tessel::test {
namespace {

template <class... Values>
std::string Reported(const Values&... values) {
    ReportRecorder recorder;
    { (DebugReport("f", 1, "i", kDebugInfo, 1) << ... << values); }
    return recorder.Texts().at(0);
}

int Function(int value) {
    return value;
}

TEST(DebugStream, ReportCarriesItsPlace) {
    ReportRecorder recorder;
    TESSEL_REPORT(kDebugError, 0xCAFE0001u) << "boom " << 1;
    const int line = __LINE__ - 1;
    const test::Report report = recorder.Reports().at(0);
    EXPECT_EACH(report.level == kDebugError, report.siteCode == 0xCAFE0001u, report.text == "boom 1",
                report.file == "tests/diagnostics/DebugStreamTest.cpp", line == report.line,
                report.identifier == "TestBody");
}

TEST(DebugStream, NumbersAreWrittenInFull) {
    EXPECT_EACH(
        Reported(int16(-32768), ' ', int16(32767), ' ', uint16(65535), ' ', uint8(255)) == "-32768 32767 65535 255",
        Reported(int32(-2147483647 - 1), ' ', uint32(0xFFFFFFFFu), ' ', 0) == "-2147483648 4294967295 0",
        Reported(std::numeric_limits<int64>::min(), ' ', std::numeric_limits<uint64>::max()) ==
            "-9223372036854775808 18446744073709551615",
        Reported(0.5f, ' ', -5.0 / 3, ' ', std::numeric_limits<double>::infinity()) == "0.500000 -1.666667 inf",
        Reported(cmplx64{1, -2.5f}, cmplx128{0.25, 3}) == "(1.000000, -2.500000)(0.250000, 3.000000)");
    EXPECT_EQ(255u, Reported(-1.7e308).size()) << "309 digits before the point are cut";
}

TEST(DebugStream, TextsAreWrittenAndNullIsNothing) {
    alignas(LStr) uint8 storage[LStrSize(3) + 8] = {};
    auto* text = reinterpret_cast<LStr*>(storage);
    text->count = 3;
    std::memcpy(storage + offsetof(LStr, bytes), "abc", 3);
    LStrHandle handle = &text;
    LStrPtr emptyMaster = nullptr;
    LStrHandle emptyHandle = &emptyMaster;
    EXPECT_EACH(Reported(text, handle, static_cast<const LStrHandle*>(&handle)) == "abcabcabc",
                Reported('<', static_cast<LStrPtr>(nullptr), LStrHandle(nullptr), emptyHandle,
                         static_cast<const LStrHandle*>(nullptr), static_cast<CStr>(nullptr), '>') == "<>",
                Reported(std::string_view("viewed", 4)) == "view");
}

TEST(DebugStream, FormattingHelpers) {
    const uint8 pascal[] = {2, 'h', 'i', 'x'};
    EXPECT_EACH(
        Reported(DbgFmtPStr(pascal), '|', DbgFmtCStr("c"), DbgFmtCStr(nullptr), DbgFmtPStr(nullptr)) == "hi|c",
        Reported(DbgFmtPtr(42), ' ', DbgFmtPtr(-1), ' ', DbgFmtHex(0x0BADCAFEu)) == "0x0000002a 0xffffffff 0x0badcafe",
        Reported(DbgFmtQuadChar(TESSEL_FOURCC('T', 'E', 'X', 1))) == "TEX ",
        Reported(DbgFmtQuadChar(TESSEL_FOURCC(127, 0x80, '~', 31))) == " \x80~ ",
        Reported(DbgFmtSysThreadID(0xAB12)) == "0xab12", Reported(DbgFmtType<int>(42, "%05d")) == "00042",
        Reported(DbgFmtType<int>(50, "%d%%")) == "50%",
        Reported(DbgFmtType<int>(1, "%d%d")) == "__DbgFmtType: Bad Format__",
        std::string(31, '7') == Reported(DbgFmtNum(std::string(40, '7').c_str())));
    // An address has the width of a pointer and no prefix.
    char expected[32];
    std::snprintf(expected, sizeof expected, "%0*llX", int(2 * sizeof(void*)),
                  static_cast<unsigned long long>(reinterpret_cast<uintptr_t>(&Function)));
    EXPECT_EQ(expected, Reported(&Function));
}

TEST(DebugStream, KeepsTheFirst255Bytes) {
    DebugStream stream("f", 1, "i", kDebugInfo);
    for (int i = 0; i < 3; ++i) stream.Append(std::string(100, static_cast<char>('a' + i)).c_str());
    stream.Append('x');
    EXPECT_EQ(std::string(100, 'a') + std::string(100, 'b') + std::string(55, 'c'), stream.Text());
}

class DebugStreamPool : public testing::Test {
protected:
    void SetUp() override { DebugStreamStart(); }
    void TearDown() override { DebugStreamStop(); }

    // Makes so many streams at once, and gives all of them back.
    static void MakeStreams(int count) {
        std::vector<std::unique_ptr<DebugStream>> streams;
        for (int i = 0; i < count; ++i) {
            streams.push_back(std::make_unique<DebugStream>("f", 1, "i", kDebugInfo));
            streams.back()->Append(std::to_string(i).c_str());
        }
        for (int i = 0; i < count; ++i) EXPECT_EQ(std::to_string(i), streams[static_cast<size_t>(i)]->Text());
    }
};

TEST_F(DebugStreamPool, TheSeventeenthStreamAtOnceHasABufferOfItsOwn) {
    ReportRecorder recorder;
    MakeStreams(16);
    MakeStreams(16);
    DebugStreamStop();
    MakeStreams(20);  // without the pool nothing is counted
    EXPECT_EQ(std::vector<std::string>{}, recorder.Texts(kDebugWarning));
    DebugStreamStart();
    MakeStreams(17);
    DebugStreamStop();
    EXPECT_EQ(std::vector<std::string>{"DebugStream_Service: 1 failed checkouts forced a private buffer."},
              recorder.Texts(kDebugWarning));
    DebugStreamStart();
}

}  // namespace
}  // namespace tessel::test
