// Cached attributes; the start and stop of paths, and what they leave behind.
#include "paths/PathRefAccess.h"
#include "paths/PathTestSupport.h"
#include "support/HandClock.h"
#include "support/Test.h"
#include <tessel/paths/PathCachedItem.h>

namespace tessel::test {
namespace {

using Item = PathRef::CachedItem;

// Counts those that live.
class CountedItem final : public PathRef::CachedInt32 {
public:
    CountedItem(uint32 lifetime, RelationToMetaData relation, int32 value, int& living)
        : CachedInt32(lifetime, relation, value), living_(living) {
        ++living_;
    }
    ~CountedItem() override { --living_; }
    void Attached() override { attached = true; }
    bool attached = false;

private:
    int& living_;
};

class PathCache : public PathTest {
protected:
    int32 Found(const PathRef& path, const char* key, PathRef::SearchDirection direction = PathRef::kSearchHere,
                PathItemElement** at = nullptr) {
        const PathRef::CacheLock lock;
        const Item* item = path.GetCachedProxy(key, "CachedInt32", direction, at);
        return item ? static_cast<const PathRef::CachedInt32*>(item)->Get() : -1;
    }
    Item* New(int32 value, Item::RelationToMetaData relation = Item::kIndependent, uint32 lifetime = 1000) {
        return new CountedItem(lifetime, relation, value, living_);
    }

