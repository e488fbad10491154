#include <tessel/base/MgErr.h>

#include <gtest/gtest.h>

namespace {

TEST(MgErr, MeaningsFollowTheCodes) {
    EXPECT_STREQ("success", MgErrMeaning(kNoErr));
    EXPECT_STREQ("not a resource file, or resource file not open", MgErrMeaning(13));
    EXPECT_STREQ("resource file format version newer than this library reads", MgErrMeaning(122));
    EXPECT_STREQ("registry value is not of a string type", MgErrMeaning(4011));
    EXPECT_STREQ("unknown error", MgErrMeaning(12));
    EXPECT_STREQ("unknown error", MgErrMeaning(-1));
}

}  // namespace
