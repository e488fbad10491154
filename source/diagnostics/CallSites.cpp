#include "diagnostics/CallSites.h"

#include "base/Compiler.h"
#include "platform/Module.h"
#include "platform/Thread.h"

#include <algorithm>
#include <array>
#include <cstdlib>
#include <cstring>
#include <utility>

namespace tessel {
namespace {

constexpr size_t kChunkSize = 16 * 1024;
constexpr int32 kMostSkipRemembered = 8;
constexpr int32 kMostFrames = CallStack::kCapacity + kMostSkipRemembered;
constexpr int kWalksRemembered = 16;

std::atomic<uint64> nextSerial{1};

// One odd factor for each word of a key, so that the products do not wait for each other.
constexpr auto kFactors = [] {
    std::array<uint64, CallStack::kCapacity + 2> factors{};
    uint64 state = 0x9E3779B97F4A7C15u;
    for (uint64& factor : factors) {
        state = (state ^ (state >> 29)) * 0xBF58476D1CE4E5B9u + 0x94D049BB133111EBu;
        factor = (state ^ (state >> 31)) | 1;
    }
    return factors;
}();

}  // namespace

// A walk as it was done last: the frames, innermost first, and what came of it.
struct RememberedWalk {
    uint64 serial;
    const char* file;
    int32 line;
    int32 depth;
    int32 skip;
    const StackFrame* first;
    const CallSite* site;
    StackFrame frames[kMostFrames];
};

namespace {

// What a thread remembers: the walks it did last, and for whom it is reporting. All its own, so that no lock is needed.
struct RememberedWalks {
    const CallSites* reporting;
    RememberedWalk walks[kWalksRemembered];
};

TESSEL_FAST_THREAD_LOCAL RememberedWalks* ownWalks = nullptr;
TESSEL_FAST_THREAD_LOCAL bool threadEnds = false;

struct RememberedWalksOwner {
    ~RememberedWalksOwner() {
        threadEnds = true;
        std::free(std::exchange(ownWalks, nullptr));
    }
    bool alive = true;
};
thread_local RememberedWalksOwner walksOwner;

TESSEL_NOT_INLINE RememberedWalks* MakeWalks() {
    if (threadEnds || !walksOwner.alive) return nullptr;
    return ownWalks = static_cast<RememberedWalks*>(std::calloc(1, sizeof(RememberedWalks)));
}

// Null while the thread ends, and when there is no memory.
RememberedWalks* WalksOfThread() {
    return ownWalks ? ownWalks : MakeWalks();
}

RememberedWalk& WalkFrom(RememberedWalks& mine, const StackFrame* frame, uint64 serial) {
    const auto hash = (reinterpret_cast<uintptr_t>(frame) >> 4) + serial * 5;
    return mine.walks[(hash ^ (hash >> 4)) % kWalksRemembered];
}

// The frames lie in the stack of this thread above the innermost one, so that they can be read whatever became of them.
TESSEL_NOT_SANITIZED bool IsSameWalk(const RememberedWalk& walk) {
    const StackFrame* frame = walk.first;
    uintptr_t difference = 0;
#pragma GCC unroll 4
    for (int32 i = 0; i < walk.depth; ++i) {
        const StackFrame& remembered = walk.frames[i];
        difference |= reinterpret_cast<uintptr_t>(frame->caller) ^ reinterpret_cast<uintptr_t>(remembered.caller);
        difference |=
            reinterpret_cast<uintptr_t>(frame->returnAddress) ^ reinterpret_cast<uintptr_t>(remembered.returnAddress);
        frame = remembered.caller;
    }
    return difference == 0;
}

// Copies the frames from `frame` outwards, at most `most`; returns how many there are. The first is there in any case:
// it is that of a function that is running.
TESSEL_NOT_SANITIZED int32 CopyFrames(const StackFrame* frame, StackFrame* frames, int32 most) {
    const platform::StackBounds bounds = platform::CurrentStackBounds();
    auto at = reinterpret_cast<uintptr_t>(frame);
    if (at < bounds.low) most = 1;
    int32 depth = 0;
    do {
        frames[depth] = *reinterpret_cast<const StackFrame*>(at);
        const uintptr_t below = at;
        at = reinterpret_cast<uintptr_t>(frames[depth].caller);
        if (!IsCallerOf(below, at, bounds.high)) return depth + 1;
    } while (++depth < most);
    return depth;
}

// How many frames there are before the chain leads astray: into code without frame pointers, which keeps anything in
// the register. What stands in a frame of its making is code by chance only. The innermost one is true in any case.
int32 WithoutGarbage(const StackFrame* frames, int32 depth) {
    for (int32 i = 1; i < depth; ++i)
        if (!platform::IsInModule(frames[i].returnAddress)) return i;
    return depth;
}

}  // namespace

struct CallSites::Key {
    Key(const char* file_, int32 line_, const StackFrame* frames, int32 count_)
        : file(file_), line(line_), count(count_) {
        hash = reinterpret_cast<uintptr_t>(file) * kFactors[0] + static_cast<uint32>(line) * kFactors[1];
        for (int32 i = 0; i < count; ++i) {
            addresses[i] = frames[i].returnAddress;
            hash += reinterpret_cast<uintptr_t>(addresses[i]) * kFactors[i + 2];
        }
        hash ^= hash >> 32;
    }
    bool Is(const CallSite& site) const {
        return site.hash == hash && site.fileKey == file && site.line == line && site.count == count &&
               std::memcmp(site.addresses, addresses, static_cast<size_t>(count) * sizeof addresses[0]) == 0;
    }

