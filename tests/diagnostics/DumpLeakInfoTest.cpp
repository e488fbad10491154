#include "support/FailingPlatform.h"
#include "support/ScratchDrive.h"
#include "support/Test.h"
#include <tessel/base/OVExcept.h>
#include <tessel/diagnostics/DumpLeakInfo.h>
#include <tessel/diagnostics/FileLoc.h>

#include <cerrno>
#include <chrono>
#include <filesystem>
#include <set>
#include <stdlib.h>
#include <sys/mman.h>
#include <sys/wait.h>
#include <unistd.h>

namespace tessel::test {
namespace {

// The temporary folder is on the scratch drive.
class DumpLeakInfoTest : public testing::Test {
protected:
    DumpLeakInfoTest() { setenv("TMPDIR", drive.Native().c_str(), 1); }
    ~DumpLeakInfoTest() override {
        DestroyAllocTracker(tracker);
        unsetenv("TMPDIR");
    }
    bool FileExists() const { return std::filesystem::exists(drive.Native("leaks.txt")); }

    test::ScratchDrive drive;
    ReportRecorder recorder;
    AllocTracker* const tracker = CreateAllocTracker();
};

TEST_F(DumpLeakInfoTest, AsManyAsExpectedIsOnlyATotal) {
    tracker->AddRecord(this, 1, "f.cpp", 1);
    DumpLeakInfo(tracker, 1, "Thing Leaks", "leaks.txt");
    EXPECT_EACH(recorder.Texts(kDebugInfo) == Texts{"Total Thing Leaks = 1.\n"}, recorder.Count() == 1u, !FileExists());
    DumpLeakInfo(nullptr, 1, "Thing Leaks", "leaks.txt");
    EXPECT_EQ(1u, recorder.Count());
}

TEST_F(DumpLeakInfoTest, MoreThanExpectedAreWrittenToTheFile) {
    const char object[] = "A\ttext\x80.";
    const std::string big(300, 'b');
    tracker->AddRecord(object, sizeof object, "maker.cpp", 77);
    tracker->AddRecord(big.data(), 300, "maker.cpp", 78);
    drive.Put("target.txt", "what was there before");
    std::filesystem::create_symlink(drive.Native("target.txt"), drive.Native("leaks.txt"));
    DumpLeakInfo(tracker, 1, "Thing Leaks", "leaks.txt");
    const Texts infos = recorder.Texts(kDebugInfo);
    ASSERT_EQ(1u, infos.size());
    EXPECT_TRUE(infos[0].ends_with("\\leaks.txt(1) : 2 Thing Leaks (1 expected)")) << infos[0];
    EXPECT_EQ(Texts{"We got 1 more Thing Leaks than we see from a basic launch and quit.\n"},
              recorder.Texts(kDebugError));
    const auto status = std::filesystem::symlink_status(drive.Native("leaks.txt"));
    EXPECT_EQ(std::filesystem::file_type::regular, status.type()) << "the link is gone, and not followed";
    EXPECT_EACH(std::filesystem::perms(0600) == status.permissions(),
                drive.Get("target.txt") == "what was there before");
    const std::string text = drive.Get("leaks.txt");
    EXPECT_EACH(text.find("****************************************\n** List of currently allocated Thing Leaks") == 0u,
                std::string::npos != text.find("File maker.cpp      ; Line 77    # "));
    EXPECT_NE(std::string::npos, text.find("\nMemory Contents: A.text...\n")) << text;
    EXPECT_EACH(std::string::npos != text.find("\nMemory Contents: " + std::string(254, 'b') + "\n"),
                std::string::npos != text.find("\nNumber of unfreed items: 2\n\n2 Thing Leaks\n"));
}

TEST_F(DumpLeakInfoTest, ManyRecordsAreWrittenWhole) {
    static const char objects[2000] = {};
    for (const char& object : objects) tracker->AddRecord(&object, 1, "maker.cpp", 1);
    DumpLeakInfo(tracker, 0, "Thing Leaks", "leaks.txt");
    const std::string text = drive.Get("leaks.txt");
    size_t count = 0;
    for (size_t at = text.find("\nMemory Contents: .\n"); at != std::string::npos;
         at = text.find("\nMemory Contents: .\n", at + 1))
        ++count;
    EXPECT_EACH(count == 2000u, text.ends_with("\n2000 Thing Leaks\n"));
}

TEST_F(DumpLeakInfoTest, WhatCannotBeReadOfAnObjectIsLeftOut) {
    char* const pages =
        static_cast<char*>(mmap(nullptr, 8192, PROT_READ | PROT_WRITE, MAP_PRIVATE | MAP_ANONYMOUS, -1, 0));
    std::memset(pages, 'x', 8192);
    mprotect(pages + 4096, 4096, PROT_NONE);
    tracker->AddRecord(pages + 4096, 100, "maker.cpp", 1);
    tracker->AddRecord(pages + 4091, 100, "maker.cpp", 1);
    DumpLeakInfo(tracker, 0, "Thing Leaks", "leaks.txt");
    munmap(pages, 8192);
    EXPECT_THAT(drive.Get("leaks.txt"),
                AllOf(HasSubstr("\nMemory Contents: \n"), HasSubstr("\nMemory Contents: xxxxx\n")));
}

TEST_F(DumpLeakInfoTest, WithoutAFileTheSummaryStays) {
    tracker->AddRecord(this, 1, "f.cpp", 1);
    DumpLeakInfo(tracker, 0, "Thing Leaks", "no\\such\\folder.txt");
    DumpLeakInfo(tracker, 0, "Thing Leaks", std::string(600, 'n').c_str());
    DumpLeakInfo(tracker, 0, "Thing Leaks", nullptr);
    const std::string summary = "We got 1 more Thing Leaks than we see from a basic launch and quit.\n";
    const std::string nowhere = "There is no place for the report of the Thing Leaks",
                      folder = "\\no\\such\\folder.txt";
    const Texts errors = recorder.Texts(kDebugError);
    ASSERT_EQ(6u, errors.size());
    EXPECT_TRUE(errors[0].ends_with(folder + ": there is no such folder on the way")) << errors[0];
    EXPECT_EQ((Texts{summary, nowhere, summary, nowhere, summary}), Texts(errors.begin() + 1, errors.end()));
    EXPECT_EQ(1u, recorder.CountAt(kDebugInfo)) << "the one whose location is good";
    DumpLeakInfo(tracker, INT32_MIN, "Thing Leaks", nullptr);
    EXPECT_TRUE(
        recorder.Has(kDebugError, "We got 2147483649 more Thing Leaks than we see from a basic launch and quit.\n"));
}

TEST_F(DumpLeakInfoTest, WhatIsCutShortSaysSo) {
    tracker->AddRecord(this, 1, std::string(3000, 'f').c_str(), 1);
    DumpLeakInfo(tracker, 0, "Thing Leaks", "leaks.txt");
    DumpLeakInfo(tracker, 0, std::string(20000, 'n').c_str(), "leaks.txt");
    for (const char* call : {"write", "close"}) {
        test::FailingPlatform failing(call, call[0] == 'w' ? 1 : 2, ENOSPC);  // the old file is closed first
        DumpLeakInfo(tracker, 0, "Thing Leaks", "leaks.txt");
    }
    int cut = 0;
    for (const std::string& text : recorder.Texts(kDebugError))
        cut += text.ends_with("\\leaks.txt could not be written whole");
    EXPECT_EQ(4, cut);
}

TEST_F(DumpLeakInfoTest, ProgramsAtTheSameTimeKeepTheirReports) {
    tracker->AddRecord(this, 1, "f.cpp", 1);
    drive.Put("leaks.txt", "of an earlier program");
    std::filesystem::last_write_time(drive.Native("leaks.txt"),
                                     std::filesystem::file_time_type::clock::now() - std::chrono::hours(1));
    std::set<pid_t> others;
    for (int i = 0; i < 4; ++i) {
        const pid_t other = fork();
        if (other == 0) {
            DumpLeakInfo(tracker, 0, ("Leaks of " + std::to_string(getpid())).c_str(), "leaks.txt");
            _exit(0);
        }
        others.insert(other);
    }
    for (const pid_t other : others) waitpid(other, nullptr, 0);
    DumpLeakInfo(tracker, 0, ("Leaks of " + std::to_string(getpid())).c_str(), "leaks.txt");
    DumpLeakInfo(tracker, 0, ("Leaks of " + std::to_string(getpid())).c_str(), "leaks.txt");  // its own, again
    others.insert(getpid());
    int usual = 0;
    for (const auto& entry : std::filesystem::directory_iterator(drive.Native())) {
        const std::string name = entry.path().filename(), text = drive.Get(name);
        const pid_t writer = std::stoi(text.substr(text.find("Leaks of ") + 9));
        EXPECT_TRUE(name == "leaks.txt" || name == "leaks." + std::to_string(writer) + ".txt") << name;
        usual += name == "leaks.txt";
        EXPECT_EQ(1u, others.erase(writer)) << name;
    }
    EXPECT_EACH(usual == 1, others.empty());
}

std::string Failure(int32 code, const char* name, bool addTxt) {
    try {
        delete CreateFileLoc(code, name, addTxt);
        return "";
    } catch (const OVExcept& e) {
        return std::to_string(e.Code()) + ' ' + e.Detail();
    }
}

std::string PathText(int32 code, const std::string& name, bool addTxt) {
    const std::unique_ptr<FileLoc> location(CreateFileLoc(code, name.c_str(), addTxt));
    return location->PathText();
}

TEST(FileLoc, PlacesTheNameByItsCode) {
    EXPECT_EACH(PathText(1, "C:\\dir\\f", false) == "C:\\dir\\f", PathText(-1, "C:\\dir\\f", true) == "C:\\dir\\f.txt");
    setenv("TMPDIR", "/some/where", 1);
    for (int32 code : {0, 2, 4}) EXPECT_EQ("C:\\some\\where\\f", PathText(code, "f", false));
    unsetenv("TMPDIR");
    const std::unique_ptr<FileLoc> location(CreateFileLoc(1, "name", false)), clone(location->Clone());
    EXPECT_EACH(location->PathText() != clone->PathText(), clone->PathText() == "name");
}

TEST(FileLoc, RefusesWhatDoesNotFit) {
    const std::string n511(511, 'n'), n512(512, 'n'), n516(516, 'n'), n517(517, 'n');
    EXPECT_EACH(Failure(4, nullptr, false) == "1 inFilename is NULL", n516 == PathText(1, n516, false),
                Failure(1, n517.c_str(), false) == "7 Path too long", n511 + ".txt" == PathText(1, n511, true),
                Failure(1, n512.c_str(), true) == "7 Path too long");
    setenv("TMPDIR", "/t", 1);  // "C:\t\" is five bytes
    EXPECT_EACH("C:\\t\\" + n511 == PathText(4, n511, false), Failure(4, n512.c_str(), false) == "7 Path too long",
                Failure(4, n511.c_str(), true) == "7 Path too long");
    unsetenv("TMPDIR");
}

}  // namespace
}  // namespace tessel::test
