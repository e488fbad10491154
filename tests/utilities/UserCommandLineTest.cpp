#include "support/Test.h"
#include "support/malloc/FailingMalloc.h"
#include <tessel/utilities/UserCommandLine.h>

namespace {

using Words = std::vector<std::string>;

Words Get(void (*getter)(int32* count, char*** args)) {
    int32 count = -1;
    char** args = nullptr;
    getter(&count, &args);
    return Words(args, args + count);
}

// A host's arguments, as main gets them.
class Host {
public:
    explicit Host(Words words) : words_(std::move(words)) {
        for (std::string& word : words_) args_.push_back(word.data());
    }
    ~Host() { UninitUserCommandLine(); }
    MgErr Init() { return InitUserCommandLine(static_cast<int32>(args_.size()), args_.data()); }

private:
    Words words_;
    std::vector<char*> args_;
};

std::string Joined(const Words& words) {
    std::string text;
    for (const std::string& word : words) text += word + '|';
    return text;
}

// The application's words of a command line, the user's, and the preferences.
std::string Split(Words words, bool ignore = false) {
    Host host(words);
    SetIgnoreCommandLine(ignore);
    EXPECT_EACH(host.Init() == kNoErr, Get(GetRawCommandLine) == words);
    return Joined(Get(GetAppCommandLine)) + "; " + Joined(Get(GetUserCommandLine)) + "; " +
           (GetPrefsPath() ? GetPrefsPath() : "null");
}

TEST(UserCommandLine, IsSplitAtTheFirstSeparator) {
    EXPECT_EACH(Split({"prog", "-x", "--", "-y", "z"}) == "prog|-x|; prog|-y|z|; null",
                Split({"prog", "-pref"}) == "prog|-pref|; prog|; null",
                Split({"prog", "--", "a", "--", "b"}) == "prog|; prog|a|--|b|; null",
                Split({"--", "a"}) == "; --|a|; null", Split({"prog", "---", "-- "}) == "prog|---|-- |; prog|; null",
                Split({"prog", "-x", "--", "z"}, true) == "; prog|-x|--|z|; null",
                Split({"prog", "-pref", "a", "-pref", "b"}) == "prog|-pref|a|-pref|b|; prog|; b",
                Split({"prog", "-pref", "a", "-pref"}) == "prog|-pref|a|-pref|; prog|; a",
                Split({"prog", "--", "-pref", "a"}) == "prog|; prog|-pref|a|; null");
}

TEST(UserCommandLine, RefusesNoneAndASecondOne) {
    EXPECT_EQ(InitUserCommandLine(0, nullptr), kArgErr);
    Host first({"one", "-pref", "a.ini", "--", "a"}), second({"two", "--", "b"});
    EXPECT_EACH(first.Init() == kNoErr, second.Init() == kArgErr, Get(GetAppCommandLine) == (Words{"two", "--", "b"}),
                Get(GetUserCommandLine) == (Words{"one", "a"}), SetPrefsPath("own.ini") == kNoErr,
                SetPrefsPath(GetPrefsPath()) == kNoErr);
    SetIgnoreCommandLine(1);
    UninitUserCommandLine();
    EXPECT_EACH(Get(GetRawCommandLine).empty(), Get(GetUserCommandLine).empty(), second.Init() == kNoErr,
                Get(GetUserCommandLine) == (Words{"two", "b"}), GetPrefsPath() == "own.ini",
                SetPrefsPath(nullptr) == kNoErr, GetPrefsPath() == nullptr);
}

TEST(UserCommandLine, WithoutMemoryNothingIsKept) {
    std::string program = "prog";
    Host host({"prog", "--", "a"});
    int failures = tessel::test::WithEachAllocationFailing([&] {
        MgErr err = host.Init();
        int32 count = -1;
        char** args = nullptr;
        GetUserCommandLine(&count, &args);
        EXPECT_TRUE(err == kNoErr ? count == 2 : err == kMemFullErr && count == 0 && !args);
        err = SetPrefsPath("first.ini") != kNoErr ? kNoErr : SetPrefsPath("second.ini");
        EXPECT_TRUE(GetPrefsPath() ? err == kNoErr : err == kNoErr || err == kMemFullErr);
        NewCommandLineArgsFromSingleLine("a b", program.data(), &count, &args);
        EXPECT_EQ(count, args ? 3 : 0);
        DeleteCommandLineArgsFromSingleLine(count, args);
        SetPrefsPath(nullptr);
        UninitUserCommandLine();
    });
    EXPECT_EQ(failures, 4);
}

TEST(UserCommandLine, KnowsTheLibrarysOwnArguments) {
    for (std::string own : {"-pref", "OV_ALLOC_TRACKER=off", "OV_USE_MALLOC=", "tessel=x"}) {
        int32 index = 5;
        EXPECT_TRUE(ShouldIgnoreCommandLineArg(own.data(), &index)) << own;
        EXPECT_EQ(index, own == "-pref" ? 6 : 5);
    }
    for (std::string other : {"-prefs", "tessel", "Tessel=x", ""}) {
        int32 index = 5;
        EXPECT_FALSE(ShouldIgnoreCommandLineArg(other.data(), &index)) << other;
    }
}

TEST(UserCommandLine, IsMadeFromOneLine) {
    const auto words = [](const char* line) {
        std::string first = "prog";
        int32 count = 0;
        char** args = nullptr;
        NewCommandLineArgsFromSingleLine(line, first.data(), &count, &args);
        EXPECT_EQ(args[0], first.data());
        const std::string text = Joined(Words(args + 1, args + count));
        DeleteCommandLineArgsFromSingleLine(count, args);
        return text;
    };
    EXPECT_EACH(words(" a \"b c\" d") == "a|b c|d|", words(nullptr) == "", words("") == "", words(" \t \t") == "",
                words("\ta\t\tb ") == "a|b|", words("\"") == "|", words("\"\"\"\"") == "||",
                words("x \"y z") == "x|y z|", words("\"a\"b\"c d\"") == "a|b\"c|d\"|",
                words("-n=\"a b\"") == "-n=\"a|b\"|");
    DeleteCommandLineArgsFromSingleLine(0, nullptr);
}

}  // namespace
