// Cookies through the flat interface: making and ending them, and what they stand for.
#include "base/Compiler.h"
#include "memory/JarRecord.h"
#include <tessel/diagnostics/DebugStream.h>
#include <tessel/memory/CookieManager.h>
#include <tessel/memory/MemoryManager.h>
#include <tessel/memory/MemoryUtil.h>

#include <algorithm>
#include <atomic>
#include <cstring>

namespace tessel {
namespace {

std::atomic<uint32> disposedTotal{0};  // bytes of all jars disposed of

// ---- making and ending cookies, under the mutex ---------------------------------------------------------------------

uint32 NextGeneration(JarRecord& record) {
    const uint32 generation = record.serial++;
    if ((record.serial & kGenerations) == 0) record.serial = 1;
    return generation;
}

MagicCookie MakeCookie(JarRecord& record, const void* info) {
    const uint32 index = record.freeHead;
    CookieEntry* entry = index < PouchTree::kIndices ? record.tree->Find(index) : nullptr;
    if (!entry) return 0;
    record.freeHead = static_cast<uint32>(entry->Link());
    const int32 live = record.liveCount + 1;
    __atomic_store_n(&record.liveCount, live, __ATOMIC_RELAXED);
    record.highWater = std::max(record.highWater, live);
    // The generation last: from then on the cookie is valid to those who look without the mutex.
    const uint32 generation = NextGeneration(record);
    StoreInfo(record, entry, info);
    entry->SetRights(CookieEntry::RightsOf(generation, record.rightsMode ? 1 : 0));
    entry->SetLink(CookieEntry::kInUse);
    entry->SetGeneration(generation);
    return CookieOf(generation, index);
}

// A block for the tree, made without the mutex.
struct SpareBlock {
    void* block = nullptr;
    uint32 size = 0;

    SpareBlock() = default;
    ~SpareBlock() {
        if (block) DSDisposePtr(block);
    }
    SpareBlock(const SpareBlock&) = delete;
    SpareBlock& operator=(const SpareBlock&) = delete;

    bool Renew(uint32 wanted) {
        if (block) DSDisposePtr(block);
        size = wanted;
        block = DSNewPClr(wanted);
        return block != nullptr;
    }
};

// Makes the cookie; 0 with *missing = 0 when it cannot be made, and with the size of the block that the tree wants
// first when the spare one is none or of another size.
MagicCookie TryNewCookie(JarRecord& record, const void* info, SpareBlock& spare, uint32* missing) {
    ThMutexHolder hold(record.mutex);
    *missing = 0;
    if (record.freeHead >= PouchTree::kIndices) return 0;
    while ((*missing = record.tree->SizeMissing(record.freeHead)) != 0) {
        if (!spare.block || spare.size != *missing) return 0;
        *missing = 0;
        if (!record.tree->Add(record.freeHead, spare.block)) return 0;
        spare.block = nullptr;
    }
    return MakeCookie(record, info);
}

// ---- ending jars ----------------------------------------------------------------------------------------------------

void ReportDisposal(MagicCookieJar jar) {
    const JarRecord& record = Record(jar);
    if (record.liveCount != 0)
        TESSEL_REPORT(kDebugInfo, 0x22C7F5A9u) << "Disposing jar with " << record.liveCount << " cookies remaining";
    PouchTree::Size tree = record.tree ? record.tree->Measure() : PouchTree::Size{0, 0, 0};
    const uint32 size = static_cast<uint32>(sizeof(JarRecord)) + tree.bytes;
    const uint32 total = disposedTotal.fetch_add(size, std::memory_order_relaxed) + size;
    TESSEL_REPORT(kDebugInfo, 0x6D04B1E8u)
        << "MCDisposeJar(" << DbgFmtPtr(jar) << "): highWater=" << static_cast<uint32>(record.highWater)
        << "; nTreeNodes=" << tree.arrays << "; nPouches=" << tree.pouches << "; size=" << size << "; total=" << total;
}

}  // namespace
}  // namespace tessel

using namespace tessel;

MagicCookieJar MCNewJar(void) {
    return NewJar(kWord, 0);
}

MagicCookieJar MCNewBigJar(uint32 infoSize) {
    return NewJar(infoSize, 0);
}

MgErr MCDisposeJar(MagicCookieJar jar) {
    if (!jar) return kNoErr;
    ReportDisposal(jar);
    ThMutexDestroy(Record(jar).mutex);
    delete Record(jar).tree;
    DSDisposeHandle(jar);
    return kNoErr;
}

MgErr MCJarSize(MagicCookieJar jar, int32* count) {
    if (!jar || !count) return kArgErr;
    *count = __atomic_load_n(&Record(jar).liveCount, __ATOMIC_RELAXED);
    return kNoErr;
}

MagicCookie MCNewCookie(MagicCookieJar jar, const void* info) {
    if (!jar) return 0;
    // Memory is asked for without the mutex: the host's procedures may use the jar.
    SpareBlock spare;
    for (uint32 missing = 0;;) {
        MagicCookie cookie = TryNewCookie(Record(jar), info, spare, &missing);
        if (missing == 0 || !spare.Renew(missing)) return cookie;
    }
}

