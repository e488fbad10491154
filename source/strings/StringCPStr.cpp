// Lists of PStrs laid end to end.
#include "strings/CPStrWalk.h"
#include "strings/HandleOps.h"
#include <tessel/diagnostics/DebugStream.h>
#include <tessel/strings/StringCPStr.h>
#include <tessel/strings/StringPStr.h>

#include <cstring>

using namespace tessel;

namespace {

constexpr uint32 kEmptyListSize = offsetof(CPStr, bytes);

uint32 OffsetOf(const CPStr* list, int32 i) {
    return static_cast<uint32>(ElementAt(list, i) - reinterpret_cast<ConstPStr>(list));
}

int32 ClampToElement(const CPStr* list, int32 i) {
    return std::clamp(i, 0, std::max(ElementCount(list) - 1, 0));
}

}  // namespace

uint32 CPStrSize(const CPStr* list) {
    return list ? OffsetOf(list, ElementCount(list)) : 0;
}

PStr CPStrIndex(CPStrHandle list, int32 i) {
    if (!list) return nullptr;
    return const_cast<PStr>(ElementAt(*list, ClampToElement(*list, i)));
}

int32 CPStrCmp(const CPStr* a, const CPStr* b) {
    return CompareLists(a, b, PStrCmp);
}

bool CPStrEqual(const CPStr* a, const CPStr* b) {
    return ElementCount(a) == ElementCount(b) && FirstElementsEqual(a, b, ElementCount(a), PStrEqual);
}

MgErr CPStrClear(CPStrHandle list) {
    if (!list) return kArgErr;
    if (MgErr err = SizeHandle(list, kEmptyListSize, true)) return err;
    (*list)->count = 0;
    return kNoErr;
}

MgErr CPStrSetToNEmptyStrings(CPStrHandle* list, int32 n) {
    if (!list || n < 0) return kArgErr;
    const uint32 size = kEmptyListSize + static_cast<uint32>(n);
    if (MgErr err = DSSetHandleSizeOrNewHandle(AsHandlePtr(list), size)) return err;
    (**list)->count = n;
    std::memset((**list)->bytes, 0, static_cast<size_t>(n));
    return kNoErr;
}

MgErr CPStrInsert(CPStrHandle list, ConstPStr element, int32 index) {
    return CPStrInsertEfficient(list, element, index, true);
}

MgErr CPStrInsertEfficient(CPStrHandle list, ConstPStr element, int32 index, bool exact) {
    if (!list || !element) {
        TESSEL_REPORT(kDebugError, 0x0D5CB872u) << "Bad inputs to CPStrInsertEfficient";
        return kGenericErr;
    }
    Str255 inserted;  // the element may lie in the list
    PStrCpy(inserted, element);
    const int32 count = ElementCount(*list);
    const uint32 offset = OffsetOf(*list, std::clamp(index, 0, count));
    const uint32 size = inserted[0] + 1u;
    if (MgErr err = ResizeRange(AsHandle(list), {CPStrSize(*list), offset, 0}, size, exact)) return err;
    std::memcpy(*AsHandle(list) + offset, inserted, size);
    (*list)->count = count + 1;
    return kNoErr;
}

MgErr CPStrRemove(CPStrHandle list, int32 index) {
    if (!list || ElementCount(*list) == 0) return kArgErr;
    const HandleRange removed = {CPStrSize(*list), OffsetOf(*list, ClampToElement(*list, index)),
                                 CPStrIndex(list, index)[0] + 1u};
    --(*list)->count;
    return ResizeRange(AsHandle(list), removed, 0, true);
}

MgErr CPStrReplace(CPStrHandle list, ConstPStr element, int32 index) {
    if (!list || !element || ElementCount(*list) == 0) return kArgErr;
    Str255 replacement;  // the element may lie in the list
    PStrCpy(replacement, element);
    const HandleRange replaced = {CPStrSize(*list), OffsetOf(*list, ClampToElement(*list, index)),
                                  CPStrIndex(list, index)[0] + 1u};
    const uint32 size = replacement[0] + 1u;
    const MgErr err = ResizeRange(AsHandle(list), replaced, size, true);
    if (!err) std::memcpy(*AsHandle(list) + replaced.offset, replacement, size);
    return err;
}

int32 CPStrSearch(CPStrHandle list, ConstPStr key, CPStrMatchProc match) {
    const int32 count = list && match ? ElementCount(*list) : 0;
    ConstPStr element = count != 0 ? (*list)->bytes : nullptr;
    for (int32 i = 0; i < count; ++i, element += element[0] + 1) {
        if (match(key, element) == 0) return i;
    }
    return -1;
}

void StrPoundToCPStr(UHandle resource, CPStrPtr list) {
    if (!list) return;
    int16 count = 0;
    const uint32 size = resource ? DSGetHandleSize(resource) : 0;
    if (size >= sizeof count) {
        std::memcpy(&count, *resource, sizeof count);
        std::memcpy(list->bytes, *resource + sizeof count, size - sizeof count);
    }
    list->count = count;
    const uint32 bytes = kEmptyListSize + size - static_cast<uint32>(sizeof count);
    if (count > 0) list->count = ElementsPresent(list, bytes);
    if (list->count < count) {
        TESSEL_REPORT(kDebugError, 0xA70D3C96u) << "String list of " << count << " ends after " << list->count;
    }
}
