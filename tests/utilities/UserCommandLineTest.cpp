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

TEST(UserCommandLine, IsSplitAtTheFirstSeparator) {
    const struct {
        Words all;
        bool ignore;
        Words app, user;
        const char* prefs;
    } cases[] = {
        {{"prog", "-x", "--", "-y", "z"}, false, {"prog", "-x"}, {"prog", "-y", "z"}, nullptr},
        {{"prog", "-pref"}, false, {"prog", "-pref"}, {"prog"}, nullptr},
        {{"prog", "--", "a", "--", "b"}, false, {"prog"}, {"prog", "a", "--", "b"}, nullptr},
        {{"--", "a"}, false, {}, {"--", "a"}, nullptr},
        {{"prog", "---", "-- "}, false, {"prog", "---", "-- "}, {"prog"}, nullptr},
        {{"prog", "-x", "--", "z"}, true, {}, {"prog", "-x", "--", "z"}, nullptr},
        {{"prog", "-pref", "a", "-pref", "b"}, false, {"prog", "-pref", "a", "-pref", "b"}, {"prog"}, "b"},
        {{"prog", "-pref", "a", "-pref"}, false, {"prog", "-pref", "a", "-pref"}, {"prog"}, "a"},
        {{"prog", "--", "-pref", "a"}, false, {"prog"}, {"prog", "-pref", "a"}, nullptr},
    };
    for (const auto& each : cases) {
        Host host(each.all);
        SetIgnoreCommandLine(each.ignore);
        EXPECT_EACH(host.Init() == kNoErr, Get(GetRawCommandLine) == each.all, Get(GetAppCommandLine) == each.app,
                    Get(GetUserCommandLine) == each.user);
        EXPECT_STREQ(GetPrefsPath(), each.prefs);
    }
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
    const struct {
        const char* line;
        Words words;
    } cases[] = {
        {" a \"b c\" d", {"a", "b c", "d"}},
        {nullptr, {}},
        {"", {}},
        {" \t \t", {}},
        {"\ta\t\tb ", {"a", "b"}},
        {"\"", {""}},
        {"\"\"\"\"", {"", ""}},
        {"x \"y z", {"x", "y z"}},
        {"\"a\"b\"c d\"", {"a", "b\"c", "d\""}},
        {"-n=\"a b\"", {"-n=\"a", "b\""}},
    };
    for (const auto& each : cases) {
        std::string first = "prog";
        int32 count = 0;
        char** args = nullptr;
        NewCommandLineArgsFromSingleLine(each.line, first.data(), &count, &args);
        ASSERT_EQ(count, static_cast<int32>(each.words.size()) + 1) << (each.line ? each.line : "null");
        EXPECT_EACH(args[0] == first.data(), Words(args + 1, args + count) == each.words);
        DeleteCommandLineArgsFromSingleLine(count, args);
    }
    DeleteCommandLineArgsFromSingleLine(0, nullptr);
}

}  // namespace
