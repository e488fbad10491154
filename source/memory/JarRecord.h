// What a jar of cookies is, and finding a cookie's entry in it.
#ifndef TESSEL_SOURCE_MEMORY_JARRECORD_H
#define TESSEL_SOURCE_MEMORY_JARRECORD_H

#include "base/Compiler.h"
#include "memory/PouchTree.h"
#include <tessel/memory/CookieManager.h>
#include <tessel/sync/ThMutex.h>

#include <cstring>

namespace tessel {

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

// Null when memory is short, or an info too large.
MagicCookieJar NewJar(uint32 infoSize, int32 rightsMode);

inline JarRecord& Record(MagicCookieJar jar) {
    return *reinterpret_cast<JarRecord*>(*jar);
}

// ---- cookies and their entries --------------------------------------------------------------------------------------

inline uint32 GenerationOf(MagicCookie cookie) {
    return cookie >> PouchTree::kIndexBits;
}
inline uint32 IndexOf(MagicCookie cookie) {
    return cookie % PouchTree::kIndices;
}
inline MagicCookie CookieOf(uint32 generation, uint32 index) {
    return generation << PouchTree::kIndexBits | index;
}

// Generation 0 is a free entry's, and only a free entry's: no cookie has it, and the link need not be looked at.
inline bool IsValid(const CookieEntry* entry, MagicCookie cookie) {
    return entry->Generation() == GenerationOf(cookie) && cookie >= kLeastCookie;
}

// The entry of a valid cookie, or null.
TESSEL_ALWAYS_INLINE CookieEntry* Find(const JarRecord& record, MagicCookie cookie) {
    CookieEntry* entry = record.tree->Find(IndexOf(cookie));
    return entry && IsValid(entry, cookie) ? entry : nullptr;
}

inline void*& WordOf(void* info) {
    return *static_cast<void**>(info);
}
inline void* LoadWord(CookieEntry* entry) {
    return __atomic_load_n(&WordOf(entry->Info()), __ATOMIC_ACQUIRE);
}

// A null info stores zeros.
inline void StoreInfo(const JarRecord& record, CookieEntry* entry, const void* info) {
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
inline void LoadInfo(const JarRecord& record, CookieEntry* entry, void* infoOut) {
    if (record.infoSize == kWord) {
        void* word = LoadWord(entry);
        std::memcpy(infoOut, &word, kWord);
    } else {
        std::memcpy(infoOut, entry->Info(), record.infoSize);
    }
}

// Under the mutex. The generation first: nobody may take what follows for the cookie's.
inline void EndCookie(JarRecord& record, CookieEntry* entry, uint32 index) {
    entry->SetGeneration(0);
    entry->SetLink(static_cast<int32>(record.freeHead));
    record.freeHead = index;
    __atomic_store_n(&record.liveCount, record.liveCount - 1, __ATOMIC_RELAXED);
    StoreInfo(record, entry, nullptr);
    entry->SetRights(0);
}

}  // namespace tessel

#endif