    HandClock clock_{0xFFFFFF00u};  // the tick wraps during the tests
    int living_ = 0;
};

TEST_F(PathCache, ItemsBelongToTheElement) {
    {
        const PathRef path = Abs({"C", "x"});
        auto* item = New(1);
        EXPECT_EACH(path.Cache("key", item) == kNoErr, static_cast<CountedItem*>(item)->attached,
                    Found(Abs({"C", "x"}), "key") == 1, Found(Abs({"C", "X"}), "key") == -1, Found(path, "other") == -1,
                    path.GetCachedProxy("key", "CachedBool", PathRef::kSearchHere) == nullptr,
                    path.GetCachedProxy("key", "CachedItem", PathRef::kSearchHere) != nullptr,
                    path.Cache("key", New(2)) == kNoErr, Found(path, "key") == 2, living_ == 1,
                    path.Cache("gone", New(3)) == kNoErr, path.Cache("gone", nullptr) == kNoErr,
                    Found(path, "gone") == -1, PathRef().Cache("key", New(4)) == kArgErr, living_ == 1);
    }
    EXPECT_EQ(0, living_);  // with the last path there
}

TEST_F(PathCache, SearchDirections) {
    const PathRef a = Abs({"a"}), abc = Abs({"a", "b", "c"});
    a.Cache("up", New(1));
    abc.Cache("down", New(2));
    PathItemElement* at = nullptr;
    EXPECT_EACH(Found(abc, "up", PathRef::kSearchUp, &at) == 1, PathRefAccess::Element(a) == at,
                Found(abc, "up", PathRef::kSearchHere, &at) == -1, at == nullptr,
                Found(Abs({}), "down", PathRef::kSearchDown, &at) == 2, PathRefAccess::Element(abc) == at,
                Found(a, "down", PathRef::kSearchUp) == -1);
}

TEST_F(PathCache, ExpiryAndFlushing) {
    PathRef path = Abs({"C", "x"});
    path.Cache("file", New(1, Item::kDependsOnFile, 1000));
    path.Cache("short", New(2, Item::kIndependent, 300));
    path.Cache("long", New(3, Item::kIndependent, 1000));
    clock_.Advance(299);
    EXPECT_EQ(2, Found(path, "short"));
    clock_.Advance(1);
    EXPECT_EACH(Found(path, "short") == -1, living_ == 3, 2 * sizeof(PathRef::CachedInt32) == path.FlushCache(),
                living_ == 1, Found(path, "file") == -1, Found(path, "long") == 3, FShrinkPath(&path) == 0u);
    PathRef::CachedBool item(10, Item::kIndependent, true);
    clock_.Advance(25);
    EXPECT_EACH(item.Expired(), item.Rotten() == 15u);
    item.ResetBool(10, false);
    EXPECT_FALSE(item.Expired() || item.Get() || item.Invalidate());
    EXPECT_EQ(0u, item.Rotten());
}

// Asks another thread for a path in everything that it does, which hangs where the lock is held.
class WaitingItem final : public Item {
public:
    WaitingItem(uint32& calls) : CachedItem(1000, kDependsOnFile), calls_(calls) {}
    ~WaitingItem() override { Wait(1); }
    bool IsA(const char* name) const override { return Wait(2) && CachedItem::IsA(name); }
    bool Expired() const override { return Wait(4) && CachedItem::Expired(); }
    bool Invalidate() const override { return Wait(8) && CachedItem::Invalidate(); }
    uint32 Size() const override { return Wait(16) ? 5 : 0; }
    void Attached() override { Wait(32); }

private:
    bool Wait(uint32 call) const {
        std::thread([] { Abs({"C", "other"}).FlushCache(); }).join();
        calls_ |= call;
        return true;
    }
    uint32& calls_;
};

TEST_F(PathCache, ItemsAreAskedWithoutALock) {
    uint32 calls = 0;
    const PathRef path = Abs({"C", "x"});
    for (const char* key : {"replaced", "replaced", "flushed"}) path.Cache(key, new WaitingItem(calls));
    for (const auto direction : {PathRef::kSearchHere, PathRef::kSearchUp, PathRef::kSearchDown})
        EXPECT_NE(nullptr, path.GetCachedProxy("flushed", "CachedItem", direction));
    EXPECT_EACH(path.FlushCache() == 10u, calls == 63u);
    Abs({"C", "y"}).Cache("key", new WaitingItem(calls = 0));
    EXPECT_EQ(33u, calls);
}

TEST_F(PathCache, LifetimesAreAtMostHalfTheClock) {
    for (uint32 lifetime : {0x7FFFFFFFu, 0x80000000u, 0xFFFFFFFFu}) {
        PathRef::CachedBool item(lifetime, Item::kIndependent, true);
        EXPECT_FALSE(item.Expired());
        clock_.Advance(0x7FFFFFFE);
        EXPECT_FALSE(item.Expired());
        clock_.Advance(1);
        EXPECT_TRUE(item.Expired());
    }
}

// The text of a path is remembered on its element, and outlives a flush.
TEST_F(PathCache, TextsAreRemembered) {
    const PathRef path = Abs({"C", "x"});
    std::string text;
    path.ConvertToString(&text, PathRef::StringDisplay());
    path.FlushCache();
    const PathRef::CacheLock lock;
    const Item* item = path.GetCachedProxy("internal_display", "CachedPathString", PathRef::kSearchHere);
    ASSERT_NE(nullptr, item);
    EXPECT_EACH(static_cast<const PathRef::CachedPathString*>(item)->Get() == "C:\\x",
                path.GetCachedProxy("internal_unix", "CachedItem", PathRef::kSearchHere) == nullptr);
}

// ---- start and stop -------------------------------------------------------------------------------------------------

TEST_F(PathCache, LeakedPathsAreReported) {
    Path leaked = nullptr;
    Abs({"C", "left"}).ConvertToPath(&leaked);
    EXPECT_EACH(PathManagerStop() == kNoErr,
                reports_.Has(3, "We got 1 more Path Leaks than we see from a basic launch and quit.\n"),
                reports_.Has(2, "Possible path leak, unable to purge elements of base #0"),
                reports_.Has(2, "Killing a storage buffer with 3 live object(s)"), reports_.Has(2, "name= left"));
    reports_.Clear();
    EXPECT_EACH(PathRefAccess::Element(PathRef::NotAPath()) == nullptr,
                reports_.Has(2, "Call to GetNotAPath before PathRef::Init() or after PathRef::Uninit()?"));
    // A path that outlives a restart is no good, and does no harm.
    EXPECT_EACH(PathManagerStart() == kNoErr, !FIsAPathOrNotAPath(leaked));
    const PathRef again = Abs({"C", "left"});
    EXPECT_NE(PathRefAccess::Element(*leaked), PathRefAccess::Element(again));
    FDestroyPath(&leaked);
}

TEST_F(PathCache, CachedPathsAreNoLeaks) {
    const auto cache = [](const PathRef& path) {
        path.Cache("me", new PathRef::CachedPath(1000, Item::kIndependent, path));  // keeps its own element
    };
    cache(Abs({"C", "x", "y"}));
    EXPECT_EACH(PathManagerStop() == kNoErr, reports_.CountAt(2) + reports_.CountAt(3) == 0u,
                PathManagerStart() == kNoErr);
}

TEST_F(PathCache, GarbageCollection) {
    const PathRef kept = Abs({"kept"});
    {
        std::vector<PathRef> many;
        for (int i = 0; i < 2000; ++i) many.push_back(Rel({std::to_string(i).c_str()}));
        EXPECT_EQ(0u, PathRef::GarbageCollect(PathRef::kFreeUnused));
        reports_.Clear();
    }
    EXPECT_EQ(0u, PathRef::GarbageCollect(PathRef::kCountOnly));
    const uint32 bytes = PathRef::GarbageCollect(PathRef::kFreeUnusedAndReport);
    EXPECT_EACH(bytes >= 3 * 512 * sizeof(PathItemElement), reports_.Has(2, "Leaked Path Element: 1 refs to kept"),
                reports_.Has(0, "Path Garbage Collect: " + std::to_string(bytes) + " bytes reclaimed"),
                kept.IsSane(false), Show(Rel({"new"})) == "rel:new");
}

TEST_F(PathCache, DebugModeShowsTheText) {
    PathRef::Setting("debug");
    EXPECT_TRUE(PathRef::DebugModeEnabled());
    PathRef path;
    path = Abs({"C", "x"});
    EXPECT_EQ("C:\\x", PathRefAccess::TextCache(path));
    PathRef::Setting("nodebug");
    path.Append("y");
    EXPECT_EQ("C:\\x", PathRefAccess::TextCache(path));
    TESSEL_REPORT(kDebugInfo, 1) << path << " " << &path << " " << static_cast<Path>(nullptr);
    EXPECT_TRUE(reports_.Has(0, "C:\\x\\y C:\\x\\y NULL"));
}

}  // namespace
}  // namespace tessel::test
