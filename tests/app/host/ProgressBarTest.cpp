#include "app/host/ProgressBar.h"

#include <gmock/gmock.h>

#include <cmath>

namespace {

TEST(ProgressBar, FillsAsFarAsTheWorkHasCome)
{
    EXPECT_EQ(host::progressLine("Work", 0, 33), "Work [--------------------]   0 %");
    EXPECT_EQ(host::progressLine("Work", 0.5, 33), "Work [##########----------]  50 %");
    EXPECT_EQ(host::progressLine("Work", 1, 33), "Work [####################] 100 %");
}

TEST(ProgressBar, NeverSaysMoreThanIsDone)
{
    EXPECT_EQ(host::progressLine("Work", 0.9999, 33), "Work [###################-]  99 %");
}

TEST(ProgressBar, TakesWhatIsNoPartForTheNearestThatIs)
{
    EXPECT_EQ(host::progressLine("Work", -3, 33), host::progressLine("Work", 0, 33));
    EXPECT_EQ(host::progressLine("Work", 7, 33), host::progressLine("Work", 1, 33));
    EXPECT_EQ(host::progressLine("Work", std::nan(""), 33), host::progressLine("Work", 0, 33));
}

TEST(ProgressBar, CountsLettersAndLeavesTheBarOutWhereThereIsNoRoom)
{
    EXPECT_EQ(host::progressLine("Wörk", 0.5, 33), "Wörk [##########----------]  50 %");
    EXPECT_EQ(host::progressLine("Work", 0.5, 20), "Work  50 %");
    EXPECT_EQ(host::progressLine("Work", 0.5, 1000).size(), 100U);
}

TEST(ProgressBar, SaysNothingWhereNobodyLooks)
{
    std::FILE* const file = std::tmpfile();
    {
        host::ProgressBar bar("Work", file);
        bar.show(0.5);
        bar.clear();
    }
    EXPECT_EQ(std::ftell(file), 0);
    std::fclose(file);
}

} // namespace
