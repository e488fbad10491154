#include <tessel/base/MGModule.h>

#include <climits>
#include <ctime>
#include <gtest/gtest.h>
#include <string>
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
    EXPECT_EQ(~MGModuleHandle{0}, MGModuleGetInstance());
    EXPECT_EQ(7u, MGModuleGetModule());
    MGModuleSetInstance(0);
    MGModuleSetModule(0);
}

TEST(MGModule, PathIsTakenApart) {
    const std::string name = ProgramName();
    char text[kModuleTextSize];
    EXPECT_EQ(static_cast<int32>(name.size()), MSWinGetModulePath(0, text, sizeof text));
    EXPECT_EQ(name, text);
    const size_t backslash = name.rfind('\\');
    MSWinGetModuleLocation(0, text);
    EXPECT_EQ(name.substr(0, backslash), text);
    MSWinGetModuleFileName(0, text);
    EXPECT_EQ(name.substr(backslash + 1), text);
    EXPECT_EQ(3, MSWinGetModulePath(0, text, 4));
    EXPECT_STREQ("C:\\", text);
    EXPECT_EQ(0, MSWinGetModulePath(0, nullptr, 10));
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
    EXPECT_EQ(0, MSWinGetModulePath(1, text, sizeof text));
    EXPECT_EQ("failed to get module filename\n", testing::internal::GetCapturedStderr());
    EXPECT_STREQ("", text);
    testing::internal::CaptureStderr();
    MSWinGetModuleLocation(1, text);
    MSWinGetModuleFileName(1, text);
    MSWinGetModuleModDate(1, text);
    testing::internal::GetCapturedStderr();
    EXPECT_STREQ("", text);
}

}  // namespace
