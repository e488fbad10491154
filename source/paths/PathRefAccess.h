// The inside of a PathRef, for the other files of this folder.
#ifndef TESSEL_SOURCE_PATHS_PATHREFACCESS_H
#define TESSEL_SOURCE_PATHS_PATHREFACCESS_H

#include "paths/PathItemElement.h"
#include <tessel/paths/PathRef.h>

namespace tessel {

class PathItemList;

struct PathRefAccess {
    static PathItemElement* Element(const PathRef& path) { return path.mPathElement; }
    // What GetCachedProxy finds, held so that it stays while it is used. No lock is held while items are asked.
    static SharedCachedItem CachedItem(const PathRef& path, const char* key, const char* className,
                                       PathRef::SearchDirection direction, PathItemElement** foundAt = nullptr);
    static std::string& TextCache(PathRef& path) { return path.TextCache(); }

    // A path to an element that is retained for it already, or that it has to retain.
    static PathRef Adopt(PathItemElement* element) {
        PathRef path;
        path.TakeOver(element);
        return path;
    }
    static PathRef Share(PathItemElement* element) {
        PathRef path;
        path.Assign(element);
        return path;
    }

    // Appends names of a path from the given one on; an up-directory element steps up. Raises `detail` when memory is
    // short.
    static void AppendNames(PathRef& path, const PathItemList& names, int32 first, const char* detail);
};

// Whether names are compared without regard to case. An unknown policy is reported.
bool IgnoresCase(PathRef::ComparePolicy policy);
bool SameName(const std::string& a, const std::string& b, bool ignoreCase);

}  // namespace tessel

#endif
