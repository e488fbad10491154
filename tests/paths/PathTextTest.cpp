// Paths as text, text as paths, and names for the system.
#include "paths/PathTestSupport.h"
#include "platform/CodePage.h"
#include "support/Test.h"
#include <tessel/memory/MemoryManager.h>
#include <tessel/paths/PathAbbreviation.h>
#include <tessel/paths/PathTextFormat.h>

#include <fstream>
#include <sstream>

namespace tessel::test {
namespace {

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
            EXPECT_EACH(row.display == Written(row.path, PathRef::StringDisplay()),
                        row.display == Written(row.path, PathRef::StringDOS()),
                        row.unixText == Written(row.path, PathRef::StringUnix()),
                        row.independent == Written(row.path, PathRef::StringPlatformIndependent()),
                        row.independent == Written(row.path, "pathref_platformagnostic"));
        }
        PathRef copy(row.path);
        EXPECT_EQ(row.display, copy.ToString("pathref_display"));
    }
    EXPECT_EACH(Written(Abs({"C", "x"}), PathRef::StringCommandLine()) == "C:\\x",
                Written(Abs({}), PathRef::StringCommandLine()) == "1", Written(Abs({}), "pathref_Display") == "53");
    PathRef::SetNotAPathString("<none>");
    EXPECT_EQ("<none>", Written(PathRef(), PathRef::StringUnix()));
    std::string text;
    EXPECT_EACH(PathRef(PathRef::kNullPath).ConvertToString(&text, PathRef::StringUnix()) == kArgErr, text == "<none>");
    PathRef::SetNotAPathString("");
}

TEST_F(PathText, Read) {
    std::ifstream file("data/path_texts.txt");
    int rows = 0;
    for (std::string line, format, text, shown; std::getline(file, line);) {
        std::istringstream fields(line);
        if (line[0] == '#') continue;
        for (std::string* field : {&format, &text, &shown}) std::getline(fields, *field, '|');
        EXPECT_EQ(shown, Read(text, ("pathref_" + format).c_str())) << format << " " << text;
        ++rows;
    }
    EXPECT_EQ(39, rows);
    EXPECT_EACH(PathRef("a/b", PathRef::StringDisplay()).ItemCount() == 1,
                PathRef("a/b", PathRef::StringPlatformAgnostic()).ItemCount() == 2);
    const auto detail = [](const char* text, const char* format) {
        try {
            return Show(PathRef(text, format));
        } catch (const OVExcept& e) {
            return std::string(e.Detail());
        }
    };
    EXPECT_EACH(detail("", PathRef::StringCommandLine()) == "Empty command line strings cannot be converted to Path",
                detail("pathref_unix", "C:\\x") == "PathRef from string constructor: unknown format \"C:\\x\"");
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
    EXPECT_EACH(MakeDOSPathName(&path, name, 1) == kNoErr, "C:\\" + hyou + "\\x" == name);
    LStrHandle text = nullptr;
    EXPECT_EACH(FPathToStringRTF(&path, &text) == kNoErr,
                "C:\\\\" + hyou + "\\\\x" ==
                    std::string(reinterpret_cast<char*>((*text)->bytes), static_cast<size_t>((*text)->count)));
    DSDisposeHandle(reinterpret_cast<UHandle>(text));
    EXPECT_EACH(PathRef::NameWildCardMatch(hyou + ".txt", "?.txt"), PathRef::NameWildCardMatch(hyou + ".txt", "*.txt"),
                PathRef::CharCountMeasurementStyle(1).StringIsTooLong(hyou + hyou),
                !PathRef::CharCountMeasurementStyle(2).StringIsTooLong(hyou + hyou));
}

