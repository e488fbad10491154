// Lists of LStrs laid end to end.
#include "strings/HandleOps.h"
#include "strings/LStrView.h"
#include <tessel/diagnostics/DebugStream.h>
#include <tessel/strings/StringCLStr.h>
#include <tessel/strings/StringLStr.h>

#include <algorithm>
#include <cstring>

using namespace tessel;

namespace {

constexpr uint32 kEmptyListSize = offsetof(CLStr, bytes);
constexpr uint32 kAlignment = 4;

// What an element of so many bytes takes up.
uint32 ElementSize(size_t length) {
    return (LStrSize(length) + kAlignment - 1) / kAlignment * kAlignment;
}

int32 ElementCount(const CLStr* list) {
    return std::max(list->count, 0);
}

// Where element i stands, or would stand, in the list: 0 <= i <= count.
uint32 OffsetOf(const CLStr* list, int32 i) {
    uint32 offset = kEmptyListSize;
    const auto* start = reinterpret_cast<const uint8*>(list);
    while (i-- > 0) offset += ElementSize(LStrView(reinterpret_cast<const LStr*>(start + offset)).length);
    return offset;
}

LStrPtr ElementAt(CLStrPtr list, uint32 offset) {
    return reinterpret_cast<LStrPtr>(reinterpret_cast<uint8*>(list) + offset);
}

int32 ClampToElement(const CLStr* list, int32 i) {
    return std::clamp(i, 0, std::max(ElementCount(list) - 1, 0));
}

// The element may lie in the list.
MgErr InsertAt(CLStrHandle list, LStrView element, uint32 offset, bool exact) {
    const uint32 size = ElementSize(element.length);
    const uint32 listSize = CLStrSize(*list);
    const size_t place = reinterpret_cast<uintptr_t>(element.bytes) - reinterpret_cast<uintptr_t>(*list);
    if (MgErr err = ResizeRange(AsHandle(list), {listSize, offset, 0}, size, exact)) return err;
    const uint8* source = element.bytes;
    if (place < listSize) source = *AsHandle(list) + place + (place >= offset ? size : 0);
    LStrPtr inserted = ElementAt(*list, offset);
    std::memset(inserted, 0, size);
    inserted->count = static_cast<int32>(element.length);
    if (element.length != 0) std::memcpy(inserted->bytes, source, element.length);
    ++(*list)->count;
    return kNoErr;
}

// Brings the number at `at` into host order.
uint32 StdToHost(uint8* at) {
    const uint32 value = uint32{at[0]} << 24 | uint32{at[1]} << 16 | uint32{at[2]} << 8 | at[3];
    std::memcpy(at, &value, sizeof value);
    return value;
}

}  // namespace

uint32 CLStrSize(const CLStr* list) {
    return list ? OffsetOf(list, ElementCount(list)) : 0;
}

LStrPtr CLStrIndex(CLStrPtr list, int32 i) {
    if (!list) {
        TESSEL_REPORT(kDebugFatal, 0x7A1F46CDu) << "invalid buffer passed to CLStrIndex";
        return nullptr;
    }
    return ElementAt(list, OffsetOf(list, ClampToElement(list, i)));
}

MgErr CLStrInsert(CLStrHandle list, const LStr* element, int32 index, bool exact) {
    if (!list || !element) {
        TESSEL_REPORT(kDebugFatal, 0xC3590E8Bu) << "Invalid dest buffer or insert buffer passed to CLStrInsert";
        return kGenericErr;
    }
    return InsertAt(list, element, OffsetOf(*list, std::clamp(index, 0, ElementCount(*list))), exact);
}

MgErr CLStrInsertSort(CLStrHandle list, const LStr* element, bool allowDuplicate, int32* index, bool* inserted,
                      bool exact) {
    if (!list || !element || !index || !inserted) {
        TESSEL_REPORT(kDebugFatal, 0x249DE5F7u) << "Invalid dest buffer or insert buffer passed to CLStrInsertSort";
        return kGenericErr;
    }
    const int32 count = ElementCount(*list);
    uint32 offset = kEmptyListSize;
    int32 order = -1;
    int32 i = 0;
    for (; i < count; ++i) {
        const LStr* present = ElementAt(*list, offset);
        order = LStrCmp(present, element);
        if (order >= 0) break;
        offset += ElementSize(LStrView(present).length);
    }
    *index = i;
    *inserted = false;
    if (order == 0 && !allowDuplicate) return kNoErr;
    const MgErr err = InsertAt(list, element, offset, exact);
    *inserted = err == kNoErr;
    return err;
}

MgErr CLStrRemove(CLStrHandle list, int32 i) {
    if (!list || ElementCount(*list) == 0) return kArgErr;
    const uint32 offset = OffsetOf(*list, ClampToElement(*list, i));
    const HandleRange removed = {CLStrSize(*list), offset, ElementSize(LStrView(ElementAt(*list, offset)).length)};
    --(*list)->count;
    return ResizeRange(AsHandle(list), removed, 0, true);
}

void StdToCLStr(CLStrHandle list) {
    const uint32 size = list ? DSGetHandleSize(AsHandle(list)) : 0;
    uint64 offset = 0;
    bool hasAll = false;
    if (size >= kEmptyListSize) {
        uint8* bytes = *AsHandle(list);
        StdToHost(bytes);
        int32 present = 0;
        for (offset = kEmptyListSize; offset + sizeof(int32) <= size;) {
            const uint64 length = StdToHost(bytes + offset);
            offset += sizeof(int32) + (length + kAlignment - 1) / kAlignment * kAlignment;
            if (offset <= size) ++present;
        }
        hasAll = (*list)->count <= present;
        if (!hasAll) (*list)->count = present;
    }
    if (!hasAll || offset != size) TESSEL_REPORT(kDebugFatal, 0x8F3B62D0u);
}
