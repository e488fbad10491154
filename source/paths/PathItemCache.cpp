// Storing cached items on the elements of paths, finding and dropping them.
#include "paths/PathItemCache.h"

#include "diagnostics/Guarded.h"
#include "paths/PathLock.h"
#include "paths/PathRefAccess.h"

#include <utility>
#include <vector>

namespace tessel {

namespace {

SharedCachedItem ItemOn(PathItemElement& element, const char* key) {
    PathLock lock;
    if (!element.Cache()) return nullptr;
    const auto found = element.Cache()->items.find(std::string_view(key));
    return found == element.Cache()->items.end() ? nullptr : found->second;
}

struct FoundItem {
    PathItemElement* element;
    SharedCachedItem item;
};
using FoundItems = std::vector<FoundItem, TrackedAllocator<FoundItem>>;

// The items under the key on an element and all below it.
FoundItems ItemsBelow(PathItemElement* element, const char* key) {
    FoundItems items;
    std::vector<PathItemElement*, TrackedAllocator<PathItemElement*>> waiting{element};
    PathLock lock;
    while (!waiting.empty()) {
        element = waiting.back();
        waiting.pop_back();
        if (SharedCachedItem item = ItemOn(*element, key)) items.push_back({element, std::move(item)});
        for (int32 i = element->ChildCount(); i-- > 0;) waiting.push_back(element->ChildAt(i));
    }
    return items;
}

bool IsWanted(const SharedCachedItem& item, const char* className) {
    return item && !item->Expired() && item->IsA(className);
}

FoundItem FindItem(PathItemElement* element, const char* key, const char* className,
                   PathRef::SearchDirection direction) {
    if (direction == PathRef::kSearchDown) {
        for (FoundItem& found : ItemsBelow(element, key))
            if (IsWanted(found.item, className)) return std::move(found);
        return {};
    }
    for (; element; element = direction == PathRef::kSearchUp ? element->Parent() : nullptr) {
        SharedCachedItem item = ItemOn(*element, key);
        if (IsWanted(item, className)) return {element, std::move(item)};
    }
    return {};
}

// Stores the item and gives back the one that was there.
SharedCachedItem Exchange(PathItemElement& element, const char* key, const SharedCachedItem& item) {
    auto made = std::make_unique<PathItemCache>();
    made->items.try_emplace(key, item);
    PathLock lock;
    std::unique_ptr<PathItemCache>& cache = element.Cache();
    if (!cache) {
        cache.swap(made);
        return nullptr;
    }
    const auto inserted = cache->items.insert(made->items.extract(made->items.begin()));
    return inserted.inserted ? nullptr : std::exchange(inserted.position->second, item);
}

SharedCachedItem Remove(PathItemElement& element, const char* key) {
    PathLock lock;
    if (!element.Cache()) return nullptr;
    PathItemCache::Map& items = element.Cache()->items;
    const auto found = items.find(std::string_view(key));
    if (found == items.end()) return nullptr;
    SharedCachedItem item = std::move(found->second);
    items.erase(found);
    if (items.empty()) element.Cache().reset();
    return item;
}

// Takes an item off its element; nothing happens when another stands there by now.
void RemoveThis(PathItemElement& element, const std::string& key, const SharedCachedItem& item) {
    PathLock lock;
    if (!element.Cache()) return;
    PathItemCache::Map& items = element.Cache()->items;
    const auto found = items.find(key);
    if (found == items.end() || found->second != item) return;
    items.erase(found);
    if (items.empty()) element.Cache().reset();
}

}  // namespace

SharedCachedItem PathRefAccess::CachedItem(const PathRef& path, const char* key, const char* className,
                                           PathRef::SearchDirection direction, PathItemElement** foundAt) {
    if (foundAt) *foundAt = nullptr;
    if (!path.mPathElement || !key || !className) return nullptr;
    FoundItem found = FindItem(path.mPathElement, key, className, direction);
    if (foundAt) *foundAt = found.element;
    return std::move(found.item);
}

MgErr PathRef::Cache(const char* key, CachedItem* item) const {
    std::unique_ptr<CachedItem> owned(item);
    if (!mPathElement || !key) return kArgErr;
    return Guarded([&] {
        SharedCachedItem previous;  // deleted without the lock
        if (!owned) {
            previous = Remove(*mPathElement, key);
            return kNoErr;
        }
        const SharedCachedItem stored(std::move(owned));
        previous = Exchange(*mPathElement, key, stored);
        stored->Attached();
        return kNoErr;
    });
}

PathRef::CachedItem* PathRef::GetCachedProxy(const char* key, const char* className, SearchDirection direction,
                                             PathItemElement** foundAt) const {
    return GuardedOr<CachedItem*>(
        nullptr, [&] { return PathRefAccess::CachedItem(*this, key, className, direction, foundAt).get(); });
}

uint32 PathRef::FlushCache() const {
    if (!mPathElement) return 0;
    std::unique_ptr<PathItemCache> everything;
    PathItemCache::Map items;  // as they were: what they answer is asked without the lock
    {
        PathLock lock;
        mPathElement->GiveBackUnusedRoom();
        std::unique_ptr<PathItemCache>& cache = mPathElement->Cache();
        if (!cache) return 0;
        const MgErr err = Guarded([&] {
            items = cache->items;
            return kNoErr;
        });
        if (err) everything.swap(cache);  // without memory to ask, all go: a cache may forget
    }
    uint32 bytes = 0;
    for (const auto& [key, item] : items) {
        if (!item->Invalidate() && !item->Expired()) continue;
        bytes += item->Size();
        RemoveThis(*mPathElement, key, item);
    }
    return bytes;
}

ThMutex PathRef::GetCacheMutex() {
    return PathLock::Mutex();
}

PathRef::CacheLock::CacheLock() {
    PathLock::Acquire();
}

PathRef::CacheLock::~CacheLock() {
    PathLock::Release();
}

}  // namespace tessel
