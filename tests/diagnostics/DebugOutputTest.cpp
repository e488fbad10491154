#include "support/Test.h"
#include <tessel/diagnostics/DebugOutput.h>
#include <tessel/diagnostics/DebugStream.h>

#include <sys/mman.h>
#include <sys/resource.h>
#include <unistd.h>

namespace tessel::test {
namespace {

using testing::ExitedWithCode;

TEST(DebugOutput, DefaultBehaviourCountsAndShowsSeriousReports) {
    ASSERT_EQ(nullptr, DebugOutputSetHandler(nullptr));
    DebugOutputResetNumEvents();
    testing::internal::CaptureStderr();
    DebugOutputCallHandler("f.cpp", 12, "f", 2, 0x2A, "quiet");
    DebugOutputCallHandler("f.cpp", 12, "f", 3, 0x2A, "boom\n");
    DebugOutputCallHandler(nullptr, 1, nullptr, 3, 0xABCDEF01u, std::string(2000, 'x').c_str());
    const std::string shown = testing::internal::GetCapturedStderr();
    EXPECT_EQ(0u, shown.find("ERR 2a: f.cpp(12): boom\nERR abcdef01: (1): xxx"));
    EXPECT_EQ(1023u - 19u, static_cast<size_t>(std::count(shown.begin(), shown.end(), 'x'))) << "cut at 1023 bytes";
    EXPECT_EACH(DebugOutputGetNumEvents(1) == 0, DebugOutputGetNumEvents(2) == 1, DebugOutputGetNumEvents(3) == 2,
                DebugOutputGetNumEvents(5) == 0, DebugOutputGetNumEvents(-1) == 0);
    DebugOutputIncrementEventCount(1);
    DebugOutputIncrementEventCount(99);
    EXPECT_EQ(1, DebugOutputGetNumEvents(1));
    DebugOutputResetNumEvents();
    EXPECT_EQ(0, DebugOutputGetNumEvents(3));
}

TEST(DebugOutputDeathTest, FatalReportEndsTheProcess) {
    EXPECT_EXIT(TESSEL_REPORT(kDebugFatal, 0x2Au) << "the end", ExitedWithCode(1), "ERR 2a: .*: the end");
}

// A call of malloc that the compiler cannot leave out.
void* Take(size_t size) {
    void* block = std::malloc(size);
    asm volatile("" : "+r"(block));
    return block;
}

// Takes all memory there is, then reports.
[[noreturn]] void ReportWithoutMemory() {
    rlimit limit{256u << 20, 256u << 20};
    setrlimit(RLIMIT_AS, &limit);
    for (size_t size = 64u << 20; size >= 8; size /= 2)
        while (Take(size)) {
        }
    TESSEL_REPORT(kDebugError, 0x3Bu) << "no memory " << 1;
    _exit(Take(256) ? 2 : 3);
}

TEST(DebugOutputDeathTest, ReportsWithoutMemory) {
#if defined(__SANITIZE_ADDRESS__) || defined(__SANITIZE_THREAD__)
    GTEST_SKIP() << "a sanitizer takes more address space than the limit";
#endif
    EXPECT_EXIT(ReportWithoutMemory(), ExitedWithCode(3), "ERR 3b: .*: no memory 1");
}

TEST(DebugOutput, AHandlerTakesEverything) {
    DebugOutputResetNumEvents();
    ReportRecorder recorder;
    DebugOutputCallHandler("f.cpp", 12, "id", kDebugFatal, 7, "still here");
    ASSERT_EQ(1u, recorder.Count());
    EXPECT_EACH(recorder.Texts()[0] == "still here", DebugOutputGetNumEvents(kDebugFatal) == 0);
}

int theHandlerCalls = 0;

TEST(DebugOutput, AHandlerThatReportsDoesNotRecurseForEver) {
    theHandlerCalls = 0;
    DebugOutputResetNumEvents();
    DebugOutputSetHandler([](CStr, int32, CStr, int32, uint32, CStr) {
        ++theHandlerCalls;
        TESSEL_REPORT(kDebugInfo, 5u) << "again";
    });
    TESSEL_REPORT(kDebugInfo, 5u) << "first";
    DebugOutputSetHandler(nullptr);
    EXPECT_EACH(theHandlerCalls >= 2, theHandlerCalls <= 16);
    EXPECT_EQ(1, DebugOutputGetNumEvents(kDebugInfo)) << "the innermost has the default behaviour";
}

TEST(DebugOutput, StopHereReportsAndReturnsZero) {
    ReportRecorder recorder;
    testing::internal::CaptureStderr();
    EXPECT_EACH(StopHere("look") == 0, StopHere(nullptr) == 0,
                testing::internal::GetCapturedStderr().find("look") == 0u,
                (std::vector<std::string>{"StopHere: look", "StopHere: "}) == recorder.Texts(kDebugInfo));
}

TEST(DebugOutput, VerifySingleFormatSpecifier) {
    for (CStr good : {"%d", "%d%%", "%%%d", "a%sb", "%"}) EXPECT_TRUE(VerifySingleFormatSpecifier(good)) << good;
    for (CStr bad : {"%d%s", "%%", "none", "", "%%%%", "%d %"}) EXPECT_FALSE(VerifySingleFormatSpecifier(bad)) << bad;
    EXPECT_FALSE(VerifySingleFormatSpecifier(nullptr));
}

TEST(DumpSomeMemory, ShowsWholeLines) {
    const char bytes[33] = "ABCDEFGHIJKLMNOP\x01\x7F\x80 ~QRSTUVWXYZ";
    ReportRecorder recorder;
    DumpSomeMemory(bytes, 20);
    const auto lines = recorder.Texts(kDebugTrace);
    ASSERT_EQ(2u, lines.size());
    EXPECT_EACH(lines[0].substr(lines[0].find("  ") + 2) ==
                    "41 42 43 44 45 46 47 48 49 4A 4B 4C 4D 4E 4F 50   ABCDEFGHIJKLMNOP",
                lines[1].substr(lines[1].find("  ") + 2) ==
                    "01 7F 80 20 7E 51 52 53 54 55 56 57 58 59 5A 00   ... ~QRSTUVWXYZ.");
    char address[32];
    std::snprintf(address, sizeof address, "%08llX",
                  static_cast<unsigned long long>(reinterpret_cast<uintptr_t>(bytes) + 16));
    EXPECT_EQ(address, lines[1].substr(0, lines[1].find(' ')));

    recorder.Clear();
    DumpSomeMemory(bytes, 16);
    EXPECT_EQ(1u, recorder.Count());
    DumpSomeMemory(bytes, 0);
    DumpSomeMemory(bytes, -5);
    EXPECT_EQ(1u, recorder.Count());
}

TEST(DumpSomeMemory, BytesThatCannotBeReadAreMarked) {
    const size_t page = static_cast<size_t>(sysconf(_SC_PAGESIZE));
    void* const pages = mmap(nullptr, 2 * page, PROT_READ | PROT_WRITE, MAP_PRIVATE | MAP_ANONYMOUS, -1, 0);
    ASSERT_NE(MAP_FAILED, pages);
    char* const edge = static_cast<char*>(pages) + page;
    ASSERT_EQ(0, mprotect(edge, page, PROT_NONE));
    edge[-2] = 'H';
    edge[-1] = 'i';
    ReportRecorder recorder;
    DumpSomeMemory(edge - 2, 4);
    munmap(pages, 2 * page);
    const std::string line = recorder.Texts(kDebugTrace).at(0);
    EXPECT_EQ("48 69 ?? ?? ?? ?? ?? ?? ?? ?? ?? ?? ?? ?? ?? ??   Hi..............", line.substr(line.find("  ") + 2));
}

}  // namespace
}  // namespace tessel::test
