// A host whose own `new` is tracked. Exit status 0 when all is as it should be; run with OVGuardBytes_NewDelete=alloc.
#include <tessel/tessel.h>

#include <cstdio>
#include <cstring>
#include <string>

namespace {

int failures = 0;
int leakReports = 0;

void Check(bool good, const char* what) {
    if (good) return;
    std::fprintf(stderr, "failed: %s\n", what);
    ++failures;
}

void TakeReport(CStr, int32, CStr, int32, uint32, CStr text) {
    if (std::strstr(text, "(1) : 1 new/delete leaks (0 expected)")) ++leakReports;
}

void CheckOperators() {
    char* guarded = new char[5];
    const char* volatile end = guarded + 5;  // the compiler knows of no bytes there
    Check(std::memcmp(end, "ORV13MEM", 8) == 0, "operator new[] leaves guard bytes");
    delete[] guarded;
    int* none = new int[0];
    int* other = new int[0];
    Check(none && other && none != other, "blocks of 0 bytes are distinct");
    delete[] none;
    delete[] other;
    delete static_cast<int*>(nullptr);
    volatile size_t huge = size_t(-1) / 2;
    char* volatile block = new (std::nothrow) char[huge];  // what nobody sees may be left out
    Check(block == nullptr, "the no-throw form returns null");
    try {
        block = new char[huge];
        delete[] block;
        Check(false, "out of memory throws");
    } catch (const std::bad_alloc& e) {
        Check(std::string(e.what()) == "bad allocation", "the text of the exception");
    }
}

}  // namespace

int main() {
    DebugOutputSetHandler(TakeReport);
    Check(InitTesselBase() == kNoErr, "start");
    CheckOperators();
    static int* volatile leak;
    leak = new int(5);
    Check(UninitTesselBase() == kNoErr, "stop");
    Check(leakReports == 1, "the one leak is reported");
    delete leak;
    return failures == 0 ? 0 : 1;
}
