// The member of CPStrList that needs the resource manager.
#include "strings/CPStrWalk.h"
#include <tessel/memory/MemoryManager.h>
#include <tessel/resources/ResourceManager.h>
#include <tessel/streams/Endianizer.h>
#include <tessel/strings/CPStrList.h>

namespace tessel {
CPStrList::CPStrList(UHandle resource) {
    if (!resource || RDetach(resource)) return;
    if (DSGetHandleSize(resource) < sizeof(int32)) {
        DSDisposeHandle(resource);
        return;
    }
    list_ = reinterpret_cast<CPStrHandle>(resource);
    RevBL(&(*list_)->count);
    (*list_)->count = ElementsPresent(*list_, DSGetHandleSize(resource));
}

}  // namespace tessel