    const char* file;
    int32 line;
    int32 count;
    uint64 hash;
    const void* addresses[CallStack::kCapacity];
};

CallSites::CallSites(TrackerHeap& heap, int32 skip) : heap_(heap), serial_(nextSerial.fetch_add(1)), skip_(skip) {
}

void CallSites::SetSkip(int32 skip) {
    skip_ = skip;
}

const CallSite* CallSites::Enter(const char* file, int32 line, const StackFrame* frame, TrackerFailure& failure) {
    RememberedWalks* const mine = WalksOfThread();
    if (!mine) return Walk(file, line, frame, nullptr, failure);
    if (mine->reporting == this) return nullptr;
    RememberedWalk& walk = WalkFrom(*mine, frame, serial_);
    if (walk.first == frame && walk.serial == serial_ && walk.file == file && walk.line == line &&
        walk.skip == skip_.load(std::memory_order_relaxed) && IsSameWalk(walk))
        return walk.site;
    return Walk(file, line, frame, &walk, failure);
}

// Remembers the walk when asked to.
const CallSite* CallSites::Walk(const char* file, int32 line, const StackFrame* frame, RememberedWalk* remembered,
                                TrackerFailure& failure) {
    StackFrame frames[kMostFrames];
    const int32 skip = skip_.load(std::memory_order_relaxed);
    int32 depth, first;
    if (skip <= kMostSkipRemembered) {
        depth = WithoutGarbage(frames, CopyFrames(frame, frames, CallStack::kCapacity + skip));
        first = std::min(skip, depth);
    } else {
        const void* addresses[CallStack::kCapacity];
        depth = WalkCallStack(addresses, CallStack::kCapacity, frame, frame->returnAddress, skip);
        for (int32 i = 0; i < depth; ++i) frames[i] = {nullptr, addresses[i]};
        depth = WithoutGarbage(frames, depth);
        first = 0;
    }
    const Key key(file, line, frames + first, depth - first);
    const CallSite* site = Find(key);
    if (!site) site = Add(key, failure);
    if (!site && failure == TrackerFailure::kNone) site = Add(Key(file, line, frames, 1), failure);
    if (site && remembered && skip <= kMostSkipRemembered) {
        *remembered = {serial_, file, line, depth, skip, frame, site, {}};
        std::copy_n(frames, depth, remembered->frames);
    }
    return site;
}

const CallSite* CallSites::Find(const Key& key) const {
    return sites_.Find(SiteKeys::HashOf(key.hash), [&key](const CallSite* site) { return key.Is(*site); });
}

const CallSite* CallSites::Add(const Key& key, TrackerFailure& failure) {
    platform::MutexHolder hold(mutex_);
    if (const CallSite* site = Find(key)) return site;
    if (count_ >= kMostStacks && key.count > 1) return nullptr;
    const size_t stackSize = static_cast<size_t>(key.count) * sizeof key.addresses[0];
    auto* const site = static_cast<CallSite*>(AllocateSmall(offsetof(CallSite, addresses) + stackSize, failure));
    const char* const file = CopyText(key.file, failure);
    if (!site || !file) return nullptr;
    site->hash = key.hash;
    site->fileKey = key.file;
    site->file = file;
    site->line = key.line;
    site->count = key.count;
    std::memcpy(site->addresses, key.addresses, stackSize);

    if (!sites_.Add(site, [&](size_t size) { return heap_.Allocate(size, failure); })) return nullptr;
    ++count_;
    return site;
}

uint32 CallSites::Count() const {
    platform::MutexHolder hold(mutex_);
    return count_;
}

void* CallSites::AllocateSmall(size_t size, TrackerFailure& failure) {
    size = (size + alignof(CallSite) - 1) / alignof(CallSite) * alignof(CallSite);
    if (size > smallLeft_) {
        const size_t chunk = std::max(kChunkSize, size);
        auto* const fresh = static_cast<char*>(heap_.Allocate(chunk, failure));
        if (!fresh) return nullptr;
        small_ = fresh;
        smallLeft_ = chunk;
    }
    void* const result = small_;
    small_ += size;
    smallLeft_ -= size;
    return result;
}

// The name may belong to a library that is gone when the report is written.
const char* CallSites::CopyText(const char* text, TrackerFailure& failure) {
    if (!text) return "";
    const size_t size = std::strlen(text) + 1;
    void* const copy = AllocateSmall(size, failure);
    return copy ? static_cast<const char*>(std::memcpy(copy, text, size)) : nullptr;
}

CallSites::Reporting::Reporting(const CallSites& sites) : outer_(ownWalks ? ownWalks->reporting : nullptr) {
    if (RememberedWalks* mine = WalksOfThread()) mine->reporting = &sites;
}

CallSites::Reporting::~Reporting() {
    if (ownWalks) ownWalks->reporting = outer_;
}

bool CallSites::IsReporting() const {
    return ownWalks && ownWalks->reporting == this;
}

}  // namespace tessel
