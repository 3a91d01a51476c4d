// A value on its way, moment by moment.
#include "linux/qt/animation/Tween.h"

#include <gtest/gtest.h>

namespace {

using namespace std::chrono_literals;

TEST(Tween, GoesFromOneValueToTheOtherAndArrives)
{
    qtui::Tween<double> tween;
    tween.start(0, 1, 10s, 250ms);
    EXPECT_EQ(tween.shown(1, 10s), 0);
    EXPECT_DOUBLE_EQ(tween.shown(1, 10s + 125ms), 0.5);
    EXPECT_TRUE(tween.isRunning());
    EXPECT_EQ(tween.shown(1, 10s + 250ms), 1);
    EXPECT_FALSE(tween.isRunning());
}

TEST(Tween, HasArrivedAsSoonAsNobodyCouldSeeADifference)
{
    qtui::Tween<double> tween;
    tween.start(0.3, 1, 10s, 250ms);
    for (const base::Instant before : {base::Instant(1ns), base::Instant(100us), base::Instant(450us)})
        EXPECT_EQ(tween.shown(1, 10s + 250ms - before), 1);
    EXPECT_TRUE(tween.isRunning()) << "a last picture still comes";
    EXPECT_LT(tween.shown(1, 10s + 235ms), 1);
}

TEST(Tween, TurnsRoundWhereItIs)
{
    qtui::Tween<double> tween;
    tween.start(0, 1, 10s, 200ms);
    tween.start(1, 0, 10s + 100ms, 200ms);
    EXPECT_DOUBLE_EQ(tween.shown(0, 10s + 100ms), 0.5);
    EXPECT_DOUBLE_EQ(tween.shown(0, 10s + 200ms), 0.25);
}

TEST(Tween, FollowsAModelThatChangesWithoutAnAnimationAtOnce)
{
    qtui::Tween<double> tween;
    tween.start(0, 1, 10s, 200ms);
    EXPECT_EQ(tween.shown(0.7, 10s + 50ms), 0.7);
    EXPECT_FALSE(tween.isRunning());
}

} // namespace
