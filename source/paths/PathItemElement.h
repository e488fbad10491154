// The shared elements that paths are made of: one for every distinct sequence of names from a base.
#ifndef TESSEL_SOURCE_PATHS_PATHITEMELEMENT_H
#define TESSEL_SOURCE_PATHS_PATHITEMELEMENT_H

#include "paths/PathItemCache.h"
#include "paths/PathLock.h"
#include <tessel/memory/TrackedMallocFree.h>

#include <atomic>
#include <memory>
#include <string>
#include <vector>

namespace tessel {

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

    int32 ChildCount() const TESSEL_REQUIRES(pathMutex) { return static_cast<int32>(children_.size()); }
    PathItemElement* ChildAt(int32 index) const TESSEL_REQUIRES(pathMutex) {
        return children_[static_cast<size_t>(index)].element;
    }
    int32 OutsideRetains() const TESSEL_REQUIRES(pathMutex) {
        return retains_.load(std::memory_order_relaxed) - ChildCount();
    }
    std::unique_ptr<PathItemCache>& Cache() TESSEL_REQUIRES(pathMutex) { return cache_; }
    void GiveBackUnusedRoom() TESSEL_REQUIRES(pathMutex);

    // Moves the caches of this element and all below it to the list.
    void TakeCaches(PathItemCacheList& list) TESSEL_REQUIRES(pathMutex);

    enum class Fault { kNone, kOwnParent, kBaseDepth, kDepth, kChildren };
    Fault Check() TESSEL_REQUIRES(pathMutex);

    // ---- for the storage --------------------------------------------------------------------------------------------

    bool Claim();
    void BecomeBase(const char* name);
    void Vacate() TESSEL_REQUIRES(pathMutex);

private:
    struct ChildEntry {
        int32 hash;
        PathItemElement* element;
    };
    using Children = std::vector<ChildEntry, TrackedAllocator<ChildEntry>>;

    Children::iterator FindChild(const std::string& name, int32 hash, bool& found) TESSEL_REQUIRES(pathMutex);
    PathItemElement* FindOrMakeChild(const std::string& name);
    PathItemElement* MakeChild(const std::string& name, int32 hash, Children::iterator position)
        TESSEL_REQUIRES(pathMutex);
    struct Remains;
    void End(Remains& remains) TESSEL_REQUIRES(pathMutex);
    // The element that follows this one and those below it in the tree of `top`; null at its end.
    PathItemElement* NextBelow(const PathItemElement* top) TESSEL_REQUIRES(pathMutex);
    // Gives up one retain. The parent loses one too, the caller's to give up, when that ended the element.
    PathItemElement* ReleaseOnce();

    std::string name_;
    PathItemElement* parent_ = nullptr;
    std::atomic<int32> retains_{0};
    std::atomic<uint32> inUse_{0};
    Children children_ TESSEL_GUARDED_BY(pathMutex);  // in the order of their hashes
    std::unique_ptr<PathItemCache> cache_ TESSEL_GUARDED_BY(pathMutex);
    int32 depth_ = 0;
    int32 hash_ = 0;
    // Whether the order of the children has been verified since one was added.
    bool checked_ TESSEL_GUARDED_BY(pathMutex) = false;
};

}  // namespace tessel

#endif
