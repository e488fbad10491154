// The library, started for as long as it lives.
#pragma once

#include <tessel/frame/TesselInit.h>

#include <gtest/gtest.h>

namespace tessel::test {

class StartedLibrary {
public:
    StartedLibrary() {
        EXPECT_EQ(kNoErr, InitTesselBase());
        EXPECT_EQ(kNoErr, InitTesselAppSupport());
    }
    ~StartedLibrary() {
        UninitTesselAppSupport();
        UninitTesselBase();
    }
    StartedLibrary(const StartedLibrary&) = delete;
    StartedLibrary& operator=(const StartedLibrary&) = delete;
};

}  // namespace tessel::test
