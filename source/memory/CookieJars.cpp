// Cookies as classes, and the rights that keep one alive while somebody uses it.
#include "memory/JarRecord.h"
#include <tessel/memory/CookieManager.h>
#include <tessel/memory/MemoryManager.h>
#include <tessel/memory/MemoryUtil.h>

#include <algorithm>
#include <cstring>

namespace tessel {
namespace {

// Changes the positive rights count of the cookie with that generation by `change`, and returns what it was; 0 when
// there is no such cookie any more, its count is not positive or it can take no more.
uint32 ChangeRights(CookieEntry* entry, uint32 generation, int32 change) {
    for (;;) {
        const uint32 rights = entry->Rights();
        const uint32 count = rights & CookieEntry::kMostRights;
        if (rights >> CookieEntry::kRightsBits != generation || count == 0) return 0;
        if (change > 0 && count == CookieEntry::kMostRights) return 0;
        if (entry->SwapRights(rights, rights + static_cast<uint32>(change))) return count;
    }
}

// Lowers the count, and ends the cookie with it, unless somebody else has ended it meanwhile.
uint32 ReleaseEntry(JarRecord& record, CookieEntry* entry, MagicCookie cookie) {
    const uint32 generation = GenerationOf(cookie);
    const uint32 before = ChangeRights(entry, generation, -1);
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

CookieList::~CookieList() {
    DSDisposeHandle(cookies_);
}

MagicCookie CookieList::GetCookie(int32 i) const {
    return cookies_ && i >= 0 && i < count_ ? reinterpret_cast<MagicCookie*>(*cookies_)[i] : 0;
}

MgErr CookieList::SetCookie(int32 i, MagicCookie cookie) {
    if (!cookies_ || i < 0 || i >= count_) return kArgErr;
    reinterpret_cast<MagicCookie*>(*cookies_)[i] = cookie;
    return kNoErr;
}

MgErr CookieList::SetCount(int32 count) {
    if (count < 0) return kArgErr;
    const int32 known = count_;
    count_ = 0;
    if (count == 0) return DSDisposeHandleAndNull(&cookies_);
    if (count > INT32_MAX / static_cast<int32>(sizeof(MagicCookie))) return kMemFullErr;
    const MgErr err = DSSetHandleSizeOrNewHandle(&cookies_, static_cast<uint32>(count) * sizeof(MagicCookie));
    if (err != kNoErr) return err;
    if (count > known)
        ClearMem(reinterpret_cast<MagicCookie*>(*cookies_) + known,
                 static_cast<size_t>(count - known) * sizeof(MagicCookie));
    count_ = count;
    return kNoErr;
}

MgErr BaseCookieJar::Init(uint32 infoSize, int32 rightsMode) {
    jar_ = NewJar(infoSize, rightsMode);
    return jar_ ? kNoErr : kMemFullErr;
}

MgErr BaseCookieJar::Uninit() {
    const MgErr err = MCDisposeJar(jar_);
    jar_ = nullptr;
    return err;
}

MagicCookie BaseCookieJar::NewCookie(const void* info) {
    return MCNewCookie(jar_, info);
}

MgErr BaseCookieJar::DisposeCookie(const MagicCookie& cookie, void* infoOut) {
    return jar_ ? MCDisposeCookie(jar_, cookie, infoOut) : kArgErr;
}

MgErr BaseCookieJar::SetCookieInfo(const MagicCookie& cookie, const void* info) {
    return jar_ ? MCSetCookieInfo(jar_, cookie, info) : kArgErr;
}

MgErr BaseCookieJar::GetCookieInfo(const MagicCookie& cookie, void* infoOut) {
    return MCGetCookieInfo(jar_, cookie, infoOut);
}

bool BaseCookieJar::IsACookie(const MagicCookie& cookie) {
    return MCIsACookie(jar_, cookie);
}

MgErr BaseCookieJar::GetCookieList(CookieList* list) {
    if (!list) return kArgErr;
    UHandle cookies = nullptr;
    const MgErr err = jar_ ? MCGetCookieList(jar_, &cookies) : kNoErr;
    const int32 count = cookies && err == kNoErr ? *reinterpret_cast<const int32*>(*cookies) : 0;
    const MgErr listErr = list->SetCount(count);
    for (int32 i = 0; listErr == kNoErr && i < count; ++i)
        list->SetCookie(i, reinterpret_cast<const MagicCookie*>(*cookies)[i + 1]);
    DSDisposeHandle(cookies);
    return err != kNoErr ? err : listErr;
}

MagicCookie BaseCookieJar::GetCookieForInfo(const void* info) {
    return jar_ ? MCGetCookieForInfo(jar_, info) : 0;
}

int32 BaseCookieJar::AcquireCookieRights(const MagicCookie& cookie, void* infoOut) {
    if (jar_ && AcquireRights(Record(jar_), cookie, infoOut)) return 1;
    if (jar_ && infoOut) std::memset(infoOut, 0, std::min(Record(jar_).infoSize, kWord));
    return 0;
}

int32 BaseCookieJar::ReleaseCookieRights(const MagicCookie& cookie) {
    if (!jar_ || !Record(jar_).rightsMode) return 0;
    JarRecord& record = Record(jar_);
    CookieEntry* entry = Find(record, cookie);
    return entry ? static_cast<int32>(ReleaseEntry(record, entry, cookie)) : 0;
}

MgErr BaseCookieJar::GetNumCookies(int32* count) {
    return MCJarSize(jar_, count);
}

}  // namespace tessel
