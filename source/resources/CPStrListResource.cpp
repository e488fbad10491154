/* The member of CPStrList that needs the resource manager. */
#include <tessel/resources/ResourceManager.h>
#include <tessel/streams/Endianizer.h>
#include <tessel/strings/CPStrList.h>

#include "strings/HandleOps.h"

namespace tessel {
namespace {

/* How many of the elements that the count promises lie in the handle. */
int32 ElementsPresent(CPStrHandle list) {
    const uint32 size = DSGetHandleSize(AsHandle(list));
    uint64 offset = offsetof(CPStr, bytes);
    int32 present = 0;
    while (present < (*list)->count && offset < size) {
        offset += (*AsHandle(list))[offset] + 1u;
        if (offset <= size) ++present;
    }
    return present;
}

}  // namespace

CPStrList::CPStrList(UHandle resource) {
    if (!resource || RDetach(resource)) return;
    if (DSGetHandleSize(resource) < sizeof(int32)) {
        DSDisposeHandle(resource);
        return;
    }
    list_ = reinterpret_cast<CPStrHandle>(resource);
    RevBL(&(*list_)->count);
    (*list_)->count = ElementsPresent(list_);
}

}  // namespace tessel
