// The flat interface: what it accepts, and what it answers for null and for bad paths.
#include "paths/PathTestSupport.h"
#include "support/Test.h"
#include <tessel/memory/MemoryManager.h>

namespace tessel::test {
namespace {

class PathManagerFlat : public PathTest {
protected:
    static constexpr ConstPStr kEnd = nullptr;
    PathRef abs_ = Abs({"C", "dir"}), rel_ = Rel({"..", "x"}), none_, null_{PathRef::kNullPath};
    PathRef bareUnc_{PathRef::kUNC};
};

TEST_F(PathManagerFlat, Making) {
    Path path = FMakePath(nullptr, kPathUNC, PStrOf("s"), static_cast<ConstPStr>(PStrOf("x")), kEnd);
    EXPECT_EQ("unc:s/x", Show(path));
    EXPECT_EQ(path, FMakePath(path, 0x10000 + kPathRelative, PStrOf(".."), kEnd));  // 16 bits count
    EXPECT_EQ("rel:^", Show(path));
    EXPECT_EACH(
        FMakePath(nullptr, 4, PStrOf("x"), kEnd) == nullptr, FMakePath(&bareUnc_, 0, PStrOf("x"), kEnd) == nullptr,
        FMakePath(nullptr, kPathNotAPath, PStrOf("x"), kEnd) == nullptr, path == FMakePath(path, kPathNotAPath, kEnd),
        Show(path) == "not", Show(FEmptyPath(path)) == "abs:", Show(FNotAPath(path)) == "not",
        FAppendName(path, PStrOf("x")) == kArgErr, FAppendName(&abs_, PStrOf("")) == kArgErr,
        FAppendName(&abs_, nullptr) == kArgErr, Show(FAppendName(&rel_, PStrOf("")), rel_) == "rel:^");
    Path copy = path;
    EXPECT_EACH(FPathCpy(path, &abs_) == kNoErr, FPathToPath(&copy) == kNoErr, path != copy, Show(copy) == "abs:C/dir",
                FPathCpy(path, nullptr) == kArgErr);
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
    EXPECT_EACH(PathType(&bareUnc_) == kPathUNC, FIsAPathOfType(&bareUnc_, kPathUNC), !FIsAPathOfType(&abs_, 4));
}

TEST_F(PathManagerFlat, NamesAreCopiedWhole) {
    Str255 name;
    const auto read = [&](MgErr err) { return err ? "error " + std::to_string(err) : TextOf(name); };
    EXPECT_EACH(read(FNamePtr(&abs_, name)) == "dir", read(FPathComponent(&rel_, 0, name)) == "",
                name == PathCopyElt(&abs_, -2, name), TextOf(name) == "C", PathCopyElt(&abs_, -3, name) == nullptr,
                name[0] == 0, PathCopyName(&none_, name) == nullptr);
    PathRef tooLong = Rel({std::string(256, 'x').c_str()});
    EXPECT_EQ(kArgErr, FNamePtr(&tooLong, name));
    UHandle handle = DSNewHandle(0);
    EXPECT_EACH(FName(&abs_, handle) == kNoErr, DSGetHandleSize(handle) == 4u, TextOf(*handle) == "dir");
    DSDisposeHandle(handle);
    EXPECT_EACH(PathReplaceElt(&abs_, PStrOf("D"), 0) == kNoErr, Show(&abs_) == "abs:D/dir");
    for (auto [file, extension] : {std::pair{"a.tar.gz", ".gz"}, {"noext", ""}, {".profile", ""}, {"x.", "."}}) {
        char out[16] = "#";
        FGetFileExtension(file, out);
        EXPECT_STREQ(extension, out);
    }
}

TEST_F(PathManagerFlat, Types) {
    EXPECT_EACH(Show(FSetPathType(&abs_, kPathRelative), abs_) == "rel:C/dir",
                Show(FSetPathType(&abs_, kPathUNC), abs_) == "unc:C/dir", FSetPathType(&abs_, kPathNotAPath) == kArgErr,
                FSetPathType(&abs_, 4) == kArgErr, FSetPathType(&none_, kPathAbsolute) == kArgErr);
    PathRef slashes = Abs({"\\\\srv\\share", "x"});
    EXPECT_EACH(Show(FNormalizePath(&slashes), slashes) == "unc:\\\\srv\\share/x", FNormalizePath(nullptr) == kArgErr,
                reports_.Count() == 0u);
}

TEST_F(PathManagerFlat, Comparing) {
    PathRef ab = Abs({"a", "b"}), AB = Abs({"A", "B"}), ac = Abs({"a", "c"}), xb = Abs({"x", "q", "b"}), bare = Abs({});
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
    EXPECT_EACH(FileNameEqual(PStrOf("Name"), PStrOf("nAME")), !FileNameEqual(PStrOf("Name"), PStrOf("Names")),
                FileNameNEqual(PStrOf("Name1"), PStrOf("nAME2"), 4), !FileNameNEqual(PStrOf("Na"), PStrOf("nAME2"), 4),
                FileNameCStrEqual("Name", "nAME"));
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
    EXPECT_EACH(FAddPath(&abs_, &rel_, nullptr) == kArgErr, Show(FAddPath(&abs_, &rel_, &abs_), abs_) == "abs:C/x");
    PathRef other = Abs({"c", "y"}), result, unc = Unc({"s"}), otherUnc = Unc({"t"});
    EXPECT_EACH(Show(FRelPath(&abs_, &other, &result), result) == "rel:^/y",
                Show(FVolName(&abs_, &result), result) == "abs:C", Show(FCommonPath(&abs_, &other), abs_) == "abs:C",
                Show(FCommonPath(&unc, &otherUnc), unc) == "abs:", FCommonPath(nullptr, &unc) == kArgErr);
}

TEST_F(PathManagerFlat, TheTextsOfTheHostAreTwoPairs) {
    PathRef::SetPathTooLongString("class");
    FSetPathTooLongString(PStrOf("flat"));
    Str255 text;
    FGetPathTooLongString(text);
    EXPECT_EACH(TextOf(text) == "flat", PathRef::GetPathTooLongString() == "class");
    FGetNotAPathString(text);
    EXPECT_EQ("", TextOf(text));
    FSetPathTooLongString(PStrOf(""));
    PathRef::SetPathTooLongString("");
}

}  // namespace
}  // namespace tessel::test
