// Tracked allocation: what is not freed by the stop of the library is named in a leak report, with the place it was
// made.
//
// The flat functions work before start and after stop too (then untracked). In C++, derive from tessel::TrackedObject
// to have a class allocated that way, and give containers tessel::TrackedAllocator.
#ifndef TESSEL_MEMORY_TRACKEDMALLOCFREE_H
#define TESSEL_MEMORY_TRACKEDMALLOCFREE_H

#include <tessel/base/MgErr.h>
#include <tessel/base/Types.h>

TESSEL_BEGIN_C

// `size` bytes, aligned for any plain type; null when there is no memory. Free with TrackedFree. Any thread.
TESSEL_API void* TrackedMalloc(size_t size);

// Frees what TrackedMalloc gave. Null is fine. Damaged guard bytes are only reported. Any thread.
TESSEL_API void TrackedFree(void* address);

// The leak report of the tracked blocks that live now and were not reported yet, into "ovnewdelleaks.txt".
TESSEL_API void TrackedMallocDumpTracker(void);

// Marks the tracked blocks that live now as reported: later reports name only newer ones.
TESSEL_API void TrackedMallocResetTracker(void);

TESSEL_END_C

#ifdef __cplusplus
#    include <new>

namespace tessel {

// operator new and operator delete over the functions above: 0 bytes give a block of their own, out of memory throws
// std::bad_alloc whose text is "bad allocation". The forms of a class or a program that replaces its own.
TESSEL_API void* TrackedNew(size_t size);
// The same without raising: null when there is no memory.
TESSEL_API void* TrackedNewNoThrow(size_t size) noexcept;

// Base of classes whose objects are tracked when made with new.
class TrackedObject {
public:
    // Tracked; raises std::bad_alloc when there is no memory.
    static void* operator new(size_t size) { return TrackedNew(size); }
    // Tracked; null when there is no memory.
    static void* operator new(size_t size, const std::nothrow_t&) noexcept { return TrackedNewNoThrow(size); }
    // In memory of the caller's: not tracked.
    static void* operator new(size_t, void* place) noexcept { return place; }
    // Tracked; raises std::bad_alloc when there is no memory.
    static void* operator new[](size_t size) { return TrackedNew(size); }
    // Tracked; null when there is no memory.
    static void* operator new[](size_t size, const std::nothrow_t&) noexcept { return TrackedNewNoThrow(size); }
    // Frees an object. Null is fine.
    static void operator delete(void* address) noexcept { TrackedFree(address); }
    // What a constructor that raises leaves behind.
    static void operator delete(void* address, const std::nothrow_t&) noexcept { TrackedFree(address); }
    // Nothing: the memory is the caller's.
    static void operator delete(void*, void*) noexcept {}
    // Frees an array. Null is fine.
    static void operator delete[](void* address) noexcept { TrackedFree(address); }
    // What a constructor that raises leaves behind.
    static void operator delete[](void* address, const std::nothrow_t&) noexcept { TrackedFree(address); }
};

// Allocator for standard containers.
template <class T>
struct TrackedAllocator {
    static_assert(alignof(T) <= alignof(max_align_t), "TrackedMalloc aligns for plain types only");
    using value_type = T;

    TrackedAllocator() noexcept = default;
    // All are alike: what one gives, any other takes back.
    template <class U>
    TrackedAllocator(const TrackedAllocator<U>&) noexcept {}

    // Room for so many objects; raises std::bad_alloc when there is no memory.
    T* allocate(size_t count) {
        if (count > size_t(-1) / sizeof(T)) return static_cast<T*>(TrackedNew(size_t(-1)));
        return static_cast<T*>(TrackedNew(count * sizeof(T)));
    }
    // Gives the room back.
    void deallocate(T* address, size_t) noexcept { TrackedFree(address); }
    // True: all are alike.
    template <class U>
    bool operator==(const TrackedAllocator<U>&) const noexcept {
        return true;
    }
    // False: all are alike.
    template <class U>
    bool operator!=(const TrackedAllocator<U>&) const noexcept {
        return false;
    }
};

}  // namespace tessel
#endif

#endif
