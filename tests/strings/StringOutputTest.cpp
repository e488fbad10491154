#include "support/ScratchDrive.h"
#include <tessel/diagnostics/FileLoc.h>
#include <tessel/strings/StringOutput.h>

#include <gtest/gtest.h>
#include <memory>
#include <string>

namespace tessel {
namespace {

// Gathers what is printed; a print may print again, as a report raised meanwhile would.
class Gathering : public StringOutputBase {
public:
    explicit Gathering(bool printsAgain = false) : printsAgain_(printsAgain) {}
    void Open(OpenMode mode) override { text += "open" + std::to_string(mode) + ' '; }
    void Flush() override { text += "flush "; }
    std::string text;
    int32 nestedResult = -1;

private:
    void WriteFormatted(CStr format, va_list arguments) override {
        char buffer[32];
        const int32 length = vsnprintf(buffer, sizeof buffer, format, arguments);
        EXPECT_EQ(static_cast<size_t>(length), std::string(buffer).size());
        text += buffer;
        if (printsAgain_) nestedResult = PrintData("again ");
    }
    bool printsAgain_;
};

TEST(StringOutput, CountsPrintsAndDropsTheNestedOnes) {
    Gathering output(true);
    EXPECT_EQ(1, output.PrintData("%d;%s ", 7, "x"));
    EXPECT_EQ(0, output.nestedResult);
    EXPECT_EQ(2, output.PrintData("second "));
    EXPECT_EQ(1, output.nestedResult);
    EXPECT_EQ("7;x second ", output.text);
    EXPECT_EQ(2, output.PrintData(nullptr));
    Gathering small;
    small.PrintData("%s", std::string(100, 'a').c_str());
    EXPECT_EQ(std::string(31, 'a'), small.text);
}

TEST(StringOutput, ForkPassesEverythingToBoth) {
    Gathering first, second;
    second.PrintData("earlier ");
    {
        StringOutputFork fork(&first, &second, false);
        fork.Open(StringOutput::kAppendAtEnd);
        EXPECT_EQ(2, fork.PrintData("%d %s ", 5, "both"));
        fork.Flush();
    }
    EXPECT_EQ("open1 5 both flush ", first.text);
    EXPECT_EQ("earlier open1 5 both flush ", second.text);
    EXPECT_EQ(2, StringOutputFork(&first, nullptr, false).PrintData("x"));
    EXPECT_EQ(3, StringOutputFork(nullptr, &second, false).PrintData("x"));
    EXPECT_EQ(0, StringOutputFork(nullptr, nullptr, true).PrintData("x"));
    // Owned outputs end with it; a leak checker would tell.
    StringOutputFork owner(new Gathering, new Gathering, true);
    EXPECT_EQ(1, owner.PrintData("x"));
}

TEST(StringOutput, ConsoleAndDebuggerChannel) {
    const std::unique_ptr<StringOutput> console(StringOutputFactory::CreateConsoleOutput());
    const std::unique_ptr<StringOutput> debugger(StringOutputFactory::CreateDebugPrintOutput());
    const std::string longText(3000, 'y');
    testing::internal::CaptureStdout();
    testing::internal::CaptureStderr();
    console->PrintData("to the console %d\n", 1);
    debugger->PrintData("to the debugger %d\n", 2);
    debugger->PrintData("%s", longText.c_str());
    EXPECT_EQ("to the console 1\n", testing::internal::GetCapturedStdout());
    EXPECT_EQ("to the debugger 2\n" + std::string(2047, 'y'), testing::internal::GetCapturedStderr());
}

TEST(StringOutput, FileModes) {
    const test::ScratchDrive drive;
    const auto print = [&](int32 mode, const char* text) {
        const std::unique_ptr<StringOutput> output(
            StringOutputFactory::CreateFileOutput(CreateFileLoc(-1, drive.Name("out").c_str(), true)));
        EXPECT_EQ(1, output->PrintData("not open yet"));
        output->Open(static_cast<StringOutput::OpenMode>(mode));
        EXPECT_EQ(2, output->PrintData("%s", text));
        output->Flush();
        return drive.Get("out.txt");
    };
    EXPECT_EQ("one ", print(0, "one "));
    EXPECT_EQ("one two ", print(1, "two "));
    EXPECT_EQ("one two three ", print(7, "three "));
    EXPECT_EQ("four", print(0, "four"));
}

TEST(StringOutput, FileThatCannotBeOpenedPrintsNothing) {
    const std::unique_ptr<StringOutput> output(
        StringOutputFactory::CreateFileOutput(CreateFileLoc(-1, "?:\\no\\such", false)));
    output->Open(StringOutput::kTruncate);
    EXPECT_EQ(1, output->PrintData("x"));
    output->Flush();
}

}  // namespace
}  // namespace tessel
