// CPStrList: an owned list of PStrs.
#ifndef TESSEL_STRINGS_CPSTRLIST_H
#define TESSEL_STRINGS_CPSTRLIST_H

#include <tessel/base/MgErr.h>
#include <tessel/base/StringTypes.h>

#ifdef __cplusplus
namespace tessel {

class BinDataReader;
class BinDataWriter;
class OVSubString;

// Owns one CPStr handle, null until something is inserted, and disposes of it. Element pointers hold until the list is
// changed. Used by one thread at a time.
class TESSEL_API CPStrList {
public:
    CPStrList() = default;

    // Copies the list; null, or memory that is short, gives an empty one.
    explicit CPStrList(const CPStr* list);

    // Takes the data of a loaded resource over from the resource manager. Its count stands most significant byte
    // first.
    explicit CPStrList(UHandle resource);

    CPStrList(const CPStrList&) = delete;
    CPStrList& operator=(const CPStrList&) = delete;
    ~CPStrList();

    // Number of elements.
    int32 Count() const;
    // The handle, which stays the list's; null for an empty list without one.
    CPStrHandle Handle() const { return list_; }

    // Replace the content; null empties.
    MgErr Copy(const CPStrList& other);
    // Replace the content by a copy; null empties.
    MgErr Copy(const CPStr* list);
    // Empties the list.
    MgErr Clear();

    // Element i, brought into 0 ... count - 1. Null when the list is empty.
    PStr operator[](int32 i);
    // The same, read-only.
    ConstPStr operator[](int32 i) const;

    // Insert before element `index`; a negative index appends. kArgErr for null, kMemFullErr when memory is short. A
    // substring is cut at 255 bytes.
    MgErr Insert(ConstPStr element, int32 index);
    // Insert a substring, cut at 255 bytes; else as above.
    MgErr Insert(const OVSubString& element, int32 index);
    // Removes element `index`, brought into 0 ... count - 1. kArgErr when the list is empty.
    MgErr Delete(int32 index);

    // Makes sure that there is a handle. kMemFullErr when memory is short.
    MgErr ForceAllocate();

    // Element by element over the common count, then the counts: as they are, and without regard to case. CompareFS is
    // CompareNC.
    int32 Compare(const CPStrList& other) const;
    // As Compare, without regard to case.
    int32 CompareNC(const CPStrList& other) const;
    // The same as CompareNC.
    int32 CompareFS(const CPStrList& other) const;

    // Equal counts and equal elements: as they are, without regard to case, as file names.
    bool Equal(const CPStrList& other) const;
    // As Equal, without regard to case.
    bool EqualNC(const CPStrList& other) const;
    // As Equal, as file names.
    bool EqualFS(const CPStrList& other) const;

    // Both have at least n elements, and the first n are equal as file names.
    bool EqualNEltsFS(const CPStrList& other, int32 n) const;

    // An int32 count, then each element as a PStr without padding. UnFlatten replaces the content and stops at the
    // reader's first error, which it returns.
    MgErr Flatten(BinDataWriter& writer) const;
    // Replaces the content by what Flatten wrote; the reader's first error.
    MgErr UnFlatten(BinDataReader& reader);

private:
    CPStrHandle list_ = nullptr;
};

}  // namespace tessel
#endif

#endif
