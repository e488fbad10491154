// Lists of PStrs laid end to end (CPStr), held in a handle. Element i is found by walking from the first.
//
// "exact" means that the handle is left exactly as large as the list, else it is only ever grown. An operation that
// fails leaves the list as it was. All functions may be called from any thread on distinct data.
#ifndef TESSEL_STRINGS_STRINGCPSTR_H
#define TESSEL_STRINGS_STRINGCPSTR_H

#include <tessel/base/MgErr.h>
#include <tessel/base/StringTypes.h>

TESSEL_BEGIN_C

// Bytes of the whole list; 4 when it is empty, 0 for null.
TESSEL_API uint32 CPStrSize(const CPStr* list);

// Element i, with i brought into 0 ... count - 1; where the first one would be if there is none. The pointer lies in
// the handle's block. Null for a null handle.
TESSEL_API PStr CPStrIndex(CPStrHandle list, int32 i);

// Compares element by element with PStrCmp, then the counts.
TESSEL_API int32 CPStrCmp(const CPStr* a, const CPStr* b);
// Whether counts and elements are the same.
TESSEL_API bool CPStrEqual(const CPStr* a, const CPStr* b);

// Empties the list. kArgErr for null.
TESSEL_API MgErr CPStrClear(CPStrHandle list);

// Makes *list a list of n empty strings, creating it when it is null; the caller owns it. kArgErr for a null pointer or
// a negative n.
TESSEL_API MgErr CPStrSetToNEmptyStrings(CPStrHandle* list, int32 n);

// Inserts before element `index`, brought into 0 ... count. CPStrInsert is exact. The element may lie in the list.
// Null inputs are reported and give kGenericErr.
TESSEL_API MgErr CPStrInsert(CPStrHandle list, ConstPStr element, int32 index);
// The same; `exact` says whether the handle is left exactly as large as the list.
TESSEL_API MgErr CPStrInsertEfficient(CPStrHandle list, ConstPStr element, int32 index, bool exact);

// Removes element `index`, brought into 0 ... count - 1. kArgErr for null inputs and for an empty list.
TESSEL_API MgErr CPStrRemove(CPStrHandle list, int32 index);
// Replaces element `index`, brought into 0 ... count - 1. kArgErr for null inputs and for an empty list.
TESSEL_API MgErr CPStrReplace(CPStrHandle list, ConstPStr element, int32 index);

// A comparison of a key with an element, for example PStrCmp or PStrCaseCmp; 0 means that they match.
typedef int32 (*CPStrMatchProc)(ConstPStr key, ConstPStr element);

// Index of the first element that matches, or -1; -1 for a null list or comparison.
TESSEL_API int32 CPStrSearch(CPStrHandle list, ConstPStr key, CPStrMatchProc match);

// Converts the body of a string-list resource (an int16 count in host order, then PStrs) into a CPStr. list must take
// the handle's size + 2 bytes. Of a body that ends before its count does, the whole strings are counted, and it is
// reported. A null list is left alone.
TESSEL_API void StrPoundToCPStr(UHandle resource, CPStrPtr list);

TESSEL_END_C

#endif
