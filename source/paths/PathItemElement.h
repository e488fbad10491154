// The shared elements that paths are made of: one for every distinct sequence of names from a base.
#ifndef TESSEL_SOURCE_PATHS_PATHITEMELEMENT_H
#define TESSEL_SOURCE_PATHS_PATHITEMELEMENT_H

#include <tessel/memory/TrackedMallocFree.h>
#include <tessel/paths/PathCachedItem.h>
#include <tessel/sync/ThMutex.h>

#include <array>
#include <atomic>
#include <functional>
#include <map>
#include <memory>
#include <string>
#include <vector>

namespace tessel {

// The path mutex guards the children and the cached items of every element, and the end of elements. The storage mutex
// may be taken inside. A thread may hold it more than once, so that what is called with it held can use paths.
class PathLock {
public:
    PathLock() { Acquire(); }
    ~PathLock() { Release(); }
    PathLock(const PathLock&) = delete;
    PathLock& operator=(const PathLock&) = delete;

    static void Acquire();
    static void Release();
    static MgErr CreateMutex();
    static void DestroyMutex();
    static ThMutex Mutex();
};

// Cached items are the host's: they are asked and destroyed without the path mutex, held by a reference meanwhile.
using SharedCachedItem = std::shared_ptr<PathRef::CachedItem>;

// What is cached on one element.
struct PathItemCache : TrackedObject {
    using Map = std::map<std::string, SharedCachedItem, std::less<>,
                         TrackedAllocator<std::pair<const std::string, SharedCachedItem>>>;
    Map items;
    std::unique_ptr<PathItemCache> next;
};

// Caches that were taken off their elements with the path mutex held, to be destroyed without it: the items are the
// host's.
class PathItemCacheList {
public:
    PathItemCacheList() = default;
    ~PathItemCacheList() {
        while (first_) first_ = std::move(first_->next);
    }
    PathItemCacheList(const PathItemCacheList&) = delete;
    PathItemCacheList& operator=(const PathItemCacheList&) = delete;

    void Add(std::unique_ptr<PathItemCache>& cache) {
        if (!cache) return;
        cache->next = std::move(first_);
        first_ = std::move(cache);
    }

private:
    std::unique_ptr<PathItemCache> first_;
};

// An element is a slot of PathItemStorage. Name, parent and depth do not change while it is in use, and it is in use as
// long as somebody retains it: a path, a child, or the table of bases and standard locations. They are read without a
// lock.
class PathItemElement {
public:
    const std::string& Name() const { return name_; }
    PathItemElement* Parent() const { return parent_; }
    int32 Depth() const { return depth_; }  // number of names from the base
    bool IsUpDir() const { return parent_ && name_.empty(); }
    bool InUse() const { return inUse_.load(std::memory_order_acquire) != 0; }

    const PathItemElement* Base() const;
    // The ancestor, or this, with so many names. 0 <= depth <= Depth().
    PathItemElement* AtDepth(int32 depth) const;

    void Retain() { retains_.fetch_add(1, std::memory_order_relaxed); }
    void Release();

    // The child of that name, made if there is none, and retained for the caller. Null (reported) when memory is short.
    PathItemElement* Child(const std::string& name);

    // ---- with the path mutex held -----------------------------------------------------------------------------------

    int32 ChildCount() const { return static_cast<int32>(children_.size()); }
    PathItemElement* ChildAt(int32 index) const { return children_[static_cast<size_t>(index)].element; }
    int32 OutsideRetains() const { return retains_.load(std::memory_order_relaxed) - ChildCount(); }
    std::unique_ptr<PathItemCache>& Cache() { return cache_; }
    void GiveBackUnusedRoom();

    // Moves the caches of this element and all below it to the list.
    void TakeCaches(PathItemCacheList& list);

    enum class Fault { kNone, kOwnParent, kBaseDepth, kDepth, kChildren };
    Fault Check();

    // ---- for the storage --------------------------------------------------------------------------------------------

    bool Claim();
    void BecomeBase(const char* name);
    void Vacate();

private:
    struct ChildEntry {
        int32 hash;
        PathItemElement* element;
    };
    using Children = std::vector<ChildEntry, TrackedAllocator<ChildEntry>>;

    Children::iterator FindChild(const std::string& name, int32 hash, bool& found);
    PathItemElement* FindOrMakeChild(const std::string& name);
    PathItemElement* MakeChild(const std::string& name, int32 hash, Children::iterator position);
    struct Remains;
    void End(Remains& remains);
    // The element that follows this one and those below it in the tree of `top`; null at its end.
    PathItemElement* NextBelow(const PathItemElement* top);
    // Gives up one retain. The parent loses one too, the caller's to give up, when that ended the element.
    PathItemElement* ReleaseOnce();

    std::string name_;
    PathItemElement* parent_ = nullptr;
    std::atomic<int32> retains_{0};
    std::atomic<uint32> inUse_{0};
    Children children_;  // in the order of their hashes
    std::unique_ptr<PathItemCache> cache_;
    int32 depth_ = 0;
    int32 hash_ = 0;
    bool checked_ = false;  // whether the order of the children has been verified since one was added
};

// The elements of a path, the one of its first name first.
class PathItemList {
public:
    explicit PathItemList(const PathItemElement* last);
    int32 Count() const { return count_; }
    const PathItemElement& operator[](int32 index) const { return *items_[index]; }
    PathItemList(const PathItemList&) = delete;
    PathItemList& operator=(const PathItemList&) = delete;

private:
    int32 count_;
    const PathItemElement** items_;
    std::array<const PathItemElement*, 32> few_;
    std::vector<const PathItemElement*, TrackedAllocator<const PathItemElement*>> many_;
};

}  // namespace tessel

#endif
