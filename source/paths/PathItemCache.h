// What is cached on the elements of paths.
#ifndef TESSEL_SOURCE_PATHS_PATHITEMCACHE_H
#define TESSEL_SOURCE_PATHS_PATHITEMCACHE_H

#include <tessel/memory/TrackedMallocFree.h>
#include <tessel/paths/PathCachedItem.h>

#include <functional>
#include <map>
#include <memory>
#include <string>

namespace tessel {

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

}  // namespace tessel

#endif