TEST_F(PathText, FlatReading) {
    Path path = nullptr;
    const auto read = [&](MgErr err) { return Show(err, *path); };
    EXPECT_EQ("abs:C/ab", read(FTextToPath("C:\\ab!!", 5, &path)));
    const Path same = path;
    EXPECT_EACH(read(FFileSystemCStrToPath("x", &path)) == "rel:x", same == path,
                FTextToPath("\\\\s\\t\\..", 8, &path) == kArgErr, Show(path) == "rel:x",
                read(FTextToPath(nullptr, 5, &path)) == "abs:", FTextToPath("a", 1, nullptr) == kArgErr,
                FTextToPath("a", -1, &path) == kArgErr,
                read(ConvertPlatformIndependentTextToPath(&path, "/C/y")) == "abs:C/y",
                read(FStringToPath(nullptr, &path)) == "abs:", reports_.Count() == 0u,
                FFileSystemCStrToPath(nullptr, &path) == kArgErr,
                read(ConvertPlatformIndependentTextToPath(&path, nullptr)) == "abs:",
                (std::vector<std::string>{"FFileSystemCStrToPath: don't pass NULL for text",
                                          "ConvertPlatformIndependentTextToPathNew: NULL text passed in"}) ==
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
    EXPECT_EACH(bytes(FPathToDSString(&path, &text)) == std::string("C:\\dir\0", 7), (*text)->count == 6,
                bytes(FPathToUnixString(&path, &text)) == std::string("/C/dir\0", 7),
                bytes(ConvertPathToPlatformIndependentText(&path, &text)) == "/C/dir",
                bytes(FPathToStringRTF(&path, &text)) == "C:\\\\dir",
                bytes(FPathToAZString(nullptr, &text)) == std::string("\0", 1),
                FPathToFileSystemDSString(nullptr, &text) == kArgErr, FPathToURL(&path, &text) == kNotFoundErr);
    DSDisposeHandle(reinterpret_cast<UHandle>(text));

    alignas(LStr) char room[16];
    LStrPtr counted = reinterpret_cast<LStrPtr>(room);
    counted->count = -1;
    EXPECT_EACH(FPathToText(&path, counted) == kNoErr, counted->count == 6, FPathToText(&path, counted) == kNoErr,
                std::memcmp(counted->bytes, "C:\\dir", 6) == 0);

    UHandle cString = PathToCString(&path);
    EXPECT_EACH(DSGetHandleSize(cString) == 7u, reinterpret_cast<char*>(*cString) == "C:\\dir");
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
    EXPECT_EACH(made(Abs({"C"})) == "C:\\", made(Abs({"c", "dir", "a b.x"})) == "c:\\dir\\a b.x",
                made(Unc({"\\\\s\\t"})) == "\\\\s\\t\\", made(Unc({"\\\\s\\t", "x"})) == "\\\\s\\t\\x");
    for (const PathRef& path : {Abs({}), Abs({"CC"}), Abs({"1"}), Rel({"C"}), PathRef(), Abs({"C", "con"}),
                                Abs({"C", "lpt9", "x"}), Abs({"C", "a?b"}), Abs({"C", "x."}), Abs({".."})})
        EXPECT_EQ("1", made(path)) << Show(path);
    for (const std::string& text :
         {std::string("C:\\dir\\a\0.txt", 13), std::string("\\\\s\0\\t\\x", 9),
          std::string("\\\\s\\h\\..\\..\\etc\\passwd"), std::string("\\\\s\\h\\..\\x"), std::string("\\\\..\\h\\x"),
          std::string("\\\\s\\..\\x"), std::string("\\\\s\\h?\\x")})
        EXPECT_EQ("1", made(PathRef(text, PathRef::StringDisplay())));
    const auto ofLength = [](size_t length) { return Abs({"C", std::string(length - 3, 'x').c_str()}); };
    EXPECT_EACH(made(ofLength(259)).size() == 259u, made(ofLength(260)) == "1",
                MakeDOSPathName(nullptr, nullptr, 0) == kArgErr);
}

TEST_F(PathText, NamesThatFilesCannotHave) {
    const auto check = [](const char* name) {
        char bad[256] = "#";
        const int32 flags = FileNameChk(PStrOf(name), 0, 0, bad);
        EXPECT_EQ(flags & 2, FileNameChk(PStrOf(name), 0, 1, nullptr));
        return std::to_string(flags) + bad;
    };
    EXPECT_EACH(check("good.txt") == "0", check("") == "2", check("name.") == "32", check("COM1") == "8",
                check("lpt0") == "8", check("COM10") == "0", check("COMX") == "0", check("cLoCk$") == "8",
                check("a:b") == "4:", check("a\"*/:<>?\\|b") == "4\"*/:<>?\\|", check("a|.") == "36|");
}

TEST_F(PathText, Patterns) {
    const struct {
        std::string pattern, fits, doesNot;
    } rows[] = {{"*.txt", "a.txt", "dir\\a.txt"},
                {"**.txt", "a.txt", "a.tx"},
                {"**.txt", "dir\\a.txt", "dir\\a.t"},
                {"a?c", "abc", "a\\c"},
                {"a?c", "a?c", "ac"},
                {"name.", "name", "name.x"},
                {"*.*", "name", "a\\b"},
                {"NAME", "name", "names"},
                {"", "", "a"},
                {"*", "", "a\\b"},
                {"**x", "a\\x", "a\\b"},
                {"a*b*c", "a1b2bc", "a1b2b"},
                {"*\\x", "dir\\X", "x"},
                {"a.b", "A.b", "ab"}};
    const auto size = [](const std::string& text) { return static_cast<int32>(text.size()); };
    for (const auto& [pattern, fits, doesNot] : rows) {
        for (const auto& name : {fits, doesNot}) {
            EXPECT_EQ(name == fits, PathRef::NameWildCardMatch(name, pattern)) << pattern << " " << name;
            EXPECT_EQ(name == fits, FStrFitsPat(pattern.data(), name.data(), size(pattern), size(name)));
        }
    }
    // Many stars on a long name: the work stays bounded.
    EXPECT_FALSE(PathRef::NameWildCardMatch(std::string(2000, 'a'), "*a*a*a*a*a*a*a*a*a*a*a*a*b"));
    int32 position = 0;
    EXPECT_EACH(FMFindWildCardMatchCh("ab*c?", &position, 5, 'x'), position == 2);
    position = 3;
    EXPECT_EACH(FMFindWildCardMatchCh("ab*c?", &position, 5, 'c'), position == 3, !FFindMatchCh("ab*c?", &position, 4),
                FFindMatchCh("abc`", &(position = 0), 4));
}

TEST_F(PathText, AbbreviatedToFit) {
    using Paths = std::list<PathRef>;
    const struct {
        Paths paths;
        uint32 maximum;
        std::vector<std::string> texts;
    } rows[] = {{{Abs({"C", "a", "one"}), Abs({"C", "b", "two"}), Abs({})}, 20, {"one", "two", ""}},
                {{Abs({"C", "a", "longname"})}, 7, {"...name"}},
                {{Abs({"C", "a", "longname"})}, 3, {""}},
                {{Abs({"C", "a", "x"}), Abs({"C", "b", "X"})}, 20, {"C:\\a\\x", "C:\\b\\X"}},
                {{Abs({"C", "dir", "sub", "x"}), Abs({"C", "x"})}, 14, {"C:\\dir\\sub\\x", "C:\\x"}},
                {{Abs({"C", "dir", "sub", "name"}), Abs({"C", "name"})}, 14, {"...\\sub\\name", "C:\\name"}},
                {{Abs({"C", "dir", "sub", "name"}), Abs({"C", "name"})}, 10, {"...\\name", "C:\\name"}},
                {{Abs({"C", "dir", "sub", "name"}), Abs({"C", "name"})}, 6, {"name", "name"}}};
    for (const auto& row : rows) {
        std::vector<std::string> texts;
        EXPECT_EACH(PathRef::ToAbbreviatedDisplayStrings(row.paths, &texts, PathRef::TrimFromFrontAbbreviationStyle(),
                                                         PathRef::CharCountMeasurementStyle(row.maximum)) == kNoErr,
                    row.texts == texts);
    }
    PathRef::TrimFromFrontAbbreviationStyle forced;
    forced.SetForceFullPathStrings(true);
    std::vector<std::string> texts;
    const PathRef::CharCountMeasurementStyle wide(100);
    EXPECT_EACH(PathRef::ToAbbreviatedDisplayStrings({Abs({"C", "x"})}, &texts, forced, wide) == kNoErr,
                texts.at(0) == "C:\\x", PathRef::ToAbbreviatedDisplayStrings({}, nullptr, forced, wide) == kArgErr,
                PathRef::ToAbbreviatedDisplayStrings({PathRef(PathRef::kNullPath)}, &texts, forced, wide) == kArgErr);
}

}  // namespace
}  // namespace tessel::test
