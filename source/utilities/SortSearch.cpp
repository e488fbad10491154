// Sorting in place and binary search over records of any size.
#include <tessel/utilities/SortSearch.h>

#include <cstddef>
#include <cstring>

namespace {

// ---- exchanging two records -----------------------------------------------------------------------------------------

template <class Unit>
void SwapUnits(char* a, char* b) {
    Unit left, right;
    std::memcpy(&left, a, sizeof left);
    std::memcpy(&right, b, sizeof right);
    std::memcpy(a, &right, sizeof right);
    std::memcpy(b, &left, sizeof left);
}

// Records of exactly one unit.
template <class Unit>
struct OneUnit {
    static constexpr size_t size = sizeof(Unit);
    void operator()(char* a, char* b) const { SwapUnits<Unit>(a, b); }
    void If(bool yes, char* a, char* b) const {
        Unit left, right;
        std::memcpy(&left, a, sizeof left);
        std::memcpy(&right, b, sizeof right);
        Unit change = (left ^ right) & (Unit{0} - Unit{yes});
        left ^= change;
        right ^= change;
        std::memcpy(a, &left, sizeof left);
        std::memcpy(b, &right, sizeof right);
    }
};

// Records of any number of units.
template <class Unit>
struct ManyUnits {
    size_t size;
    void operator()(char* a, char* b) const {
        for (size_t i = 0; i < size; i += sizeof(Unit)) SwapUnits<Unit>(a + i, b + i);
    }
    void If(bool yes, char* a, char* b) const {
        if (yes) (*this)(a, b);
    }
};

// ---- from one record to the next ------------------------------------------------------------------------------------

template <size_t N>
struct FixedStride {
    static constexpr size_t Bytes() { return N; }
};

struct Stride {
    size_t bytes;
    size_t Bytes() const { return bytes; }
};

// ---- comparing two records ------------------------------------------------------------------------------------------

struct Plain {
    CompareProc compare;
    explicit operator bool() const { return compare != nullptr; }
    int32 operator()(const void* a, const void* b) const { return compare(a, b); }
};

struct WithContext {
    CompareProcEx compare;
    void* context;
    explicit operator bool() const { return compare != nullptr; }
    int32 operator()(const void* a, const void* b) const { return compare(a, b, context); }
};

template <class T>
T Load(const void* address) {
    T value;
    std::memcpy(&value, address, sizeof value);
    return value;
}

struct Int32s {
    explicit operator bool() const { return true; }
    int32 operator()(const void* a, const void* b) const {
        return static_cast<int32>(Load<uint32>(a) - Load<uint32>(b));
    }
};

// ---- quicksort ------------------------------------------------------------------------------------------------------

template <class Compare, class Swap, class RecordStride>
class Sorter {
public:
    Sorter(RecordStride stride, Compare compare, Swap swap) : stride_(stride), compare_(compare), swap_(swap) {}

    // Sorts from the first to the last record, both included.
    void Sort(char* lo, char* hi) {
        const size_t size = stride_.Bytes();
        Range pending[kMaxPending];
        size_t count = 0;
        budget_ = Budget(static_cast<size_t>(hi - lo) / size + 1);
        for (;;) {
            if (static_cast<size_t>(hi - lo) > 2 * size && !SortRun(lo, hi) && !SortLate(lo, hi)) {
                char* pivot = Partition(lo, hi);
                if (pivot - lo > hi - pivot) {
                    if (pivot - size != lo) pending[count++] = {lo, pivot - size};
                    lo = pivot;
                } else {
                    if (pivot + size != hi) pending[count++] = {pivot + size, hi};
                    hi = pivot;
                }
                continue;
            }
            if (static_cast<size_t>(hi - lo) <= 2 * size) SortFew(lo, hi);
            if (count == 0) return;
            lo = pending[--count].lo;
            hi = pending[count].hi;
        }
    }

private:
    struct Range {
        char *lo, *hi;
    };

    // The comparisons that partitions may take, 2 n log2 n: some 1.2 n log2 n are usual. Only answers that are chosen
    // against the sort, or a very unlucky order, take more.
    static uint64 Budget(size_t records) {
        uint64 halvings = 1;
        for (size_t rest = records; rest > 2; rest = (rest + 1) / 2) ++halvings;
        return 2 * halvings * records;
    }

    void Charge(uint64 comparisons) { budget_ -= comparisons < budget_ ? comparisons : budget_; }

    // Sorts what the partitions can no longer pay for.
    bool SortLate(char* lo, char* hi) {
        const uint64 records = static_cast<size_t>(hi - lo) / stride_.Bytes() + 1;
        const bool late = records > budget_;
        if (late) HeapSort(lo, hi);
        Charge(records);
        return late;
    }

