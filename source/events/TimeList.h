// Refnums in the order of a time on the millisecond clock.
#ifndef TESSEL_SOURCE_EVENTS_TIMELIST_H
#define TESSEL_SOURCE_EVENTS_TIMELIST_H

#include <tessel/memory/CookieManager.h>
#include <tessel/memory/TrackedMallocFree.h>

#include <functional>
#include <map>
#include <utility>

namespace tessel {

// Times are kept in 64 bits, counted on from the clock's 32 as it is read, so that the order is one whatever times are
// asked for: a time stands for the moment less than 2^31 ms before or after the present. Something must look at a list
// that is not empty every 2^31 ms: the thread that waits for its first entry does.
class TimeList {
    using Moment = int64;
    using Refnum = MagicCookie;
    using Tree = std::multimap<Moment, Refnum, std::less<Moment>, TrackedAllocator<std::pair<const Moment, Refnum>>>;

public:
    // A place in a list. Its memory is taken when it is made, so that joining a list cannot fail.
    class Entry {
    public:
        explicit Entry(Refnum refnum = 0);  // may throw std::bad_alloc
        Entry(const Entry&) = delete;
        Entry& operator=(const Entry&) = delete;

        void SetRefnum(Refnum refnum) { spare_.mapped() = refnum; }  // while it is not listed
        Refnum GetRefnum() const { return listed_ ? place_->second : spare_.mapped(); }
        bool IsListed() const { return listed_; }
        uint32 Time() const { return static_cast<uint32>(place_->first); }  // while it is listed

    private:
        friend class TimeList;
        Tree::node_type spare_;  // while it is not listed
        Tree::iterator place_;
        bool listed_ = false;
    };

    enum class Among { kBeforeEquals, kAfterEquals };

    // Adds an entry that is not listed.
    void Insert(Entry& entry, uint32 time, uint32 now, Among among);

    // Gives a listed entry another time. It keeps its place among equals where its neighbours allow it: after one that
    // is not later, before one that is. Else it goes before its equals.
    void Move(Entry& entry, uint32 time, uint32 now);

    // Nothing for an entry that is not listed.
    void Remove(Entry& entry);

    // The refnum of the first entry that is due; 0 when none is.
    Refnum FirstDue(uint32 now);
    size_t CountDue(uint32 now);

    bool IsFirst(const Entry& entry) const { return entry.listed_ && entry.place_ == tree_.begin(); }
    uint32 FirstTime() const { return tree_.empty() ? 0 : static_cast<uint32>(tree_.begin()->first); }  // 0: none

    // For entries that nobody has any more.
    void DropFirst() { tree_.erase(tree_.begin()); }
    void Forget() { tree_.clear(); }

private:
    Moment Present(uint32 now);
    Moment MomentOf(uint32 time, uint32 now) { return Present(now) + static_cast<int32>(time - now); }

    Tree tree_;
    Moment present_ = 0;
};

}  // namespace tessel

#endif
