// Lists of LStrs laid end to end (CLStr), held in a handle, each padded with zero bytes to a multiple of 4.
//
// "exact" means that the handle is left exactly as large as the list, else it is only ever grown. An operation that
// fails leaves the list as it was. All functions may be called from any thread on distinct data.
#ifndef TESSEL_STRINGS_STRINGCLSTR_H
#define TESSEL_STRINGS_STRINGCLSTR_H

#include <tessel/base/MgErr.h>
#include <tessel/base/StringTypes.h>

TESSEL_BEGIN_C

// Bytes of the whole list; 4 when it is empty, 0 for null.
TESSEL_API uint32 CLStrSize(const CLStr* list);

// Element i, with i brought into 0 ... count - 1; where the first one would be if there is none. The pointer lies in
// the list. Null is reported (fatal) and gives null.
TESSEL_API LStrPtr CLStrIndex(CLStrPtr list, int32 i);

// Inserts before element `index`; at or beyond the count it appends, and a negative index is 0. The element may lie in
// the list. Null inputs are reported (fatal) and give kGenericErr.
TESSEL_API MgErr CLStrInsert(CLStrHandle list, const LStr* element, int32 index, bool exact);

// Inserts into a sorted list before the first element that is not below the new one by LStrCmp, and stores that index.
// With allowDuplicate false an equal element keeps it out: *inserted is then false, the result still 0. Null inputs are
// reported (fatal) and give kGenericErr.
TESSEL_API MgErr CLStrInsertSort(CLStrHandle list, const LStr* element, bool allowDuplicate, int32* index,
                                 bool* inserted, bool exact);

// Removes element i, brought into 0 ... count - 1, and shrinks the handle. kArgErr for null and for an empty list.
TESSEL_API MgErr CLStrRemove(CLStrHandle list, int32 i);

// Brings a list whose count and lengths stand most significant byte first into host order. A list that does not end
// exactly at the handle's end, or has fewer elements than its count says, is reported (fatal); no byte beyond the
// handle is touched, and the count is then that of the elements that lie in it whole.
TESSEL_API void StdToCLStr(CLStrHandle list);

TESSEL_END_C

#endif
