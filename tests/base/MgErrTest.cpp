#include "support/Test.h"
#include <tessel/base/MgErr.h>

namespace {

TEST(MgErr, MeaningsFollowTheCodes) {
    EXPECT_EACH(MgErrMeaning(kNoErr) == "success", MgErrMeaning(13) == "not a resource file, or resource file not open",
                MgErrMeaning(122) == "resource file format version newer than this library reads",
                MgErrMeaning(4011) == "registry value is not of a string type", MgErrMeaning(12) == "unknown error",
                MgErrMeaning(-1) == "unknown error");
}

}  // namespace
