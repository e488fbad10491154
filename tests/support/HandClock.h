// Clocks that stand still and are moved by hand, while the object lives. One at a time. Sleeping moves them.
#pragma once

#include <cstdint>

namespace tessel::test {

class HandClock {
public:
    // Both clocks start at so many milliseconds: the monotonic one from its origin, the time of day from 1970.
    explicit HandClock(std::int64_t milliseconds);
    ~HandClock();
    HandClock(const HandClock&) = delete;
    HandClock& operator=(const HandClock&) = delete;

    void Advance(std::int64_t milliseconds);
};

}  // namespace tessel::test

