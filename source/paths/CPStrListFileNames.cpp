// The members of CPStrList that compare file names.
#include "strings/CPStrWalk.h"
#include <tessel/paths/PathManager.h>
#include <tessel/strings/CPStrList.h>

namespace tessel {

bool CPStrList::EqualFS(const CPStrList& other) const {
    return Count() == other.Count() && EqualNEltsFS(other, Count());
}

bool CPStrList::EqualNEltsFS(const CPStrList& other, int32 n) const {
    return FirstElementsEqual(list_ ? *list_ : nullptr, other.list_ ? *other.list_ : nullptr, n, FileNameEqual);
}

}  // namespace tessel
