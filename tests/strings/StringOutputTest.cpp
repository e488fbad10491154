#include "support/ScratchDrive.h"
#include "support/Test.h"
#include <tessel/diagnostics/FileLoc.h>
#include <tessel/strings/StringOutput.h>

namespace tessel::test {
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
    EXPECT_EACH(output.PrintData("%d;%s ", 7, "x") == 1, output.nestedResult == 0, output.PrintData("second ") == 2,
                output.nestedResult == 1, output.text == "7;x second ", output.PrintData(nullptr) == 2);
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
    EXPECT_EACH(first.text == "open1 5 both flush ", second.text == "earlier open1 5 both flush ",
                StringOutputFork(&first, nullptr, false).PrintData("x") == 2,
                StringOutputFork(nullptr, &second, false).PrintData("x") == 3,
                StringOutputFork(nullptr, nullptr, true).PrintData("x") == 0);
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
    EXPECT_EACH(testing::internal::GetCapturedStdout() == "to the console 1\n",
                "to the debugger 2\n" + std::string(2047, 'y') == testing::internal::GetCapturedStderr());
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
    EXPECT_EACH(print(0, "one ") == "one ", print(1, "two ") == "one two ", print(7, "three ") == "one two three ",
                print(0, "four") == "four");
}

TEST(StringOutput, FileThatCannotBeOpenedPrintsNothing) {
    const std::unique_ptr<StringOutput> output(
        StringOutputFactory::CreateFileOutput(CreateFileLoc(-1, "?:\\no\\such", false)));
    output->Open(StringOutput::kTruncate);
    EXPECT_EQ(1, output->PrintData("x"));
    output->Flush();
}

}  // namespace
}  // namespace tessel::test
