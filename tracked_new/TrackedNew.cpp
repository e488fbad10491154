// The global operators new and delete over TrackedMalloc and TrackedFree. Those for types of larger alignment than any
// plain type stay the standard library's.
#include <tessel/memory/TrackedMallocFree.h>

#include <new>

void* operator new(size_t size) {
    return tessel::TrackedNew(size);
}
void* operator new[](size_t size) {
    return tessel::TrackedNew(size);
}
void* operator new(size_t size, const std::nothrow_t&) noexcept {
    return tessel::TrackedNewNoThrow(size);
}
void* operator new[](size_t size, const std::nothrow_t&) noexcept {
    return tessel::TrackedNewNoThrow(size);
}
void operator delete(void* address) noexcept {
    TrackedFree(address);
}
void operator delete[](void* address) noexcept {
    TrackedFree(address);
}
void operator delete(void* address, size_t) noexcept {
    TrackedFree(address);
}
void operator delete[](void* address, size_t) noexcept {
    TrackedFree(address);
}
void operator delete(void* address, const std::nothrow_t&) noexcept {
    TrackedFree(address);
}
void operator delete[](void* address, const std::nothrow_t&) noexcept {
    TrackedFree(address);
}
