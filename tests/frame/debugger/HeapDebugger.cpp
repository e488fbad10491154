// Stands for the library that watches the heap: tells that it was loaded.
#include <cstdlib>

__attribute__((constructor)) static void TellThatItIsLoaded() {
    ::setenv("TESSEL_TEST_HEAP_DEBUGGER", "loaded", 1);
}
