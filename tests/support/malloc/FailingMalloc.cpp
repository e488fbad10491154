#include "support/malloc/FailingMalloc.h"

#include <cstdlib>
#include <new>

extern "C" {
void* __real_malloc(std::size_t size);
void* __wrap_malloc(std::size_t size);
}

namespace {

constinit thread_local int left = 0;
constinit thread_local bool failed = false;

}  // namespace

void* __wrap_malloc(std::size_t size) {
    if (left == 0 || --left != 0) return __real_malloc(size);
    failed = true;
    return nullptr;
}

void* operator new(std::size_t size) {
    if (void* block = __wrap_malloc(size)) return block;
    throw std::bad_alloc();
}

void* operator new(std::size_t size, const std::nothrow_t&) noexcept {
    return __wrap_malloc(size);
}

void operator delete(void* block) noexcept {
    std::free(block);
}

void operator delete(void* block, std::size_t) noexcept {
    std::free(block);
}

namespace tessel::test {

FailingMalloc::FailingMalloc(int n) {
    left = n;
    failed = false;
}

FailingMalloc::~FailingMalloc() {
    left = 0;
}

bool FailingMalloc::HasFailed() const {
    return failed;
}

}  // namespace tessel::test
