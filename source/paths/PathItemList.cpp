#include "paths/PathItemList.h"

namespace tessel {

PathItemList::PathItemList(const PathItemElement* last) : count_(last ? last->Depth() : 0) {
    if (static_cast<size_t>(count_) > few_.size()) many_.resize(static_cast<size_t>(count_));
    items_ = many_.empty() ? few_.data() : many_.data();
    for (; last && last->Depth() > 0; last = last->Parent()) items_[last->Depth() - 1] = last;
}

}  // namespace tessel
