// The names of a path in their order.
#ifndef TESSEL_SOURCE_PATHS_PATHITEMLIST_H
#define TESSEL_SOURCE_PATHS_PATHITEMLIST_H

#include "paths/PathItemElement.h"

#include <array>
#include <vector>

namespace tessel {

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
