#include "support/StartedLibrary.h"

#include <tessel/frame/TesselInit.h>

#include <gtest/gtest.h>

namespace tessel::test {

StartedLibrary::StartedLibrary() {
    EXPECT_EQ(kNoErr, InitTesselBase());
    EXPECT_EQ(kNoErr, InitTesselAppSupport());
}

StartedLibrary::~StartedLibrary() {
    UninitTesselAppSupport();
    UninitTesselBase();
}

}  // namespace tessel::test
