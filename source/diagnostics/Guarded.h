// Where exceptions end: the flat functions run what may throw through these.
#ifndef TESSEL_SOURCE_DIAGNOSTICS_GUARDED_H
#define TESSEL_SOURCE_DIAGNOSTICS_GUARDED_H

#include <tessel/base/MgErr.h>

#include <utility>

namespace tessel {

// Inside a catch handler: the code of what was caught. An OVExcept has its own, std::bad_alloc is 2, everything
// else 42. The unwinding of a thread that is being ended is no exception of ours: it is thrown on.
MgErr CaughtErr();

// The result of `body`, or the code of what it threw.
template <class Body>
MgErr Guarded(Body&& body) {
    try {
        return std::forward<Body>(body)();
    } catch (...) {
        return CaughtErr();
    }
}

// The result of `body`, or `otherwise` when it threw.
template <class T, class Body>
T GuardedOr(T otherwise, Body&& body) {
    try {
        return std::forward<Body>(body)();
    } catch (...) {
        CaughtErr();
        return otherwise;
    }
}

}  // namespace tessel

#endif
