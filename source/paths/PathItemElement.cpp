#include "paths/PathItemElement.h"

#include "paths/PathItemStorage.h"
#include "paths/PathLock.h"
#include <tessel/diagnostics/DebugStream.h>
#include <tessel/strings/StringUtils.h>

#include <algorithm>
#include <new>

namespace tessel {

// ---- walking --------------------------------------------------------------------------------------------------------

const PathItemElement* PathItemElement::Base() const {
    const PathItemElement* element = this;
    while (element->parent_) element = element->parent_;
    return element;
}

PathItemElement* PathItemElement::AtDepth(int32 depth) const {
    PathItemElement* element = const_cast<PathItemElement*>(this);
    while (element->depth_ > depth) element = element->parent_;
    return element;
}

// ---- children -------------------------------------------------------------------------------------------------------

// Where the child of that name stands, or else where it belongs.
PathItemElement::Children::iterator PathItemElement::FindChild(const std::string& name, int32 hash, bool& found) {
    auto position = std::lower_bound(children_.begin(), children_.end(), hash,
                                     [](const ChildEntry& entry, int32 wanted) { return entry.hash < wanted; });
    for (; position != children_.end() && position->hash == hash; ++position) {
        if (position->element->name_ == name) {
            found = true;
            return position;
        }
    }
    found = false;
    return position;
}

PathItemElement* PathItemElement::Child(const std::string& name) {
    PathItemElement* child = FindOrMakeChild(name);
    if (!child) TESSEL_REPORT(kDebugError, 0x5E0B77D9u) << "Out of memory!";
    return child;
}

PathItemElement* PathItemElement::FindOrMakeChild(const std::string& name) {
    const int32 hash = StringUtils::Hash(name, false);
    PathLock lock;
    bool found;
    const auto position = FindChild(name, hash, found);
    if (!found) return MakeChild(name, hash, position);
    position->element->Retain();
    return position->element;
}

PathItemElement* PathItemElement::MakeChild(const std::string& name, int32 hash, Children::iterator position) {
    PathItemElement* child = PathItemStorage::Allocate();
    if (!child) return nullptr;
    try {
        child->name_ = name;
        children_.insert(position, ChildEntry{hash, child});
    } catch (const std::bad_alloc&) {
        child->Vacate();
        return nullptr;
    }
    child->parent_ = this;
    child->hash_ = hash;
    child->depth_ = depth_ + 1;
    child->retains_.store(1, std::memory_order_relaxed);
    checked_ = false;
    Retain();
    return child;
}

// ---- the end of an element ------------------------------------------------------------------------------------------

void PathItemElement::Release() {
    // Only who gives up the last retain needs the lock, so that nobody finds a child that is about to end.
    int32 retains = retains_.load(std::memory_order_relaxed);
    while (retains > 1) {
        if (retains_.compare_exchange_weak(retains, retains - 1, std::memory_order_release, std::memory_order_relaxed))
            return;
    }
    for (PathItemElement* element = this; element;) element = element->ReleaseOnce();
}

// What an element leaves behind, given back without the lock.
struct PathItemElement::Remains {
    std::string name;
    Children children;
    std::unique_ptr<PathItemCache> cache;
};

namespace {

void ReportOverRelease(const PathItemElement* element, const std::string& name, int32 count) {
    TESSEL_REPORT(kDebugError, 0x3C5A9E10u) << "name= " << name;
    TESSEL_REPORT(kDebugError, 0x3C5A9E11u) << "element= " << DbgFmtPtr(element);
    TESSEL_REPORT(kDebugError, 0x3C5A9E12u) << "count= " << count;
    TESSEL_REPORT(kDebugError, 0x3C5A9E13u) << "Release of PathItemElement, but we did not have enough retains";
}

}  // namespace

PathItemElement* PathItemElement::ReleaseOnce() {
    Remains remains;
    PathItemElement* parent = nullptr;
    int32 left;
    {
        PathLock lock;
        left = retains_.fetch_sub(1, std::memory_order_acq_rel) - 1;
        if (left > 0) return nullptr;
        if (left == 0) {
            parent = parent_;
            End(remains);
        } else {
            retains_.fetch_add(1, std::memory_order_relaxed);
        }
    }
    if (left < 0) ReportOverRelease(this, name_, left);
    return parent;
}

// Takes an element that nobody retains out of the tree.
void PathItemElement::End(Remains& remains) {
    if (parent_) {
        bool found;
        const auto position = parent_->FindChild(name_, hash_, found);
        if (found) parent_->children_.erase(position);
    }
    remains.name.swap(name_);
    remains.children.swap(children_);
    remains.cache.swap(cache_);
    Vacate();
}

void PathItemElement::GiveBackUnusedRoom() {
    if (children_.empty()) Children().swap(children_);
}

// Part of the stop, which must not want memory: finds its way by the places of the elements in their parents.
void PathItemElement::TakeCaches(PathItemCacheList& list) {
    for (PathItemElement* element = this; element;) {
        list.Add(element->cache_);
        element = element->children_.empty() ? element->NextBelow(this) : element->children_.front().element;
    }
}

PathItemElement* PathItemElement::NextBelow(const PathItemElement* top) {
    for (PathItemElement* element = this; element != top; element = element->parent_) {
        bool found;
        auto position = element->parent_->FindChild(element->name_, element->hash_, found);
        if (found && ++position != element->parent_->children_.end()) return position->element;
    }
    return nullptr;
}

// ---- checks ---------------------------------------------------------------------------------------------------------

PathItemElement::Fault PathItemElement::Check() {
    if (parent_ == this) return Fault::kOwnParent;
    if (!parent_ && depth_ != 0) return Fault::kBaseDepth;
    if (parent_ && depth_ != parent_->depth_ + 1) return Fault::kDepth;
    if (checked_) return Fault::kNone;
    int32 previous = INT32_MIN;
    for (const ChildEntry& entry : children_) {
        if (entry.hash < previous || entry.element->parent_ != this) return Fault::kChildren;
        previous = entry.hash;
    }
    checked_ = true;
    return Fault::kNone;
}

// ---- slots ----------------------------------------------------------------------------------------------------------

bool PathItemElement::Claim() {
    uint32 unused = 0;
    return inUse_.compare_exchange_strong(unused, 1, std::memory_order_acq_rel);
}

void PathItemElement::BecomeBase(const char* name) {
    name_ = name;
    retains_.store(1, std::memory_order_relaxed);
}

void PathItemElement::Vacate() {
    std::string().swap(name_);
    Children().swap(children_);
    parent_ = nullptr;
    depth_ = 0;
    hash_ = 0;
    checked_ = false;
    retains_.store(0, std::memory_order_relaxed);
    inUse_.store(0, std::memory_order_release);
    PathItemStorage::SlotVacated(this);
}

}  // namespace tessel
