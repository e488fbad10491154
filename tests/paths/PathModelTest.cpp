// The elements of paths, their names and their relations.
#include "paths/PathLock.h"
#include "paths/PathRefAccess.h"
#include "paths/PathTestSupport.h"
#include "support/Test.h"
#include <tessel/memory/MemoryManager.h>
#include <tessel/paths/PathCachedItem.h>

namespace tessel::test {
namespace {

using PathModel = PathTest;
using Item = PathRef::CachedItem;

TEST_F(PathModel, AppendingStepsUpWhereItCan) {
    EXPECT_EACH(Show(Rel({"a", "..", "b"})) == "rel:b", Show(Rel({".."})) == "rel:^",
                Show(Rel({"..", "..", "a"})) == "rel:^/^/a", Show(Rel({"..", "..", "a", ""})) == "rel:^/^",
                Show(Rel({"a", ".", "b", ""})) == "rel:a",
                Show(Abs({"C", ".."})) == "abs:", Show(Abs({"C", "x"}).Append(Rel({"..", "..", "D"}))) == "abs:D",
                Show(Rel({"a"}).Append(Rel({"..", "..", "b"}))) == "rel:^/b");
    EXPECT_EACH(
        Rel({"..", "..", "a"}).CountUpDir() == 2, CodeOf([] { PathRef(PathRef::kNullPath).Append("a"); }) == kArgErr,
        CodeOf([] { PathRef().Append(".."); }) == kArgErr, CodeOf([] { Abs({"C"}).Append(Abs({"C"})); }) == kArgErr,
        CodeOf([] { Abs({"C"}).Append(PathRef()); }) == kArgErr);
}

TEST_F(PathModel, TheSameNamesAreTheSameElement) {
    const PathRef a = Abs({"C", "dir", "file"}), b = Abs({"C", "dir", "file"}), otherCase = Abs({"C", "Dir", "file"});
    EXPECT_EACH(PathRefAccess::Element(a) == PathRefAccess::Element(b),
                PathRefAccess::Element(a) != PathRefAccess::Element(otherCase),
                a.Equals(otherCase, PathRef::kIgnoreCase), !a.Equals(otherCase, PathRef::kExact),
                !a.Equals(Rel({"C", "dir", "file"}), PathRef::kExact));
    // "ab" and "bR" have the same hash.
    EXPECT_NE(PathRefAccess::Element(Rel({"ab"})), PathRefAccess::Element(Rel({"bR"})));
    const PathRef first = Rel({"ab"}), second = Rel({"bR"});
    EXPECT_EACH(Show(first) == "rel:ab", Show(second) == "rel:bR",
                PathRefAccess::Element(second) == PathRefAccess::Element(Rel({"bR"})));
}

TEST_F(PathModel, NamesByIndex) {
    PathRef path = Abs({"C", "dir", "file"});
    EXPECT_EQ((std::vector<std::string>{"C", "file", "C", "file"}),
              (std::vector<std::string>{path.ItemAt(0), path.ItemAt(-1), path.ItemAt(-3), path.Name()}));
    for (int32 bad : {3, -4, INT32_MAX, INT32_MIN})
        EXPECT_EACH(CodeOf([&] { path.ItemAt(bad); }) == kArgErr, CodeOf([&] { path.Replace(bad, "x"); }) == kArgErr);
    path.Replace(-2, "other");
    EXPECT_EQ("abs:C/other/file", Show(path));
    path.Replace(0, "D");
    EXPECT_EACH(Show(path) == "abs:D/other/file",
                CodeOf([&] { path.Replace(0, static_cast<const char*>(nullptr)); }) == kArgErr);
    const PathRef& same = path;
    path = same;
    EXPECT_EQ("abs:D/other/file", Show(path));
}

TEST_F(PathModel, Comparison) {
    const PathRef notAPath;
    const auto compared = [](const PathRef& a, const PathRef& b) {
        return std::pair(a.Compare(b, PathRef::kExact), a.Compare(b, PathRef::kIgnoreCase));
    };
    const auto both = [](int32 exact, int32 ignoringCase) { return std::pair(exact, ignoringCase); };
    EXPECT_EACH(
        compared(Abs({"a"}), Abs({"a"})) == both(0, 0), compared(Abs({"a", "c", "x"}), Abs({"a", "b"})) == both(2, 2),
        compared(Abs({"a"}), Abs({"a", "b"})) == both(-2, -2), compared(Abs({"a", "b"}), Abs({"a"})) == both(2, 2),
        compared(Unc({"s"}), Abs({"s"})) == both(-1, -1), compared(Rel({"s"}), Abs({"s"})) == both(1, -1),
        compared(PathRef(PathRef::kNullPath), Rel({})) == both(1, -1), compared(notAPath, Abs({})) == both(1, 1),
        compared(Abs({}), notAPath) == both(-1, -1), compared(notAPath, notAPath) == both(0, 0));
    EXPECT_EACH(Rel({}).Compare(Unc({"s"}), PathRef::kIgnoreCase3) == 1,
                PathRef::NameEquals("a", "A", static_cast<PathRef::ComparePolicy>(9)),
                reports_.Has(2, "Unexpected PathRef::ComparePolicy"),
                PathRef::NameCompare("B", "a", PathRef::kExact) == -1,
                PathRef::NameCompare("B", "a", PathRef::kIgnoreCase) == 1);
}

TEST_F(PathModel, Relations) {
    const PathRef abc = Abs({"a", "b", "c"});
    EXPECT_EACH(Show(abc.GetRelativePathFromThisToThat(Abs({"A", "d"}), PathRef::kIgnoreCase)) == "rel:^/^/d",
                Show(abc.GetRelativePathFromThisToThat(abc, PathRef::kExact)) == "rel:",
                Show(abc.GetRelativePathFromThisToThat(Rel({"a"}), PathRef::kExact)) == "not",
                CodeOf([&] { abc.GetRelativePathFromThisToThat(PathRef(), PathRef::kExact); }) == kArgErr,
                Show(abc.GetInCommonWith(Abs({"a", "B", "c"}), PathRef::kExact)) == "abs:a",
                Show(abc.GetInCommonWith(Abs({"a", "B", "c", "d"}), PathRef::kIgnoreCase)) == "abs:a/b/c",
                Show(abc.GetInCommonWith(Rel({"a"}), PathRef::kExact)) == "not",
                Show(abc.GetParentDirectory()) == "abs:a/b", Show(Abs({}).GetParentDirectory()) == "not",
                Show(Rel({"..", ".."}).GetParentDirectory()) == "rel:^", Show(abc.Volume()) == "abs:a",
                CodeOf([] { Abs({}).Volume(); }) == kArgErr, abc.StartsWith(Abs({"A"}), PathRef::kIgnoreCase),
                !abc.StartsWith(Abs({"A"}), PathRef::kExact), !abc.StartsWith(Rel({"a"}), PathRef::kExact),
                Abs({"a"}).IsParentDirectoryOf(abc, PathRef::kExact), !abc.IsParentDirectoryOf(abc, PathRef::kExact));
}

TEST_F(PathModel, Rebase) {
    PathRef path = Abs({"a", "b", "c"});
    EXPECT_EACH(!path.Rebase(Abs({"b"}), Unc({"s"}), PathRef::kExact),
                !path.Rebase(Abs({}), Unc({"s"}), PathRef::kExact), Show(path) == "abs:a/b/c",
                path.Rebase(Abs({"A"}), Unc({"s", "t"}), PathRef::kIgnoreCase), Show(path) == "unc:s/t/b/c");
    path = Rel({"..", "..", "c"});  // what steps up behind a name removes it
    EXPECT_EACH(path.Rebase(Rel({".."}), Abs({"C", "x", "y"}), PathRef::kExact), Show(path) == "abs:C/x/c");
    path = Rel({"..", "..", "c"});
    path.Replace(0, "x");
    EXPECT_EQ("rel:c", Show(path));
}

class AtName final : public PathRef::SplitCriteria {
public:
    AtName(std::string name, int32 action) : name_(std::move(name)), action_(action) {}
    int32 Decide(const PathRef&, int32, const std::string& name) const override {
        return name == name_ ? action_ : int32{kContinue};
    }

private:
    std::string name_;
    int32 action_;
};

TEST_F(PathModel, Splitting) {
    const struct {
        const char* name;
        int32 action;
        PathRef::SplitDirection direction;
        bool split;
        const char *head, *tail;
    } rows[] = {{"b", 3, PathRef::kFromFirst, true, "abs:a", "rel:b/c/b"},
                {"b", 2, PathRef::kFromFirst, true, "abs:a/b", "rel:c/b"},
                {"b", 1, PathRef::kFromFirst, true, "abs:a", "rel:c/b"},
                {"b", 1, PathRef::kFromLast, true, "abs:a/b/c", "rel:"},
                {"a", 3, PathRef::kFromFirst, true, "abs:", "rel:a/b/c/b"},
                {"b", 7, PathRef::kFromFirst, true, "abs:a", "rel:c/b"},
                {"x", 1, PathRef::kFromFirst, false, "not", "not"}};
    for (const auto& row : rows) {
        const PathRef path = Abs({"a", "b", "c", "b"});
        PathRef head, tail;
        EXPECT_EACH(row.split == path.SplitOn(AtName(row.name, row.action), &head, &tail, row.direction),
                    row.head == Show(head), row.tail == Show(tail));
    }
    EXPECT_EACH(reports_.Count() == 1u, reports_.Has(2, "Illegal action"));
    PathRef path = Abs({"a", "b"});
    EXPECT_EACH(path.SplitOn(AtName("b", 3), nullptr, &path, PathRef::kFromFirst), Show(path) == "rel:b");
}

TEST_F(PathModel, Extensions) {
    PathRef path = Abs({"C", "archive.tar.gz"});
    EXPECT_EACH(path.GetExtension() == "gz", path.Extension() == "gz");
    path.RemoveExtension();
    EXPECT_EQ("abs:C/archive.tar", Show(path));
    path = Rel({"readme"});
    EXPECT_EQ("", path.GetExtension());
    path.RemoveExtension();
    path.AppendExtension("txt");
    EXPECT_EACH(Show(path) == "rel:readme.txt", CodeOf([] { Abs({}).GetExtension(); }) == kArgErr);

    const _FMFileType kText = TESSEL_FOURCC('T', 'E', 'X', 'T'), kData = TESSEL_FOURCC('D', 'A', 'T', 'A');
    const auto list = [](std::initializer_list<PathRef::ExtensionEntry> entries) {
        UHandle handle = DSNewHandle(static_cast<uint32>(4 + entries.size() * sizeof(PathRef::ExtensionEntry)));
        const int32 count = static_cast<int32>(entries.size());
        std::memcpy(*handle, &count, 4);
        std::copy(entries.begin(), entries.end(), reinterpret_cast<PathRef::ExtensionEntry*>(*handle + 4));
        return (const PathRef::ExtensionList**)handle;
    };
    PathRef::SetExtensionList(list({{kText, "txt"}}), list({{kData, "dat"}, {kData, "txt"}}));
    EXPECT_EACH(PathRef::NameGetExtensionType("a.TXT") == kText, PathRef::NameGetExtensionType("a.b.dat") == kData,
                PathRef::NameGetExtensionType("dat") == 0u, PathRef::NameHasExtension("x.Dat", kData),
                !PathRef::NameHasExtension("x.dat", kText));
    path = Rel({"x"});
    path.AppendExtension(kData);
    EXPECT_EACH(Show(path) == "rel:x.dat",
                CodeOf([&] { path.AppendExtension(TESSEL_FOURCC('N', 'O', 'N', 'E')); }) == kArgErr);
    PathRef::SetExtensionList(list({}), nullptr);
    EXPECT_EACH(reports_.Has(2, "The extension lists should only be set once"),
                PathRef::NameGetExtensionType("a.txt") == 0u);
}

TEST_F(PathModel, StandardLocations) {
    const PathRef temp = Abs({"C", "tmp"});
    EXPECT_EACH(temp.AssignToName("os_temp") == kNoErr, Abs({"D"}).AssignToName("os_temp") == kArgErr,
                Show(PathRef("os_temp")) == "abs:C/tmp", CodeOf([] { PathRef("os_nowhere"); }) == kArgErr);
}

TEST_F(PathModel, Sanity) {
    const PathRef path = Unc({"s", "x"}), one = Abs({"aq"}), ofSameHash = Abs({"ba"});
    EXPECT_EACH(path.IsSane(false), one.IsSane(false), ofSameHash.IsSane(false), PathRef().IsSane(false),
                !Unc({}).IsValid(), !Unc({}).IsSane(false),
                (std::vector<std::string>{"PathRef is not valid"}) == reports_.Texts());
    PathRef wild;
    alignas(PathItemElement) static char noElement[sizeof(PathItemElement)];
    auto* element = reinterpret_cast<PathItemElement*>(noElement);
    std::memcpy(static_cast<void*>(&wild), &element, sizeof element);
    EXPECT_EACH(!wild.IsSane(true), reports_.Has(3, "mPathElement not in storage"));
    std::memset(static_cast<void*>(&wild), 0, sizeof wild);
    PathRef deep = Rel({});
    while (deep.ItemCount() < 511) deep.Append("x");
    EXPECT_EACH(deep.IsSane(false), reports_.CountAt(2) == 0u, deep.Append("x").IsSane(false),
                reports_.Reports().back().level == 2);
}

// Eight threads make, copy and drop the same few paths, and cache on one: an element is made once, and ends with its
// last user.
TEST_F(PathModel, ThreadsShareElements) {
    const PathRef shared = Rel({"shared"});
    const auto work = [&](uint32 seed) {
        std::vector<PathRef> kept(16);
        for (int i = 0; i < 4000; ++i) {
            seed = seed * 1664525 + 1013904223;
            PathRef path(PathRef::kAbsolute);
            for (uint32 depth = 0; depth < 1 + (seed >> 8) % 4; ++depth)
                path.Append(std::string(1, static_cast<char>('a' + (seed >> (10 + 2 * depth)) % 3)));
            const PathRef copy(path);
            ASSERT_EQ(0, copy.Compare(path, PathRef::kExact));
            std::string text;
            ASSERT_EQ(kNoErr, copy.ConvertToString(&text, PathRef::StringUnix()));
            ASSERT_EQ(static_cast<size_t>(copy.ItemCount() * 2), text.size());
            shared.Cache("key", new PathRef::CachedPath(1000, Item::kDependsOnFile, Abs({"C", "y"})));
            {
                const PathRef::CacheLock lock;
                const Item* item = shared.GetCachedProxy("key", "CachedPath", PathRef::kSearchHere);
                ASSERT_TRUE(!item || Show(static_cast<const PathRef::CachedPath*>(item)->Get()) == "abs:C/y");
            }
            shared.FlushCache();
            kept[(seed >> 20) % kept.size()] = copy;
            ASSERT_TRUE(i % 64 != 0 || copy.IsSane(false));
        }
    };
    std::vector<std::thread> threads;
    for (uint32 i = 0; i < 8; ++i) threads.emplace_back(work, i);
    for (std::thread& thread : threads) thread.join();
    EXPECT_EQ(0u, reports_.Count());
    PathLock lock;
    EXPECT_EQ(0, PathRefAccess::Element(Abs({}))->ChildCount());
}

}  // namespace
}  // namespace tessel::test
