#include "support/StartedLibrary.h"

#include <gtest/gtest.h>
#include <tessel/frame/TesselInit.h>

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
