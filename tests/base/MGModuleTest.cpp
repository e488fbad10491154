#include "support/Test.h"
#include <tessel/base/MGModule.h>

#include <climits>
#include <ctime>
#include <sys/stat.h>
#include <unistd.h>

namespace {

// The name of this program, as the host tells it.
std::string ProgramFile() {
    char name[PATH_MAX];
    const ssize_t length = readlink("/proc/self/exe", name, sizeof name);
    return std::string(name, static_cast<size_t>(length));
}

// The same with the drive and the separators of the library's names.
std::string ProgramName() {
    std::string name = "C:" + ProgramFile();
    for (char& c : name)
        if (c == '/') c = '\\';
    return name;
}

TEST(MGModule, HandlesAreKeptAsGiven) {
    EXPECT_EQ(0u, MGModuleGetInstance());
    MGModuleSetInstance(~MGModuleHandle{0});
    MGModuleSetModule(7);
    EXPECT_EACH(~MGModuleHandle{0} == MGModuleGetInstance(), MGModuleGetModule() == 7u);
    MGModuleSetInstance(0);
    MGModuleSetModule(0);
}

TEST(MGModule, PathIsTakenApart) {
    const std::string name = ProgramName();
    char text[kModuleTextSize];
    EXPECT_EACH(static_cast<int32>(name.size()) == MSWinGetModulePath(0, text, sizeof text), name == text);
    const size_t backslash = name.rfind('\\');
    MSWinGetModuleLocation(0, text);
    EXPECT_EQ(name.substr(0, backslash), text);
    MSWinGetModuleFileName(0, text);
    EXPECT_EACH(name.substr(backslash + 1) == text, MSWinGetModulePath(0, text, 4) == 3, text == "C:\\",
                MSWinGetModulePath(0, nullptr, 10) == 0);
}

TEST(MGModule, ModDateIsTheFilesInUtc) {
    struct stat status;
    ASSERT_EQ(0, stat(ProgramFile().c_str(), &status));
    char expected[64];
    std::strftime(expected, sizeof expected, "%m/%d/%Y %H:%M GMT", std::gmtime(&status.st_mtime));
    char text[kModuleTextSize];
    MSWinGetModuleModDate(0, text);
    EXPECT_STREQ(expected, text);
}

TEST(MGModule, UnknownModuleIsToldToTheDebugger) {
    char text[kModuleTextSize] = "old";
    testing::internal::CaptureStderr();
    EXPECT_EACH(MSWinGetModulePath(1, text, sizeof text) == 0,
                testing::internal::GetCapturedStderr() == "failed to get module filename\n", text == "");
    testing::internal::CaptureStderr();
    MSWinGetModuleLocation(1, text);
    MSWinGetModuleFileName(1, text);
    MSWinGetModuleModDate(1, text);
    testing::internal::GetCapturedStderr();
    EXPECT_STREQ("", text);
}

}  // namespace
