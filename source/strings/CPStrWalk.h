// Going through the elements of a CPStr. Null is the empty list.
#ifndef TESSEL_STRINGS_CPSTRWALK_H
#define TESSEL_STRINGS_CPSTRWALK_H

#include <tessel/base/StringTypes.h>

#include <algorithm>

namespace tessel {

inline int32 ElementCount(const CPStr* list) {
    return list ? std::max(list->count, 0) : 0;
}

// Where element i is, or would be: 0 <= i <= count.
inline ConstPStr ElementAt(const CPStr* list, int32 i) {
    ConstPStr element = list->bytes;
    while (i-- > 0) element += element[0] + 1;
    return element;
}

// How many of the elements that the count promises lie whole in a list of so many bytes.
inline int32 ElementsPresent(const CPStr* list, uint32 size) {
    const auto* bytes = reinterpret_cast<const uint8*>(list);
    uint64 offset = offsetof(CPStr, bytes);
    int32 present = 0;
    while (present < list->count && offset < size) {
        offset += bytes[offset] + 1u;
        if (offset <= size) ++present;
    }
    return present;
}

// The first result of compare(element of a, element of b) over n elements that is not 0, or 0.
template <class Compare>
int32 CompareElements(const CPStr* a, const CPStr* b, int32 n, Compare compare) {
    if (n <= 0) return 0;
    ConstPStr p = a->bytes;
    ConstPStr q = b->bytes;
    for (; n > 0; --n, p += p[0] + 1, q += q[0] + 1) {
        if (const int32 result = compare(p, q)) return result;
    }
    return 0;
}

// Over the common elements, then by the counts.
template <class Compare>
int32 CompareLists(const CPStr* a, const CPStr* b, Compare compare) {
    const int32 aCount = ElementCount(a);
    const int32 bCount = ElementCount(b);
    const int32 result = CompareElements(a, b, std::min(aCount, bCount), compare);
    return result ? result : aCount - bCount;
}

// Both lists have n elements, and equal(element of a, element of b) holds for the first n.
template <class Equal>
bool FirstElementsEqual(const CPStr* a, const CPStr* b, int32 n, Equal equal) {
    return ElementCount(a) >= n && ElementCount(b) >= n &&
           CompareElements(a, b, n, [&](ConstPStr p, ConstPStr q) -> int32 { return !equal(p, q); }) == 0;
}

}  // namespace tessel

#endif
