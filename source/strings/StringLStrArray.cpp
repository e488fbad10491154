// Arrays of text handles.
#include "strings/CPStrWalk.h"
#include "strings/HandleOps.h"
#include "strings/LStrView.h"
#include <tessel/diagnostics/DebugStream.h>
#include <tessel/strings/StringCPStr.h>
#include <tessel/strings/StringLStr.h>
#include <tessel/strings/StringLStrArray.h>

#include <cstring>

using namespace tessel;

namespace {

constexpr int32 kMaxElements = INT32_MAX / static_cast<int32>(sizeof(LStrHandle)) - 1;

int32 ElementCount(LStrArrayHandle array) {
    return array ? (*array)->elementCount : 0;
}

uint8 ClippedLength(LStrHandle text) {
    return static_cast<uint8>(std::min(LStrView(text).length, kMaxPStr));
}

MgErr FillArray(LStrArrayHandle array, const CPStr* list, int32 n) {
    ConstPStr element = n != 0 ? list->bytes : nullptr;
    for (int32 i = 0; i < n; ++i, element += element[0] + 1) {
        if (MgErr err = LStrFromPtr(&(*array)->element[i], element[0], element + 1)) return err;
    }
    return kNoErr;
}

}  // namespace

MgErr ReallocLStrArrayHandle(LStrArrayHandle* array, int32 n) {
    if (!array || n < 0) return kArgErr;
    if (n > kMaxElements) return kMemFullErr;
    const int32 oldCount = ElementCount(*array);
    for (int32 i = n; i < oldCount; ++i) DSDisposeHandleAndNull(AsHandlePtr(&(**array)->element[i]));
    if (n == 0) return DSDisposeHandleAndNull(AsHandlePtr(array));
    if (n < oldCount) (**array)->elementCount = n;

    if (MgErr err = DSSetHandleSizeOrNewHandle(AsHandlePtr(array), LStrArraySize(n))) return err;
    for (int32 i = oldCount; i < n; ++i) (**array)->element[i] = nullptr;
    (**array)->elementCount = n;
    return kNoErr;
}

MgErr CPStrPtrToLStrArray(const CPStr* list, int32 n, LStrArrayHandle* array) {
    if (!array) {
        TESSEL_REPORT(kDebugError, 0x60E8A97Cu) << "Null not allowed";
        return kGenericErr;
    }
    if (n < 0 || n > ElementCount(list)) return kArgErr;
    LStrArrayHandle made = nullptr;
    MgErr err = ReallocLStrArrayHandle(&made, n);
    if (!err) err = FillArray(made, list, n);
    ReallocLStrArrayHandle(err ? &made : array, 0);
    if (!err) *array = made;
    return err;
}

MgErr LStrArrayToCPStrHandle(LStrArrayHandle array, int32 n, CPStrHandle* list) {
    if (!list || n < 0) return kArgErr;
    if (array && n > ElementCount(array)) return kArgErr;
    if (!array || n == 0) return DSDisposeHandleAndNull(AsHandlePtr(list));
    size_t size = offsetof(CPStr, bytes);
    for (int32 i = 0; i < n; ++i) size += ClippedLength((*array)->element[i]) + size_t{1};
    if (size > INT32_MAX || DSSetHandleSizeOrNewHandle(AsHandlePtr(list), static_cast<uint32>(size))) {
        return kMemFullErr;
    }
    PStr element = (**list)->bytes;
    for (int32 i = 0; i < n; ++i, element += element[0] + 1) {
        const LStrView text((*array)->element[i]);
        element[0] = ClippedLength((*array)->element[i]);
        if (element[0] != 0) std::memcpy(element + 1, text.bytes, element[0]);
    }
    (**list)->count = n;
    return kNoErr;
}

namespace tessel {

MgErr CPStrPtrToLStrArray(const CPStr* list, LStrArrayHandle* array) {
    return CPStrPtrToLStrArray(list, ElementCount(list), array);
}

MgErr LStrArrayToCPStrHandle(LStrArrayHandle array, CPStrHandle* list) {
    return LStrArrayToCPStrHandle(array, ::ElementCount(array), list);
}

}  // namespace tessel
