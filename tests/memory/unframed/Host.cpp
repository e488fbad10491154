// A host as compilers make it by default: without frame pointers (see tests/CMakeLists.txt). The register serves for
// whatever the code wants to keep; here for the address of numbers on the stack that are never the same.
#include <tessel/memory/MemoryManager.h>

namespace tessel::test {

__attribute__((noinline)) void MakeAndDisposeWithoutFrames(unsigned rounds) {
    for (unsigned i = 0; i < rounds; ++i) {
        struct Kept {
            const Kept* next;
            uintptr_t number;
        } volatile kept[4];
        for (unsigned k = 0; k < 4; ++k) {
            kept[k].next = const_cast<const Kept*>(&kept[k < 3 ? k + 1 : 3]);
            kept[k].number = 0x10000u + 7u * i + k;
        }
#if defined(__x86_64__)
        register volatile Kept* inFrameRegister asm("rbp") = kept;
        asm volatile("" : "+r"(inFrameRegister));
#else
        volatile Kept* inFrameRegister = kept;
#endif
        UHandle const h = DSNewHandle(8);
        asm volatile("" : : "r"(inFrameRegister), "m"(kept));
        DSDisposeHandle(h);
    }
}

}  // namespace tessel::test
