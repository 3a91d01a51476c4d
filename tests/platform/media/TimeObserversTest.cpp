#include "platform/media/TimeObservers.h"

#include <gtest/gtest.h>

#include <optional>

namespace {

using base::MediaTime;
using platform::TimeObservers;

MediaTime at(double seconds)
{
    return MediaTime::fromSeconds(seconds, 600);
}

TEST(TimeObservers, APeriodicOneIsCalledOnceForAStepThatReachesItsNextMoment)
{
    TimeObservers observers;
    int calls = 0;
    const auto token = observers.addPeriodic(at(0.1), [&](MediaTime) { ++calls; });
    observers.played(at(0), at(0.05));
    EXPECT_EQ(calls, 0);
    observers.played(at(0.05), at(0.1));
    EXPECT_EQ(calls, 1);
    observers.played(at(0.1), at(0.95));
    EXPECT_EQ(calls, 2);
}

TEST(TimeObservers, ABoundaryIsCalledWhenAStepPassesItAndNotByAJump)
{
    TimeObservers observers;
    int calls = 0;
    const auto token = observers.addBoundary({at(1), at(2)}, [&] { ++calls; });
    observers.jumped(at(1.5));
    EXPECT_EQ(calls, 0);
    observers.played(at(1.5), at(2));
    EXPECT_EQ(calls, 1);
    observers.played(at(2), at(3));
    EXPECT_EQ(calls, 1);
}

TEST(TimeObservers, TheNextMomentIsTheNearestOfAll)
{
    TimeObservers observers;
    EXPECT_FALSE(observers.nextAfter(at(0)));
    const auto periodic = observers.addPeriodic(at(0.25), [](MediaTime) {});
    const auto boundary = observers.addBoundary({at(0.3)}, [] {});
    EXPECT_EQ(observers.nextAfter(at(0)), at(0.25));
    EXPECT_EQ(observers.nextAfter(at(0.25)), at(0.3));
    EXPECT_EQ(observers.nextAfter(at(0.3)), at(0.5));
}

TEST(TimeObservers, ACallbackMayRemoveAnotherAndDestroyThemAll)
{
    std::optional<TimeObservers> observers(std::in_place);
    int calls = 0;
    TimeObservers::Token second;
    const auto first = observers->addPeriodic(at(1), [&](MediaTime) { observers->remove(second); });
    second = observers->addPeriodic(at(1), [&](MediaTime) { ++calls; });
    const auto third = observers->addPeriodic(at(1), [&](MediaTime) { observers.reset(); });
    const auto fourth = observers->addPeriodic(at(1), [&](MediaTime) { ++calls; });
    observers->jumped(at(0));
    EXPECT_EQ(calls, 0);
}

TEST(TimeObservers, AnIntervalOfNothingWaitsForNoMoment)
{
    TimeObservers observers;
    int calls = 0;
    const auto zero = observers.addPeriodic(at(0), [&](MediaTime) { ++calls; });
    const auto invalid = observers.addPeriodic(MediaTime::invalid(), [&](MediaTime) { ++calls; });
    observers.played(at(0), at(5));
    EXPECT_EQ(calls, 0);
    observers.jumped(at(5));
    EXPECT_EQ(calls, 2);
}

} // namespace
