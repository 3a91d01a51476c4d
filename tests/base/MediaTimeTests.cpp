#include "base/MediaTime.h"

#include <gtest/gtest.h>

#include <cmath>
#include <cstdint>
#include <limits>

namespace {

using base::MediaTime;

constexpr auto kMost = std::numeric_limits<std::int64_t>::max();
constexpr auto kInfinity = std::numeric_limits<double>::infinity();

MediaTime time(std::int64_t value, std::int32_t timescale)
{
    return MediaTime::make(value, timescale);
}

TEST(MediaTimeTests, SecondsAreRoundedToTheNearestTickHalvesAwayFromZero)
{
    EXPECT_EQ(MediaTime::fromSeconds(0.24, 10).value, 2);
    EXPECT_EQ(MediaTime::fromSeconds(0.25, 10).value, 3);
    EXPECT_EQ(MediaTime::fromSeconds(-0.25, 10).value, -3);
}

TEST(MediaTimeTests, SecondsThatAreNoNumberGiveAnInvalidTime)
{
    EXPECT_FALSE(MediaTime::fromSeconds(std::nan(""), 600).isValid());
    EXPECT_FALSE(MediaTime::fromSeconds(1, 0).isValid());
    EXPECT_FALSE(MediaTime::make(1, -1).isValid());
    EXPECT_TRUE(std::isnan(MediaTime::invalid().seconds()));
}

TEST(MediaTimeTests, SecondsBeyondAllTicksAreInfinite)
{
    EXPECT_EQ(MediaTime::fromSeconds(kInfinity, 600).kind, MediaTime::Kind::PositiveInfinity);
    EXPECT_EQ(MediaTime::fromSeconds(-1e300, 600).kind, MediaTime::Kind::NegativeInfinity);
}

TEST(MediaTimeTests, ConversionRoundsHalvesAwayFromZero)
{
    EXPECT_EQ(time(1, 2).convertedTo(1).value, 1);
    EXPECT_EQ(time(-1, 2).convertedTo(1).value, -1);
    EXPECT_EQ(time(1, 3).convertedTo(1).value, 0);
    EXPECT_EQ(time(2, 3).convertedTo(1).value, 1);
    EXPECT_EQ(time(3, 90000).convertedTo(48000).value, 2);
}

TEST(MediaTimeTests, AConversionThatDoesNotFitIsInvalid)
{
    EXPECT_FALSE(time(kMost, 1).convertedTo(600).isValid());
}

TEST(MediaTimeTests, ComparingAcrossTimescalesIsExact)
{
    EXPECT_EQ(time(1, 3), time(20, 60));
    EXPECT_LT(time(1, 3), time(333334, 1000000));
    EXPECT_GT(time(1, 3), time(333333, 1000000));
    EXPECT_LT(time(kMost - 1, 1), time(kMost, 1));
    EXPECT_GT(time(kMost, 1), time(kMost, std::numeric_limits<std::int32_t>::max()));
}

TEST(MediaTimeTests, InfinitiesStandAtTheEndsAndTheRestIsUnordered)
{
    EXPECT_LT(time(kMost, 1), MediaTime::positiveInfinity());
    EXPECT_FALSE(MediaTime::invalid() < time(0, 1));
    EXPECT_FALSE(MediaTime::invalid() == MediaTime::invalid());
    EXPECT_FALSE(MediaTime::indefinite() > time(0, 1));
}

TEST(MediaTimeTests, SumsAreExactInACommonScale)
{
    const MediaTime sum = time(1, 3) + time(1, 2);
    EXPECT_EQ(sum.timescale, 6);
    EXPECT_EQ(sum.value, 5);
    EXPECT_EQ(time(1, 2) - time(1, 2), MediaTime::zero());
}

TEST(MediaTimeTests, SumsWhoseCommonScaleIsTooFineKeepTheScaleOfTheFirst)
{
    const MediaTime sum = time(1, 2147483647) + time(1, 2147483629);
    EXPECT_EQ(sum.timescale, 2147483647);
    EXPECT_EQ(sum.value, 2);
}

TEST(MediaTimeTests, SumsThatDoNotFitTheCommonScaleKeepTheScaleOfTheFirst)
{
    const MediaTime sum = time(kMost - 1, 1) + time(1, 3);
    EXPECT_EQ(sum.timescale, 1);
    EXPECT_EQ(sum.value, kMost - 1);
}

TEST(MediaTimeTests, SumsThatOverflowAreInvalidAndNotWrong)
{
    EXPECT_FALSE((time(kMost, 1) + time(kMost, 1)).isValid());
    EXPECT_FALSE((time(0, 2147483647) + time(kMost, 2)).isValid());
}

TEST(MediaTimeTests, WhatIsTakenFromAnInfinityLeavesIt)
{
    EXPECT_EQ((MediaTime::positiveInfinity() - time(1, 1)).kind, MediaTime::Kind::PositiveInfinity);
    EXPECT_EQ((time(1, 1) - MediaTime::positiveInfinity()).kind, MediaTime::Kind::NegativeInfinity);
    EXPECT_FALSE((MediaTime::positiveInfinity() - MediaTime::positiveInfinity()).isValid());
    EXPECT_FALSE((MediaTime::positiveInfinity() + MediaTime::invalid()).isValid());
    EXPECT_EQ((time(1, 1) + MediaTime::indefinite()).kind, MediaTime::Kind::Indefinite);
}

TEST(MediaTimeTests, ARangeEndsWhereItsDurationIsOver)
{
    EXPECT_EQ((base::MediaTimeRange{time(1, 2), time(1, 3)}.end()), time(5, 6));
}

} // namespace