    // The slower sort that has no bad case.
    void HeapSort(char* lo, char* hi) {
        const size_t size = stride_.Bytes();
        const size_t count = static_cast<size_t>(hi - lo) / size + 1;
        for (size_t root = count / 2; root-- > 0;) SiftDown(lo, root, count);
        for (size_t last = count - 1; last > 0; --last) {
            swap_(lo, lo + last * size);
            SiftDown(lo, 0, last);
        }
    }

    // The record at `root` goes down to its place: the way of the greater children to the end, and back up from there,
    // as most records belong far down. A comparison a level.
    void SiftDown(char* base, size_t root, size_t count) {
        const size_t size = stride_.Bytes();
        size_t at = root;
        for (size_t child; (child = 2 * at + 1) < count; at = child) {
            if (child + 1 < count && compare_(base + child * size, base + (child + 1) * size) < 0) ++child;
        }
        while (at != root && compare_(base + root * size, base + at * size) > 0) at = (at - 1) / 2;
        // Each record on the way moves up by one, and the root's takes the last place.
        for (; at != root; at = (at - 1) / 2) swap_(base + root * size, base + at * size);
    }
    // The larger part is always put off, so what goes on halves: of 2^31 records no more than 31 ranges are pending.
    static constexpr size_t kMaxPending = 64;

    void Order(char* a, char* b) { swap_.If(compare_(a, b) > 0, a, b); }

    void MedianOfThree(char* lo, char* mid, char* hi) {
        Order(lo, mid);
        Order(lo, hi);
        Order(mid, hi);
    }

    // What is in order, or in reverse, needs no partition: it is left alone, or turned round. Only where there is one
    // sorted order: all records differ, or are the same in every byte. Elsewhere that is found out soon, as an order is
    // mostly disturbed in the middle, where the pivot was taken, or at an end.
    bool SortRun(char* lo, char* hi) {
        constexpr size_t kWorthALook = 32;  // records
        const size_t size = stride_.Bytes();
        const size_t count = static_cast<size_t>(hi - lo) / size;
        if (count < kWorthALook || swap_.size != size) return false;
        const bool falling = compare_(lo, lo + size) > 0;
        const char* const mid = lo + count / 2 * size;
        if (!IsInRun(mid, falling) || !IsInRun(mid - size, falling)) return false;
        for (const char *low = lo, *high = hi - size; low <= high; low += size, high -= size) {
            if (IsInRun(high, falling) && IsInRun(low, falling)) continue;
            Charge(static_cast<size_t>(low - lo) / size * 2);
            return false;
        }
        for (; falling && lo < hi; lo += size, hi -= size) swap_(lo, hi);
        return true;
    }

    bool IsInRun(const char* record, bool falling) const {
        const size_t size = stride_.Bytes();
        const int32 order = compare_(record, record + size);
        return order == 0 ? std::memcmp(record, record + size, size) == 0 : (order > 0) == falling;
    }

    // One, two or three records.
    void SortFew(char* lo, char* hi) {
        const size_t size = stride_.Bytes();
        if (lo + size == hi)
            Order(lo, hi);
        else if (lo != hi)
            MedianOfThree(lo, lo + size, hi);
    }

    // The pivot's final place. Each scan stops at the other one, whatever the comparison answers.
    char* Partition(char* lo, char* hi) {
        const size_t size = stride_.Bytes();
        char* mid = lo + static_cast<size_t>(hi - lo) / size / 2 * size;
        char* pivot = hi - size;
        MedianOfThree(lo, mid, hi);
        if (mid != pivot) swap_(mid, pivot);
        char* i = lo;
        char* j = pivot;
        PartitionBlocks(i, j, pivot);
        for (;;) {
            do i += size;
            while (i != j && compare_(i, pivot) < 0);
            if (i == j) break;
            do j -= size;
            while (j != i && compare_(j, pivot) > 0);
            if (j == i) break;
            swap_(i, j);
        }
        if (i != pivot) swap_(i, pivot);
        return i;
    }

    // Where a scan stops cannot be predicted. So while much lies between the two, they go ahead by blocks: a block is
    // compared without branches, and its stops are noted. They are exchanged in pairs just as one by one, and what
    // remains of a block when the two come near is scanned again.
    void PartitionBlocks(char*& i, char*& j, const char* pivot) {
        constexpr size_t kBlock = 64;
        const size_t size = stride_.Bytes();
        struct Stops {
            uint8 at[kBlock];  // distances from where the scan stands
            size_t next = 0, count = 0;
            bool IsDone() const { return next == count; }
        } left, right;
        while (static_cast<size_t>(j - i) > 2 * kBlock * size) {
            if (left.IsDone()) {
                left.next = left.count = 0;
                for (size_t k = 1; k <= kBlock; ++k) {
                    left.at[left.count] = static_cast<uint8>(k);
                    left.count += compare_(i + k * size, pivot) >= 0;
                }
            }
            if (right.IsDone()) {
                right.next = right.count = 0;
                for (size_t k = 1; k <= kBlock; ++k) {
                    right.at[right.count] = static_cast<uint8>(k);
                    right.count += compare_(j - k * size, pivot) <= 0;
                }
            }
            while (!left.IsDone() && !right.IsDone())
                swap_(i + left.at[left.next++] * size, j - right.at[right.next++] * size);
            if (left.IsDone()) i += kBlock * size;
            if (right.IsDone()) j -= kBlock * size;
        }
        if (!left.IsDone()) i += (left.at[left.next] - 1u) * size;
        if (!right.IsDone()) j -= (right.at[right.next] - 1u) * size;
    }

