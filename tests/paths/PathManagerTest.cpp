// The flat interface: what it accepts, and what it answers for null and for bad paths.
#include "paths/PathTestSupport.h"
#include <tessel/memory/MemoryManager.h>

namespace tessel {
namespace {

using namespace test;

class PathManagerFlat : public PathTest {
protected:
    static constexpr ConstPStr kEnd = nullptr;
    PathRef abs_ = Abs({"C", "dir"});
    PathRef rel_ = Rel({"..", "x"});
    PathRef none_;
    PathRef null_{PathRef::kNullPath};
    PathRef bareUnc_{PathRef::kUNC};
};

TEST_F(PathManagerFlat, Making) {
    Path path = FMakePath(nullptr, kPathUNC, PStrOf("s"), static_cast<ConstPStr>(PStrOf("x")), kEnd);
    EXPECT_EQ("unc:s/x", Show(path));
    EXPECT_EQ(path, FMakePath(path, 0x10000 + kPathRelative, PStrOf(".."), kEnd));  // 16 bits count
    EXPECT_EQ("rel:^", Show(path));
    EXPECT_EQ(nullptr, FMakePath(nullptr, 4, PStrOf("x"), kEnd));
    EXPECT_EQ(nullptr, FMakePath(&bareUnc_, 0, PStrOf("x"), kEnd));
    EXPECT_EQ(nullptr, FMakePath(nullptr, kPathNotAPath, PStrOf("x"), kEnd));
    EXPECT_EQ(path, FMakePath(path, kPathNotAPath, kEnd));
    EXPECT_EQ("not", Show(path));
    EXPECT_EQ("abs:", Show(FEmptyPath(path)));
    EXPECT_EQ("not", Show(FNotAPath(path)));
    EXPECT_EQ(kArgErr, FAppendName(path, PStrOf("x")));
    EXPECT_EQ(kArgErr, FAppendName(&abs_, PStrOf("")));
    EXPECT_EQ(kArgErr, FAppendName(&abs_, nullptr));
    EXPECT_EQ("rel:^", Show(FAppendName(&rel_, PStrOf("")), rel_));
    Path copy = path;
    EXPECT_EQ(kNoErr, FPathCpy(path, &abs_));
    EXPECT_EQ(kNoErr, FPathToPath(&copy));
    EXPECT_NE(path, copy);
    EXPECT_EQ("abs:C/dir", Show(copy));
    EXPECT_EQ(kArgErr, FPathCpy(path, nullptr));
    FDestroyPath(&path);
    EXPECT_EQ(nullptr, path);
    FDestroyPath(&path);
    EXPECT_EQ(0u, reports_.Count());
    FDestroyPath(nullptr);
    FDisposePath(copy);
    EXPECT_EQ((std::vector<std::string>{"This is a noop.",
                                        "FDisposePath is deprecated within OV code; use FDestroyPath instead."}),
              reports_.Texts(2));
}

TEST_F(PathManagerFlat, Inspecting) {
    PathRef bareAbs = Abs({});
    // Error and type; path, path or not-a-path, absolute, empty, with a step up; depth and count; size in PathRefs.
    const std::pair<Path, std::vector<int32>> rows[] = {
        {nullptr, {1, 2, 0, 0, 0, 0, 0, -1, 0, 0}},   {&abs_, {0, 0, 1, 1, 1, 0, 0, 2, 2, 1}},
        {&rel_, {0, 1, 1, 1, 0, 0, 1, 2, 2, 1}},      {&none_, {0, 2, 0, 1, 0, 0, 0, -1, 0, 1}},
        {&bareUnc_, {1, 2, 1, 0, 0, 1, 0, -1, 0, 1}}, {&null_, {1, 2, 1, 0, 0, 1, 0, -1, 0, 1}},
        {&bareAbs, {0, 0, 1, 1, 1, 1, 0, 0, 0, 1}}};
    for (const auto& [path, expected] : rows) {
        int32 type = 99;
        const MgErr err = FGetPathType(path, &type);
        EXPECT_EQ(expected, (std::vector<int32>{err, type, FIsAPath(path), FIsAPathOrNotAPath(path), FIsAbsPath(path),
                                                FIsEmptyPath(path), FIsCDUp(path), FDepth(path), PathCnt(path),
                                                static_cast<int32>(PathSize(path) / sizeof(PathRef))}))
            << Show(path);
    }
    EXPECT_EQ(kPathUNC, PathType(&bareUnc_));
    EXPECT_TRUE(FIsAPathOfType(&bareUnc_, kPathUNC));
    EXPECT_FALSE(FIsAPathOfType(&abs_, 4));
}

TEST_F(PathManagerFlat, NamesAreCopiedWhole) {
    Str255 name;
    const auto read = [&](MgErr err) { return err ? "error " + std::to_string(err) : TextOf(name); };
    EXPECT_EQ("dir", read(FNamePtr(&abs_, name)));
    EXPECT_EQ("", read(FPathComponent(&rel_, 0, name)));
    EXPECT_EQ(name, PathCopyElt(&abs_, -2, name));
    EXPECT_EQ("C", TextOf(name));
    EXPECT_EQ(nullptr, PathCopyElt(&abs_, -3, name));
    EXPECT_EQ(0, name[0]);
    EXPECT_EQ(nullptr, PathCopyName(&none_, name));
    PathRef tooLong = Rel({std::string(256, 'x').c_str()});
    EXPECT_EQ(kArgErr, FNamePtr(&tooLong, name));
    UHandle handle = DSNewHandle(0);
    EXPECT_EQ(kNoErr, FName(&abs_, handle));
    EXPECT_EQ(4u, DSGetHandleSize(handle));
    EXPECT_EQ("dir", TextOf(*handle));
    DSDisposeHandle(handle);
    EXPECT_EQ(kNoErr, PathReplaceElt(&abs_, PStrOf("D"), 0));
    EXPECT_EQ("abs:D/dir", Show(&abs_));
    for (auto [file, extension] : {std::pair{"a.tar.gz", ".gz"}, {"noext", ""}, {".profile", ""}, {"x.", "."}}) {
        char out[16] = "#";
        FGetFileExtension(file, out);
        EXPECT_STREQ(extension, out);
    }
}

TEST_F(PathManagerFlat, Types) {
    EXPECT_EQ("rel:C/dir", Show(FSetPathType(&abs_, kPathRelative), abs_));
    EXPECT_EQ("unc:C/dir", Show(FSetPathType(&abs_, kPathUNC), abs_));
    EXPECT_EQ(kArgErr, FSetPathType(&abs_, kPathNotAPath));
    EXPECT_EQ(kArgErr, FSetPathType(&abs_, 4));
    EXPECT_EQ(kArgErr, FSetPathType(&none_, kPathAbsolute));
    PathRef slashes = Abs({"\\\\srv\\share", "x"});
    EXPECT_EQ("unc:\\\\srv\\share/x", Show(FNormalizePath(&slashes), slashes));
    EXPECT_EQ(kArgErr, FNormalizePath(nullptr));
    EXPECT_EQ(0u, reports_.Count());
}

TEST_F(PathManagerFlat, Comparing) {
    PathRef ab = Abs({"a", "b"}), AB = Abs({"A", "B"}), ac = Abs({"a", "c"}), xb = Abs({"x", "q", "b"});
    PathRef bare = Abs({});
    const struct {
        Path a, b;
        std::vector<int32> equalExactLexicalCmpTail;
    } rows[] = {{&ab, &AB, {1, 1, 0, 0, 0}},        {&ab, &ac, {0, -2, -2, 2, 1}},
                {&ac, &ab, {0, 2, 2, 2, 1}},        {&ab, &rel_, {0, -1, -1, -1, -1}},
                {&bare, &ab, {0, -2, -2, -1, 1}},   {&ab, &bare, {0, 2, 2, 1, 1}},
                {&AB, &xb, {0, -1, -1, 1, 2}},      {&ab, nullptr, {0, 1, -1, -1, -1}},
                {nullptr, &ab, {0, -1, 1, -1, -1}}, {nullptr, nullptr, {1, 0, 0, 0, 0}}};
    for (const auto& [a, b, expected] : rows)
        EXPECT_EQ(expected, (std::vector<int32>{FPathEqual(a, b), FPathCmpExact(a, b), FPathCmpLexical(a, b),
                                                FPathCmp(a, b), FPathMatchingTailCount(a, b)}))
            << Show(a) << " " << Show(b);
    EXPECT_TRUE(FileNameEqual(PStrOf("Name"), PStrOf("nAME")));
    EXPECT_FALSE(FileNameEqual(PStrOf("Name"), PStrOf("Names")));
    EXPECT_TRUE(FileNameNEqual(PStrOf("Name1"), PStrOf("nAME2"), 4));
    EXPECT_FALSE(FileNameNEqual(PStrOf("Na"), PStrOf("nAME2"), 4));
    EXPECT_TRUE(FileNameCStrEqual("Name", "nAME"));
}

TEST_F(PathManagerFlat, Combining) {
    const struct {
        PathRef base, rel;
        const char* result;
    } rows[] = {{Abs({"a", "b"}), Rel({"..", "c"}), "abs:a/c"},
                {Abs({}), Unc({"s"}), "unc:s"},
                {Abs({"a"}), Abs({"b"}), "error 1"},
                {Abs({"a"}), Rel({}), "abs:a"},
                {Abs({"a"}), Rel({"..", "..", "b"}), "rel:^/b"},
                {Rel({".."}), Rel({"..", "b"}), "rel:^/^/b"},
                {Rel({}), Rel({"\\\\s\\t", "x"}), "unc:\\\\s\\t/x"}};
    for (const auto& row : rows) {
        PathRef base(row.base), rel(row.rel), result;
        EXPECT_EQ(row.result, Show(FAddPath(&base, &rel, &result), result)) << Show(base) << Show(rel);
    }
    EXPECT_EQ(kArgErr, FAddPath(&abs_, &rel_, nullptr));
    EXPECT_EQ("abs:C/x", Show(FAddPath(&abs_, &rel_, &abs_), abs_));
    PathRef other = Abs({"c", "y"}), result, unc = Unc({"s"}), otherUnc = Unc({"t"});
    EXPECT_EQ("rel:^/y", Show(FRelPath(&abs_, &other, &result), result));
    EXPECT_EQ("abs:C", Show(FVolName(&abs_, &result), result));
    EXPECT_EQ("abs:C", Show(FCommonPath(&abs_, &other), abs_));
    EXPECT_EQ("abs:", Show(FCommonPath(&unc, &otherUnc), unc));
    EXPECT_EQ(kArgErr, FCommonPath(nullptr, &unc));
}

TEST_F(PathManagerFlat, TheTextsOfTheHostAreTwoPairs) {
    PathRef::SetPathTooLongString("class");
    FSetPathTooLongString(PStrOf("flat"));
    Str255 text;
    FGetPathTooLongString(text);
    EXPECT_EQ("flat", TextOf(text));
    EXPECT_EQ("class", PathRef::GetPathTooLongString());
    FGetNotAPathString(text);
    EXPECT_EQ("", TextOf(text));
    FSetPathTooLongString(PStrOf(""));
    PathRef::SetPathTooLongString("");
}

}  // namespace
}  // namespace tessel
