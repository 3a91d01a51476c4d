#include "base/Environment.h"

#include <gtest/gtest.h>

#include <cstdlib>

TEST(Environment, OfWhatIsNotSetOrSetToNothingIsEmpty)
{
    ::unsetenv("CLIPSA_TEST_VARIABLE"); // NOLINT(concurrency-mt-unsafe): no other thread runs
    EXPECT_EQ(base::environment("CLIPSA_TEST_VARIABLE"), "");
    ::setenv("CLIPSA_TEST_VARIABLE", "", 1); // NOLINT(concurrency-mt-unsafe)
    EXPECT_EQ(base::environment("CLIPSA_TEST_VARIABLE"), "");
    ::setenv("CLIPSA_TEST_VARIABLE", "a b", 1); // NOLINT(concurrency-mt-unsafe)
    EXPECT_EQ(base::environment("CLIPSA_TEST_VARIABLE"), "a b");
}
