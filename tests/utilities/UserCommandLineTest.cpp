#include <tessel/utilities/UserCommandLine.h>

#include <gtest/gtest.h>

#include <string>
#include <vector>

namespace {

using Words = std::vector<std::string>;
using Getter = void (*)(int32* count, char*** args);

Words ToWords(int32 count, char** args) {
    return Words(args, args + count);
}

Words Get(Getter getter) {
    int32 count = -1;
    char** args = nullptr;
    getter(&count, &args);
    return ToWords(count, args);
}

/* A host's arguments, as main gets them. */
class Host {
public:
    explicit Host(Words words) : words_(std::move(words)) {
        for (std::string& word : words_) args_.push_back(word.data());
        args_.push_back(nullptr);
    }
    ~Host() { UninitUserCommandLine(); }
    MgErr Init() { return InitUserCommandLine(static_cast<int32>(words_.size()), args_.data()); }

private:
    Words words_;
    std::vector<char*> args_;
};

TEST(UserCommandLine, IsSplitAtTheFirstSeparator) {
    const struct {
        Words all;
        bool ignore;
        Words app, user;
    } cases[] = {
        {{"prog", "-x", "--", "-y", "z"}, false, {"prog", "-x"}, {"prog", "-y", "z"}},
        {{"prog", "-x"}, false, {"prog", "-x"}, {"prog"}},
        {{"prog", "--", "a", "--", "b"}, false, {"prog"}, {"prog", "a", "--", "b"}},
        {{"prog", "--"}, false, {"prog"}, {"prog"}},
        {{"--", "a"}, false, {}, {"--", "a"}},
        {{"prog", "---", "-- "}, false, {"prog", "---", "-- "}, {"prog"}},
        {{"prog", "-x", "--", "z"}, true, {}, {"prog", "-x", "--", "z"}},
    };
    for (const auto& each : cases) {
        Host host(each.all);
        SetIgnoreCommandLine(each.ignore);
        EXPECT_EQ(host.Init(), kNoErr);
        EXPECT_EQ(Get(GetRawCommandLine), each.all);
        EXPECT_EQ(Get(GetAppCommandLine), each.app);
        EXPECT_EQ(Get(GetUserCommandLine), each.user);
    }
}

TEST(UserCommandLine, RefusesNoneAndASecondOne) {
    EXPECT_EQ(InitUserCommandLine(0, nullptr), kArgErr);
    Host first({"one", "--", "a"}), second({"two", "--", "b"});
    EXPECT_EQ(first.Init(), kNoErr);
    EXPECT_EQ(second.Init(), kArgErr);
    EXPECT_EQ(Get(GetAppCommandLine), (Words{"two", "--", "b"}));
    EXPECT_EQ(Get(GetUserCommandLine), (Words{"one", "a"}));
    SetIgnoreCommandLine(1);
    UninitUserCommandLine();
    EXPECT_TRUE(Get(GetRawCommandLine).empty());
    EXPECT_TRUE(Get(GetUserCommandLine).empty());
    EXPECT_EQ(second.Init(), kNoErr);
    EXPECT_EQ(Get(GetUserCommandLine), (Words{"two", "b"}));
}

TEST(UserCommandLine, NamesThePreferenceFile) {
    const struct {
        Words all;
        const char* path;
    } cases[] = {
        {{"prog", "-pref", "a.ini", "-pref", "b.ini"}, "b.ini"},
        {{"prog", "-pref"}, nullptr},
        {{"prog", "-pref", "a.ini", "-pref"}, "a.ini"},
        {{"prog", "-pref", "-pref", "b.ini"}, "-pref"},
        {{"prog", "--", "-pref", "a.ini"}, nullptr},
    };
    for (const auto& each : cases) {
        Host host(each.all);
        ASSERT_EQ(host.Init(), kNoErr);
        EXPECT_STREQ(GetPrefsPath(), each.path);
    }
    Host host({"prog", "-pref", "a.ini"});
    ASSERT_EQ(host.Init(), kNoErr);
    EXPECT_EQ(SetPrefsPath("own.ini"), kNoErr);
    EXPECT_EQ(SetPrefsPath(GetPrefsPath()), kNoErr);
    UninitUserCommandLine();
    EXPECT_STREQ(GetPrefsPath(), "own.ini");
    EXPECT_EQ(SetPrefsPath(nullptr), kNoErr);
    EXPECT_EQ(GetPrefsPath(), nullptr);
}

TEST(UserCommandLine, KnowsTheLibrarysOwnArguments) {
    const struct {
        std::string arg;
        bool ignored;
        int32 step;
    } cases[] = {{"-pref", true, 1},          {"-prefs", false, 0},  {"OV_ALLOC_TRACKER=off", true, 0},
                 {"OV_USE_MALLOC=", true, 0}, {"tessel=x", true, 0}, {"tessel", false, 0},
                 {"Tessel=x", false, 0},      {"", false, 0}};
    for (auto each : cases) {
        int32 index = 5;
        EXPECT_EQ(ShouldIgnoreCommandLineArg(each.arg.data(), &index), each.ignored) << each.arg;
        EXPECT_EQ(index, 5 + each.step) << each.arg;
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
        {"\"a\tb\" \xC3\xA4", {"a\tb", "\xC3\xA4"}},
    };
    for (const auto& each : cases) {
        std::string first = "prog";
        int32 count = 0;
        char** args = nullptr;
        NewCommandLineArgsFromSingleLine(each.line, first.data(), &count, &args);
        ASSERT_EQ(count, static_cast<int32>(each.words.size()) + 1) << (each.line ? each.line : "null");
        EXPECT_EQ(args[0], first.data());
        EXPECT_EQ(ToWords(count - 1, args + 1), each.words);
        DeleteCommandLineArgsFromSingleLine(count, args);
    }
    DeleteCommandLineArgsFromSingleLine(0, nullptr);
}

}  // namespace
