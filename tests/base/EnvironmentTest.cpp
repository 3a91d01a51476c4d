#include "base/Environment.h"

#include <gmock/gmock.h>

#include <cstdlib>
#include <map>
#include <string>

using testing::ElementsAre;
using testing::IsEmpty;

TEST(Environment, OfWhatIsNotSetOrSetToNothingIsEmpty)
{
    ::unsetenv("CLIPSA_TEST_VARIABLE");
    EXPECT_EQ(base::environment("CLIPSA_TEST_VARIABLE"), "");
    ::setenv("CLIPSA_TEST_VARIABLE", "", 1);
    EXPECT_EQ(base::environment("CLIPSA_TEST_VARIABLE"), "");
    ::setenv("CLIPSA_TEST_VARIABLE", "a b", 1);
    EXPECT_EQ(base::environment("CLIPSA_TEST_VARIABLE"), "a b");
}

TEST(Environment, TellsWhatTheUserWantsToReadMostPreferredFirst)
{
    std::map<std::string, std::string> variables;
    const auto preferred = [&] { return base::preferredLocales([&](const char* name) { return variables[name]; }); };
    EXPECT_THAT(preferred(), IsEmpty());
    variables["LANG"] = "sv_SE.UTF-8";
    EXPECT_THAT(preferred(), ElementsAre("sv_SE.UTF-8"));
    variables["LC_MESSAGES"] = "nl";
    EXPECT_THAT(preferred(), ElementsAre("nl"));
    variables["LC_ALL"] = "C";
    EXPECT_THAT(preferred(), ElementsAre("C"));
    variables["LANGUAGE"] = "de_AT:de::fr";
    EXPECT_THAT(preferred(), ElementsAre("de_AT", "de", "", "fr", "C"));
}
