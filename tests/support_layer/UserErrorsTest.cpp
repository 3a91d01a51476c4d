// The system's own errors: what the user reads of them.
#include "support/VKErrorExtensions.h"

#include <gtest/gtest.h>

namespace {

using VKExtensions::_vkUserErrorForCode_userInfo;

TEST(UserErrors, HaveTheSystemsDomainTheirCodeAndWordsForTheUser)
{
    const auto noMovie = _vkUserErrorForCode_userInfo(-5818);
    EXPECT_EQ(noMovie->domain(), "clipsa");
    EXPECT_EQ(noMovie->code(), -5818);
    EXPECT_EQ(noMovie->description(), "There is no movie to save. Record it again, or open the file itself.");

    const auto failed = _vkUserErrorForCode_userInfo(-5812);
    EXPECT_EQ(failed->code(), -5812);
    EXPECT_EQ(failed->description(), "The movie could not be exported. It is still there as it was.");

    EXPECT_EQ(_vkUserErrorForCode_userInfo(-1)->description(), "Something went wrong (error -1).");
}

TEST(UserErrors, KeepTheWordsThatTheyAreGiven)
{
    const auto error = _vkUserErrorForCode_userInfo(-5812, {{base::Error::kDescriptionKey, "The disk is full."}});
    EXPECT_EQ(error->description(), "The disk is full.");
}

} // namespace