MgErr MCDisposeCookie(MagicCookieJar jar, MagicCookie cookie, void* infoOut) {
    if (!jar) return kArgErr;
    JarRecord& record = Record(jar);
    ThMutexHolder hold(record.mutex);
    CookieEntry* entry = Find(record, cookie);
    if (!entry) return kArgErr;
    if (infoOut) LoadInfo(record, entry, infoOut);
    EndCookie(record, entry, IndexOf(cookie));
    return kNoErr;
}

MgErr MCSetCookieInfo(MagicCookieJar jar, MagicCookie cookie, const void* info) {
    if (!jar) return kArgErr;
    JarRecord& record = Record(jar);
    ThMutexHolder hold(record.mutex);
    CookieEntry* entry = Find(record, cookie);
    if (!entry) return kArgErr;
    StoreInfo(record, entry, info);
    return kNoErr;
}

namespace {

TESSEL_NOT_INLINE MgErr CopyInfoUnderMutex(JarRecord& record, CookieEntry* entry, MagicCookie cookie, void* infoOut) {
    ThMutexHolder hold(record.mutex);
    if (!IsValid(entry, cookie)) return kArgErr;
    LoadInfo(record, entry, infoOut);
    return kNoErr;
}

}  // namespace

MgErr MCGetCookieInfo(MagicCookieJar jar, MagicCookie cookie, void* infoOut) {
    if (!jar || !infoOut) return kArgErr;
    JarRecord& record = Record(jar);
    CookieEntry* entry = Find(record, cookie);
    if (!entry) return kArgErr;
    if (record.infoSize != kWord) return CopyInfoUnderMutex(record, entry, cookie, infoOut);
    void* word = LoadWord(entry);
    const bool valid = IsValid(entry, cookie);  // still, so the word was the cookie's
    if (!valid) word = nullptr;
    std::memcpy(infoOut, &word, kWord);
    return valid ? kNoErr : kArgErr;
}

MgErr MCGetCookieInfoPtr(MagicCookieJar jar, MagicCookie cookie, void** info) {
    if (!info) return kArgErr;
    CookieEntry* entry = jar ? Find(Record(jar), cookie) : nullptr;
    *info = entry ? entry->Info() : nullptr;
    return entry ? kNoErr : kArgErr;
}

namespace {

uint32 ListSize(uint32 cookies) {
    return static_cast<uint32>(sizeof(uint32)) * (cookies + 1);
}

uint32 LiveCount(const JarRecord& record) {
    return static_cast<uint32>(__atomic_load_n(&record.liveCount, __ATOMIC_RELAXED));
}

// Under the mutex, into a list that has room for all that live.
void CollectCookies(const JarRecord& record, uint32* list) {
    const uint32 live = LiveCount(record);
    uint32 count = 0;
    if (live != 0)
        record.tree->ForEachInUse([&](CookieEntry* entry, uint32 index) {
            list[++count] = CookieOf(entry->Generation(), index);
            return count < live;
        });
    list[0] = count;
}

}  // namespace

// The list is resized without the mutex, since that may call the host: again when cookies were made meanwhile.
MgErr MCGetCookieList(MagicCookieJar jar, UHandle* list) {
    if (!jar || !list) return kArgErr;
    JarRecord& record = Record(jar);
    uint32 room = LiveCount(record), live;
    for (;; room = live) {
        const MgErr err = DSSetHandleSizeOrNewHandle(list, ListSize(room));
        if (err != kNoErr) return err;
        ThMutexHolder hold(record.mutex);
        live = LiveCount(record);
        if (live > room) continue;
        CollectCookies(record, reinterpret_cast<uint32*>(**list));
        break;
    }
    if (*reinterpret_cast<const uint32*>(**list) != live)
        TESSEL_REPORT(kDebugError, 0x51EB0F47u) << "PouchTree::CollectMagicCookies: cookie count discrepancy";
    return live < room ? DSSetHandleSize(*list, ListSize(live)) : kNoErr;
}

bool MCIsACookie(MagicCookieJar jar, MagicCookie cookie) {
    if (!jar || cookie == 0) return false;
    JarRecord& record = Record(jar);
    ThMutexHolder hold(record.mutex);
    return Find(record, cookie) != nullptr;
}

namespace {

bool HasInfo(const JarRecord& record, MagicCookie cookie, const void* info) {
    CookieEntry* entry = Find(record, cookie);
    if (!entry) return false;
    if (record.infoSize == kWord) {
        void* word = LoadWord(entry);
        return BlockCmp(&word, info, kWord) == 0;
    }
    ThMutexHolder hold(record.mutex);
    return BlockCmp(entry->Info(), info, record.infoSize) == 0;
}

}  // namespace

MagicCookie MCGetCookieForInfo(MagicCookieJar jar, const void* info) {
    UHandle list = nullptr;
    if (!info || MCGetCookieList(jar, &list) != kNoErr) return 0;
    const uint32* words = reinterpret_cast<const uint32*>(*list);
    const uint32* end = words + 1 + words[0];
    const uint32* found = std::find_if(words + 1, end, [&](MagicCookie c) { return HasInfo(Record(jar), c, info); });
    MagicCookie cookie = found != end ? *found : 0;
    DSDisposeHandle(list);
    return cookie;
}
