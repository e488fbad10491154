// The library, started for as long as it lives.
#ifndef TESSEL_TESTS_SUPPORT_STARTEDLIBRARY_H
#define TESSEL_TESTS_SUPPORT_STARTEDLIBRARY_H

namespace tessel::test {

class StartedLibrary {
public:
    StartedLibrary();  // fails the test when the library does not start
    ~StartedLibrary();
    StartedLibrary(const StartedLibrary&) = delete;
    StartedLibrary& operator=(const StartedLibrary&) = delete;
};

}  // namespace tessel::test

#endif
