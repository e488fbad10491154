#include "memory/PouchTree.h"
#include <tessel/diagnostics/DebugStream.h>
#include <tessel/memory/CookieManager.h>
#include <tessel/memory/MemoryManager.h>
#include <tessel/memory/MemoryUtil.h>
#include <tessel/sync/ThMutex.h>
#include <tessel/time/Millisecs.h>

#include <algorithm>
#include <atomic>
#include <cstring>
#include <new>

namespace tessel {
namespace {

constexpr uint32 kWord = sizeof(void*);  // an info of this size is read and written at once
constexpr uint32 kGenerations = 0xFFF;   // 1 to 4095
constexpr MagicCookie kLeastCookie = 1u << PouchTree::kIndexBits;

// The data of a jar's handle.
struct JarRecord {
    ThMutex mutex;  // guards the rest, and the making and freeing of entries
    uint32 serial;  // generation of the next cookie
    PouchTree* tree;
    uint32 infoSize;
    uint32 entrySize;
    uint32 freeHead;  // index of the first free entry
    int32 liveCount;
    int32 rightsMode;
    int32 highWater;  // the largest live count
};
static_assert(sizeof(void*) != 4 || sizeof(JarRecord) == 36);

std::atomic<uint32> disposedTotal{0};  // bytes of all jars disposed of

JarRecord& Record(MagicCookieJar jar) {
    return *reinterpret_cast<JarRecord*>(*jar);
}

uint32 GenerationOf(MagicCookie cookie) {
    return cookie >> PouchTree::kIndexBits;
}
uint32 IndexOf(MagicCookie cookie) {
    return cookie % PouchTree::kIndices;
}
MagicCookie CookieOf(uint32 generation, uint32 index) {
    return generation << PouchTree::kIndexBits | index;
}

// Generation 0 is a free entry's, and only a free entry's: no cookie has it, and the link need not be looked at.
bool IsValid(const CookieEntry* entry, MagicCookie cookie) {
    return entry->Generation() == GenerationOf(cookie) && cookie >= kLeastCookie;
}

// The entry of a valid cookie, or null.
inline __attribute__((always_inline)) CookieEntry* Find(const JarRecord& record, MagicCookie cookie) {
    CookieEntry* entry = record.tree->Find(IndexOf(cookie));
    return entry && IsValid(entry, cookie) ? entry : nullptr;
}

void*& WordOf(void* info) {
    return *static_cast<void**>(info);
}
void* LoadWord(CookieEntry* entry) {
    return __atomic_load_n(&WordOf(entry->Info()), __ATOMIC_ACQUIRE);
}

// A null info stores zeros.
void StoreInfo(const JarRecord& record, CookieEntry* entry, const void* info) {
    if (record.infoSize == kWord) {
        void* word = nullptr;
        if (info) std::memcpy(&word, info, kWord);
        __atomic_store_n(&WordOf(entry->Info()), word, __ATOMIC_RELEASE);
    } else if (info) {
        std::memcpy(entry->Info(), info, record.infoSize);
    } else {
        std::memset(entry->Info(), 0, record.infoSize);
    }
}

// Under the mutex, or of a word.
void LoadInfo(const JarRecord& record, CookieEntry* entry, void* infoOut) {
    if (record.infoSize == kWord) {
        void* word = LoadWord(entry);
        std::memcpy(infoOut, &word, kWord);
    } else {
        std::memcpy(infoOut, entry->Info(), record.infoSize);
    }
}

// ---- making and ending cookies, under the mutex ---------------------------------------------------------------------

uint32 NextGeneration(JarRecord& record) {
    uint32 generation = record.serial++;
    if ((record.serial & kGenerations) == 0) record.serial = 1;
    return generation;
}

MagicCookie MakeCookie(JarRecord& record, const void* info) {
    const uint32 index = record.freeHead;
    CookieEntry* entry = index < PouchTree::kIndices ? record.tree->Find(index) : nullptr;
    if (!entry) return 0;
    record.freeHead = static_cast<uint32>(entry->Link());
    int32 live = record.liveCount + 1;
    __atomic_store_n(&record.liveCount, live, __ATOMIC_RELAXED);
    record.highWater = std::max(record.highWater, live);
    // The generation last: from then on the cookie is valid to those who look without the mutex.
    uint32 generation = NextGeneration(record);
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

// The generation first: nobody may take what follows for the cookie's.
void EndCookie(JarRecord& record, CookieEntry* entry, uint32 index) {
    entry->SetGeneration(0);
    entry->SetLink(static_cast<int32>(record.freeHead));
    record.freeHead = index;
    __atomic_store_n(&record.liveCount, record.liveCount - 1, __ATOMIC_RELAXED);
    StoreInfo(record, entry, nullptr);
    entry->SetRights(0);
}

// ---- making and ending jars -----------------------------------------------------------------------------------------

// False leaves a half-made jar.
bool FillJar(MagicCookieJar jar, uint32 infoSize, int32 rightsMode) {
    if (ThMutexCreate(&Record(jar).mutex, "JarRights") != kNoErr) return false;
    PouchTree* tree = new (std::nothrow) PouchTree(infoSize);
    JarRecord& record = Record(jar);
    record.tree = tree;
    if (!tree) return false;
    record.serial = MilliSecs() & kGenerations;
    if (record.serial == 0) record.serial = 1;
    record.rightsMode = rightsMode;
    record.infoSize = infoSize;
    record.entrySize = tree->EntrySize();
    return true;
}

MagicCookieJar NewJar(uint32 infoSize, int32 rightsMode) {
    constexpr uint32 kMostInfo = 0x01000000;  // so that the size of a pouch stays far below 2^32
    MagicCookieJar jar = infoSize <= kMostInfo ? DSNewHClr(sizeof(JarRecord)) : nullptr;
    if (!jar || FillJar(jar, infoSize, rightsMode)) return jar;
    MCDisposeJar(jar);
    return nullptr;
}

void ReportDisposal(MagicCookieJar jar) {
    const JarRecord& record = Record(jar);
    if (record.liveCount != 0)
        TESSEL_REPORT(kDebugInfo, 0x22C7F5A9u) << "Disposing jar with " << record.liveCount << " cookies remaining";
    PouchTree::Size tree = record.tree ? record.tree->Measure() : PouchTree::Size{0, 0, 0};
    uint32 size = static_cast<uint32>(sizeof(JarRecord)) + tree.bytes;
    uint32 total = disposedTotal.fetch_add(size, std::memory_order_relaxed) + size;
    TESSEL_REPORT(kDebugInfo, 0x6D04B1E8u)
        << "MCDisposeJar(" << DbgFmtPtr(jar) << "): highWater=" << static_cast<uint32>(record.highWater)
        << "; nTreeNodes=" << tree.arrays << "; nPouches=" << tree.pouches << "; size=" << size << "; total=" << total;
}

// ---- rights ---------------------------------------------------------------------------------------------------------

// Changes the positive rights count of the cookie with that generation by `change`, and returns what it was; 0 when
// there is no such cookie any more, its count is not positive or it can take no more.
uint32 ChangeRights(CookieEntry* entry, uint32 generation, int32 change) {
    for (;;) {
        uint32 rights = entry->Rights();
        uint32 count = rights & CookieEntry::kMostRights;
        if (rights >> CookieEntry::kRightsBits != generation || count == 0) return 0;
        if (change > 0 && count == CookieEntry::kMostRights) return 0;
        if (entry->SwapRights(rights, rights + static_cast<uint32>(change))) return count;
    }
}

// Lowers the count, and ends the cookie with it, unless somebody else has ended it meanwhile.
uint32 ReleaseEntry(JarRecord& record, CookieEntry* entry, MagicCookie cookie) {
    const uint32 generation = GenerationOf(cookie);
    uint32 before = ChangeRights(entry, generation, -1);
    if (before == 1) {
        ThMutexHolder hold(record.mutex);
        if (IsValid(entry, cookie) && entry->Rights() == CookieEntry::RightsOf(generation, 0))
            EndCookie(record, entry, IndexOf(cookie));
    }
    return before;
}

void CopyInfoOut(JarRecord& record, CookieEntry* entry, void* infoOut) {
    if (!infoOut) return;
    ThMutexHolder hold(record.infoSize == kWord ? nullptr : record.mutex);
    LoadInfo(record, entry, infoOut);
}

bool AcquireRights(JarRecord& record, MagicCookie cookie, void* infoOut) {
    CookieEntry* entry = record.rightsMode ? Find(record, cookie) : nullptr;
    if (!entry || ChangeRights(entry, GenerationOf(cookie), 1) == 0) return false;
    CopyInfoOut(record, entry, infoOut);
    return true;
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

__attribute__((noinline)) MgErr CopyInfoUnderMutex(JarRecord& record, CookieEntry* entry, MagicCookie cookie,
                                                   void* infoOut) {
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
    bool valid = IsValid(entry, cookie);  // still, so the word was the cookie's
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
    uint32 live = LiveCount(record);
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
        MgErr err = DSSetHandleSizeOrNewHandle(list, ListSize(room));
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

// ---- the classes ----------------------------------------------------------------------------------------------------

namespace tessel {

CookieList::~CookieList() {
    DSDisposeHandle(fCookies);
}

MagicCookie CookieList::GetCookie(int32 i) const {
    return fCookies && i >= 0 && i < fCount ? reinterpret_cast<MagicCookie*>(*fCookies)[i] : 0;
}

MgErr CookieList::SetCookie(int32 i, MagicCookie cookie) {
    if (!fCookies || i < 0 || i >= fCount) return kArgErr;
    reinterpret_cast<MagicCookie*>(*fCookies)[i] = cookie;
    return kNoErr;
}

MgErr CookieList::SetCount(int32 count) {
    if (count < 0) return kArgErr;
    int32 known = fCount;
    fCount = 0;
    if (count == 0) return DSDisposeHandleAndNull(&fCookies);
    if (count > INT32_MAX / static_cast<int32>(sizeof(MagicCookie))) return kMemFullErr;
    MgErr err = DSSetHandleSizeOrNewHandle(&fCookies, static_cast<uint32>(count) * sizeof(MagicCookie));
    if (err != kNoErr) return err;
    if (count > known)
        ClearMem(reinterpret_cast<MagicCookie*>(*fCookies) + known,
                 static_cast<size_t>(count - known) * sizeof(MagicCookie));
    fCount = count;
    return kNoErr;
}

MgErr BaseCookieJar::Init(uint32 infoSize, int32 rightsMode) {
    fJar = NewJar(infoSize, rightsMode);
    return fJar ? kNoErr : kMemFullErr;
}

MgErr BaseCookieJar::Uninit() {
    MgErr err = MCDisposeJar(fJar);
    fJar = nullptr;
    return err;
}

MagicCookie BaseCookieJar::NewCookie(const void* info) {
    return MCNewCookie(fJar, info);
}

MgErr BaseCookieJar::DisposeCookie(const MagicCookie& cookie, void* infoOut) {
    return fJar ? MCDisposeCookie(fJar, cookie, infoOut) : kArgErr;
}

MgErr BaseCookieJar::SetCookieInfo(const MagicCookie& cookie, const void* info) {
    return fJar ? MCSetCookieInfo(fJar, cookie, info) : kArgErr;
}

MgErr BaseCookieJar::GetCookieInfo(const MagicCookie& cookie, void* infoOut) {
    return MCGetCookieInfo(fJar, cookie, infoOut);
}

bool BaseCookieJar::IsACookie(const MagicCookie& cookie) {
    return MCIsACookie(fJar, cookie);
}

MgErr BaseCookieJar::GetCookieList(CookieList* list) {
    if (!list) return kArgErr;
    UHandle cookies = nullptr;
    MgErr err = fJar ? MCGetCookieList(fJar, &cookies) : kNoErr;
    int32 count = cookies && err == kNoErr ? *reinterpret_cast<const int32*>(*cookies) : 0;
    MgErr listErr = list->SetCount(count);
    for (int32 i = 0; listErr == kNoErr && i < count; ++i)
        list->SetCookie(i, reinterpret_cast<const MagicCookie*>(*cookies)[i + 1]);
    DSDisposeHandle(cookies);
    return err != kNoErr ? err : listErr;
}

MagicCookie BaseCookieJar::GetCookieForInfo(const void* info) {
    return fJar ? MCGetCookieForInfo(fJar, info) : 0;
}

int32 BaseCookieJar::AcquireCookieRights(const MagicCookie& cookie, void* infoOut) {
    if (fJar && AcquireRights(Record(fJar), cookie, infoOut)) return 1;
    if (fJar && infoOut) std::memset(infoOut, 0, std::min(Record(fJar).infoSize, kWord));
    return 0;
}

int32 BaseCookieJar::ReleaseCookieRights(const MagicCookie& cookie) {
    if (!fJar || !Record(fJar).rightsMode) return 0;
    JarRecord& record = Record(fJar);
    CookieEntry* entry = Find(record, cookie);
    return entry ? static_cast<int32>(ReleaseEntry(record, entry, cookie)) : 0;
}

MgErr BaseCookieJar::GetNumCookies(int32* count) {
    return MCJarSize(fJar, count);
}

}  // namespace tessel
