// Lists of objects in a handle.
#include <tessel/diagnostics/DebugStream.h>
#include <tessel/memory/HObjList.h>
#include <tessel/memory/MemoryManager.h>

#include <algorithm>
#include <cstring>

namespace {

struct ObjList {
    int32 count;
    uint32 values[1];  // as many as the handle has room for; zeros beyond the count
};

constexpr uint32 kValue = sizeof(uint32);
constexpr uint32 kGranule = 16;  // bytes by which a list grows and shrinks
constexpr int32 kAbsent = -1;

ObjList& ListOf(UHandle list) {
    return *reinterpret_cast<ObjList*>(*list);
}

// False, with a report, for a null list.
bool IsList(UHandle list) {
    if (!list) TESSEL_REPORT(kDebugFatal, 0x3C7AD651u);
    return list != nullptr;
}

uint32 RoundDown(uint32 size) {
    return size & ~(kGranule - 1);
}

int32 Pin(int32 pos, int32 last) {
    return std::clamp(pos, int32{0}, last);
}

// Makes room for one more value.
MgErr Grow(UHandle list, int32 count) {
    const uint32 size = DSGetHandleSize(list);
    if (size >= static_cast<uint32>(count) * kValue + 2 * kValue) return kNoErr;
    return DSSetHSzClr(list, size > UINT32_MAX - kGranule ? UINT32_MAX : RoundDown(size + kGranule));
}

}  // namespace

MgErr HObjListInsert(UHandle list, uint32 value, int32 pos) {
    if (!IsList(list)) return kArgErr;
    const int32 count = ListOf(list).count;
    const MgErr err = Grow(list, count);
    if (err != kNoErr) return err;
    ObjList& data = ListOf(list);
    uint32* at = data.values + Pin(pos, count);
    std::memmove(at + 1, at, static_cast<size_t>(data.values + count - at) * kValue);
    *at = value;
    data.count = count + 1;
    return kNoErr;
}

uint32 HObjListDelete(UHandle list, int32 pos) {
    if (!IsList(list)) return 0;
    ObjList& data = ListOf(list);
    const int32 count = data.count;
    if (count <= 0) return 0;
    uint32* at = data.values + Pin(pos, count - 1);
    const uint32 value = *at;
    std::memmove(at, at + 1, static_cast<size_t>(data.values + count - 1 - at) * kValue);
    data.values[count - 1] = 0;
    data.count = count - 1;
    const uint32 size = DSGetHandleSize(list);
    if (size > static_cast<uint32>(count) * kValue + kGranule)
        DSSetHandleSize(list, size % kGranule == 0 ? size - kGranule : RoundDown(size));
    return value;
}

int32 HObjListSearch(UHandle list, uint32 value) {
    if (!IsList(list)) return kAbsent;
    const ObjList& data = ListOf(list);
    int32 i = data.count - 1;
    while (i >= 0 && data.values[i] != value) --i;
    return i;
}

int32 HObjListSearchDelete(UHandle list, uint32 value) {
    const int32 pos = HObjListSearch(list, value);
    if (pos == kAbsent) return 0;
    HObjListDelete(list, pos);
    return 1;
}

int32 HObjListBringToFront(UHandle list, uint32 value) {
    if (!IsList(list)) return 0;
    const int32 pos = HObjListSearch(list, value);
    if (pos == kAbsent) TESSEL_REPORT(kDebugInfo, 0x1EA4C8B0u) << "HObjListBringToFront: object not found!!!";
    if (pos <= 0) return 0;
    uint32* values = ListOf(list).values;
    std::rotate(values, values + pos, values + pos + 1);
    return 1;
}

void HObjListSwap(UHandle list, int32 a, int32 b) {
    if (!IsList(list)) return;
    ObjList& data = ListOf(list);
    if (a < 0 || a >= data.count || b < 0 || b >= data.count) {
        TESSEL_REPORT(kDebugFatal, 0x75D0923Eu) << "HObjListSwap: pos out of range";
        return;
    }
    std::swap(data.values[a], data.values[b]);
}

void HCompactObjList(UHandle list) {
    if (!IsList(list)) return;
    ObjList& data = ListOf(list);
    uint32* end = data.values + data.count;
    uint32* kept = std::remove(data.values, end, 0u);
    std::fill(kept, end, 0u);
    data.count = static_cast<int32>(kept - data.values);
    const uint32 wanted = RoundDown(static_cast<uint32>(data.count) * kValue + kValue + kGranule - 1);
    if (DSGetHandleSize(list) > wanted) DSSetHandleSize(list, wanted);
}
