// Makes calls of the kernel fail, while the object lives. One object at a time.
#pragma once

#include <cstddef>

namespace tessel::test {

class FailingPlatform {
public:
    // The n-th call (from 1) of the one named as in the table of system calls, and `times` - 1 after it, fail with
    // `error`. With an error of 0 a read or a write moves one byte instead; with kKill the process ends before the
    // call, with status 99. "*": any call that has to do with files.
    static constexpr int kKill = -1, kForever = 1 << 30;
    FailingPlatform(const char* call, int n, int error, int times = 1);
    ~FailingPlatform();
    FailingPlatform(const FailingPlatform&) = delete;
    FailingPlatform& operator=(const FailingPlatform&) = delete;

    // How many calls there were, failed or not.
    int Calls() const;
};

}  // namespace tessel::test

