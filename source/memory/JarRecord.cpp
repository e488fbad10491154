#include "memory/JarRecord.h"

#include <tessel/memory/MemoryManager.h>
#include <tessel/time/Millisecs.h>

#include <new>

namespace tessel {
namespace {

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

}  // namespace

MagicCookieJar NewJar(uint32 infoSize, int32 rightsMode) {
    constexpr uint32 kMostInfo = 0x01000000;  // so that the size of a pouch stays far below 2^32
    MagicCookieJar jar = infoSize <= kMostInfo ? DSNewHClr(sizeof(JarRecord)) : nullptr;
    if (!jar || FillJar(jar, infoSize, rightsMode)) return jar;
    MCDisposeJar(jar);
    return nullptr;
}

}  // namespace tessel
