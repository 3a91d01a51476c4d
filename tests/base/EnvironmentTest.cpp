#include "base/Environment.h"

#include <gtest/gtest.h>

#include <cstdlib>

TEST(Environment, OfWhatIsNotSetOrSetToNothingIsEmpty)
{
    ::unsetenv("CLIPSA_TEST_VARIABLE");
    EXPECT_EQ(base::environment("CLIPSA_TEST_VARIABLE"), "");
    ::setenv("CLIPSA_TEST_VARIABLE", "", 1);
    EXPECT_EQ(base::environment("CLIPSA_TEST_VARIABLE"), "");
    ::setenv("CLIPSA_TEST_VARIABLE", "a b", 1);
    EXPECT_EQ(base::environment("CLIPSA_TEST_VARIABLE"), "a b");
}
