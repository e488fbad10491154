// CPStrList, a list of PStrs as an object.
#include "strings/CPStrWalk.h"
#include "strings/HandleOps.h"
#include <tessel/strings/CPStrList.h>
#include <tessel/strings/StringCPStr.h>
#include <tessel/strings/StringPStr.h>
#include <tessel/strings/ovstring.h>

namespace tessel {
namespace {

const CPStr* ListOf(CPStrHandle handle) {
    return handle ? *handle : nullptr;
}

}  // namespace

CPStrList::CPStrList(const CPStr* list) {
    Copy(list);
}

CPStrList::~CPStrList() {
    DSDisposeHandle(AsHandle(list_));
}

int32 CPStrList::Count() const {
    return ElementCount(ListOf(list_));
}

MgErr CPStrList::Copy(const CPStrList& other) {
    return &other == this ? kNoErr : Copy(ListOf(other.list_));
}

MgErr CPStrList::Copy(const CPStr* list) {
    return list ? DSSetHandleFromPtr(AsHandlePtr(&list_), list, CPStrSize(list)) : Clear();
}

MgErr CPStrList::Clear() {
    return list_ ? CPStrClear(list_) : kNoErr;
}

PStr CPStrList::operator[](int32 i) {
    return Count() != 0 ? CPStrIndex(list_, i) : nullptr;
}

ConstPStr CPStrList::operator[](int32 i) const {
    return Count() != 0 ? CPStrIndex(list_, i) : nullptr;
}

MgErr CPStrList::Insert(ConstPStr element, int32 index) {
    if (!element) return kArgErr;
    if (MgErr err = ForceAllocate()) return err;
    return CPStrInsert(list_, element, index < 0 ? Count() : index);
}

MgErr CPStrList::Insert(const OVSubString& element, int32 index) {
    Str255 text;
    element.CopyToPStr(text);
    return Insert(text, index);
}

MgErr CPStrList::Delete(int32 index) {
    return CPStrRemove(list_, index);
}

MgErr CPStrList::ForceAllocate() {
    return list_ ? kNoErr : CPStrSetToNEmptyStrings(&list_, 0);
}

int32 CPStrList::Compare(const CPStrList& other) const {
    return CompareLists(ListOf(list_), ListOf(other.list_), PStrCmp);
}

int32 CPStrList::CompareNC(const CPStrList& other) const {
    return CompareLists(ListOf(list_), ListOf(other.list_), PStrCaseCmp);
}

int32 CPStrList::CompareFS(const CPStrList& other) const {
    return CompareNC(other);
}

bool CPStrList::Equal(const CPStrList& other) const {
    return Count() == other.Count() && FirstElementsEqual(ListOf(list_), ListOf(other.list_), Count(), PStrEqual);
}

bool CPStrList::EqualNC(const CPStrList& other) const {
    return Count() == other.Count() && FirstElementsEqual(ListOf(list_), ListOf(other.list_), Count(), PStrCaseEqual);
}

}  // namespace tessel
