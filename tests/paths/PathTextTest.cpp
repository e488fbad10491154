// Paths as text, text as paths, and names for the system.
#include <tessel/memory/MemoryManager.h>
#include <tessel/paths/PathAbbreviation.h>
#include <tessel/paths/PathTextFormat.h>

#include "paths/PathTestSupport.h"
#include "platform/CodePage.h"

namespace tessel {
namespace {

using namespace test;

class PathText : public PathTest {
protected:
    ~PathText() override { platform::SetCodePage(platform::kCodePageUtf8); }

    static std::string Written(const PathRef& path, const char* format) {
        std::string text = "#";
        const MgErr err = path.ConvertToString(&text, format);
        return err ? std::to_string(err) : text;
    }
    static std::string Read(const std::string& text, const char* format) {
        std::string shown;
        const MgErr err = CodeOf([&] { shown = Show(PathRef(text, format)); });
        return err ? std::to_string(err) : shown;
    }
    using TextAndPath = std::initializer_list<std::pair<const char*, const char*>>;
    static void ExpectRead(const char* format, TextAndPath rows) {
        for (const auto& [text, shown] : rows) EXPECT_EQ(shown, Read(text, format)) << format << " " << text;
    }
};

TEST_F(PathText, Written) {
    const struct {
        PathRef path;
        const char *display, *unixText, *independent;
    } rows[] = {{Abs({"C", "dir", "file"}), "C:\\dir\\file", "/C/dir/file", "/C/dir/file"},
                {Abs({"C"}), "C:\\", "/C", "/C"},
                {Abs({}), "", "/", ""},
                {Rel({}), ".", ".", ""},
                {Rel({"..", "..", "a"}), "..\\..\\a", "../../a", "../../a"},
                {Unc({"\\\\srv\\share", "x"}), "\\\\srv\\share\\x", "\\\\srv\\share/x", "//srv/share/x"}};
    for (const auto& row : rows) {
        for (int again = 0; again < 2; ++again) {  // the second time from the cache
            EXPECT_EQ(row.display, Written(row.path, PathRef::StringDisplay()));
            EXPECT_EQ(row.display, Written(row.path, PathRef::StringDOS()));
            EXPECT_EQ(row.unixText, Written(row.path, PathRef::StringUnix()));
            EXPECT_EQ(row.independent, Written(row.path, PathRef::StringPlatformIndependent()));
            EXPECT_EQ(row.independent, Written(row.path, "pathref_platformagnostic"));
        }
        PathRef copy(row.path);
        EXPECT_EQ(row.display, copy.ToString("pathref_display"));
    }
    EXPECT_EQ("C:\\x", Written(Abs({"C", "x"}), PathRef::StringCommandLine()));
    EXPECT_EQ("1", Written(Abs({}), PathRef::StringCommandLine()));
    EXPECT_EQ("53", Written(Abs({}), "pathref_Display"));
    PathRef::SetNotAPathString("<none>");
    EXPECT_EQ("<none>", Written(PathRef(), PathRef::StringUnix()));
    std::string text;
    EXPECT_EQ(kArgErr, PathRef(PathRef::kNullPath).ConvertToString(&text, PathRef::StringUnix()));
    EXPECT_EQ("<none>", text);
    PathRef::SetNotAPathString("");
}

TEST_F(PathText, ReadAsDisplayText) {
    ExpectRead(PathRef::StringDisplay(), {{"C:\\", "abs:C"},
                                          {"C:\\dir\\..\\file", "abs:C/file"},
                                          {"C:dir", "abs:C/dir"},
                                          {"C::dir\\x", "abs:C/dir/x"},
                                          {"name:", "abs:name"},
                                          {"Disk:a:b", "abs:Disk/a:b"},
                                          {":a", "1"},
                                          {"", "abs:"},
                                          {".", "rel:"},
                                          {"a\\.\\b\\", "rel:a/b"},
                                          {"..\\..\\a", "rel:^/^/a"},
                                          {"a\\b:c", "rel:a/b:c"},
                                          {"\\\\srv\\share\\x", "unc:\\\\srv\\share/x"},
                                          {"\\\\srv\\share", "unc:\\\\srv\\share"},
                                          {"\\\\srv", "unc:\\\\srv\\"},
                                          {"\\\\srv\\share\\..", "1"}});
    // The drive of the current directory.
    ExpectRead(PathRef::StringDisplay(), {{"\\dir\\\\x\\", "abs:C/dir/x"}, {"\\", "abs:C"}, {"\\a:b", "abs:C/a:b"}});
    EXPECT_EQ(1, PathRef("a/b", PathRef::StringDisplay()).ItemCount());
    try {
        PathRef("", PathRef::StringCommandLine());
        FAIL();
    } catch (const OVExcept& e) {
        EXPECT_EQ(kArgErr, e.Code());
        EXPECT_STREQ("Empty command line strings cannot be converted to Path", e.Detail());
    }
    EXPECT_EQ("53", Read("a", "pathref_nothing"));
}

TEST_F(PathText, ReadAsOtherText) {
    ExpectRead("pathref_unix", {{"/usr//lib/./../bin", "abs:usr/bin"},
                                {"../a", "rel:^/a"},
                                {"//srv/share/x", "abs:srv/share/x"},
                                {"", "abs:"}});
    ExpectRead("pathref_platformindependent", {{"/", "rel:"},
                                               {"", "abs:"},
                                               {"/C/x", "abs:C/x"},
                                               {"//srv/share/x", "unc:\\\\srv\\share/x"},
                                               {"//s/x", "unc:\\\\s\\x"},
                                               {"//s/", "abs:s"},
                                               {"//srv", "abs:srv"},
                                               {"//srv/", "unc:\\\\srv\\"}});
    ExpectRead("pathref_platformagnostic", {{"/usr/bin", "abs:usr/bin"},
                                            {"C:\\x", "abs:C/x"},
                                            {"Disk:folder:file", "abs:Disk/folder/file"},
                                            {":folder:file", "rel:folder/file"},
                                            {"Disk:a:b::c:d", "abs:Disk/a/c/d"},
                                            {"a\\b", "rel:a/b"},
                                            {"name", "rel:name"}});
    EXPECT_EQ(2, PathRef("a/b", PathRef::StringPlatformAgnostic()).ItemCount());
}

// 0x5C is the second byte of many characters in the Japanese code page, and a backslash alone.
TEST_F(PathText, CharactersWithABackslashByte) {
    ASSERT_TRUE(platform::SetCodePage(932));
    const std::string hyou = "\x95\x5C";
    EXPECT_EQ("abs:C/" + hyou + "/x", Read("C:\\" + hyou + "\\x", PathRef::StringDisplay()));
    EXPECT_EQ("unc:\\\\" + hyou + "\\s/x", Read("//" + hyou + "/s/x", PathRef::StringPlatformIndependent()));
    EXPECT_EQ("//" + hyou + "/s",
              Written(Unc({("\\\\" + hyou + "\\s").c_str()}), PathRef::StringPlatformIndependent()));
    PathRef path = Abs({"C", hyou.c_str(), "x"});
    char name[kMaxDOSPathName];
    EXPECT_EQ(kNoErr, MakeDOSPathName(&path, name, 1));
    EXPECT_EQ("C:\\" + hyou + "\\x", name);
    LStrHandle text = nullptr;
    EXPECT_EQ(kNoErr, FPathToStringRTF(&path, &text));
    EXPECT_EQ("C:\\\\" + hyou + "\\\\x",
              std::string(reinterpret_cast<char*>((*text)->bytes), static_cast<size_t>((*text)->count)));
    DSDisposeHandle(reinterpret_cast<UHandle>(text));
    EXPECT_TRUE(PathRef::NameWildCardMatch(hyou + ".txt", "?.txt"));
    EXPECT_TRUE(PathRef::NameWildCardMatch(hyou + ".txt", "*.txt"));
    EXPECT_TRUE(PathRef::CharCountMeasurementStyle(1).StringIsTooLong(hyou + hyou));
    EXPECT_FALSE(PathRef::CharCountMeasurementStyle(2).StringIsTooLong(hyou + hyou));
}

TEST_F(PathText, FlatReading) {
    Path path = nullptr;
    const auto read = [&](MgErr err) { return Show(err, *path); };
    EXPECT_EQ("abs:C/ab", read(FTextToPath("C:\\ab!!", 5, &path)));
    const Path same = path;
    EXPECT_EQ("rel:x", read(FFileSystemCStrToPath("x", &path)));
    EXPECT_EQ(same, path);
    EXPECT_EQ(kArgErr, FTextToPath("\\\\s\\t\\..", 8, &path));
    EXPECT_EQ("rel:x", Show(path));
    EXPECT_EQ("abs:", read(FTextToPath(nullptr, 5, &path)));
    EXPECT_EQ(kArgErr, FTextToPath("a", 1, nullptr));
    EXPECT_EQ("abs:C/y", read(ConvertPlatformIndependentTextToPath(&path, "/C/y")));
    EXPECT_EQ("abs:", read(FStringToPath(nullptr, &path)));
    EXPECT_EQ(0u, reports_.Count());
    EXPECT_EQ(kArgErr, FFileSystemCStrToPath(nullptr, &path));
    EXPECT_EQ("abs:", read(ConvertPlatformIndependentTextToPath(&path, nullptr)));
    EXPECT_EQ((std::vector<std::string>{"FFileSystemCStrToPath: don't pass NULL for text",
                                        "ConvertPlatformIndependentTextToPathNew: NULL text passed in"}),
              reports_.Texts(2));
    FDestroyPath(&path);
}

TEST_F(PathText, FlatWriting) {
    PathRef path = Abs({"C", "dir"});
    LStrHandle text = nullptr;
    const auto bytes = [&](MgErr err) {
        EXPECT_EQ(kNoErr, err);
        const uint32 size = DSGetHandleSize(reinterpret_cast<UHandle>(text));
        EXPECT_LE(LStrSize((*text)->count), size);
        return std::string(reinterpret_cast<char*>((*text)->bytes), size - LStrSize(0));
    };
    EXPECT_EQ(std::string("C:\\dir\0", 7), bytes(FPathToDSString(&path, &text)));
    EXPECT_EQ(6, (*text)->count);
    EXPECT_EQ(std::string("/C/dir\0", 7), bytes(FPathToUnixString(&path, &text)));
    EXPECT_EQ("/C/dir", bytes(ConvertPathToPlatformIndependentText(&path, &text)));
    EXPECT_EQ("C:\\\\dir", bytes(FPathToStringRTF(&path, &text)));
    EXPECT_EQ(std::string("\0", 1), bytes(FPathToAZString(nullptr, &text)));
    EXPECT_EQ(kArgErr, FPathToFileSystemDSString(nullptr, &text));
    EXPECT_EQ(kNotFoundErr, FPathToURL(&path, &text));
    DSDisposeHandle(reinterpret_cast<UHandle>(text));

    alignas(LStr) char room[16];
    LStrPtr counted = reinterpret_cast<LStrPtr>(room);
    counted->count = -1;
    EXPECT_EQ(kNoErr, FPathToText(&path, counted));
    EXPECT_EQ(6, counted->count);
    EXPECT_EQ(kNoErr, FPathToText(&path, counted));
    EXPECT_EQ(0, std::memcmp(counted->bytes, "C:\\dir", 6));

    UHandle cString = PathToCString(&path);
    EXPECT_EQ(7u, DSGetHandleSize(cString));
    EXPECT_STREQ("C:\\dir", reinterpret_cast<char*>(*cString));
    DSDisposeHandle(cString);
    for (size_t length : {260, 261}) {
        PathRef longPath = Rel({std::string(length, 'x').c_str()});
        UPtr block = nullptr;
        EXPECT_EQ(length == 260 ? kNoErr : kMemFullErr, FPathToMaxCString(&longPath, &block));
        if (!block) continue;
        EXPECT_EQ(260u, std::strlen(reinterpret_cast<char*>(block)));
        DSDisposePtr(block);
    }
}

TEST_F(PathText, NamesForTheSystem) {
    const auto made = [](PathRef path) {
        char name[kMaxDOSPathName];
        const MgErr err = MakeDOSPathName(&path, name, 0);
        return err ? std::to_string(err) : std::string(name);
    };
    EXPECT_EQ("C:\\", made(Abs({"C"})));
    EXPECT_EQ("c:\\dir\\a b.x", made(Abs({"c", "dir", "a b.x"})));
    EXPECT_EQ("\\\\s\\t\\", made(Unc({"\\\\s\\t"})));
    EXPECT_EQ("\\\\s\\t\\x", made(Unc({"\\\\s\\t", "x"})));
    for (const PathRef& path : {Abs({}), Abs({"CC"}), Abs({"1"}), Rel({"C"}), PathRef(), Abs({"C", "con"}),
                                Abs({"C", "lpt9", "x"}), Abs({"C", "a?b"}), Abs({"C", "x."}), Abs({".."})})
        EXPECT_EQ("1", made(path)) << Show(path);
    for (const std::string& text : {std::string("C:\\dir\\a\0.txt", 13), std::string("\\\\s\0\\t\\x", 9)})
        EXPECT_EQ("1", made(PathRef(text, PathRef::StringDisplay())));
    const auto ofLength = [](size_t length) { return Abs({"C", std::string(length - 3, 'x').c_str()}); };
    EXPECT_EQ(259u, made(ofLength(259)).size());
    EXPECT_EQ("1", made(ofLength(260)));
    EXPECT_EQ(kArgErr, MakeDOSPathName(nullptr, nullptr, 0));
}

TEST_F(PathText, NamesThatFilesCannotHave) {
    const struct {
        const char* name;
        int32 flags;
        const char* bad;
    } rows[] = {
        {"good.txt", 0, ""}, {"", 2, ""},     {"name.", 32, ""}, {"COM1", 8, ""}, {"lpt0", 8, ""},
        {"COM10", 0, ""},    {"COMX", 0, ""}, {"cLoCk$", 8, ""}, {"a:b", 4, ":"}, {"a\"*/:<>?\\|b", 4, "\"*/:<>?\\|"},
        {"a|.", 36, "|"}};
    for (const auto& row : rows) {
        char bad[256] = "#";
        EXPECT_EQ(row.flags, FileNameChk(PStrOf(row.name), 0, 0, bad)) << row.name;
        EXPECT_STREQ(row.bad, bad);
        EXPECT_EQ(row.flags & 2, FileNameChk(PStrOf(row.name), 0, 1, nullptr));
    }
}

TEST_F(PathText, Patterns) {
    const struct {
        bool fits;
        std::vector<std::pair<std::string, std::string>> patternsAndNames;
    } rows[] = {{true,
                 {{"*.txt", "a.txt"},
                  {"**.txt", "a.txt"},
                  {"**.txt", "dir\\a.txt"},
                  {"a?c", "abc"},
                  {"name.", "name"},
                  {"*.*", "name"},
                  {"NAME", "name"},
                  {"", ""},
                  {"*", ""},
                  {"**", "a\\b"},
                  {"a*b*c", "a1b2bc"},
                  {"*\\x", "dir\\X"}}},
                {false,
                 {{"*.txt", "dir\\a.txt"},
                  {"a?c", "a\\c"},
                  {"a?c", "ac"},
                  {"name.", "name.x"},
                  {"name", "names"},
                  {"", "a"},
                  {"*", "a\\b"},
                  {"a*b*c", "a1b2b"},
                  {"a.b", "ab"}}}};
    for (const auto& row : rows) {
        for (const auto& [pattern, name] : row.patternsAndNames) {
            EXPECT_EQ(row.fits, PathRef::NameWildCardMatch(name, pattern)) << pattern << " " << name;
            EXPECT_EQ(row.fits, FStrFitsPat(pattern.data(), name.data(), static_cast<int32>(pattern.size()),
                                            static_cast<int32>(name.size())));
        }
    }
    // Many stars on a long name: the work stays bounded.
    EXPECT_FALSE(PathRef::NameWildCardMatch(std::string(2000, 'a'), "*a*a*a*a*a*a*a*a*a*a*a*a*b"));
    int32 position = 0;
    EXPECT_TRUE(FMFindWildCardMatchCh("ab*c?", &position, 5, 'x'));
    EXPECT_EQ(2, position);
    position = 3;
    EXPECT_TRUE(FMFindWildCardMatchCh("ab*c?", &position, 5, 'c'));
    EXPECT_EQ(3, position);
    EXPECT_FALSE(FFindMatchCh("ab*c?", &position, 4));
    EXPECT_TRUE(FFindMatchCh("abc`", &(position = 0), 4));
}

TEST_F(PathText, AbbreviatedToFit) {
    using Paths = std::list<PathRef>;
    const struct {
        Paths paths;
        uint32 maximum;
        std::vector<std::string> texts;
    } rows[] = {
        {{Abs({"C", "a", "one"}), Abs({"C", "b", "two"}), Abs({})}, 20, {"one", "two", ""}},
        {{Abs({"C", "a", "longname"})}, 7, {"...name"}},
        {{Abs({"C", "a", "longname"})}, 3, {""}},
        {{Abs({"C", "a", "x"}), Abs({"C", "b", "X"})}, 20, {"C:\\a\\x", "C:\\b\\X"}},
        {{Abs({"C", "dir", "sub", "x"}), Abs({"C", "x"})}, 14, {"C:\\dir\\sub\\x", "C:\\x"}},
        {{Abs({"C", "dir", "sub", "name"}), Abs({"C", "name"})}, 14, {"...\\sub\\name", "C:\\name"}},
        {{Abs({"C", "dir", "sub", "name"}), Abs({"C", "name"})}, 10, {"...\\name", "C:\\name"}},
        {{Abs({"C", "dir", "sub", "name"}), Abs({"C", "name"})}, 6, {"name", "name"}},
    };
    for (const auto& row : rows) {
        std::vector<std::string> texts;
        EXPECT_EQ(kNoErr,
                  PathRef::ToAbbreviatedDisplayStrings(row.paths, &texts, PathRef::TrimFromFrontAbbreviationStyle(),
                                                       PathRef::CharCountMeasurementStyle(row.maximum)));
        EXPECT_EQ(row.texts, texts);
    }
    PathRef::TrimFromFrontAbbreviationStyle forced;
    forced.SetForceFullPathStrings(true);
    std::vector<std::string> texts;
    const PathRef::CharCountMeasurementStyle wide(100);
    EXPECT_EQ(kNoErr, PathRef::ToAbbreviatedDisplayStrings({Abs({"C", "x"})}, &texts, forced, wide));
    EXPECT_EQ("C:\\x", texts.at(0));
    EXPECT_EQ(kArgErr, PathRef::ToAbbreviatedDisplayStrings({}, nullptr, forced, wide));
    EXPECT_EQ(kArgErr, PathRef::ToAbbreviatedDisplayStrings({PathRef(PathRef::kNullPath)}, &texts, forced, wide));
}

}  // namespace
}  // namespace tessel
