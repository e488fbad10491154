// Makes the n-th allocation (from 1) by malloc or operator new fail while the object lives; with n = 0 none. Of the
// calling thread. For programs linked with --wrap=malloc.
#pragma once

namespace tessel::test {

class FailingMalloc {
public:
    explicit FailingMalloc(int n);
    ~FailingMalloc();
    FailingMalloc(const FailingMalloc&) = delete;
    FailingMalloc& operator=(const FailingMalloc&) = delete;

    // Whether an allocation has failed.
    bool HasFailed() const;
};

// Runs body() with the first allocation failing, then the second, and so on until it runs with none. How often
// one failed.
template <class Body>
int WithEachAllocationFailing(Body body) {
    for (int n = 1;; ++n) {
        FailingMalloc failing(n);
        body();
        if (!failing.HasFailed()) return n - 1;
    }
}

}  // namespace tessel::test