    RecordStride stride_;
    Compare compare_;
    Swap swap_;
    uint64 budget_ = 0;  // comparisons
};

template <class Compare, class Swap, class RecordStride>
void SortWith(void* base, int32 count, Compare compare, Swap swap, RecordStride stride) {
    char* first = static_cast<char*>(base);
    char* last = first + (static_cast<size_t>(count) - 1) * stride.Bytes();
    Sorter<Compare, Swap, RecordStride>(stride, compare, swap).Sort(first, last);
}

// Picks the exchange by the swap size: the largest units that fit.
template <class Compare>
void SortRecords(void* base, int32 count, int32 swapSize, int32 recordSize, Compare compare) {
    if (!base || !compare || count < 2 || recordSize < 1 || swapSize < 0 || swapSize > recordSize) return;
    const size_t size = static_cast<size_t>(swapSize);
    const Stride stride{static_cast<size_t>(recordSize)};
    if (size == 4 && stride.bytes == 4) {
        SortWith(base, count, compare, OneUnit<uint32>(), FixedStride<4>());
    } else if (size == 8 && stride.bytes == 8) {
        SortWith(base, count, compare, OneUnit<uint64>(), FixedStride<8>());
    } else if (size % 8 == 0) {
        SortWith(base, count, compare, ManyUnits<uint64>{size}, stride);
    } else if (size % 4 == 0) {
        SortWith(base, count, compare, ManyUnits<uint32>{size}, stride);
    } else if (size % 2 == 0) {
        SortWith(base, count, compare, ManyUnits<uint16>{size}, stride);
    } else {
        SortWith(base, count, compare, ManyUnits<uint8>{size}, stride);
    }
}

// ---- binary search --------------------------------------------------------------------------------------------------

template <class Compare>
int32 Search(const void* base, int32 count, int32 recordSize, const void* key, Compare compare) {
    const char* records = static_cast<const char*>(base);
    const size_t size = static_cast<size_t>(recordSize);
    size_t lo = 0, end = base && compare && count > 0 ? static_cast<size_t>(count) : 0;  // of those that may match
    while (lo < end) {
        size_t mid = (lo + end - 1) / 2;
        // Fetch both halves' middles, and select rather than branch: which half it is cannot be predicted.
        __builtin_prefetch(records + (lo + mid) / 2 * size);
        __builtin_prefetch(records + (mid + end) / 2 * size);
        int32 order = compare(key, records + mid * size);
        if (order == 0) return static_cast<int32>(mid);
        const size_t before = static_cast<size_t>(order >> 31);
        end ^= (end ^ mid) & before;
        lo ^= (lo ^ (mid + 1)) & ~before;
    }
    return -static_cast<int32>(lo) - 1;  // lo is where the key would be inserted
}

}  // namespace

void QSort2(void* base, int32 count, int32 swapSize, int32 recordSize, CompareProc compare) {
    if (compare == CompareInt32s)
        SortRecords(base, count, swapSize, recordSize, Int32s());  // needs no calls
    else
        SortRecords(base, count, swapSize, recordSize, Plain{compare});
}

void QSort(void* base, int32 count, int32 recordSize, CompareProc compare) {
    QSort2(base, count, recordSize, recordSize, compare);
}

void QSort2Ex(void* base, int32 count, int32 swapSize, int32 recordSize, CompareProcEx compare, void* context) {
    SortRecords(base, count, swapSize, recordSize, WithContext{compare, context});
}

void QSortEx(void* base, int32 count, int32 recordSize, CompareProcEx compare, void* context) {
    QSort2Ex(base, count, recordSize, recordSize, compare, context);
}

int32 BinSearch(const void* base, int32 count, int32 recordSize, const void* key, CompareProc compare) {
    return Search(base, count, recordSize, key, Plain{compare});
}

int32 BinSearchEx(const void* base, int32 count, int32 recordSize, const void* key, CompareProcEx compare,
                  void* context) {
    return Search(base, count, recordSize, key, WithContext{compare, context});
}

int32 CompareInt16s(const void* a, const void* b) {
    return Load<int16>(a) - Load<int16>(b);
}

int32 CompareInt32s(const void* a, const void* b) {
    return Int32s()(a, b);
}

int32 CompareUIntPtrTs(const void* a, const void* b) {
    uintptr_t left = Load<uintptr_t>(a), right = Load<uintptr_t>(b);
    return static_cast<int32>(left > right) - static_cast<int32>(left < right);
}
