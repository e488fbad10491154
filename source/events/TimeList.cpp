#include "events/TimeList.h"

#include <iterator>

namespace tessel {

TimeList::Entry::Entry(Refnum refnum) {
    Tree tree;
    spare_ = tree.extract(tree.emplace(0, refnum));
}

// The clock may have been read a little earlier than the one before.
TimeList::Moment TimeList::Present(uint32 now) {
    present_ += static_cast<int32>(now - static_cast<uint32>(present_));
    return present_;
}

void TimeList::Insert(Entry& entry, uint32 time, uint32 now, Among among) {
    const Moment moment = MomentOf(time, now);
    entry.spare_.key() = moment;
    auto next = among == Among::kBeforeEquals ? tree_.lower_bound(moment) : tree_.upper_bound(moment);
    entry.place_ = tree_.insert(next, std::move(entry.spare_));
    entry.listed_ = true;
}

void TimeList::Move(Entry& entry, uint32 time, uint32 now) {
    const Moment moment = MomentOf(time, now);
    if (moment == entry.place_->first) return;
    const bool fitsAfter = entry.place_ != tree_.begin() && std::prev(entry.place_)->first <= moment;
    const auto next = std::next(entry.place_);
    const bool keepsPlace = fitsAfter && (next == tree_.end() || moment < next->first);
    Remove(entry);
    if (!keepsPlace) return Insert(entry, time, now, Among::kBeforeEquals);
    entry.spare_.key() = moment;
    entry.place_ = tree_.insert(next, std::move(entry.spare_));
    entry.listed_ = true;
}

void TimeList::Remove(Entry& entry) {
    if (!entry.listed_) return;
    entry.spare_ = tree_.extract(entry.place_);
    entry.listed_ = false;
}

TimeList::Refnum TimeList::FirstDue(uint32 now) {
    return !tree_.empty() && tree_.begin()->first <= Present(now) ? tree_.begin()->second : 0;
}

size_t TimeList::CountDue(uint32 now) {
    return static_cast<size_t>(std::distance(tree_.begin(), tree_.upper_bound(Present(now))));
}

}  // namespace tessel
