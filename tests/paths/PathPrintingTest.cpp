// What the strings do with paths: "%z", and lists compared as file names.
#include "paths/PathTestSupport.h"
#include "support/Test.h"
#include <tessel/strings/CPStrList.h>
#include <tessel/strings/StringFmtPrint.h>

namespace tessel::test {
namespace {

class PathPrinting : public PathTest {
protected:
    static std::string Printed(const PathRef* path) {
        char text[600];
        const int32 length = SNPrintf(text, sizeof text, "[%z]", path);
        EXPECT_EQ(length, SNPrintf(nullptr, 0, "[%20.1z]", path));  // neither width nor precision
        return text;
    }
};

TEST_F(PathPrinting, PrintsDisplayText) {
    const PathRef path = Abs({"C", "dir", "file.txt"});
    EXPECT_EACH(Printed(&path) == "[C:\\dir\\file.txt]", Printed(nullptr) == "[NULL]");

    const std::string name(248, 'n');
    const PathRef fits = Abs({"C", name.c_str(), "x"});  // C:\ name \x: 253 bytes are too long
    FSetPathTooLongString(PStrOf("<too long>"));
    EXPECT_EQ("[<too long>]", Printed(&fits));
    const PathRef longest = Abs({"C", name.c_str() + 1, "x"});
    EXPECT_EQ("[C:\\" + name.substr(1) + "\\x]", Printed(&longest));
    FSetPathTooLongString(PStrOf(""));
}

TEST_F(PathPrinting, ListsCompareAsFileNames) {
    CPStrList a, b;
    for (const char* name : {"Dir", "FILE"}) EXPECT_EQ(kNoErr, a.Insert(PStrOf(name), -1));
    for (const char* name : {"dir", "file"}) EXPECT_EQ(kNoErr, b.Insert(PStrOf(name), -1));
    EXPECT_EACH(a.EqualFS(b), !a.Equal(b), b.Insert(PStrOf("more"), -1) == kNoErr, !a.EqualFS(b), a.EqualNEltsFS(b, 2),
                !a.EqualNEltsFS(b, 3), a.EqualNEltsFS(CPStrList(), 0));
}

}  // namespace
}  // namespace tessel::test
