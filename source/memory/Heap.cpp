#include "memory/Heap.h"

#include "memory/MemorySettings.h"
#include "platform/Mutex.h"
#include "platform/Process.h"
#include <tessel/diagnostics/DebugStream.h>

#include <cstring>

namespace tessel::heap {
namespace {

constexpr size_t kAlignment = 16;                  // as malloc's
constexpr size_t kMostBytes = PTRDIFF_MAX - 4096;  // of a block: no object is larger than PTRDIFF_MAX

// In front of every plain block.
struct alignas(kAlignment) Link {
    Link* next;      // null at the last
    Link* previous;  // null at the first
};

struct alignas(64) Shard {
    platform::Mutex mutex;  // guards the links of the blocks in it too
    Link* first TESSEL_GUARDED_BY(mutex) = nullptr;
    uint64 bytes TESSEL_GUARDED_BY(mutex) = 0;
};

constexpr size_t kShards = 64;
constinit Shard shards[kShards];

std::atomic<HandleBlocks> handleBlocks{nullptr};

Shard& ShardOf(const Link* link) {
    const uint32 hash = static_cast<uint32>(reinterpret_cast<uintptr_t>(link) >> 4) * 0x9E3779B1u;
    return shards[hash / (UINT32_MAX / kShards + 1)];
}

size_t SizeOf(Link* link) {
    return platform::AllocatedSize(link) - sizeof(Link);
}

bool StraightThrough() {
    static const bool straight = [] {
        const char* value = platform::EnvironmentGet("OV_USE_MALLOC");
        return value && std::strcmp(value, "1") == 0;
    }();
    return straight;
}

void Enter(Link* link) {
    Shard& shard = ShardOf(link);
    platform::MutexHolder hold(shard.mutex);
    link->next = shard.first;
    link->previous = nullptr;
    if (shard.first) shard.first->previous = link;
    shard.first = link;
    shard.bytes += SizeOf(link);
}

// Whether an address can be a link of the shard: what overwrote a block is hardly ever one.
bool IsPlausible(const Shard& shard, const Link* link) {
    return reinterpret_cast<uintptr_t>(link) % kAlignment == 0 && &ShardOf(link) == &shard;
}

bool IsSound(const Shard& shard, const Link* link) TESSEL_REQUIRES(shard.mutex) {
    const Link* next = link->next;
    const Link* previous = link->previous;
    const bool nextIs = !next || (IsPlausible(shard, next) && next->previous == link);
    const bool previousIs = previous ? IsPlausible(shard, previous) && previous->next == link : shard.first == link;
    return nextIs && previousIs;
}

// False, and nothing is done, when the links are damaged.
bool Remove(Link* link) {
    Shard& shard = ShardOf(link);
    platform::MutexHolder hold(shard.mutex);
    if (!IsSound(shard, link)) return false;
    if (link->next) link->next->previous = link->previous;
    (link->previous ? link->previous->next : shard.first) = link->next;
    shard.bytes -= SizeOf(link);
    return true;
}

void ReportDamage(Error error, const void*) {
    if (error == Error::kDamagedBlock) TESSEL_REPORT(kDebugError, 0x2B94D6E8u) << "The heap is corrupt";
}

std::atomic<ErrorCallback> errorCallback{ReportDamage};

// The first block whose links are damaged, or null. Each block is looked at before its link is followed.
const Link* WalkShard(Shard& shard, void* context, Visitor visitor, bool& goOn) {
    platform::MutexHolder hold(shard.mutex);
    for (Link* link = shard.first; goOn && link; link = link->next) {
        if (!IsSound(shard, link)) return link;
        goOn = visitor(context, link + 1, SizeOf(link));
    }
    return nullptr;
}

}  // namespace

std::atomic<AllocationFilter> allocationFilter{nullptr};

void SetAllocationFilter(AllocationFilter filter) {
    allocationFilter.store(filter, std::memory_order_relaxed);
    SetDetour(kHeapFiltered, filter != nullptr);
}

ErrorCallback SetErrorCallback(ErrorCallback callback) {
    return errorCallback.exchange(callback);
}

void CallErrorCallback(Error error, const void* block) {
    if (ErrorCallback callback = errorCallback.load()) callback(error, block);
}

void* OutOfMemory() {
    CallErrorCallback(Error::kOutOfMemory, nullptr);
    return nullptr;
}

void* Allocate(size_t size) {
    if (size > kMostBytes || !MayAllocate(size)) return OutOfMemory();
    if (StraightThrough()) return std::malloc(size);
    Link* link = static_cast<Link*>(std::malloc(size + sizeof(Link)));
    if (!link) return OutOfMemory();
    Enter(link);
    return link + 1;
}

bool Free(void* block) {
    if (!block) return true;
    if (StraightThrough()) {
        std::free(block);
        return true;
    }
    Link* link = static_cast<Link*>(block) - 1;
    if (!Remove(link)) {
        CallErrorCallback(Error::kDamagedBlock, block);
        return false;
    }
    std::free(link);
    return true;
}

void* Reallocate(void* block, size_t oldSize, size_t newSize) {
    if (!MayAllocate(newSize)) return nullptr;
    const size_t more = newSize / 8;
    const bool growsByLittle = newSize > oldSize && newSize - oldSize < more && newSize <= kMostBytes - more;
    void* resized = growsByLittle ? std::realloc(block, newSize + more) : nullptr;
    return resized ? resized : std::realloc(block, newSize);
}

void SetHandleBlocks(HandleBlocks blocks) {
    handleBlocks.store(blocks);
}

namespace {

// The damaged block is only told where the lists show it.
bool WalkAll(void* context, Visitor visitor, const void*& damaged) {
    bool goOn = true;
    for (size_t i = 0; goOn && i < kShards; ++i)
        if (const Link* link = WalkShard(shards[i], context, visitor, goOn)) {
            damaged = link + 1;
            return false;
        }
    HandleBlocks blocks = handleBlocks.load();
    if (!goOn || !blocks) return goOn;
    GateClosed closed;
    return blocks(context, visitor);
}

}  // namespace

bool Walk(void* context, Visitor visitor) {
    const void* damaged = nullptr;
    return WalkAll(context, visitor, damaged);
}

bool Check() {
    const void* damaged = nullptr;
    bool sound = WalkAll(
        nullptr, [](void*, const void*, size_t) { return true; }, damaged);
    if (!sound) CallErrorCallback(Error::kDamagedBlock, damaged);
    return sound;
}

uint64 TotalAllocated() {
    uint64 total = static_cast<uint64>(ThreadMemory::Totals().bytes);
    for (Shard& shard : shards) {
        platform::MutexHolder hold(shard.mutex);
        total += shard.bytes;
    }
    return total;
}

void ReturnFreeMemory() {
    platform::ReturnFreeMemory();
}

}  // namespace tessel::heap
